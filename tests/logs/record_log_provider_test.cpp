// The methods of the record logs, and the records of the provider's own.
#include <filesystem>
#include <fstream>
#include <sstream>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "Failing_New.h"
#include "agent/RecordLogs.h"
#include "logs/Log_Entry_Providers.h"
#include "logs/TVXHBA_RecordLog_Provider.h"

namespace cimrt::test {
namespace {

template <class T>
Property<T> valueOf(T value) {
  Property<T> property{};
  property.set(value);
  return property;
}

class Record_Log_Methods : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    std::filesystem::create_directories(root / "var/log");
    useScenario(singlePortCards(1));
  }

  /// An agent whose logger was configured before: mode, level, enabled, and the log file.
  void begin(const char* dump = "1,3,1\n") {
    if (dump) writeFile("etc/torvex_fc_provider.dmp", dump);
    agent = &startAgent();
    refresh(*agent);
  }
  void TearDown() override {
    getLogger().setMode(TVX_LOG_MODE_OFF);
    Agent_Test::TearDown();
  }

  TVXHBA_RecordLog& providerLog() { return *findRecordLog(*agent, providerLogInstanceID(*agent)); }
  TVXHBA_RecordLog& driverLog() { return *findRecordLog(*agent, driverLogInstanceID(*agent)); }
  static Ref<TVXHBA_RecordLog> unknownLog() {
    Ref<TVXHBA_RecordLog> other(TVXHBA_RecordLog::create());
    other->InstanceID.set("TVXHBA:ProviderLog:elsewhere");
    return other;
  }

  /// The method's result; the call's own status must be good.
  std::uint32_t setParams(int level, int mode, const std::string& path) {
    Property<std::uint32_t> result{};
    result.null = 1;
    EXPECT_EQ(TVXHBA_RecordLog_Provider().SetLogParams(
                  &providerLog(), valueOf(static_cast<std::uint16_t>(level)),
                  valueOf(static_cast<std::uint16_t>(mode)), valueOf(String(path.c_str())), result),
              INVOKE_METHOD_OK);
    EXPECT_FALSE(result.is_null());
    return result.value;
  }
  static std::uint32_t clear(const TVXHBA_RecordLog& record) {
    Property<std::uint32_t> result{};
    EXPECT_EQ(TVXHBA_RecordLog_Provider().ClearLog(&record, result), INVOKE_METHOD_OK);
    return result.value;
  }
  static std::uint32_t change(const TVXHBA_RecordLog& record, int state) {
    Property<std::uint32_t> result{};
    EXPECT_EQ(TVXHBA_RecordLog_Provider().RequestStateChange(
                  &record, valueOf(static_cast<std::uint16_t>(state)), nullptr,
                  Property<Datetime>{}, result),
              INVOKE_METHOD_OK);
    return result.value;
  }

  std::string file(const std::string& name) const { return (root / name).string(); }
  std::string contents(const std::string& name) const {
    std::ostringstream text;
    text << std::ifstream(root / name).rdbuf();
    return text.str();
  }
  /// The logger and the entry are as `begin` made them.
  void expectUnchanged() {
    EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_MEMORY);
    EXPECT_EQ(getLogger().level(), 3);
    EXPECT_EQ(agent->m_FileLogger.path(), "");
    EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "1,3,1\n");
    EXPECT_EQ(providerLog().LogMode.value, TVX_LOG_MODE_MEMORY);
    EXPECT_EQ(providerLog().LogLevel.value, 3);
    EXPECT_TRUE(providerLog().TracePath.is_null());
  }

  ProviderAgent* agent = nullptr;
};

// --- SetLogParams

TEST_F(Record_Log_Methods, LevelsOutsideOneToFiveAreRefused) {
  begin();
  for (const int level : {0, 6, 65535}) {
    log.clear();
    EXPECT_EQ(setParams(level, 1, ""), 0x80C8u) << level;
    EXPECT_EQ(log.level("Log level provided is out of range"), TVX_ERR);
    expectUnchanged();
  }
}

