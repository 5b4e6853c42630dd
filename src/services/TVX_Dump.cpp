#include "services/TVX_Dump.h"

#include <new>
#include <string>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "services/Service_Checks.h"

namespace cimrt {

namespace {

constexpr const char* OWNER = "TVX_Dump";
constexpr std::uint16_t IS_CURRENT = 1;

/// What is logged when an instance can't be made or inserted.
struct Dump_Texts {
  const char* notCreated;
  const char* notInserted;
};

constexpr Dump_Texts SERVICE = {"Failed to create TVXHBA_DumpService",
                                "Insert Failed : m_TVXHBA_DumpService_map"};
constexpr Dump_Texts HOSTED = {"Failed to create TVXHBA_HostedDumpService",
                               "Insert Failed : m_TVXHBA_HostedDumpService_map"};
constexpr Dump_Texts AFFECTS = {"Failed to create TVXHBA_DumpServiceAffectsElement",
                                "Insert Failed : m_TVXHBA_DumpServiceAffectsElement_map"};
constexpr Dump_Texts DATA = {"Failed to create TVXHBA_DumpData for fc port",
                             "Insert Failed : m_TVXHBA_DumpData_map"};
constexpr Dump_Texts ELEMENT = {"Failed to create TVXHBA_ElementDumpData for fc port",
                                "Insert Failed : m_TVXHBA_ElementDumpData_map"};

/// An instance that `make` gives, in its map. 0, or the result with the failure logged.
template <class T, class Make>
std::int32_t store(Instance_Map<T>& map, const Dump_Texts& texts, Make make) {
  Ref<T> instance;
  try {
    instance = make();
  } catch (const std::bad_alloc&) {
  }
  if (!instance) {
    TVX_LOG(TVX_CRIT, "%s", texts.notCreated);
    return DUMP_NO_INSTANCE;
  }
  return insertInto(map, std::move(instance), texts.notInserted) ? 0 : DUMP_INSERT_FAILED;
}

/// The entry that was inserted last.
template <class T>
T* lastOf(Instance_Map<T>& map) {
  return map[map.size() - 1];
}

Ref<TVXHBA_DumpService> makeService(const CIM_ComputerSystem* system) {
  auto service = makeInstance<TVXHBA_DumpService>();
  if (system) {
    service->SystemCreationClassName = system->CreationClassName;
    service->SystemName = system->Name;
  }
  service->Name.set("TVXHBA_DumpService");
  service->CreationClassName.set("TVXHBA_DumpService");
  return service;
}

/// What the library says of the dumps of one port.
struct Dump_Settings {
  std::string directory{};
  std::uint32_t retention = 0;
};

Dump_Settings readSettings(const HBA_WWN& wwpn) {
  Dump_Settings settings;
  char directory[TVX_DUMP_DIRECTORY_SIZE + 1] = {};
  if (TVX_MethodWrapper::tvxcimGetDumpDirectory(wwpn, directory) == RM_OK) {
    TVX_LOG(TVX_DBG, "TVX_Dump::tvxcimGetDumpDirectory Succesful");
    settings.directory = directory;
  } else {
    TVX_LOG(TVX_INFO, "TVX_Dump::tvxcimGetDumpDirectory failed");
  }
  TVX_LOG(TVX_DBG, "Calling TVX_Dump::tvxcimGetRetentionCount");
  std::uint32_t count = 0;
  const RM_STATUS status = TVX_MethodWrapper::tvxcimGetRetentionCount(wwpn, &count);
  TVX_LOG(TVX_DBG, "returned tvxcimGetRetentionCount call from wrapper");
  if (status == RM_OK)
    settings.retention = count;
  else
    TVX_LOG(TVX_ERR, "TVX_Dump::tvxcimGetRetentionCount failed");
  return settings;
}

Ref<TVXHBA_DumpData> makeData(const String& deviceID, const Dump_Settings& settings) {
  auto data = makeInstance<TVXHBA_DumpData>();
  data->InstanceID.set(formatText("TVXHBA_DumpData::%s", deviceID.c_str()).c_str());
  data->ElementName.set(deviceID);
  data->RetentionCount.set(settings.retention);
  data->DumpDirectory.set(settings.directory.c_str());
  return data;
}

std::int32_t buildSettings(ProviderAgent& agent, const TVXHBA_PortController* controller) {
  HBA_WWN wwpn{};
  if (!convertPortName(OWNER, controller->DeviceID, wwpn)) return DUMP_INSERT_FAILED;
  const Dump_Settings settings = readSettings(wwpn);
  auto& map = agent.m_TVXHBA_DumpData_map;
  if (const std::int32_t failed =
          store(map, DATA, [&] { return makeData(controller->DeviceID.value, settings); });
      failed != 0)
    return failed;
  return store(agent.m_TVXHBA_ElementDumpData_map, ELEMENT, [&] {
    auto tie = makeAssociation<TVXHBA_ElementDumpData>(controller, lastOf(map));
    tie->IsCurrent.set(IS_CURRENT);
    return tie;
  });
}

std::int32_t buildController(ProviderAgent& agent, const TVXHBA_PortController* controller,
                             const TVXHBA_DumpService* service) {
  const std::int32_t failed = store(agent.m_TVXHBA_DumpServiceAffectsElement_map, AFFECTS, [&] {
    return makeAssociation<TVXHBA_DumpServiceAffectsElement>(controller, service);
  });
  return failed != 0 ? failed : buildSettings(agent, controller);
}

/// A host that is not there hosts nothing, which is no failure.
std::int32_t buildHosted(ProviderAgent& agent, const CIM_ComputerSystem* system,
                         const TVXHBA_DumpService* service) {
  if (!system) return 0;
  return store(agent.m_TVXHBA_HostedDumpService_map, HOSTED,
               [&] { return makeAssociation<TVXHBA_HostedDumpService>(system, service); });
}

}  // namespace

std::int32_t FC_CreateDumpClasses(ProviderAgent& agent) {
  TVX_LOG(TVX_DBG, "Entered FC_CreateDumpClasses");
  auto& systems = agent.m_CIM_ComputerSystem_map;
  const CIM_ComputerSystem* system = systems.size() != 0 ? systems[0] : nullptr;
  auto& services = agent.m_TVXHBA_DumpService_map;
  if (const std::int32_t failed = store(services, SERVICE, [&] { return makeService(system); }))
    return failed;
  const TVXHBA_DumpService* service = lastOf(services);
  if (const std::int32_t failed = buildHosted(agent, system, service)) return failed;
  auto& controllers = agent.m_TVXHBA_PortController_map;
  for (std::size_t i = 0; i < controllers.size(); i++)
    if (const std::int32_t failed = buildController(agent, controllers[i], service)) return failed;
  return 0;
}

std::int32_t FC_ClearDumpClasses(ProviderAgent& agent) {
  TVX_LOG(TVX_DBG, "Entered FC_ClearDumpClasses");
  agent.m_TVXHBA_DumpService_map.clear();
  agent.m_TVXHBA_HostedDumpService_map.clear();
  agent.m_TVXHBA_DumpServiceAffectsElement_map.clear();
  agent.m_TVXHBA_DumpData_map.clear();
  agent.m_TVXHBA_ElementDumpData_map.clear();
  return 0;
}

std::int32_t announceDumpClasses(Host_Build&) {
  TVX_LOG(TVX_DBG, "Calling FC_CreateDumpClasses");
  return 0;
}

std::int32_t buildDumpClasses(Host_Build& host) {
  if (const std::int32_t status = FC_CreateDumpClasses(host.agent); status != 0)
    TVX_LOG(TVX_ERR, "FC_CreateDumpClasses failed with status %d", status);
  TVX_LOG(TVX_DBG, "FC_CreateDumpClasses succesful");
  return 0;
}

}  // namespace cimrt
