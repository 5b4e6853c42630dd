#include "cli/Output.h"

#include <gtest/gtest.h>

#include "cli/Table.h"

namespace tvx::host {
namespace {

ObjectPath path(const std::string& id) {
  return {"",
          "root/fake",
          "X_Thing",
          {{"SystemName", Value::string("host")},
           {"CreationClassName", Value::string("X_Thing")},
           {"DeviceID", Value::string(id)}}};
}

Instance thing(const std::string& id, const std::string& name) {
  Instance instance{path(id), path(id).keys};
  instance.properties.set("ElementName", Value::string(name));
  instance.properties.set("Empty", Value::null(CMPI_uint16));
  return instance;
}

TEST(TableTest, ColumnsAreAlignedAndLinesHaveNoTrailingBlanks) {
  Table table({"A", "LONG", "C"});
  table.add({"wide cell", "x", ""});
  table.add({"\xC3\xA9", "yy", "end"});
  table.add({"short"});
  EXPECT_EQ(table.text(), "A          LONG  C\nwide cell  x\n\xC3\xA9          yy    end\nshort\n");
}

TEST(TableTest, ControlCharactersCannotReachTheTerminal) {
  Table table({"A"});
  table.add({"a\x1b[31m\nb"});
  EXPECT_EQ(table.text(), "A\na?[31m?b\n");
}

TEST(TableTest, LongTextsAreCutAtWholeCharacters) {
  EXPECT_EQ(shortened("abcdef", 6), "abcdef");
  EXPECT_EQ(shortened("abcdefg", 6), "abc...");
  EXPECT_EQ(shortened("ab\xC3\xA9xyz", 6), "ab...");
}

TEST(OutputTest, ShortPathsLeaveOutWhatIsTheSameEverywhere) {
  EXPECT_EQ(shortPath(path("1")), "X_Thing.DeviceID=\"1\"");
  ObjectPath common{"", "n", "X", {{"SystemName", Value::string("h")}}};
  EXPECT_EQ(shortPath(common), "X.SystemName=\"h\"");
}

TEST(OutputTest, TheTableShowsTellingColumns) {
  EXPECT_EQ(instanceTable({thing("1", "one"), thing("22", "two")}, {}),
            "DeviceID  ElementName\n1         one\n22        two\n");
  EXPECT_EQ(instanceTable({}, {}), "no instances\n");
  EXPECT_EQ(
      instanceTable({thing("1", "one")}, std::vector<std::string>{"systemname", "Empty", "None"}),
      "systemname  Empty  None\nhost\n");
}

TEST(OutputTest, LongCellsAreShortUnlessAskedFor) {
  const std::string longText(100, 'x');
  EXPECT_EQ(instanceTable({thing("1", longText)}, {}),
            "DeviceID  ElementName\n1         " + std::string(45, 'x') + "...\n");
  EXPECT_EQ(instanceTable({thing("1", longText)}, std::vector<std::string>{"ElementName"}),
            "ElementName\n" + longText + "\n");
}

TEST(OutputTest, ReferencesInTablesAreShort) {
  Instance link{{"", "n", "X_Link", {}}, {{"Antecedent", Value::reference(path("1"))}}};
  EXPECT_EQ(instanceTable({link}, {}), "Antecedent\nX_Thing.DeviceID=\"1\"\n");
}

TEST(OutputTest, DetailsListEveryProperty) {
  Instance instance = thing("1", "one");
  instance.properties.set(
      "Inner", Value::embedded(Instance{{"", "", "Y", {}}, {{"A", Value::number(CMPI_uint8, 1)}}}));
  const std::string text = instanceDetails(instance);
  EXPECT_NE(text.find("root/fake:X_Thing.SystemName=\"host\""), std::string::npos) << text;
  EXPECT_NE(text.find("Empty              uint16    NULL"), std::string::npos) << text;
  EXPECT_NE(text.find(R"({"path":"Y","class":"Y","properties":{"A":1}})"), std::string::npos)
      << text;
}

TEST(OutputTest, MofHasEveryKindOfValue) {
  Instance inner{{"", "", "Y", {}}, {{"A", Value::number(CMPI_uint8, 1)}}};
  const Instance instance{
      path("1"),
      {{"Text", Value::string("a\"b\\c")},
       {"List", Value::array(CMPI_string, {Value::string("x"), Value::null(CMPI_string)})},
       {"Flag", Value::boolean(false)},
       {"None", Value::null(CMPI_uint8)},
       {"Real", Value::real(CMPI_real32, 1.5)},
       {"Ref", Value::reference({"", "n", "Z", {{"K", Value::string("v")}}})},
       {"Inner", Value::embedded(inner)}}};
  EXPECT_EQ(mofText(instance),
            "instance of X_Thing {\n"
            "    Text = \"a\\\"b\\\\c\";\n"
            "    List = {\"x\", NULL};\n"
            "    Flag = FALSE;\n"
            "    None = NULL;\n"
            "    Real = 1.5;\n"
            "    Ref = \"n:Z.K=\\\"v\\\"\";\n"
            "    Inner = instance of Y {\n    A = 1;\n};\n;\n"
            "};\n");
}

TEST(OutputTest, JsonCarriesItsVersion) {
  EXPECT_EQ(jsonHead("ei").dump(), R"({"version":1,"command":"ei"})");
}

}  // namespace
}  // namespace tvx::host
