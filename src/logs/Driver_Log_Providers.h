// The records of the driver's log, and the log's tie to each of them.
//
// The lines are those that the last enable of the log has read. Each request makes the records anew
// and in the agent's map, under the agent's data lock, and delivers outside it. Always 0.
#pragma once

#include "agent/ProviderAgent.h"
#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

/// Result of a failed rebuild of the records.
inline constexpr std::int32_t DRIVER_LOG_FAILED = 0x8000;

/// Refills the map of the driver's records from the agent's lines. The caller holds the data lock.
/// @return 0, or DRIVER_LOG_FAILED with the failure logged and the map as far as it got
std::int32_t CreateFCDriverLogEntryClass(ProviderAgent& agent);

class TVXHBA_FCDriverLogEntry_Provider {
 public:
  /// Empty if the agent's libraries did not load.
  std::int32_t enum_instances(const TVXHBA_FCDriverLogEntry* model,
                              const Instance_Handler& handler);
};

class TVXHBA_DriverRecordLogManagesRecord_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_DriverRecordLogManagesRecord* model,
                              const Instance_Handler& handler);
};

}  // namespace cimrt
