#include "services/Service_Checks.h"

#include "common/CLogger.h"

namespace cimrt {

namespace {

/// The agent, once it has something to say.
ProviderAgent& readyAgent() {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.awaitAdapterMaps();
  return agent;
}

}  // namespace

Service_Call::Service_Call() : agent(readyAgent()), m_Lock(agent.m_DataMutex) {}

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

}  // namespace cimrt
