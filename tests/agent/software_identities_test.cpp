// The software of host and ports, after a refresh and step by step.
#include "Agent_Fixture.h"
#include "Instance_Checks.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "agent/SoftwareIdentities.h"
#include "common/TVX_Clock.h"
#include "model/TVX_Data.h"

namespace cimrt::test {
namespace {

using Identity = TVXHBA_SoftwareIdentity;

constexpr const char* PROVIDER = "Torvex CMPI HBA Provider v10.2.107-7";
constexpr const char* DRIVER = "TVX FC HBA: Driver tvxfc v12.8.351.47";
constexpr const char* REFUSED = "Insert Failed : m_TVXHBA_SoftwareIdentity_map";

class Software_Identities : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& scenario = {}) {
    useScenario(scenario);
    ProviderAgent& agent = startAgent();
    refresh(agent);
    return agent;
  }

  static const Identity* find(ProviderAgent& agent, const std::string& instanceID) {
    return entryOf(agent.m_TVXHBA_SoftwareIdentity_map, &Identity::InstanceID, instanceID);
  }

  /// One card of one port, 0xE300, without data of the field replaceable unit.
  static std::string plainPort(const std::string& more = {}) {
    return R"({"library": {"versions": {"0x66": "12.8.1", "0x68": "10.4.2"}}, "cards": [{"model":
        "TVX1", "serial_number": "SN1", "firmware_version": "2.01a4", "driver_name": "tvxfc",
        "option_rom_version": "5.30a2", )" +
           std::string(more.find("driver_version") == more.npos
                           ? R"("driver_version": "12.8.351.47", )"
                           : "") +
           more + R"("ports": [{"wwpn": "10:00:00:00:00:00:00:01",
        "wwnn": "20:00:00:00:00:00:00:01", "fru": []}]}]})";
  }
};

TEST_F(Software_Identities, Provider) {
  ProviderAgent& agent = build(plainPort());
  const Identity* identity = find(agent, PROVIDER);
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(identity, agent.m_TVXHBA_SoftwareIdentity_map[0]);
  EXPECT_TRUE(identity->__name_space == "root/torvex");
  EXPECT_EQ(textOf(identity->ElementName), PROVIDER);
  EXPECT_EQ(textOf(identity->Name), PROVIDER);
  EXPECT_EQ(textOf(identity->Description), "Torvex CMPI HBA Provider");
  EXPECT_EQ(textOf(identity->VersionString), "10.2.107-7");
  EXPECT_EQ(textOf(identity->Manufacturer), "Torvex Corporation");
  EXPECT_EQ(numbersOf(identity->Classifications), (std::vector<std::uint16_t>{4}));
  EXPECT_EQ(textsOf(identity->ClassificationDescriptions),
            (std::vector<std::string>{"CMPI HBA CIM Provider"}));
  EXPECT_EQ(numberOf(identity->IsEntity), 1);
  EXPECT_EQ(numberOf(identity->MajorVersion), 10);
  EXPECT_EQ(numberOf(identity->MinorVersion), 2);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 107);
  EXPECT_EQ(numberOf(identity->BuildNumber), 7);
  ASSERT_FALSE(identity->InstallDate.is_null());
  EXPECT_EQ(identity->InstallDate.value.usec(), tvxNow());
  EXPECT_TRUE(identity->InstallDate.value.is_timestamp());
  EXPECT_EQ(textOf(identity->LibRMAPIVersion), "12.8.1");
  EXPECT_EQ(textOf(identity->LibDFCVersion), "10.4.2");
  EXPECT_TRUE(identity->PortWWN.is_null());
}

TEST_F(Software_Identities, ProviderIsTiedToSystemAndProfile) {
  ProviderAgent& agent = build(plainPort());
  const Identity* identity = find(agent, PROVIDER);
  const CIM_ComputerSystem* system = agent.m_CIM_ComputerSystem_map[0];
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_InstalledSoftwareIdentity_map[0], system, identity));
  ASSERT_EQ(agent.m_TVXHBA_ProviderSoftwareIdentity_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ProviderSoftwareIdentity_map[0], identity, system));
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_SoftwareConformsToProfile_map[0],
                         findRegisteredProfile(agent, "Software"), identity));
  EXPECT_EQ(
      log.count(std::string("Generating TVXHBA_InstalledSoftwareIdentity (") + PROVIDER + ")"), 1u);
  EXPECT_EQ(log.count("Generating TVXHBA_ProviderSoftwareIdentity (Software Identity (CMPI HBA "
                      "Provider v10.2.107-7))"),
            1u);
  EXPECT_EQ(log.count("Generating TVXHBA_SoftwareConformsToProfile (CMPI HBA Provider, Software)"),
            1u);
}

