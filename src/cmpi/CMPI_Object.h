// Small helpers over CMPI objects: a releasing pointer and safe reads of texts.
#pragma once

#include <utility>

#include "cmpi/cmpimacs.h"

namespace cimrt {

/// Owns one CMPI object that this library made and releases it early, on the thread and within the
/// request that made it. Arrays are never held so: some servers let an array share its elements.
template <class T>
class CMPI_Ptr {
 public:
  CMPI_Ptr() = default;
  explicit CMPI_Ptr(T* object) : _object(object) {}
  ~CMPI_Ptr() { reset(); }
  CMPI_Ptr(const CMPI_Ptr&) = delete;
  CMPI_Ptr& operator=(const CMPI_Ptr&) = delete;

  T* get() const { return _object; }
  /// Leaves the object to the server's own clean-up at the end of the request.
  T* release() { return std::exchange(_object, nullptr); }
  void reset(T* object = nullptr) {
    T* old = std::exchange(_object, object);
    if (old) CMRelease(old);
  }
  /// Place for a function that makes an object.
  T*& receive() {
    reset();
    return _object;
  }
  explicit operator bool() const { return _object != nullptr; }

 private:
  T* _object = nullptr;
};

/// The characters of a CMPI text; "" for a null text object and for one without characters.
inline const char* text_of(const CMPIString* text) {
  const char* chars = text ? CMGetCharsPtr(text, nullptr) : nullptr;
  return chars ? chars : "";
}

inline const char* name_space_of(const CMPIObjectPath* path) {
  return path ? text_of(CMGetNameSpace(path, nullptr)) : "";
}

inline const char* class_name_of(const CMPIObjectPath* path) {
  return path ? text_of(CMGetClassName(path, nullptr)) : "";
}

}  // namespace cimrt
