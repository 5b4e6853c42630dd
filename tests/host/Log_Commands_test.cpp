// `tvxcim log`, `driverlog` and `settings` as a person uses them.
#include <fstream>
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;
using nlohmann::json;

class LogCommandsTest : public test::Simulated_Program {
 protected:
  LogCommandsTest() {
    for (const char* folder : {"etc", "var/log", "opt/ibm/platform/log"}) {
      fs::create_directories(m_Root / folder);
    }
  }
  test::Outcome tool(const std::string& words) {
    return run("--sim --root " + m_Root.string() + " " + words);
  }
  json toolJson(const std::string& words) { return json::parse(tool("--json " + words).out); }
  void writeFile(const char* name, const std::string& text) {
    std::ofstream(m_Root / name, std::ios::binary) << text;
  }

  const fs::path m_Root = m_Temporary / "root";
};

TEST_F(LogCommandsTest, ANewMachineLogsFirstFailuresOnly) {
  const test::Outcome shown = tool("log show");
  EXPECT_EQ(shown.exitCode, 0) << shown.err;
  EXPECT_NE(shown.out.find("state  enabled\nlevel  not set\nmode   file\npath   "),
            std::string::npos)
      << shown.out;
  EXPECT_NE(shown.out.find("(first failures only)\nno records in memory\n"), std::string::npos);
  EXPECT_NE(tool("log enable").out.find("no path is set yet"), std::string::npos);
  const test::Outcome refused = tool("log level err");
  EXPECT_EQ(refused.exitCode, 8);
  EXPECT_EQ(refused.err, "tvxcim: the log has no file yet; 'tvxcim log path FILE' sets one\n");
}

TEST_F(LogCommandsTest, PathLevelAndModeOutliveTheCommand) {
  const std::string path = (m_Root / "var/log/trace.log").string();
  EXPECT_EQ(tool("log path " + path).exitCode, 0);
  EXPECT_TRUE(fs::exists(path));
  EXPECT_EQ(tool("log level warn").exitCode, 0);
  EXPECT_EQ(tool("log mode both").exitCode, 0);
  const json log = toolJson("log show")["log"];
  EXPECT_EQ(log["path"], path);
  EXPECT_EQ(log["level"], 2);
  EXPECT_EQ(log["mode"], "both");
  EXPECT_EQ(log["enabled"], true);
  EXPECT_EQ(log["firstFailuresOnly"], false);
  ASSERT_FALSE(log["records"].empty());
  EXPECT_EQ(log["records"][0]["text"], "[ Continuing logs in Torvex log provider. ]");
  EXPECT_EQ(log["records"][0]["level"], "1");
  EXPECT_EQ(tool("log path").out,
            "state  enabled\nlevel  warn\nmode   both\npath   " + path + "\n");
}

TEST_F(LogCommandsTest, TheLogIsSwitchedOffOnAndCleared) {
  writeFile("etc/torvex_fc_provider.dmp", "1,5,1\n");
  EXPECT_EQ(tool("log disable").out, "state  disabled\nlevel  dbg\nmode   memory\npath   \n");
  EXPECT_EQ(toolJson("log level")["log"]["enabled"], false);
  EXPECT_EQ(tool("log enable").out, "state  enabled\nlevel  dbg\nmode   memory\npath   \n");
  EXPECT_EQ(toolJson("log level")["log"]["enabled"], true);
  EXPECT_EQ(tool("log clear").exitCode, 0);
}

TEST_F(LogCommandsTest, TheNewestRecordsCanBeChosen) {
  writeFile("etc/torvex_fc_provider.dmp", "1,5,1\n");
  const test::Outcome all = tool("log show");
  EXPECT_NE(all.out.find("Record  Time                 Level  Text\n"), std::string::npos);
  const json records = toolJson("log show")["log"]["records"];
  ASSERT_GT(records.size(), 2U);
  const json last = toolJson("log show --last 2")["log"]["records"];
  ASSERT_EQ(last.size(), 2U);
  EXPECT_EQ(last[1]["id"], records.back()["id"]);
  EXPECT_EQ(toolJson("log show --last 5000")["log"]["records"].size(), records.size());
}

TEST_F(LogCommandsTest, WordsThatAreNoLevelOrModeAreRefused) {
  writeFile("etc/torvex_fc_provider.dmp", "1,5,1\n");
  const test::Outcome level = tool("log level loud");
  EXPECT_EQ(level.exitCode, 8);
  EXPECT_EQ(level.err,
            "tvxcim: there is no log level 'loud'; take one of: crit (1), warn (2), err (3), info "
            "(4), dbg (5)\n");
  EXPECT_EQ(tool("log level 0").exitCode, 8);
  EXPECT_EQ(tool("log mode off").exitCode, 8);
  EXPECT_EQ(tool("log mode file").exitCode, 8) << "no file is set";
  EXPECT_EQ(tool("log path " + (m_Root / "missing/x.log").string()).exitCode, 9);
  EXPECT_EQ(tool("log").exitCode, 2);
}

