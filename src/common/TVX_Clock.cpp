#include "common/TVX_Clock.h"

#include <atomic>

#include "runtime/Threads.h"

namespace cimrt {

namespace {

std::atomic<TVX_Clock_Function> installedClock{nullptr};
std::atomic<TVX_Sleep_Function> installedSleep{nullptr};

}  // namespace

std::uint64_t tvxNow() {
  const TVX_Clock_Function clock = installedClock.load(std::memory_order_acquire);
  return clock != nullptr ? clock() : Time::now();
}

Datetime tvxNowDatetime() {
  if (installedClock.load(std::memory_order_acquire) == nullptr) return Datetime::now();
  return Datetime(tvxNow(), 0);
}

void tvxSleep(std::uint64_t usec) {
  const TVX_Sleep_Function sleep = installedSleep.load(std::memory_order_acquire);
  if (sleep != nullptr) {
    sleep(usec);
  } else {
    Time::sleep(usec);
  }
}

void tvxSetClock(TVX_Clock_Function clock) {
  installedClock.store(clock, std::memory_order_release);
}

void tvxSetSleep(TVX_Sleep_Function sleep) {
  installedSleep.store(sleep, std::memory_order_release);
}

}  // namespace cimrt