TEST_F(Record_Log_Methods, ModesOutsideOneToFourAreRefused) {
  begin();
  for (const int mode : {0, 5, 65535}) {
    log.clear();
    EXPECT_EQ(setParams(1, mode, ""), 0x80C8u) << mode;
    EXPECT_EQ(log.level("Log mode provided is out of range"), TVX_ERR);
    expectUnchanged();
  }
}

TEST_F(Record_Log_Methods, AMissingParameterIsOutOfRange) {
  begin();
  Property<std::uint16_t> none{};
  none.null = 1;
  none.value = 3;
  Property<String> noPath{};
  noPath.null = 1;
  Property<std::uint32_t> result{};
  TVXHBA_RecordLog_Provider provider;
  provider.SetLogParams(&providerLog(), none, valueOf<std::uint16_t>(1), noPath, result);
  EXPECT_EQ(result.value, 0x80C8u);
  provider.SetLogParams(&providerLog(), valueOf<std::uint16_t>(1), none, noPath, result);
  EXPECT_EQ(result.value, 0x80C8u);
  provider.SetLogParams(&providerLog(), valueOf<std::uint16_t>(1), valueOf<std::uint16_t>(2),
                        noPath, result);
  EXPECT_EQ(result.value, 0x80C8u);
  expectUnchanged();
}

TEST_F(Record_Log_Methods, ModesThatWriteAFileNeedOneThatCanBeWritten) {
  begin();
  std::filesystem::create_directories(root / "folder");
  for (const int mode : {2, 4})
    for (const std::string& path :
         {std::string(), file("folder"), file("missing/x.log"), std::string("/dev/null"),
          file("two\nlines"), file(std::string(300, 'x'))}) {
      log.clear();
      EXPECT_EQ(setParams(5, mode, path), 0x80C8u) << mode << path;
      EXPECT_EQ(log.level("Setting the trace path failed"), TVX_ERR);
      expectUnchanged();
    }
}

TEST_F(Record_Log_Methods, ModesWithoutAFileNeedNoPath) {
  begin();
  for (const int mode : {1, 3}) {
    log.clear();
    EXPECT_EQ(setParams(2, mode, ""), 0u);
    EXPECT_EQ(getLogger().mode(), mode);
    EXPECT_EQ(getLogger().level(), 2);
    EXPECT_EQ(log.level("Changing the record log parameters 2-" + std::to_string(mode) + "-"),
              TVX_CRIT);
    EXPECT_EQ(log.level("Setting path as "), TVX_DBG);
    EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), std::to_string(mode) + ",2,1\n");
  }
}

TEST_F(Record_Log_Methods, ANewFileGetsTheLinesFromThenOn) {
  begin();
  const std::string path = file("var/log/trace.log");
  EXPECT_EQ(setParams(5, 4, path), 0u);
  EXPECT_EQ(log.level("Changing the record log parameters 5-4-" + path), TVX_CRIT);
  EXPECT_EQ(log.count("Setting path as " + path), 1u);
  EXPECT_EQ(agent->m_FileLogger.path(), path);
  EXPECT_EQ(textOf(providerLog().TracePath), path);
  EXPECT_EQ(providerLog().LogLevel.value, 5);
  EXPECT_EQ(providerLog().LogMode.value, TVX_LOG_MODE_BOTH);
  EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "4,5,1\n" + path);
  TVX_LOG(TVX_DBG, "a line of the lowest level");
  EXPECT_NE(contents("var/log/trace.log").find("][TVX_DBG] a line of the lowest level\n"),
            std::string::npos);
}

TEST_F(Record_Log_Methods, APathEndsTheFirstFailureLog) {
  begin(nullptr);
  ASSERT_TRUE(getLogger().isDefaultLog());
  ASSERT_TRUE(agent->m_FileLogger.isRestricted());
  EXPECT_EQ(setParams(4, 2, file("var/log/trace.log")), 0u);
  EXPECT_FALSE(getLogger().isDefaultLog());
  EXPECT_FALSE(agent->m_FileLogger.isRestricted());
  stopAgent();  // which writes the dump only because the first-failure log is over
  EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "2,4,1\n" + file("var/log/trace.log"));
}

