// Virtual ports and their pools.
#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "../logs/Failing_New.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/TVX_Memory.h"
#include "services/TVX_PortVirtualization.h"

namespace cimrt::test {
namespace {

constexpr const char* PORT = "1000000000000001";

class Port_Virtualization : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& vports) {
    return builtAgent(R"({"cards": [{"ports": [
        {"wwpn": "10:00:00:00:00:00:00:01", "wwnn": "20:00:00:00:00:00:00:01", "vports": )" +
                      vports + R"(},
        {"wwpn": "10:00:00:00:00:00:00:02", "wwnn": "20:00:00:00:00:00:00:02"}]}]})");
  }

  static constexpr const char* TWO =
      R"([{"wwpn": "20:AB:00:00:00:00:00:01", "wwnn": "20:00:00:00:00:00:00:0A", "fc_id": 66305,
           "name": "guest-one"},
          {"wwpn": "20:AB:00:00:00:00:00:02", "wwnn": "20:00:00:00:00:00:00:0B", "fc_id": 66306,
           "name": "guest-two"}])";
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 1}};
};

TEST_F(Port_Virtualization, PoolOfAPhysicalPort) {
  ProviderAgent& agent = build(TWO);
  ASSERT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 1u);
  const TVXHBA_ResourcePool& pool = *agent.m_TVXHBA_ResourcePool_map[0];
  for (const auto* text : {&pool.InstanceID, &pool.ElementName, &pool.PoolID})
    EXPECT_EQ(textOf(*text), "TVX:Resource Pool:1000000000000001");
  EXPECT_EQ(numberOf(pool.Primordial), 0);
  EXPECT_EQ(numberOf(pool.Capacity), 2);
  EXPECT_EQ(numberOf(pool.ResourceType), 10);
  EXPECT_TRUE(pool.__name_space == "root/torvex");
  ASSERT_EQ(agent.m_TVXHBA_HostedResourcePool_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_HostedResourcePool_map[0],
                         agent.m_CIM_ComputerSystem_map[0], &pool));
}

TEST_F(Port_Virtualization, VirtualPortsWithTheirAssociations) {
  ProviderAgent& agent = build(TWO);
  ASSERT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 2u);
  const TVXHBA_VirtualFCPort& port = *agent.m_TVXHBA_VirtualFCPort_map[1];
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  EXPECT_EQ(textOf(port.SystemCreationClassName), textOf(system.CreationClassName));
  EXPECT_EQ(textOf(port.SystemName), textOf(system.Name));
  EXPECT_EQ(textOf(port.CreationClassName), "TVX_VirtualFCPort");
  EXPECT_EQ(textOf(port.Name), "20AB000000000002");
  EXPECT_EQ(textOf(port.DeviceID), "20AB000000000002");
  EXPECT_EQ(textOf(port.NodeWWN), "200000000000000B");
  EXPECT_EQ(numberOf(port.PortFCId), 66306);
  EXPECT_EQ(textOf(port.VPortName), "guest-two");
  ASSERT_EQ(agent.m_TVXHBA_VPortHostedDependency_map.size(), 2u);
  EXPECT_TRUE(
      tiesClones(agent.m_TVXHBA_VPortHostedDependency_map[1], agent.m_TVXHBA_FCPort_map[0], &port));
  ASSERT_EQ(agent.m_TVXHBA_ElementAllocatedFromPool_map.size(), 2u);
  EXPECT_TRUE(tiesClones(agent.m_TVXHBA_ElementAllocatedFromPool_map[1],
                         agent.m_TVXHBA_ResourcePool_map[0], &port));
}

