// The identities that belong to the host as a whole: provider, drivers, diagnostics.
#include "agent/SoftwareIdentities.h"

#include <array>
#include <string_view>

#include "access/TVX_MethodWrapper.h"
#include "agent/Associations.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "common/TVX_Clock.h"
#include "common/TVX_Common.h"
#include "common/TVX_Memory.h"

namespace cimrt {

namespace {

constexpr const char* IDENTITY_REFUSED = "Insert Failed : m_TVXHBA_SoftwareIdentity_map";

/// Selectors of the library versions.
constexpr int LIB_RMAPI_VERSION = 0x66;
constexpr int LIB_DFC_VERSION = 0x68;

/// Room for a library version: more than any library was seen to ask for.
constexpr std::size_t VERSION_ROOM = 4096;

/// Operating system types of the CIM schema.
constexpr std::uint16_t OS_OTHER = 1;
constexpr std::uint16_t OS_LINUX = 36;

constexpr const char* DIAGNOSTICS_NAME = "TVXHBA Diagnostics";

void setLibraryVersion(Property<String>& property, int selector, const char* name) {
  TVX_Block text = tvxAllocate(VERSION_ROOM);
  const RM_STATUS status =
      text ? TVX_MethodWrapper::GetLibraryVersion(selector, reinterpret_cast<char*>(text.get()),
                                                  VERSION_ROOM - 1)
           : RM_ERROR_NO_MEMORY;
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "Failed to get %s: returned with error - %d", name, status);
    return;
  }
  property.set(reinterpret_cast<const char*>(text.get()));
}

/// The operating system as the library sees it through the first port.
void setTargetOSTypes(TVXHBA_SoftwareIdentity& identity, const std::string& portName) {
  std::array<char, 41> text{};
  if (portName.empty() ||
      TVX_MethodWrapper::getTargetOS_info(portName.c_str(), text.data()) != RM_OK)
    return;
  const std::string_view system = text.data();
  identity.TargetOperatingSystems.set({String(system)});
  identity.TargetOSTypes.set({system.find("Linux") != system.npos ? OS_LINUX : OS_OTHER});
}

Ref<TVXHBA_SoftwareIdentity> makeProviderIdentity(const Host_Build& host) {
  auto identity = makeInstance<TVXHBA_SoftwareIdentity>();
  const std::string name = providerIdentityInstanceID();
  identity->InstanceID.set(name.c_str());
  identity->ElementName.set(name.c_str());
  identity->Name.set(name.c_str());
  identity->Description.set("Torvex CMPI HBA Provider");
  identity->VersionString.set(providerVersionText().c_str());
  identity->Manufacturer.set(TORVEX_CORPORATION);
  identity->Classifications.set({SOFTWARE_APPLICATION});
  identity->ClassificationDescriptions.set({"CMPI HBA CIM Provider"});
  identity->IsEntity.set(true);
  identity->MajorVersion.set(PROVIDER_MAJOR);
  identity->MinorVersion.set(PROVIDER_MINOR);
  identity->RevisionNumber.set(PROVIDER_REVISION);
  identity->BuildNumber.set(PROVIDER_BUILD);
  identity->InstallDate.set(tvxNowDatetime());
  setLibraryVersion(identity->LibDFCVersion, LIB_DFC_VERSION, "LibDFCVersion");
  setLibraryVersion(identity->LibRMAPIVersion, LIB_RMAPI_VERSION, "LibRMAPIVersion");
  setTargetOSTypes(*identity, host.firstPortName);
  return identity;
}

void associateProviderIdentity(Host_Build& host) {
  ProviderAgent& agent = host.agent;
  TVXHBA_SoftwareIdentity* identity = host.providerIdentity;
  createInstalledSoftwareIdentity(agent, identity->InstanceID.value.c_str(), host.system, identity);
  createProviderSoftwareIdentity(
      agent, formatText("Software Identity (CMPI HBA Provider v%s)", providerVersionText().c_str()),
      identity, host.system);
  createSoftwareConformsToProfile(agent, "CMPI HBA Provider, Software",
                                  findRegisteredProfile(agent, "Software"), identity);
}

struct Driver_Facts {
  std::string name;
  std::string version;
  std::string manufacturer;
  std::uint32_t type;
};

Driver_Facts readDriver(const FCAdapterAttributes& attributes) {
  Driver_Facts driver{attributes.DriverName, attributes.DriverVersion, attributes.Manufacturer,
                      attributes.DriverType};
  if (driver.manufacturer.empty()) driver.manufacturer = TORVEX_CORPORATION;
  TVX_LOG(TVX_DBG, "driverName: %s, driverVersion: %s, driverManufacturer: %s", driver.name.c_str(),
          driver.version.c_str(), driver.manufacturer.c_str());
  return driver;
}

/// The four numbers of a driver's version: in the form of a firmware version, or dotted.
void setDriverNumbers(TVXHBA_SoftwareIdentity& identity, const std::string& text) {
  ParsedVersion version;
  if (parseVersion(text.c_str(), version) != 0) {
    std::uint16_t numbers[4];
    versionNumbers(text.c_str(), numbers);
    version.Major = numbers[0];
    version.Minor = numbers[1];
    version.Revision = numbers[2];
    version.Build = numbers[3];
  }
  identity.MajorVersion.set(version.Major);
  identity.MinorVersion.set(version.Minor);
  identity.RevisionNumber.set(version.Revision);
  identity.BuildNumber.set(version.Build);
}

