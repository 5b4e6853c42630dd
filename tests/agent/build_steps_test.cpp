// The helpers of the map builders, and each step's failure when its map refuses the instance.
#include <string>

#include "Map_Test.h"
#include "agent/HostedServices.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"

namespace cimrt::test {
namespace {

/// A built host whose first port can be built again by single steps, which then meet their own
/// entries in the maps.
class Build_Steps : public Adapter_Maps {
 protected:
  void SetUp() override {
    Adapter_Maps::SetUp();
    agent = &build();
    adapter = dynamic_cast<FCAdapter*>(agent->m_pData->m_Adapters[0]);
    port = dynamic_cast<FCPort*>(adapter->getPort(0));
    log.clear();
  }
  Host_Build host() {
    Host_Build build{*agent};
    build.system = agent->m_CIM_ComputerSystem_map[0];
    build.chassis = agent->m_CIM_Chassis_map[0];
    return build;
  }
  Adapter_Build adapterOf(Host_Build& host) {
    Adapter_Build build{host, *adapter,
                        dynamic_cast<const FCAdapterAttributes&>(*adapter->getAttributes())};
    build.product = agent->m_TVXHBA_Product_map[0];
    build.portGroup = agent->m_TVXHBA_LogicalPortGroup_map[0];
    build.card = agent->m_TVXHBA_Card_map[0];
    return build;
  }
  Port_Build portOf(Adapter_Build& adapterBuild) {
    Port_Build build{adapterBuild, *port,
                     dynamic_cast<const FCPortAttributes&>(*port->getAttributes())};
    build.chip = agent->m_TVXHBA_Chip_map[0];
    build.connector = agent->m_TVXHBA_PhysicalConnector_map[0];
    build.fcPort = agent->m_TVXHBA_FCPort_map[0];
    build.controller = agent->m_TVXHBA_PortController_map[0];
    return build;
  }
  /// Runs one step of the first port again.
  std::int32_t again(Build_Step<Port_Build> step) {
    Host_Build hostBuild = host();
    Adapter_Build adapterBuild = adapterOf(hostBuild);
    Port_Build portBuild = portOf(adapterBuild);
    return step(portBuild);
  }

