// Static objects that are not taken away from threads that still use them.
#pragma once

#include <new>
#include <utility>

namespace cimrt {

/// While one lives, threads of the library or requests of the server may be at work. A server may
/// end its process then, without unloading anything first.
class At_Work {
 public:
  At_Work() noexcept;
  ~At_Work();
  At_Work(const At_Work&) = delete;
  At_Work& operator=(const At_Work&) = delete;

  /// True if there is one, on any thread.
  static bool any() noexcept;
};

/// A static object that is destroyed when the library leaves the process, but not when the process
/// ends around a library at work: then it stays usable to the last, and its memory goes with the
/// process.
template <class T>
class Lasting {
 public:
  template <class... Args>
  explicit Lasting(Args&&... args) {
    new (&_object) T(std::forward<Args>(args)...);
  }
  ~Lasting() {
    if (!At_Work::any()) _object.~T();
  }
  Lasting(const Lasting&) = delete;
  Lasting& operator=(const Lasting&) = delete;

  T& operator*() { return _object; }
  T* operator->() { return &_object; }

 private:
  union {
    T _object;
  };
};

}  // namespace cimrt
