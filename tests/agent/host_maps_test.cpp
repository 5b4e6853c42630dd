// Host, packages, cards, chips and connectors after a refresh, and what a failed build leaves.
#include <utility>

#include "Map_Test.h"

namespace cimrt::test {
namespace {

TEST_F(Adapter_Maps, DefaultHostHasItsInstances) {
  ProviderAgent& agent = build();
  EXPECT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1u);
  EXPECT_EQ(agent.m_CIM_Chassis_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_Product_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_LogicalPortGroup_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_HostedCollection_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_Card_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_Chip_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_CardContainsChip_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_PCIDevice_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_SystemDevice_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_PhysicalConnector_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ProductPhysicalConnector_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_CardContainsConnector_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ConnectorDependsOnChip_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_FCPortSystemDevice_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_MemberOfCollection_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_FCPortStatistics_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ElementStatisticalData_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolController_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ProtocolControllerForPort_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolControllerSystemDevice_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_PortController_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ProductElementComponent_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_PHYConnectorRealizesPortController_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_ControlledBy_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_Realizes_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_PortControllerSystemDevice_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_DeviceSAPImplementation_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_LocalHostedInitiatorAccessPoint_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_FCRealizes_map.size(), 0u);
  // Two cards are new; either is told once for its own adapter.
  EXPECT_EQ(agent.m_TVXHBA_ProductPhysicalComponent_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_ChassisContainsCard_map.size(), 2u);
}

TEST_F(Adapter_Maps, BuildGoesThroughItsStepsInOrder) {
  build(singlePortCards(1));
  const std::vector<std::string> steps = {
      " updateAdapterMaps: Entry",
      "PERF: Entered clearAdapterMaps()",
      "Exiting clearAdapterMaps()",
      "up-call to enumerate CIM_ComputerSystem started",
      "up-call method failed",
      "Generating an torvex specific m_CIM_ComputerSystem_map[0]",
      "All clear -created tvxhba computer system instance",
      "up-call to enumerate CIM_Chassis started",
      "up-call method to get the chassis is failed",
      "Creating classes for port 0.",
      "Card is created. Creating the associations",
      "FC Port # 0",
      "Create the Diagnostic classes",
      "PERF: updateAdapterMaps: cleanExit",
      "Creating classes for port 0.",  // by the SAN maps
  };
  EXPECT_EQ(log.only(steps), steps);
}

TEST_F(Adapter_Maps, EveryInstanceStandsInTheProvidersNamespace) {
  ProviderAgent& agent = build();
  EXPECT_TRUE(agent.m_CIM_ComputerSystem_map[0]->__name_space == "root/torvex");
  EXPECT_TRUE(agent.m_CIM_Chassis_map[0]->__name_space == "root/torvex");
  EXPECT_TRUE(agent.m_TVXHBA_FCPort_map[0]->__name_space == "root/torvex");
  EXPECT_TRUE(agent.m_TVXHBA_ControlledBy_map[0]->__name_space == "root/torvex");
}

TEST_F(Adapter_Maps, GeneratedComputerSystem) {
  ProviderAgent& agent = build();
  EXPECT_TRUE(agent.m_bOwnComputerSystem);
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  EXPECT_EQ(text(system.Name), agent.m_HostName);
  EXPECT_EQ(text(system.ElementName), agent.m_HostName);
  EXPECT_FALSE(agent.m_HostName.empty());
  EXPECT_EQ(text(system.CreationClassName), "CIM_ComputerSystem");
  EXPECT_EQ(text(system.Description),
            agent.m_OSName + " with Torvex CMPI HBA Provider v10.2.107-7");
  EXPECT_EQ(system.EnabledState.value, 0);
  EXPECT_EQ(system.RequestedState.value, 12);
  EXPECT_EQ(system.TransitioningToState.value, 12);
  EXPECT_EQ(system.EnabledDefault.value, 2);
  EXPECT_EQ(texts(system.OtherIdentifyingInfo),
            (std::vector<std::string>{agent.m_IPAddress, agent.m_OSName, agent.m_OSExtendedInfo}));
  EXPECT_EQ(
      texts(system.IdentifyingDescriptions),
      (std::vector<std::string>{"TORVEX:IP_ADDRESS", "TORVEX:OS_NAME", "TORVEX:OS_EXTENDED_INFO"}));
  EXPECT_EQ(numbers(system.Dedicated), (std::vector<std::uint16_t>{0}));
  EXPECT_EQ(text(system.NameFormat), "Other");
  EXPECT_EQ(system.ResetCapability.value, 2);
  EXPECT_EQ(numbers(system.PowerManagementCapabilities), (std::vector<std::uint16_t>{0}));
  EXPECT_EQ(numbers(system.OperationalStatus), (std::vector<std::uint16_t>{2}));
}

TEST_F(Adapter_Maps, OwnChassis) {
  const CIM_Chassis& chassis = *build().m_CIM_Chassis_map[0];
  EXPECT_EQ(text(chassis.Tag), "TVX HBA:Chassis");
  EXPECT_EQ(text(chassis.ElementName), "TVX HBA:Chassis");
  EXPECT_EQ(text(chassis.CreationClassName), "CIM_Chassis");
  EXPECT_EQ(chassis.PackageType.value, 3);
  EXPECT_EQ(chassis.ChassisPackageType.value, 0);
}

TEST_F(Adapter_Maps, ProductAndPortGroup) {
  ProviderAgent& agent = build();
  const TVXHBA_Product& product = *agent.m_TVXHBA_Product_map[0];
  EXPECT_EQ(text(product.Description), "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(text(product.ElementName), "Torvex TVX16002 FV2.01a4");
  EXPECT_EQ(text(product.Name), "TVX16002");
  EXPECT_EQ(text(product.IdentifyingNumber), "TX52100417");
  EXPECT_EQ(text(product.Vendor), "Torvex Corporation");
  EXPECT_EQ(text(product.Version), "0000000b");
  const TVXHBA_LogicalPortGroup& group = *agent.m_TVXHBA_LogicalPortGroup_map[1];
  EXPECT_EQ(text(group.InstanceID), "TVX FC HBA:20000254560C4111");
  EXPECT_EQ(text(group.Name), "20000254560C4111");
  EXPECT_EQ(text(group.NameFormat), "WWN");
  EXPECT_EQ(text(group.ElementName), "TX52100417");
  EXPECT_EQ(text(group.Description), "The Fibre Channel ports of the HBA.");
  EXPECT_TRUE(
      ties(*agent.m_TVXHBA_HostedCollection_map[1], agent.m_CIM_ComputerSystem_map[0], &group));
}

TEST_F(Adapter_Maps, Card) {
  // Without data of its own unit the card keeps what the libraries say of the adapter.
  useScenario(TWO_CARDS);
  addFault(R"({"call": "LRM_GetVPDV2", "status": 1})");
  ProviderAgent& agent = rebuild();
  const TVXHBA_Card& card = *agent.m_TVXHBA_Card_map[0];
  EXPECT_EQ(text(card.CreationClassName), "TVXHBA_Card");
  for (const auto* serial :
       {&card.Tag, &card.OtherIdentifyingInfo, &card.SerialNumber, &card.TVXSerialNumber})
    EXPECT_EQ(text(*serial), "TX52100417");
  for (const auto* model : {&card.Name, &card.Model, &card.PartNumber})
    EXPECT_EQ(text(*model), "TVX16002");
  EXPECT_EQ(text(card.Manufacturer), "Torvex Corporation");
  EXPECT_EQ(text(card.Description), "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(card.PackageType.value, 9);
  EXPECT_EQ(card.DeviceID.value, 0xE300u);
  EXPECT_EQ(card.ModelID.value, 0xE312u);
  EXPECT_EQ(card.SLIMode.value, 4u);
  EXPECT_EQ(card.VendorSpecID.value, 0xE2001D9Bu);
  EXPECT_FALSE(card.HostingBoard.is_null());
  EXPECT_FALSE(card.HostingBoard.value);
  EXPECT_EQ(text(card.ElementName), "TVX FCHBA:TVX16002:TX52100417");
  EXPECT_EQ(text(card.Version), "0000000b");
  EXPECT_TRUE(
      ties(*agent.m_TVXHBA_ProductPhysicalComponent_map[0], agent.m_TVXHBA_Product_map[0], &card));
  EXPECT_TRUE(ties(*agent.m_TVXHBA_ChassisContainsCard_map[0], agent.m_CIM_Chassis_map[0], &card));
}

TEST_F(Adapter_Maps, Chip) {
  ProviderAgent& agent = build();
  const TVXHBA_Chip& chip = *agent.m_TVXHBA_Chip_map[1];
  EXPECT_EQ(text(chip.CreationClassName), "TVXHBA_Chip");
  EXPECT_EQ(text(chip.Tag), "TX48007733:1");
  EXPECT_EQ(text(chip.Name), "TVX8102");
  EXPECT_EQ(text(chip.Model), "TVX8102");
  EXPECT_EQ(text(chip.Manufacturer), "Torvex Corporation");
  EXPECT_EQ(text(chip.Description), "Torvex TVX8102 2-Port 8Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(text(chip.SerialNumber), "TX48007733");
  EXPECT_EQ(text(chip.SubAdapterId), "1");
  EXPECT_EQ(text(chip.ElementName), "TVX HBA ASIC:TVX8102:TX48007733");
  EXPECT_EQ(text(chip.TemperatureUnit), "Celsius");
  EXPECT_EQ(chip.OASCapability.value, 0);
  EXPECT_EQ(chip.BoardTemperature.value, 51);
  EXPECT_EQ(chip.ThresholdWarningTemp.value, 75);
  EXPECT_EQ(chip.ThresholdCriticalTemp.value, 85);
  EXPECT_EQ(text(agent.m_TVXHBA_Chip_map[0]->Tag), "TX52100417");
  EXPECT_TRUE(ties(*agent.m_TVXHBA_CardContainsChip_map[1], agent.m_TVXHBA_Card_map[1], &chip));
}

TEST_F(Adapter_Maps, BoardWithoutTemperatureLeavesItsThreeValuesNull) {
  ProviderAgent& agent = build(
      R"({"cards": [{"board_temperature": {"current": 0, "critical": 60, "warning": 70},
          "ports": [{}]}]})");
  const TVXHBA_Chip& chip = *agent.m_TVXHBA_Chip_map[0];
  EXPECT_TRUE(chip.BoardTemperature.is_null());
  EXPECT_TRUE(chip.ThresholdWarningTemp.is_null());
  EXPECT_TRUE(chip.ThresholdCriticalTemp.is_null());
  EXPECT_EQ(text(chip.TemperatureUnit), "Celsius");
}

TEST_F(Adapter_Maps, FunctionsOfOneCardShareItAndHaveChipsOfTheirOwn) {
  ProviderAgent& agent = build(
      R"({"cards": [{"serial_number": "ONE", "ports": [{"sub_adapter_id": "1"},
          {"sub_adapter_id": "2"}]}]})");
  EXPECT_EQ(agent.m_TVXHBA_Card_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_Product_map.size(), 1u);
  ASSERT_EQ(agent.m_TVXHBA_Chip_map.size(), 2u);
  EXPECT_EQ(text(agent.m_TVXHBA_Chip_map[0]->Tag), "ONE:1");
  EXPECT_EQ(text(agent.m_TVXHBA_Chip_map[1]->Tag), "ONE:2");
  EXPECT_EQ(log.count("Card is created. Creating the associations"), 1u);
}

