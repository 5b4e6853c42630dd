// The tests of a host as instances: every property, every association, and what happens when some
// of them can't be made.
#include "Diagnostics_Fixture.h"
#include "Feature_Maps.h"
#include "common/TVX_Clock.h"

namespace cimrt::test {
namespace {

using Numbers = std::vector<std::uint16_t>;
using Texts = std::vector<std::string>;

struct Expected {
  const char* name;
  std::uint16_t type;
  Numbers testTypes;
  Numbers characteristics;
  Texts loopParameter;  // none: no loop control either
  Numbers loopControls;
  Numbers executionControls;
  Texts otherControls;
  std::uint16_t serviceMode;
  const char* description;
};

const Texts WITH_PATTERN = {"BufferSize", "BufferPattern"};

const Expected TESTS[] = {
    {"TVX:FCHBA Beacon Test",
     2,
     {2},
     {0},
     {"5"},
     {3, 4},
     {0x8000},
     {},
     0x8000,
     "Test causes a port's LEDs to flash on and off, allowing the port to be easily visually "
     "identified"},
    {"TVX:FCHBA Echo Test",
     3,
     {3, 5},
     {4, 10},
     {"100"},
     {3},
     {1},
     {"TargetDevice", "EchoMechanism", "LUN", "BufferSize", "BufferPattern"},
     4,
     "Test verifies the data path from host to target"},
    {"TVX:FCHBA External Loopback Test",
     4,
     {2, 5},
     {4, 10},
     {"100"},
     {2, 3},
     {1},
     WITH_PATTERN,
     4,
     "Test verifies that the entire data path through an FCHBA is working properly"},
    {"TVX:FCHBA Host Loopback Test",
     5,
     {2},
     {4},
     {"100"},
     {2, 3},
     {1},
     WITH_PATTERN,
     4,
     "Test verifies the FC HBA hostbus interface"},
    {"TVX:FCHBA Internal Loopback Test",
     6,
     {2},
     {4},
     {"100"},
     {2, 3},
     {1},
     WITH_PATTERN,
     4,
     "Test verifies the integrity of internal data paths in the FCHBA"},
    {"TVX:FCHBA Ping Test",
     7,
     {5},
     {4, 10},
     {"100"},
     {3},
     {1},
     {"TargetDevice", "PingMechanism", "LUN", "BufferSize", "BufferPattern"},
     4,
     "Test verifies the existence and accessibility of devices on the SAN"},
    {"TVX:FCHBA Status Test",
     10,
     {4},
     {0},
     {},
     {0x8000},
     {0x8000},
     {},
     0x8000,
     "Test checks the health of the FCHBA, not including the FC optics"},
    {"TVX:FCHBA Reset Test",
     8,
     {2},
     {4},
     {},
     {0x8000},
     {0x8000},
     {},
     0x8000,
     "Test causes the FCHBA to re-initialize itself"},
    {"TVX:FCHBA Self Test",
     9,
     {2},
     {4},
     {},
     {0x8000},
     {0x8000},
     {},
     0x8000,
     "Test allows all components of the FCHBA to be tested"},
};
constexpr std::size_t COUNT = std::size(TESTS);

using Class_Feature = Diagnostics_Test;

TEST_F(Class_Feature, NineTestsStandInTheirOrder) {
  build();
  auto& map = agent->m_TVXHBA_FCHBADiagnosticTest_map;
  const CIM_ComputerSystem& system = *agent->m_CIM_ComputerSystem_map[0];
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const Expected& row = TESTS[i];
    const TVXHBA_FCHBADiagnosticTest& test = *map[i];
    EXPECT_EQ(textOf(test.Name), row.name);
    EXPECT_EQ(textOf(test.ElementName), row.name);
    EXPECT_EQ(textOf(test.CreationClassName), "TVXHBA_FCHBADiagnosticTest");
    EXPECT_EQ(textOf(test.SystemName), textOf(system.Name));
    EXPECT_EQ(textOf(test.SystemCreationClassName), "CIM_ComputerSystem");
    EXPECT_EQ(numberOf(test.FCHBATestType), row.type) << row.name;
    EXPECT_EQ(numbersOf(test.TestTypes), row.testTypes) << row.name;
    EXPECT_EQ(numbersOf(test.Characteristics), row.characteristics) << row.name;
    EXPECT_TRUE(test.__name_space == "root/torvex");
  }
}

TEST_F(Class_Feature, NumbersOfTheTestsAreTheTables) {
  const std::uint32_t numbers[] = {1, 2, 3, 4, 5, 6, 9, 7, 8};
  ASSERT_EQ(diagnosticTests().size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    EXPECT_EQ(static_cast<std::uint32_t>(diagnosticTests()[i].number), numbers[i]);
    EXPECT_EQ(diagnosticTests()[i].haltOnError, Halt_On_Error::NO);
    EXPECT_EQ(findDiagnosticTest(TESTS[i].name), &diagnosticTests()[i]);
  }
  EXPECT_EQ(findDiagnosticTest("TVX:FCHBA self Test"), nullptr);
}

TEST_F(Class_Feature, SettingsHoldTheDefaultsOfTheirTest) {
  build();
  auto& map = agent->m_TVXHBA_FCHBADiagnosticSettingData_map;
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const std::string name = TESTS[i].name;
    const TVXHBA_FCHBADiagnosticSettingData& data = *map[i];
    EXPECT_EQ(textOf(data.InstanceID), name);
    EXPECT_EQ(textOf(data.ElementName), name + " SettingData");
    EXPECT_EQ(numberOf(data.OverridedSettingData), 0);
    EXPECT_EQ(numberOf(data.HaltOnError), 0);
    EXPECT_EQ(numberOf(data.ResultPersistence), 0xFFFFFFFF);
    EXPECT_EQ(numbersOf(data.LogOptions), (Numbers{2, 6}));
    EXPECT_EQ(numbersOf(data.LogStorage), Numbers{2});
    EXPECT_EQ(textsOf(data.LoopControlParameter), TESTS[i].loopParameter) << name;
    EXPECT_EQ(numbersOf(data.LoopControl), TESTS[i].loopParameter.empty() ? Numbers{} : Numbers{3});
    EXPECT_EQ(data.LoopControl.is_null(), TESTS[i].loopParameter.empty());
    EXPECT_EQ(data.LoopControlParameter.is_null(), TESTS[i].loopParameter.empty());
  }
}