TEST_F(Port_Virtualization, StepsAreLogged) {
  build(TWO);
  const std::vector<std::string> texts = {
      "TVX_PortVirtualization::CreatePortVirtualizationClasses",
      "No of FC Ports: 2",
      "FC Port ID: 1000000000000001",
      "No of vports:2 for 1000000000000001",
      "Creating Resource pool ",
      "Resource Pool created and inserted in map",
      "Creating HostedResource pool ",
      "HostedResource Pool created and inserted in map",
      "VPort Id :20AB000000000001 Node name: 200000000000000A",
      "VPort details",
      "VPort Name guest-one ",
      "Exit the ListVPortattributes method",
      "VPort Id :20AB000000000002 Node name: 200000000000000B",
      "VPort Name guest-two ",
      "Freeing VPList",
      "FC Port ID: 1000000000000002",
      "Need not create any resource pools since no vports exist for FCport: 1000000000000002",
  };
  std::vector<std::string> wanted = texts;
  // These come once for each virtual port.
  wanted.insert(wanted.begin() + 13, "VPort details");
  wanted.insert(wanted.begin() + 15, "Exit the ListVPortattributes method");
  EXPECT_EQ(log.only(texts), wanted);
  EXPECT_EQ(log.count("Created VirtualFCPort and inserted in map"), 2u);
  EXPECT_EQ(log.count("VPortHostedDependency created and inserted in map"), 2u);
  EXPECT_EQ(log.count("ElementAllocatedFromPool created and inserted in map"), 2u);
  EXPECT_EQ(log.count("Exit the ListVPorts method"), 2u);
}

TEST_F(Port_Virtualization, PortWithoutVirtualPortsHasNoPool) {
  ProviderAgent& agent = build("[]");
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 0u);
}

TEST_F(Port_Virtualization, WithoutAPhysicalPortTheMapsStay) {
  ProviderAgent& agent = startAgent();
  auto pool = makeInstance<TVXHBA_ResourcePool>();
  pool->InstanceID.set("kept");
  insertInto(agent.m_TVXHBA_ResourcePool_map, std::move(pool), "x");
  EXPECT_EQ(TVX_PortVirtualization::CreatePortVirtualizationClasses(agent), 0);
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 1u);
  EXPECT_EQ(log.level("Unable to create the Port Virtualization classes, No Physical Port(FCoE) "
                      "exists"),
            TVX_ERR);
  EXPECT_EQ(log.count("ClearPortVirtualizationMaps for FC invoked"), 0u);
}

TEST_F(Port_Virtualization, UnreadableListLeavesThatPortOut) {
  useScenario(R"({"cards": [{"ports": [
      {"wwpn": "10:00:00:00:00:00:00:01", "vports": [{}]},
      {"wwpn": "10:00:00:00:00:00:00:02", "vports": [{}]}]}],
      "faults": [{"call": "LRM_VPList", "port": "10:00:00:00:00:00:00:01", "status": 9}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(log.level("TVXUCNA_PortVirtualization::Failure in listing vports for port: "
                      "1000000000000001, Rm Error: 1"),
            TVX_ERR);
  EXPECT_EQ(log.count("Unable to list virtual ports!!"), 1u);
  ASSERT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_ResourcePool_map[0]->PoolID),
            "TVX:Resource Pool:1000000000000002");
}

TEST_F(Port_Virtualization, HostThatCannotListThemSaysSo) {
  ProviderAgent& agent = build("[{}]");
  addFault(R"({"call": "LRM_VPList", "status": 128})");
  log.clear();
  TVX_Block list;
  EXPECT_EQ(TVX_MethodWrapper::ListVPorts(&wwpn, &list), RM_ERROR);
  EXPECT_FALSE(list);
  EXPECT_EQ(log.count("FABCMD does not support listing virtual ports on this host."), 1u);
  EXPECT_EQ(log.count("Unable to list virtual ports!!"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 1u);
}

TEST_F(Port_Virtualization, VirtualPortWithoutAttributesHasNoName) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01", "vports": [{}]}]}],
      "faults": [{"call": "LRM_VPGetAttributes", "status": 9}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 1u);
  EXPECT_TRUE(agent.m_TVXHBA_VirtualFCPort_map[0]->VPortName.is_null());
  EXPECT_EQ(log.count("TVXUCNA_PortVirtualization::Failure in listing vports information for port: "
                      "1000000000000001, Rm Error: 1"),
            1u);
  EXPECT_EQ(agent.m_TVXHBA_VPortHostedDependency_map.size(), 1u);
}

