#include "cli/Arguments.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>

#include "Test_Classes.h"
#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

const ClassCatalogue& classes = test::testClasses();
const ClassData& widget() {
  return *classes.find("FAKE_Widget");
}
const MethodData& paint() {
  return *findMethod(widget(), "Paint");
}

PathResolver resolver() {
  return [](const std::string& text) { return parsePath(text, "root/fake", &classes); };
}

NamedValues arguments(const std::vector<std::string>& words) {
  return parseArguments(widget(), paint(), words, classes, resolver());
}

Value argument(const std::string& word) {
  return arguments({word})[0].value;
}

/// Code and message of the refusal.
std::pair<ExitCode, std::string> refusal(const std::string& word) {
  try {
    arguments({word});
  } catch (const CommandError& error) {
    return {error.code(), error.what()};
  }
  return {ExitCode::Ok, "no refusal"};
}

TEST(ArgumentsTest, ScalarsTakeTheirDeclaredType) {
  EXPECT_EQ(argument("Color=dark = red"), Value::string("dark = red"));
  EXPECT_EQ(argument("Color="), Value::string(""));
  EXPECT_EQ(argument("coats=0x10"), Value::number(CMPI_uint16, 16));
  EXPECT_EQ(argument("Small=-128"), Value::signedNumber(CMPI_sint8, -128));
  EXPECT_EQ(argument("Big=18446744073709551615"), Value::number(CMPI_uint64, ~std::uint64_t{0}));
  EXPECT_EQ(argument("Share=-1.5e2"), Value::real(CMPI_real64, -150));
  EXPECT_EQ(argument("On=true"), Value::boolean(true));
  EXPECT_EQ(argument("On=FALSE"), Value::boolean(false));
  EXPECT_EQ(argument("On=1"), Value::boolean(true));
  EXPECT_EQ(argument("On=0"), Value::boolean(false));
  EXPECT_EQ(argument("When=00000001020304.000005:000"),
            Value::dateTime("00000001020304.000005:000"));
  EXPECT_EQ(argument("Letter=A"), Value::number(CMPI_char16, 65));
  EXPECT_EQ(argument("Letter=66"), Value::number(CMPI_char16, 66));
}

TEST(ArgumentsTest, NamesTakeTheDeclaredSpelling) {
  EXPECT_EQ(arguments({"COLOR=red"})[0].name, "Color");
}

TEST(ArgumentsTest, ArraysComeFromCommasOrJson) {
  EXPECT_EQ(argument("Data=1,0x2,255").asUnsignedList(), (std::vector<std::uint64_t>{1, 2, 255}));
  EXPECT_EQ(argument("Data=").elements().size(), 0U);
  EXPECT_EQ(argument("Words=a,,b c").asTextList(), (std::vector<std::string>{"a", "", "b c"}));
  EXPECT_EQ(argument(R"(Words=["a,b","c"])").asTextList(), (std::vector<std::string>{"a,b", "c"}));
}

TEST(ArgumentsTest, ReferencesAndTheirArraysArePaths) {
  EXPECT_EQ(argument("Target=FAKE_Widget.Name=\"a\",Number=1").asReference().key("Number"),
            Value::number(CMPI_uint32, 1));
  EXPECT_EQ(argument("Targets=FAKE_Widget.Name=\"a\",Number=1").elements().size(), 1U);
  EXPECT_EQ(
      argument(R"(Targets=["FAKE_Widget.Number=1","FAKE_Widget.Number=2"])").elements().size(), 2U);
}

TEST(ArgumentsTest, EmbeddedInstancesAreJsonOrAFile) {
  const Value direct =
      argument(R"(Setting={"class":"FAKE_Widget","properties":{"Color":"red","Sizes":[1]}})");
  EXPECT_EQ(direct.asInstance().property("Sizes"),
            Value::array(CMPI_uint16, {Value::number(CMPI_uint16, 1)}));
  const std::string file = testing::TempDir() + "setting" + std::to_string(getpid()) + ".json";
  std::ofstream(file) << R"({"class":"FAKE_Widget","properties":{"Color":"red","Sizes":[1]}})";
  EXPECT_EQ(argument("Setting=@" + file), direct);
  unlink(file.c_str());
}

TEST(ArgumentsTest, BytesMayComeFromAFile) {
  const std::string file = testing::TempDir() + "bytes" + std::to_string(getpid());
  std::ofstream(file, std::ios::binary) << std::string("\x00\xFF\x0A", 3);
  EXPECT_EQ(argument("Data=@" + file).asUnsignedList(), (std::vector<std::uint64_t>{0, 255, 10}));
  unlink(file.c_str());
  EXPECT_EQ(
      refusal("Data=@/nowhere/bytes"),
      std::pair(ExitCode::File,
                std::string("cannot read the file '/nowhere/bytes': No such file or directory")));
}