Ref<TVXHBA_SoftwareIdentity> makeDriverIdentity(const std::string& instanceID,
                                                const Driver_Facts& driver) {
  auto identity = makeInstance<TVXHBA_SoftwareIdentity>();
  const std::string name = formatText("%s v%s", driver.name.c_str(), driver.version.c_str());
  identity->InstanceID.set(instanceID.c_str());
  identity->ElementName.set(name.c_str());
  identity->Name.set(name.c_str());
  identity->Description.set("Torvex HBA Driver");
  identity->VersionString.set(driver.version.c_str());
  identity->Manufacturer.set(driver.manufacturer.c_str());
  identity->IsEntity.set(true);
  setDriverNumbers(*identity, driver.version);
  identity->IdentityInfoValue.set({driver.name.c_str(), driver.version.c_str(),
                                   formatText("%d", static_cast<int>(driver.type)).c_str()});
  identity->IdentityInfoType.set(
      {"TORVEX:DRIVER_NAME", "TORVEX:DRIVER_VERSION", "TORVEX:TVFC_DRIVER_TYPE"});
  identity->Classifications.set({SOFTWARE_DRIVER});
  identity->ClassificationDescriptions.set({"FC HBA Driver"});
  return identity;
}

Ref<TVXHBA_SoftwareIdentity> makeDiagnosticsIdentity(const std::string& name,
                                                     std::uint32_t number) {
  auto identity = makeInstance<TVXHBA_SoftwareIdentity>();
  const std::string version = formatText("%d", static_cast<int>(number));
  identity->InstanceID.set(name.c_str());
  identity->ElementName.set(name.c_str());
  identity->Name.set(name.c_str());
  identity->Description.set(DIAGNOSTICS_NAME);
  identity->VersionString.set(version.c_str());
  identity->Manufacturer.set(TORVEX_CORPORATION);
  identity->IdentityInfoValue.set({DIAGNOSTICS_NAME, version.c_str()});
  identity->IdentityInfoType.set({"TORVEX:DIAGNOSTICS_NAME", "TORVEX:DIAGNOSTICS_VERSION"});
  identity->Classifications.set({SOFTWARE_DIAGNOSTIC});
  identity->ClassificationDescriptions.set({DIAGNOSTICS_NAME});
  identity->IsEntity.set(true);
  identity->MajorVersion.set(static_cast<std::uint16_t>(number));
  identity->MinorVersion.set(0);
  identity->RevisionNumber.set(0);
  identity->BuildNumber.set(0);
  return identity;
}

/// The identity of that `InstanceID`, made by `make` and tied to the inventory if it is new. Null
/// when a new one was refused.
template <class Make>
TVXHBA_SoftwareIdentity* hostIdentity(ProviderAgent& agent, const std::string& instanceID,
                                      const char* conformance, Make make) {
  auto& map = agent.m_TVXHBA_SoftwareIdentity_map;
  if (auto* known = findByText(map, &TVXHBA_SoftwareIdentity::InstanceID, instanceID)) return known;
  TVXHBA_SoftwareIdentity* identity = insertInto(map, make(), IDENTITY_REFUSED);
  if (identity)
    createSoftwareConformsToProfile(agent, conformance,
                                    findRegisteredProfile(agent, "Software Inventory"), identity);
  return identity;
}

bool buildAdapterSoftware(Host_Build& host, const FCAdapterAttributes& attributes) {
  const Driver_Facts driver = readDriver(attributes);
  const std::string driverID = driverIdentityInstanceID(attributes);
  TVXHBA_SoftwareIdentity* identity =
      hostIdentity(host.agent, driverID, "Driver, Software Inventory",
                   [&] { return makeDriverIdentity(driverID, driver); });
  if (!identity) return false;
  if (!host.driverIdentity) host.driverIdentity = identity;
  const std::string diagnosticsID =
      formatText("%s v%d", DIAGNOSTICS_NAME, static_cast<int>(attributes.DiagVersion));
  return hostIdentity(host.agent, diagnosticsID, "Diagnositc, Software Inventory", [&] {
           return makeDiagnosticsIdentity(diagnosticsID, attributes.DiagVersion);
         }) != nullptr;
}

}  // namespace

std::string providerVersionText() {
  return formatText("%d.%d.%d-%d", PROVIDER_MAJOR, PROVIDER_MINOR, PROVIDER_REVISION,
                    PROVIDER_BUILD);
}

std::string providerIdentityInstanceID() {
  return formatText("Torvex CMPI HBA Provider v%s", providerVersionText().c_str());
}

std::string driverIdentityInstanceID(const FCAdapterAttributes& attributes) {
  return formatText("TVX FC HBA: Driver %s v%s", attributes.DriverName.c_str(),
                    attributes.DriverVersion.c_str());
}

std::int32_t buildProviderIdentity(Host_Build& host) {
  host.providerIdentity = insertInto(host.agent.m_TVXHBA_SoftwareIdentity_map,
                                     makeProviderIdentity(host), IDENTITY_REFUSED);
  if (!host.providerIdentity) {
    TVX_LOG(TVX_CRIT, "TVXHBA_SoftwareIdentity provider creation failed");
    return MAP_BUILD_FAILED;
  }
  associateProviderIdentity(host);
  return 0;
}

std::int32_t CreateDriverIdentity(Host_Build& host) {
  for (Adapter* adapter : host.agent.m_pData->m_Adapters) {
    const auto* attributes = dynamic_cast<const FCAdapterAttributes*>(adapter->getAttributes());
    if (adapter->m_Type != TVX_ADAPTER_TYPE_FC || !attributes) {
      TVX_LOG(TVX_DBG, "Skippping Adapter [%s] since it is not an FC Adapter",
              adapter->getName().c_str());
      continue;
    }
    if (!buildAdapterSoftware(host, *attributes)) return MAP_BUILD_FAILED;
  }
  return 0;
}

}  // namespace cimrt