TEST_F(Adapter_Maps, PhysicalConnector) {
  ProviderAgent& agent = build();
  const TVXHBA_PhysicalConnector& connector = *agent.m_TVXHBA_PhysicalConnector_map[1];
  EXPECT_EQ(text(connector.CreationClassName), "TVXHBA_PhysicalConnector");
  EXPECT_EQ(text(connector.Tag), "10000254560C4111");
  EXPECT_EQ(text(connector.Name), "10000254560C4111");
  EXPECT_EQ(text(connector.InstanceID), "TX52100417:1");
  EXPECT_EQ(text(connector.OtherIdentifyingInfo), "TX52100417:1");
  EXPECT_EQ(text(connector.ElementName), "TVX HBA Port:TX52100417:Network Connector:1");
  EXPECT_EQ(text(connector.Manufacturer), "Torvex Corporation");
  EXPECT_EQ(text(connector.Model), "TVX16002");
  EXPECT_EQ(text(connector.SerialNumber), "TX52100417");
  EXPECT_EQ(connector.ConnectorLayout.value, 12);
  EXPECT_TRUE(ties(*agent.m_TVXHBA_ProductPhysicalConnector_map[1], agent.m_TVXHBA_Product_map[0],
                   &connector));
  EXPECT_TRUE(
      ties(*agent.m_TVXHBA_CardContainsConnector_map[1], agent.m_TVXHBA_Card_map[0], &connector));
  EXPECT_TRUE(
      ties(*agent.m_TVXHBA_ConnectorDependsOnChip_map[1], &connector, agent.m_TVXHBA_Chip_map[0]));
}

