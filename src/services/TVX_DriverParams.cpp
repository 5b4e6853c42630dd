#include "services/TVX_DriverParams.h"

#include <cstring>

#include "agent/LiveStatus.h"
#include "agent/Live_Throttle.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "agent/SoftwareIdentities.h"

namespace cimrt {

namespace {

template <std::size_t N>
std::string fieldText(const char (&field)[N]) {
  return std::string(field, ::strnlen(field, N));
}

// --- Instances -----------------------------------------------------------------------------------

/// What both classes of parameters take from a record.
template <class T>
void setCommon(T& instance, const RM_DriverParam& record, std::uint32_t index) {
  instance.paramno.set(index);
  instance.paramname.set(fieldText(record.name).c_str());
  instance.lowRange.set(record.low);
  instance.highRange.set(record.high);
  instance.current.set(record.current);
  instance.exportFlag.set(record.exportFlag);
  instance.dynamic.set(record.dynamic);
  instance.help.set(fieldText(record.help).c_str());
}

std::string localInstanceID(const std::string& deviceId, const RM_DriverParam& record) {
  return deviceId + ":" + fieldText(record.name);
}

/// One parameter of a port. False if the map refuses it.
bool insertLocal(ProviderAgent& agent, const std::string& deviceId, const HBA_WWN& wwpn,
                 const RM_DriverParam& record, std::uint32_t index) {
  auto instance = makeInstance<TVXHBA_DriverParams>();
  setCommon(*instance, record, index);
  const HBA_UINT8* b = wwpn.wwn;
  instance->deviceID.set(
      formatText("%02x%02x%02x%02x%02x%02x%02x%02x", b[0], b[1], b[2], b[3], b[4], b[5], b[6], b[7])
          .c_str());
  instance->def.set(record.def);
  instance->InstanceID.set(localInstanceID(deviceId, record).c_str());
  const TVXHBA_DriverParams* entry =
      insertInto(agent.m_TVXHBA_DriverParams_map, std::move(instance),
                 "Insert Failed : m_TVXHBA_DriverParams_map");
  if (!entry) return false;
  auto& services = agent.m_TVXHBA_FCHBADriverParamService_map;
  if (services.size() != 0)
    associate(agent.m_TVXHBA_DriverServiceElementSettingData_map, services[0], entry,
              "Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map");
  return true;
}

/// One parameter of the driver as a whole. False if the map refuses it.
bool insertGlobal(ProviderAgent& agent, const RM_DriverParam& record, std::uint32_t index) {
  auto instance = makeInstance<TVXHBA_DriverParamGlobal>();
  setCommon(*instance, record, index);
  instance->glbl.set(record.def);
  instance->InstanceID.set(fieldText(record.name).c_str());
  const TVXHBA_DriverParamGlobal* entry =
      insertInto(agent.m_TVXHBA_DriverParamGlobal_map, std::move(instance),
                 "Insert Failed : m_TVXHBA_DriverParamGlobal_map");
  if (!entry) return false;
  auto& services = agent.m_TVXHBA_FCHBADriverParamService_map;
  if (services.size() != 0)
    associate(agent.m_TVXHBA_GlobalDriverServiceElementSettingData_map, services[0], entry,
              "Insert Failed : m_TVXHBA_GlobalDriverServiceElementSettingData_map");
  return true;
}

/// Port 0 of the first FC adapter; null if that has no ports, or there is none.
const Port* firstFCPort(ProviderAgent& agent) {
  for (Adapter* adapter : agent.m_pData->m_Adapters) {
    if (adapter->m_Type != TVX_ADAPTER_TYPE_FC) continue;
    return adapter->getNumberOfPorts() > 0 ? adapter->getPort(0) : nullptr;
  }
  return nullptr;
}

// --- Driver map ----------------------------------------------------------------------------------

TVXHBA_SoftwareIdentity* findDriverIdentity(ProviderAgent& agent) {
  auto& identities = agent.m_TVXHBA_SoftwareIdentity_map;
  for (std::size_t i = 0; i < identities.size(); i++) {
    const Array<std::uint16_t>& kinds = identities[i]->Classifications.value;
    if (kinds.size() > 0 && kinds[0] == SOFTWARE_DRIVER) return identities[i];
  }
  return nullptr;
}

void readParameters(ProviderAgent& agent, const Port& port, const Port* first) {
  if (&port == first)
    if (const RM_STATUS status = tvxcimGetDriverParam(agent, port.m_Name, TVX_Driver_Scope::GLOBAL);
        status != RM_OK)
      TVX_LOG(TVX_ERR, "Getting Global Driver Parameters failed with code %d", status);
  if (const RM_STATUS status = tvxcimGetDriverParam(agent, port.m_Name, TVX_Driver_Scope::LOCAL);
      status != RM_OK)
    TVX_LOG(TVX_ERR, "Retrieving Local Driver Parameters failed with code %d\n", status);
}

void updateDriverMap(ProviderAgent& agent) {
  static Lasting<Live_Throttle> throttle(DRIVER_UPDATE_PERIOD);
  if (!startDriverUpdate(*throttle)) return;
  const TVXHBA_SoftwareIdentity* driver = findDriverIdentity(agent);
  if (!driver) {
    TVX_LOG(TVX_CRIT, "Could not locate the FC DriverServiceAffectsDriver Identity");
    return;
  }
  auto& services = agent.m_TVXHBA_FCHBADriverParamService_map;
  if (services.size() != 0)
    associate(agent.m_TVXHBA_FCDriverServiceAffectsDriver_map, driver, services[0],
              "Insert Failed : m_TVXHBA_FCDriverServiceAffectsDriver_map");
  const Port* first = firstFCPort(agent);
  forEachFCPort(agent, [&](Adapter&, Port& port) {
    readParameters(agent, port, first);
    return true;
  });
}

// --- Current values ------------------------------------------------------------------------------

/// Takes the current value of one record over to the entry of that `InstanceID`, if there is one.
template <class T>
void takeCurrent(Instance_Map<T>& map, const std::string& instanceID,
                 const RM_DriverParam& record) {
  const Ref<T> model(T::create(false));
  model->InstanceID.set(instanceID.c_str());
  if (auto* entry = static_cast<T*>(map.lookup(model.get()))) entry->current.set(record.current);
}

/// False if the port can't be read.
bool updatePort(ProviderAgent& agent, const Port& port, TVX_Driver_Params& params) {
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::string2HBAName(&wwpn, port.m_Name.c_str()) == 0) return false;
  if (TVX_MethodWrapper::ReadDriverParams(wwpn, TVX_Driver_Scope::LOCAL, &params) != RM_OK)
    return false;
  for (std::uint32_t i = 0; i < params.count; i++)
    takeCurrent(agent.m_TVXHBA_DriverParams_map, localInstanceID(port.m_Name, params[i]),
                params[i]);
  return true;
}

void updatePorts(ProviderAgent& agent) {
  TVX_Driver_Params params;
  if (TVX_MethodWrapper::AllocateDriverParams(&params) != RM_OK) return;
  forEachFCPort(agent, [&](Adapter&, Port& port) { return updatePort(agent, port, params); });
}

void updateDriver(ProviderAgent& agent) {
  TVX_Driver_Params params;
  if (TVX_MethodWrapper::AllocateDriverParams(&params) != RM_OK) return;
  const Port* port = firstFCPort(agent);
  HBA_WWN wwpn{};
  if (!port || TVX_MethodWrapper::string2HBAName(&wwpn, port->m_Name.c_str()) == 0) return;
  if (TVX_MethodWrapper::ReadDriverParams(wwpn, TVX_Driver_Scope::GLOBAL, &params) != RM_OK) return;
  TVX_LOG(TVX_DBG, "number of driver parameters %d", static_cast<int>(params.count));
  for (std::uint32_t i = 0; i < params.count; i++)
    takeCurrent(agent.m_TVXHBA_DriverParamGlobal_map, fieldText(params[i].name), params[i]);
}

/// Runs an update. What it throws ends it: the instances keep their last values.
template <class Update>
void containUpdate(Update update) {
  try {
    update();
  } catch (...) {
    TVX_LOG(TVX_CRIT, "Found issue with local Driver Refresh");
  }
}

}  // namespace

