#include "agent/Ranked_Mutex.h"

#include "runtime/Thread_Context.h"

namespace cimrt {

namespace {

constexpr unsigned NUM_RANKS = static_cast<unsigned>(Lock_Rank::CLASS_STATIC) + 1;

constexpr unsigned index_of(Lock_Rank rank) {
  return static_cast<unsigned>(rank);
}

/// How many locks of each rank this thread holds.
thread_local unsigned held[NUM_RANKS];

bool holds_any_from(unsigned first) {
  for (unsigned i = first; i < NUM_RANKS; i++)
    if (held[i] != 0) return true;
  return false;
}

}  // namespace

bool may_take_lock(Lock_Rank rank, bool recursive) {
  // The thread lock is taken alone: under it nothing, and it under nothing but the instance lock.
  if (held[index_of(Lock_Rank::THREAD)] != 0) return false;
  return !holds_any_from(index_of(rank) + (recursive ? 1 : 0));
}

void note_lock_taken(Lock_Rank rank) {
  held[index_of(rank)]++;
}

void note_lock_released(Lock_Rank rank) {
  CIMRT_ASSERT(held[index_of(rank)] > 0);
  held[index_of(rank)]--;
}

void Ranked_Mutex::lock() {
#ifndef NDEBUG
  CIMRT_ASSERT(may_take_lock(_rank, _recursive));
#endif
  _waiting.fetch_add(1, std::memory_order_relaxed);
  _mutex.lock();
  _waiting.fetch_sub(1, std::memory_order_relaxed);
#ifndef NDEBUG
  note_lock_taken(_rank);
#endif
}

void Ranked_Mutex::unlock() {
#ifndef NDEBUG
  note_lock_released(_rank);
#endif
  _mutex.unlock();
}

}  // namespace cimrt