TEST_F(Adapter_Maps, HostWithoutCardsHasSystemAndChassis) {
  useScenario();
  addFault(R"({"call": "HBA_GetNumberOfAdapters", "status": 0})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(log.count("No FC card found"), 1u);
  EXPECT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1u);
  EXPECT_EQ(agent.m_CIM_Chassis_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_Card_map.size(), 0u);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
}

TEST_F(Adapter_Maps, CountBeyondTheTreeEndsTheWalkAndNotTheBuild) {
  ProviderAgent& agent = build();
  {
    Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    agent.m_pData->m_AdapterCount++;
    agent.updateAdapterMaps();
    agent.m_pData->m_AdapterCount--;
  }
  EXPECT_EQ(log.level("Unknown Exception in FC card discovery"), TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
}

TEST_F(Adapter_Maps, AdapterOfAnotherKindIsPassedOver) {
  ProviderAgent& agent = build();
  {
    Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    agent.m_pData->m_Adapters[0]->m_Type = 2;
    agent.updateAdapterMaps();
    agent.m_pData->m_Adapters[0]->m_Type = TVX_ADAPTER_TYPE_FC;
  }
  EXPECT_EQ(log.count("Skippping Non FC Adapter [Torvex-TVX16002-1]"), 1u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 3u);
}

TEST_F(Adapter_Maps, AdapterThatIsNoFCAdapterEndsTheBuild) {
  ProviderAgent& agent = build();
  Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
  Ranked_Lock data(agent.m_DataMutex);
  agent.m_pData->m_Adapters.push_back(new Odd_Adapter);
  agent.m_pData->m_AdapterCount++;
  log.clear();
  EXPECT_EQ(agent.updateAdapterMaps(), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Adapter [odd] is no FC adapter"), TVX_ERR);
  EXPECT_EQ(log.count("Unknown Exception in FC card discovery"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  EXPECT_EQ(agent.m_TVXHBA_RecordLog_map.size(), 0u);
}

TEST_F(Adapter_Maps, PortThatIsNoFCPortEndsTheBuildWithWhatThereIs) {
  ProviderAgent& agent = build();
  Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
  Ranked_Lock data(agent.m_DataMutex);
  Port*& place = agent.m_pData->m_Adapters[2]->getPorts().at(0);
  Port* const port = std::exchange(place, nullptr);
  log.clear();
  EXPECT_EQ(agent.updateAdapterMaps(), MAP_BUILD_FAILED);
  place = port;
  EXPECT_EQ(log.level("Port 0 of adapter [" + agent.m_pData->m_Adapters[2]->getName() +
                      "] is no FC port"),
            TVX_ERR);
  EXPECT_EQ(log.count("Unknown Exception in FC card discovery"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 2u);
}

TEST_F(Adapter_Maps, LostTreeIsASeriousIssue) {
  ProviderAgent& agent = build();
  {
    Ranked_Lock maps(agent.m_AdapterMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    auto tree = std::move(agent.m_pData);
    EXPECT_EQ(agent.updateAdapterMaps(), MAP_BUILD_FAILED);
    agent.m_pData = std::move(tree);
  }
  EXPECT_EQ(log.level("Could not locate the data pointer - Serious issue"), TVX_CRIT);
  EXPECT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1u);
}

}  // namespace
}  // namespace cimrt::test