TEST_F(Port_Virtualization, NameThatFillsItsFieldIsCut) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10:00:00:00:00:00:00:01",
      "vports": [{"name": "v"}]}]}],
      "faults": [{"call": "LRM_VPGetAttributes", "unterminated_texts": true}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map[0]->VPortName.value.size(), 256u);
}

TEST_F(Port_Virtualization, ListThatGrowsBetweenTheCallsIsCutToItsRoom) {
  ProviderAgent& agent = build(TWO);
  addFault(R"({"call": "LRM_VPList", "returned_size": 4000000000})");
  TVX_Block list;
  RM_STATUS status = RM_OK;
  {
    // The first answer asks for more room than there is memory: the list is given up.
    tvxSetAllocator([](std::size_t size) -> void* {
      return size > 1'000'000 ? nullptr : std::calloc(1, size);
    });
    status = TVX_MethodWrapper::ListVPorts(&wwpn, &list);
  }
  EXPECT_EQ(status, RM_ERROR);
  EXPECT_EQ(log.level("FABCMD_ListVPorts: Unable to allocate buffer"), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 2u);
}

TEST_F(Port_Virtualization, CountBeyondTheRoomIsNotBelieved) {
  build(R"([{}])");
  addFault(R"({"call": "LRM_VPList", "returned_size": 5000})");
  TVX_Block list;
  EXPECT_EQ(TVX_MethodWrapper::ListVPorts(&wwpn, &list), RM_OK);
  ASSERT_TRUE(list);
  EXPECT_EQ(reinterpret_cast<const RM_VPortList*>(list.get())->count, 1u);
}

TEST_F(Port_Virtualization, WrapperRefusesNullAndForeignPorts) {
  build("[]");
  log.clear();
  EXPECT_EQ(TVX_MethodWrapper::ListVPorts(&wwpn, nullptr), RM_ERROR_INVALID_POINTER);
  EXPECT_EQ(log.count("Invalid input pointer"), 1u);
  EXPECT_EQ(TVX_MethodWrapper::ListVPortAttributes(&wwpn, wwpn, nullptr), RM_ERROR_INVALID_POINTER);
  EXPECT_EQ(log.count("Invalid input vp attributes pointer"), 1u);
  const HBA_WWN foreign{{0x50, 1, 2, 3, 4, 5, 6, 7}};
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::ListVPorts(&foreign, &block), RM_ERROR);
  EXPECT_EQ(TVX_MethodWrapper::ListVPortAttributes(&foreign, wwpn, &block), RM_ERROR);
  EXPECT_FALSE(block);
  EXPECT_EQ(log.count("HBA IS NOT LOCAL"), 2u);
}

TEST_F(Port_Virtualization, NoMemoryForTheBuffers) {
  build("[]");
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::ListVPorts(&wwpn, &block), RM_ERROR);
  EXPECT_EQ(TVX_MethodWrapper::ListVPortAttributes(&wwpn, wwpn, &block), RM_ERROR);
  EXPECT_EQ(log.level("FABCMD_ListVPorts: Unable to allocate buffer"), TVX_ERR);
  EXPECT_EQ(log.level("FABCMD_ListVPortAttributes: Unable to allocate buffer"), TVX_ERR);
}

TEST_F(Port_Virtualization, RefusedInsertStopsAndKeepsWhatIsThere) {
  useScenario(R"({"cards": [{"ports": [
      {"wwpn": "10:00:00:00:00:00:00:01",
       "vports": [{"wwpn": "20:AB:00:00:00:00:00:01"}, {"wwpn": "20:AB:00:00:00:00:00:02"}]},
      {"wwpn": "10:00:00:00:00:00:00:02", "vports": [{"wwpn": "20:AB:00:00:00:00:00:02"},
       {"wwpn": "20:AB:00:00:00:00:00:03"}]}]}]})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_VirtualFCPort_map"), TVX_CRIT);
  EXPECT_EQ(log.level("CreatePortVirtualizationClasses failed: 32769"), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 2u);
  EXPECT_EQ(log.count("PERF: updateAdapterMaps: cleanExit"), 1u);
}