TEST_F(Software_Identities, LibraryVersionsThatCannotBeReadStayNull) {
  useScenario(plainPort());
  addFault(R"({"call": "RM_GetVersion", "status": 9})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  const Identity* identity = find(agent, PROVIDER);
  ASSERT_NE(identity, nullptr);
  EXPECT_TRUE(identity->LibDFCVersion.is_null());
  EXPECT_TRUE(identity->LibRMAPIVersion.is_null());
  EXPECT_EQ(log.count("Failed to get LibDFCVersion: returned with error - 9"), 1u);
  EXPECT_EQ(log.count("Failed to get LibRMAPIVersion: returned with error - 9"), 1u);
}

TEST_F(Software_Identities, TargetSystemIsReadThroughTheFirstPort) {
  const std::string ports = R"("cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}]})";
  ProviderAgent& agent = build(R"({"library": {"os_info": "Linux 6.1.0"}, )" + ports);
  const Identity* identity = find(agent, PROVIDER);
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textsOf(identity->TargetOperatingSystems), (std::vector<std::string>{"Linux 6.1.0"}));
  EXPECT_EQ(numbersOf(identity->TargetOSTypes), (std::vector<std::uint16_t>{36}));
  // A text that fills the buffer of 40 characters has no end of its own.
  useScenario(R"({"library": {"os_info": "0123456789012345678901234567890123456789ABC"}, )" +
              ports);
  refresh(agent);
  EXPECT_EQ(textsOf(find(agent, PROVIDER)->TargetOperatingSystems),
            (std::vector<std::string>{"0123456789012345678901234567890123456789"}));
  EXPECT_EQ(numbersOf(find(agent, PROVIDER)->TargetOSTypes), (std::vector<std::uint16_t>{1}));
}

TEST_F(Software_Identities, TargetSystemThatCannotBeReadStaysNull) {
  useScenario(plainPort());
  addFault(R"({"call": "LRM_GetServerAttributes", "status": 1})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  const Identity* identity = find(agent, PROVIDER);
  ASSERT_NE(identity, nullptr);
  EXPECT_TRUE(identity->TargetOSTypes.is_null());
  EXPECT_TRUE(identity->TargetOperatingSystems.is_null());
}

TEST_F(Software_Identities, SecondProviderIdentityFailsTheBuild) {
  ProviderAgent& agent = build(plainPort());
  Host_Build host{agent};
  log.clear();
  EXPECT_EQ(buildProviderIdentity(host), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level(REFUSED), TVX_CRIT);
  EXPECT_EQ(log.level("TVXHBA_SoftwareIdentity provider creation failed"), TVX_CRIT);
}

TEST_F(Software_Identities, Driver) {
  ProviderAgent& agent = build(plainPort());
  const Identity* identity = find(agent, DRIVER);
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textOf(identity->ElementName), "tvxfc v12.8.351.47");
  EXPECT_EQ(textOf(identity->Name), "tvxfc v12.8.351.47");
  EXPECT_EQ(textOf(identity->Description), "Torvex HBA Driver");
  EXPECT_EQ(textOf(identity->VersionString), "12.8.351.47");
  EXPECT_EQ(textOf(identity->Manufacturer), "Torvex Corporation");
  EXPECT_EQ(numberOf(identity->IsEntity), 1);
  EXPECT_EQ(numberOf(identity->MajorVersion), 12);
  EXPECT_EQ(numberOf(identity->MinorVersion), 8);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 351);
  EXPECT_EQ(numberOf(identity->BuildNumber), 47);
  EXPECT_EQ(textsOf(identity->IdentityInfoValue),
            (std::vector<std::string>{"tvxfc", "12.8.351.47", "5"}));
  EXPECT_EQ(textsOf(identity->IdentityInfoType),
            (std::vector<std::string>{"TORVEX:DRIVER_NAME", "TORVEX:DRIVER_VERSION",
                                      "TORVEX:TVFC_DRIVER_TYPE"}));
  EXPECT_EQ(numbersOf(identity->Classifications), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(textsOf(identity->ClassificationDescriptions),
            (std::vector<std::string>{"FC HBA Driver"}));
  EXPECT_EQ(log.count("driverName: tvxfc, driverVersion: 12.8.351.47, driverManufacturer: Torvex "
                      "Corporation"),
            1u);
  EXPECT_EQ(log.count("Generating TVXHBA_SoftwareConformsToProfile (Driver, Software Inventory)"),
            1u);
}

