// The table of associations: what each kind logs, carries and does when the map refuses it.
#include "agent/Associations.h"

#include <set>

#include "Agent_Fixture.h"
#include "Instance_Checks.h"
#include "agent/Map_Insert.h"

namespace cimrt::test {
namespace {

using enum Association_Kind;

class Associations : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    system = makeInstance<CIM_ComputerSystem>();
    system->Name.set("host");
    system->CreationClassName.set("CIM_ComputerSystem");
    identity = makeInstance<TVXHBA_SoftwareIdentity>();
    identity->InstanceID.set("software");
    log.clear();
  }

  Ref<CIM_ComputerSystem> system;
  Ref<TVXHBA_SoftwareIdentity> identity;
};

struct Expected_Rule {
  Association_Kind kind;
  const char* className;
  const char* insertFailure;
};

// Written down apart from the table under test.
constexpr Expected_Rule EXPECTED[] = {
    {INSTALLED_SOFTWARE_IDENTITY, "TVXHBA_InstalledSoftwareIdentity",
     "Insert Failed : m_TVXHBA_InstalledSoftwareIdentity_map"},
    {SOFTWARE_CONFORMS_TO_PROFILE, "TVXHBA_SoftwareConformsToProfile",
     "Insert Failed : m_TVXHBA_SoftwareConformsToProfile_map"},
    {PORT_CONTROLLER_CONFORMS_TO_PROFILE, "TVXHBA_PortControllerConformsToProfile",
     "Insert Failed : m_TVXHBA_PortControllerConformsToProfile_map"},
    {FC_PORT_CONFORMS_TO_PROFILE, "TVXHBA_FCPortConformsToProfile",
     "Insert Failed : m_TVXHBA_FCPortConformsToProfile_map"},
    {RECORD_LOG_CONFORMS_TO_PROFILE, "TVXHBA_RecordLogConformsToProfile",
     "Insert Failed : m_TVXHBA_RecordLogConformsToProfile_map"},
    {COMPUTER_SYSTEM_CONFORMS_TO_PROFILE, "TVXHBA_ComputerSystemConformsToProfile",
     "Insert Failed : m_TVXHBA_ComputerSystemConformsToProfile_map"},
    {INSTALL_SERVICE_CONFORMS_TO_PROFILE, "TVXHBA_InstallServiceConformsToProfile",
     "Insert Failed"},
    {PROVIDER_SOFTWARE_IDENTITY, "TVXHBA_ProviderSoftwareIdentity",
     "Insert Failed : m_TVXHBA_ProviderSoftwareIdentity_map"},
    {ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_ElementSoftwareIdentity",
     "Insert Failed : m_TVXHBA_FCPortSoftwareIdentity_map"},
    {FIRMWARE_ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_FirmwareElementSoftwareIdentity",
     "Insert Failed (CNA): m_TVXHBA_FirmwareElementSoftwareIdentity_map"},
    {FC_TAG_ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_FCTagElementSoftwareIdentity",
     "Insert Failed (CNA): m_TVXHBA_FCTagElementSoftwareIdentity_map"},
    {ELEMENT_CAPABILITIES, "TVXHBA_ElementCapabilities", "Insert Failed"},
    {PROVIDER_USE_OF_LOG, "TVXHBA_ProviderUseOfLog", "Insert Failed"},
    {RECORD_LOG_CAPABILITIES, "TVXHBA_RecordLogCapabilities", "Insert Failed"},
    {HOSTED_INSTALLATION_SERVICE, "TVXHBA_HostedInstallationService", "Insert Failed"},
    {HOSTED_WWN_SERVICE, "TVXHBA_HostedFCHBAWWNService", "Insert Failed"},
    {HOSTED_TAG_SERVICE, "TVXHBA_HostedFCTagService", "Insert Failed"},
    {HOSTED_BOOT_BIOS_SERVICE, "TVXHBA_HostedBootBIOSService", "Insert Failed"},
    {HOSTED_DRIVER_PARAM_SERVICE, "TVXHBA_HostedFCHBADriverParamService", "Insert Failed"},
    {REMOTE_HOSTED_ACCESS_POINT, "TVXHBA_RemoteHostedAccessPoint",
     "Insert Failed : m_TVXHBA_RemoteHostedAccessPoint_map"},
    {INSTALL_SERVICE_AFFECTS_SYSTEM, "TVXHBA_InstallServiceAffectsSystem", "Insert Failed"},
    {INSTALL_SERVICE_AFFECTS_FIRMWARE, "TVXHBA_InstallServiceAffectsFirmwareIdentity",
     "Insert Failed : m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map"},
    {WWN_SERVICE_AFFECTS_SYSTEM, "TVXHBA_FCHBAWWNServiceAffectsSystem", "Insert Failed"},
    {WWN_SERVICE_AFFECTS_FC_PORT, "TVXHBA_FCHBAWWNServiceAffectsFCPort", "Insert Failed"},
    {BOOT_BIOS_SERVICE_AFFECTS_SYSTEM, "TVXHBA_BootBIOSServiceAffectsSystem", "Insert Failed"},
    {BOOT_BIOS_SERVICE_AFFECTS_FC_PORT, "TVXHBA_BootBIOSServiceAffectsFCPort", "Insert Failed"},
    {DRIVER_PARAM_SERVICE_AFFECTS_FC_PORT, "TVXHBA_FCHBADriverParamServiceAffectsFCPort",
     "Insert Failed"},
    {TAG_SERVICE_AFFECTS_PORT, "TVXHBA_FCTagServiceAffectsPort",
     "Insert into m_TVXHBA_FCTagServiceAffectsPort_map Failed"},
};

