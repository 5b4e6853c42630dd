// The time of day and the sleep of the provider's own code, replaceable by tests.
#pragma once

#include <cstdint>

#include "runtime/Datetime.h"

namespace cimrt {

/// Gives the present time in microseconds since the epoch.
using TVX_Clock_Function = std::uint64_t (*)();
/// Sleeps for the given microseconds.
using TVX_Sleep_Function = void (*)(std::uint64_t usec);

/// Microseconds since the epoch, from the installed clock (the runtime's by default).
std::uint64_t tvxNow();

/// The same as a CIM timestamp with the machine's offset from UTC.
Datetime tvxNowDatetime();

/// Sleeps through the installed function (the runtime's by default).
void tvxSleep(std::uint64_t usec);

/// Installs a clock or a sleep; null goes back to the default. For tests. Any thread.
void tvxSetClock(TVX_Clock_Function clock);
void tvxSetSleep(TVX_Sleep_Function sleep);

}  // namespace cimrt