TEST_F(Software_Identities, DriverVersionInTheFormOfAFirmwareVersion) {
  ProviderAgent& agent = build(plainPort(R"("driver_version": "8.31b2", )"));
  const Identity* identity = find(agent, "TVX FC HBA: Driver tvxfc v8.31b2");
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(numberOf(identity->MajorVersion), 8);
  EXPECT_EQ(numberOf(identity->MinorVersion), 3);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 1);
  EXPECT_EQ(numberOf(identity->BuildNumber), 2);
}

TEST_F(Software_Identities, DriverWithoutAMaker) {
  ProviderAgent& agent = build(plainPort(R"("manufacturer": "", )"));
  ASSERT_NE(find(agent, DRIVER), nullptr);
  EXPECT_EQ(textOf(find(agent, DRIVER)->Manufacturer), "Torvex Corporation");
}

TEST_F(Software_Identities, Diagnostics) {
  ProviderAgent& agent = build(plainPort(R"("diag_version": 7, )"));
  const Identity* identity = find(agent, "TVXHBA Diagnostics v7");
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textOf(identity->ElementName), "TVXHBA Diagnostics v7");
  EXPECT_EQ(textOf(identity->Name), "TVXHBA Diagnostics v7");
  EXPECT_EQ(textOf(identity->Description), "TVXHBA Diagnostics");
  EXPECT_EQ(textsOf(identity->IdentityInfoValue),
            (std::vector<std::string>{"TVXHBA Diagnostics", "7"}));
  EXPECT_EQ(textsOf(identity->ClassificationDescriptions),
            (std::vector<std::string>{"TVXHBA Diagnostics"}));
  EXPECT_EQ(numbersOf(identity->Classifications), (std::vector<std::uint16_t>{7}));
  EXPECT_EQ(textOf(identity->Manufacturer), "Torvex Corporation");
  EXPECT_EQ(numberOf(identity->MajorVersion), 7);
  EXPECT_EQ(numberOf(identity->MinorVersion), 0);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 0);
  EXPECT_EQ(numberOf(identity->BuildNumber), 0);
  EXPECT_EQ(
      log.count("Generating TVXHBA_SoftwareConformsToProfile (Diagnositc, Software Inventory)"),
      1u);
}

TEST_F(Software_Identities, DriverAndDiagnosticsOfManyPortsExistOnce) {
  ProviderAgent& agent = build(singlePortCards(3));
  std::size_t drivers = 0;
  for (std::size_t i = 0; i < agent.m_TVXHBA_SoftwareIdentity_map.size(); i++)
    drivers +=
        textOf(agent.m_TVXHBA_SoftwareIdentity_map[i]->Description) == "Torvex HBA Driver" ? 1 : 0;
  EXPECT_EQ(drivers, 1u);
  EXPECT_EQ(log.count("Generating TVXHBA_SoftwareConformsToProfile (Driver, Software Inventory)"),
            1u);
  EXPECT_EQ(log.count(REFUSED), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 3u);
}

/// An adapter of another kind.
class Other_Adapter : public Adapter {
 public:
  Other_Adapter() : Adapter("Other-1", 7, 2) {}
  const std::string& getName() const override { return m_Name; }
  const std::int32_t& getNumber() const override { return m_Number; }
  const std::uint32_t& getFunctionType() const override { return m_FunctionType; }
  AdapterAttributes* getAttributes() override { return nullptr; }
  AdapterStatistics* getStatistics() override { return nullptr; }
  std::size_t getNumberOfPorts() override { return 0; }
  std::vector<Port*>& getPorts() override { return m_Ports; }
  Port* getPort(int) override { throw std::out_of_range("no port"); }
  void rescanTargets() override {}
};

