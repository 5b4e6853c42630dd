// The port itself, with its places in system and group, and its statistics.
#include "access/TVX_MethodWrapper.h"
#include "agent/FCPortTables.h"
#include "agent/LiveStatus.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

void setNames(TVXHBA_FCPort& port, const Port_Build& build) {
  const CIM_ComputerSystem& system = *build.adapter.host.system;
  const char* wwpn = build.port.m_Name.c_str();
  port.SystemCreationClassName.set(system.CreationClassName.value);
  port.SystemName.set(system.Name.value);
  port.CreationClassName.set("TVXHBA_FCPort");
  port.Name.set(wwpn);
  port.DeviceID.set(wwpn);
  port.PermanentAddress.set(wwpn);
  port.NetworkAddresses.set({wwpn});
  port.AdapterName.set(build.adapter.adapter.m_Name.c_str());
}

/// Further names of the port, each with the text that says what it is.
void setIdentifyingInfo(TVXHBA_FCPort& port, const Port_Build& build) {
  const FCAdapterAttributes& adapter = build.adapter.attributes;
  std::string serial = adapter.SerialNumber;
  if (!adapter.SubAdapterID.empty()) serial += ":" + adapter.SubAdapterID;
  const struct {
    const std::string& value;
    const char* description;
  } infos[] = {
      {build.attributes.OSDeviceName, "OS Device Name"},
      {adapter.IEEEAddress, "TORVEX:IEEE_ADDRESS"},
      {serial, "SerialNumber + Sub-AdapterID"},
      {build.port.m_NodeName, "NodeWWN"},
      {adapter.NodeSymbolicName, "NodeSymbolicName"},
  };
  for (const auto& info : infos) {
    port.OtherIdentifyingInfo.append(info.value.c_str());
    port.IdentifyingDescriptions.append(info.description);
  }
}

void setState(TVXHBA_FCPort& port, const FCPortAttributes& from) {
  setLinkState(port, from);
  port.FCID.set(from.PortFcId);
  port.NumberOfDiscoveredPorts.set(from.NumberofDiscoveredPorts);
  port.FWDownloadStatus.set(0);
  port.FECState.set(from.FECState);
}

/// The beacon, if it can be asked for.
void setLocationIndicator(TVXHBA_FCPort& port, const char* wwpn) {
  std::uint16_t indicator = TVX_INDICATOR_UNKNOWN;
  if (TVX_MethodWrapper::GetBeaconState(wwpn, &indicator) == 0)
    port.LocationIndicator.set(indicator);
}

void setCapabilities(TVXHBA_FCPort& port, const FCPortAttributes& from) {
  const Array<std::uint16_t> classes = classesOfService(from.PortSupportedClassofService);
  port.SupportedCOS.set(classes);
  port.ActiveCOS.set(classes);
  port.SupportedFC4Types.set(fc4Types(from.PortSupportedFc4Types));
  port.ActiveFC4Types.set(fc4Types(from.PortActiveFc4Types));
  port.MaxSpeed.set(maxPortSpeed(from.PortSupportedSpeed));
  port.LinkTechnology.set(4);
  port.SupportedMaximumTransmissionUnit.set(from.PortMaxFrameSize);
  port.ActiveMaximumTransmissionUnit.set(from.PortMaxFrameSize);
  port.UsageRestriction.set(4);
}

Ref<TVXHBA_FCPort> CreateFCPortInstance(const Port_Build& build) {
  const FCAdapterAttributes& adapter = build.adapter.attributes;
  TVX_LOG(TVX_DBG, "FC Port # %d", static_cast<int>(build.port.m_Index));
  Ref<TVXHBA_FCPort> port = makeInstance<TVXHBA_FCPort>();
  port->PortNumber.set(adapter.PortNumber);
  port->Description.set(adapter.ModelDescription.c_str());
  port->OperationalFirmware.set(adapter.OperationalFirmware.c_str());
  setNames(*port.get(), build);
  setIdentifyingInfo(*port.get(), build);
  setState(*port.get(), build.attributes);
  setCapabilities(*port.get(), build.attributes);
  setLocationIndicator(*port.get(), build.port.m_Name.c_str());
  return port;
}

}  // namespace

std::int32_t insertFCPort(Port_Build& build) {
  build.fcPort = insertInto(build.adapter.host.agent.m_TVXHBA_FCPort_map,
                            CreateFCPortInstance(build), "Insert Failed : m_TVXHBA_FCPort_map");
  return build.fcPort ? 0 : MAP_BUILD_FAILED;
}

std::int32_t associateFCPort(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  ProviderAgent& agent = adapter.host.agent;
  const bool done = associate(agent.m_TVXHBA_FCPortSystemDevice_map, adapter.host.system,
                              build.fcPort, "Insert Failed : m_TVXHBA_FCPortSystemDevice_map") &&
                    associate(agent.m_TVXHBA_MemberOfCollection_map, adapter.portGroup,
                              build.fcPort, "Insert Failed : m_TVXHBA_MemberOfCollection_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

std::int32_t buildPortStatistics(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  const std::string& wwpn = build.port.m_Name;
  Ref<TVXHBA_FCPortStatistics> statistics = makeInstance<TVXHBA_FCPortStatistics>();
  statistics->ElementName.set(wwpn.c_str());
  statistics->Description.set("Statistics for the FC port.");
  statistics->InstanceID.set(("TVX FC HBA:HBA Statistics:" + wwpn).c_str());
  const TVXHBA_FCPortStatistics* entry =
      insertInto(agent.m_TVXHBA_FCPortStatistics_map, std::move(statistics),
                 "Insert Failed : m_TVXHBA_FCPortStatistics_map");
  const bool done =
      entry && associate(agent.m_TVXHBA_ElementStatisticalData_map, build.fcPort, entry,
                         "Insert Failed : m_TVXHBA_ElementStatisticalData_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

std::int32_t offerAccessPoint(Port_Build& build) {
  const Host_Build& host = build.adapter.host;
  associate(host.agent.m_TVXHBA_SAPAvailableForElement_map, host.accessPoint, build.fcPort,
            "Insert Failed : m_TVXHBA_SAPAvailableForElement_map");
  return 0;
}

}  // namespace cimrt
