// The program as people and scripts run it: output, errors and exit codes.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>

#include "Run_Program.h"
#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

using test::Outcome;

/// Runs the program over the test classes.
Outcome run(const std::string& words, bool withLibrary = true) {
  return test::runShell(std::string(TVXCIM_FAKE) +
                        (withLibrary ? " --lib " FAKE_PROVIDER " " : " ") + words);
}

nlohmann::json jsonOf(const Outcome& result) {
  return nlohmann::json::parse(result.out);
}

/// A text as the manual page writes it: each '-' behind a backslash, if it belongs to an option.
std::string manText(const std::string& text) {
  std::string result;
  bool inOption = false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    inOption = text.compare(i, 2, "--") == 0 || (inOption && text[i] != ' ');
    result += (inOption && text[i] == '-' ? "\\" : "") + std::string(1, text[i]);
  }
  return result;
}

constexpr const char* first = R"('FAKE_Widget.Name="widget0",Number=0')";
constexpr const char* oddName = R"('FAKE_Widget.Name="wid get: \"1\"\\"')";

TEST(ProgramTest, HelpListsCommandsAndExitCodes) {
  const Outcome result = run("--help", false);
  EXPECT_EQ(result.exitCode, 0);
  for (const char* text :
       {"classes", "ein", "ports", "--sim", "Exit codes:", "11  --strict found"}) {
    EXPECT_NE(result.out.find(text), std::string::npos) << text;
  }
  EXPECT_EQ(run("ain --help", false).exitCode, 0);
}

TEST(ProgramTest, WrongUsageIsCodeTwo) {
  EXPECT_EQ(run("", false).exitCode, 2);
  EXPECT_EQ(run("fly", false).exitCode, 2);
  EXPECT_EQ(run("ei", false).exitCode, 2);
  EXPECT_EQ(run("--json --mof classes", false).exitCode, 2);
  EXPECT_EQ(run("--broker-version 150 classes", false).exitCode, 2);
  EXPECT_EQ(run("mi " + std::string(first)).exitCode, 2);
  EXPECT_EQ(run("mi " + std::string(first) + " Color").exitCode, 2);
}

TEST(ProgramTest, ALibraryThatCannotBeLoadedIsCodeThree) {
  const Outcome missing = run("--lib /nowhere/lib.so ei FAKE_Widget", false);
  EXPECT_EQ(missing.exitCode, 3);
  EXPECT_EQ(missing.err, "tvxcim: there is no library '/nowhere/lib.so'; check --lib\n");
  const Outcome bad = run("--lib " TVXCIM_FAKE ".missing ei FAKE_Widget", false);
  EXPECT_EQ(bad.exitCode, 3);
  const Outcome wrong = run("--lib /etc/passwd ei FAKE_Widget", false);
  EXPECT_EQ(wrong.exitCode, 3);
  EXPECT_NE(wrong.err.find("cannot load the provider library '/etc/passwd'"), std::string::npos)
      << wrong.err;
}

TEST(ProgramTest, ClassesNeedNoLibrary) {
  const Outcome result = run("classes", false);
  EXPECT_EQ(result.exitCode, 0);
  EXPECT_NE(result.out.find("FAKE_Link    association               Antecedent,Dependent"),
            std::string::npos)
      << result.out;
  EXPECT_NE(result.out.find("3 classes\n"), std::string::npos);
  EXPECT_NE(run("classes --all", false).out.find("5 classes\n"), std::string::npos);
  EXPECT_NE(
      run("classes --methods", false).out.find("FAKE_Widget: uint32 Misbehave(in string How)"),
      std::string::npos)
      << run("classes --methods", false).out;
  EXPECT_EQ(jsonOf(run("--json classes", false))["classes"].size(), 3U);
}

TEST(ProgramTest, OneClassIsDescribed) {
  const Outcome result = run("class fake_widget", false);
  EXPECT_EQ(result.exitCode, 0);
  EXPECT_EQ(result.out.substr(0, result.out.find('\n')), "FAKE_Widget : CIM_Thing");
  EXPECT_NE(result.out.find("instance, in root/fake"), std::string::npos);
  EXPECT_NE(result.out.find("Color     string                writable  \"red\"    FAKE_Widget"),
            std::string::npos)
      << result.out;
  EXPECT_NE(result.out.find("in out uint16 Coats"), std::string::npos);
  const auto json = jsonOf(run("--json class FAKE_Widget", false));
  EXPECT_EQ(json["version"], 1);
  EXPECT_EQ(json["class"]["properties"][1]["key"], true);
  EXPECT_EQ(json["class"]["methods"][0]["name"], "Paint");
}