TEST_F(Software_Identities, AdapterOfAnotherKindHasNoDriver) {
  ProviderAgent& agent = build(plainPort());
  const std::size_t before = agent.m_TVXHBA_SoftwareIdentity_map.size();
  agent.m_pData->m_Adapters.push_back(new Other_Adapter);
  Host_Build host{agent};
  EXPECT_EQ(CreateDriverIdentity(host), 0);
  EXPECT_EQ(log.count("Skippping Adapter [Other-1] since it is not an FC Adapter"), 1u);
  EXPECT_EQ(agent.m_TVXHBA_SoftwareIdentity_map.size(), before);
  EXPECT_EQ(host.driverIdentity, find(agent, DRIVER));
}

TEST_F(Software_Identities, Firmware) {
  ProviderAgent& agent = build(plainPort());
  const Identity* identity = find(agent, "TVX FC HBA:Firmware:v2.01a4 TVX1 SN1");
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textOf(identity->ElementName), "FC HBA Firmware v2.01a4 TVX1 SN1");
  EXPECT_EQ(textOf(identity->Name), "Torvex Fiber Channel Adapter SN1 Firmware");
  EXPECT_EQ(textOf(identity->Description), "Torvex FC HBA Firmware");
  EXPECT_EQ(textOf(identity->VersionString), "2.01a4");
  EXPECT_EQ(numberOf(identity->MajorVersion), 2);
  EXPECT_EQ(numberOf(identity->MinorVersion), 0);
  EXPECT_EQ(numberOf(identity->RevisionNumber), 1);
  EXPECT_EQ(numberOf(identity->BuildNumber), 4);
  EXPECT_EQ(textOf(identity->ReleaseType), "a");
  EXPECT_EQ(textOf(identity->TestReleaseVersion), "");
  EXPECT_EQ(textOf(identity->NodeWWN), "2000000000000001");
  EXPECT_EQ(textOf(identity->PortWWN), "1000000000000001");
  EXPECT_EQ(textOf(identity->Manufacturer), "Torvex Corporation");
  EXPECT_EQ(textOf(identity->OperationalFirmware), "2.01a4");
  EXPECT_EQ(textOf(identity->FirmwareOnFlash), "2.01a4");
  EXPECT_EQ(textOf(identity->ULPFirmwareVersion), "2.01a4");
  EXPECT_EQ(textOf(identity->ULPFirmwareName), "ULP TVX1");
  EXPECT_EQ(textOf(identity->SPFirmwareVersion), "2.01a4");
  EXPECT_EQ(textOf(identity->SPFirmwareName), "SP TVX1");
  EXPECT_EQ(textOf(identity->SLI1FirmwareVersion), "SLI-1 Overlay");
  EXPECT_EQ(textOf(identity->SLI2FirmwareVersion), "SLI-2 Overlay");
  EXPECT_EQ(textOf(identity->SLI3FirmwareVersion), "SLI-3 Overlay");
  EXPECT_EQ(textOf(identity->FCUniversalVersion), "5.30a2");
  EXPECT_EQ(textOf(identity->OptROMVersion), "5.30a2");
  EXPECT_EQ(numbersOf(identity->Classifications), (std::vector<std::uint16_t>{10}));
  EXPECT_EQ(log.count("Firmware- Parsing VersionString"), 1u);
  EXPECT_EQ(log.count("Firmware- Parsing Success"), 1u);
  EXPECT_EQ(log.count("Firmware- Parsing Done"), 1u);
}

