// The driver's log: what is read from the system log, and how it is served.
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "Failing_New.h"
#include "agent/ProductSteps.h"
#include "agent/RecordLogs.h"
#include "common/TVX_Path.h"
#include "logs/Driver_Log_Providers.h"
#include "logs/TVXHBA_DriverLogProfile.h"
#include "logs/TVXHBA_RecordLog_Provider.h"
#include "model/TVX_Data.h"

namespace cimrt::test {
namespace {

class Driver_Log : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    std::filesystem::create_directories(root / "var/log");
    writeFile("etc/torvex_fc_provider.dmp", "1,3,1\n");
    useScenario(singlePortCards(2));
  }

  void begin() {
    agent = &startAgent();
    refresh(*agent);
  }
  TVXHBA_RecordLog& driverLog() { return *findRecordLog(*agent, driverLogInstanceID(*agent)); }

  std::uint32_t change(int state) {
    Property<std::uint16_t> requested{};
    requested.set(state);
    Property<std::uint32_t> result{};
    EXPECT_EQ(TVXHBA_RecordLog_Provider().RequestStateChange(&driverLog(), requested, nullptr,
                                                             Property<Datetime>{}, result),
              INVOKE_METHOD_OK);
    return result.value;
  }
  std::string readText(const std::string& name) const {
    std::ostringstream text;
    text << std::ifstream(root / name).rdbuf();
    return text.str();
  }
  void expectRecords(std::size_t count) {
    Delivered entries;
    EXPECT_EQ(TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
    EXPECT_EQ(entries.size(), count);
    EXPECT_EQ(agent->m_DeviceLogBuffer.lines().size(), count);
  }

  ProviderAgent* agent = nullptr;
};

TEST_F(Driver_Log, StandsBesideTheProvidersAsDisabled) {
  begin();
  ASSERT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 2u);
  const TVXHBA_RecordLog& record = driverLog();
  const std::string name = "TVX: FC Driver Record Log:" + agent->m_HostName;
  EXPECT_EQ(textOf(record.InstanceID), name);
  EXPECT_EQ(textOf(record.ElementName), name);
  EXPECT_EQ(textOf(record.Name), "Driver logs for Torvex FC Provider");
  EXPECT_EQ(numberOf(record.MaxNumberOfRecords), 200);
  EXPECT_EQ(numberOf(record.CurrentNumberOfRecords), 0);
  EXPECT_EQ(numberOf(record.LogState), 4);
  EXPECT_EQ(numberOf(record.OverwritePolicy), 2);
  EXPECT_EQ(numbersOf(record.OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(numberOf(record.RequestedState), 2);
  EXPECT_EQ(numberOf(record.EnabledState), 3);
  EXPECT_EQ(numberOf(record.HealthState), 5);
  EXPECT_TRUE(record.TracePath.is_null());
  EXPECT_TRUE(record.__name_space == "root/torvex");
}

TEST_F(Driver_Log, IsStoppedWhileNothingIsLogged) {
  writeFile("etc/torvex_fc_provider.dmp", "1,3,0\n");
  agent = &startAgent();
  getLogger().disable();
  refresh(*agent);
  EXPECT_EQ(numbersOf(driverLog().OperationalStatus), (std::vector<std::uint16_t>{10}));
}

TEST_F(Driver_Log, HasCapabilitiesAndIsUsedByTheDriver) {
  useScenario(R"({"cards": [{"driver_name": "tvfc", "driver_version": "1.2", "ports": [{}]}]})");
  begin();
  const auto* capabilities = entryOf(agent->m_TVXHBA_EnabledRecordLogCapabilities_map,
                                     &TVXHBA_EnabledRecordLogCapabilities::InstanceID,
                                     "TVX:FC Driver Record Log Capabilities");
  ASSERT_NE(capabilities, nullptr);
  EXPECT_EQ(numbersOf(capabilities->RequestedStatesSupported),
            (std::vector<std::uint16_t>{2, 3, 11}));
  EXPECT_EQ(numberOf(capabilities->MaxElementNameLen), 0);
  ASSERT_EQ(agent->m_TVXHBA_ProviderUseOfLog_map.size(), 2u);
  const auto* use = agent->m_TVXHBA_ProviderUseOfLog_map[0];
  const auto* driver =
      entryOf(agent->m_TVXHBA_SoftwareIdentity_map, &TVXHBA_SoftwareIdentity::InstanceID,
              "TVX FC HBA: Driver tvfc v1.2");
  ASSERT_NE(driver, nullptr);
  EXPECT_TRUE(tiesKeys(use, &driverLog(), driver));
}

TEST_F(Driver_Log, BuildIsTraced) {
  begin();
  const std::vector<std::string> texts = {
      "TVXHBA_DriverLogProfile constructor", "Enter CreateFCDriverLogClasses",
      "Exit CreateFCDriverLogClasses", "TVXHBA_DriverLogProfile destructor"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
  const auto* driver = static_cast<const TVXHBA_SoftwareIdentity*>(
      static_cast<const Instance*>(agent->m_TVXHBA_ProviderUseOfLog_map[0]->Dependent));
  EXPECT_EQ(
      log.count(textOf(driver->ElementName) + " uses log : " + textOf(driverLog().InstanceID)), 1u);
}

TEST_F(Driver_Log, OfAHostWithoutFCAdaptersIsNotBuilt) {
  useScenario(R"({"cards": []})");
  begin();
  Ranked_Lock data(agent->m_DataMutex);
  EXPECT_EQ(TVXHBA_DriverLogProfile(*agent).CreateFCDriverLogClasses(), 0);
  EXPECT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 1u);
}

TEST_F(Driver_Log, ARunWithoutCardsLeavesItOut) {
  useScenario(R"({"cards": []})");
  begin();
  EXPECT_EQ(log.level("No FC card found"), TVX_DBG);
  EXPECT_EQ(log.count("TVXHBA_DriverLogProfile constructor"), 0u);
}

TEST_F(Driver_Log, ARunThatEndsBeforeItLeavesItOutAndTheNextOneBuildsIt) {
  useScenario(R"({"cards": [{"serial_number": "TWO", "adapter_per": "card",
      "ports": [{"wwpn": "1000000000000001"}, {"wwpn": "1000000000000002"}]}]})");
  begin();
  EXPECT_EQ(log.level("Insert Failed (HBA): m_TVXHBA_PhysicalConnector"), TVX_CRIT);
  EXPECT_EQ(log.count("TVXHBA_DriverLogProfile constructor"), 0u);
  EXPECT_EQ(findRecordLog(*agent, driverLogInstanceID(*agent)), nullptr);
  useScenario(singlePortCards(1));
  refresh(*agent);
  EXPECT_EQ(log.count("TVXHBA_DriverLogProfile constructor"), 1u);
  EXPECT_NE(findRecordLog(*agent, driverLogInstanceID(*agent)), nullptr);
}

