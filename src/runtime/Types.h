// Type codes of CIM values and the tables that go with them.
#pragma once

#include <cstddef>
#include <cstdint>

namespace cimrt {

class String;
class Datetime;
struct Instance;

/// Code of one CIM value type. Codes 0 to 13 also stand in `Meta_Property::type`; an array type is
/// the scalar code with `ARRAY_BIT` set.
enum Type : std::int32_t {
  NONE = -1,
  BOOLEAN = 0,
  UINT8 = 1,
  SINT8 = 2,
  UINT16 = 3,
  SINT16 = 4,
  UINT32 = 5,
  SINT32 = 6,
  UINT64 = 7,
  SINT64 = 8,
  REAL32 = 9,
  REAL64 = 10,
  CHAR16 = 11,
  STRING = 12,
  DATETIME = 13,
  INSTANCE = 14,

  ARRAY_BIT = 0x80,
  BOOLEAN_ARRAY = 0x80,
  UINT8_ARRAY = 0x81,
  SINT8_ARRAY = 0x82,
  UINT16_ARRAY = 0x83,
  SINT16_ARRAY = 0x84,
  UINT32_ARRAY = 0x85,
  SINT32_ARRAY = 0x86,
  UINT64_ARRAY = 0x87,
  SINT64_ARRAY = 0x88,
  REAL32_ARRAY = 0x89,
  REAL64_ARRAY = 0x8A,
  CHAR16_ARRAY = 0x8B,
  STRING_ARRAY = 0x8C,
  DATETIME_ARRAY = 0x8D,
  INSTANCE_ARRAY = 0x8E,
};

/// Number of scalar property types (BOOLEAN to DATETIME).
inline constexpr std::size_t NUM_TYPES = 14;

/// Type names as MOF writes them ("boolean", "uint8", ...), indexed by scalar code 0 to 13.
extern const char* const type_name_table[NUM_TYPES];

/// Widths in bytes of the stored value, indexed by scalar code 0 to 13.
extern const std::size_t type_size_table[NUM_TYPES];

/// Maps each byte to its lower-case form; the cheap first test of every name comparison.
extern const unsigned char __lower[256];

/// Case-insensitive equality of two names. Neither may be null.
bool name_eq(const char* a, const char* b);

/// Maps a C++ value type to its `Type` code; the CIM char16 is `char16_t`.
template <class T>
struct Type_Of;
template <>
struct Type_Of<bool> {
  static constexpr Type value = BOOLEAN;
};
template <>
struct Type_Of<std::uint8_t> {
  static constexpr Type value = UINT8;
};
template <>
struct Type_Of<std::int8_t> {
  static constexpr Type value = SINT8;
};
template <>
struct Type_Of<std::uint16_t> {
  static constexpr Type value = UINT16;
};
template <>
struct Type_Of<std::int16_t> {
  static constexpr Type value = SINT16;
};
template <>
struct Type_Of<std::uint32_t> {
  static constexpr Type value = UINT32;
};
template <>
struct Type_Of<std::int32_t> {
  static constexpr Type value = SINT32;
};
template <>
struct Type_Of<std::uint64_t> {
  static constexpr Type value = UINT64;
};
template <>
struct Type_Of<std::int64_t> {
  static constexpr Type value = SINT64;
};
template <>
struct Type_Of<float> {
  static constexpr Type value = REAL32;
};
template <>
struct Type_Of<double> {
  static constexpr Type value = REAL64;
};
template <>
struct Type_Of<char16_t> {
  static constexpr Type value = CHAR16;
};
template <>
struct Type_Of<String> {
  static constexpr Type value = STRING;
};
template <>
struct Type_Of<Datetime> {
  static constexpr Type value = DATETIME;
};
template <>
struct Type_Of<Instance*> {
  static constexpr Type value = INSTANCE;
};

}  // namespace cimrt