struct MisfitRow {
  const char* name;
  const char* word;
  const char* message;
};

class MisfitTest : public ::testing::TestWithParam<MisfitRow> {};

TEST_P(MisfitTest, IsRefusedWithValueAndType) {
  EXPECT_EQ(refusal(GetParam().word),
            std::pair(ExitCode::BadArgument, std::string(GetParam().message)));
}

INSTANTIATE_TEST_SUITE_P(
    Values, MisfitTest,
    ::testing::Values(
        MisfitRow{"TooBig", "Coats=65536",
                  "'65536' does not fit 'uint16 Coats', which takes a number from 0 to 65535"},
        MisfitRow{"Negative", "Coats=-1",
                  "'-1' does not fit 'uint16 Coats', which takes a number from 0 to 65535"},
        MisfitRow{"NoNumber", "Coats=two",
                  "'two' does not fit 'uint16 Coats', which takes a number from 0 to 65535"},
        MisfitRow{"EmptyNumber",
                  "Coats=", "'' does not fit 'uint16 Coats', which takes a number from 0 to 65535"},
        MisfitRow{"Trailing", "Coats=1x",
                  "'1x' does not fit 'uint16 Coats', which takes a number from 0 to 65535"},
        MisfitRow{"SignedTooLow", "Small=-129",
                  "'-129' does not fit 'sint8 Small', which takes a number from -128 to 127"},
        MisfitRow{"SignedTooHigh", "Small=128",
                  "'128' does not fit 'sint8 Small', which takes a number from -128 to 127"},
        MisfitRow{"Overflow", "Big=18446744073709551616",
                  "'18446744073709551616' does not fit 'uint64 Big', which takes a number from 0 "
                  "to 18446744073709551615"},
        MisfitRow{"Real", "Share=1,5",
                  "'1,5' does not fit 'real64 Share', which takes a number such as 1.5 or -2e3"},
        MisfitRow{"Boolean", "On=maybe",
                  "'maybe' does not fit 'boolean On', which takes true or false"},
        MisfitRow{"Time", "When=now",
                  "'now' does not fit 'datetime When', which takes a time as "
                  "20240229235959.000000+060 or a span as 00000001020304.000000:000"},
        MisfitRow{"Element", "Data=1,256",
                  "'256' does not fit 'uint8[] Data', which takes a number from 0 to 255"},
        MisfitRow{"JsonElement", "Data=[256]", "'uint8[] Data': 256 is no uint8"}),
    [](const auto& row) { return std::string(row.param.name); });

TEST(ArgumentsTest, UnknownNamesSuggestKnownOnes) {
  EXPECT_EQ(refusal("Colour=red"),
            std::pair(ExitCode::BadArgument,
                      std::string("FAKE_Widget.Paint takes no 'Colour'; did you mean Color?")));
  EXPECT_EQ(refusal("Log=x").first, ExitCode::BadArgument) << "it goes out only";
  EXPECT_EQ(refusal("Color"),
            std::pair(ExitCode::Usage, std::string("'Color' is not of the form name=value")));
  EXPECT_EQ(refusal("=red").first, ExitCode::Usage);
  try {
    parseProperties(widget(), {"Farbe=red"}, classes, resolver());
    FAIL();
  } catch (const CommandError& error) {
    EXPECT_NE(std::string(error.what())
                  .find("FAKE_Widget has no property 'Farbe'; there are: Caption, Name,"),
              std::string::npos)
        << error.what();
  }
}

TEST(ArgumentsTest, PropertiesAreTypedFromTheClass) {
  const NamedValues properties =
      parseProperties(widget(), {"sizes=1,2", "Number=3"}, classes, resolver());
  EXPECT_EQ(properties[0].name, "Sizes");
  EXPECT_EQ(properties[0].value.type(), CMPI_uint16A);
  EXPECT_EQ(properties.find("Number")->type(), CMPI_uint32);
}

TEST(ArgumentsTest, SignaturesReadLikeMof) {
  EXPECT_EQ(signatureOf(*findParameter(paint(), "Target")), "ref FAKE_Widget Target");
  EXPECT_EQ(signatureOf(*findParameter(paint(), "Targets")), "ref FAKE_Widget[] Targets");
  EXPECT_EQ(signatureOf(*findParameter(paint(), "Setting")), "embedded FAKE_Widget Setting");
  EXPECT_EQ(signatureOf(*findParameter(paint(), "Data")), "uint8[] Data");
}

}  // namespace
}  // namespace tvx::host
