// Model paths, both ways.
#include <gtest/gtest.h>

#include <random>
#include <string>
#include <utility>

#include "Test_Schema.h"

namespace cimrt {
namespace {

using namespace test;

const Meta_Class* const scope = &T_Device::static_meta_class;

Ref<Instance> read(const std::string& path) {
  return Ref<Instance>(model_path_to_instance(scope, path.c_str()));
}

template <class T>
Ref<T> read_as(const std::string& path) {
  Instance* instance = model_path_to_instance(scope, path.c_str());
  EXPECT_TRUE(instance && instance->meta_class == &T::static_meta_class) << path;
  return Ref<T>(static_cast<T*>(instance));
}

std::string written(const Instance* instance) {
  String text;
  return instance_to_model_path(instance, text) == 0 ? text.c_str() : "refused";
}

TEST(WritePath, JoinsKeysInFeatureOrder) {
  EXPECT_EQ(written(make_device("a", 1).get()), "T_Device.Name=\"a\",Number=1");
  EXPECT_EQ(written(make_device<T_Wide>("", 0).get()), "refused");
}

TEST(WritePath, LeavesStringsAsTheyStand) {
  EXPECT_EQ(written(make_device("a\"b\\c,d", 1).get()), "T_Device.Name=\"a\"b\\c,d\",Number=1");
}

TEST(WritePath, QuotesAndEscapesThePathOfATarget) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  EXPECT_EQ(written(link.get()),
            "T_Link.Antecedent=\"T_Device.Name=\\\"a\\\",Number=1\","
            "Dependent=\"T_Device.Name=\\\"b\\\",Number=2\"");
}

TEST(WritePath, WritesEachTypeItsWay) {
  const Ref<T_Timed> timed = make<T_Timed>(false);
  timed->Stamp.set(Datetime(93784000005u));
  timed->Ratio.set(1.5);
  timed->Flag.set(true);
  timed->Letter.set(u'x');
  EXPECT_EQ(written(timed.get()),
            "T_Timed.Stamp=00000001020304.000005:000,Ratio=1.500000,Flag=true,Letter='x'");
  const Ref<T_Integers> integers = make<T_Integers>(false);
  integers->Uint8.set(std::uint8_t{255});
  integers->Sint16.set(std::int16_t{-5});
  integers->Uint64.set(UINT64_MAX);
  integers->Sint64.set(INT64_MIN);
  EXPECT_EQ(written(integers.get()),
            "T_Integers.Uint8=255,Sint16=-5,Uint64=18446744073709551615,"
            "Sint64=-9223372036854775808,Flag=false");
}

TEST(WritePath, WritesKeysOfClassesThatAreMadeAtRunTime) {
  Meta_Class* mc = create_meta_class("X_Keys", nullptr, FLAG_CLASS);
  const std::pair<const char*, Type> keys[] = {
      {"Small", SINT8}, {"Short", UINT16}, {"Whole", SINT32}, {"Real", REAL32}};
  std::uint32_t offset = 24;
  for (const auto& [name, type] : keys) {
    add_feature(mc, create_property(name, type, 0, offset, true));
    offset += 8;
  }
  const Ref<Instance> instance(create(mc, true));
  const auto value = [&](const char* name) {
    *null_flag(instance.get(), find_property(mc, name)) = 0;
    return storage(instance.get(), find_property(mc, name));
  };
  *static_cast<std::int8_t*>(value("Small")) = -128;
  *static_cast<std::uint16_t*>(value("Short")) = 65535;
  *static_cast<std::int32_t*>(value("Whole")) = INT32_MIN;
  *static_cast<float*>(value("Real")) = 0.5F;
  EXPECT_EQ(written(instance.get()),
            "X_Keys.Small=-128,Short=65535,Whole=-2147483648,Real=0.500000");
  unref(mc);
}

TEST(WritePath, RefusesKeylessClassesNullKeysAndArrayKeysAndLeavesTheText) {
  String text("kept");
  EXPECT_EQ(instance_to_model_path(make<T_Empty>().get(), text), -1);
  EXPECT_EQ(instance_to_model_path(make<T_Device>().get(), text), -1);
  EXPECT_EQ(instance_to_model_path(make<T_Link>().get(), text), -1);
  EXPECT_EQ(instance_to_model_path(make<T_Array_Key>(false).get(), text), -1);
  const Ref<T_Link> link = make_link(make<T_Device>(), make_device("b", 2));
  EXPECT_EQ(instance_to_model_path(link.get(), text), -1);
  const Ref<Instance> call(create(&T_Device_Reset::static_meta_method));
  EXPECT_EQ(instance_to_model_path(call.get(), text), -1);
  EXPECT_STREQ(text.c_str(), "kept");
}

TEST(ReadPath, FillsKeysAndNullifiesTheRest) {
  const Ref<T_Device> device = read_as<T_Device>("T_Device.Name=\"a\",Number=7");
  EXPECT_STREQ(device->Name.value.c_str(), "a");
  EXPECT_EQ(device->Number.value, 7u);
  EXPECT_FALSE(device->Name.is_null());
  EXPECT_TRUE(device->Caption.is_null());
}

TEST(ReadPath, IgnoresCaseOfNamesAndTheirOrder) {
  const Ref<T_Device> device = read_as<T_Device>("t_device.NUMBER=7,name=\"a\"");
  EXPECT_TRUE(key_eq(device.get(), make_device("a", 7).get()));
}

TEST(ReadPath, ResolvesTheClassInTheRepository) {
  const Ref<T_Wide> wide = read_as<T_Wide>("T_Wide.Name=\"a\",Number=7,Extra=3");
  EXPECT_EQ(wide->Extra.value, 3);
}

TEST(ReadPath, TakesACommaBehindTheLastPair) {
  EXPECT_TRUE(read("T_Device.Name=\"a\",Number=7,"));
}

TEST(ReadPath, TakesDecimalAndHexadecimalIntegers) {
  EXPECT_EQ(read_as<T_Device>("T_Device.Name=\"a\",Number=0x1f")->Number.value, 31u);
  EXPECT_EQ(read_as<T_Device>("T_Device.Name=\"a\",Number=1F")->Number.value, 31u);
  EXPECT_EQ(read_as<T_Device>("T_Device.Name=\"a\",Number=12")->Number.value, 12u);
  const Ref<T_Integers> integers = read_as<T_Integers>(
      "T_Integers.Uint8=255,Sint16=-5,Uint64=9223372036854775807,Sint64=-9223372036854775808,"
      "Flag=TRUE");
  EXPECT_EQ(integers->Uint8.value, 255);
  EXPECT_EQ(integers->Sint16.value, -5);
  EXPECT_EQ(integers->Uint64.value, 9223372036854775807u);
  EXPECT_EQ(integers->Sint64.value, INT64_MIN);
  EXPECT_TRUE(integers->Flag.value);
}

TEST(ReadPath, UndoesTheTwoEscapesInStrings) {
  const Ref<T_Device> device = read_as<T_Device>(R"(T_Device.Name="a\"b\\c,d=e",Number=7)");
  EXPECT_STREQ(device->Name.value.c_str(), R"(a"b\c,d=e)");
}

TEST(ReadPath, ReadsTargetsRecursively) {
  const Ref<T_Link> link = read_as<T_Link>(
      "T_Link.Antecedent=\"T_Device.Name=\\\"a\\\",Number=1\","
      "Dependent=\"T_Port.Name=\\\"b\\\",Number=2\"");
  const Ref<T_Link> expected = make_link(make_device("a", 1), make_device("b", 2));
  EXPECT_TRUE(key_eq(link.get(), expected.get()));
  EXPECT_EQ(link->Dependent->meta_class, &T_Port::static_meta_class);
}

struct Refused_Path {
  const char* name;
  const char* path;
};

class ReadPath_Refuses : public testing::TestWithParam<Refused_Path> {};

TEST_P(ReadPath_Refuses, WithNull) {
  EXPECT_FALSE(read(GetParam().path));
}

INSTANTIATE_TEST_SUITE_P(
    Paths, ReadPath_Refuses,
    testing::Values(
        Refused_Path{"Empty", ""}, Refused_Path{"NoClass", ".Name=\"a\",Number=7"},
        Refused_Path{"UnknownClass", "T_Unknown.Name=\"a\""},
        Refused_Path{"DigitFirst", "1T_Device.Name=\"a\",Number=7"},
        Refused_Path{"NoDot", "T_Device"},
        Refused_Path{"OtherThanDot", "T_Device:Name=\"a\",Number=7"},
        Refused_Path{"NoPairs", "T_Device."}, Refused_Path{"FewerKeys", "T_Device.Name=\"a\""},
        Refused_Path{"MorePairs", "T_Device.Name=\"a\",Number=7,Number=8"},
        Refused_Path{"UnknownName", "T_Device.Nome=\"a\",Number=7"},
        Refused_Path{"NonKey", "T_Device.Name=\"a\",Caption=\"b\""},
        Refused_Path{"Method", "T_Device.Name=\"a\",Reset=1"},
        Refused_Path{"NoEquals", "T_Device.Name\"a\",Number=7"},
        Refused_Path{"NoValue", "T_Device.Name=\"a\",Number="},
        Refused_Path{"NoOpeningQuote", "T_Device.Name=a,Number=7"},
        Refused_Path{"NoClosingQuote", "T_Device.Number=7,Name=\"a"},
        Refused_Path{"OtherEscape", "T_Device.Name=\"\\n\",Number=7"},
        Refused_Path{"EscapeAtTheEnd", "T_Device.Name=\"\\"},
        Refused_Path{"BadNumber", "T_Device.Name=\"a\",Number=7x"},
        Refused_Path{"NoCommaBetween", "T_Device.Name=\"a\"Number=7"},
        Refused_Path{"TwoCommas", "T_Device.Name=\"a\",,Number=7"},
        Refused_Path{"BadBoolean", "T_Integers.Uint8=1,Sint16=1,Uint64=1,Sint64=1,Flag=truer"},
        Refused_Path{"EmptyBoolean", "T_Integers.Uint8=1,Sint16=1,Uint64=1,Sint64=1,Flag="},
        Refused_Path{"RealKey", "T_Real_Key.Ratio=1.0"},
        Refused_Path{"ArrayKey", "T_Array_Key.Numbers=1"},
        Refused_Path{"DatetimeKey",
                     "T_Timed.Stamp=00000001020304.000005:000,Ratio=1.0,Flag=true,Letter='x'"},
        Refused_Path{"TargetNotQuoted", "T_Meta_Link.Link=T_Link.x"},
        Refused_Path{"BadTarget", "T_Meta_Link.Link=\"T_Link.\""},
        Refused_Path{"TargetOfAnotherClass",
                     "T_Meta_Link.Link=\"T_Device.Name=\\\"a\\\",Number=1\""},
        Refused_Path{"TargetOfASuperclass",
                     "T_Port_Link.Antecedent=\"T_Device.Name=\\\"a\\\",Number=1\","
                     "Dependent=\"T_Device.Name=\\\"a\\\",Number=1\""}),
    [](const auto& param) { return param.param.name; });

TEST(ReadPath, OfNullIsNull) {
  EXPECT_EQ(model_path_to_instance(scope, nullptr), nullptr);
}

TEST(ReadPath, ReleasesATargetThatIsGivenTwice) {
  EXPECT_TRUE(
      read("T_Link.Antecedent=\"T_Device.Name=\\\"a\\\",Number=1\","
           "Antecedent=\"T_Device.Name=\\\"b\\\",Number=2\""));
}

TEST(ReadPath, OfAKeylessClassNeedsOnlyTheDot) {
  EXPECT_TRUE(read("T_Empty."));
  EXPECT_FALSE(read("T_Empty"));
}

TEST(ModelPath, RandomKeysSurviveBothWays) {
  std::mt19937 random(11);
  const std::string letters = "abcXYZ019 ,.=:;'-_/";
  const auto name = [&] {
    std::string text;
    for (std::size_t i = random() % 20; i > 0; --i) text += letters[random() % letters.size()];
    return text;
  };
  for (int i = 0; i < 500; ++i) {
    const Ref<T_Link> link =
        make_link(make_device(name().c_str(), static_cast<std::uint32_t>(random())),
                  make_device(name().c_str(), static_cast<std::uint32_t>(random())));
    const std::string path = written(link.get());
    const Ref<Instance> again = read(path);
    ASSERT_TRUE(again) << path;
    EXPECT_TRUE(key_eq(link.get(), again.get())) << path;
    for (std::size_t n = 0; n < path.size(); n += 7) EXPECT_FALSE(read(path.substr(0, n)));
  }
}

}  // namespace
}  // namespace cimrt
