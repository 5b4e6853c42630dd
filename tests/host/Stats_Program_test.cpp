// `tvxcim --sim stats` as a person runs it.
#include <nlohmann/json.hpp>
#include <sstream>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

using StatsProgramTest = test::Simulated_Program;

std::size_t occurrences(const std::string& text, const std::string& part) {
  std::size_t count = 0;
  for (std::size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
    ++count;
  }
  return count;
}

TEST_F(StatsProgramTest, ShowsTheCountersOfEveryPort) {
  const test::Outcome result = run("--sim --strict stats");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(lines(result.out), 5U) << result.out;
  EXPECT_EQ(result.out.find("WWPN  "), 0U) << result.out;
  EXPECT_EQ(result.out.find("TX/S"), std::string::npos) << "rates need two samples";
}

TEST_F(StatsProgramTest, ShowsOnePortByItsName) {
  const test::Outcome result = run("--sim stats 10:00:02:54:56:0c:41:10");
  EXPECT_EQ(lines(result.out), 2U) << result.out << result.err;
  EXPECT_NE(result.out.find("10:00:02:54:56:0C:41:10"), std::string::npos) << result.out;
  const test::Outcome unknown = run("--sim stats 1000000000000000");
  EXPECT_EQ(unknown.exitCode, 6);
  EXPECT_NE(unknown.err.find("there is no port '1000000000000000'"), std::string::npos);
}

TEST_F(StatsProgramTest, ShowsWhatTheShippedScenarioCounts) {
  const test::Outcome result = run("--sim live --json stats");
  const auto json = nlohmann::json::parse(result.out);
  ASSERT_EQ(json["ports"].size(), 3U) << result.err;
  const auto& counters = json["ports"][0]["counters"];
  EXPECT_EQ(counters["CRCErrors"], 0) << "the first value of its script";
  EXPECT_EQ(counters["LinkFailures"], 2);
  EXPECT_GE(counters["BytesTransmitted"], 4000000);
}

TEST_F(StatsProgramTest, PrintsJson) {
  const test::Outcome result = run("--sim --json stats");
  const auto json = nlohmann::json::parse(result.out);
  EXPECT_EQ(json["version"], 1);
  EXPECT_EQ(json["command"], "stats");
  ASSERT_EQ(json["ports"].size(), 4U);
  EXPECT_GE(json["ports"][0]["counters"]["PacketsTransmitted"], 9602720);
  EXPECT_EQ(json["ports"][0]["time"].get<std::string>().size(), 25U);
}

TEST_F(StatsProgramTest, WatchesSoManySamples) {
  const test::Outcome result = run("--sim --strict stats --watch 0.1 --count 3");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(occurrences(result.out, "TX FRAMES/S"), 3U) << result.out;
  EXPECT_EQ(lines(result.out), 15U) << result.out;
}

TEST_F(StatsProgramTest, WatchingShowsTheRatesBetweenTwoReadings) {
  const std::string words = "stats 10000254560C5001 --watch 0.3 --count 2";
  const test::Outcome result = run("--sim live --json " + words, "LD_PRELOAD=" FAST_CLOCK);
  ASSERT_EQ(result.exitCode, 0) << result.err;
  std::istringstream samples(result.out);
  nlohmann::json first;
  nlohmann::json second;
  samples >> first >> second;
  EXPECT_TRUE(first["ports"][0]["perSecond"]["BytesTransmitted"].is_null());
  const auto& rates = second["ports"][0]["perSecond"];
  const double sent = rates["BytesTransmitted"];
  EXPECT_GT(sent, 2e7) << "of 25,000,000 words a second";
  EXPECT_LT(sent, 5e8);
  EXPECT_DOUBLE_EQ(rates["BytesReceived"], 2 * sent);
  const test::Outcome table = run("--sim live " + words, "LD_PRELOAD=" FAST_CLOCK);
  ASSERT_EQ(lines(table.out), 4U) << table.out << table.err;
  EXPECT_EQ(occurrences(table.out, " MB/s"), 2U) << table.out;
}

TEST_F(StatsProgramTest, WatchingEndsWithASignalAndUnloadsTheLibrary) {
  const std::string sample = (m_Temporary / "sample").string();
  const test::Outcome result = test::runShell(
      "(env -u TVX_ROOT -u TVX_SIM_STATE -u TVX_SIM_SCENARIO TMPDIR=" + m_Temporary.string() +
      " " TVXCIM " --sim --strict stats --watch 3600 >" + sample +
      " & child=$!; for i in $(seq 1200); do grep -q 'TX FRAMES/S' " + sample +
      " && break; sleep 0.05; done; kill -TERM $child; wait $child; code=$?; cat " + sample +
      "; exit $code)");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(occurrences(result.out, "TX FRAMES/S"), 1U) << result.out;
}

TEST_F(StatsProgramTest, RefusesWordsThatMakeNoSense) {
  for (const char* words :
       {"--sim stats --watch 0", "--sim stats --watch soon", "--sim stats --count 2",
        "--sim stats --watch 1 --count 0", "--sim stats one two"}) {
    EXPECT_EQ(run(words).exitCode, 2) << words;
  }
}

}  // namespace
}  // namespace tvx::host
