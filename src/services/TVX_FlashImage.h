// The programs that lie in the flash memory of a port.
#pragma once

#include "access/TVX_MethodWrapper.h"
#include "agent/MapBuild.h"

namespace cimrt {

/// Makes an identity of each program and ties it to `element`. 0; or 1, with the reason logged,
/// when the name is invalid, the flash can't be read or a map refuses: what was made before stays.
/// On the refresh thread, with the agent's map and data locks held.
RM_STATUS CreateFlashImageIdentity(ProviderAgent& agent, const char* deviceID,
                                   const FCAdapterAttributes& attributes, const Instance* element);

}  // namespace cimrt
