#include "agent/RegisteredProfiles.h"

#include "agent/Associations.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

constexpr std::uint16_t ADVERTISED_BY_SLP = 3;

constexpr Profile_Row REGISTRATION = {"Profile Registration", ORGANIZATION_DMTF, "1.0.0"};
constexpr Profile_Row INVENTORY = {"Software Inventory", ORGANIZATION_DMTF, "1.0.0"};
constexpr Profile_Row PACKAGE = {"Physical Package", ORGANIZATION_SNIA, "1.3.0"};
constexpr Profile_Row RESOURCES = {"Host Discovered Resources", ORGANIZATION_SNIA, "1.2.0"};
constexpr Profile_Row FC_HBA = {"FC HBA", ORGANIZATION_SNIA, "1.2.0"};
constexpr Profile_Row STORAGE_HBA = {"Storage HBA", ORGANIZATION_SNIA, "1.4.0"};
constexpr Profile_Row INITIATOR_PORTS = {"FC Initiator Ports", ORGANIZATION_SNIA, "1.3.0"};
constexpr Profile_Row SOFTWARE = {"Software", ORGANIZATION_SNIA, "1.2.0"};
constexpr Profile_Row ACCESS_POINTS = {"Access Points", ORGANIZATION_SNIA, "1.3.0"};
constexpr Profile_Row PCI_DEVICE = {"PCI Device", ORGANIZATION_DMTF, "1.0.0"};
constexpr Profile_Row DIAGNOSTICS = {"FCHBA Diagnostics", ORGANIZATION_DMTF, "1.0.0"};
constexpr Profile_Row ASSET = {"Physical Asset", ORGANIZATION_DMTF, "1.0.2"};
constexpr Profile_Row RECORD_LOG = {"Record Log", ORGANIZATION_DMTF, "1.0.1"};
constexpr Profile_Row UPDATE = {"Software Update", ORGANIZATION_DMTF, "1.0.0"};

constexpr Profile_Row BASE[] = {REGISTRATION,  INVENTORY,   PACKAGE,         RESOURCES,
                                FC_HBA,        STORAGE_HBA, INITIATOR_PORTS, SOFTWARE,
                                ACCESS_POINTS, PCI_DEVICE,  DIAGNOSTICS,     ASSET};

constexpr Profile_Row ENUMERATED[] = {
    REGISTRATION, INVENTORY,  PACKAGE,  RESOURCES,     FC_HBA,     STORAGE_HBA, INITIATOR_PORTS,
    UPDATE,       RECORD_LOG, SOFTWARE, ACCESS_POINTS, PCI_DEVICE, DIAGNOSTICS, ASSET};

}  // namespace

std::span<const Profile_Row> baseProfiles() {
  return BASE;
}

std::span<const Profile_Row> enumeratedProfiles() {
  return ENUMERATED;
}

std::span<const Profile_Row> referencedProfiles() {
  // All but the first, which is the one that refers, and the last, which is left out on purpose.
  return enumeratedProfiles().subspan(1, std::size(ENUMERATED) - 2);
}

std::string profileInstanceID(const char* name) {
  return formatText("TVX:%s", name);
}

Ref<TVXHBA_RegisteredProfile> makeRegisteredProfile(const Profile_Row& row) {
  auto profile = makeInstance<TVXHBA_RegisteredProfile>(INTEROP_NAME_SPACE);
  profile->InstanceID.set(profileInstanceID(row.name).c_str());
  profile->Description.set(formatText("Torvex %s", row.name).c_str());
  profile->ElementName.set(formatText("Torvex Registered %s", row.name).c_str());
  profile->RegisteredOrganization.set(row.organization);
  profile->RegisteredName.set(row.name);
  profile->RegisteredVersion.set(row.version);
  profile->AdvertiseTypes.set({ADVERTISED_BY_SLP});
  profile->AdvertiseTypeDescriptions.set({"SLP"});
  return profile;
}

TVXHBA_RegisteredProfile* findRegisteredProfile(ProviderAgent& agent, const char* name) {
  return findByText(agent.m_TVXHBA_RegisteredProfile_map, &TVXHBA_RegisteredProfile::InstanceID,
                    profileInstanceID(name));
}

TVXHBA_RegisteredProfile* createRegisteredProfile(ProviderAgent& agent, const char* name,
                                                  std::uint16_t organization, const char* version) {
  TVX_LOG(TVX_DBG, "Generating TVXHBA_RegisteredProfile (%s)", name);
  if (TVXHBA_RegisteredProfile* known = findRegisteredProfile(agent, name)) {
    TVX_LOG(TVX_DBG, "Got TVXHBA_RegisteredProfile in the map (%s)", name);
    return known;
  }
  TVXHBA_RegisteredProfile* made = insertInto(agent.m_TVXHBA_RegisteredProfile_map,
                                              makeRegisteredProfile({name, organization, version}),
                                              "Insert Failed : m_TVXHBA_RegisteredProfile_map");
  if (made) TVX_LOG(TVX_DBG, "Created TVXHBA_RegisteredProfile in the map (%s)", name);
  return made;
}

void createComputerSystemConformsToProfile(ProviderAgent& agent,
                                           const TVXHBA_RegisteredProfile* profile) {
  TVX_LOG(TVX_DBG, "inside createComputerSystemConformsToProfile");
  if (!agent.m_bOwnComputerSystem) {
    TVX_LOG(TVX_DBG, "This is IBM/VMWare comp Sys - do nothing");
    return;
  }
  if (!profile || agent.m_CIM_ComputerSystem_map.size() == 0) return;
  createAssociation(agent, Association_Kind::COMPUTER_SYSTEM_CONFORMS_TO_PROFILE,
                    formatText("Computer System,%s", profile->InstanceID.value.c_str()), profile,
                    agent.m_CIM_ComputerSystem_map[0]);
}

std::int32_t registerBaseProfiles(Host_Build& host) {
  for (const Profile_Row& row : baseProfiles())
    createComputerSystemConformsToProfile(
        host.agent, createRegisteredProfile(host.agent, row.name, row.organization, row.version));
  return 0;
}

}  // namespace cimrt
