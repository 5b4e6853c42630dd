// Thin layer over POSIX threads: locks, conditions, time and threads.
#pragma once

#include <pthread.h>

#include <cstdint>

namespace cimrt {

class Mutex {
 public:
  explicit Mutex(bool recursive = false);
  ~Mutex();
  Mutex(const Mutex&) = delete;
  Mutex& operator=(const Mutex&) = delete;

  void lock();
  void unlock();
  /// 0, 16 (EBUSY) when held elsewhere, -1 on any other failure.
  int try_lock();

  pthread_mutex_t* native() { return &_mutex; }

 private:
  pthread_mutex_t _mutex;
};

class Cond {
 public:
  Cond();
  ~Cond();
  Cond(const Cond&) = delete;
  Cond& operator=(const Cond&) = delete;

  void wait(Mutex& mutex);
  void signal();
  void broadcast();

 private:
  pthread_cond_t _cond;
};

/// Holds a mutex for a scope.
class Auto_Mutex {
 public:
  explicit Auto_Mutex(Mutex& mutex) : _mutex(mutex) { _mutex.lock(); }
  ~Auto_Mutex() { _mutex.unlock(); }
  Auto_Mutex(const Auto_Mutex&) = delete;
  Auto_Mutex& operator=(const Auto_Mutex&) = delete;

 private:
  Mutex& _mutex;
};

struct Time {
  static void sleep(std::uint64_t usec);
  static std::uint64_t now();  ///< microseconds since the epoch
};

using Thread_Proc = void* (*)(void* arg);

class Thread {
 public:
  Thread() = default;  ///< names no thread
  static Thread self();
  static bool equal(const Thread& a, const Thread& b);
  static int join(const Thread& thread, void*& out);
  [[noreturn]] static void exit(void* result);
  /// Starts a thread that inherits a context made by the caller's top context, if there is one.
  static int create(Thread& thread, Thread_Proc proc, void* arg, bool detached);
  static int create_joinable(Thread& thread, Thread_Proc proc, void* arg);
  static int create_detached(Thread& thread, Thread_Proc proc, void* arg);

 private:
  pthread_t _id = 0;
  [[maybe_unused]] std::uint64_t _reserved = 0;
};

}  // namespace cimrt
