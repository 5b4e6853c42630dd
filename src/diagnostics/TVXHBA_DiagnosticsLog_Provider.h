// Provider of the logs of the tests.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_DiagnosticsLog_Provider {
 public:
  /// Takes the results of a test out of their maps, with what ties them to log and port. Jobs and
  /// records of settings stay.
  /// @param return_value 0; 4 if entries could not be kept; 5 for a log that is not known
  std::int32_t ClearLog(const TVXHBA_DiagnosticsLog* log, Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
