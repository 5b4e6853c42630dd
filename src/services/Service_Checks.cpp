#include "services/Service_Checks.h"

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "runtime/Value.h"

namespace cimrt {

bool isKnownService(const Instance_Map_Base& map, const Instance* service) {
  return map.size() == 0 || map.find(service) != Instance_Map_Base::npos;
}

TVXHBA_FCPort* findFCPort(ProviderAgent& agent, const char* deviceID) {
  TVX_LOG(TVX_DBG, "Checking the FCPort");
  auto& ports = agent.m_TVXHBA_FCPort_map;
  for (std::size_t i = 0; deviceID && i < ports.size(); i++) {
    const Property<String>& id = ports[i]->DeviceID;
    if (id.is_null() || !id.value.equal(deviceID)) continue;
    TVX_LOG(TVX_DBG, "Valid FCPort WWPN Passed");
    return ports[i];
  }
  TVX_LOG(TVX_ERR, "Could not find the passed FCPort in the map");
  return nullptr;
}

TVXHBA_FCPort* findTargetPort(ProviderAgent& agent, const Instance* target) {
  if (!target || !is_subclass(&TVXHBA_FCPort::static_meta_class, class_of(target))) return nullptr;
  const auto* port = static_cast<const TVXHBA_FCPort*>(target);
  return findFCPort(agent, port->DeviceID.is_null() ? nullptr : port->DeviceID.value.c_str());
}

TVXHBA_FCPort* findPortOfDevice(ProviderAgent& agent, const Instance* target) {
  const Meta_Class* meta = target ? class_of(target) : nullptr;
  const Meta_Feature* feature = meta ? find_feature(meta, "DeviceID", FLAG_PROPERTY) : nullptr;
  Value value;
  String deviceID;
  if (!feature || value.get(target, feature) != 0 || value.get(deviceID) != 0) return nullptr;
  return findFCPort(agent, value.null() ? nullptr : deviceID.c_str());
}

bool convertPortName(const char* owner, const Property<String>& deviceID, HBA_WWN& wwpn) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  const char* text = deviceID.is_null() ? nullptr : deviceID.value.c_str();
  if (TVX_MethodWrapper::Id2HBAName(hbaName, text) != RM_OK) {
    TVX_LOG(TVX_ERR, "%s::Id2HBAName failed", owner);
    return false;
  }
  if (TVX_MethodWrapper::str2HBAName(&wwpn, hbaName) != RM_OK) {
    TVX_LOG(TVX_ERR, "%s::str2HBAName failed", owner);
    return false;
  }
  return true;
}

std::uint32_t openServiceCall(ProviderAgent& agent, const Instance_Map_Base& services,
                              const Instance* service, const Instance* target,
                              const Service_Texts& texts, HBA_WWN& wwpn) {
  if (!isKnownService(services, service)) {
    TVX_LOG(TVX_ERR, "%s", texts.unknownService);
    return METHOD_UNKNOWN_SERVICE;
  }
  const TVXHBA_FCPort* port = findTargetPort(agent, target);
  if (!port) {
    TVX_LOG(TVX_ERR, "%s", texts.unknownPort);
    return METHOD_UNKNOWN_PORT;
  }
  return convertPortName(texts.owner, port->DeviceID, wwpn) ? METHOD_OK : METHOD_UNKNOWN_PORT;
}

}  // namespace cimrt
