#include "runtime/Value.h"

#include <gtest/gtest.h>

#include <string>

#include "Captured_Stream.h"
#include "Test_Schema.h"

namespace cimrt {
namespace {

using namespace test;

template <class C>
const Meta_Feature* feature(const char* name) {
  return find_feature(&C::static_meta_class, name);
}

TEST(Value, HasNoTypeAndIsNotNullAtFirst) {
  const Value value;
  EXPECT_EQ(value.type(), NONE);
  EXPECT_FALSE(value.null());
}

TEST(Value, ClearingADefaultOneMakesItNull) {
  Value value;
  value.clear();
  EXPECT_EQ(value.type(), NONE);
  EXPECT_TRUE(value.null());
}

/// Stores and reads back one value, and checks that no other type reads it.
template <class T>
void round_trip(const T& x, Type type, bool (*equal)(const T&, const T&)) {
  Value value;
  value.set_null_flag(true);
  value.set(x);
  EXPECT_EQ(value.type(), type);
  EXPECT_FALSE(value.null());
  T out{};
  EXPECT_EQ(value.get(out), 0);
  EXPECT_TRUE(equal(x, out)) << type_name(type);
  const Value copy(value);
  T copied{};
  EXPECT_EQ(copy.get(copied), 0);
  EXPECT_TRUE(equal(x, copied)) << type_name(type);
  Array<Instance*> other;
  EXPECT_EQ(value.get(other), -1);
  EXPECT_EQ(other.size(), 0u);
}

template <class T>
void round_trip_both(const T& x, Type type) {
  round_trip<T>(x, type, [](const T& a, const T& b) { return a == b; });
  const T items[] = {x, T{}, x};
  round_trip<Array<T>>(Array<T>(items, 3), static_cast<Type>(type | ARRAY_BIT),
                       [](const Array<T>& a, const Array<T>& b) { return a.equal(b); });
}

TEST(Value, HoldsEveryTypeAndArraysOfIt) {
  round_trip_both(true, BOOLEAN);
  round_trip_both(std::uint8_t{200}, UINT8);
  round_trip_both(std::int8_t{-100}, SINT8);
  round_trip_both(std::uint16_t{60000}, UINT16);
  round_trip_both(std::int16_t{-30000}, SINT16);
  round_trip_both(std::uint32_t{4000000000u}, UINT32);
  round_trip_both(std::int32_t{-2000000000}, SINT32);
  round_trip_both(UINT64_MAX, UINT64);
  round_trip_both(INT64_MIN, SINT64);
  round_trip_both(1.5f, REAL32);
  round_trip_both(-2.25, REAL64);
  round_trip_both(u'x', CHAR16);
  round_trip_both(String("text"), STRING);
  round_trip_both(Datetime(5, 6), DATETIME);
}

TEST(Value, GetOfAWrongTypeLeavesTheArgumentAlone) {
  Value value;
  value.set(std::uint16_t{5});
  std::uint32_t number = 77;
  EXPECT_EQ(value.get(number), -1);
  EXPECT_EQ(number, 77u);
  String text("kept");
  EXPECT_EQ(value.get(text), -1);
  EXPECT_STREQ(text.c_str(), "kept");
  char16_t c = u'k';
  EXPECT_EQ(value.get(c), -1);
  EXPECT_EQ(c, u'k');
}

TEST(Value, ReadsOnlyTheLowByteOfAChar16WithItsSign) {
  Value value;
  char16_t c = 0;
  value.set(u'\x0441');
  EXPECT_EQ(value.get(c), 0);
  EXPECT_EQ(c, u'\x41');
  value.set(u'\x00E9');
  EXPECT_EQ(value.get(c), 0);
  EXPECT_EQ(c, u'\xFFE9');
}

TEST(Value, StringsShareTheirRepAndArraysAreDeep) {
  const String text("text");
  Value value;
  value.set(text);
  String out;
  ASSERT_EQ(value.get(out), 0);
  EXPECT_EQ(out.rep(), text.rep());
  Array<std::uint32_t> numbers{1, 2};
  value.set(numbers);
  numbers[0] = 9;
  Array<std::uint32_t> read;
  ASSERT_EQ(value.get(read), 0);
  EXPECT_EQ(read[0], 1u);
}

TEST(Value, TakesOverTheReferenceOfAnInstance) {
  Ref<T_Device> device = make_device("a", 1);
  {
    Value value;
    ref(device.get());
    value.set(device.get());
    EXPECT_EQ(device->refs.load(), 2u);
    Instance* out = nullptr;
    EXPECT_EQ(value.get(out), 0);
    EXPECT_EQ(out, device.get());
    EXPECT_EQ(device->refs.load(), 2u);
    const Value copy(value);
    EXPECT_EQ(device->refs.load(), 3u);
    Value assigned;
    assigned.set(String("old"));
    assigned = copy;
    EXPECT_EQ(device->refs.load(), 4u);
    value.clear();
    EXPECT_EQ(device->refs.load(), 3u);
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(Value, OwnsOneReferencePerElementOfAnInstanceArray) {
  Ref<T_Device> device = make_device("a", 1);
  {
    Array<Instance*> instances{device.get(), nullptr};
    ref(device.get());
    Value value;
    value.set(instances);
    EXPECT_EQ(device->refs.load(), 2u);
    const Value copy(value);
    EXPECT_EQ(device->refs.load(), 3u);
    Array<Instance*> out;
    EXPECT_EQ(copy.get(out), 0);
    ASSERT_EQ(out.size(), 2u);
    EXPECT_EQ(device->refs.load(), 3u);
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(Value, SetFromWhatItHoldsKeepsIt) {
  Value value;
  value.set(String("text"));
  const Value& self = value;
  value = self;
  String out;
  EXPECT_EQ(value.get(out), 0);
  EXPECT_STREQ(out.c_str(), "text");
}

TEST(ValueInInstance, OfANullInstanceIsRefused) {
  Value value;
  value.set(std::uint64_t{5});
  EXPECT_EQ(value.set(nullptr, feature<T_Device>("Speed")), -1);
}

TEST(ValueInInstance, OfAnotherTypeIsRefused) {
  const Ref<T_Device> device = make_device("a", 1);
  Value value;
  value.set(std::uint16_t{5});
  EXPECT_EQ(value.set(device.get(), feature<T_Device>("Number")), -1);
  EXPECT_EQ(device->Number.value, 1u);
}

TEST(ValueInInstance, OfAMethodIsRefused) {
  const Ref<T_Device> device = make_device("a", 1);
  Value value;
  EXPECT_EQ(value.set(device.get(), feature<T_Device>("Reset")), -1);
  value.set(String("x"));
  EXPECT_EQ(value.set(device.get(), feature<T_Device>("Reset")), -1);
  EXPECT_EQ(value.get(device.get(), feature<T_Device>("Reset")), -1);
  EXPECT_TRUE(value.null());
  EXPECT_EQ(value.type(), NONE);
}

TEST(ValueInInstance, EveryPropertySurvivesReadAndWrite) {
  const Ref<T_All> source = make<T_All>();
  source->Boolean.set(true);
  source->Sint8.set(std::int8_t{-1});
  source->Uint32.set(9u);
  source->Sint64.set(std::int64_t{-9});
  source->Real32.set(0.5f);
  source->Real64.set(-0.5);
  source->Char16.set(u'\x0416');
  source->Text.set("text");
  source->Char16s.set({u'a', u'\x0416'});
  source->Real32s.set({1.0f, 2.0f});
  const Ref<T_All> dest = make<T_All>(false);
  const Meta_Class& mc = T_All::static_meta_class;
  for (std::uint64_t i = 0; i < mc.num_meta_features; ++i) {
    Value value;
    EXPECT_EQ(value.get(source.get(), mc.meta_features[i]), 0);
    EXPECT_EQ(value.set(dest.get(), mc.meta_features[i]), 0);
  }
  EXPECT_TRUE(identical(source.get(), dest.get()));
}

TEST(ValueInInstance, OfANullStringKeepsItsText) {
  const Ref<T_Device> device = make_device("a", 1);
  device->Caption.set("caption");
  device->Caption.null = 1;
  Value value;
  ASSERT_EQ(value.get(device.get(), feature<T_Device>("Caption")), 0);
  EXPECT_EQ(value.type(), STRING);
  EXPECT_TRUE(value.null());
  String text;
  EXPECT_EQ(value.get(text), 0);
  EXPECT_STREQ(text.c_str(), "caption");
}

TEST(ValueInInstance, ANullOneSetsTheFlagAndCopiesTheValue) {
  const Ref<T_Device> device = make_device("a", 1);
  Value value;
  value.set(std::uint64_t{5});
  value.set_null_flag(true);
  EXPECT_EQ(value.set(device.get(), feature<T_Device>("Speed")), 0);
  EXPECT_TRUE(device->Speed.is_null());
  EXPECT_EQ(device->Speed.value, 5u);
}

TEST(ValueInInstance, AReferenceIsCountedBothWays) {
  Ref<T_Device> device = make_device("a", 1);
  {
    const Ref<T_Link> link = make<T_Link>();
    Value value;
    ref(device.get());
    value.set(device.get());
    EXPECT_EQ(value.set(link.get(), feature<T_Link>("Antecedent")), 0);
    EXPECT_EQ(link->Antecedent, device.get());
    EXPECT_EQ(device->refs.load(), 3u);
    Value read;
    EXPECT_EQ(read.get(link.get(), feature<T_Link>("Antecedent")), 0);
    EXPECT_EQ(read.type(), INSTANCE);
    EXPECT_FALSE(read.null());
    EXPECT_EQ(device->refs.load(), 4u);
    EXPECT_EQ(read.get(link.get(), feature<T_Link>("Dependent")), 0);
    EXPECT_TRUE(read.null());
    EXPECT_EQ(read.type(), INSTANCE);
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(ValueInInstance, ATargetOfASuperclassIsRefused) {
  const Ref<T_Port_Link> link = make<T_Port_Link>();
  Value value;
  value.set(make_device("a", 1).release());
  EXPECT_EQ(value.set(link.get(), feature<T_Port_Link>("Dependent")), -1);
  EXPECT_EQ(link->Dependent, nullptr);
  value.set(make_device<T_Port>("a", 1).release());
  EXPECT_EQ(value.set(link.get(), feature<T_Port_Link>("Dependent")), 0);
}

TEST(ValueInInstance, ATargetOfASubclassIsTaken) {
  const Ref<T_Link> link = make<T_Link>();
  Value value;
  value.set(make_device<T_Port>("a", 1).release());
  EXPECT_EQ(value.set(link.get(), feature<T_Link>("Antecedent")), 0);
  value.set(static_cast<Instance*>(nullptr));
  EXPECT_EQ(value.set(link.get(), feature<T_Link>("Dependent")), 0);
}

TEST(ValueInInstance, AnArrayOfReferencesIsCountedPerElement) {
  Ref<T_Device> device = make_device("a", 1);
  {
    const Ref<T_Group> group = make<T_Group>();
    ref(device.get());
    Value value;
    value.set(Array<Instance*>{device.get(), nullptr});
    EXPECT_EQ(value.set(group.get(), feature<T_Group>("Members")), 0);
    EXPECT_EQ(device->refs.load(), 3u);
    Value read;
    group->Members.null = 1;
    EXPECT_EQ(read.get(group.get(), feature<T_Group>("Members")), 0);
    EXPECT_EQ(read.type(), INSTANCE_ARRAY);
    EXPECT_TRUE(read.null());
    EXPECT_EQ(device->refs.load(), 4u);
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(ValueInInstance, AWrongElementEndsTheArrayWithTheEarlierOnesKept) {
  Ref<T_Device> device = make_device("a", 1);
  {
    const Ref<T_Group> group = make<T_Group>();
    ref(device.get());
    Value value;
    value.set(Array<Instance*>{device.get(), make<T_Empty>().release(), nullptr});
    EXPECT_EQ(value.set(group.get(), feature<T_Group>("Members")), -1);
    ASSERT_EQ(group->Members.value.size(), 1u);
    EXPECT_EQ(device->refs.load(), 3u);
  }
  EXPECT_EQ(device->refs.load(), 1u);
}

TEST(FeatureType, TellsPropertiesReferencesAndArraysApart) {
  EXPECT_EQ(feature_type(feature<T_All>("Uint16")), UINT16);
  EXPECT_EQ(feature_type(feature<T_All>("Uint16s")), UINT16_ARRAY);
  EXPECT_EQ(feature_type(feature<T_Group>("Leader")), INSTANCE);
  EXPECT_EQ(feature_type(feature<T_Group>("Members")), INSTANCE_ARRAY);
  EXPECT_EQ(feature_type(feature<T_Device>("Reset")), NONE);
}

TEST(TypeName, HasBothForms) {
  const char* const upper[] = {"BOOLEAN", "UINT8",  "SINT8",  "UINT16",   "SINT16",
                               "UINT32",  "SINT32", "UINT64", "SINT64",   "REAL32",
                               "REAL64",  "CHAR16", "STRING", "DATETIME", "INSTANCE"};
  for (int i = BOOLEAN; i <= INSTANCE; ++i) {
    const std::string name = upper[i];
    std::string lower;
    for (const char c : name) lower += static_cast<char>(__lower[static_cast<unsigned char>(c)]);
    EXPECT_EQ(type_name(static_cast<Type>(i)), name);
    EXPECT_EQ(type_name_lower(static_cast<Type>(i)), lower);
    EXPECT_EQ(type_name(static_cast<Type>(i | ARRAY_BIT)), name + "_ARRAY");
    EXPECT_EQ(type_name_lower(static_cast<Type>(i | ARRAY_BIT)), lower + "_array");
  }
  EXPECT_STREQ(type_name(NONE), "NONE");
  EXPECT_STREQ(type_name_lower(NONE), "none");
  EXPECT_STREQ(type_name(static_cast<Type>(99)), "NONE");
}

std::string printed(const Value& value) {
  Captured_Stream stream;
  value.print(stream.file());
  return stream.text();
}

/// The dump of one non-null value.
template <class T>
std::string printed_value(const T& x) {
  Value value;
  value.set(x);
  std::string text = printed(value);
  const std::string start = "    value=";
  const std::size_t at = text.find(start);
  if (at == std::string::npos) return "no value in: " + text;
  text = text.substr(at + start.size());
  return text.substr(0, text.size() - 3);
}

TEST(ValueDump, ShowsTypeNullAndValue) {
  Value value;
  value.set(std::uint16_t{5});
  EXPECT_EQ(printed(value), "Value\n{\n    type=UINT16\n    null=false\n    value=5\n}\n");
  value.set_null_flag(true);
  EXPECT_EQ(printed(value), "Value\n{\n    type=UINT16\n    null=true\n}\n");
}

TEST(ValueDump, WritesEachTypeItsWay) {
  EXPECT_EQ(printed_value(true), "true");
  EXPECT_EQ(printed_value(std::uint8_t{200}), "200");
  EXPECT_EQ(printed_value(std::int8_t{-5}), "-5");
  EXPECT_EQ(printed_value(std::int16_t{-500}), "-500");
  EXPECT_EQ(printed_value(4000000000u), "4000000000");
  EXPECT_EQ(printed_value(-2000000000), "-2000000000");
  EXPECT_EQ(printed_value(UINT64_MAX), "18446744073709551615");
  EXPECT_EQ(printed_value(INT64_MIN), "-9223372036854775808");
  EXPECT_EQ(printed_value(0.5f), "0.500000");
  EXPECT_EQ(printed_value(-2.25), "-2.250000");
  EXPECT_EQ(printed_value(u'A'), "65");
  EXPECT_EQ(printed_value(String("a\tb\nc\rd\fe\"f\\g")), R"("a\tb\nc\rd\fe\"f\\g")");
  EXPECT_EQ(printed_value(Datetime(93784000005u)), "00000001020304.000005:000");
  EXPECT_EQ(printed_value(Array<std::uint32_t>{1, 2, 3}), "1, 2, 3");
  EXPECT_EQ(printed_value(Array<String>{"a", "b"}), "\"a\", \"b\"");
}

TEST(ValueDump, WritesInstancesAsBlocks) {
  Value value;
  value.set(Array<Instance*>{make<T_Empty>().release(), nullptr});
  EXPECT_EQ(printed(value),
            "Value\n{\n    type=INSTANCE_ARRAY\n    null=false\n    value=\n    {\n"
            "T_Empty\n{\n}\n    }\n}\n");
  value.set(make<T_Empty>().release());
  EXPECT_EQ(printed(value),
            "Value\n{\n    type=INSTANCE\n    null=false\n    value=\nT_Empty\n{\n}\n}\n");
}

}  // namespace
}  // namespace cimrt
