// Reads the list of a port's virtual ports with the room that it needs.
#pragma once

#include "common/TVX_Memory.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// What the library answered.
struct TVX_VPort_List {
  TVX_Block block;  ///< null if memory ran out
  RM_STATUS status = RM_ERROR_NO_MEMORY;

  /// The list, whose count never exceeds what the block holds.
  RM_VPortList& list() const { return *reinterpret_cast<RM_VPortList*>(block.get()); }
  /// Record `i` of the list, copied out.
  RM_VPortEntry entry(std::uint32_t i) const;
};

/// Asks with room for one port, and once more with room for all if there are more.
/// @param most a longer list is not read: the status stays RM_ERROR_MORE_DATA
TVX_VPort_List readVPorts(const HBA_WWN& wwpn, std::uint32_t most);

}  // namespace cimrt