TEST_F(Class_Feature, PatternAndTargetBelongToTheTestsThatSend) {
  build();
  for (std::size_t i = 0; i < COUNT; i++) {
    const TVXHBA_FCHBADiagnosticSettingData& data = *settings(TESTS[i].name);
    const bool sends = TESTS[i].serviceMode == 4;
    const bool aims =
        std::string(TESTS[i].name) == ECHO_TEST || std::string(TESTS[i].name) == PING_TEST;
    EXPECT_EQ(data.BufferSizes.is_null(), !sends) << TESTS[i].name;
    EXPECT_EQ(data.BufferPattern.is_null(), !sends);
    if (sends) {
      EXPECT_EQ(numbersOf(data.BufferSizes), std::vector<std::uint32_t>{8});
      const std::vector<std::uint8_t> pattern = numbersOf(data.BufferPattern);
      EXPECT_EQ(std::string(pattern.begin(), pattern.end()), "1a2b3c4d");
    }
    EXPECT_EQ(textOf(data.TargetDevice), aims ? "" : "(null)") << TESTS[i].name;
    EXPECT_EQ(textOf(data.TargetDeviceFormat), aims ? "2" : "(null)");
    // These three have the same values in any setting data: their class gives them.
    EXPECT_EQ(numberOf(data.LUN), 0);
    EXPECT_EQ(numberOf(data.PingMechanism), 2);
    EXPECT_EQ(numberOf(data.EchoMechanism), 2);
  }
}

