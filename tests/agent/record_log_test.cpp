// The provider's record log and what the host conforms to.
#include <string>
#include <vector>

#include "Map_Test.h"
#include "agent/RecordLogs.h"

namespace cimrt::test {
namespace {

class Record_Log : public Adapter_Maps {
 protected:
  /// The provider's own log; the driver's stands beside it.
  static const TVXHBA_RecordLog* providerLog(ProviderAgent& agent) {
    return findRecordLog(agent, providerLogInstanceID(agent));
  }
};

TEST_F(Record_Log, DescribesTheLogger) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_RecordLog_map.size(), 2u);
  const TVXHBA_RecordLog& record = *providerLog(agent);
  EXPECT_EQ(text(record.InstanceID), "TVXHBA:ProviderLog:" + agent.m_HostName);
  EXPECT_EQ(record.MaxNumberOfRecords.value, 1024u);
  EXPECT_EQ(record.CurrentNumberOfRecords.value, 0u);
  EXPECT_FALSE(record.CurrentNumberOfRecords.is_null());
  EXPECT_EQ(record.LogState.value, 4);
  EXPECT_EQ(record.OverwritePolicy.value, 2);
  EXPECT_EQ(record.RequestedState.value, 2);
  EXPECT_EQ(record.EnabledState.value, 2);
  EXPECT_EQ(numbers(record.OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(record.HealthState.value, 5);
  EXPECT_EQ(text(record.Name), "Record logs for Torvex CIM Provider");
  EXPECT_EQ(text(record.ElementName), "Record logs for Torvex CIM Provider");
  EXPECT_EQ(text(record.TracePath), agent.m_FileLogger.path());
  EXPECT_EQ(record.LogMode.value, TVX_LOG_MODE_FILE);
  EXPECT_EQ(record.LogLevel.value, getLogger().level());
}

TEST_F(Record_Log, OfADisabledLoggerIsDisabledAndHasNoPath) {
  writeFile("etc/torvex_fc_provider.dmp", "1,3,0\n");
  useScenario(TWO_CARDS);
  ProviderAgent& agent = startAgent();
  getLogger().disable();
  refresh(agent);
  getLogger().enable();
  const TVXHBA_RecordLog& record = *providerLog(agent);
  EXPECT_EQ(record.RequestedState.value, 5);
  EXPECT_EQ(record.EnabledState.value, 3);
  EXPECT_EQ(record.LogMode.value, TVX_LOG_MODE_MEMORY);
  EXPECT_EQ(record.LogLevel.value, 3);
  EXPECT_TRUE(record.TracePath.is_null());
}

TEST_F(Record_Log, HasCapabilitiesAndIsUsedByTheProvider) {
  ProviderAgent& agent = build();
  const TVXHBA_RecordLog* record = providerLog(agent);
  ASSERT_EQ(agent.m_TVXHBA_EnabledRecordLogCapabilities_map.size(), 2u);
  const auto& capabilities = *agent.m_TVXHBA_EnabledRecordLogCapabilities_map[1];
  EXPECT_EQ(text(capabilities.InstanceID), "TVXHBA provider log capabilities");
  EXPECT_FALSE(capabilities.ElementNameEditSupported.is_null());
  EXPECT_FALSE(capabilities.ElementNameEditSupported.value);
  EXPECT_EQ(numbers(capabilities.RequestedStatesSupported), (std::vector<std::uint16_t>{2, 3}));
  EXPECT_EQ(numbers(capabilities.LogParamsSupported), (std::vector<std::uint16_t>{2, 3}));
  EXPECT_TRUE(ties(*agent.m_TVXHBA_RecordLogCapabilities_map[0], record, &capabilities));
  EXPECT_EQ(log.count(text(record->InstanceID) + " : Logging capabilities"), 1u);
  ASSERT_EQ(agent.m_TVXHBA_ProviderUseOfLog_map.size(), 2u);
  const auto& use = *agent.m_TVXHBA_ProviderUseOfLog_map[1];
  EXPECT_TRUE(identical(use.Antecedent, record));
  EXPECT_TRUE(identical(use.Dependent, agent.m_TVXHBA_SoftwareIdentity_map[0]));
}

TEST_F(Record_Log, ConformsToItsProfileAndSoDoesTheSystem) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_RecordLogConformsToProfile_map.size(), 1u);
  const auto& conformance = *agent.m_TVXHBA_RecordLogConformsToProfile_map[0];
  EXPECT_TRUE(identical(conformance.ManagedElement, providerLog(agent)));
  EXPECT_EQ(text(conformance.ConformantStandard->InstanceID), "TVX:Record Log");
  bool systemConforms = false;
  for (std::size_t i = 0; i < agent.m_TVXHBA_ComputerSystemConformsToProfile_map.size(); i++)
    systemConforms |= text(agent.m_TVXHBA_ComputerSystemConformsToProfile_map[i]
                               ->ConformantStandard->InstanceID) == "TVX:Record Log";
  EXPECT_TRUE(systemConforms);
  EXPECT_EQ(log.count("Generating TVXHBA_RecordLogConformsToProfile (Record logs for Torvex CIM "
                      "Provider conformant to Record Log profile)"),
            1u);
}