TEST_F(Driver_Log, ASecondBuildIsRefusedAndStopsNothing) {
  begin();
  Ranked_Lock data(agent->m_DataMutex);
  Host_Build host{*agent};
  log.clear();
  EXPECT_EQ(buildDriverLog(host), 0);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_RecordLog_map"), TVX_CRIT);
  EXPECT_EQ(log.level("Issue with FC Driver Log classes"), TVX_INFO);
  EXPECT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 2u);
}

TEST_F(Driver_Log, EveryFailureOfTheBuildIsLogged) {
  begin();
  Ranked_Lock data(agent->m_DataMutex);
  const auto failing = [this] {
    log.clear();
    EXPECT_EQ(TVXHBA_DriverLogProfile(*agent).CreateFCDriverLogClasses(), 0x8001);
    EXPECT_EQ(log.count("Exit CreateFCDriverLogClasses"), 0u);
  };
  agent->m_TVXHBA_RecordLog_map.clear();
  failing();  // the capabilities of before are still there
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_EnabledRecordLogCapabilities_map"), TVX_CRIT);
  EXPECT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 1u);

  agent->m_TVXHBA_RecordLog_map.clear();
  agent->m_TVXHBA_EnabledRecordLogCapabilities_map.clear();
  agent->m_TVXHBA_SoftwareIdentity_map.clear();
  failing();
  EXPECT_EQ(log.level("Missing Provider Software Identity"), TVX_CRIT);

  agent->m_TVXHBA_RecordLog_map.clear();
  {
    const Failing_New noMemory(TVXHBA_RecordLog::static_meta_class.size);
    failing();
  }
  EXPECT_EQ(log.level("Failed to allocate memory to create TVXHBA_RecordLog"), TVX_CRIT);
  EXPECT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 0u);

  agent->m_TVXHBA_EnabledRecordLogCapabilities_map.clear();
  {
    const Failing_New noMemory(TVXHBA_EnabledRecordLogCapabilities::static_meta_class.size);
    failing();
  }
  EXPECT_EQ(log.level("Failed to allocate memory to create TVXHBA_EnabledRecordLogCapabilities"),
            TVX_CRIT);
}