TEST_F(Class_Feature, CapabilitiesTellWhatATestTakes) {
  build();
  auto& map = agent->m_TVXHBA_FCHBADiagnosticServiceCapabilities_map;
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const TVXHBA_FCHBADiagnosticServiceCapabilities& data = *map[i];
    EXPECT_EQ(textOf(data.InstanceID), TESTS[i].name);
    EXPECT_EQ(textOf(data.ElementName), std::string(TESTS[i].name) + " Capabilites");
    EXPECT_EQ(numbersOf(data.SupportedServiceModes), Numbers{TESTS[i].serviceMode});
    EXPECT_EQ(numbersOf(data.SupportedLogStorage), Numbers{2});
    EXPECT_EQ(numbersOf(data.SupportedLogOptions), (Numbers{2, 6}));
    EXPECT_EQ(numbersOf(data.SupportedLoopControl), TESTS[i].loopControls) << TESTS[i].name;
    EXPECT_EQ(numbersOf(data.SupportedExecutionControls), TESTS[i].executionControls);
    EXPECT_EQ(textsOf(data.OtherSupportedExecutionControlsDescriptions), TESTS[i].otherControls);
    EXPECT_EQ(data.OtherSupportedExecutionControlsDescriptions.is_null(),
              TESTS[i].otherControls.empty());
  }
}

TEST_F(Class_Feature, HelpServicesDescribeTheirTest) {
  build();
  auto& map = agent->m_TVXHBA_HelpService_map;
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const TVXHBA_HelpService& help = *map[i];
    EXPECT_EQ(textOf(help.CreationClassName), "TVXHBA_HelpService");
    EXPECT_EQ(textOf(help.SystemCreationClassName), "CIM_ComputerSystem");
    EXPECT_EQ(textOf(help.SystemName), textOf(agent->m_CIM_ComputerSystem_map[0]->Name));
    EXPECT_EQ(textOf(help.Name), TESTS[i].name);
    EXPECT_EQ(textOf(help.ElementName), std::string(TESTS[i].name) + " HelpService");
    EXPECT_EQ(numbersOf(help.DeliveryOptions), Numbers{1});
    EXPECT_EQ(textOf(help.OtherDeliveryOptionDescription), "String");
    EXPECT_EQ(numbersOf(help.DocumentFormat), Numbers{1});
    EXPECT_EQ(textOf(help.OtherDocumentFormatDescription), "String");
    EXPECT_EQ(textsOf(help.DocumentsAvailable), Texts{TESTS[i].name});
    EXPECT_EQ(textsOf(help.DocumentDescriptions), Texts{TESTS[i].description});
  }
}

TEST_F(Class_Feature, IdentitiesTellTheVersion) {
  build();
  auto& map = agent->m_TVXHBA_DiagnosticIdentity_map;
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const TVXHBA_DiagnosticIdentity& identity = *map[i];
    EXPECT_EQ(textOf(identity.Name), TESTS[i].name);
    EXPECT_EQ(textOf(identity.InstanceID), TESTS[i].name);
    EXPECT_EQ(textOf(identity.ElementName), std::string(TESTS[i].name) + " DiagnosticIdentity");
    EXPECT_EQ(numberOf(identity.MajorVersion), 1);
    EXPECT_EQ(numberOf(identity.MinorVersion), 7);
    EXPECT_EQ(numberOf(identity.RevisionNumber), 1);
    EXPECT_EQ(textOf(identity.VersionString), "1.7.1");
    EXPECT_EQ(textOf(identity.Manufacturer), "Torvex Corporation");
    EXPECT_EQ(numbersOf(identity.Classifications), Numbers{7});
    EXPECT_EQ(textsOf(identity.ClassificationDescriptions), Texts{"TVX: FCHBA Diagnostics"});
    EXPECT_EQ(numberOf(identity.IsEntity), 1);
    EXPECT_EQ(textOf(identity.Description), "TVX FCHBA Diagnostics");
    EXPECT_EQ(textsOf(identity.IdentityInfoValue), Texts{TESTS[i].name});
    EXPECT_EQ(textsOf(identity.IdentityInfoType), Texts{"TORVEX:DIAGNOSTICS_NAME"});
    ASSERT_FALSE(identity.ReleaseDate.is_null());
    EXPECT_TRUE(identity.ReleaseDate.value.equal(tvxNowDatetime())) << "the time of the build";
  }
}

