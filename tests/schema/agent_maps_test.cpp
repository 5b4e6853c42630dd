// The agent's maps: one for each class that has one, in a fixed order.
#include "generated/Agent_Maps.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>

namespace cimrt::test {
namespace {

TEST(AgentMaps, ServeTheirOwnClass) {
  Agent_Maps maps;
  EXPECT_STREQ(maps.m_CIM_ComputerSystem_map.meta_class()->name, "CIM_ComputerSystem");
  EXPECT_STREQ(maps.m_TVXHBA_FCPort_map.meta_class()->name, "TVXHBA_FCPort");
  EXPECT_STREQ(maps.m_TVXHBA_RecordLog_driver_map.meta_class()->name, "TVXHBA_RecordLog");
  EXPECT_NE(static_cast<void*>(&maps.m_TVXHBA_RecordLog_driver_map),
            static_cast<void*>(&maps.m_TVXHBA_RecordLog_map));
}

TEST(AgentMaps, AreDeclaredFromTheHostToTheDiagnostics) {
  Agent_Maps maps;
  const auto address = [](const auto& map) { return reinterpret_cast<std::uintptr_t>(&map); };
  const std::uintptr_t in_order[] = {address(maps.m_CIM_ComputerSystem_map),
                                     address(maps.m_CIM_Chassis_map),
                                     address(maps.m_TVXHBA_ComputerSystemConformsToProfile_map),
                                     address(maps.m_TVXHBA_FCPort_map),
                                     address(maps.m_TVXHBA_SCSIProtocolEndpoint_map),
                                     address(maps.m_TVXHBA_RecordLogConformsToProfile_map),
                                     address(maps.m_TVXHBA_RecordLog_driver_map),
                                     address(maps.m_TVXHBA_EnabledRecordLogCapabilities_driver_map),
                                     address(maps.m_TVXHBA_ProviderUseOfLog_driver_map),
                                     address(maps.m_TVXHBA_FCDriverLogEntry_map),
                                     address(maps.m_TVXHBA_SoftwareInstallationService_map),
                                     address(maps.m_TVXHBA_FCHBAWWNServiceAffectsFCPort_map),
                                     address(maps.m_TVXHBA_FCHBADiagnosticTest_map),
                                     address(maps.m_TVXHBA_JobElementSettingData_map)};
  EXPECT_TRUE(std::ranges::is_sorted(in_order));
  EXPECT_EQ(in_order[0], reinterpret_cast<std::uintptr_t>(&maps));
  EXPECT_EQ(address(maps.m_TVXHBA_JobElementSettingData_map) + sizeof(Instance_Map_Base),
            reinterpret_cast<std::uintptr_t>(&maps) + sizeof(maps));
}

TEST(AgentMaps, AreOneHundredAndFiftyTwo) {
  EXPECT_EQ(sizeof(Agent_Maps), 152 * sizeof(Instance_Map_Base));
}

}  // namespace
}  // namespace cimrt::test
