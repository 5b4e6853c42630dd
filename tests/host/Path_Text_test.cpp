#include <gtest/gtest.h>

#include "Test_Classes.h"
#include "cim/PathText.h"

namespace tvx::host {
namespace {

ObjectPath parsed(const std::string& text) {
  return parsePath(text, "root/default");
}
ObjectPath typed(const std::string& text) {
  return parsePath(text, "root/fake", &test::testClasses());
}

std::string faultOf(const std::string& text, bool withClasses = false) {
  try {
    withClasses ? typed(text) : parsed(text);
  } catch (const PathError& error) {
    return error.what();
  }
  return "no fault";
}

TEST(PathTextTest, ReadsNamespaceClassAndKeys) {
  const ObjectPath path = parsed("root/torvex:X_Y.Name=\"a\",Number=12,Low=-3,Flag=TRUE");
  EXPECT_EQ(path.host, "");
  EXPECT_EQ(path.nameSpace, "root/torvex");
  EXPECT_EQ(path.className, "X_Y");
  EXPECT_EQ(path.key("Name"), Value::string("a"));
  EXPECT_EQ(path.key("Number"), Value::number(CMPI_uint64, 12));
  EXPECT_EQ(path.key("Low"), Value::signedNumber(CMPI_sint64, -3));
  EXPECT_EQ(path.key("Flag"), Value::boolean(true));
}

TEST(PathTextTest, NamespaceAndHostMayBeLeftOutOrGiven) {
  EXPECT_EQ(parsed("X.N=1").nameSpace, "root/default");
  EXPECT_EQ(parsed("X").keys.size(), 0U);
  EXPECT_EQ(parsed("root/a:X=@").className, "X");
  const ObjectPath path = parsed("http://host:5988/root/a:X.N=1");
  EXPECT_EQ(path.host, "host:5988");
  EXPECT_EQ(path.nameSpace, "root/a");
}

TEST(PathTextTest, TextsMayHoldBlanksColonsDotsCommasAndQuotes) {
  const std::string text = R"(root/a:X.A="b c: d.e=f,g",B="say \"hi\" \\ there")";
  const ObjectPath path = parsed(text);
  EXPECT_EQ(path.key("A").asText(), "b c: d.e=f,g");
  EXPECT_EQ(path.key("B").asText(), "say \"hi\" \\ there");
  EXPECT_EQ(printPath(path), text);
}

TEST(PathTextTest, NestedReferencesAreQuotedAndEscapedAtEachLevel) {
  ObjectPath inner{"",
                   "root/fake",
                   "FAKE_Widget",
                   {{"Name", Value::string("a\"b")}, {"Number", Value::number(CMPI_uint32, 1)}}};
  ObjectPath link{
      "",
      "root/fake",
      "FAKE_Link",
      {{"Antecedent", Value::reference(inner)}, {"Dependent", Value::reference(inner)}}};
  const std::string text = printPath(link);
  EXPECT_NE(text.find(R"(Antecedent="root/fake:FAKE_Widget.Name=\"a\\\"b\",Number=1")"),
            std::string::npos)
      << text;
  EXPECT_EQ(typed(text), link);
  EXPECT_EQ(typed(text).key("Antecedent").asReference().key("Number"),
            Value::number(CMPI_uint32, 1));
}

TEST(PathTextTest, KeysTakeTheirDeclaredTypesAndSpelling) {
  const ObjectPath path = typed("fake_widget.NAME=\"a\",number=7");
  EXPECT_EQ(path.className, "FAKE_Widget");
  EXPECT_EQ(path.keys[0].name, "Name");
  EXPECT_EQ(path.key("Number"), Value::number(CMPI_uint32, 7));
  EXPECT_EQ(typed("FAKE_Widget.Name=12").key("Name"), Value::string("12"));
  EXPECT_EQ(typed("FAKE_Widget.Number=\"12\"").key("Number"), Value::number(CMPI_uint32, 12));
}

TEST(PathTextTest, FaultsAreToldWithTheirPlace) {
  EXPECT_EQ(faultOf(""), "bad object path '': expected a class name at character 1");
  EXPECT_EQ(faultOf("root/a:"), "bad object path 'root/a:': expected a class name at character 8");
  EXPECT_EQ(faultOf("X,N=1"),
            "bad object path 'X,N=1': expected '.' before the first key at character 2");
  EXPECT_EQ(faultOf("X.=1"), "bad object path 'X.=1': expected a key name at character 3");
  EXPECT_EQ(faultOf("X.N"),
            "bad object path 'X.N': expected '=' after the key name N at character 4");
  EXPECT_EQ(faultOf("X.N=\"a"),
            "bad object path 'X.N=\"a': expected a closing '\"' at character 7");
  EXPECT_EQ(faultOf("X.N=1;"),
            "bad object path 'X.N=1;': expected a text in double quotes, a number, TRUE or FALSE "
            "at character 5");
  EXPECT_EQ(faultOf("X.N=\"a\"b"),
            "bad object path 'X.N=\"a\"b': expected ',' or the end at character 8");
  EXPECT_EQ(faultOf("X.N=1,n=2"),
            "bad object path 'X.N=1,n=2': expected the key n only once at character 7");
  EXPECT_NE(faultOf("X.N=18446744073709551616"), "no fault");
}

TEST(PathTextTest, UnknownKeysAndMisfitsAreToldByName) {
  EXPECT_EQ(faultOf("FAKE_Widget.Colour=\"x\"", true),
            "class FAKE_Widget has no key 'Colour'; its keys are: Name, Number");
  EXPECT_EQ(faultOf("FAKE_Widget.Color=\"x\"", true),
            "class FAKE_Widget has no key 'Color'; its keys are: Name, Number");
  EXPECT_EQ(faultOf("FAKE_Widget.Number=4294967296", true),
            "key Number is a uint32, '4294967296' is not");
  EXPECT_EQ(faultOf("FAKE_Widget.Number=-1", true), "key Number is a uint32, '-1' is not");
  EXPECT_EQ(faultOf("FAKE_Widget.Number=\"x\"", true), "key Number is a uint32, 'x' is not");
  EXPECT_NE(faultOf("FAKE_Link.Antecedent=\"FAKE_Widget.Bad=1\"", true), "no fault");
}

}  // namespace
}  // namespace tvx::host
