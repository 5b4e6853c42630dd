// Tagged union of one property, the currency between CMPI data and instances.
#pragma once

#include <cstdio>

#include "runtime/Instance.h"

namespace cimrt {

/// Owns what it holds. `set` takes over an instance's reference; the array form for instances
/// copies the pointers only. `get` answers -1, leaving its argument alone, when the type differs.
class Value {
 public:
  Value() noexcept;
  Value(const Value& other);
  Value& operator=(const Value& other);
  ~Value();

  void clear();

  void set(bool x);
  void set(std::uint8_t x);
  void set(std::int8_t x);
  void set(std::uint16_t x);
  void set(std::int16_t x);
  void set(std::uint32_t x);
  void set(std::int32_t x);
  void set(std::uint64_t x);
  void set(std::int64_t x);
  void set(float x);
  void set(double x);
  void set(char16_t x);
  void set(const String& x);
  void set(const Datetime& x);
  void set(Instance* x);
  void set(const Array<bool>& x);
  void set(const Array<std::uint8_t>& x);
  void set(const Array<std::int8_t>& x);
  void set(const Array<std::uint16_t>& x);
  void set(const Array<std::int16_t>& x);
  void set(const Array<std::uint32_t>& x);
  void set(const Array<std::int32_t>& x);
  void set(const Array<std::uint64_t>& x);
  void set(const Array<std::int64_t>& x);
  void set(const Array<float>& x);
  void set(const Array<double>& x);
  void set(const Array<char16_t>& x);
  void set(const Array<String>& x);
  void set(const Array<Datetime>& x);
  void set(const Array<Instance*>& x);

  int get(bool& x) const;
  int get(std::uint8_t& x) const;
  int get(std::int8_t& x) const;
  int get(std::uint16_t& x) const;
  int get(std::int16_t& x) const;
  int get(std::uint32_t& x) const;
  int get(std::int32_t& x) const;
  int get(std::uint64_t& x) const;
  int get(std::int64_t& x) const;
  int get(float& x) const;
  int get(double& x) const;
  int get(char16_t& x) const;
  int get(String& x) const;
  int get(Datetime& x) const;
  int get(Instance*& x) const;
  int get(Array<bool>& x) const;
  int get(Array<std::uint8_t>& x) const;
  int get(Array<std::int8_t>& x) const;
  int get(Array<std::uint16_t>& x) const;
  int get(Array<std::int16_t>& x) const;
  int get(Array<std::uint32_t>& x) const;
  int get(Array<std::int32_t>& x) const;
  int get(Array<std::uint64_t>& x) const;
  int get(Array<std::int64_t>& x) const;
  int get(Array<float>& x) const;
  int get(Array<double>& x) const;
  int get(Array<char16_t>& x) const;
  int get(Array<String>& x) const;
  int get(Array<Datetime>& x) const;
  int get(Array<Instance*>& x) const;

  void set_null_flag(bool null) { _null = null ? 1 : 0; }
  bool null() const { return _null != 0; }
  Type type() const { return _type; }

  /// Writes into, or reads from, one feature of an instance: 0 or -1.
  int set(Instance* instance, const Meta_Feature* feature) const;
  int get(const Instance* instance, const Meta_Feature* feature);

  void print(std::FILE* stream) const;

 private:
  Type _type;
  std::uint8_t _null;
  union Union {
    bool boolean;
    std::uint8_t uint8;
    std::int8_t sint8;
    std::uint16_t uint16;
    std::int16_t sint16;
    std::uint32_t uint32;
    std::int32_t sint32;
    std::uint64_t uint64;
    std::int64_t sint64;
    float real32;
    double real64;
    char16_t char16;
    void* pointer;  ///< storage of the one-pointer String, Datetime, Array or Instance*
  } _value;
};

Type feature_type(const Meta_Feature* feature);
/// "BOOLEAN", "BOOLEAN_ARRAY", ... and the lower-case form used in messages.
const char* type_name(Type type);
const char* type_name_lower(Type type);

}  // namespace cimrt
