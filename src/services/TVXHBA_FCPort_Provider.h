// Provider of the FC ports: status as it is now, and a beacon that can be switched.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_FCPort_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_FCPort* model, const Instance_Handler& handler);
  /// Switches the beacon: `LocationIndicator` 2 is on, 3 is off. Nothing else can be changed.
  /// @param model names the properties to change by not being null
  std::int32_t modify_instance(const TVXHBA_FCPort* model, const TVXHBA_FCPort* instance);
};

}  // namespace cimrt