TEST_F(Driver_Log, IsEmptyBeforeItIsEnabled) {
  writeFile("var/log/messages", "kernel: tvfc 0: link up\n");
  begin();
  expectRecords(0);
}

TEST_F(Driver_Log, KeepsTheNewestTwoHundredLinesNewestFirst) {
  std::string text;
  for (int i = 0; i < 250; i++)
    text += "line " + std::to_string(i) + " of tvfc\nline of another driver\n";
  writeFile("var/log/messages", text);
  begin();
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 200);
  Delivered entries;
  TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler());
  ASSERT_EQ(entries.size(), 200u);
  const auto* newest = entries.at<TVXHBA_FCDriverLogEntry>(0);
  EXPECT_EQ(textOf(newest->RecordData), "line 249 of tvfc");
  EXPECT_EQ(textOf(newest->RecordID), "0");
  EXPECT_EQ(textOf(newest->InstanceID), "TVX:HBA FC Driver Record:0");
  EXPECT_EQ(textOf(newest->LogInstanceID), textOf(driverLog().InstanceID));
  EXPECT_EQ(textOf(newest->LogName), textOf(driverLog().ElementName));
  EXPECT_EQ(textOf(newest->ElementName), textOf(driverLog().ElementName));
  EXPECT_EQ(textOf(newest->RecordFormat), "[string record]");
  EXPECT_TRUE(newest->CreationTimeStamp.is_null());
  EXPECT_TRUE(newest->__name_space == "root/torvex");
  const auto* oldest = entries.at<TVXHBA_FCDriverLogEntry>(199);
  EXPECT_EQ(textOf(oldest->RecordData), "line 50 of tvfc");
  EXPECT_EQ(textOf(oldest->InstanceID), "TVX:HBA FC Driver Record:199");
}

TEST_F(Driver_Log, EnableIsTracedAndShowsInTheLog) {
  writeFile("var/log/messages", "kernel: tvfc 0: link up\n");
  begin();
  log.clear();
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(numberOf(driverLog().RequestedState), 2);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 2);
  EXPECT_EQ(numbersOf(driverLog().OperationalStatus), (std::vector<std::uint16_t>{2}));
  const std::vector<std::string> texts = {
      "Instance of FC Driver Record Log", "Reading Events for tvfc",
      "Finished reading Events for tvfc", "Logging of FC Driver Log Ends"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
  EXPECT_EQ(log.count("FC Record Logs enabled"), 0u);
}

TEST_F(Driver_Log, WithoutAPathItIsEnabledAndTheLoggerStaysAsItIs) {
  std::filesystem::remove(root / "etc/torvex_fc_provider.dmp");
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  ASSERT_EQ(agent->m_FileLogger.path(), tvxFfdcLogPath());
  getLogger().disable();
  log.clear();
  getLogger().enable();
  const std::string before = readText("etc/torvex_fc_provider.dmp");
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(log.level("The tracepath has not been set yet. Until the tracepath is set, FFDC will "
                      "be used to log messages."),
            TVX_ERR);
  EXPECT_EQ(numberOf(driverLog().RequestedState), 2);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 2);
  EXPECT_EQ(numbersOf(driverLog().OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 1);
  expectRecords(1);
  getLogger().disable();
  EXPECT_EQ(change(2), 0u);
  EXPECT_FALSE(getLogger().isEnabled()) << "only the state of the log is enabled";
  // The driver's log has no part in the logger's configuration.
  EXPECT_EQ(readText("etc/torvex_fc_provider.dmp"), before);
  EXPECT_TRUE(agent->m_FileLogger.isRestricted());
}

