#include <gtest/gtest.h>

#include "Test_Classes.h"
#include "cim/JsonText.h"
#include "cim/PathText.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

const JsonContext context{&test::testClasses(), "root/fake"};

std::string faultOf(const std::function<void()>& action) {
  try {
    action();
  } catch (const std::exception& error) {
    return error.what();
  }
  return "no fault";
}

TEST(JsonTextTest, ValuesKeepTheirNature) {
  EXPECT_EQ(toJson(Value::number(CMPI_uint64, ~std::uint64_t{0})).dump(), "18446744073709551615");
  EXPECT_EQ(toJson(Value::signedNumber(CMPI_sint8, -3)).dump(), "-3");
  EXPECT_EQ(toJson(Value::boolean(true)).dump(), "true");
  EXPECT_EQ(toJson(Value::real(CMPI_real32, static_cast<double>(3.3F))).dump(), "3.3");
  EXPECT_EQ(toJson(Value::real(CMPI_real64, 0.25)).dump(), "0.25");
  EXPECT_EQ(toJson(Value::string("a\"b")).dump(), R"("a\"b")");
  EXPECT_EQ(toJson(Value::stringWithoutText()).dump(), R"("")");
  EXPECT_EQ(toJson(Value::null(CMPI_string)).dump(), "null");
  EXPECT_EQ(toJson(Value::number(CMPI_char16, 65)).dump(), "65");
  EXPECT_EQ(
      toJson(Value::array(CMPI_uint8, {Value::number(CMPI_uint8, 1), Value::null(CMPI_uint8)}))
          .dump(),
      "[1,null]");
}

TEST(JsonTextTest, InstancesCarryPathClassAndProperties) {
  const Instance instance{{"", "root/fake", "FAKE_Widget", {{"Name", Value::string("a")}}},
                          {{"Name", Value::string("a")}, {"Flag", Value::boolean(false)}}};
  EXPECT_EQ(
      toJson(instance).dump(),
      R"({"path":"root/fake:FAKE_Widget.Name=\"a\"","class":"FAKE_Widget","properties":{"Name":"a","Flag":false}})");
}

TEST(JsonTextTest, DeclaredTypesAreCheckedWithTheirRange) {
  EXPECT_EQ(valueFromJson(Json::parse("255"), CMPI_uint8, context), Value::number(CMPI_uint8, 255));
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("256"), CMPI_uint8, context); }),
            "256 is no uint8");
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("-1"), CMPI_uint8, context); }),
            "-1 is no uint8");
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("-129"), CMPI_sint8, context); }),
            "-129 is no sint8");
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("1"), CMPI_string, context); }),
            "1 is no string");
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("1"), CMPI_uint8A, context); }),
            "1 is no uint8[]");
  EXPECT_EQ(faultOf([] { valueFromJson(Json::parse("\"soon\""), CMPI_dateTime, context); }),
            "\"soon\" is no datetime");
  EXPECT_EQ(valueFromJson(Json::parse("[1,null]"), CMPI_uint8A, context).elements()[1],
            Value::null(CMPI_uint8));
  EXPECT_TRUE(valueFromJson(Json(), CMPI_uint8A, context).isNull());
}

TEST(JsonTextTest, UntypedValuesTakeTheNearestType) {
  EXPECT_EQ(untypedFromJson(Json::parse("7"), context), Value::number(CMPI_uint64, 7));
  EXPECT_EQ(untypedFromJson(Json::parse("-7"), context), Value::signedNumber(CMPI_sint64, -7));
  EXPECT_EQ(untypedFromJson(Json::parse("1.5"), context), Value::real(CMPI_real64, 1.5));
  EXPECT_EQ(untypedFromJson(Json::parse(R"({"type":"uint16","value":3})"), context),
            Value::number(CMPI_uint16, 3));
  EXPECT_EQ(untypedFromJson(Json::parse(R"({"type":"string[]","value":["a"]})"), context),
            Value::array(CMPI_string, {Value::string("a")}));
  EXPECT_EQ(faultOf([] { untypedFromJson(Json::parse(R"({"type":"uint99"})"), context); }),
            "'uint99' is no CIM type");
  EXPECT_EQ(faultOf([] { untypedFromJson(Json::parse(R"([1,"a"])"), context); }),
            R"(the elements of [1,"a"] differ in type)");
}

TEST(JsonTextTest, InstancesAreTypedFromTheirClassAndNameTheFault) {
  const Instance instance = instanceFromJson(
      Json::parse(
          R"({"class":"fake_foreign","properties":{"id":"x","Level":3,"Levels":[-1],"Widget":"FAKE_Widget.Number=4","Extra":true}})"),
      context);
  EXPECT_EQ(instance.className(), "FAKE_Foreign");
  EXPECT_EQ(instance.path.nameSpace, "root/fake");
  EXPECT_EQ(instance.path.key("Id"), Value::string("x"));
  EXPECT_EQ(instance.property("Level"), Value::number(CMPI_uint16, 3));
  EXPECT_EQ(instance.property("Levels").elements().front(), Value::signedNumber(CMPI_sint8, -1));
  EXPECT_EQ(instance.property("Widget").asReference().key("Number"), Value::number(CMPI_uint32, 4));
  EXPECT_TRUE(instance.property("Extra").asBoolean());
  EXPECT_EQ(faultOf([] {
              instanceFromJson(
                  Json::parse(R"({"class":"FAKE_Foreign","properties":{"Level":"x"}})"), context);
            }),
            "property Level of FAKE_Foreign: \"x\" is no uint16");
}

TEST(JsonTextTest, KeysMayBeNamedForUnknownClasses) {
  const Instance instance = instanceFromJson(
      Json::parse(
          R"({"class":"X","namespace":"root/x","keys":["A"],"properties":{"A":"k","B":2}})"),
      context);
  EXPECT_EQ(printPath(instance.path), "root/x:X.A=\"k\"");
}

}  // namespace
}  // namespace tvx::host
