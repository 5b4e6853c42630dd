// Making instances where a lack of memory has a message of its own.
#pragma once

#include "agent/Map_Insert.h"

namespace cimrt {

/// What `make()` makes; null, with `failure` logged at `TVX_CRIT`, when it made nothing or memory
/// ran out on the way.
template <class Make>
auto tryMake(const char* failure, Make make) -> decltype(make()) {
  auto made = madeOrNull(make);
  if (!made) TVX_LOG(TVX_CRIT, "%s", failure);
  return made;
}

}  // namespace cimrt