TEST_F(Record_Log_Methods, ParametersSurviveAReload) {
  begin();
  const std::string path = file("var/log/trace.log");
  ASSERT_EQ(setParams(2, 4, path), 0u);
  stopAgent();
  getLogger().setMode(TVX_LOG_MODE_OFF);
  getLogger().setLevel(5);
  agent = &startAgent();
  refresh(*agent);
  EXPECT_EQ(getLogger().level(), 2);
  EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_BOTH);
  EXPECT_EQ(agent->m_FileLogger.path(), path);
  EXPECT_FALSE(agent->m_FileLogger.isRestricted());
  EXPECT_EQ(textOf(providerLog().TracePath), path);
  EXPECT_EQ(providerLog().LogLevel.value, 2);
  EXPECT_EQ(providerLog().LogMode.value, TVX_LOG_MODE_BOTH);
}

TEST_F(Record_Log_Methods, WhatCannotBeWrittenOutIsNotUndoneByAnEarlierDump) {
  begin();
  std::filesystem::remove(root / "etc/torvex_fc_provider.dmp");
  std::filesystem::create_directories(root / "etc/torvex_fc_provider.dmp");
  EXPECT_EQ(setParams(5, 3, ""), 0u);
  EXPECT_EQ(log.level("Unable to open dump file\n"), TVX_ERR);
  EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_RESERVED);
  EXPECT_EQ(getLogger().level(), 5);
}

TEST_F(Record_Log_Methods, TheDriversLogHasNoParameters) {
  begin();
  Property<std::uint32_t> result{};
  result.null = 1;
  EXPECT_EQ(TVXHBA_RecordLog_Provider().SetLogParams(&driverLog(), valueOf<std::uint16_t>(1),
                                                     valueOf<std::uint16_t>(1), valueOf(String("")),
                                                     result),
            0x83);
  EXPECT_TRUE(result.is_null());
  // It is told before anything else is looked at.
  EXPECT_EQ(log.count("Invalid instance of Record Log"), 0u);
  EXPECT_EQ(log.level("SetLogParams is not supported for Driver Record Log Instance"), TVX_CRIT);
  expectUnchanged();
}

TEST_F(Record_Log_Methods, AnUnknownLogIsRefusedByAll) {
  begin();
  const Ref<TVXHBA_RecordLog> other = unknownLog();
  const Ref<TVXHBA_RecordLog> nameless(TVXHBA_RecordLog::create());
  for (const TVXHBA_RecordLog* each : {other.get(), nameless.get()}) {
    log.clear();
    Property<std::uint32_t> result{};
    EXPECT_EQ(TVXHBA_RecordLog_Provider().SetLogParams(each, valueOf<std::uint16_t>(1),
                                                       valueOf<std::uint16_t>(1),
                                                       valueOf(String("")), result),
              INVOKE_METHOD_OK);
    EXPECT_EQ(result.value, 0x812Cu);
    EXPECT_EQ(clear(*each), 0x812Cu);
    EXPECT_EQ(change(*each, 2), 0x812Cu);
    EXPECT_EQ(log.count("Invalid instance of Record Log"), 3u);
    EXPECT_EQ(log.level("Invalid instance of Record Log"), TVX_ERR);
  }
  expectUnchanged();
}

TEST_F(Record_Log_Methods, ParametersAreLookedAtInOrder) {
  begin();
  const auto refused = [this](int level, int mode, const std::string& text) {
    log.clear();
    EXPECT_EQ(setParams(level, mode, ""), 0x80C8u);
    EXPECT_EQ(log.only({"Log level provided is out of range", "Log mode provided is out of range",
                        "Setting the trace path failed"}),
              std::vector<std::string>{text});
  };
  refused(9, 9, "Log level provided is out of range");
  refused(5, 9, "Log mode provided is out of range");
  refused(5, 2, "Setting the trace path failed");
  // What is checked first is whether there is such a log.
  const Ref<TVXHBA_RecordLog> other = unknownLog();
  Property<std::uint32_t> result{};
  log.clear();
  TVXHBA_RecordLog_Provider().SetLogParams(other.get(), valueOf<std::uint16_t>(9),
                                           valueOf<std::uint16_t>(9), valueOf(String("")), result);
  EXPECT_EQ(result.value, 0x812Cu);
  EXPECT_EQ(log.count("Log level provided is out of range"), 0u);
}

