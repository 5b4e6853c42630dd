// Provider of the ports' driver parameters, among which marked units of optimized access stand.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_DriverParams_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_DriverParams* model, const Instance_Handler& handler);
  /// Marks the unit that the `InstanceID` names for optimized access, in the driver or in the
  /// stored configuration. Nothing else of the instance counts.
  std::int32_t create_instance(const TVXHBA_DriverParams* instance);
  /// Takes the mark away. A parameter that is no such unit can't be deleted.
  std::int32_t delete_instance(const TVXHBA_DriverParams* instance);
};

}  // namespace cimrt
