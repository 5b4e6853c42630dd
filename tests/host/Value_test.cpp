#include "cim/Value.h"

#include <gtest/gtest.h>

#include "cim/ScalarText.h"
#include "cim/TypeNames.h"

namespace tvx::host {
namespace {

ObjectPath pathOf(const std::string& name) {
  return {"", "root/fake", "FAKE_Widget", {{"Name", Value::string(name)}}};
}

TEST(ValueTest, NumbersAreCutToTheWidthOfTheirType) {
  EXPECT_EQ(Value::number(CMPI_uint8, 0x1FF).asUnsigned(), 0xFFU);
  EXPECT_EQ(Value::number(CMPI_uint16, 0x12345).asUnsigned(), 0x2345U);
  EXPECT_EQ(Value::number(CMPI_char16, 0x10041).asUnsigned(), 0x41U);
  EXPECT_EQ(Value::number(CMPI_uint32, 0x1'0000'0002).asUnsigned(), 2U);
  EXPECT_EQ(Value::number(CMPI_uint64, ~std::uint64_t{0}).asUnsigned(), ~std::uint64_t{0});
  EXPECT_EQ(Value::signedNumber(CMPI_sint8, 0xFF).asSigned(), -1);
  EXPECT_EQ(Value::signedNumber(CMPI_sint16, 0x8000).asSigned(), -32768);
  EXPECT_EQ(Value::signedNumber(CMPI_sint32, -5).asSigned(), -5);
  EXPECT_EQ(Value::signedNumber(CMPI_sint64, INT64_MIN).asSigned(), INT64_MIN);
}

TEST(ValueTest, TypedAccessRefusesOtherTypes) {
  EXPECT_THROW(Value::string("x").asUnsigned(), ValueError);
  EXPECT_THROW(Value::boolean(true).asText(), ValueError);
  EXPECT_THROW(Value::null(CMPI_uint16).asUnsigned(), ValueError);
  EXPECT_THROW(Value::signedNumber(CMPI_sint8, -1).asUnsigned(), ValueError);
  EXPECT_THROW(Value::number(CMPI_uint64, ~std::uint64_t{0}).asSigned(), ValueError);
  EXPECT_THROW(Value::stringWithoutText().asText(), ValueError);
  EXPECT_EQ(Value::number(CMPI_uint8, 7).asSigned(), 7);
  EXPECT_EQ(Value::signedNumber(CMPI_sint64, 7).asUnsigned(), 7U);
}

TEST(ValueTest, DisplayIsWhatAPersonReads) {
  EXPECT_EQ(Value::boolean(false).display(), "FALSE");
  EXPECT_EQ(Value::real(CMPI_real32, static_cast<double>(3.3F)).display(), "3.3");
  EXPECT_EQ(Value::real(CMPI_real64, 0.1).display(), "0.1");
  EXPECT_EQ(Value::null(CMPI_string).display(), "");
  EXPECT_EQ(Value::array(CMPI_string, {Value::string(""), Value::string("b")}).display(), ", b");
  EXPECT_EQ(Value::reference(pathOf("a")).display(), "root/fake:FAKE_Widget.Name=\"a\"");
  EXPECT_EQ(Value::embedded(Instance{pathOf("a"), {}}).display(), "instance of FAKE_Widget");
}

TEST(ValueTest, EqualityLooksAtTypeNullAndContents) {
  EXPECT_EQ(Value::string("a"), Value::string("a"));
  EXPECT_NE(Value::string("a"), Value::string("b"));
  EXPECT_NE(Value::number(CMPI_uint8, 1), Value::number(CMPI_uint16, 1));
  EXPECT_NE(Value::null(CMPI_string), Value::stringWithoutText());
  EXPECT_EQ(Value::reference(pathOf("a")), Value::reference(pathOf("a")));
  EXPECT_NE(Value::reference(pathOf("a")), Value::reference(pathOf("b")));
  EXPECT_EQ(Value::embedded(Instance{pathOf("a"), {}}), Value::embedded(Instance{pathOf("a"), {}}));
}

TEST(ValueTest, ListsAreReadAsAWhole) {
  const Value list =
      Value::array(CMPI_uint16, {Value::number(CMPI_uint16, 1), Value::number(CMPI_uint16, 2)});
  EXPECT_TRUE(list.isArray());
  EXPECT_EQ(list.elementType(), CMPI_uint16);
  EXPECT_EQ(list.asUnsignedList(), (std::vector<std::uint64_t>{1, 2}));
  EXPECT_THROW(list.asTextList(), ValueError);
}

TEST(NamedValuesTest, NamesAreFoundInAnyCase) {
  NamedValues values{{"Name", Value::string("a")}};
  values.set("NAME", Value::string("b"));
  ASSERT_EQ(values.size(), 1U);
  EXPECT_EQ(values.find("name")->asText(), "b");
  EXPECT_EQ(values[0].name, "Name");
  EXPECT_TRUE(values.remove("nAME"));
  EXPECT_FALSE(values.remove("Name"));
}

TEST(ObjectPathTest, KeysCompareByValueInAnyOrderAndWidth) {
  ObjectPath a{"",
               "root/a",
               "FAKE_Widget",
               {{"Name", Value::string("x")}, {"Number", Value::number(CMPI_uint32, 7)}}};
  ObjectPath b{"",
               "root/b",
               "fake_widget",
               {{"number", Value::signedNumber(CMPI_sint64, 7)}, {"NAME", Value::string("x")}}};
  EXPECT_TRUE(a.sameObject(b));
  EXPECT_FALSE(a == b) << "the namespaces differ";
  b.keys.set("Number", Value::signedNumber(CMPI_sint64, -7));
  EXPECT_FALSE(a.sameObject(b));
  EXPECT_THROW(a.key("Missing"), ValueError);
}

TEST(ObjectPathTest, ReferencesInKeysCompareAsObjects) {
  ObjectPath a{"", "", "FAKE_Link", {{"Antecedent", Value::reference(pathOf("x"))}}};
  ObjectPath b{"",
               "",
               "FAKE_Link",
               {{"Antecedent",
                 Value::reference({"", "other", "FAKE_Widget", {{"Name", Value::string("x")}}})}}};
  EXPECT_TRUE(a.sameObject(b));
}

TEST(InstanceTest, MissingPropertiesAreToldByName) {
  const Instance instance{pathOf("a"), {{"Flag", Value::boolean(true)}}};
  EXPECT_TRUE(instance.property("flag").asBoolean());
  EXPECT_EQ(instance.text("Other"), "");
  try {
    instance.property("Other");
    FAIL() << "a missing property was found";
  } catch (const ValueError& error) {
    EXPECT_STREQ(error.what(), "instance of FAKE_Widget has no property Other");
  }
}

struct TypeRow {
  CMPIType type;
  const char* name;
};

class TypeNameTest : public ::testing::TestWithParam<TypeRow> {};

TEST_P(TypeNameTest, NamesGoBothWays) {
  EXPECT_EQ(typeName(GetParam().type), GetParam().name);
  EXPECT_EQ(typeOfName(GetParam().name), GetParam().type);
  EXPECT_EQ(typeName(static_cast<CMPIType>(GetParam().type | CMPI_ARRAY)),
            std::string(GetParam().name) + "[]");
}

INSTANTIATE_TEST_SUITE_P(
    All, TypeNameTest,
    ::testing::Values(TypeRow{CMPI_boolean, "boolean"}, TypeRow{CMPI_uint8, "uint8"},
                      TypeRow{CMPI_sint8, "sint8"}, TypeRow{CMPI_uint16, "uint16"},
                      TypeRow{CMPI_sint16, "sint16"}, TypeRow{CMPI_uint32, "uint32"},
                      TypeRow{CMPI_sint32, "sint32"}, TypeRow{CMPI_uint64, "uint64"},
                      TypeRow{CMPI_sint64, "sint64"}, TypeRow{CMPI_real32, "real32"},
                      TypeRow{CMPI_real64, "real64"}, TypeRow{CMPI_char16, "char16"},
                      TypeRow{CMPI_string, "string"}, TypeRow{CMPI_dateTime, "datetime"},
                      TypeRow{CMPI_ref, "ref"}, TypeRow{CMPI_instance, "instance"}),
    [](const auto& row) { return std::string(row.param.name); });

TEST(TypeNameTest, UnknownCodesAndNamesAreSaidSo) {
  EXPECT_EQ(typeName(CMPI_null), "null");
  EXPECT_EQ(typeName(0x1900), "type 0x1900");
  EXPECT_EQ(typeOfName("uint128"), std::nullopt);
  EXPECT_EQ(typeOfName("UINT16"), CMPI_uint16);
}

TEST(ReturnCodeTest, CodesHaveNamesAndWords) {
  EXPECT_EQ(rcName(CMPI_RC_ERR_NOT_FOUND), "CMPI_RC_ERR_NOT_FOUND");
  EXPECT_EQ(rcWords(CMPI_RC_ERR_NOT_FOUND), "not found");
  EXPECT_EQ(rcName(CMPI_RC_ERROR), "CMPI_RC_ERROR");
  EXPECT_EQ(rcWords(CMPI_RC_DO_NOT_UNLOAD), "the provider asks not to be unloaded");
  EXPECT_EQ(rcName(42), "CMPI_RC(42)");
  EXPECT_EQ(rcWords(42), "code 42");
}

TEST(InstanceTest, KeysBecomePropertiesWhereThereAreNone) {
  Instance instance;
  instance.path.keys = {{"Name", Value::string("a")}, {"Number", Value::number(CMPI_uint32, 1)}};
  instance.properties = {{"NAME", Value::string("b")}, {"Color", Value::string("red")}};
  instance.addKeysAsProperties();
  EXPECT_EQ(instance.properties.size(), 3U);
  EXPECT_EQ(instance.text("Name"), "b");
  EXPECT_EQ(instance.property("Number").asUnsigned(), 1U);
}

TEST(ScalarTextTest, TheEndsThatAreToldFitAndNoMore) {
  struct Row {
    CMPIType type;
    const char* least;
    const char* most;
    const char* below;
    const char* above;
  };
  const Row rows[] = {
      {CMPI_uint8, "0", "255", "-1", "256"},
      {CMPI_uint16, "0", "65535", "-1", "65536"},
      {CMPI_uint32, "0", "4294967295", "-1", "4294967296"},
      {CMPI_uint64, "0", "18446744073709551615", "-1", "18446744073709551616"},
      {CMPI_sint8, "-128", "127", "-129", "128"},
      {CMPI_sint16, "-32768", "32767", "-32769", "32768"},
      {CMPI_sint32, "-2147483648", "2147483647", "-2147483649", "2147483648"},
      {CMPI_sint64, "-9223372036854775808", "9223372036854775807", "-9223372036854775809",
       "9223372036854775808"},
  };
  for (const Row& row : rows) {
    EXPECT_EQ(fittingText(row.type), std::string("a number from ") + row.least + " to " + row.most);
    EXPECT_TRUE(scalarFromText(row.type, row.least) && scalarFromText(row.type, row.most));
    EXPECT_FALSE(scalarFromText(row.type, row.below) || scalarFromText(row.type, row.above));
  }
  EXPECT_EQ(fittingText(CMPI_char16), "one character or its number");
  EXPECT_EQ(fittingText(CMPI_string), "a text");
}

}  // namespace
}  // namespace tvx::host