TEST_F(Software_Identities, KernelBootCodeAndStub) {
  ProviderAgent& agent = build(plainPort());
  struct Expected {
    const char* instanceID;
    const char* name;
    const char* description;
    const char* version;
    std::uint16_t classification;
    const char* parsing;
  };
  constexpr Expected EXPECTED[] = {
      {"Firmware Kernel v2.01a4 TVX1 SN1", "Firmware Kernel v2.01a4 TVX1 SN1",
       "Torvex FC HBA Firmware Kernel", "2.01a4", 10, "FirmwareKernel"},
      {"Boot Code - Expansion ROM v5.30a2 TVX1 SN1", "Torvex Fiber Channel Adapter SN1 BootCode",
       "Torvex FC HBA Boot Code", "5.30a2", 11, "BootCodeExpansionROM"},
      {"Functional Firmware stub v2.01a4 TVX1 SN1", "Functional Firmware stub v2.01a4 TVX1 SN1",
       "Torvex Functional Firmware", "2.01a4", 10, "FunctionalFirmware"},
  };
  for (const Expected& expected : EXPECTED) {
    SCOPED_TRACE(expected.instanceID);
    const Identity* identity = find(agent, expected.instanceID);
    ASSERT_NE(identity, nullptr);
    EXPECT_EQ(textOf(identity->ElementName), expected.instanceID);
    EXPECT_EQ(textOf(identity->Name), expected.name);
    EXPECT_EQ(textOf(identity->Description), expected.description);
    EXPECT_EQ(textOf(identity->VersionString), expected.version);
    EXPECT_EQ(numbersOf(identity->Classifications),
              (std::vector<std::uint16_t>{expected.classification}));
    EXPECT_EQ(textOf(identity->PortWWN), "1000000000000001");
    EXPECT_EQ(textOf(identity->NodeWWN), "2000000000000001");
    for (const char* part : {"Parsing VersionString", "Parsing Success", "Parsing Done"})
      EXPECT_EQ(log.count(std::string(expected.parsing) + "- " + part), 1u) << part;
  }
  const Identity* boot = find(agent, "Boot Code - Expansion ROM v5.30a2 TVX1 SN1");
  EXPECT_EQ(textOf(boot->FCUniversalVersion), "5.30a2");
  EXPECT_EQ(textOf(boot->OptROMVersion), "5.30a2");
  EXPECT_EQ(textOf(boot->OperationalFirmware), "(null)");
}

TEST_F(Software_Identities, PortSoftwareIsTiedToItsElements) {
  ProviderAgent& agent = build(plainPort());
  const Identity* firmware = find(agent, "TVX FC HBA:Firmware:v2.01a4 TVX1 SN1");
  ASSERT_EQ(agent.m_TVXHBA_FirmwareElementSoftwareIdentity_map.size(), 1u);
  const auto& onChip = *agent.m_TVXHBA_FirmwareElementSoftwareIdentity_map[0];
  EXPECT_TRUE(tiesClones(&onChip, firmware, agent.m_TVXHBA_Chip_map[0]));
  EXPECT_EQ(textOf(onChip.PortID), "SN1:0");
  EXPECT_EQ(numbersOf(onChip.ElementSoftwareStatus), (std::vector<std::uint16_t>{2, 6}));
  ASSERT_EQ(agent.m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map[0], firmware,
                         agent.m_TVXHBA_SoftwareInstallationService_map[0]));
  // Kernel, boot code, stub and driver stand on the port, in this order.
  auto& onPort = agent.m_TVXHBA_ElementSoftwareIdentity_map;
  const std::vector<std::string> keys = {"Firmware Kernel v2.01a4 TVX1 SN1",
                                         "Boot Code - Expansion ROM v5.30a2 TVX1 SN1",
                                         "Functional Firmware stub v2.01a4 TVX1 SN1", DRIVER};
  ASSERT_EQ(onPort.size(), keys.size());
  for (std::size_t i = 0; i < keys.size(); i++)
    EXPECT_TRUE(tiesClones(onPort[i], find(agent, keys[i]), agent.m_TVXHBA_FCPort_map[0]))
        << keys[i];
  // The provider, and the four of the port.
  EXPECT_EQ(agent.m_TVXHBA_InstalledSoftwareIdentity_map.size(), 5u);
  // Provider, driver, diagnostics, and the four of the port.
  EXPECT_EQ(agent.m_TVXHBA_SoftwareConformsToProfile_map.size(), 7u);
}

