#include "agent/Associations.h"

#include <iterator>

#include "agent/Map_Insert.h"
#include "runtime/Value.h"

namespace cimrt {

namespace {

using enum Association_Kind;
using enum Entry_Text;

/// The map of a member pointer, as the base that all maps have.
template <auto MEMBER>
Instance_Map_Base& mapOf(Agent_Maps& maps) {
  return maps.*MEMBER;
}

constexpr const char* NOT_CREATED = "Could not create the instance of the Association class";
constexpr const char* NOT_INSERTED = "Insert Failed";

constexpr std::uint16_t OWNER_MAY_UPGRADE = 3;  ///< upgrade condition "packages"

constexpr Association_Rule RULES[] = {
    {INSTALLED_SOFTWARE_IDENTITY, "TVXHBA_InstalledSoftwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_InstalledSoftwareIdentity_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_InstalledSoftwareIdentity_map", 0, false},
    {SOFTWARE_CONFORMS_TO_PROFILE, "TVXHBA_SoftwareConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_SoftwareConformsToProfile_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_SoftwareConformsToProfile_map", 0, false},
    {PORT_CONTROLLER_CONFORMS_TO_PROFILE, "TVXHBA_PortControllerConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_PortControllerConformsToProfile_map>, GENERATING, nullptr,
     NOT_CREATED, "Insert Failed : m_TVXHBA_PortControllerConformsToProfile_map", 0, false},
    {FC_PORT_CONFORMS_TO_PROFILE, "TVXHBA_FCPortConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_FCPortConformsToProfile_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_FCPortConformsToProfile_map", 0, false},
    {RECORD_LOG_CONFORMS_TO_PROFILE, "TVXHBA_RecordLogConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_RecordLogConformsToProfile_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_RecordLogConformsToProfile_map", 0, false},
    {COMPUTER_SYSTEM_CONFORMS_TO_PROFILE, "TVXHBA_ComputerSystemConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_ComputerSystemConformsToProfile_map>, PLAIN, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_ComputerSystemConformsToProfile_map", 0, false},
    {INSTALL_SERVICE_CONFORMS_TO_PROFILE, "TVXHBA_InstallServiceConformsToProfile",
     mapOf<&Agent_Maps::m_TVXHBA_InstallServiceConformsToProfile_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {PROVIDER_SOFTWARE_IDENTITY, "TVXHBA_ProviderSoftwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_ProviderSoftwareIdentity_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_ProviderSoftwareIdentity_map", OWNER_MAY_UPGRADE, false},
    {ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_ElementSoftwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_ElementSoftwareIdentity_map>, GENERATING, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_FCPortSoftwareIdentity_map", OWNER_MAY_UPGRADE, false},
    {FIRMWARE_ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_FirmwareElementSoftwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_FirmwareElementSoftwareIdentity_map>, PLAIN, nullptr, NOT_CREATED,
     "Insert Failed (CNA): m_TVXHBA_FirmwareElementSoftwareIdentity_map", 0, true},
    {FC_TAG_ELEMENT_SOFTWARE_IDENTITY, "TVXHBA_FCTagElementSoftwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_FCTagElementSoftwareIdentity_map>, PLAIN, nullptr, NOT_CREATED,
     "Insert Failed (CNA): m_TVXHBA_FCTagElementSoftwareIdentity_map", 0, false},
    {ELEMENT_CAPABILITIES, "TVXHBA_ElementCapabilities",
     mapOf<&Agent_Maps::m_TVXHBA_ElementCapabilities_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {PROVIDER_USE_OF_LOG, "TVXHBA_ProviderUseOfLog",
     mapOf<&Agent_Maps::m_TVXHBA_ProviderUseOfLog_map>, PLAIN, nullptr, NOT_CREATED, NOT_INSERTED,
     0, false},
    {RECORD_LOG_CAPABILITIES, "TVXHBA_RecordLogCapabilities",
     mapOf<&Agent_Maps::m_TVXHBA_RecordLogCapabilities_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {HOSTED_INSTALLATION_SERVICE, "TVXHBA_HostedInstallationService",
     mapOf<&Agent_Maps::m_TVXHBA_HostedInstallationService_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {HOSTED_WWN_SERVICE, "TVXHBA_HostedFCHBAWWNService",
     mapOf<&Agent_Maps::m_TVXHBA_HostedFCHBAWWNService_map>, PLAIN,
     "ProviderAgent::createAssociationAntDep_ComputerSystem_FCHBAWWNService_"
     "HostedFCHBAWWNService",
     NOT_CREATED, NOT_INSERTED, 0, false},
    {HOSTED_TAG_SERVICE, "TVXHBA_HostedFCTagService",
     mapOf<&Agent_Maps::m_TVXHBA_HostedFCTagService_map>, PLAIN, nullptr, NOT_CREATED, NOT_INSERTED,
     0, false},
    {HOSTED_BOOT_BIOS_SERVICE, "TVXHBA_HostedBootBIOSService",
     mapOf<&Agent_Maps::m_TVXHBA_HostedBootBIOSService_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {HOSTED_DRIVER_PARAM_SERVICE, "TVXHBA_HostedFCHBADriverParamService",
     mapOf<&Agent_Maps::m_TVXHBA_HostedFCHBADriverParamService_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {REMOTE_HOSTED_ACCESS_POINT, "TVXHBA_RemoteHostedAccessPoint",
     mapOf<&Agent_Maps::m_TVXHBA_RemoteHostedAccessPoint_map>, PLAIN, nullptr, NOT_CREATED,
     "Insert Failed : m_TVXHBA_RemoteHostedAccessPoint_map", 0, false},
    {INSTALL_SERVICE_AFFECTS_SYSTEM, "TVXHBA_InstallServiceAffectsSystem",
     mapOf<&Agent_Maps::m_TVXHBA_InstallServiceAffectsSystem_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {INSTALL_SERVICE_AFFECTS_FIRMWARE, "TVXHBA_InstallServiceAffectsFirmwareIdentity",
     mapOf<&Agent_Maps::m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map>, PLAIN, nullptr,
     NOT_CREATED, "Insert Failed : m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map", 0, false},
    {WWN_SERVICE_AFFECTS_SYSTEM, "TVXHBA_FCHBAWWNServiceAffectsSystem",
     mapOf<&Agent_Maps::m_TVXHBA_FCHBAWWNServiceAffectsSystem_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {WWN_SERVICE_AFFECTS_FC_PORT, "TVXHBA_FCHBAWWNServiceAffectsFCPort",
     mapOf<&Agent_Maps::m_TVXHBA_FCHBAWWNServiceAffectsFCPort_map>, PLAIN,
     "createAssociationsAffectedAffectingElem_FCHBAWWNService_FCPort_"
     "FCHBAWWNServiceAffectsFCPort",
     NOT_CREATED, NOT_INSERTED, 0, false},
    {BOOT_BIOS_SERVICE_AFFECTS_SYSTEM, "TVXHBA_BootBIOSServiceAffectsSystem",
     mapOf<&Agent_Maps::m_TVXHBA_BootBIOSServiceAffectsSystem_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {BOOT_BIOS_SERVICE_AFFECTS_FC_PORT, "TVXHBA_BootBIOSServiceAffectsFCPort",
     mapOf<&Agent_Maps::m_TVXHBA_BootBIOSServiceAffectsFCPort_map>, PLAIN, nullptr, NOT_CREATED,
     NOT_INSERTED, 0, false},
    {DRIVER_PARAM_SERVICE_AFFECTS_FC_PORT, "TVXHBA_FCHBADriverParamServiceAffectsFCPort",
     mapOf<&Agent_Maps::m_TVXHBA_FCHBADriverParamServiceAffectsFCPort_map>, PLAIN, nullptr,
     NOT_CREATED, NOT_INSERTED, 0, false},
    {TAG_SERVICE_AFFECTS_PORT, "TVXHBA_FCTagServiceAffectsPort",
     mapOf<&Agent_Maps::m_TVXHBA_FCTagServiceAffectsPort_map>, PLAIN,
     "createAssoc_FCTagService_FCPort: Creating TVXHBA_FCTagServiceAffectsPort ",
     "Could not create the instance of the TVXHBA_FCTagServiceAffectsPort",
     "Insert into m_TVXHBA_FCTagServiceAffectsPort_map Failed", 0, false},
};

static_assert(std::size(RULES) == static_cast<std::size_t>(Association_Kind::COUNT));

consteval bool rulesAreInOrder() {
  for (std::size_t i = 0; i < std::size(RULES); i++)
    if (RULES[i].kind != static_cast<Association_Kind>(i)) return false;
  return true;
}
static_assert(rulesAreInOrder(), "a kind is the index of its row");

void logEntry(const Association_Rule& rule, const std::string& text) {
  if (rule.announcement) TVX_LOG(TVX_DBG, "%s", rule.announcement);
  if (text.empty()) return;
  if (rule.entry == GENERATING)
    TVX_LOG(TVX_DBG, "Generating %s (%s)", rule.className, text.c_str());
  else
    TVX_LOG(TVX_DBG, "%s", text.c_str());
}

void setUint16(Instance* instance, const char* property, std::uint16_t number) {
  Value value;
  value.set(number);
  value.set(instance, find_property(instance->meta_class, property));
}

/// `ElementSoftwareStatus`: the software is the one in use (2), and it is installed (6).
void setInUse(Instance* instance) {
  Value value;
  value.set(Array<std::uint16_t>{2, 6});
  value.set(instance, find_property(instance->meta_class, "ElementSoftwareStatus"));
}

Ref<Instance> makeByRule(const Association_Rule& rule, const Meta_Class* metaClass,
                         const Instance* first, const Instance* second) {
  Ref<Instance> association(create(metaClass, true));
  if (!association) return association;
  association->__name_space = PROVIDER_NAME_SPACE;
  setEnds(association.get(), first, second);
  if (rule.upgradeCondition != 0)
    setUint16(association.get(), "UpgradeCondition", rule.upgradeCondition);
  if (rule.inUse) setInUse(association.get());
  return association;
}

}  // namespace

const Association_Rule& associationRule(Association_Kind kind) {
  return RULES[static_cast<std::size_t>(kind)];
}

Instance* createAssociation(ProviderAgent& agent, Association_Kind kind, const std::string& text,
                            const Instance* first, const Instance* second) {
  const Association_Rule& rule = associationRule(kind);
  logEntry(rule, text);
  if (!first || !second) return nullptr;
  Instance_Map_Base& map = rule.map(agent);
  Ref<Instance> association =
      madeOrNull([&] { return makeByRule(rule, map.meta_class(), first, second); });
  if (!association) {
    TVX_LOG(TVX_CRIT, "%s", rule.creationFailure);
    return nullptr;
  }
  Instance* entry = association.get();
  return insertInstance(map, std::move(association), rule.insertFailure) ? entry : nullptr;
}

void createInstalledSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                     const CIM_ComputerSystem* system,
                                     const TVXHBA_SoftwareIdentity* identity) {
  createAssociation(agent, INSTALLED_SOFTWARE_IDENTITY, text, system, identity);
}

void createSoftwareConformsToProfile(ProviderAgent& agent, const std::string& text,
                                     const TVXHBA_RegisteredProfile* profile,
                                     const TVXHBA_SoftwareIdentity* identity) {
  createAssociation(agent, SOFTWARE_CONFORMS_TO_PROFILE, text, profile, identity);
}

void createPortControllerConformsToProfile(ProviderAgent& agent, const std::string& text,
                                           const TVXHBA_RegisteredProfile* profile,
                                           const TVXHBA_PortController* controller) {
  createAssociation(agent, PORT_CONTROLLER_CONFORMS_TO_PROFILE, text, profile, controller);
}

void createFCPortConformsToProfile(ProviderAgent& agent, const std::string& text,
                                   const TVXHBA_RegisteredProfile* profile,
                                   const TVXHBA_FCPort* port) {
  createAssociation(agent, FC_PORT_CONFORMS_TO_PROFILE, text, profile, port);
}

void createRecordLogConformsToProfile(ProviderAgent& agent, const std::string& text,
                                      const TVXHBA_RegisteredProfile* profile,
                                      const TVXHBA_RecordLog* log) {
  createAssociation(agent, RECORD_LOG_CONFORMS_TO_PROFILE, text, profile, log);
}

void createProviderSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                    const TVXHBA_SoftwareIdentity* identity,
                                    const CIM_ComputerSystem* system) {
  createAssociation(agent, PROVIDER_SOFTWARE_IDENTITY, text, identity, system);
}

void createElementSoftwareIdentity(ProviderAgent& agent, const std::string& text,
                                   const TVXHBA_SoftwareIdentity* identity,
                                   const Instance* element) {
  createAssociation(agent, ELEMENT_SOFTWARE_IDENTITY, text, identity, element);
}

}  // namespace cimrt