TEST_F(Driver_Log, StepsOfItsStatesComeInOrder) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  log.clear();
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(change(3), 0u);
  getLogger().enable();
  Property<std::uint32_t> result{};
  TVXHBA_RecordLog_Provider().ClearLog(&driverLog(), result);
  const std::vector<std::string> texts = {
      "Instance of FC Driver Record Log", "Reading Events for tvfc",
      "Finished reading Events for tvfc", "Logging of FC Driver Log Ends",
      "Instance of FC Driver Record Log", "Logs disabled"};
  EXPECT_EQ(log.only({texts[0], texts[1], texts[2], texts[3], texts[5], "FC Record Logs enabled",
                      "Cleared all the logs"}),
            texts);
}

TEST_F(Driver_Log, AdaptersOfAnotherKindAreSkippedAndTheFirstFCOneCounts) {
  useScenario(R"({"cards": [{"driver_version": "1.1", "ports": [{}]},
                            {"driver_version": "2.2", "ports": [{}]},
                            {"driver_version": "3.3", "ports": [{}]}]})");
  begin();
  Ranked_Lock data(agent->m_DataMutex);
  agent->m_TVXHBA_RecordLog_map.clear();
  agent->m_TVXHBA_EnabledRecordLogCapabilities_map.clear();
  agent->m_TVXHBA_ProviderUseOfLog_map.clear();
  Adapter& other = *agent->m_pData->m_Adapters[0];
  other.m_Type = 2;
  log.clear();
  EXPECT_EQ(TVXHBA_DriverLogProfile(*agent).CreateFCDriverLogClasses(), 0);
  other.m_Type = TVX_ADAPTER_TYPE_FC;
  const std::string skipped =
      "Skippping Adapter [" + other.getName() + "] since it is not an FC Adapter";
  const std::vector<std::string> texts = {"Enter CreateFCDriverLogClasses", skipped,
                                          "Exit CreateFCDriverLogClasses"};
  EXPECT_EQ(log.only(texts), texts);
  EXPECT_EQ(log.level(skipped), TVX_DBG);
  ASSERT_EQ(agent->m_TVXHBA_ProviderUseOfLog_map.size(), 1u);
  const auto* driver = static_cast<const TVXHBA_SoftwareIdentity*>(
      static_cast<const Instance*>(agent->m_TVXHBA_ProviderUseOfLog_map[0]->Dependent));
  EXPECT_NE(textOf(driver->InstanceID).find("v2.2"), std::string::npos)
      << textOf(driver->InstanceID);
}

TEST_F(Driver_Log, WithAdaptersOfAnotherKindAloneThereIsNone) {
  begin();
  Ranked_Lock data(agent->m_DataMutex);
  agent->m_TVXHBA_RecordLog_map.clear();
  for (Adapter* each : agent->m_pData->m_Adapters) each->m_Type = 2;
  EXPECT_EQ(TVXHBA_DriverLogProfile(*agent).CreateFCDriverLogClasses(), 0);
  for (Adapter* each : agent->m_pData->m_Adapters) each->m_Type = TVX_ADAPTER_TYPE_FC;
  EXPECT_EQ(agent->m_TVXHBA_RecordLog_map.size(), 0u);
}

TEST_F(Driver_Log, ALineWithTheNameInsideAWordIsKept) {
  writeFile("var/log/messages", "xtvfcx\ntvf c\n\nTVFC\ntvfc");
  begin();
  change(2);
  const std::vector<std::string> expected = {"tvfc", "xtvfcx"};
  EXPECT_EQ(agent->m_DeviceLogBuffer.lines(), expected);
}

TEST_F(Driver_Log, WithoutASystemLogItIsEnabledAndEmpty) {
  begin();
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 0);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 2);
  expectRecords(0);
}

TEST_F(Driver_Log, ASystemLogThatIsNoFileGivesNoRecords) {
  std::filesystem::create_directories(root / "var/log/messages");
  begin();
  EXPECT_EQ(change(2), 0u);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 2);
  expectRecords(0);
}

TEST_F(Driver_Log, BinaryBytesOfALineAreServed) {
  writeFile("var/log/messages", std::string("\xff\xfe tvfc \x01\0end\n", 14) + "tvfc at the end");
  begin();
  EXPECT_EQ(change(2), 0u);
  Delivered entries;
  TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler());
  ASSERT_EQ(entries.size(), 2u);
  EXPECT_EQ(textOf(entries.at<TVXHBA_FCDriverLogEntry>(0)->RecordData), "tvfc at the end");
  EXPECT_EQ(textOf(entries.at<TVXHBA_FCDriverLogEntry>(1)->RecordData),
            "\xff\xfe tvfc \x01"
            "end");
}

