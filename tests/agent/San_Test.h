// What the tests of the SAN maps share: a host with logical units, and its maps.
#pragma once

#include <string>

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

class San_Maps : public Adapter_Maps {
 protected:
  /// The agent with the SAN maps of a host of one port; again, for another host.
  ProviderAgent& buildUnits(const std::string& luns) {
    useScenario(unitsBehindOnePort(luns));
    if (!m_pAgent) m_pAgent = &startAgent();
    refresh(*m_pAgent);
    return *m_pAgent;
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
