// Calls of a class's entry as the server boundary makes them, and what the handler saw.
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include "derivedObjects/Skeleton_Provider.h"

namespace cimrt::test {

/// One call of the entry with up to eight arguments; texts, places and callbacks as pointers.
template <class... Args>
std::int32_t call(const Registration& registration, std::uint32_t operation, Args... args) {
  void* all[8] = {const_cast<void*>(reinterpret_cast<const void*>(args))...};
  return registration.provider_proc(&registration, operation, all[0], all[1], all[2], all[3],
                                    all[4], all[5], all[6], all[7]);
}

/// Counts deliveries, and keeps the status of the end call.
struct Deliveries {
  std::size_t instances = 0;
  std::vector<std::int32_t> ends;

  static bool take(Instance* instance, std::int32_t status, void* client_data) {
    auto* self = static_cast<Deliveries*>(client_data);
    if (!instance) {
      self->ends.push_back(status);
      return false;
    }
    ++self->instances;
    unref(instance);
    return true;
  }
  Instance_Handler handler() { return {&take, this}; }
};

/// A provider object that lives for one test.
class Made_Provider {
 public:
  explicit Made_Provider(const Registration& registration) : _registration(registration) {
    call(registration, OPERATION_CREATE_PROVIDER, &_object);
  }
  ~Made_Provider() { call(_registration, OPERATION_DESTROY_PROVIDER, _object); }
  Made_Provider(const Made_Provider&) = delete;
  Made_Provider& operator=(const Made_Provider&) = delete;

  void* object() const { return _object; }
  template <class... Args>
  std::int32_t operator()(std::uint32_t operation, Args... args) const {
    return call(_registration, operation, _object, args...);
  }

 private:
  const Registration& _registration;
  void* _object = nullptr;
};

}  // namespace cimrt::test