RM_STATUS tvxcimGetDriverParam(ProviderAgent& agent, const std::string& deviceId,
                               TVX_Driver_Scope scope) {
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::tvxcimGetDriverParam()");
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::string2HBAName(&wwpn, deviceId.c_str()) == 0 ||
      TVX_MethodWrapper::Validatewwpn(&wwpn) != RM_OK) {
    TVX_LOG(TVX_ERR, "INVALID wwpn");
    return RM_ERROR;
  }
  TVX_Driver_Params params;
  if (const RM_STATUS status = TVX_MethodWrapper::ReadDriverParams(wwpn, scope, &params);
      status != RM_OK)
    return status;
  for (std::uint32_t i = 0; i < params.count; i++) {
    TVX_LOG(TVX_DBG, "saving the values of driver parameter %d", static_cast<int>(i));
    const bool inserted = scope == TVX_Driver_Scope::GLOBAL
                              ? insertGlobal(agent, params[i], i)
                              : insertLocal(agent, deviceId, wwpn, params[i], i);
    if (!inserted) return RM_ERROR;
  }
  return RM_OK;
}

void updateLocalDriverParams(ProviderAgent& agent) {
  static Lasting<Live_Throttle> throttle(DRIVER_UPDATE_PERIOD);
  if (!startDriverUpdate(*throttle)) return;
  containUpdate([&] { updatePorts(agent); });
}

void updateGlobalDriverParams(ProviderAgent& agent) {
  static Lasting<Live_Throttle> throttle(DRIVER_UPDATE_PERIOD);
  if (!startDriverUpdate(*throttle)) return;
  containUpdate([&] { updateDriver(agent); });
}

std::int32_t buildDriverParameters(Host_Build& host) {
  updateDriverMap(host.agent);
  TVX_LOG(TVX_DBG, "Done with the Driver Parameter fetching");
  return 0;
}

}  // namespace cimrt
