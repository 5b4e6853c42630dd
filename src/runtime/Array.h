// Type-erased array driven by per-type traits, with a typed shell over it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>

#include "runtime/Types.h"

namespace cimrt {

struct ArrayRep;

/// Operations of one element type.
struct Array_Traits {
  std::size_t size;                               ///< element width in bytes
  void (*construct)(void* to, const void* from);  ///< copy into raw storage; null: plain byte copy
  void (*destroy)(void* element);                 ///< release one element; null: nothing to do
  bool (*equal)(const void* a, const void* b);    ///< null: byte comparison
  /// The rep of capacity 0 that all arrays of this type without room share; null: each has its own.
  ArrayRep* no_room = nullptr;
};

/// Traits by scalar `Type` code, 0 to 13.
extern const Array_Traits* const array_traits[NUM_TYPES];

/// Traits of `Array<Instance*>`: bare pointers, owned by whoever owns the array.
extern const Array_Traits instance_array_traits;

/// Header of an array's block; `capacity` elements and eight spare bytes follow it.
struct ArrayRep {
  const Array_Traits* traits;
  std::uint64_t size;
  std::uint64_t capacity;
  std::uint64_t reserved;

  void* element(std::size_t i) noexcept {
    return reinterpret_cast<char*>(this + 1) + i * traits->size;
  }
  const void* element(std::size_t i) const noexcept {
    return reinterpret_cast<const char*>(this + 1) + i * traits->size;
  }
};

/// Untyped array: what generic code over meta data handles. Elements are never shared; a copy is
/// deep, and one of nothing takes no memory. Capacity is exact beyond the first eight elements.
/// Positions behind the end are cut to it; indices of single elements are not checked. Elements
/// handed in may lie in the array itself.
class Array_Base {
 public:
  explicit Array_Base(const Array_Traits* traits);
  Array_Base(const Array_Traits* traits, const void* data, std::size_t n);
  Array_Base(const Array_Base& other);
  ~Array_Base();
  Array_Base& operator=(const Array_Base& other);

  std::size_t size() const noexcept { return _rep->size; }
  std::size_t capacity() const noexcept { return _rep->capacity; }
  const Array_Traits* traits() const noexcept { return _rep->traits; }

  void assign(const void* data, std::size_t n);  ///< exact capacity
  void reserve(std::size_t n);                   ///< exact capacity, never shrinks
  /// New elements are copies of `fill`, or all zero for element types without a constructor.
  void resize(std::size_t n, const void* fill);
  void insert(std::size_t pos, const void* data, std::size_t n);
  void prepend(const void* data, std::size_t n) { insert(0, data, n); }
  void append(const void* data, std::size_t n) { insert(size(), data, n); }
  void remove(std::size_t pos, std::size_t n);  ///< does not shrink
  void clear() { remove(0, size()); }

  /// Index of the first equal element, or -1 (all ones). For element types without an `equal`
  /// function any match answers 1: use it only as "found".
  std::size_t find(const void* element) const;
  bool equal(const Array_Base& other) const;

  void* element(std::size_t i) noexcept { return _rep->element(i); }
  const void* element(std::size_t i) const noexcept {
    return static_cast<const ArrayRep*>(_rep)->element(i);
  }

 private:
  ArrayRep* _rep;
};

/// Traits for a C++ element type. Other element types specialise this.
template <class T>
const Array_Traits* traits_of() {
  return array_traits[Type_Of<T>::value];
}
template <>
inline const Array_Traits* traits_of<Instance*>() {
  return &instance_array_traits;
}

/// Typed shell over `Array_Base`.
template <class T>
class Array : public Array_Base {
 public:
  Array() : Array_Base(traits_of<T>()) {}
  Array(const T* data, std::size_t n) : Array_Base(traits_of<T>(), data, n) {}
  Array(std::initializer_list<T> items) : Array_Base(traits_of<T>(), items.begin(), items.size()) {}

  T& operator[](std::size_t i) noexcept { return *static_cast<T*>(element(i)); }
  const T& operator[](std::size_t i) const noexcept { return *static_cast<const T*>(element(i)); }

  void assign(const T* data, std::size_t n) { Array_Base::assign(data, n); }
  void resize(std::size_t n, const T& fill) { Array_Base::resize(n, &fill); }
  void insert(std::size_t pos, const T* data, std::size_t n) { Array_Base::insert(pos, data, n); }
  void insert(std::size_t pos, const T& item) { Array_Base::insert(pos, &item, 1); }
  void prepend(const T& item) { Array_Base::insert(0, &item, 1); }
  void append(const T& item) { Array_Base::insert(size(), &item, 1); }
  void append(const T* data, std::size_t n) { Array_Base::insert(size(), data, n); }
  std::size_t find(const T& item) const { return Array_Base::find(&item); }

  const T* begin() const noexcept { return static_cast<const T*>(element(0)); }
  const T* end() const noexcept { return begin() + size(); }
  T* begin() noexcept { return static_cast<T*>(element(0)); }
  T* end() noexcept { return begin() + size(); }
};

}  // namespace cimrt