TEST_F(Software_Identities, TextsOfThePortSoftware) {
  build(plainPort());
  const std::string conforms = "Generating TVXHBA_SoftwareConformsToProfile (";
  const std::string stands = "Generating TVXHBA_ElementSoftwareIdentity (Software Identity (";
  const std::vector<std::string> texts = {
      conforms + "Firmware TVX1:1000000000000001, Software Inventory)",
      stands + "Firmware Kernel) TVX1:1000000000000001)",
      conforms + "Firmware Kernel TVX1:1000000000000001, Software Inventory)",
      stands + "Boot Code - Expansion ROM) TVX1:1000000000000001)",
      conforms + "Boot Code - Expansion ROM TVX1:1000000000000001, Software Inventory)",
      stands + "Functional Firmware stub) TVX1:1000000000000001)",
      conforms + "Functional Firmware stub TVX1:1000000000000001, Software Inventory)",
      stands + "Driver) TVX1:1000000000000001)",
  };
  EXPECT_EQ(log.only(texts), texts);
}

TEST_F(Software_Identities, AdapterE200HasFirmwareAndDriverOnly) {
  ProviderAgent& agent = build(plainPort(R"("device_id": "0xE200", )"));
  EXPECT_NE(find(agent, "TVX FC HBA:Firmware:v2.01a4 TVX1 SN1"), nullptr);
  EXPECT_EQ(find(agent, "Firmware Kernel v2.01a4 TVX1 SN1"), nullptr);
  EXPECT_EQ(find(agent, "Boot Code - Expansion ROM v5.30a2 TVX1 SN1"), nullptr);
  EXPECT_EQ(find(agent, "Functional Firmware stub v2.01a4 TVX1 SN1"), nullptr);
  ASSERT_EQ(agent.m_TVXHBA_ElementSoftwareIdentity_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ElementSoftwareIdentity_map[0], find(agent, DRIVER),
                         agent.m_TVXHBA_FCPort_map[0]));
}

TEST_F(Software_Identities, PortsOfOneCardShareTheirIdentities) {
  ProviderAgent& agent = build(
      R"({"cards": [{"model": "TVX2", "serial_number": "SN2", "ports": [
          {"wwpn": "10:00:00:00:00:00:00:01", "fru": []},
          {"wwpn": "10:00:00:00:00:00:00:02", "fru": []}]}]})");
  ASSERT_EQ(agent.m_TVXHBA_FCPort_map.size(), 2u);
  EXPECT_EQ(log.count(REFUSED), 4u);
  EXPECT_EQ(log.level(REFUSED), TVX_CRIT);
  EXPECT_EQ(log.count("CreateFirmwareIdentityInstance failed"), 0u);
  const Identity* kernel = find(agent, "Firmware Kernel v2.01a4 TVX2 SN2");
  ASSERT_NE(kernel, nullptr);
  EXPECT_EQ(textOf(kernel->PortWWN), "1000000000000001");
  // The second port has its links too.
  auto& onPort = agent.m_TVXHBA_ElementSoftwareIdentity_map;
  ASSERT_EQ(onPort.size(), 8u);
  EXPECT_TRUE(tiesClones(onPort[4], kernel, agent.m_TVXHBA_FCPort_map[1]));
}

TEST_F(Software_Identities, VersionThatCannotBeParsedLeavesItsNumbersNull) {
  ProviderAgent& agent = build(
      R"({"cards": [{"model": "TVX3", "serial_number": "SN3", "firmware_version": "10.2.1",
          "ports": [{"wwpn": "10:00:00:00:00:00:00:01", "fru": []}]}]})");
  const Identity* identity = find(agent, "TVX FC HBA:Firmware:v10.2.1 TVX3 SN3");
  ASSERT_NE(identity, nullptr);
  EXPECT_EQ(textOf(identity->VersionString), "10.2.1");
  EXPECT_TRUE(identity->MajorVersion.is_null());
  EXPECT_TRUE(identity->BuildNumber.is_null());
  EXPECT_TRUE(identity->ReleaseType.is_null());
  EXPECT_EQ(log.count("Firmware- Parsing Success"), 0u);
  EXPECT_EQ(log.count("Firmware- Parsing Done"), 1u);
}

}  // namespace
}  // namespace cimrt::test
