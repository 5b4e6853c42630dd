// Keeps clients that poll from driving the hardware at their own rate.
#pragma once

#include <cstdint>

#include "common/TVX_Clock.h"
#include "runtime/Lasting.h"

namespace cimrt {

/// The time of an update's last run. It begins as the zero time and is never set back, so that an
/// update that was due once stays quiet for its period, whatever became of that run. Not locked:
/// each belongs to one update, which runs under the agent's locks.
class Live_Throttle {
 public:
  /// @param period microseconds between two runs
  explicit Live_Throttle(std::uint64_t period) : m_Period(period) {}

  /// True if the period has passed since the last run. A clock that was set back counts as passed.
  bool isDue() const { return tvxNowDatetime().usec() - m_LastRun.usec() >= m_Period; }
  /// Makes this moment the last run.
  void start() { m_LastRun = tvxNowDatetime(); }

 private:
  const std::uint64_t m_Period;
  Datetime m_LastRun;
};

/// How the updates of link status and driver data begin: logs the check, and what it found. True if
/// the update is due, which makes this moment its last run.
bool startDriverUpdate(Live_Throttle& throttle);

inline constexpr std::uint64_t PORT_UPDATE_PERIOD = 10'000'000;   ///< microseconds
inline constexpr std::uint64_t DRIVER_UPDATE_PERIOD = 5'000'000;  ///< microseconds

}  // namespace cimrt
