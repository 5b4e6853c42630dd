// The plain value types and their places in a CMPI value.
#pragma once

#include <cstdint>

#include "cmpi/cmpidt.h"
#include "runtime/Types.h"

namespace cimrt {

/// A C++ type of the runtime with the member of the CMPI union that carries it.
template <class T, auto Member>
struct Plain {
  using type = T;

  static T read(const CMPIValue& value) { return static_cast<T>(value.*Member); }
  static void write(CMPIValue& value, T x) {
    value.*Member = static_cast<std::remove_reference_t<decltype(value.*Member)>>(x);
  }
};

/// Any non-zero byte is true, and true is written as 1.
struct Plain_Boolean {
  using type = bool;

  static bool read(const CMPIValue& value) { return value.boolean != 0; }
  static void write(CMPIValue& value, bool x) { value.boolean = x ? 1 : 0; }
};

/// Calls `function` with the `Plain` of a scalar type code and answers its result, or -1 for a code
/// that is not plain (text, timestamp, instance, none).
template <class Function>
int with_plain_type(Type scalar, Function&& function) {
  switch (scalar) {
    case BOOLEAN:
      return function(Plain_Boolean());
    case UINT8:
      return function(Plain<std::uint8_t, &CMPIValue::uint8>());
    case SINT8:
      return function(Plain<std::int8_t, &CMPIValue::sint8>());
    case UINT16:
      return function(Plain<std::uint16_t, &CMPIValue::uint16>());
    case SINT16:
      return function(Plain<std::int16_t, &CMPIValue::sint16>());
    case UINT32:
      return function(Plain<std::uint32_t, &CMPIValue::uint32>());
    case SINT32:
      return function(Plain<std::int32_t, &CMPIValue::sint32>());
    case UINT64:
      return function(Plain<std::uint64_t, &CMPIValue::uint64>());
    case SINT64:
      return function(Plain<std::int64_t, &CMPIValue::sint64>());
    case REAL32:
      return function(Plain<float, &CMPIValue::real32>());
    case REAL64:
      return function(Plain<double, &CMPIValue::real64>());
    case CHAR16:
      return function(Plain<char16_t, &CMPIValue::char16>());
    default:
      return -1;
  }
}

inline bool is_array(Type type) {
  return type != NONE && (type & ARRAY_BIT) != 0;
}
inline Type scalar_of(Type type) {
  return type == NONE ? NONE : static_cast<Type>(type & ~ARRAY_BIT);
}

}  // namespace cimrt
