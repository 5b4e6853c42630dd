// Tagged union of one property, the currency between CMPI data and instances.
#pragma once

#include <cstdio>

#include "runtime/Instance.h"

namespace cimrt {

template <class T>
concept Value_Scalar = requires {
  Type_Of<T>::value;
};

/// `Type` code of what a C++ type is stored as: scalars, and arrays of them.
template <class T>
struct Value_Type_Of;
template <Value_Scalar T>
struct Value_Type_Of<T> {
  static constexpr Type value = Type_Of<T>::value;
};
template <Value_Scalar T>
struct Value_Type_Of<Array<T>> {
  static constexpr Type value = static_cast<Type>(Type_Of<T>::value | ARRAY_BIT);
};

/// What a `Value` can hold: the types of `Type_Of` and arrays of them, nothing convertible to them.
template <class T>
concept Value_Content = requires {
  Value_Type_Of<T>::value;
};

/// Holds one value and owns it: a text or datetime by count, an array as a deep copy, and one
/// reference of an instance, or of each element of an array of instances. For one thread.
class Value {
 public:
  Value() noexcept = default;  ///< type NONE, not null
  Value(const Value& other);   ///< takes a reference per instance
  Value& operator=(const Value& other);
  ~Value();

  /// Releases what is held; type NONE and null.
  void clear();

  /// Stores a non-null value. An instance's reference is taken over, and so is one per element of
  /// an array of instances.
  template <Value_Content T>
  void set(const T& x) {
    take(Value_Type_Of<T>::value, &x);
  }
  void set(Instance* x) { take(INSTANCE, &x); }

  /// 0 with a copy in `x`, or -1 with `x` left alone when the type differs. Instances come out
  /// without a reference of their own. A char16 keeps only its low 8 bits, sign-extended.
  template <Value_Content T>
  int get(T& x) const {
    if constexpr (Value_Type_Of<T>::value == CHAR16) return get_char16(x);
    const void* object = held(Value_Type_Of<T>::value);
    if (!object) return -1;
    x = *static_cast<const T*>(object);
    return 0;
  }

  void set_null_flag(bool null) { _null = null ? 1 : 0; }
  bool null() const { return _null != 0; }
  Type type() const { return _type; }

  /// Writes into a feature, the null flag included: 0, or -1 for a null instance, another type, a
  /// method, or a target that is not of the reference's class. Targets get a reference. The field
  /// must hold no target yet: an old one is not released. A refused array of targets leaves those
  /// in front of the wrong one.
  int set(Instance* instance, const Meta_Feature* feature) const;
  /// Reads a feature, its stored value also when it is null: 0, or -1 for a method.
  int get(const Instance* instance, const Meta_Feature* feature);

  /// Multi-line dump, for debugging.
  void print(std::FILE* stream) const;

 private:
  union Union {
    std::uint64_t uint64;
    char16_t char16;
    void* pointer;  ///< storage of the one-pointer String, Datetime, Array or Instance*
  };

  void hold(const Value& other);
  void construct(Type type, const void* from);
  void take(Type type, const void* from);
  const void* held(Type type) const;
  int get_char16(char16_t& x) const;
  void print_held(std::FILE* stream) const;

  Type _type = NONE;
  std::uint8_t _null = 0;
  Union _value = {0};
};

/// INSTANCE or INSTANCE_ARRAY for a reference, the property's type with `ARRAY_BIT` for an array,
/// NONE for anything else.
Type feature_type(const Meta_Feature* feature);
/// "BOOLEAN", "BOOLEAN_ARRAY", ... and the lower-case form used in messages. Unknown codes are
/// NONE.
const char* type_name(Type type);
const char* type_name_lower(Type type);

/// Text of one value, stored as an instance stores it, of a scalar type up to DATETIME.
void write_scalar(std::FILE* stream, Type type, const void* value);
/// The same for each element of an array, separated by ", ". `type` is that of the elements.
void write_array(std::FILE* stream, Type type, const Array_Base& array);

}  // namespace cimrt