TEST_F(Associations, EveryKindMakesItsClassAndLogsItsRefusal) {
  ProviderAgent& agent = startAgent();
  ASSERT_EQ(std::size(EXPECTED), static_cast<std::size_t>(COUNT));
  for (const Expected_Rule& expected : EXPECTED) {
    SCOPED_TRACE(expected.className);
    const Instance* made =
        createAssociation(agent, expected.kind, "text", system.get(), identity.get());
    ASSERT_NE(made, nullptr);
    EXPECT_STREQ(made->meta_class->name, expected.className);
    EXPECT_TRUE(made->__name_space == "root/torvex");
    EXPECT_TRUE(tiesClones(made, system.get(), identity.get()));
    log.clear();
    EXPECT_EQ(createAssociation(agent, expected.kind, "text", system.get(), identity.get()),
              nullptr);
    EXPECT_EQ(log.count(expected.insertFailure), 1u);
    EXPECT_EQ(log.level(expected.insertFailure), TVX_CRIT);
  }
}

TEST_F(Associations, KindsOfTheGeneratingFamilySayWhatTheyGenerate) {
  ProviderAgent& agent = startAgent();
  const std::set<Association_Kind> generating = {INSTALLED_SOFTWARE_IDENTITY,
                                                 SOFTWARE_CONFORMS_TO_PROFILE,
                                                 PORT_CONTROLLER_CONFORMS_TO_PROFILE,
                                                 FC_PORT_CONFORMS_TO_PROFILE,
                                                 RECORD_LOG_CONFORMS_TO_PROFILE,
                                                 PROVIDER_SOFTWARE_IDENTITY,
                                                 ELEMENT_SOFTWARE_IDENTITY};
  for (const Expected_Rule& expected : EXPECTED) {
    SCOPED_TRACE(expected.className);
    log.clear();
    createAssociation(agent, expected.kind, "the text", system.get(), identity.get());
    const std::string entry = std::string("Generating ") + expected.className + " (the text)";
    EXPECT_EQ(log.count(entry), generating.count(expected.kind));
    EXPECT_EQ(log.count("the text"), 1 - generating.count(expected.kind));
  }
}