TEST_F(Record_Log_Methods, StepsOfAChangeComeInOrder) {
  begin();
  const std::string path = file("var/log/trace.log");
  log.clear();
  ASSERT_EQ(setParams(5, 4, path), 0u);
  const std::vector<std::string> texts = {"Changing the record log parameters 5-4-" + path,
                                          "Setting path as " + path};
  EXPECT_EQ(log.only(texts), texts);
  // Level and mode hold when the entry is told of, and the file has that line as its second.
  const std::string lines = contents("var/log/trace.log");
  EXPECT_EQ(lines.find("Changing the record log parameters"), std::string::npos)
      << "the mode was another by then";
  EXPECT_NE(lines.find("][TVX_DBG] Setting path as " + path + "\n"), std::string::npos);
}

// --- RequestStateChange

TEST_F(Record_Log_Methods, TheLogIsSwitchedOffAndOn) {
  begin(("4,3,1\n" + file("var/log/x.log")).c_str());
  EXPECT_EQ(change(providerLog(), 3), 0u);
  EXPECT_EQ(log.level("Logs disabled"), TVX_WARN);
  EXPECT_FALSE(getLogger().isEnabled());
  EXPECT_EQ(providerLog().RequestedState.value, 3);
  EXPECT_EQ(providerLog().EnabledState.value, 3);
  EXPECT_EQ(numbersOf(providerLog().OperationalStatus), (std::vector<std::uint16_t>{10}));
  EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "4,3,0\n" + file("var/log/x.log"));

  EXPECT_EQ(change(providerLog(), 2), 0u);
  EXPECT_EQ(log.level("FC Record Logs enabled"), TVX_WARN);
  EXPECT_TRUE(getLogger().isEnabled());
  EXPECT_EQ(providerLog().RequestedState.value, 2);
  EXPECT_EQ(providerLog().EnabledState.value, 2);
  EXPECT_EQ(numbersOf(providerLog().OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "4,3,1\n" + file("var/log/x.log"));
  EXPECT_EQ(log.count("Instance of FC Driver Record Log"), 0u);
}

TEST_F(Record_Log_Methods, DisabledSurvivesAReload) {
  begin();
  ASSERT_EQ(change(providerLog(), 3), 0u);
  stopAgent();
  agent = &startAgent();
  refresh(*agent);
  EXPECT_FALSE(getLogger().isEnabled());
  EXPECT_EQ(providerLog().EnabledState.value, 3);
  EXPECT_EQ(providerLog().RequestedState.value, 5);
}

TEST_F(Record_Log_Methods, WithoutAPathOnlyTheStateIsEnabled) {
  getLogger().setLevel(5);
  begin(nullptr);
  getLogger().disable();
  EXPECT_EQ(change(providerLog(), 2), 0u);
  EXPECT_FALSE(getLogger().isEnabled());
  EXPECT_EQ(providerLog().EnabledState.value, 2);
  // Written out and applied, the configuration says that logging is off.
  EXPECT_EQ(contents("etc/torvex_fc_provider.dmp"), "2,5,0\n" + tvxFfdcLogPath());
}

TEST_F(Record_Log_Methods, WithoutAPathAnEnabledLogSaysWhereItLogs) {
  begin(nullptr);
  EXPECT_EQ(change(providerLog(), 2), 0u);
  EXPECT_EQ(log.level("The tracepath has not been set yet. Until the tracepath is set, FFDC will "
                      "be used to log messages."),
            TVX_ERR);
  EXPECT_TRUE(getLogger().isEnabled());
  EXPECT_TRUE(agent->m_FileLogger.isRestricted());
}

TEST_F(Record_Log_Methods, OtherStatesAreInvalid) {
  begin();
  for (const int state : {0, 1, 4, 11, 65535}) {
    log.clear();
    EXPECT_EQ(change(providerLog(), state), 0x80C8u) << state;
    EXPECT_EQ(log.level("Invalid input"), TVX_ERR);
    EXPECT_EQ(change(driverLog(), state), 0x80C8u) << state;
  }
  Property<std::uint16_t> none{};
  none.null = 1;
  none.value = 2;
  Property<std::uint32_t> result{};
  TVXHBA_RecordLog_Provider().RequestStateChange(&providerLog(), none, nullptr,
                                                 Property<Datetime>{}, result);
  EXPECT_EQ(result.value, 0x80C8u);
  expectUnchanged();
}