TEST_F(Class_Feature, NothingElseIsFilledIn) {
  build();
  using Names = std::set<std::string>;
  const Agent_Maps& maps = *agent;
  EXPECT_EQ(filledIn(maps.m_TVXHBA_FCHBADiagnosticTest_map[0]),
            (Names{"SystemCreationClassName", "SystemName", "CreationClassName", "Name",
                   "ElementName", "FCHBATestType", "TestTypes", "Characteristics"}));
  Names settingNames = {"InstanceID",  "ElementName",       "OverridedSettingData",
                        "HaltOnError", "ResultPersistence", "LogOptions",
                        "LogStorage"};
  EXPECT_EQ(filledIn(settings(SELF_TEST)), settingNames);
  settingNames.insert({"LoopControl", "LoopControlParameter"});
  EXPECT_EQ(filledIn(settings(BEACON_TEST)), settingNames);
  settingNames.insert({"BufferSizes", "BufferPattern"});
  EXPECT_EQ(filledIn(settings(HOST_LOOPBACK_TEST)), settingNames);
  settingNames.insert({"TargetDevice", "TargetDeviceFormat"});
  EXPECT_EQ(filledIn(settings(PING_TEST)), settingNames);
  EXPECT_EQ(filledIn(settings(ECHO_TEST)), settingNames);
  EXPECT_EQ(filledIn(maps.m_TVXHBA_FCHBADiagnosticServiceCapabilities_map[1]),
            (Names{"InstanceID", "ElementName", "SupportedServiceModes", "SupportedLogStorage",
                   "SupportedLogOptions", "SupportedLoopControl", "SupportedExecutionControls",
                   "OtherSupportedExecutionControlsDescriptions"}));
  EXPECT_EQ(
      filledIn(maps.m_TVXHBA_HelpService_map[0]),
      (Names{"SystemCreationClassName", "SystemName", "CreationClassName", "Name", "ElementName",
             "DeliveryOptions", "OtherDeliveryOptionDescription", "DocumentFormat",
             "OtherDocumentFormatDescription", "DocumentsAvailable", "DocumentDescriptions"}));
  EXPECT_EQ(
      filledIn(maps.m_TVXHBA_DiagnosticIdentity_map[0]),
      (Names{"Name", "InstanceID", "ElementName", "MajorVersion", "RevisionNumber", "MinorVersion",
             "VersionString", "Manufacturer", "Classifications", "ClassificationDescriptions",
             "Description", "IdentityInfoValue", "IdentityInfoType", "ReleaseDate"}));
  EXPECT_EQ(filledIn(maps.m_TVXHBA_DiagnosticsLog_map[0]),
            (Names{"InstanceID", "ElementName", "Description", "MaxNumberOfRecords",
                   "CurrentNumberOfRecords", "OperationalStatus", "HealthState"}));
  EXPECT_EQ(filledIn(maps.m_TVXHBA_JobSettingData_map[0]), (Names{"InstanceID", "ElementName"}));
  EXPECT_EQ(filledIn(maps.m_TVXHBA_DiagElementSettingData_map[0]), Names{"IsDefault"});
  EXPECT_EQ(filledIn(maps.m_TVXHBA_JobElementSettingData_map[0]), Names{"IsDefault"});
  EXPECT_EQ(filledIn(maps.m_TVXHBA_DiagElementSoftwareIdentity_map[0]),
            Names{"ElementSoftwareStatus"});
  EXPECT_EQ(filledIn(maps.m_TVXHBA_AvailableDiagnosticService_map[0]),
            Names{"EstimatedDurationOfService"});
  EXPECT_EQ(filledIn(maps.m_TVXHBA_ServiceAffectsElement_map[0]), Names{});
}

TEST_F(Class_Feature, LogsAreEmptyAndLarge) {
  build();
  auto& map = agent->m_TVXHBA_DiagnosticsLog_map;
  ASSERT_EQ(map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const TVXHBA_DiagnosticsLog& data = *map[i];
    EXPECT_EQ(textOf(data.InstanceID), TESTS[i].name);
    EXPECT_EQ(textOf(data.ElementName), std::string(TESTS[i].name) + " DiagnosticLog");
    EXPECT_EQ(textOf(data.Description),
              "TVXHBA_DiagnosticsLog represents the logs for FCHBA CDM tests");
    EXPECT_EQ(numberOf(data.MaxNumberOfRecords), 200);
    EXPECT_EQ(numberOf(data.CurrentNumberOfRecords), 0);
    EXPECT_EQ(numbersOf(data.OperationalStatus), Numbers{2});
    EXPECT_EQ(numberOf(data.HealthState), 5);
  }
}

