// What the builders of the maps say when memory runs out.
#include <chrono>
#include <new>
#include <thread>

#include "../logs/Failing_New.h"
#include "No_Threads.h"
#include "San_Test.h"
#include "agent/Associations.h"
#include "agent/MapSteps.h"
#include "agent/ProductSteps.h"

namespace cimrt::test {
namespace {

class No_Memory : public San_Maps {
 protected:
  /// Builds the PCI device of the first port again, short of blocks of that size but for
  /// `spare` of them.
  std::int32_t buildDevice(ProviderAgent& agent, std::size_t size, int spare) {
    auto& adapter = dynamic_cast<FCAdapter&>(*agent.m_pData->m_Adapters[0]);
    auto& port = dynamic_cast<FCPort&>(*adapter.getPort(0));
    Host_Build host{agent};
    host.system = agent.m_CIM_ComputerSystem_map[0];
    Adapter_Build adapterBuild{host, adapter,
                               dynamic_cast<const FCAdapterAttributes&>(*adapter.getAttributes())};
    Port_Build build{adapterBuild, port,
                     dynamic_cast<const FCPortAttributes&>(*port.getAttributes())};
    agent.m_TVXHBA_PCIDevice_map.clear();
    agent.m_TVXHBA_PCIElementConformsToProfile_map.clear();
    agent.m_TVXHBA_SystemDevice_map.clear();
    const Failing_New failing(size, spare);
    return CreatePCIDeviceInstance(build);
  }
};

TEST_F(No_Memory, PortWithoutItsConformanceHasNoPCIView) {
  ProviderAgent& agent = build();
  EXPECT_EQ(buildDevice(agent, TVXHBA_PCIElementConformsToProfile::static_meta_class.size, 0),
            MAP_BUILD_LEAVE_PORT);
  EXPECT_EQ(log.level("Failed to create TVXHBA_PCIElementConformsToProfile"), TVX_CRIT);
}

TEST_F(No_Memory, DeviceWithoutItsPlaceEndsTheBuild) {
  ProviderAgent& agent = build();
  // The conformance before it has the same size.
  const std::size_t size = TVXHBA_SystemDevice::static_meta_class.size;
  const int spare = size == TVXHBA_PCIElementConformsToProfile::static_meta_class.size ? 1 : 0;
  EXPECT_EQ(buildDevice(agent, size, spare), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Failed to create TVXHBA_SystemDevice"), TVX_CRIT);
  EXPECT_EQ(log.level("CreatePCIDeviceInstance failed"), TVX_CRIT);
}

TEST_F(No_Memory, EveryKindOfAssociationTellsThatItCouldNotBeMade) {
  ProviderAgent& agent = build();
  const Instance* end = agent.m_CIM_ComputerSystem_map[0];
  for (std::size_t i = 0; i < static_cast<std::size_t>(Association_Kind::COUNT); i++) {
    const Association_Rule& rule = associationRule(static_cast<Association_Kind>(i));
    log.clear();
    {
      const Failing_New failing(rule.map(agent).meta_class()->size);
      EXPECT_EQ(createAssociation(agent, rule.kind, "", end, end), nullptr) << rule.className;
    }
    EXPECT_EQ(log.level(rule.creationFailure), TVX_CRIT) << rule.className;
  }
}

TEST_F(No_Memory, UnitThatCannotBeMadeEndsTheSANBuildWithWhatThereIs) {
  ProviderAgent& agent = buildUnits(R"({"count": 3})");
  std::int32_t result = 0;
  {
    // The first unit takes two: its own instance, and the end that its associations share.
    const Failing_New failing(TVXHBA_StorageVolume::static_meta_class.size, 2);
    result = rebuildSAN(agent);
  }
  EXPECT_EQ(result, 0x8001);
  EXPECT_EQ(log.level("Error updating SAN maps"), TVX_ERR);
  const std::vector<std::size_t> sizes = sizesOf(agent);
  EXPECT_EQ(std::vector(sizes.begin(), sizes.begin() + 5),
            (std::vector<std::size_t>{2, 2, 1, 1, 1}));
}

TEST_F(No_Memory, ReadersGetNothingAndLeaveTheLocksFree) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  Delivered delivered;
  {
    // The second copy cannot be made.
    const Failing_New failing(TVXHBA_FCPort::static_meta_class.size, 1);
    agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  }
  EXPECT_EQ(log.level("Exception in CIM Provider Enumeration - do nothing"), TVX_CRIT);
  {
    const Failing_New failing(TVXHBA_FCPort::static_meta_class.size, 1);
    agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(),
                              [](ProviderAgent&) {});
  }
  EXPECT_EQ(log.level("Exception in Active CIM Provider Enumeration - do nothing"), TVX_CRIT);
  {
    const Failing_New failing(TVXHBA_FCPort::static_meta_class.size, 1);
    agent.enumSANInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  }
  EXPECT_EQ(log.level("Exception in SAN CIM Provider Enumeration - do nothing"), TVX_CRIT);
  EXPECT_EQ(delivered.size(), 0u);
  for (Ranked_Mutex* mutex : {&agent.m_AdapterDataReadyMutex, &agent.m_AdapterMapsReadyMutex,
                              &agent.m_SANMapsReadyMutex, &agent.m_DataMutex})
    EXPECT_TRUE(isFree(*mutex));
}

TEST_F(No_Memory, DiagnosticsThatCannotBeMadeDoNotEndTheBuild) {
  ProviderAgent& agent = build();
  Host_Build host{agent};
  host.system = agent.m_CIM_ComputerSystem_map[0];
  // Instances that cannot be made have texts of their own; the texts within them have none.
  for (std::size_t size = 24; size <= 256; size += 8) {
    const Failing_New failing(size, 40);
    EXPECT_EQ(buildDiagnostics(host), 0);
  }
  EXPECT_EQ(log.level("Exception in FCHBA Diagnostics feature class creation"), TVX_DBG);
}

/// A refresh that is short of blocks of that size. A request without memory may fail before it.
void refreshShortOf(ProviderAgent& agent, std::size_t size, int spare) {
  const Failing_New failing(size, spare);
  agent.m_bAdapterRefreshPending = true;
  try {
    agent.BuildCimrtInfo();
  } catch (const std::bad_alloc&) {
    EXPECT_FALSE(agent.m_bThreadRunning) << "nobody may wait for a run that there is not";
  }
}

/// True once no run is under way.
bool endsSoon(ProviderAgent& agent) {
  for (int tries = 0; tries < 10'000; tries++) {
    {
      Ranked_Lock thread(agent.m_ThreadMutex);
      if (!agent.m_bThreadRunning) return true;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return false;
}

TEST_F(No_Memory, BuildsThatRunOutOfItEndAndTheNextOneIsWhole) {
  ProviderAgent& agent = build();
  for (std::size_t size = 8; size <= 400; size += 8) {
    SCOPED_TRACE(size);
    for (const int spare : {0, 20}) {
      const No_Threads none;  // memory is refused to this thread alone
      refreshShortOf(agent, size, spare);
    }
    ASSERT_FALSE(agent.m_bThreadRunning);
    ASSERT_TRUE(agent.m_bIsAdapterDataReady && agent.m_bIsAdapterMapsReady);
  }
  EXPECT_EQ(log.level("Exception in updateAdapterMaps - do nothing"), TVX_CRIT);
  EXPECT_EQ(log.level("Exception in DataFetch_Handler - do nothing"), TVX_CRIT);
  for (Ranked_Mutex* mutex : {&agent.m_AdapterDataReadyMutex, &agent.m_AdapterMapsReadyMutex,
                              &agent.m_SANMapsReadyMutex, &agent.m_DataMutex})
    EXPECT_TRUE(isFree(*mutex));
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
  awaitIdle(agent);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
}

TEST_F(No_Memory, ThreadThatCannotBeMadeLeavesTheRunToItsCaller) {
  ProviderAgent& agent = build();
  for (std::size_t size = 8; size <= 128; size += 8)
    for (const int spare : {0, 1}) {
      refreshShortOf(agent, size, spare);
      ASSERT_TRUE(endsSoon(agent));
    }
  EXPECT_EQ(log.level("DataFetch_Handler thread could not be created"), TVX_CRIT);
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
  awaitIdle(agent);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
}

}  // namespace
}  // namespace cimrt::test
