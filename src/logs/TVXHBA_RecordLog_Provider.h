// Methods of the record logs: the provider's own and the driver's.
//
// All of them wait for the adapter maps and hold the agent's data lock. The returned number is the
// call's own status; what a method says goes into `result`: METHOD_OK, LOG_UNKNOWN or
// LOG_INVALID_PARAMETER.
#pragma once

#include <cstdint>

#include "generated/Records.h"

namespace cimrt {

/// There is no log of that `InstanceID`.
inline constexpr std::uint32_t LOG_UNKNOWN = 0x812C;
/// An argument is out of its range; nothing was changed.
inline constexpr std::uint32_t LOG_INVALID_PARAMETER = 0x80C8;

class TVXHBA_RecordLog_Provider {
 public:
  /// Sets what the logger writes and where, for now and for the next start.
  /// @param level 1 to 5
  /// @param mode 1 to 4; 2 and 4 write to a file
  /// @param path the file for these two, a regular one or none yet; otherwise not looked at
  /// @return INVOKE_METHOD_UNSUPPORTED for the driver's log, which has no parameters
  std::int32_t SetLogParams(const TVXHBA_RecordLog* log, const Property<std::uint16_t>& level,
                            const Property<std::uint16_t>& mode, const Property<String>& path,
                            Property<std::uint32_t>& result);

  /// Drops the records of the log. The provider's log file is emptied too.
  std::int32_t ClearLog(const TVXHBA_RecordLog* log, Property<std::uint32_t>& result);

  /// 2 enables, 3 disables. The logger is switched by both logs; enabling the driver's log reads
  /// the system log afresh. No job is ever started.
  std::int32_t RequestStateChange(const TVXHBA_RecordLog* log, const Property<std::uint16_t>& state,
                                  const CIM_ConcreteJob*, const Property<Datetime>& timeout,
                                  Property<std::uint32_t>& result);
};

}  // namespace cimrt
