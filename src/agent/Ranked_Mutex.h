// A mutex that knows its place in the agent's lock order and, in debug builds, asserts it.
#pragma once

#include <atomic>
#include <cstdint>

#include "runtime/Threads.h"

namespace cimrt {

/// Place of a lock in the one order in which a thread may take them, outermost first. The order is
/// explained in ProviderAgent.h; the log mutex and that of the settings file lie inside all these.
enum class Lock_Rank : std::uint8_t {
  INSTANCE = 0,      ///< the singleton pointer and its reference count
  THREAD = 1,        ///< start and end of the refresh thread; nothing is taken under it
  ADAPTER_DATA = 2,  ///< readiness of the device tree
  ADAPTER_MAPS = 3,  ///< readiness of the adapter maps
  SAN_MAPS = 4,      ///< readiness of the SAN maps
  DATA = 5,          ///< the device tree and the contents of the maps
  CLASS_STATIC = 6,  ///< update functions of one active class; recursive
};

/// Tells whether the calling thread, holding what it holds, may take a lock of `rank`. `recursive`
/// allows a lock of the same rank to be held already.
bool may_take_lock(Lock_Rank rank, bool recursive);
/// Books a lock of `rank` for the calling thread, or gives it back.
void note_lock_taken(Lock_Rank rank);
void note_lock_released(Lock_Rank rank);

/// Plain or recursive mutex of a fixed rank. Taking locks out of order aborts a debug build; with
/// NDEBUG the check costs nothing.
class Ranked_Mutex {
 public:
  explicit Ranked_Mutex(Lock_Rank rank, bool recursive = false)
      : _mutex(recursive), _rank(rank), _recursive(recursive) {}
  Ranked_Mutex(const Ranked_Mutex&) = delete;
  Ranked_Mutex& operator=(const Ranked_Mutex&) = delete;

  void lock();
  void unlock();
  /// How many threads ask for it at the moment; a thread that gets it is counted no more.
  unsigned waiting() const { return _waiting.load(std::memory_order_relaxed); }

 private:
  friend class Ranked_Cond;
  Mutex _mutex;
  std::atomic<unsigned> _waiting{0};
  const Lock_Rank _rank;
  const bool _recursive;
};

/// Holds a ranked mutex for a scope, or until `release`.
class Ranked_Lock {
 public:
  explicit Ranked_Lock(Ranked_Mutex& mutex) : _mutex(&mutex) { mutex.lock(); }
  ~Ranked_Lock() { release(); }
  Ranked_Lock(const Ranked_Lock&) = delete;
  Ranked_Lock& operator=(const Ranked_Lock&) = delete;

  /// Gives the lock back before the scope ends. Harmless when done twice.
  void release() {
    if (!_mutex) return;
    _mutex->unlock();
    _mutex = nullptr;
  }

 private:
  Ranked_Mutex* _mutex;
};

/// Condition that goes with one ranked mutex. Waiting gives back that mutex alone.
class Ranked_Cond {
 public:
  /// Sleeps until `ready` holds; the caller holds `mutex`. Wake-ups without cause are slept over.
  template <class Predicate>
  void wait_until(Ranked_Mutex& mutex, Predicate ready) {
    while (!ready()) _cond.wait(mutex._mutex);
  }
  void broadcast() { _cond.broadcast(); }

 private:
  Cond _cond;
};

}  // namespace cimrt