TEST_F(Record_Log, OfAHostWithoutCardsHasNoWriterAndFailsTheBuild) {
  useScenario();
  addFault(R"({"call": "HBA_GetNumberOfAdapters", "status": 0})");
  ProviderAgent& agent = rebuild();
  EXPECT_EQ(log.count("No FC card found"), 1u);
  EXPECT_EQ(log.level("Missing Provider Software Identity"), TVX_CRIT);
  EXPECT_EQ(log.count("PERF: updateAdapterMaps: cleanExit"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_RecordLog_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_ProviderUseOfLog_map.size(), 0u);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
}

TEST_F(Record_Log, PortsAndControllersConformToTheirProfiles) {
  ProviderAgent& agent = build(singlePortCards(1));
  const char* portProfiles[] = {"TVX:Physical Package", "TVX:Host Discovered Resources",
                                "TVX:FC Initiator Ports", "TVX:Access Points"};
  ASSERT_EQ(agent.m_TVXHBA_FCPortConformsToProfile_map.size(), 4u);
  for (std::size_t i = 0; i < 4; i++) {
    const auto& row = *agent.m_TVXHBA_FCPortConformsToProfile_map[i];
    EXPECT_EQ(text(row.ConformantStandard->InstanceID), portProfiles[i]);
    EXPECT_TRUE(identical(row.ManagedElement, agent.m_TVXHBA_FCPort_map[0]));
  }
  const char* controllerProfiles[] = {"TVX:Storage HBA", "TVX:FC HBA"};
  ASSERT_EQ(agent.m_TVXHBA_PortControllerConformsToProfile_map.size(), 2u);
  for (std::size_t i = 0; i < 2; i++) {
    const auto& row = *agent.m_TVXHBA_PortControllerConformsToProfile_map[i];
    EXPECT_EQ(text(row.ConformantStandard->InstanceID), controllerProfiles[i]);
    EXPECT_TRUE(identical(row.ManagedElement, agent.m_TVXHBA_PortController_map[0]));
  }
  for (const char* line :
       {"Generating TVXHBA_FCPortConformsToProfile (FC Port TVX16000:1000000000000000, Physical "
        "Package)",
        "Generating TVXHBA_FCPortConformsToProfile (FC Port TVX16000:1000000000000000, Host "
        "Discovered Resource)",
        "Generating TVXHBA_FCPortConformsToProfile (FC Port TVX16000:1000000000000000, FC "
        "Initiator Port)",
        "Generating TVXHBA_FCPortConformsToProfile (FC Port TVX16000:1000000000000000, Access "
        "Points)",
        "Generating TVXHBA_PortControllerConformsToProfile (Port Controller "
        "TVX16000:1000000000000000, Storage HBA)",
        "Generating TVXHBA_PortControllerConformsToProfile (Port Controller "
        "TVX16000:1000000000000000, FC HBA)"})
    EXPECT_EQ(log.count(line), 1u) << line;
}

TEST_F(Record_Log, NewCardIsTiedToTheProviderAndToItsProfile) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_ProviderElementSoftwareIdentity_map.size(), 2u);
  const auto& tie = *agent.m_TVXHBA_ProviderElementSoftwareIdentity_map[1];
  EXPECT_TRUE(ties(tie, agent.m_TVXHBA_SoftwareIdentity_map[0], agent.m_TVXHBA_Card_map[1]));
  EXPECT_EQ(numbers(tie.ElementSoftwareStatus), (std::vector<std::uint16_t>{2, 6}));
  ASSERT_EQ(agent.m_TVXHBA_CardConformsToProfile_map.size(), 2u);
  EXPECT_EQ(text(agent.m_TVXHBA_CardConformsToProfile_map[0]->ConformantStandard->InstanceID),
            "TVX:Physical Asset");
}

TEST_F(Record_Log, AccessPointIsOfferedToEveryPort) {
  writeFile("etc/tvx_smis.conf", "https://fabridesk.example/launch\n");
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_SAPAvailableForElement_map.size(), 4u);
  EXPECT_TRUE(ties(*agent.m_TVXHBA_SAPAvailableForElement_map[2],
                   agent.m_TVXHBA_RemoteServiceAccessPoint_map[0], agent.m_TVXHBA_FCPort_map[2]));
}

}  // namespace
}  // namespace cimrt::test