TEST(ProgramTest, AnUnknownClassIsCodeFourWithNearNames) {
  for (const char* command : {"ei", "ein", "class", "gi", "ci", "di"}) {
    const Outcome result = run(std::string(command) + " FAKE_Wigdet");
    EXPECT_EQ(result.exitCode, 4) << command;
    EXPECT_NE(result.err.find("tvxcim: unknown class 'FAKE_Wigdet'; did you mean FAKE_Widget"),
              std::string::npos)
        << result.err;
  }
  EXPECT_EQ(run("ain " + std::string(first) + " --assoc-class FAKE_Lnk").exitCode, 4);
  EXPECT_NE(run("ei Zzzzzzzzzzzzzz").err.find("'tvxcim classes' lists them"), std::string::npos);
}

TEST(ProgramTest, AnUnknownNamespaceIsCodeFive) {
  const Outcome result = run("--namespace root/else ei FAKE_Widget");
  EXPECT_EQ(result.exitCode, 5);
  EXPECT_EQ(result.err,
            "tvxcim: enumerateInstances root/else:FAKE_Widget: unknown namespace "
            "(CMPI_RC_ERR_INVALID_NAMESPACE): no namespace 'root/else' here\n");
}

TEST(ProgramTest, NamesAreOnePathALine) {
  const Outcome result = run("ein FAKE_Widget");
  EXPECT_EQ(result.exitCode, 0);
  EXPECT_NE(result.out.find(R"(root/fake:FAKE_Widget.Name="wid get: \"1\"\\",Number=1)"
                            "\n"),
            std::string::npos)
      << result.out;
  EXPECT_EQ(jsonOf(run("--json ein FAKE_Widget"))["paths"].size(), 4U);
}

TEST(ProgramTest, InstancesComeAsTableJsonAndMof) {
  const Outcome table = run("ei FAKE_Gadget");
  EXPECT_EQ(table.out, "Name     Number\nwidget0  0\n");
  const auto json = jsonOf(run("ei FAKE_Gadget --json"));
  EXPECT_EQ(json["version"], 1);
  EXPECT_EQ(json["command"], "ei");
  EXPECT_EQ(json["instances"][0]["properties"]["Sizes"], nlohmann::json::array());
  EXPECT_EQ(json["instances"][0]["properties"]["Number"], 0);
  const Outcome mof = run("--mof ei FAKE_Gadget");
  EXPECT_EQ(mof.out,
            "instance of FAKE_Gadget {\n    Name = \"widget0\";\n    Number = 0;\n    Color = "
            "\"red\";\n    Sizes = {};\n};\n");
}

TEST(ProgramTest, SeveralClassesGetATableEach) {
  const Outcome result = run("ei CIM_Thing --property-list Name,Color");
  EXPECT_EQ(result.out,
            "FAKE_Gadget\nName     Color\nwidget0  red\n\n"
            "FAKE_Widget\nName           Color\nwidget0        red\n"
            "wid get: \"1\"\\  blue\nwidget2        red\n");
}

TEST(ProgramTest, OneInstanceIsListedInFull) {
  const Outcome result = run("gi " + std::string(first));
  EXPECT_EQ(result.exitCode, 0);
  EXPECT_NE(result.out.find("Color     string    red"), std::string::npos) << result.out;
}

TEST(ProgramTest, KeysThatAreLeftOutAreFilledIn) {
  EXPECT_EQ(run(std::string("gi --json ") + oddName).exitCode, 0);
  const Outcome many = run("gi FAKE_Widget");
  EXPECT_EQ(many.exitCode, 6);
  EXPECT_NE(many.err.find("4 instances fit FAKE_Widget; add keys:\n  root/fake:"),
            std::string::npos)
      << many.err;
  const Outcome none = run("gi FAKE_Widget.Number=77");
  EXPECT_EQ(none.exitCode, 6);
  EXPECT_EQ(
      none.err,
      "tvxcim: no instance fits FAKE_Widget.Number=77; 'tvxcim ein FAKE_Widget' lists them\n");
}

TEST(ProgramTest, AMissingInstanceOrABadPathIsCodeSix) {
  const Outcome missing = run(R"(gi 'FAKE_Widget.Name="x",Number=0')");
  EXPECT_EQ(missing.exitCode, 6);
  EXPECT_EQ(missing.err,
            "tvxcim: getInstance FAKE_Widget.Name=\"x\",Number=0: not found "
            "(CMPI_RC_ERR_NOT_FOUND): no such widget\n");
  const Outcome key = run("gi FAKE_Widget.Color=1");
  EXPECT_EQ(key.exitCode, 6);
  EXPECT_NE(key.err.find("class FAKE_Widget has no key 'Color'; its keys are: Name, Number"),
            std::string::npos);
  EXPECT_EQ(run("gi 'FAKE_Widget.Name='").exitCode, 6);
}

