#include "services/TVXHBA_FCPort_Provider.h"

#include "access/TVX_MethodWrapper.h"
#include "agent/LiveStatus.h"
#include "services/Active_Enumeration.h"
#include "services/Service_Checks.h"

namespace cimrt {

namespace {

bool convertDeviceID(const TVXHBA_FCPort& port, HBA_WWN& wwpn) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  const char* deviceID = port.DeviceID.is_null() ? nullptr : port.DeviceID.value.c_str();
  if (TVX_MethodWrapper::Id2HBAName(hbaName, deviceID) != RM_OK) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCPort_Provider::Id2HBAName failed");
    return false;
  }
  if (TVX_MethodWrapper::str2HBAName(&wwpn, hbaName) != RM_OK) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCPort_Provider::::str2HBAName failed");
    return false;
  }
  return true;
}

bool isIndicator(std::uint16_t value) {
  return value == TVX_INDICATOR_ON || value == TVX_INDICATOR_OFF;
}

/// Switches the beacon and keeps the new state with the map's entry.
std::int32_t switchBeacon(ProviderAgent& agent, const TVXHBA_FCPort& instance) {
  HBA_WWN wwpn{};
  if (!convertDeviceID(instance, wwpn)) return MODIFY_INSTANCE_FAILED;
  const std::uint16_t indicator = instance.LocationIndicator.value;
  if (TVX_MethodWrapper::SetBeaconState(wwpn, indicator) != 0) return MODIFY_INSTANCE_FAILED;
  auto* entry = static_cast<TVXHBA_FCPort*>(agent.m_TVXHBA_FCPort_map.lookup(&instance));
  if (!entry) return MODIFY_INSTANCE_FAILED;
  entry->LocationIndicator.set(indicator);
  TVX_LOG(TVX_DBG, "Beacon state modified successfully");
  return MODIFY_INSTANCE_OK;
}

}  // namespace

std::int32_t TVXHBA_FCPort_Provider::enum_instances(const TVXHBA_FCPort*,
                                                    const Instance_Handler& handler) {
  return enumerateActive("TVXHBA_FCPort", &Agent_Maps::m_TVXHBA_FCPort_map, handler,
                         UpdateFCPortStatus);
}

std::int32_t TVXHBA_FCPort_Provider::modify_instance(const TVXHBA_FCPort* model,
                                                     const TVXHBA_FCPort* instance) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "TVXHBA_FCPort_Provider::modify_instance");
  if (!model || !instance) {
    TVX_LOG(TVX_DBG, "TVXHBA_FCPort_Provider::modify_instance invalid parameter");
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  const auto& ports = call.agent.m_TVXHBA_FCPort_map;
  if (ports.size() != 0 && ports.find(instance) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_DBG, "Invalid instance of TVXHBA_FCPort Data");
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  if (model->LocationIndicator.is_null()) return MODIFY_INSTANCE_INVALID_PARAMETER;
  TVX_LOG(TVX_DBG, "Input BeaconState : %d", static_cast<int>(instance->LocationIndicator.value));
  if (!isIndicator(instance->LocationIndicator.value)) {
    TVX_LOG(TVX_DBG, "Invalid LocationIndicator, Valid values are '2' or '3'");
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  return switchBeacon(call.agent, *instance);
}

}  // namespace cimrt