TEST_F(Driver_Log, AMillionLinesGiveTheNewestTwoHundred) {
  std::string text;
  for (int i = 0; i < 1'000'000; i++)
    text += i % 1000 == 0 ? "tvfc " + std::to_string(i) + "\n" : "x\n";
  writeFile("var/log/messages", text);
  begin();
  EXPECT_EQ(change(2), 0u);
  expectRecords(200);
  EXPECT_EQ(agent->m_DeviceLogBuffer.lines().front(), "tvfc 999000");
  EXPECT_EQ(agent->m_DeviceLogBuffer.lines().back(), "tvfc 800000");
}

TEST_F(Driver_Log, AnEmptySystemLogGivesNoRecords) {
  writeFile("var/log/messages", "");
  begin();
  EXPECT_EQ(change(2), 0u);
  expectRecords(0);
}

TEST_F(Driver_Log, IsFixedAtTheMomentOfTheEnable) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  change(2);
  writeFile("var/log/messages", "tvfc one\ntvfc two\n");
  expectRecords(1);
  change(2);
  expectRecords(2);
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 2);
}

TEST_F(Driver_Log, ARefreshMakesTheLogAnewButKeepsItsLines) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  change(2);
  refresh(*agent);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 3);
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 0);
  EXPECT_EQ(agent->m_TVXHBA_FCDriverLogEntry_map.size(), 0u);
  expectRecords(1);
}

TEST_F(Driver_Log, ClearLogForgetsTheLines) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  change(2);
  TVX_LOG(TVX_ERR, "a record of the provider's log");
  Property<std::uint32_t> result{};
  EXPECT_EQ(TVXHBA_RecordLog_Provider().ClearLog(&driverLog(), result), INVOKE_METHOD_OK);
  EXPECT_EQ(result.value, 0u);
  EXPECT_EQ(numberOf(driverLog().CurrentNumberOfRecords), 0);
  expectRecords(0);
  EXPECT_FALSE(agent->m_CIMLogger.records().empty()) << "the other log is left alone";
}

TEST_F(Driver_Log, DisableForgetsTheLinesAndSwitchesTheLoggerOff) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  change(2);
  EXPECT_EQ(change(3), 0u);
  EXPECT_EQ(log.level("Logs disabled"), TVX_WARN);
  EXPECT_FALSE(getLogger().isEnabled());
  EXPECT_EQ(numberOf(driverLog().RequestedState), 3);
  EXPECT_EQ(numberOf(driverLog().EnabledState), 3);
  EXPECT_EQ(numbersOf(driverLog().OperationalStatus), (std::vector<std::uint16_t>{10}));
  expectRecords(0);
  EXPECT_EQ(change(2), 0u);
  EXPECT_TRUE(getLogger().isEnabled());
}