TEST(ProgramTest, ErrorsAreInTheJsonToo) {
  const auto json = jsonOf(run(R"(--json gi 'FAKE_Widget.Name="x",Number=0')"));
  EXPECT_EQ(json["version"], 1);
  EXPECT_EQ(json["error"]["exitCode"], 6);
  EXPECT_EQ(json["error"]["rc"], 6);
  EXPECT_EQ(json["error"]["name"], "CMPI_RC_ERR_NOT_FOUND");
}

TEST(ProgramTest, WalksFollowTheLinks) {
  const Outcome names = run(std::string("ain ") + oddName);
  EXPECT_EQ(names.exitCode, 0);
  EXPECT_EQ(names.out,
            "root/fake:FAKE_Widget.Name=\"widget0\",Number=0\nroot/"
            "fake:FAKE_Widget.Name=\"widget2\",Number=2\n");
  EXPECT_EQ(run(std::string("ain ") + oddName + " --role Antecedent").out,
            "root/fake:FAKE_Widget.Name=\"widget2\",Number=2\n");
  EXPECT_EQ(run(std::string("ain ") + oddName + " --result-class FAKE_Gadget").out, "");
  EXPECT_EQ(jsonOf(run(std::string("--json ai ") + oddName))["instances"].size(), 2U);
  EXPECT_EQ(
      jsonOf(run(std::string("--json ri ") + oddName + " --assoc-class FAKE_Link"))["instances"]
          .size(),
      2U);
  const Outcome references = run(std::string("rin ") + oddName + " --role Dependent");
  EXPECT_EQ(references.out.substr(0, 51), R"(root/fake:FAKE_Link.Antecedent="root/fake:FAKE_Widg)");
  EXPECT_NE(run(std::string("ri ") + oddName).out.find(R"(FAKE_Widget.Name="widget0",Number=0)"),
            std::string::npos);
}

TEST(ProgramTest, MethodsAreCalledWithTypedArguments) {
  const Outcome result = run(std::string("cm ") + first +
                             " paint Coats=2 Color=blue 'Target=FAKE_Widget.Name=\"widget2\"'");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(result.out,
            "return = 0\nCoats = 3\nLog = {\"Coats:144\", \"Color:5632\", \"Target:4352\"}\n");
  const Outcome json = run(std::string("--json cm ") + first + " Paint Coats=2");
  EXPECT_EQ(jsonOf(json)["return"], 0);
  EXPECT_EQ(jsonOf(json)["outputs"]["Coats"], 3);
}

TEST(ProgramTest, MethodsTakeListsPathsInstancesAndFiles) {
  const std::string file = testing::TempDir() + "image" + std::to_string(getpid());
  std::ofstream(file, std::ios::binary) << std::string("\x00\xFF", 2);
  const Outcome result =
      run(std::string("cm ") + first + " Paint Data=@" + file +
          R"( Words=a,b 'Targets=["FAKE_Widget.Number=1","FAKE_Widget.Number=2"]')"
          R"( 'Setting={"class":"FAKE_Widget","properties":{"Color":"red"}}')");
  std::filesystem::remove(file);
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_NE(
      result.out.find(R"(Log = {"Data:8320", "Words:13824", "Targets:12544", "Setting:4096"})"),
      std::string::npos)
      << result.out;
}

TEST(ProgramTest, AReturnValueThatIsNotZeroIsCodeNine) {
  const Outcome result = run(std::string("cm ") + first + " Paint Color=none");
  EXPECT_EQ(result.exitCode, 9);
  EXPECT_EQ(result.out.substr(0, 11), "return = 5\n");
}

TEST(ProgramTest, BadMethodsAndArgumentsAreCodeEight) {
  const Outcome method = run(std::string("cm ") + first + " Polish");
  EXPECT_EQ(method.exitCode, 8);
  EXPECT_EQ(method.err,
            "tvxcim: class FAKE_Widget has no method 'Polish'; it has: Paint, Misbehave\n");
  EXPECT_EQ(run(std::string("cm ") + first + " Paint Coats=many").exitCode, 8);
  EXPECT_EQ(run(std::string("mi ") + first + " Colour=red").exitCode, 8);
  EXPECT_EQ(run(std::string("cm ") + first + " Paint Data=@/nowhere/file").exitCode, 10);
}

