// What a client changes: settings, the beacon of a port, the parameters of a log.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "Served_Program.h"
#include "Wbemcli.h"

namespace tvx::host::test {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

class ChangesTest : public ::testing::Test {
 protected:
  /// The first instance of a class whose name has `part` in it, as the client takes it.
  std::string named(const std::string& className, const std::string& part = "") const {
    const WbemcliAnswer names =
        wbemcli({"ein", "http://" + m_Server.host() + "/root/torvex:" + className});
    const auto found = std::find_if(names.lines.begin(), names.lines.end(), [&](const auto& line) {
      return line.find(part) != std::string::npos;
    });
    if (found == names.lines.end()) {
      ADD_FAILURE() << className << " " << part << ": " << names.text;
      return {};
    }
    return m_Texts.asInput(*found);
  }
  std::string property(const std::string& name, const std::string& which) const {
    const WbemcliAnswer answer = wbemcli({"gp", name, which});
    return answer.lines.empty() ? answer.text : answer.lines.front();
  }

  ServedProgram m_Server{{TVXCIM, "--sim"}};
  WbemcliTexts m_Texts{m_Server.host()};
};

TEST_F(ChangesTest, ASettingOfTheProviderIsModified) {
  const std::string setting = named("TVXHBA_ProviderConfigSetting", "cachetimeout");
  EXPECT_EQ(property(setting, "current"), "10");
  const WbemcliAnswer modified = wbemcli({"mi", setting, "current=20"});
  EXPECT_EQ(modified.exitCode, 0) << modified.text;
  EXPECT_EQ(property(setting, "current"), "20");
  const WbemcliAnswer refused = wbemcli({"mi", setting, "current=999999"});
  EXPECT_NE(refused.exitCode, 0);
  EXPECT_THAT(refused.text, HasSubstr("(4) CIM_ERR_INVALID_PARAMETER"));
  EXPECT_EQ(property(setting, "current"), "20");
}

TEST_F(ChangesTest, OnlyWhatIsWrittenIsModified) {
  const std::string dumps = named("TVXHBA_DumpData");
  const std::string folder = property(dumps, "DumpDirectory");
  EXPECT_EQ(wbemcli({"mi", dumps, "RetentionCount=7"}).exitCode, 0);
  EXPECT_EQ(property(dumps, "RetentionCount"), "7");
  EXPECT_EQ(property(dumps, "DumpDirectory"), folder);
}

TEST_F(ChangesTest, TheBeaconOfAPortIsSwitched) {
  const std::string port = named("TVXHBA_FCPort");
  EXPECT_EQ(property(port, "LocationIndicator"), "3");
  EXPECT_EQ(wbemcli({"mi", port, "LocationIndicator=2"}).exitCode, 0);
  EXPECT_EQ(property(port, "LocationIndicator"), "2");
  EXPECT_EQ(wbemcli({"sp", port, "LocationIndicator=3"}).exitCode, 0);
  EXPECT_EQ(property(port, "LocationIndicator"), "3");
}

TEST_F(ChangesTest, WhatIsReadOnlyIsRefusedAndStays) {
  const std::string card = named("TVXHBA_Card");
  const std::string before = property(card, "ElementName");
  const WbemcliAnswer refused = wbemcli({"mi", card, "ElementName=\"mine\""});
  EXPECT_NE(refused.exitCode, 0);
  EXPECT_THAT(refused.text, HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
  EXPECT_EQ(property(card, "ElementName"), before);
  EXPECT_THAT(wbemcli({"di", card}).text, HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
}

TEST_F(ChangesTest, AModifiedInstanceThatIsNotThereIsNotFound) {
  std::string setting = named("TVXHBA_ProviderConfigSetting", "cachetimeout");
  setting.replace(setting.find("cachetimeout"), 12, "nothing");
  EXPECT_THAT(wbemcli({"mi", setting, "current=20"}).text, HasSubstr("CIM_ERR_"));
}

TEST_F(ChangesTest, TheParametersOfTheProvidersLogAreSet) {
  const std::string log = named("TVXHBA_RecordLog", "ProviderLog");
  // Level and mode are both needed: one alone is out of range.
  EXPECT_THAT(wbemcli({"cm", log, "SetLogParams.LogLevel=4"}).text,
              HasSubstr("SetLogParams: 32968"));
  const std::string file = property(log, "TracePath");
  const WbemcliAnswer set =
      wbemcli({"cm", log, "SetLogParams.LogLevel=4,LogMode=2,TracePath=" + file});
  EXPECT_EQ(set.exitCode, 0) << set.text;
  EXPECT_THAT(set.text, HasSubstr("SetLogParams: 0"));
  EXPECT_EQ(property(log, "LogLevel"), "4");
}

TEST_F(ChangesTest, MethodsThatAreNotForThisInstanceSaySo) {
  // The driver keeps its own log; counters of a port go on for as long as it runs.
  EXPECT_THAT(
      wbemcli({"cm", named("TVXHBA_RecordLog", "FC Driver Record Log"), "SetLogParams.LogLevel=4"})
          .text,
      HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
  EXPECT_THAT(wbemcli({"cm", named("TVXHBA_FCPortStatistics"), "ResetSelectedStats"}).text,
              HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
  EXPECT_THAT(wbemcli({"cm", named("TVXHBA_FCPort"), "ResetSelectedStats"}).text,
              HasSubstr("(17) CIM_ERR_METHOD_NOT_FOUND"));
}

}  // namespace
}  // namespace tvx::host::test
