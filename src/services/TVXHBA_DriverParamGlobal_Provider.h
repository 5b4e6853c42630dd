// Provider of the parameters that the driver has as a whole.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_DriverParamGlobal_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_DriverParamGlobal* model,
                              const Instance_Handler& handler);
};

}  // namespace cimrt