TEST_F(Port_Virtualization, ALackOfMemoryIsToldForEachClass) {
  ProviderAgent& agent = build(TWO);
  Ranked_Lock data(agent.m_DataMutex);
  const struct {
    std::size_t size;
    const char* text;
    int level;
  } rows[] = {
      {TVXHBA_ResourcePool::static_meta_class.size, "Failed to create ResourcePool", TVX_ERR},
      {TVXHBA_HostedResourcePool::static_meta_class.size, "Failed to create HostedResourcePool",
       TVX_CRIT},
      {TVXHBA_VirtualFCPort::static_meta_class.size, "Failed to create VirtualFCPort", TVX_CRIT},
      {TVXHBA_VPortHostedDependency::static_meta_class.size,
       "Failed to create VPortHostedDependency", TVX_CRIT},
      {TVXHBA_ElementAllocatedFromPool::static_meta_class.size,
       "Failed to create ElementAllocatedFromPool", TVX_CRIT},
  };
  for (const auto& row : rows) {
    // Associations of one size differ by the order in which they are made.
    for (int spare = 0; spare < 8 && log.level(row.text) == -1; spare++) {
      const Failing_New failing(row.size, spare);
      EXPECT_EQ(TVX_PortVirtualization::CreatePortVirtualizationClasses(agent), VPORT_NO_INSTANCE);
    }
    EXPECT_EQ(log.level(row.text), row.level) << row.text;
  }
}

TEST_F(Port_Virtualization, AttributesAreReadBeforeThePortIsMade) {
  ProviderAgent& agent = build(TWO);
  Ranked_Lock data(agent.m_DataMutex);
  log.clear();
  constexpr const char* REFUSED = "Failed to create VirtualFCPort";
  {
    const Failing_New failing(TVXHBA_VirtualFCPort::static_meta_class.size);
    EXPECT_EQ(TVX_PortVirtualization::CreatePortVirtualizationClasses(agent), VPORT_NO_INSTANCE);
  }
  const std::vector<std::string> steps = {"VPort Name guest-one ", REFUSED};
  EXPECT_EQ(log.only(steps), steps);
}

TEST_F(Port_Virtualization, PortsOfOneNameAreRefusedTheSecondPool) {
  ProviderAgent& agent = build(TWO);
  Ranked_Lock data(agent.m_DataMutex);
  auto& ports = agent.m_TVXHBA_FCPort_map;
  Ref<TVXHBA_FCPort> twin(clone(ports[0]));
  twin->SystemName.set("another system");
  ASSERT_NE(ports.insert(twin.get()), Instance_Map_Base::npos);
  twin.release();
  EXPECT_EQ(TVX_PortVirtualization::CreatePortVirtualizationClasses(agent), VPORT_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ResourcePool_map"), TVX_CRIT);
}

TEST_F(Port_Virtualization, PortWithAnOddDeviceIdStops) {
  ProviderAgent& agent = build("[]");
  agent.m_TVXHBA_FCPort_map[0]->DeviceID.set("not a name at all");
  EXPECT_EQ(TVX_PortVirtualization::CreatePortVirtualizationClasses(agent), 32769);
  EXPECT_EQ(log.level("TVXUCNA_PortVirtualization::CreatePortVirtualizationClasses::str2HBAName "
                      "failed"),
            TVX_ERR);
}

TEST_F(Port_Virtualization, ClearingEmptiesTheSixMaps) {
  ProviderAgent& agent = build(TWO);
  log.clear();
  EXPECT_EQ(ClearPortVirtualizationMaps(agent), 0);
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_ElementAllocatedFromPool_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_HostedResourcePool_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_VPortHostedDependency_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_VMSystemDevice_map.size(), 0u);
  const std::vector<std::string> texts = {"ClearPortVirtualizationMaps for FC invoked",
                                          "Exiting ClearPortVirtualizationMaps "};
  EXPECT_EQ(log.only(texts), texts);
}

TEST_F(Port_Virtualization, RefreshReplacesTheInstances) {
  ProviderAgent& agent = build(TWO);
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_ResourcePool_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_VirtualFCPort_map.size(), 2u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_ResourcePool_map[0]->PoolID),
            std::string("TVX:Resource Pool:") + PORT);
}

}  // namespace
}  // namespace cimrt::test