TEST_F(Class_Feature, OneJobSettingServesAllTests) {
  build();
  ASSERT_EQ(agent->m_TVXHBA_JobSettingData_map.size(), 1u);
  const TVXHBA_JobSettingData& data = *agent->m_TVXHBA_JobSettingData_map[0];
  EXPECT_EQ(textOf(data.InstanceID), "TVX:FCHBA JobSettingData");
  EXPECT_EQ(textOf(data.ElementName), "TVX:FCHBA JobSettingData");
  EXPECT_TRUE(data.DeleteOnCompletion.is_null());
}

TEST_F(Class_Feature, EveryTestIsTiedToWhatBelongsToIt) {
  build();
  for (std::size_t i = 0; i < COUNT; i++) {
    const Instance* test = agent->m_TVXHBA_FCHBADiagnosticTest_map[i];
    const auto* elementSettings = agent->m_TVXHBA_DiagElementSettingData_map[i];
    EXPECT_TRUE(
        tiesClones(elementSettings, test, agent->m_TVXHBA_FCHBADiagnosticSettingData_map[i]));
    EXPECT_EQ(numberOf(elementSettings->IsDefault), 1);
    EXPECT_TRUE(tiesClones(agent->m_TVXHBA_DiagElementCapabilities_map[i], test,
                           agent->m_TVXHBA_FCHBADiagnosticServiceCapabilities_map[i]));
    EXPECT_TRUE(tiesClones(agent->m_TVXHBA_ServiceAvailableToElement_map[i],
                           agent->m_TVXHBA_HelpService_map[i], test));
    const auto* software = agent->m_TVXHBA_DiagElementSoftwareIdentity_map[i];
    EXPECT_TRUE(tiesClones(software, agent->m_TVXHBA_DiagnosticIdentity_map[i], test));
    EXPECT_EQ(numbersOf(software->ElementSoftwareStatus), (Numbers{2, 6}));
    const auto* jobSettings = agent->m_TVXHBA_JobElementSettingData_map[i];
    EXPECT_TRUE(tiesClones(jobSettings, test, agent->m_TVXHBA_JobSettingData_map[0]));
    EXPECT_EQ(numberOf(jobSettings->IsDefault), 1);
    EXPECT_TRUE(
        tiesClones(agent->m_TVXHBA_UseOfLog_map[i], agent->m_TVXHBA_DiagnosticsLog_map[i], test));
  }
}

TEST_F(Class_Feature, EveryTestIsOfferedToEveryPortController) {
  build();
  auto& offered = agent->m_TVXHBA_AvailableDiagnosticService_map;
  auto& affects = agent->m_TVXHBA_ServiceAffectsElement_map;
  ASSERT_EQ(offered.size(), 2 * COUNT);
  ASSERT_EQ(affects.size(), 2 * COUNT);
  for (std::size_t i = 0; i < 2 * COUNT; i++) {
    const Instance* test = agent->m_TVXHBA_FCHBADiagnosticTest_map[i / 2];
    const Instance* port = agent->m_TVXHBA_PortController_map[i % 2];
    EXPECT_TRUE(tiesClones(offered[i], test, port));
    EXPECT_EQ(numberOf(offered[i]->EstimatedDurationOfService), 0);
    EXPECT_TRUE(tiesClones(affects[i], port, test));
  }
}

TEST_F(Class_Feature, TestsAreLinkedToTheProfileAndTheSystem) {
  build();
  const Instance* system = agent->m_CIM_ComputerSystem_map[0];
  const Instance* profile = entryOf(agent->m_TVXHBA_RegisteredProfile_map,
                                    &TVXHBA_RegisteredProfile::InstanceID, "TVX:FCHBA Diagnostics");
  ASSERT_EQ(agent->m_TVXHBA_DiagServiceConformsToProfile_map.size(), COUNT);
  ASSERT_EQ(agent->m_TVXHBA_DiagHostedService_map.size(), COUNT);
  ASSERT_EQ(agent->m_TVXHBA_HostedService_map.size(), COUNT);
  for (std::size_t i = 0; i < COUNT; i++) {
    const Instance* test = agent->m_TVXHBA_FCHBADiagnosticTest_map[i];
    EXPECT_TRUE(tiesClones(agent->m_TVXHBA_DiagServiceConformsToProfile_map[i], profile, test));
    EXPECT_TRUE(tiesClones(agent->m_TVXHBA_DiagHostedService_map[i], system, test));
    EXPECT_TRUE(tiesClones(agent->m_TVXHBA_HostedService_map[i], system,
                           agent->m_TVXHBA_HelpService_map[i]));
  }
}

