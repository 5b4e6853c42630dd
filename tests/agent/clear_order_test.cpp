// In which order the SAN maps are emptied.
#include <numeric>
#include <vector>

#include "../logs/Failing_New.h"
#include "San_Test.h"

namespace cimrt::test {
namespace {

using Clear_Order = San_Maps;

/// The first entry of each map, which is the last to go. The maps are in their order.
std::vector<const void*> firstEntries(ProviderAgent& agent) {
  return {agent.m_TVXHBA_SCSIProtocolEndpoint_map[0],
          agent.m_TVXHBA_LogicalDisk_map[0],
          agent.m_TVXHBA_StorageVolume_map[0],
          agent.m_TVXHBA_TapeDrive_map[0],
          agent.m_TVXHBA_StorageExtent_map[0],
          agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map[0],
          agent.m_TVXHBA_LocalHostedAccessPoint_map[0],
          agent.m_TVXHBA_LogicalDiskSystemDevice_map[0],
          agent.m_TVXHBA_StorageVolumeSystemDevice_map[0],
          agent.m_TVXHBA_TapeDriveSystemDevice_map[0],
          agent.m_TVXHBA_StorageExtentSystemDevice_map[0],
          agent.m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map[0],
          agent.m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map[0],
          agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map[0],
          agent.m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map[0],
          agent.m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map[0],
          agent.m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map[0]};
}

std::vector<std::size_t> orderOfClearing(ProviderAgent& agent) {
  const Freed_Order order(firstEntries(agent));
  agent.clearSANMaps();
  return order.freed();
}

std::vector<std::size_t> allInOrder() {
  std::vector<std::size_t> places(17);
  std::iota(places.begin(), places.end(), std::size_t{0});
  return places;
}

TEST_F(Clear_Order, OneSANMapGoesAfterTheOther) {
  EXPECT_EQ(orderOfClearing(buildUnits(UNIT_OF_EACH_CLASS)), allInOrder());
}

TEST_F(Clear_Order, ManyUnitsKeepItHoweverFewThereAreOfSomeClass) {
  ProviderAgent& agent = buildUnits(
      R"([{"count": 700}, {"first": 700, "type": "tape"}, {"first": 701, "type": 2, "count": 300},
          {"first": 1001, "type": 12, "count": 2}, {"first": 1003, "type": 17}])");
  EXPECT_EQ(orderOfClearing(agent), allInOrder());
  EXPECT_EQ(sizesOf(agent), std::vector<std::size_t>(17, 0));
}

}  // namespace
}  // namespace cimrt::test
