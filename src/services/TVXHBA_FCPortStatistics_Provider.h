// Provider of the ports' counters, read when they are asked for.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_FCPortStatistics_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_FCPortStatistics* model,
                              const Instance_Handler& handler);
};

}  // namespace cimrt
