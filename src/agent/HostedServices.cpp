#include "agent/HostedServices.h"

#include <string>

#include "agent/Associations.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"
#include "agent/SoftwareIdentities.h"
#include "common/TvxConfigFile.h"

namespace cimrt {

namespace {

using enum Association_Kind;

constexpr std::uint16_t STATE_ENABLED = 2;
constexpr std::uint16_t HEALTH_OK = 5;
constexpr std::uint16_t SCHEME_FILE = 3;
constexpr std::uint16_t INFO_FORMAT_URL = 200;

/// What the services differ in.
struct Service_Row {
  const char* className;
  const char* text;    ///< `Description` and `ElementName`
  const char* name;    ///< `Name`
  const char* status;  ///< `Status`; null: leave it
  bool requested;      ///< `EnabledDefault` and `RequestedState` are set
};

constexpr Service_Row INSTALLATION = {"TVXHBA_SoftwareInstallationService",
                                      "Torvex FC HBA Software Installation Service",
                                      "TVXHBA_FCSoftwareInstallationService", "ok", true};
constexpr Service_Row WWN = {"TVXHBA_FCHBAWWNService", "Torvex FC HBA WWN Management Service",
                             "TVXHBA_FCHBAWWNService", "Ok", true};
constexpr Service_Row TAG = {"TVXHBA_FCTagService", "Torvex FC HBA Tagging Service",
                             "TVXHBA_FCTagService", nullptr, false};
constexpr Service_Row BOOT_BIOS = {"TVXHBA_BootBIOSService", "Torvex FC HBA Boot BIOS Service",
                                   "TVXHBA_BootBIOSService", "Ok", false};
constexpr Service_Row DRIVER_PARAM = {"TVXHBA_FCHBADriverParamService",
                                      "Torvex FC HBA Set Driver Parameters Service",
                                      "TVXHBA_FCHBADriverParamService", "OK", false};

std::string systemName(const Host_Build& host) {
  return host.system ? host.system->Name.value.c_str() : "";
}

/// The keys of whatever belongs to the computer system.
template <class T>
void setSystem(T& instance, const Host_Build& host) {
  if (!host.system) return;
  instance.SystemCreationClassName = host.system->CreationClassName;
  instance.SystemName = host.system->Name;
}

template <class T>
Ref<T> makeService(const Host_Build& host, const Service_Row& row) {
  auto service = makeInstance<T>();
  setSystem(*service, host);
  service->CreationClassName.set(row.className);
  service->Name.set(row.name);
  service->Description.set(row.text);
  service->ElementName.set(row.text);
  service->StartMode.set("Automatic");
  service->Started.set(true);
  service->EnabledState.set(STATE_ENABLED);
  service->HealthState.set(HEALTH_OK);
  if (row.status) service->Status.set(row.status);
  if (row.requested) {
    service->EnabledDefault.set(STATE_ENABLED);
    service->RequestedState.set(STATE_ENABLED);
  }
  return service;
}

template <class T>
T* insertService(Instance_Map<T>& map, Ref<T> service, const Service_Row& row) {
  return insertInto(map, std::move(service),
                    formatText("Insert Failed : m_%s_map", row.className).c_str());
}

Ref<TVXHBA_SoftwareInstallationServiceCapabilities> makeCapabilities() {
  constexpr const char* TEXT = "Torvex Software Installation Service Capabilities";
  auto capabilities = makeInstance<TVXHBA_SoftwareInstallationServiceCapabilities>();
  capabilities->InstanceID.set("TVX:HBASoftwareInstallationServiceCapabilities");
  capabilities->Description.set(TEXT);
  capabilities->ElementName.set(TEXT);
  capabilities->SupportedTargetTypes.set({"FC HBA"});
  capabilities->CanAddToCollection.set(false);
  capabilities->OtherSupportedExtendedResourceTypeDescriptions.set({"Torvex FC firmware files"});
  capabilities->SupportedURISchemes.set({SCHEME_FILE});
  UpdateCURLCapabilities(*capabilities);
  return capabilities;
}

void associateInstallation(Host_Build& host, const TVXHBA_RegisteredProfile* profile,
                           const Instance* capabilities) {
  ProviderAgent& agent = host.agent;
  const Instance* service = host.installationService;
  const std::string system = systemName(host);
  createAssociation(
      agent, HOSTED_INSTALLATION_SERVICE,
      formatText("Hosted Service, Torvex Firmware Installation Service: %s", system.c_str()),
      host.system, service);
  createAssociation(agent, INSTALL_SERVICE_AFFECTS_SYSTEM,
                    formatText("Install Service Affects System: %s", system.c_str()), host.system,
                    service);
  createAssociation(agent, INSTALL_SERVICE_CONFORMS_TO_PROFILE, "Computer System, Update Profile",
                    profile, service);
  createAssociation(agent, ELEMENT_CAPABILITIES,
                    "Element Capabilities, Torvex FC HBA Firmware Installation Service", service,
                    capabilities);
}

Ref<TVXHBA_SoftwareIdentity> makeTagIdentity() {
  auto identity = makeInstance<TVXHBA_SoftwareIdentity>();
  const std::string name = formatText("FC HBA TAG v%s %s %s", "1", "0", "0");
  identity->InstanceID.set(name.c_str());
  identity->ElementName.set(name.c_str());
  identity->Name.set(name.c_str());
  identity->Description.set("Torvex FC TAG Software");
  identity->VersionString.set("0");
  identity->Manufacturer.set(TORVEX_CORPORATION);
  identity->ClassificationDescriptions.set({"FC Frames Tagging Software"});
  identity->IsEntity.set(true);
  identity->MajorVersion.set(1);
  identity->MinorVersion.set(0);
  identity->RevisionNumber.set(0);
  identity->BuildNumber.set(0);
  return identity;
}

Ref<TVXHBA_RemoteServiceAccessPoint> makeAccessPoint(const Host_Build& host,
                                                     const std::string& address) {
  auto point = makeInstance<TVXHBA_RemoteServiceAccessPoint>();
  setSystem(*point, host);
  point->CreationClassName.set("TVXHBA_RemoteServiceAccessPoint");
  point->Name.set("FabriDesk");
  point->Description.set("FabriDesk WebLaunch URL");
  point->ElementName.set("TVX FC HBA:FabriDesk Management Interface");
  point->AccessInfo.set(address.c_str());
  point->InfoFormat.set(INFO_FORMAT_URL);
  return point;
}

struct Start_Row {
  std::int32_t (*start)(Host_Build& host);
  const char* failure;
};

constexpr Start_Row STARTS[] = {
    {StartSoftwareInstallationService, "StartSoftwareInstallationService failed"},
    {StartFCHBAWWNService, "Failed to create WWN Services class"},
    {StartFCTagService, "StartFCTagService failed"},
    {StartBootBIOSService, "StartBootBIOSService failed"},
    {StartFCHBADriverParamService, "StartFCHBADriverParamService failed"},
    {CreateHBAAccessPointProfiles, "CreateHBAAccessPointProfiles failed"},
    {CreateDriverIdentity, "CreateDriverIdentity failed"},
};

}  // namespace

std::int32_t StartSoftwareInstallationService(Host_Build& host) {
  TVX_LOG(TVX_DBG, "Starting the SoftwareInstallationService");
  ProviderAgent& agent = host.agent;
  host.installationService = insertService(
      agent.m_TVXHBA_SoftwareInstallationService_map,
      makeService<TVXHBA_SoftwareInstallationService>(host, INSTALLATION), INSTALLATION);
  if (!host.installationService) return MAP_BUILD_FAILED;
  const TVXHBA_RegisteredProfile* profile =
      createRegisteredProfile(agent, "Software Update", ORGANIZATION_DMTF, "1.0.0");
  const Instance* capabilities =
      insertInto(agent.m_TVXHBA_SoftwareInstallationServiceCapabilities_map, makeCapabilities(),
                 "Insert Failed : m_TVXHBA_SoftwareInstallationServiceCapabilities_map");
  if (!capabilities) return MAP_BUILD_FAILED;
  associateInstallation(host, profile, capabilities);
  return 0;
}

std::int32_t StartFCHBAWWNService(Host_Build& host) {
  TVX_LOG(TVX_DBG, "Starting the WWN Management Service");
  auto service = makeService<TVXHBA_FCHBAWWNService>(host, WWN);
  service->StatusDescriptions.set({"ok"});
  host.wwnService = insertService(host.agent.m_TVXHBA_FCHBAWWNService_map, std::move(service), WWN);
  if (!host.wwnService) return MAP_BUILD_FAILED;
  createAssociation(host.agent, HOSTED_WWN_SERVICE, "", host.system, host.wwnService);
  createAssociation(
      host.agent, WWN_SERVICE_AFFECTS_SYSTEM,
      formatText("FCHBA WWN Management Service Affects System: %s", systemName(host).c_str()),
      host.system, host.wwnService);
  return 0;
}

std::int32_t StartFCTagService(Host_Build& host) {
  TVX_LOG(TVX_DBG, "Starting the FCTagService");
  ProviderAgent& agent = host.agent;
  host.tagService = insertService(agent.m_TVXHBA_FCTagService_map,
                                  makeService<TVXHBA_FCTagService>(host, TAG), TAG);
  if (!host.tagService) return MAP_BUILD_FAILED;
  const TVXHBA_SoftwareIdentity* identity =
      insertInto(agent.m_TVXHBA_SoftwareIdentity_map, makeTagIdentity(),
                 "Insert Failed : m_TVXHBA_SoftwareIdentity_map");
  if (!identity) return MAP_BUILD_FAILED;
  createAssociation(agent, FC_TAG_ELEMENT_SOFTWARE_IDENTITY, "", identity, host.tagService);
  createAssociation(agent, HOSTED_TAG_SERVICE, "", host.system, host.tagService);
  return 0;
}

std::int32_t StartBootBIOSService(Host_Build& host) {
  TVX_LOG(TVX_DBG, "Starting the BootBIOSService");
  host.bootBIOSService =
      insertService(host.agent.m_TVXHBA_BootBIOSService_map,
                    makeService<TVXHBA_BootBIOSService>(host, BOOT_BIOS), BOOT_BIOS);
  if (!host.bootBIOSService) return MAP_BUILD_FAILED;
  createAssociation(host.agent, HOSTED_BOOT_BIOS_SERVICE, "", host.system, host.bootBIOSService);
  createAssociation(host.agent, BOOT_BIOS_SERVICE_AFFECTS_SYSTEM,
                    formatText("Boot BIOS Service Affects System: %s", systemName(host).c_str()),
                    host.system, host.bootBIOSService);
  return 0;
}

std::int32_t StartFCHBADriverParamService(Host_Build& host) {
  TVX_LOG(TVX_DBG, "Starting the FCHBASetDriverParamService");
  host.driverParamService =
      insertService(host.agent.m_TVXHBA_FCHBADriverParamService_map,
                    makeService<TVXHBA_FCHBADriverParamService>(host, DRIVER_PARAM), DRIVER_PARAM);
  if (!host.driverParamService) return MAP_BUILD_FAILED;
  createAssociation(host.agent, HOSTED_DRIVER_PARAM_SERVICE, "", host.system,
                    host.driverParamService);
  TVX_LOG(TVX_DBG, "Ending the FCHBASetDriverSetParamService");
  return 0;
}

std::int32_t CreateHBAAccessPointProfiles(Host_Build& host) {
  const WebLaunchConfig config;
  if (config.address().empty()) return 0;
  host.accessPoint = insertInto(host.agent.m_TVXHBA_RemoteServiceAccessPoint_map,
                                makeAccessPoint(host, config.address()),
                                "Insert Failed : m_TVXHBA_RemoteServiceAccessPoint_map");
  if (!host.accessPoint) return MAP_BUILD_FAILED;
  const bool made =
      createAssociation(host.agent, REMOTE_HOSTED_ACCESS_POINT,
                        "Remote Hosted Service Access Point", host.system, host.accessPoint);
  return made || !host.system ? 0 : MAP_BUILD_FAILED;
}

std::int32_t startServices(Host_Build& host) {
  for (const Start_Row& row : STARTS) {
    if (row.start(host) == 0) continue;
    TVX_LOG(TVX_CRIT, "%s", row.failure);
    return MAP_BUILD_FAILED;
  }
  return 0;
}

namespace {

void affectPort(Port_Build& port, Association_Kind kind, const char* what,
                const Instance* service) {
  if (!service) return;
  createAssociation(port.adapter.host.agent, kind,
                    formatText("%s Affects FCPort: %s", what, port.port.m_NodeName.c_str()),
                    port.fcPort, service);
}

}  // namespace

std::int32_t buildServiceAssociations(Port_Build& port) {
  const Host_Build& host = port.adapter.host;
  // The installation service acts on chips; of a port it only tells.
  if (host.installationService)
    TVX_LOG(TVX_DBG, "Install Service Affects FCPort: %s", port.port.m_NodeName.c_str());
  affectPort(port, BOOT_BIOS_SERVICE_AFFECTS_FC_PORT, "Boot BIOS Service", host.bootBIOSService);
  affectPort(port, WWN_SERVICE_AFFECTS_FC_PORT, "FCHBA WWN Management Service", host.wwnService);
  affectPort(port, DRIVER_PARAM_SERVICE_AFFECTS_FC_PORT, "FCHBA Driver Param Service",
             host.driverParamService);
  affectPort(port, TAG_SERVICE_AFFECTS_PORT, "TVXHBA FC Tag Service", host.tagService);
  TVX_LOG(TVX_DBG, "Ending of Software Installation Service");
  return 0;
}

}  // namespace cimrt
