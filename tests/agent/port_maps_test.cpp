// Ports, controllers and endpoints after a refresh.
#include "Map_Test.h"

namespace cimrt::test {
namespace {

TEST_F(Adapter_Maps, FCPortNames) {
  ProviderAgent& agent = build();
  const TVXHBA_FCPort& port = *agent.m_TVXHBA_FCPort_map[2];
  EXPECT_EQ(text(port.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(port.SystemName), agent.m_HostName);
  EXPECT_EQ(text(port.CreationClassName), "TVXHBA_FCPort");
  for (const auto* name : {&port.Name, &port.DeviceID, &port.PermanentAddress})
    EXPECT_EQ(text(*name), "10000254560A7E20");
  EXPECT_EQ(texts(port.NetworkAddresses), (std::vector<std::string>{"10000254560A7E20"}));
  EXPECT_EQ(text(port.AdapterName), "Torvex-TVX8102-3");
  EXPECT_EQ(port.PortNumber.value, 0);
  EXPECT_EQ(text(port.Description), "Torvex TVX8102 2-Port 8Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(text(port.ElementName), "port zero");
  EXPECT_EQ(
      texts(port.OtherIdentifyingInfo),
      (std::vector<std::string>{"/sys/class/scsi_host/host2", "02:54:56:0a:7e:20", "TX48007733:1",
                                "20000254560A7E20", "Torvex TVX8102 FV1.12a7"}));
  EXPECT_EQ(
      texts(port.IdentifyingDescriptions),
      (std::vector<std::string>{"OS Device Name", "TORVEX:IEEE_ADDRESS",
                                "SerialNumber + Sub-AdapterID", "NodeWWN", "NodeSymbolicName"}));
}

TEST_F(Adapter_Maps, FCPortState) {
  ProviderAgent& agent = build();
  const TVXHBA_FCPort& port = *agent.m_TVXHBA_FCPort_map[0];
  EXPECT_EQ(port.PortType.value, 10);
  EXPECT_EQ(text(port.OtherPortType), "N");
  EXPECT_EQ(numbers(port.OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(texts(port.StatusDescriptions), (std::vector<std::string>{"OK"}));
  EXPECT_EQ(port.FCID.value, 0x010400u);
  EXPECT_EQ(text(port.FabricName), "100000054D5A8001");
  EXPECT_EQ(port.NumberOfDiscoveredPorts.value, 2u);
  EXPECT_EQ(text(port.OperationalFirmware), "2.01a4");
  EXPECT_EQ(port.FWDownloadStatus.value, 0u);
  EXPECT_FALSE(port.FWDownloadStatus.is_null());
  EXPECT_EQ(port.Speed.value, 16'000'000'000u);
  EXPECT_EQ(port.MaxSpeed.value, 16'000'000'000u);
  EXPECT_EQ(port.LinkTechnology.value, 4);
  EXPECT_EQ(port.UsageRestriction.value, 4);
  EXPECT_EQ(port.SupportedMaximumTransmissionUnit.value, 2048u);
  EXPECT_EQ(port.ActiveMaximumTransmissionUnit.value, 2048u);
  EXPECT_EQ(numbers(port.SupportedCOS), (std::vector<std::uint16_t>{3}));
  EXPECT_EQ(numbers(port.ActiveCOS), (std::vector<std::uint16_t>{3}));
  EXPECT_EQ(numbers(port.SupportedFC4Types), (std::vector<std::uint16_t>{8}));
  EXPECT_EQ(numbers(port.ActiveFC4Types), (std::vector<std::uint16_t>{8}));
  const TVXHBA_FCPort& down = *agent.m_TVXHBA_FCPort_map[3];
  EXPECT_EQ(text(down.OtherPortType), "Unknown");
  EXPECT_EQ(down.Speed.value, 0u);
  EXPECT_EQ(text(down.FabricName), "0000000000000000");
}

TEST_F(Adapter_Maps, FCPortAssociations) {
  ProviderAgent& agent = build();
  const CIM_ComputerSystem* system = agent.m_CIM_ComputerSystem_map[0];
  for (std::size_t i = 0; i < agent.m_TVXHBA_FCPort_map.size(); i++) {
    const TVXHBA_FCPort* port = agent.m_TVXHBA_FCPort_map[i];
    EXPECT_TRUE(ties(*agent.m_TVXHBA_FCPortSystemDevice_map[i], system, port));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_MemberOfCollection_map[i],
                     agent.m_TVXHBA_LogicalPortGroup_map[i], port));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_ElementStatisticalData_map[i], port,
                     agent.m_TVXHBA_FCPortStatistics_map[i]));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_ProtocolControllerForPort_map[i],
                     agent.m_TVXHBA_SCSIProtocolController_map[i], port));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_SCSIProtocolControllerSystemDevice_map[i], system,
                     agent.m_TVXHBA_SCSIProtocolController_map[i]));
    const TVXHBA_PortController* controller = agent.m_TVXHBA_PortController_map[i];
    EXPECT_TRUE(ties(*agent.m_TVXHBA_ControlledBy_map[i], controller, port));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_ProductElementComponent_map[i],
                     agent.m_TVXHBA_Product_map[i / 2], controller));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_PHYConnectorRealizesPortController_map[i],
                     agent.m_TVXHBA_PhysicalConnector_map[i], controller));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_Realizes_map[i], agent.m_TVXHBA_Card_map[i / 2], controller));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_PortControllerSystemDevice_map[i], system, controller));
    const auto* endpoint = agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map[i];
    EXPECT_TRUE(ties(*agent.m_TVXHBA_DeviceSAPImplementation_map[i], port, endpoint));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_LocalHostedInitiatorAccessPoint_map[i], system, endpoint));
  }
}

