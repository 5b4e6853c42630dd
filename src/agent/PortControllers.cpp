// The controllers of a port and the endpoint through which it reaches its targets.
#include "agent/FCPortTables.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

/// How a port controller reaches its port.
std::uint16_t accessState(std::uint32_t portState) {
  switch (portState) {
    case HBA_PORTSTATE_UNKNOWN:
      return 0;
    case HBA_PORTSTATE_ONLINE:
      return 1;
    default:
      return 2;
  }
}

/// Keys that every device of a port takes from the system, and the class name.
template <class T>
void setSystemKeys(T& instance, const CIM_ComputerSystem& system, const char* className) {
  instance.SystemCreationClassName.set(system.CreationClassName.value);
  instance.SystemName.set(system.Name.value);
  instance.CreationClassName.set(className);
}

template <class T>
void setPortStatus(T& instance, std::uint32_t portState) {
  const Port_Status& status = portStatus(portState);
  instance.OperationalStatus.set({status.operationalStatus});
  instance.StatusDescriptions.set({status.description});
}

Ref<TVXHBA_SCSIProtocolController> describeSCSIController(const Port_Build& build) {
  const FCAdapterAttributes& from = build.adapter.attributes;
  Ref<TVXHBA_SCSIProtocolController> controller = makeInstance<TVXHBA_SCSIProtocolController>();
  setSystemKeys(*controller.get(), *build.adapter.host.system, "TVXHBA_SCSIProtocolController");
  controller->Description.set(from.ModelDescription.c_str());
  controller->Name.set(build.port.m_Name.c_str());
  controller->DeviceID.set(build.port.m_Name.c_str());
  controller->ElementName.set(from.NodeSymbolicName.c_str());
  setPortStatus(*controller.get(), build.attributes.PortState);
  controller->NameFormat.set(2);
  controller->MaxUnitsControlled.set(
      static_cast<std::uint32_t>(build.adapter.adapter.getNumberOfPorts()));
  return controller;
}

Ref<TVXHBA_PortController> describePortController(const Port_Build& build) {
  const FCAdapterAttributes& from = build.adapter.attributes;
  Ref<TVXHBA_PortController> controller = makeInstance<TVXHBA_PortController>();
  setSystemKeys(*controller.get(), *build.adapter.host.system, "TVXHBA_PortController");
  controller->Description.set(from.ModelDescription.c_str());
  controller->ElementName.set(from.NodeSymbolicName.c_str());
  controller->Name.set(from.NodeSymbolicName.c_str());
  controller->DeviceID.set(build.port.m_Name.c_str());
  controller->ControllerType.set(4);
  controller->ProtocolSupported.set(10);
  controller->MaxNumberControlled.set(
      static_cast<std::uint32_t>(build.adapter.adapter.getNumberOfPorts()));
  controller->ProtocolDescription.set("SCSI Fibre Channel Protocol");
  controller->Availability.set(3);
  controller->EnabledState.set(5);
  controller->RequestedState.set(5);
  controller->EnabledDefault.set(2);
  setPortStatus(*controller.get(), build.attributes.PortState);
  return controller;
}

Ref<TVXHBA_SCSIProtocolInitiatorEndpoint> describeEndpoint(const Port_Build& build) {
  const FCAdapterAttributes& from = build.adapter.attributes;
  Ref<TVXHBA_SCSIProtocolInitiatorEndpoint> endpoint =
      makeInstance<TVXHBA_SCSIProtocolInitiatorEndpoint>();
  setSystemKeys(*endpoint.get(), *build.adapter.host.system,
                "TVXHBA_SCSIProtocolInitiatorEndpoint");
  endpoint->Description.set(from.ModelDescription.c_str());
  endpoint->ElementName.set(from.NodeSymbolicName.c_str());
  endpoint->Name.set(build.port.m_Name.c_str());
  endpoint->ProtocolType.set(18);
  endpoint->ProtocolIFType.set(56);
  endpoint->ConnectionType.set(2);
  endpoint->Role.set(2);
  endpoint->EnabledDefault.set(5);
  endpoint->EnabledState.set(0);
  endpoint->RequestedState.set(0);
  endpoint->OperationalStatus.set({0});
  return endpoint;
}

}  // namespace

std::int32_t buildSCSIController(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  build.scsiController =
      insertInto(agent.m_TVXHBA_SCSIProtocolController_map, describeSCSIController(build),
                 "Insert Failed : m_TVXHBA_SCSIProtocolController_map");
  const bool done =
      build.scsiController &&
      associate(agent.m_TVXHBA_ProtocolControllerForPort_map, build.scsiController, build.fcPort,
                "Insert Failed : m_TVXHBA_ProtocolControllerForPort_map") &&
      associate(agent.m_TVXHBA_SCSIProtocolControllerSystemDevice_map, build.adapter.host.system,
                build.scsiController,
                "Insert Failed : m_TVXHBA_SCSIProtocolControllerSystemDevice_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

std::int32_t buildPortController(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  build.controller = insertInto(agent.m_TVXHBA_PortController_map, describePortController(build),
                                "Insert Failed : m_TVXHBA_PortController_map");
  const bool done =
      build.controller &&
      associate(agent.m_TVXHBA_ProductElementComponent_map, build.adapter.product, build.controller,
                "Insert Failed : m_TVXHBA_ProductElementComponent_map") &&
      associate(agent.m_TVXHBA_PHYConnectorRealizesPortController_map, build.connector,
                build.controller,
                "Insert Failed : m_TVXHBA_PHYConnectorRealizesPortController_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

std::int32_t associatePortController(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  ProviderAgent& agent = adapter.host.agent;
  Ref<TVXHBA_ControlledBy> controlledBy =
      makeAssociation<TVXHBA_ControlledBy>(build.controller, build.fcPort);
  controlledBy->AccessState.set(accessState(build.attributes.PortState));
  const bool done =
      insertInto(agent.m_TVXHBA_ControlledBy_map, std::move(controlledBy),
                 "Insert Failed : m_TVXHBA_ControlledBy_map") &&
      associate(agent.m_TVXHBA_Realizes_map, adapter.card, build.controller,
                "Insert Failed : m_TVXHBA_Realizes_map") &&
      associate(agent.m_TVXHBA_PortControllerSystemDevice_map, adapter.host.system,
                build.controller, "Insert Failed : m_TVXHBA_PortControllerSystemDevice_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

std::int32_t buildInitiatorEndpoint(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  const TVXHBA_SCSIProtocolInitiatorEndpoint* endpoint =
      insertInto(agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map, describeEndpoint(build),
                 "Insert Failed : m_TVXHBA_SCSIProtocolInitiatorEndpoint_map");
  const bool done =
      endpoint &&
      associate(agent.m_TVXHBA_DeviceSAPImplementation_map, build.fcPort, endpoint,
                "Insert Failed : m_TVXHBA_DeviceSAPImplementation_map") &&
      associate(agent.m_TVXHBA_LocalHostedInitiatorAccessPoint_map, build.adapter.host.system,
                endpoint, "Insert Failed : m_TVXHBA_LocalHostedInitiatorAccessPoint_map");
  return done ? 0 : MAP_BUILD_FAILED;
}

}  // namespace cimrt