TEST(ProgramTest, InstancesAreCreatedModifiedAndDeleted) {
  EXPECT_EQ(run("ci FAKE_Widget Name=new Number=3").out,
            "root/fake:FAKE_Widget.Name=\"new\",Number=3\n");
  const Outcome duplicate = run("ci FAKE_Widget Name=widget1");
  EXPECT_EQ(duplicate.exitCode, 7);
  EXPECT_NE(duplicate.err.find("already exists (CMPI_RC_ERR_ALREADY_EXISTS)"), std::string::npos);
  EXPECT_EQ(run(std::string("mi ") + first + " Color=green").exitCode, 0);
  const Outcome refused = run(std::string("mi ") + first + " Color=red");
  EXPECT_EQ(refused.exitCode, 7);
  EXPECT_NE(
      refused.err.find(
          "invalid parameter (CMPI_RC_ERR_INVALID_PARAMETER): only the color green can be set"),
      std::string::npos);
  EXPECT_EQ(run(std::string("di ") + first).exitCode, 0);
}

TEST(ProgramTest, ForeignInstancesAreServed) {
  const std::string file = testing::TempDir() + "foreign" + std::to_string(getpid()) + ".json";
  std::ofstream(file)
      << R"({"version": 1, "instances": [{"class": "FAKE_Foreign", "properties": {"Id": "a", "Level": 4}}]})";
  EXPECT_EQ(run("--foreign " + file + " ei FAKE_Foreign --property-list Id,Level").out,
            "Id  Level\na   4\n");
  std::ofstream(file) << "{";
  const Outcome bad = run("--foreign " + file + " ei FAKE_Foreign");
  EXPECT_EQ(bad.exitCode, 10);
  EXPECT_NE(bad.err.find("--foreign: '" + file + "'"), std::string::npos);
  unlink(file.c_str());
  EXPECT_EQ(run("--foreign /nowhere/x.json ei FAKE_Foreign").exitCode, 10);
}

TEST(ProgramTest, StrictModeReportsAndALeakIsCodeEleven) {
  const Outcome clean = run("--strict ei FAKE_Gadget");
  EXPECT_EQ(clean.exitCode, 0);
  EXPECT_EQ(clean.err, "strict: nothing leaked\n");
  const Outcome leak = run(std::string("--strict cm ") + first + " Misbehave How=leak-clone");
  EXPECT_EQ(leak.exitCode, 11);
  EXPECT_NE(leak.err.find("invokeMethod FAKE_Widget: 1 cloned CMPIString leaked\n"),
            std::string::npos)
      << leak.err;
  EXPECT_NE(leak.err.find("strict: something leaked\n"), std::string::npos);
}

TEST(ProgramTest, StrictModeReportsAfterAFailureToo) {
  const Outcome result = run(R"(--strict gi 'FAKE_Widget.Name="x",Number=0')");
  EXPECT_EQ(result.exitCode, 6);
  EXPECT_NE(result.err.find("strict: nothing leaked\n"), std::string::npos) << result.err;
}

TEST(ProgramTest, TheManualPageListsExitCodesAndOptions) {
  std::ifstream stream(TVXCIM_MAN);
  const std::string page((std::istreambuf_iterator<char>(stream)), {});
  for (const ExitCodeText& each : exitCodeTexts) {
    EXPECT_NE(
        page.find(".B " + std::to_string(static_cast<int>(each.code)) + "\n" + manText(each.text)),
        std::string::npos)
        << each.text;
  }
  const std::string help = run("--help", false).out;
  std::size_t options = 0;
  for (std::size_t i = help.find("\n  --"); i != std::string::npos;
       i = help.find("\n  --", i + 1)) {
    const std::size_t start = i + 3;
    const std::string option = help.substr(start, help.find_first_of(" \n", start) - start);
    EXPECT_NE(page.find(manText(option)), std::string::npos) << option;
    ++options;
  }
  EXPECT_GE(options, 10U);
}

TEST(ProgramTest, BrokerVersionsAreSelectable) {
  for (const char* version : {"0", "100", "200"}) {
    EXPECT_EQ(run(std::string("--broker-version ") + version + " ein FAKE_Gadget").out,
              "root/fake:FAKE_Gadget.Name=\"widget0\",Number=0\n")
        << version;
  }
}

TEST(ProgramTest, SimNeedsTheSimulatedLibraries) {
  // No simulated libraries lie beside this program.
  const Outcome result = run("--sim ei FAKE_Widget");
  EXPECT_EQ(result.exitCode, 3);
  EXPECT_NE(result.err.find("the simulated libraries were not found (liblrmapi.so)"),
            std::string::npos)
      << result.err;
  EXPECT_EQ(run("--root /nowhere ei FAKE_Widget").exitCode, 10);
}

}  // namespace
}  // namespace tvx::host
