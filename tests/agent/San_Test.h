// What the tests of the SAN maps share: a host with logical units, and its maps.
#pragma once

#include <string>
#include <vector>

#include "Map_Test.h"

namespace cimrt::test {

inline constexpr const char* SAN_PORT = "10000254560C3001";
inline constexpr const char* SAN_TARGET = "500C0FF12A001001";

/// A host of one port with one remote port, behind which `luns` (JSON) lie.
inline std::string unitsBehindOnePort(const std::string& luns) {
  return R"({"cards": [{"model": "TVX16001", "serial_number": "TX52100099", "ports": [
    {"wwpn": "10000254560C3001", "wwnn": "20000254560C3001", "targets": [
      {"wwpn": "500C0FF12A001001", "wwnn": "500C0FF12A0010FF", "fc_id": "0x010203", "luns": )" +
         luns + "}]}]}]}";
}

/// One unit of each class of devices.
inline constexpr const char* UNIT_OF_EACH_CLASS = R"([{"first": 0, "type": 0},
  {"first": 1, "type": 1}, {"first": 2, "type": 2}, {"first": 3, "type": 12},
  {"first": 4, "type": 17}])";

class San_Maps : public Adapter_Maps {
 protected:
  /// The agent with the SAN maps of a host of one port; again, for another host.
  ProviderAgent& buildUnits(const std::string& luns) { return buildHost(unitsBehindOnePort(luns)); }
  /// The same of any host.
  ProviderAgent& buildHost(const std::string& scenario) {
    useScenario(scenario);
    if (!m_pAgent) m_pAgent = &startAgent();
    refresh(*m_pAgent);
    return *m_pAgent;
  }
  /// Sizes of all SAN maps: both of the endpoints, then device, system device and path of volumes,
  /// tapes, extents, arbitrary units and disks.
  static std::vector<std::size_t> sizesOf(const ProviderAgent& agent) {
    return {agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(),
            agent.m_TVXHBA_LocalHostedAccessPoint_map.size(),
            agent.m_TVXHBA_StorageVolume_map.size(),
            agent.m_TVXHBA_StorageVolumeSystemDevice_map.size(),
            agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map.size(),
            agent.m_TVXHBA_TapeDrive_map.size(),
            agent.m_TVXHBA_TapeDriveSystemDevice_map.size(),
            agent.m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map.size(),
            agent.m_TVXHBA_StorageExtent_map.size(),
            agent.m_TVXHBA_StorageExtentSystemDevice_map.size(),
            agent.m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map.size(),
            agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map.size(),
            agent.m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map.size(),
            agent.m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map.size(),
            agent.m_TVXHBA_LogicalDisk_map.size(),
            agent.m_TVXHBA_LogicalDiskSystemDevice_map.size(),
            agent.m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map.size()};
  }
  /// Refills the SAN maps alone, from the device tree as it is.
  static std::int32_t rebuildSAN(ProviderAgent& agent) {
    Ranked_Lock sanReady(agent.m_SANMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    return agent.updateSANMaps();
  }

 private:
  ProviderAgent* m_pAgent = nullptr;
};

/// Text of a LUN below 256.
inline std::string smallLun(unsigned lun) {
  constexpr const char* digits = "0123456789ABCDEF";
  return std::string("00") + digits[lun >> 4] + digits[lun & 15] + std::string(12, '0');
}

}  // namespace cimrt::test