// --- Records and ClearLog

TEST_F(Record_Log_Methods, EachRecordIsAnEntry) {
  begin();
  ASSERT_EQ(clear(providerLog()), 0u);
  TVX_LOG(TVX_ERR, "the first");
  turnClock(5'000'000);
  TVX_LOG(TVX_WARN, "the second");
  TVX_LOG(TVX_INFO, "no record");
  log.clear();
  Delivered entries;
  EXPECT_EQ(TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
  ASSERT_EQ(entries.size(), 2u);
  const auto* second = entries.at<TVXHBA_LogEntry>(1);
  EXPECT_EQ(textOf(second->RecordID), "1");
  EXPECT_EQ(textOf(second->InstanceID), "TVXHBA:ProviderLog:1");
  EXPECT_EQ(textOf(second->RecordData), "[the second]");
  EXPECT_EQ(textOf(second->LogLevel), "2");
  EXPECT_EQ(textOf(second->LogInstanceID), textOf(providerLog().InstanceID));
  EXPECT_EQ(textOf(second->LogName), "Record logs for Torvex CIM Provider");
  EXPECT_EQ(textOf(second->ElementName), "Record logs for Torvex CIM Provider");
  EXPECT_EQ(textOf(second->RecordFormat), "[string fileName][uint32 lineNumber]:[string record]");
  EXPECT_TRUE(second->__name_space == "root/torvex");
  const auto* first = entries.at<TVXHBA_LogEntry>(0);
  EXPECT_EQ(textOf(first->LogLevel), "3");
  const std::vector<TVX_CIMLogger::Record> records = agent->m_CIMLogger.records();
  char expected[Datetime::ASCII_SIZE];
  char actual[Datetime::ASCII_SIZE];
  records[0].time.ascii(expected, true);
  first->CreationTimeStamp.value.ascii(actual, true);
  EXPECT_STREQ(actual, expected);
  second->CreationTimeStamp.value.ascii(actual, true);
  EXPECT_STRNE(actual, expected) << "five seconds later";
  const std::vector<std::string> texts = {"Entering TVXHBA_LogEntry::enum_instances", "Log Size 2",
                                          "TVXHBA_LogEntry returned instance 0",
                                          "TVXHBA_LogEntry returned instance 1",
                                          "TVXUCNA_LogEntry_Provider::enum_instances()"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Record_Log_Methods, TheLogManagesEachRecord) {
  begin();
  ASSERT_EQ(clear(providerLog()), 0u);
  TVX_LOG(TVX_ERR, "the first");
  TVX_LOG(TVX_WARN, "the second");
  Delivered entries;
  TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler());
  log.clear();
  Delivered ties;
  EXPECT_EQ(TVXHBA_RecordLogManagesRecord_Provider().enum_instances(nullptr, ties.handler()), 0);
  ASSERT_EQ(ties.size(), 2u);
  for (std::size_t i = 0; i < 2; i++)
    EXPECT_TRUE(tiesClones(ties.at<Instance>(i), &providerLog(), entries.at<Instance>(i))) << i;
  EXPECT_TRUE(ties.at<Instance>(0)->__name_space == "root/torvex");
  const std::vector<std::string> texts = {"Entering TVXHBA_RecordLogManagesRecord::enum_instances",
                                          "Log Size 2", "TVXHBA_LogEntry returned instance 0",
                                          "TVXHBA_LogEntry returned instance 1"};
  EXPECT_EQ(log.only(texts), texts);
}

TEST_F(Record_Log_Methods, AHandlerThatHasEnoughEndsTheDelivery) {
  begin();
  for (int i = 0; i < 5; i++) TVX_LOG(TVX_ERR, "one of many");
  Delivered entries;
  entries.limit = 3;
  EXPECT_EQ(TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
  EXPECT_EQ(entries.size(), 3u);
}

TEST_F(Record_Log_Methods, NothingIsDeliveredUnderTheDataLock) {
  begin();
  TVX_LOG(TVX_ERR, "a record");
  Delivered entries;
  entries.probe = [] { EXPECT_TRUE(isFree(ProviderAgent::getInstance()->m_DataMutex)); };
  TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler());
  EXPECT_NE(entries.size(), 0u);
}

TEST_F(Record_Log_Methods, NoRecordStandsAfterTheLogWasCleared) {
  begin(("4,3,1\n" + file("var/log/x.log")).c_str());
  TVX_LOG(TVX_ERR, "an old line");
  EXPECT_EQ(clear(providerLog()), 0u);
  EXPECT_EQ(log.level("Cleared all the logs"), TVX_WARN);
  Delivered entries;
  TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler());
  EXPECT_EQ(entries.size(), 0u);
  EXPECT_EQ(agent->m_CIMLogger.lastIndex(), -1);
  EXPECT_EQ(contents("var/log/x.log").find("an old line"), std::string::npos);
  EXPECT_NE(contents("var/log/x.log").find("Cleared all the logs\n"), std::string::npos);
  TVX_LOG(TVX_ERR, "a new line");
  Delivered again;
  TVXHBA_LogEntry_Provider().enum_instances(nullptr, again.handler());
  ASSERT_EQ(again.size(), 1u);
  EXPECT_EQ(textOf(again.at<TVXHBA_LogEntry>(0)->InstanceID), "TVXHBA:ProviderLog:0");
}

