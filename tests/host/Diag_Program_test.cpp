// `tvxcim --sim diag` as a person runs it.
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

using DiagProgramTest = test::Simulated_Program;

TEST_F(DiagProgramTest, ListsTheTests) {
  const test::Outcome result = run("--sim single --strict diag list");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(lines(result.out), 10U) << result.out;
  EXPECT_NE(result.out.find("external-loopback"), std::string::npos);
  const auto json = nlohmann::json::parse(run("--sim single --json diag list").out);
  EXPECT_EQ(json["command"], "diag list");
  ASSERT_EQ(json["tests"].size(), 9U);
  EXPECT_EQ(json["tests"][8]["test"], "self");
  EXPECT_EQ(json["tests"][8]["name"], "TVX:FCHBA Self Test");
  EXPECT_EQ(json["tests"][8]["version"], "1.2.1");
  EXPECT_EQ(json["tests"][8]["description"],
            "Test allows all components of the FCHBA to be tested");
}

TEST_F(DiagProgramTest, TellsThatATestPassed) {
  const test::Outcome result = run("--sim diagnostics --strict diag run status 10000254560C5010");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(result.out, "passed: TVX:FCHBA Status Test Resulted with Success\n");
  EXPECT_EQ(result.err.find("TVX:FCHBA Status Test on 10:00:02:54:56:0C:50:10"), 0U) << result.err;
}

TEST_F(DiagProgramTest, TellsOfTheJobAndTheRecord) {
  const auto good = nlohmann::json::parse(
      run("--sim diagnostics --json diag run status 10000254560C5010").out)["run"];
  EXPECT_EQ(good["passed"], true);
  EXPECT_EQ(good["job"]["id"], "TVX:FCHBA Status Test:1:65535") << "the first job of a process";
  EXPECT_EQ(good["job"]["state"], 7);
  EXPECT_EQ(good["job"]["percent"], 100);
  EXPECT_EQ(good["record"]["job"], good["job"]["id"]);
  EXPECT_EQ(good["record"]["LoopsPassed"], 0);
  EXPECT_TRUE(good["record"]["CompletedCycles"].is_null()) << "this test runs no cycles";
  const auto gone = nlohmann::json::parse(
      run("--sim diagnostics --json diag run status 10000254560C5010 --delete-job").out)["run"];
  EXPECT_EQ(gone["passed"], true) << "the record stands";
  EXPECT_TRUE(gone["job"].is_null());
}

TEST_F(DiagProgramTest, TellsWhyATestWasRefused) {
  const std::filesystem::path path = m_Temporary / "refused.json";
  const auto refused = [&](int status) {
    std::ofstream(path) << R"({"cards": [{"model": "TVX16002", "ports": [
        {"wwpn": "10000254560C4110"}]}], "faults": [{"call": "LRM_ResetHBA", "status": )"
                        << status << "}]}";
    return run("--sim=" + path.string() + " --json diag run reset 10000254560C4110");
  };
  for (const int status : {64, 63, 2, 190}) {  // busy, unavailable and unsupported
    const test::Outcome result = refused(status);
    EXPECT_EQ(result.exitCode, 9) << status << result.err;
    const auto run = nlohmann::json::parse(result.out)["run"];
    EXPECT_EQ(run["result"], 40000 + status);
    EXPECT_EQ(run["passed"], false);
    EXPECT_TRUE(run["job"].is_null());
    EXPECT_TRUE(run["record"].is_null());
  }
  const test::Outcome failed = refused(148);
  EXPECT_EQ(failed.exitCode, 12) << failed.err;
  const auto run = nlohmann::json::parse(failed.out)["run"];
  EXPECT_EQ(run["result"], 40148);
  EXPECT_EQ(run["passed"], false);
  EXPECT_EQ(run["job"]["state"], 10);
  EXPECT_EQ(run["job"]["percent"], 0);
  EXPECT_EQ(run["record"]["passed"], false);
}

TEST_F(DiagProgramTest, TellsThatATestFailedThoughTheMethodAnswersZero) {
  const test::Outcome result =
      run("--sim diagnostics --json diag run 'TVX:FCHBA Internal Loopback Test' 10000254560C5011 "
          "--set LoopControlParameter=20 --set BufferPattern=1a2b --delete-job");
  EXPECT_EQ(result.exitCode, 12) << result.err;
  const auto run = nlohmann::json::parse(result.out)["run"];
  EXPECT_EQ(run["test"], "internal-loopback");
  EXPECT_EQ(run["result"], 0);
  EXPECT_EQ(run["passed"], false);
  EXPECT_EQ(run["record"]["CompletedCycles"], 20) << "the settings were taken";
  EXPECT_EQ(run["record"]["LoopsFailed"], 1);
  EXPECT_EQ(run["record"]["text"].get<std::string>().find(
                "TVX:FCHBA Internal Loopback Test Resulted with Failure, Result - Timeout"),
            0U);
  EXPECT_NE(result.err.find("Internal Loopback Test"), std::string::npos);
  EXPECT_GE(lines(result.err), 2U) << "it is told for how long it has been running: " << result.err;
}

TEST_F(DiagProgramTest, TellsThatATestLeftNoResult) {
  const test::Outcome busy = run("--sim diagnostics diag run ping 10000254560C5010");
  EXPECT_EQ(busy.exitCode, 9) << "a ping without a target";
  EXPECT_EQ(busy.out, "no result: the method answered 5 and left no record\n");
  const test::Outcome dark = run("--sim diagnostics diag run beacon 10000254560C5012");
  EXPECT_EQ(dark.exitCode, 12) << "a beacon that is not there answers 0";
  EXPECT_EQ(dark.out, "no result: the method answered 0 and left no record\n");
}

TEST_F(DiagProgramTest, TellsWhatThereIsInstead) {
  const test::Outcome test = run("--sim single diag run nothing 10000254560C5010");
  EXPECT_EQ(test.exitCode, 6);
  EXPECT_NE(test.err.find("the tests are beacon, echo, external-loopback, host-loopback, "
                          "internal-loopback, ping, status, reset, self"),
            std::string::npos);
  EXPECT_EQ(run("--sim single diag run self 1000000000000000").exitCode, 6);
  EXPECT_EQ(run("--sim diagnostics diag run self 10000254560C5010 --set Nothing=1").exitCode, 8);
  EXPECT_EQ(run("--sim none diag run self 10000254560C5010").exitCode, 6);
  EXPECT_EQ(run("--sim single diag run self").exitCode, 2);
  EXPECT_EQ(run("--sim single diag").exitCode, 2);
}

TEST_F(DiagProgramTest, ResultsLastAsLongAsTheLibrary) {
  EXPECT_EQ(run("--sim single --strict diag results").out,
            "no results; they last as long as the provider stays loaded\n");
  EXPECT_EQ(nlohmann::json::parse(run("--sim single --json diag results").out)["results"].size(),
            0U);
  EXPECT_EQ(run("--sim single --strict diag clear").out, "9 logs cleared\n");
  EXPECT_EQ(run("--sim single diag clear self").out, "1 log cleared\n");
  EXPECT_EQ(nlohmann::json::parse(run("--sim single --json diag clear").out)["cleared"], 9);
  EXPECT_EQ(run("--sim single diag clear nothing").exitCode, 6);
}

}  // namespace
}  // namespace tvx::host
