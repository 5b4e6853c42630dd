#include "services/TVX_PortVirtualization.h"

#include <cstring>
#include <string>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"

namespace cimrt {

namespace {

constexpr std::uint16_t RESOURCE_TYPE_FC_HBA = 10;

/// The physical port whose virtual ports are being built.
struct Physical_Port {
  ProviderAgent& agent;
  TVXHBA_FCPort* port;
  const char* deviceID;
  HBA_WWN wwpn{};
  const CIM_ComputerSystem* system = nullptr;
  TVXHBA_ResourcePool* pool = nullptr;
};

/// A device id as a name for the library. False with the failing half logged at `level`.
bool convertName(const char* deviceID, HBA_WWN& wwn, int level) {
  char hbaName[TVX_HBA_NAME_LENGTH + 1];
  if (TVX_MethodWrapper::Id2HBAName(hbaName, deviceID) != RM_OK) {
    TVX_LOG(level,
            "TVXUCNA_PortVirtualization::CreatePortVirtualizationClasses::Id2HBAName failed");
    return false;
  }
  if (TVX_MethodWrapper::str2HBAName(&wwn, hbaName) != RM_OK) {
    TVX_LOG(level,
            "TVXUCNA_PortVirtualization::CreatePortVirtualizationClasses::str2HBAName failed");
    return false;
  }
  return true;
}

/// Makes an instance and inserts it. 0, or the result for one that could not be made or inserted.
template <class T, class Make>
std::int32_t store(Instance_Map<T>& map, Make make, const char* notCreated, int level,
                   const char* notInserted, const char* done) {
  Ref<T> instance = madeOrNull(make);
  if (!instance) {
    TVX_LOG(level, "%s", notCreated);
    return VPORT_NO_INSTANCE;
  }
  if (!insertInto(map, std::move(instance), notInserted)) return VPORT_FAILED;
  TVX_LOG(TVX_DBG, "%s", done);
  return 0;
}

Ref<TVXHBA_ResourcePool> makePool(const char* deviceID, std::uint32_t count) {
  TVX_LOG(TVX_DBG, "Creating Resource pool ");
  auto pool = makeInstance<TVXHBA_ResourcePool>();
  const std::string text = formatText("TVX:Resource Pool:%s", deviceID);
  pool->InstanceID.set(text.c_str());
  pool->ElementName.set(text.c_str());
  pool->PoolID.set(text.c_str());
  pool->Primordial.set(false);
  pool->Capacity.set(count);
  pool->ResourceType.set(RESOURCE_TYPE_FC_HBA);
  return pool;
}

std::int32_t buildPool(Physical_Port& physical, std::uint32_t count) {
  auto& map = physical.agent.m_TVXHBA_ResourcePool_map;
  if (const std::int32_t result = store(
          map, [&] { return makePool(physical.deviceID, count); }, "Failed to create ResourcePool",
          TVX_ERR, "Insert Failed : m_TVXHBA_ResourcePool_map",
          "Resource Pool created and inserted in map");
      result != 0)
    return result;
  physical.pool = map[map.size() - 1];
  TVX_LOG(TVX_DBG, "Creating HostedResource pool ");
  return store(
      physical.agent.m_TVXHBA_HostedResourcePool_map,
      [&] { return makeAssociation<TVXHBA_HostedResourcePool>(physical.system, physical.pool); },
      "Failed to create HostedResourcePool", TVX_CRIT,
      "Insert Failed : m_TVXHBA_HostedResourcePool_map",
      "HostedResource Pool created and inserted in map");
}

/// The attributes of a virtual port; null when the library does not give them.
TVX_Block readAttributes(const Physical_Port& physical, const HBA_WWN& name) {
  TVX_Block block;
  const RM_STATUS status = TVX_MethodWrapper::ListVPortAttributes(&physical.wwpn, name, &block);
  if (status != RM_OK)
    TVX_LOG(TVX_DBG,
            "TVXUCNA_PortVirtualization::Failure in listing vports information for port: %s, Rm "
            "Error: %d",
            physical.deviceID, status);
  return block;
}

/// The name text among the attributes, if there are any.
void setName(TVXHBA_VirtualFCPort& virtualPort, const TVX_Block& block) {
  if (!block) return;
  const auto* attributes = reinterpret_cast<const RM_VPortAttributes*>(block.get());
  virtualPort.VPortName.set(
      String(attributes->name, strnlen(attributes->name, sizeof attributes->name)));
}

Ref<TVXHBA_VirtualFCPort> makeVirtualPort(const Physical_Port& physical, const std::string& wwpn,
                                          const std::string& wwnn, std::uint32_t fcID) {
  auto virtualPort = makeInstance<TVXHBA_VirtualFCPort>();
  virtualPort->SystemCreationClassName = physical.system->CreationClassName;
  virtualPort->SystemName = physical.system->Name;
  virtualPort->CreationClassName.set("TVX_VirtualFCPort");
  virtualPort->Name.set(wwpn.c_str());
  virtualPort->DeviceID.set(wwpn.c_str());
  virtualPort->NodeWWN.set(wwnn.c_str());
  virtualPort->PortFCId.set(fcID);
  return virtualPort;
}

std::int32_t associateVirtualPort(Physical_Port& physical, const TVXHBA_VirtualFCPort* port) {
  ProviderAgent& agent = physical.agent;
  if (const std::int32_t result = store(
          agent.m_TVXHBA_VPortHostedDependency_map,
          [&] { return makeAssociation<TVXHBA_VPortHostedDependency>(physical.port, port); },
          "Failed to create VPortHostedDependency", TVX_CRIT,
          "Insert Failed : m_TVXHBA_VPortHostedDependency_map",
          "VPortHostedDependency created and inserted in map");
      result != 0)
    return result;
  return store(
      agent.m_TVXHBA_ElementAllocatedFromPool_map,
      [&] { return makeAssociation<TVXHBA_ElementAllocatedFromPool>(physical.pool, port); },
      "Failed to create ElementAllocatedFromPool", TVX_CRIT,
      "Insert Failed : m_TVXHBA_ElementAllocatedFromPool_map",
      "ElementAllocatedFromPool created and inserted in map");
}

std::int32_t buildVirtualPort(Physical_Port& physical, const RM_VPortEntry& entry) {
  const std::string wwpn = WWNToString(entry.wwpn.wwn);
  const std::string wwnn = WWNToString(entry.wwnn.wwn);
  TVX_LOG(TVX_DBG, "VPort Id :%s Node name: %s", wwpn.c_str(), wwnn.c_str());
  HBA_WWN name{};
  if (!convertName(wwpn.c_str(), name, TVX_DBG)) return VPORT_FAILED;
  const TVX_Block attributes = readAttributes(physical, name);
  const auto make = [&] {
    Ref<TVXHBA_VirtualFCPort> made = makeVirtualPort(physical, wwpn, wwnn, entry.fcId);
    setName(*made, attributes);
    return made;
  };
  auto& map = physical.agent.m_TVXHBA_VirtualFCPort_map;
  if (const std::int32_t result = store(map, make, "Failed to create VirtualFCPort", TVX_CRIT,
                                        "Insert Failed : m_TVXHBA_VirtualFCPort_map",
                                        "Created VirtualFCPort and inserted in map");
      result != 0)
    return result;
  return associateVirtualPort(physical, map[map.size() - 1]);
}

/// The list of the port's virtual ports; null when it can't be read or is empty.
TVX_Block listVirtualPorts(const Physical_Port& physical) {
  TVX_Block list;
  if (const RM_STATUS status = TVX_MethodWrapper::ListVPorts(&physical.wwpn, &list);
      status != RM_OK) {
    TVX_LOG(TVX_ERR,
            "TVXUCNA_PortVirtualization::Failure in listing vports for port: %s, Rm Error: %d",
            physical.deviceID, status);
    return nullptr;
  }
  if (list && reinterpret_cast<const RM_VPortList*>(list.get())->count != 0) return list;
  TVX_LOG(TVX_DBG, "Need not create any resource pools since no vports exist for FCport: %s",
          physical.deviceID);
  return nullptr;
}

std::int32_t buildPhysicalPort(Physical_Port& physical) {
  TVX_LOG(TVX_DBG, "FC Port ID: %s", physical.deviceID);
  if (!convertName(physical.deviceID, physical.wwpn, TVX_ERR)) return VPORT_FAILED;
  const TVX_Block block = listVirtualPorts(physical);
  if (!block) return 0;
  const auto* list = reinterpret_cast<const RM_VPortList*>(block.get());
  TVX_LOG(TVX_DBG, "No of vports:%d for %s", static_cast<int>(list->count), physical.deviceID);
  if (const std::int32_t result = buildPool(physical, list->count); result != 0) return result;
  for (std::uint32_t i = 0; i < list->count; i++)
    if (const std::int32_t result = buildVirtualPort(physical, list->entry[i]); result != 0)
      return result;
  TVX_LOG(TVX_DBG, "Freeing VPList");
  return 0;
}

}  // namespace

std::int32_t TVX_PortVirtualization::CreatePortVirtualizationClasses(ProviderAgent& agent) {
  TVX_LOG(TVX_DBG, "TVX_PortVirtualization::CreatePortVirtualizationClasses");
  auto& ports = agent.m_TVXHBA_FCPort_map;
  if (ports.size() == 0 || agent.m_CIM_ComputerSystem_map.size() == 0) {
    TVX_LOG(TVX_ERR,
            "Unable to create the Port Virtualization classes, No Physical Port(FCoE) exists");
    return 0;
  }
  ClearPortVirtualizationMaps(agent);
  TVX_LOG(TVX_DBG, "No of FC Ports: %d", static_cast<int>(ports.size()));
  for (std::size_t i = 0; i < ports.size(); i++) {
    Physical_Port physical{agent, ports[i], ports[i]->DeviceID.value.c_str()};
    physical.system = agent.m_CIM_ComputerSystem_map[0];
    if (const std::int32_t result = buildPhysicalPort(physical); result != 0) return result;
  }
  return 0;
}

std::int32_t ClearPortVirtualizationMaps(Agent_Maps& maps) {
  TVX_LOG(TVX_DBG, "ClearPortVirtualizationMaps for FC invoked");
  maps.m_TVXHBA_ResourcePool_map.clear();
  maps.m_TVXHBA_ElementAllocatedFromPool_map.clear();
  maps.m_TVXHBA_HostedResourcePool_map.clear();
  maps.m_TVXHBA_VirtualFCPort_map.clear();
  maps.m_TVXHBA_VPortHostedDependency_map.clear();
  maps.m_TVXHBA_VMSystemDevice_map.clear();
  TVX_LOG(TVX_DBG, "Exiting ClearPortVirtualizationMaps ");
  return 0;
}

std::int32_t buildVirtualPorts(Host_Build& host) {
  if (const std::int32_t result =
          TVX_PortVirtualization::CreatePortVirtualizationClasses(host.agent);
      result != 0)
    TVX_LOG(TVX_ERR, "CreatePortVirtualizationClasses failed: %d", result);
  return 0;
}

}  // namespace cimrt