TEST_F(LogCommandsTest, TheDriversLinesAreShownNewestFirst) {
  writeFile("var/log/messages", "kernel: tvfc 0: one\nother\nkernel: tvfc 1: \xff two\n");
  const test::Outcome shown = tool("driverlog show");
  EXPECT_EQ(shown.exitCode, 0) << shown.err;
  EXPECT_EQ(lines(shown.out), 3U) << shown.out;
  EXPECT_LT(shown.out.find("two"), shown.out.find("one"));
  const json list = toolJson("driverlog show --last 1")["log"]["records"];
  ASSERT_EQ(list.size(), 1U);
  EXPECT_EQ(list[0]["text"], "kernel: tvfc 1: \xef\xbf\xbd two") << "a byte that is no text";
  EXPECT_EQ(tool("driverlog enable").out, "enabled, 2 records\n");
  EXPECT_EQ(tool("driverlog clear").out, "disabled, 0 records\n");
  EXPECT_EQ(toolJson("driverlog enable")["log"]["recordCount"], 2);
}

TEST_F(LogCommandsTest, ShowingTheDriversLinesChangesNoSwitch) {
  writeFile("var/log/messages", "kernel: tvfc 0: one\n");
  for (const char* dump : {"1,5,0\n", "1,5,1\n"}) {
    writeFile("etc/torvex_fc_provider.dmp", dump);
    EXPECT_EQ(lines(tool("driverlog show").out), 2U) << dump;
    std::string kept;
    std::getline(std::ifstream(m_Root / "etc/torvex_fc_provider.dmp"), kept);
    EXPECT_EQ(kept + "\n", dump);
  }
}

TEST_F(LogCommandsTest, WithoutASystemLogThereAreNoLines) {
  EXPECT_EQ(tool("driverlog show").out, "no lines of the driver in the system log\n");
  EXPECT_EQ(toolJson("driverlog show")["log"]["records"], json::array());
}

TEST_F(LogCommandsTest, WithoutAdaptersThereIsNoDriverLog) {
  const test::Outcome result = run("--sim=none --root " + m_Root.string() + " driverlog show");
  EXPECT_EQ(result.exitCode, 6);
  EXPECT_NE(result.err.find("there is no driver log"), std::string::npos) << result.err;
}

TEST_F(LogCommandsTest, SettingsAreShownChangedAndKept) {
  const test::Outcome shown = tool("settings");
  EXPECT_EQ(shown.exitCode, 0) << shown.err;
  EXPECT_EQ(lines(shown.out), 4U) << shown.out;
  EXPECT_NE(shown.out.find("cachetimeout    10     5 to 30  10       This setting"),
            std::string::npos)
      << shown.out;
  EXPECT_EQ(tool("settings cachetimeout 25").exitCode, 0);
  const json settings = toolJson("settings")["settings"];
  ASSERT_EQ(settings.size(), 3U);
  EXPECT_EQ(settings[0]["name"], "cachetimeout");
  EXPECT_EQ(settings[0]["value"], 25);
  EXPECT_EQ(settings[0]["low"], 5);
  EXPECT_EQ(settings[0]["high"], 30);
  EXPECT_EQ(settings[0]["default"], 10);
}

TEST_F(LogCommandsTest, SettingsThatDoNotFitAreRefused) {
  const test::Outcome range = tool("settings cachetimeout 31");
  EXPECT_EQ(range.exitCode, 8);
  EXPECT_EQ(range.err, "tvxcim: 31 is out of range for cachetimeout, which goes from 5 to 30\n");
  EXPECT_EQ(tool("settings cachetimeout many").exitCode, 8);
  EXPECT_EQ(tool("settings cachetimeout -1").exitCode, 8);
  const test::Outcome unknown = tool("settings nosuch 1");
  EXPECT_EQ(unknown.exitCode, 6);
  EXPECT_EQ(unknown.err,
            "tvxcim: there is no setting 'nosuch'; there are: cachetimeout, adapterrefresh, "
            "sanrefresh\n");
  EXPECT_EQ(tool("settings cachetimeout").exitCode, 2) << "no value";
  EXPECT_EQ(toolJson("settings")["settings"][0]["value"], 10);
}

}  // namespace
}  // namespace tvx::host