TEST_F(Record_Log_Methods, TheRingServesItsNewestThousandAndTwentyFour) {
  begin();
  ASSERT_EQ(clear(providerLog()), 0u);
  for (int i = 0; i < 1025; i++) TVX_LOG(TVX_ERR, "line %d", i);
  Delivered entries;
  TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler());
  ASSERT_EQ(entries.size(), 1024u);
  EXPECT_EQ(textOf(entries.at<TVXHBA_LogEntry>(0)->RecordData), "[line 1024]");
  EXPECT_EQ(textOf(entries.at<TVXHBA_LogEntry>(1)->RecordData), "[line 1]");
}

TEST_F(Record_Log_Methods, ALackOfMemoryEndsTheRequestWithNothing) {
  begin();
  for (int i = 0; i < 3; i++) TVX_LOG(TVX_ERR, "a record");
  log.clear();
  Delivered entries;
  Delivered ties;
  {
    const Failing_New failing(TVXHBA_LogEntry::static_meta_class.size, 1);
    EXPECT_EQ(TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
  }
  EXPECT_EQ(entries.size(), 0u);
  EXPECT_EQ(log.count("TVXHBA_LogEntry returned instance 0"), 1u);
  EXPECT_EQ(log.level("Could not create TVXUCNA_LogEntry instance"), TVX_CRIT);
  EXPECT_EQ(log.count("TVXUCNA_LogEntry_Provider::enum_instances()"), 0u);
  {
    const Failing_New failing(TVXHBA_RecordLogManagesRecord::static_meta_class.size);
    TVXHBA_RecordLogManagesRecord_Provider().enum_instances(nullptr, ties.handler());
  }
  EXPECT_EQ(ties.size(), 0u);
  EXPECT_EQ(log.count("Could not create TVXUCNA_LogEntry instance"), 2u);
}

TEST_F(Record_Log_Methods, WithoutLibrariesThereAreNoEntries) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  ASSERT_FALSE(startAgent().isLoaded());
  Delivered entries;
  EXPECT_EQ(TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
  EXPECT_EQ(TVXHBA_RecordLogManagesRecord_Provider().enum_instances(nullptr, entries.handler()), 0);
  EXPECT_EQ(entries.size(), 0u);
  EXPECT_EQ(log.level("RM Init failed for TVXHBA_LogEntry_Provider.cpp"), TVX_DBG);
  EXPECT_EQ(log.level("RM Init failed for TVXHBA_RecordLogManagesRecord_Provider.cpp"), TVX_DBG);
}

}  // namespace
}  // namespace cimrt::test
