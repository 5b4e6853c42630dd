// The records of the provider's log, and the log's tie to each of them.
//
// Both classes are built anew at each request from the logger's records in memory, under the
// agent's data lock, and delivered outside it. The position in the ring names a record, so names do
// not outlast a `ClearLog` or a full turn of the ring. An agent without its libraries has nothing
// to deliver, which is no failure; always 0.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_LogEntry_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_LogEntry* model, const Instance_Handler& handler);
};

class TVXHBA_RecordLogManagesRecord_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_RecordLogManagesRecord* model,
                              const Instance_Handler& handler);
};

}  // namespace cimrt