TEST_F(Adapter_Maps, StatisticsStartUnset) {
  const TVXHBA_FCPortStatistics& statistics = *build().m_TVXHBA_FCPortStatistics_map[0];
  EXPECT_EQ(text(statistics.InstanceID), "TVX FC HBA:HBA Statistics:10000254560C4110");
  EXPECT_EQ(text(statistics.ElementName), "10000254560C4110");
  EXPECT_EQ(text(statistics.Description), "Statistics for the FC port.");
  EXPECT_TRUE(statistics.BytesTransmitted.is_null());
  EXPECT_TRUE(statistics.LinkFailures.is_null());
}

TEST_F(Adapter_Maps, SCSIController) {
  ProviderAgent& agent = build();
  const TVXHBA_SCSIProtocolController& controller = *agent.m_TVXHBA_SCSIProtocolController_map[0];
  EXPECT_EQ(text(controller.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(controller.SystemName), agent.m_HostName);
  EXPECT_EQ(text(controller.CreationClassName), "TVXHBA_SCSIProtocolController");
  EXPECT_EQ(text(controller.Name), "10000254560C4110");
  EXPECT_EQ(text(controller.DeviceID), "10000254560C4110");
  EXPECT_EQ(text(controller.ElementName), "Torvex TVX16002 FV2.01a4");
  EXPECT_EQ(text(controller.Description), "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(controller.NameFormat.value, 2);
  EXPECT_EQ(controller.MaxUnitsControlled.value, 1u);
  EXPECT_EQ(numbers(controller.OperationalStatus), (std::vector<std::uint16_t>{2}));
  EXPECT_EQ(texts(controller.StatusDescriptions), (std::vector<std::string>{"OK"}));
}

TEST_F(Adapter_Maps, PortController) {
  ProviderAgent& agent = build();
  const TVXHBA_PortController& controller = *agent.m_TVXHBA_PortController_map[0];
  EXPECT_EQ(text(controller.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(controller.SystemName), agent.m_HostName);
  EXPECT_EQ(text(controller.CreationClassName), "TVXHBA_PortController");
  EXPECT_EQ(text(controller.DeviceID), "10000254560C4110");
  EXPECT_EQ(text(controller.Name), "Torvex TVX16002 FV2.01a4");
  EXPECT_EQ(text(controller.ElementName), "Torvex TVX16002 FV2.01a4");
  EXPECT_EQ(controller.ControllerType.value, 4);
  EXPECT_EQ(controller.ProtocolSupported.value, 10);
  EXPECT_EQ(controller.MaxNumberControlled.value, 1u);
  EXPECT_EQ(text(controller.ProtocolDescription), "SCSI Fibre Channel Protocol");
  EXPECT_EQ(controller.Availability.value, 3);
  EXPECT_EQ(controller.EnabledState.value, 5);
  EXPECT_EQ(controller.RequestedState.value, 5);
  EXPECT_EQ(controller.EnabledDefault.value, 2);
  EXPECT_EQ(numbers(controller.OperationalStatus), (std::vector<std::uint16_t>{2}));
}

TEST_F(Adapter_Maps, AccessStateFollowsThePortState) {
  ProviderAgent& agent = build(
      R"({"cards": [{"ports": [{"state": "unknown"}, {"state": "online"}, {"state": "offline"},
          {"state": "link down"}]}]})");
  ASSERT_EQ(agent.m_TVXHBA_ControlledBy_map.size(), 4u);
  const std::uint16_t expected[] = {0, 1, 2, 2};
  for (std::size_t i = 0; i < 4; i++)
    EXPECT_EQ(agent.m_TVXHBA_ControlledBy_map[i]->AccessState.value, expected[i]) << i;
}

TEST_F(Adapter_Maps, InitiatorEndpoint) {
  ProviderAgent& agent = build();
  const auto& endpoint = *agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map[0];
  EXPECT_EQ(text(endpoint.SystemCreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(endpoint.SystemName), agent.m_HostName);
  EXPECT_EQ(text(endpoint.CreationClassName), "TVXHBA_SCSIProtocolInitiatorEndpoint");
  EXPECT_EQ(text(endpoint.Name), "10000254560C4110");
  EXPECT_EQ(text(endpoint.ElementName), "Torvex TVX16002 FV2.01a4");
  EXPECT_EQ(text(endpoint.Description), "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(endpoint.ProtocolType.value, 18);
  EXPECT_EQ(endpoint.ProtocolIFType.value, 56);
  EXPECT_EQ(endpoint.ConnectionType.value, 2);
  EXPECT_EQ(endpoint.Role.value, 2);
  EXPECT_EQ(endpoint.EnabledDefault.value, 5);
  EXPECT_EQ(endpoint.EnabledState.value, 0);
  EXPECT_EQ(endpoint.RequestedState.value, 0);
  EXPECT_EQ(numbers(endpoint.OperationalStatus), (std::vector<std::uint16_t>{0}));
}

}  // namespace
}  // namespace cimrt::test
