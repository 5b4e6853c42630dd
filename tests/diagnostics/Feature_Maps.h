// The maps of the class feature, and what is told when one of them refuses an instance.
#pragma once

#include <vector>

#include "generated/Agent_Maps.h"

namespace cimrt::test {

/// A map into which each test puts an instance of its own.
struct Feature_Map {
  Instance_Map_Base& (*of)(Agent_Maps& maps);
  const char* refusal;
};

template <auto MAP>
Instance_Map_Base& mapOf(Agent_Maps& maps) {
  return maps.*MAP;
}

/// In the order in which a test fills them. The last two get an instance for each port.
inline constexpr Feature_Map FEATURE_MAPS[] = {
    {mapOf<&Agent_Maps::m_TVXHBA_FCHBADiagnosticTest_map>,
     "Insert Failed : TVXHBA_FCHBADiagnosticTest_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_HelpService_map>, "Insert Failed : TVXHBA_HelpService_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_ServiceAvailableToElement_map>,
     "Insert Failed : TVXHBA_ServiceAvailableToElement_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_DiagnosticIdentity_map>,
     "Insert Failed : TVXHBA_DiagnosticIdentity_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_DiagElementSoftwareIdentity_map>,
     "Insert Failed : TVXHBA_DiagElementSoftwareIdentity_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_FCHBADiagnosticSettingData_map>,
     "Insert Failed : TVXHBA_FCHBADiagnosticSettingData_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_DiagElementSettingData_map>,
     "Insert Failed : TVXHBA_DiagElementSettingData"},
    {mapOf<&Agent_Maps::m_TVXHBA_FCHBADiagnosticServiceCapabilities_map>,
     "Insert Failed : TVXHBA_FCHBADiagnosticServiceCapabilities_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_DiagElementCapabilities_map>,
     "Insert Failed : TVXHBA_FCHBAElementCapabilities_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_JobElementSettingData_map>,
     "Insert Failed : TVXHBA_JobElementSettingData"},
    {mapOf<&Agent_Maps::m_TVXHBA_DiagnosticsLog_map>, "Insert Failed : DiagnosticsLog_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_UseOfLog_map>, "Insert Failed : UseOfLog_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_AvailableDiagnosticService_map>,
     "Insert Failed : TVXHBA_AvailableDiagnosticService_map"},
    {mapOf<&Agent_Maps::m_TVXHBA_ServiceAffectsElement_map>,
     "Insert Failed : TVXHBA_ServiceAffectsElement_map"},
};

/// Instances in all maps of the feature: those above, the shared settings and the links.
inline std::size_t featureInstances(Agent_Maps& maps) {
  std::size_t count = maps.m_TVXHBA_JobSettingData_map.size() +
                      maps.m_TVXHBA_DiagServiceConformsToProfile_map.size() +
                      maps.m_TVXHBA_DiagHostedService_map.size() +
                      maps.m_TVXHBA_HostedService_map.size();
  for (const Feature_Map& each : FEATURE_MAPS) count += each.of(maps).size();
  return count;
}

}  // namespace cimrt::test
