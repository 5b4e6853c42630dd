// The pass over the remote ports behind every port, after the logical units are built: which chip
// of which adapter stands in front of each of them, and which units have optimized access.
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "agent/SanBuild.h"

namespace cimrt {

namespace {

constexpr std::size_t WWPN_SIZE = 16;
constexpr const char* CHIP_NAME = "SerialNumber + Sub-AdapterID";

/// The port of that name. Where none has it, the last one there is, or null.
TVXHBA_FCPort* findPort(ProviderAgent& agent, const std::string& portWWPN) {
  auto& map = agent.m_TVXHBA_FCPort_map;
  if (TVXHBA_FCPort* port = findByText(map, &TVXHBA_FCPort::DeviceID, portWWPN)) {
    TVX_LOG(TVX_DBG, "Found the FCPort Instance: %s", port->DeviceID.value.c_str());
    return port;
  }
  return map.size() > 0 ? map[map.size() - 1] : nullptr;
}

/// The name of the port's chip among its identifying information; empty if it is not there.
std::string chipTagOf(const TVXHBA_FCPort& port) {
  const Array<String>& names = port.IdentifyingDescriptions.value;
  const Array<String>& values = port.OtherIdentifyingInfo.value;
  for (std::size_t i = 0; i < names.size() && i < values.size(); i++) {
    if (!names[i].equal(CHIP_NAME)) continue;
    TVX_LOG(TVX_DBG, "SerialNumber + Sub-AdapterID: %s", values[i].c_str());
    return values[i].c_str();
  }
  return {};
}

/// The chip of that tag, or null; a port that names no chip has none.
TVXHBA_Chip* findChip(ProviderAgent& agent, const std::string& tag) {
  if (tag.empty()) return nullptr;
  auto& map = agent.m_TVXHBA_Chip_map;
  for (std::size_t i = 0; i < map.size(); i++) {
    TVX_LOG(TVX_DBG, "Chip Tag: %s", map[i]->Tag.value.c_str());
    if (map[i]->Tag.value.equal(tag.c_str())) return map[i];
  }
  return nullptr;
}

}  // namespace

Port_Target findPortTarget(ProviderAgent& agent, const std::string& entry) {
  TVX_LOG(TVX_DBG, "Set content: %s", entry.c_str());
  Port_Target found;
  found.port = entry.substr(0, WWPN_SIZE);
  found.target = entry.size() > WWPN_SIZE ? entry.substr(WWPN_SIZE + 1) : std::string();
  if (const TVXHBA_FCPort* port = findPort(agent, found.port))
    found.chip = findChip(agent, chipTagOf(*port));
  return found;
}

std::int32_t visitPortTargets(San_Build& build) {
  if (build.portTargets.empty()) TVX_LOG(TVX_WARN, "No entries in the set");
  for (const std::string& entry : build.portTargets) {
    const Port_Target found = findPortTarget(build.agent, entry);
    readOptimizedAccess(build.agent, found.port, found.target, found.chip);
  }
  build.portTargets.clear();
  return 0;
}

}  // namespace cimrt
