// `tvxcim wwn`, `bootcode` and `dump` as a person uses them.
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"

namespace tvx::host {
namespace {

using nlohmann::json;

constexpr const char* port = "10:00:02:54:56:0C:41:10";
constexpr const char* digits = "10000254560C4110";

class ManagementCommandsTest : public test::Simulated_Program {
 protected:
  test::Outcome tool(const std::string& words) {
    return run("--sim --root " + m_Temporary.string() + " " + words,
               "TVX_SIM_STATE=" + (m_Temporary / "state.json").string());
  }
  json toolJson(const std::string& words) { return json::parse(tool("--json " + words).out); }
  /// The names of one kind.
  json names(const std::string& kind) {
    const json shown = toolJson(std::string("wwn show ") + port);
    for (const json& row : shown["wwns"]["names"]) {
      if (row["kind"] == kind) {
        return row;
      }
    }
    return {};
  }
};

TEST_F(ManagementCommandsTest, NamesAreShownByKind) {
  const test::Outcome shown = tool(std::string("wwn show ") + port);
  EXPECT_EQ(shown.exitCode, 0) << shown.err;
  EXPECT_EQ(lines(shown.out), 7u) << shown.out;
  EXPECT_NE(shown.out.find("current"), std::string::npos);
  EXPECT_NE(shown.out.find("10:00:02:54:56:0c:41:10"), std::string::npos);
  EXPECT_NE(shown.out.find("can change: "), std::string::npos);
  EXPECT_EQ(names("configured")["note"], "none");
  EXPECT_EQ(names("configured")["wwpn"], "");
  EXPECT_EQ(names("current")["wwpn"], "10:00:02:54:56:0c:41:10");
}

TEST_F(ManagementCommandsTest, NamesAreSetAndRestored) {
  const test::Outcome set =
      tool(std::string("wwn set ") + digits + " 10:00:00:00:00:00:0b:01 2000000000000B01");
  EXPECT_EQ(set.exitCode, 0) << set.err;
  EXPECT_EQ(set.out.find(std::string(port) + ": new names 10:00:00:00:00:00:0B:01 "
                                             "20:00:00:00:00:00:0B:01: "),
            0u)
      << set.out;
  // The next process is a reboot to the simulated host: the port has its new name.
  EXPECT_EQ(tool(std::string("wwn show ") + port).exitCode, 6);
  const test::Outcome restored = tool("wwn restore 1000000000000B01");
  EXPECT_EQ(restored.exitCode, 0) << restored.err;
  EXPECT_NE(restored.out.find("factory names: "), std::string::npos) << restored.out;
  EXPECT_EQ(names("current")["wwpn"], "10:00:02:54:56:0c:41:10");
}

TEST_F(ManagementCommandsTest, NamesThatAreNoneAreRefused) {
  const test::Outcome refused = tool(std::string("wwn set ") + port + " 1234 2000000000000B01");
  EXPECT_EQ(refused.exitCode, 8);
  EXPECT_NE(refused.err.find("'1234' is no World Wide Name"), std::string::npos) << refused.err;
  EXPECT_EQ(tool("wwn show 1000000000000FFF").exitCode, 6);
  EXPECT_EQ(tool("wwn").exitCode, 2);
}

TEST_F(ManagementCommandsTest, BootCodeIsSwitched) {
  const std::string on = std::string("bootcode on ") + port;
  EXPECT_EQ(tool(on).out, std::string(port) + ": boot code is on (0)\n");
  EXPECT_EQ(toolJson(std::string("bootcode status ") + port)["bootcode"]["state"], 1);
  EXPECT_EQ(tool(std::string("bootcode off ") + port).exitCode, 0);
  EXPECT_EQ(tool(std::string("bootcode status ") + port).out,
            std::string(port) + ": boot code is off (0)\n");
}

TEST_F(ManagementCommandsTest, DumpsAreMadeListedKeptAndRemoved) {
  const std::string behind = std::string(" ") + port;
  const json before = toolJson("dump list" + behind)["dumps"];
  EXPECT_EQ(tool("dump create" + behind).out, std::string(port) + ": a dump was written (0)\n");
  const json dumps = toolJson("dump list" + behind)["dumps"];
  EXPECT_EQ(dumps["files"].size(), before["files"].size() + 1);
  EXPECT_EQ(tool("dump keep" + behind + " 3").out,
            std::string(port) + ": at most 3 dumps are kept (0)\n");
  EXPECT_EQ(toolJson("dump list" + behind)["dumps"]["keep"], 3);
  EXPECT_EQ(tool("dump keep" + behind + " 21").exitCode, 2);
  EXPECT_EQ(tool("dump delete" + behind).exitCode, 0);
  EXPECT_EQ(tool("dump list" + behind).out, std::string(port) + ": no dumps\n");
}

}  // namespace
}  // namespace tvx::host
