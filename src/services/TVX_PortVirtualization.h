// Virtual ports of the physical FC ports, as instances.
#pragma once

#include <cstdint>

#include "agent/MapBuild.h"

namespace cimrt {

/// Results of the operation below, beside 0.
inline constexpr std::int32_t VPORT_FAILED = 32769;
inline constexpr std::int32_t VPORT_NO_INSTANCE = 32774;

class TVX_PortVirtualization {
 public:
  /// Empties the maps of the virtual ports and refills them: for each physical port with virtual
  /// ports one pool, and one instance for each of them. A port whose list can't be read has none.
  /// 0, or a result above with the maps as far as they got. Without any physical port it does
  /// nothing. On the refresh thread, with the agent's map and data locks held.
  static std::int32_t CreatePortVirtualizationClasses(ProviderAgent& agent);
};

}  // namespace cimrt