TEST_F(Class_Feature, BuildTellsItsStepsInTheirOrder) {
  useScenario(hostWith(""));
  agent = &startAgent();
  log.clear();
  refresh(*agent);
  const Texts steps = {"Clearing TVX CDM maps",
                       "TVX_Diagnostics::Constructor",
                       "TVX_Diagnostics::Destructor",
                       "Done with Clearing CDM maps",
                       "Exiting clearAdapterMaps()",
                       "TVX_Diagnostics::Constructor",
                       "TVX_Diagnostics::CreateFCHBADiagnosticClassFeature",
                       "Number of FCHBA ManagedElement : 2",
                       "Updating the CDM DiagHostService profile ",
                       "TVX_Diagnostics::Destructor",
                       "Create the Diagnostic classes"};
  Texts told = log.only(steps);
  EXPECT_EQ(told, steps);
  for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG) << step;
  EXPECT_EQ(log.count("TVXHBA_DiagElementCapabilities instance (NIC) is created"), COUNT);
  EXPECT_EQ(log.level("TVXHBA_DiagElementCapabilities instance (NIC) is created"), TVX_DBG);
}

TEST_F(Class_Feature, HostWithoutPortsHasNoTests) {
  build(R"({"cards": []})");
  TVX_Diagnostics diagnostics(*agent);
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0x812C);
  EXPECT_EQ(log.level("Unable to create the FCHBA Diagnostic feature, No managed element exist"),
            TVX_DBG);
  EXPECT_EQ(featureInstances(*agent), 0u);
  refresh(*agent);
  EXPECT_EQ(featureInstances(*agent), 0u);
  EXPECT_EQ(log.level("FCHBA Diagnositcss either Not Supported/Failed to Create the feature"),
            TVX_DBG);
}

TEST_F(Class_Feature, PortThatDoesNotAnswerGivesVersionZero) {
  build();
  addFault(R"({"call": "LRM_GetHBAAttributes", "status": 148})");
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.ClearDiagnosticClassMaps(0);
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0);
  EXPECT_EQ(agent->m_TVXHBA_FCHBADiagnosticTest_map.size(), COUNT);
  EXPECT_EQ(textOf(agent->m_TVXHBA_DiagnosticIdentity_map[0]->VersionString), "1.0.1");
  EXPECT_EQ(log.level("ERROR: GetDiagnosticVersion:RM_GetHBAAttributes call failed (148)"),
            TVX_ERR);
  EXPECT_EQ(log.count("ERROR: GetDiagnosticVersion:RM_GetHBAAttributes call failed (148)"), 1u)
      << "the first answer counts";
}

TEST_F(Class_Feature, NamesThatCantBeConvertedLeaveNoVersion) {
  build();
  agent->m_TVXHBA_PortController_map[0]->DeviceID.set("short");
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.ClearDiagnosticClassMaps(0);
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 0) << "the second one answers";
  EXPECT_EQ(textOf(agent->m_TVXHBA_DiagnosticIdentity_map[0]->VersionString), "1.7.1");
  agent->m_TVXHBA_PortController_map[1]->DeviceID.set("short too");
  diagnostics.ClearDiagnosticClassMaps(0);
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 40002);
  EXPECT_EQ(log.level("FCHBA Diagnostics are not supported in any of the managed element"),
            TVX_DBG);
  EXPECT_EQ(log.level("TVXHBA_DiagTestFunc::Id2HBAName failed"), TVX_ERR);
  EXPECT_EQ(featureInstances(*agent), 0u);
}

TEST_F(Class_Feature, HostWithoutASystemHasNoTests) {
  build();
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.ClearDiagnosticClassMaps(0);
  agent->m_CIM_ComputerSystem_map.clear();
  EXPECT_EQ(diagnostics.CreateFCHBADiagnosticClassFeature(), 40002);
  EXPECT_EQ(log.level("FCHBA Diagnostics are not supported in any of the managed element"),
            TVX_DBG);
  EXPECT_EQ(featureInstances(*agent), 0u);
}