TEST_F(Driver_Log, EntriesAreTraced) {
  writeFile("var/log/messages", "tvfc one\ntvfc two\n");
  begin();
  change(2);
  log.clear();
  expectRecords(2);
  const std::vector<std::string> texts = {
      "************Inside CreateFCDriverLogEntryClass ", "TVXHBA_LogEntry returned instance 0",
      "TVXHBA_LogEntry returned instance 1", "CreateFCDriverLogEntryClass Successful",
      "TVXHBA_FCDriverLogEntry_Provider::enum_instances()"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Driver_Log, TheLogManagesEachEntry) {
  writeFile("var/log/messages", "tvfc one\ntvfc two\n");
  begin();
  change(2);
  log.clear();
  Delivered ties;
  ties.probe = [] { EXPECT_TRUE(isFree(ProviderAgent::getInstance()->m_DataMutex)); };
  EXPECT_EQ(TVXHBA_DriverRecordLogManagesRecord_Provider().enum_instances(nullptr, ties.handler()),
            0);
  ASSERT_EQ(ties.size(), 2u);
  for (std::size_t i = 0; i < 2; i++)
    EXPECT_TRUE(
        tiesClones(ties.at<Instance>(i), &driverLog(), agent->m_TVXHBA_FCDriverLogEntry_map[i]))
        << i;
  const std::vector<std::string> texts = {
      "Enter -- TVXHBA_DriverRecordLogManagesRecord",
      "Entering TVXHBA_DriverRecordLogManagesRecord::enum_instances",
      "CreateFCDriverLogEntryClass Successful",
      "TVXHBA_DriverRecordLogManagesRecord returned instance 0",
      "TVXHBA_DriverRecordLogManagesRecord returned instance 1"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Driver_Log, ALackOfMemoryIsLoggedAndDeliversNothing) {
  writeFile("var/log/messages", "tvfc one\ntvfc two\n");
  begin();
  change(2);
  Delivered delivered;
  {
    const Failing_New failing(TVXHBA_FCDriverLogEntry::static_meta_class.size);
    Ranked_Lock data(agent->m_DataMutex);
    EXPECT_EQ(CreateFCDriverLogEntryClass(*agent), 0x8000);
    EXPECT_EQ(log.count("CreateFCDriverLogEntryClass Successful"), 0u);
  }
  {
    const Failing_New failing(TVXHBA_FCDriverLogEntry::static_meta_class.size, 1);
    TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, delivered.handler());
  }
  EXPECT_EQ(log.level("Could not create TVXHBA_FCDriverLogEntry"), TVX_CRIT);
  EXPECT_EQ(log.level(" Creation of CreateFCDriverLogEntryClass failed"), TVX_CRIT);
  {
    const Failing_New failing(TVXHBA_DriverRecordLogManagesRecord::static_meta_class.size, 1);
    TVXHBA_DriverRecordLogManagesRecord_Provider().enum_instances(nullptr, delivered.handler());
  }
  EXPECT_EQ(log.level("Could not create TVXHBA_DriverRecordLogManagesRecord instance"), TVX_CRIT);
  {
    const Failing_New failing(TVXHBA_FCDriverLogEntry::static_meta_class.size);
    TVXHBA_DriverRecordLogManagesRecord_Provider().enum_instances(nullptr, delivered.handler());
  }
  EXPECT_EQ(delivered.size(), 0u);
}

TEST_F(Driver_Log, WithoutItsLogTheRecordsHaveNoNames) {
  writeFile("var/log/messages", "tvfc one\n");
  begin();
  change(2);
  agent->m_TVXHBA_RecordLog_map.clear();
  Delivered entries;
  TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler());
  ASSERT_EQ(entries.size(), 1u);
  EXPECT_TRUE(entries.at<TVXHBA_FCDriverLogEntry>(0)->LogInstanceID.is_null());
  EXPECT_TRUE(entries.at<TVXHBA_FCDriverLogEntry>(0)->LogName.is_null());
  EXPECT_TRUE(entries.at<TVXHBA_FCDriverLogEntry>(0)->ElementName.is_null());
  Delivered ties;
  EXPECT_EQ(TVXHBA_DriverRecordLogManagesRecord_Provider().enum_instances(nullptr, ties.handler()),
            0);
  EXPECT_EQ(ties.size(), 0u);
  EXPECT_EQ(log.level("Could not create TVXHBA_DriverRecordLogManagesRecord instance"), TVX_CRIT);
}

TEST_F(Driver_Log, WithoutLibrariesThereAreNoEntries) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  ASSERT_FALSE(startAgent().isLoaded());
  Delivered entries;
  EXPECT_EQ(TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler()), 0);
  EXPECT_EQ(entries.size(), 0u);
  EXPECT_EQ(log.level("RM Init failed for TVXHBA_FCDriverLogEntry_Provider.cpp"), TVX_DBG);
}

TEST(Device_Log, IgnoresEmptyLinesAndReportsWhenItIsFull) {
  Device_Log_Buffer buffer;
  EXPECT_TRUE(buffer.add(""));
  EXPECT_TRUE(buffer.lines().empty());
  for (std::size_t i = 0; i < Device_Log_Buffer::CAPACITY; i++) EXPECT_TRUE(buffer.add("x"));
  EXPECT_FALSE(buffer.add("one more"));
  EXPECT_EQ(buffer.lines().size(), 200u);
  EXPECT_EQ(buffer.lines().back(), "x");
  EXPECT_TRUE(buffer.add("")) << "an empty line is not looked at";
  buffer.clear();
  EXPECT_TRUE(buffer.add("y"));
}

}  // namespace
}  // namespace cimrt::test
