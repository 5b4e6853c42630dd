// Emptying maps that stand in a table.
#pragma once

#include "generated/Agent_Maps.h"

namespace cimrt {

/// Empties one map, named by its member pointer. The caller holds the lock of the maps.
using Clear_Map = void (*)(Agent_Maps& maps);

template <auto MEMBER>
void clearMap(Agent_Maps& maps) {
  (maps.*MEMBER).clear();
}

}  // namespace cimrt