  ProviderAgent* agent = nullptr;
  FCAdapter* adapter = nullptr;
  FCPort* port = nullptr;
};

TEST_F(Build_Steps, RefusedInsertsEndTheBuildWithTheirTexts) {
  const struct {
    Build_Step<Port_Build> step;
    const char* text;
  } rows[] = {
      {insertFCPort, "Insert Failed : m_TVXHBA_FCPort_map"},
      {associateFCPort, "Insert Failed : m_TVXHBA_FCPortSystemDevice_map"},
      {buildPortStatistics, "Insert Failed : m_TVXHBA_FCPortStatistics_map"},
      {buildSCSIController, "Insert Failed : m_TVXHBA_SCSIProtocolController_map"},
      {buildPortController, "Insert Failed : m_TVXHBA_PortController_map"},
      {associatePortController, "Insert Failed : m_TVXHBA_ControlledBy_map"},
      {buildInitiatorEndpoint, "Insert Failed : m_TVXHBA_SCSIProtocolInitiatorEndpoint_map"},
      {CreatePhysicalConnectorInstances, "Insert Failed (HBA): m_TVXHBA_PhysicalConnector"},
      {CreatePCIDeviceInstance, "Insert Failed : m_TVXHBA_PCIDevice_map"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(again(row.step), MAP_BUILD_FAILED) << row.text;
    EXPECT_EQ(log.level(row.text), TVX_CRIT) << row.text;
  }
  EXPECT_EQ(agent->m_TVXHBA_FCPort_map.size(), 4u);
}

TEST_F(Build_Steps, RefusedAssociationsEndTheBuildWithTheirTexts) {
  // With the first map of a step emptied the refusal comes from the next one.
  const struct {
    Build_Step<Port_Build> step;
    Instance_Map_Base& emptied;
    const char* text;
  } rows[] = {
      {associateFCPort, agent->m_TVXHBA_FCPortSystemDevice_map,
       "Insert Failed : m_TVXHBA_MemberOfCollection_map"},
      {buildPortStatistics, agent->m_TVXHBA_FCPortStatistics_map,
       "Insert Failed : m_TVXHBA_ElementStatisticalData_map"},
      {buildSCSIController, agent->m_TVXHBA_SCSIProtocolController_map,
       "Insert Failed : m_TVXHBA_ProtocolControllerForPort_map"},
      {buildPortController, agent->m_TVXHBA_PortController_map,
       "Insert Failed : m_TVXHBA_ProductElementComponent_map"},
      {associatePortController, agent->m_TVXHBA_ControlledBy_map,
       "Insert Failed : m_TVXHBA_Realizes_map"},
      {buildInitiatorEndpoint, agent->m_TVXHBA_SCSIProtocolInitiatorEndpoint_map,
       "Insert Failed : m_TVXHBA_DeviceSAPImplementation_map"},
      {CreatePhysicalConnectorInstances, agent->m_TVXHBA_PhysicalConnector_map,
       "Insert Failed (HBA): TVXHBA_ProductPhysicalConnector"},
      {CreatePCIDeviceInstance, agent->m_TVXHBA_PCIDevice_map,
       "Insert Failed : m_TVXHBA_PCIElementConformsToProfile_map"},
  };
  for (const auto& row : rows) {
    Host_Build hostBuild = host();
    Adapter_Build adapterBuild = adapterOf(hostBuild);
    Port_Build portBuild = portOf(adapterBuild);
    if (&row.emptied == &agent->m_TVXHBA_PhysicalConnector_map) portBuild.connector = nullptr;
    if (&row.emptied == &agent->m_TVXHBA_PortController_map) portBuild.controller = nullptr;
    row.emptied.clear();
    EXPECT_EQ(row.step(portBuild), MAP_BUILD_FAILED) << row.text;
    EXPECT_EQ(log.level(row.text), TVX_CRIT) << row.text;
  }
}

TEST_F(Build_Steps, LaterAssociationsOfAStepEndTheBuildToo) {
  // With the maps before it emptied the refusal comes from the last map of a step.
  const struct {
    Build_Step<Port_Build> step;
    std::vector<Instance_Map_Base*> emptied;
    const char* text;
  } rows[] = {
      {CreatePCIDeviceInstance,
       {&agent->m_TVXHBA_PCIDevice_map, &agent->m_TVXHBA_PCIElementConformsToProfile_map},
       "Insert Failed : m_TVXHBA_SystemDevice_map"},
      {CreatePhysicalConnectorInstances,
       {&agent->m_TVXHBA_PhysicalConnector_map, &agent->m_TVXHBA_ProductPhysicalConnector_map},
       "Insert Failed (HBA): TVXHBA_CardContainsConnector"},
      {CreatePhysicalConnectorInstances,
       {&agent->m_TVXHBA_PhysicalConnector_map, &agent->m_TVXHBA_ProductPhysicalConnector_map,
        &agent->m_TVXHBA_CardContainsConnector_map},
       "Insert Failed (CNA): TVXHBA_ConnectorDependsOnChip"},
      {buildSCSIController,
       {&agent->m_TVXHBA_SCSIProtocolController_map,
        &agent->m_TVXHBA_ProtocolControllerForPort_map},
       "Insert Failed : m_TVXHBA_SCSIProtocolControllerSystemDevice_map"},
      {buildPortController,
       {&agent->m_TVXHBA_PortController_map, &agent->m_TVXHBA_ProductElementComponent_map},
       "Insert Failed : m_TVXHBA_PHYConnectorRealizesPortController_map"},
      {associatePortController,
       {&agent->m_TVXHBA_ControlledBy_map, &agent->m_TVXHBA_Realizes_map},
       "Insert Failed : m_TVXHBA_PortControllerSystemDevice_map"},
      {buildInitiatorEndpoint,
       {&agent->m_TVXHBA_SCSIProtocolInitiatorEndpoint_map,
        &agent->m_TVXHBA_DeviceSAPImplementation_map},
       "Insert Failed : m_TVXHBA_LocalHostedInitiatorAccessPoint_map"},
      {buildTransceiver, {&agent->m_TVXHBA_Transceiver_map}, "Insert Failed : m_Component_map"},
  };
  for (const auto& row : rows) {
    Host_Build hostBuild = host();
    Adapter_Build adapterBuild = adapterOf(hostBuild);
    Port_Build portBuild = portOf(adapterBuild);
    // The controller and the connector go with their maps; what stands for them has their keys.
    Ref<TVXHBA_PhysicalConnector> connector(clone(portBuild.connector));
    Ref<TVXHBA_PortController> controller(clone(portBuild.controller));
    portBuild.connector = connector.get();
    portBuild.controller = controller.get();
    for (Instance_Map_Base* map : row.emptied) map->clear();
    EXPECT_EQ(row.step(portBuild), MAP_BUILD_FAILED) << row.text;
    EXPECT_EQ(log.level(row.text), TVX_CRIT) << row.text;
    refresh(*agent);
    log.clear();
    adapter = dynamic_cast<FCAdapter*>(agent->m_pData->m_Adapters[0]);
    port = dynamic_cast<FCPort*>(adapter->getPort(0));
  }
}

TEST_F(Build_Steps, CardThatStandsUnderAnotherNumberEndsTheBuild) {
  Host_Build hostBuild = host();
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  agent->m_TVXHBA_Card_map[0]->Tag.set(adapterBuild.attributes.SerialNumber.c_str());
  agent->m_TVXHBA_Card_map[0]->TVXSerialNumber.set("another");
  EXPECT_EQ(CreateCardInstances(adapterBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_Card_map"), TVX_CRIT);
  EXPECT_EQ(adapterBuild.card, nullptr);
  EXPECT_FALSE(adapterBuild.cardIsNew);
}

TEST_F(Build_Steps, GroupThatIsInTheSystemAlreadyEndsTheBuild) {
  Host_Build hostBuild = host();
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  agent->m_TVXHBA_LogicalPortGroup_map.clear();
  EXPECT_EQ(CreatePackageInstances(adapterBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_HostedCollection_map"), TVX_CRIT);
}

TEST_F(Build_Steps, ServiceThatAffectsTheChipAlreadyIsNoFailure) {
  Host_Build hostBuild = host();
  hostBuild.installationService = agent->m_TVXHBA_SoftwareInstallationService_map[0];
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  Port_Build portBuild = portOf(adapterBuild);
  agent->m_TVXHBA_Chip_map.clear();
  agent->m_TVXHBA_CardContainsChip_map.clear();
  EXPECT_EQ(CreateChipInstances(portBuild), 0);
  EXPECT_EQ(log.level("Insert Failed:TVXHBA_InstallServiceAffectsChip"), TVX_CRIT);
}

TEST_F(Build_Steps, AccessPointThatIsOfferedAlreadyIsNoFailure) {
  Host_Build hostBuild = host();
  Ref<TVXHBA_RemoteServiceAccessPoint> page = makeInstance<TVXHBA_RemoteServiceAccessPoint>();
  page->Name.set("https://somewhere");
  hostBuild.accessPoint = page.get();
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  Port_Build portBuild = portOf(adapterBuild);
  EXPECT_EQ(offerAccessPoint(portBuild), 0);
  EXPECT_EQ(offerAccessPoint(portBuild), 0);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_SAPAvailableForElement_map"), TVX_CRIT);
}

TEST_F(Build_Steps, InstallationServiceNeedsItsCapabilities) {
  Host_Build hostBuild = host();
  agent->m_TVXHBA_SoftwareInstallationService_map.clear();
  EXPECT_EQ(StartSoftwareInstallationService(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_SoftwareInstallationServiceCapabilities_map"),
            TVX_CRIT);
}

TEST_F(Build_Steps, ProductDataThatAreTiedAlreadyStopNothing) {
  Host_Build hostBuild = host();
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  Port_Build portBuild = portOf(adapterBuild);
  portBuild.pciDevice = agent->m_TVXHBA_PCIDevice_map[0];
  agent->m_TVXHBA_VitalProductData_map.clear();
  EXPECT_EQ(buildVitalProductData(portBuild), 0);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ElementVPD_map"), TVX_CRIT);
}

TEST_F(Build_Steps, PortOfAnInvalidNameHasNoPCIDevice) {
  port->m_Name = "not a name";
  EXPECT_EQ(again(CreatePCIDeviceInstance), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("INVALID WWN"), TVX_ERR);
  EXPECT_EQ(log.level("CreatePCIDeviceInstance failed"), TVX_CRIT);
}

TEST_F(Build_Steps, RecordLogNeedsItsCapabilities) {
  agent->m_TVXHBA_RecordLog_map.clear();
  agent->m_TVXHBA_RecordLogConformsToProfile_map.clear();
  Host_Build hostBuild = host();
  EXPECT_EQ(buildRecordLog(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_TVXHBA_EnabledRecordLogCapabilities_map"),
            TVX_CRIT);
}

TEST_F(Build_Steps, ChipThatCannotBeTiedToItsCardEndsTheBuild) {
  Host_Build hostBuild = host();
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  Port_Build portBuild = portOf(adapterBuild);
  portBuild.chip = nullptr;
  agent->m_TVXHBA_Chip_map.clear();
  EXPECT_EQ(CreateChipInstances(portBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : TVXHBA_Container"), TVX_CRIT);
}

TEST_F(Build_Steps, SecondPortOfANewCardRepeatsItsAssociationsAsExpectedNoise) {
  Host_Build hostBuild = host();
  hostBuild.providerIdentity = agent->m_TVXHBA_SoftwareIdentity_map[0];
  Adapter_Build adapterBuild = adapterOf(hostBuild);
  adapterBuild.cardIsNew = true;
  Port_Build portBuild = portOf(adapterBuild);
  EXPECT_EQ(associateNewCard(portBuild), 0);
  for (const char* text : {"Insert Failed : m_TVXHBA_ProductPhysicalComponent_map",
                           "Insert Failed (CNA): m_TVXHBA_ProviderElementSoftwareIdentity_map",
                           "Insert Failed : m_TVXHBA_CardConformsToProfile_map",
                           "Insert Failed:TVXHBA_ChassisContainsCard"})
    EXPECT_EQ(log.level(text), TVX_CRIT) << text;
}

TEST_F(Build_Steps, SystemAndChassisThatStandAlreadyAreRefused) {
  Host_Build hostBuild{*agent};
  EXPECT_EQ(buildComputerSystem(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ComputerSystem_map"), TVX_CRIT);
  EXPECT_EQ(log.level("Could not create the Computer System Instance"), TVX_CRIT);
  EXPECT_EQ(buildOwnChassis(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_CIM_Chassis_map"), TVX_CRIT);
  EXPECT_EQ(log.level("Could not create the Chassis Instance"), TVX_CRIT);
}

TEST_F(Build_Steps, RecordLogThatStandsAlreadyEndsTheBuild) {
  Host_Build hostBuild = host();
  EXPECT_EQ(buildRecordLog(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_TVXHBA_RecordLog_map"), TVX_CRIT);
}

TEST_F(Build_Steps, RecordLogNeedsTheProfileRegistration) {
  agent->m_TVXHBA_RecordLog_map.clear();
  agent->m_TVXHBA_RegisteredProfile_map.clear();
  Host_Build hostBuild = host();
  EXPECT_EQ(buildRecordLog(hostBuild), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Missing Profile Registration Profile instance"), TVX_CRIT);
}

TEST_F(Build_Steps, AssociationWithoutAnEndIsNotMadeAndNotReported) {
  log.clear();
  EXPECT_EQ(associate(agent->m_TVXHBA_Realizes_map, nullptr, agent->m_TVXHBA_PortController_map[0],
                      "must not be logged"),
            nullptr);
  EXPECT_TRUE(log.all().empty());
}

TEST_F(Build_Steps, SearchesGoFromEitherEnd) {
  auto& map = agent->m_TVXHBA_PhysicalConnector_map;
  EXPECT_EQ(findByText(map, &TVXHBA_PhysicalConnector::SerialNumber, "TX52100417"), map[0]);
  EXPECT_EQ(findLastByText(map, &TVXHBA_PhysicalConnector::SerialNumber, "TX52100417"), map[1]);
  EXPECT_EQ(findByText(map, &TVXHBA_PhysicalConnector::SerialNumber, "none"), nullptr);
  EXPECT_EQ(findLastByText(map, &TVXHBA_PhysicalConnector::SerialNumber, "none"), nullptr);
}

}  // namespace
}  // namespace cimrt::test