TEST_F(Class_Feature, VersionWantsAPlaceAndAName) {
  build();
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion(FIRST_PORT, nullptr), 0x8000);
  EXPECT_EQ(log.level("Invalid Argument"), TVX_DBG);
  std::uint32_t version = 99;
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion(nullptr, &version), 0x8000);
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion("zz", &version), 0x8000);
  EXPECT_EQ(log.count("TVXHBA_DiagTestFunc::Id2HBAName failed"), 2u);
  EXPECT_EQ(version, 99u);
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion(FIRST_PORT, &version), 0);
  EXPECT_EQ(version, 7u);
}

TEST_F(Class_Feature, VersionIsReadIntoTwoKilobytes) {
  build();
  std::uint32_t told = 0;
  taken().adapterAttributes = [&](HBA_WWN wwpn, void*, std::uint32_t* size) {
    EXPECT_EQ(wwpn.wwn[7], 0xA1);
    told = *size;
    return RM_STATUS{RM_ERROR};
  };
  std::uint32_t version = 99;
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion(FIRST_PORT, &version), 0);
  EXPECT_EQ(told, 2048u);
  EXPECT_EQ(version, 99u) << "unchanged";
  taken() = {};
  addFault(R"({"call": "LRM_GetHBAAttributes", "omit_attributes": ["diag_version"]})");
  EXPECT_EQ(TVX_Diagnostics::GetDiagnosticVersion(FIRST_PORT, &version), 0);
  EXPECT_EQ(version, 99u) << "an adapter that doesn't tell it";
}

// --- Scopes

TEST_F(Class_Feature, ScopesClearTheirMapsAndNoOthers) {
  build();
  Ref<TVXHBA_FCHBADiagnosticSettingData> given = givenFor(HOST_LOOPBACK_TEST);
  run(HOST_LOOPBACK_TEST, given.get());
  TVX_Diagnostics diagnostics(*agent);
  const auto jobs = [&] {
    return agent->m_TVXHBA_ConcreteJob_map.size() + agent->m_TVXHBA_OwningJobElement_map.size() +
           agent->m_TVXHBA_AffectedJobElement_map.size();
  };
  const auto records = [&] {
    return agent->m_TVXHBA_LogManagesRecord_map.size() +
           agent->m_TVXHBA_RecordAppliesToElement_map.size() +
           agent->m_TVXHBA_DiagnosticCompletionRecord_map.size() +
           agent->m_TVXHBA_DiagnosticServiceRecord_map.size() +
           agent->m_TVXHBA_CorrespondingSettingDataRecord_map.size() +
           agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size();
  };
  EXPECT_EQ(diagnostics.ClearDiagnosticClassMaps(3), 0);
  EXPECT_EQ(diagnostics.ClearDiagnosticClassMaps(-1), 0);
  EXPECT_EQ(jobs(), 3u);
  EXPECT_EQ(records(), 3u + 3u + 1u + 1u + 2u + 1u);
  EXPECT_EQ(diagnostics.ClearDiagnosticClassMaps(0), 0);
  EXPECT_EQ(featureInstances(*agent), 0u);
  EXPECT_EQ(jobs(), 3u);
  EXPECT_EQ(records(), 11u);
  EXPECT_EQ(diagnostics.ClearDiagnosticClassMaps(1), 0);
  EXPECT_EQ(records(), 0u);
  EXPECT_EQ(jobs(), 3u);
  EXPECT_EQ(diagnostics.ClearDiagnosticClassMaps(2), 0);
  EXPECT_EQ(jobs(), 0u);
}

TEST_F(Class_Feature, ARefreshMakesNewTestsAndLeavesRecordsAndJobs) {
  build();
  ASSERT_EQ(run(STATUS_TEST).result, 0);
  settings(HOST_LOOPBACK_TEST)->LoopControlParameter.set({"7"});
  refresh(*agent);
  EXPECT_EQ(agent->m_TVXHBA_FCHBADiagnosticTest_map.size(), COUNT);
  EXPECT_EQ(textsOf(settings(HOST_LOOPBACK_TEST)->LoopControlParameter), Texts{"100"})
      << "new instances";
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 1u);
}

}  // namespace
}  // namespace cimrt::test