TEST_F(Associations, SomeKindsAnnounceThemselvesByName) {
  ProviderAgent& agent = startAgent();
  createAssociation(agent, WWN_SERVICE_AFFECTS_FC_PORT, "", system.get(), identity.get());
  createAssociation(agent, HOSTED_WWN_SERVICE, "", system.get(), identity.get());
  createAssociation(agent, TAG_SERVICE_AFFECTS_PORT, "", system.get(), identity.get());
  EXPECT_EQ(log.count("createAssociationsAffectedAffectingElem_FCHBAWWNService_FCPort_"
                      "FCHBAWWNServiceAffectsFCPort"),
            1u);
  EXPECT_EQ(log.count("ProviderAgent::createAssociationAntDep_ComputerSystem_FCHBAWWNService_"
                      "HostedFCHBAWWNService"),
            1u);
  EXPECT_EQ(log.count("createAssoc_FCTagService_FCPort: Creating TVXHBA_FCTagServiceAffectsPort "),
            1u);
  EXPECT_EQ(log.count(""), 0u);
}

TEST_F(Associations, CreationFailureTextsOfTheTable) {
  EXPECT_STREQ(associationRule(WWN_SERVICE_AFFECTS_FC_PORT).creationFailure,
               "Could not create the instance of the Association class");
  EXPECT_STREQ(associationRule(TAG_SERVICE_AFFECTS_PORT).creationFailure,
               "Could not create the instance of the TVXHBA_FCTagServiceAffectsPort");
}

TEST_F(Associations, UpgradeConditionIsSetWhereTheKindSaysSo) {
  ProviderAgent& agent = startAgent();
  createProviderSoftwareIdentity(agent, "p", identity.get(), system.get());
  createElementSoftwareIdentity(agent, "e", identity.get(), system.get());
  createAssociation(agent, FIRMWARE_ELEMENT_SOFTWARE_IDENTITY, "", identity.get(), system.get());
  ASSERT_EQ(agent.m_TVXHBA_ProviderSoftwareIdentity_map.size(), 1u);
  EXPECT_EQ(numberOf(agent.m_TVXHBA_ProviderSoftwareIdentity_map[0]->UpgradeCondition), 3);
  ASSERT_EQ(agent.m_TVXHBA_ElementSoftwareIdentity_map.size(), 1u);
  EXPECT_EQ(numberOf(agent.m_TVXHBA_ElementSoftwareIdentity_map[0]->UpgradeCondition), 3);
  ASSERT_EQ(agent.m_TVXHBA_FirmwareElementSoftwareIdentity_map.size(), 1u);
  const auto& firmware = *agent.m_TVXHBA_FirmwareElementSoftwareIdentity_map[0];
  EXPECT_EQ(numberOf(firmware.UpgradeCondition), -1);
  EXPECT_EQ(numbersOf(firmware.ElementSoftwareStatus), (std::vector<std::uint16_t>{2, 6}));
}

TEST_F(Associations, MissingEndLogsTheTextAndMakesNothing) {
  ProviderAgent& agent = startAgent();
  EXPECT_EQ(
      createAssociation(agent, SOFTWARE_CONFORMS_TO_PROFILE, "nobody", nullptr, identity.get()),
      nullptr);
  EXPECT_EQ(createAssociation(agent, SOFTWARE_CONFORMS_TO_PROFILE, "nobody", system.get(), nullptr),
            nullptr);
  EXPECT_EQ(agent.m_TVXHBA_SoftwareConformsToProfile_map.size(), 0u);
  EXPECT_EQ(log.count("Generating TVXHBA_SoftwareConformsToProfile (nobody)"), 2u);
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_SoftwareConformsToProfile_map"), 0u);
}

TEST_F(Associations, ChangingAnEndLaterLeavesTheAssociationAsItIs) {
  ProviderAgent& agent = startAgent();
  createInstalledSoftwareIdentity(agent, "x", system.get(), identity.get());
  identity->InstanceID.set("changed");
  const auto& made = *agent.m_TVXHBA_InstalledSoftwareIdentity_map[0];
  EXPECT_EQ(textOf(made.InstalledSoftware->InstanceID), "software");
  EXPECT_EQ(textOf(made.System->Name), "host");
}

}  // namespace
}  // namespace cimrt::test
