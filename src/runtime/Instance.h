// Base of every CIM object in memory, and the operations that walk its class description.
#pragma once

#include <atomic>
#include <concepts>
#include <cstdint>
#include <cstdio>
#include <initializer_list>
#include <type_traits>
#include <utility>

#include "runtime/Array.h"
#include "runtime/Datetime.h"
#include "runtime/Meta_Class.h"
#include "runtime/String.h"

namespace cimrt {

/// `magic` of a live instance.
inline constexpr std::uint32_t INSTANCE_MAGIC = 0xF00DFACE;

/// Header of every CIM object; the property storage follows it at the offsets of the class. Never
/// constructed or destroyed by C++: `create`, `clone` and `destroy` do that. Starts with one
/// reference; used by one thread at a time, only `refs` may be touched from several.
struct Instance {
  std::uint32_t magic;
  std::atomic<std::uint32_t> refs;
  const Meta_Record* meta_class;  ///< the class, or the method for a method call record
  String __name_space;            ///< empty: not set

  static const Meta_Class static_meta_class;  ///< root of all classes, in no repository

  Instance() = delete;
  ~Instance() = delete;
};

/// Storage of one property: the value, then a null flag (non-zero: null).
template <class T>
struct Property {
  T value;
  std::uint8_t null;

  void set(const T& v) {
    value = v;
    null = 0;
  }
  template <class U>
  requires(!std::same_as<std::remove_cvref_t<U>, T> && std::convertible_to<U, T>) void set(U&& v) {
    value = static_cast<T>(std::forward<U>(v));
    null = 0;
  }
  bool is_null() const { return null != 0; }
};

/// Storage of one array property.
template <class T>
struct Property<Array<T>> {
  Array<T> value;
  std::uint8_t null;

  void set(const Array<T>& v) {
    value = v;
    null = 0;
  }
  void set(std::initializer_list<T> items) {
    value.assign(items.begin(), items.size());
    null = 0;
  }
  void append(const T& item) {
    value.append(item);
    null = 0;
  }
  bool is_null() const { return null != 0; }
};

/// The class of an instance, or null for a method call record.
const Meta_Class* class_of(const Instance* instance);

Instance* create(const Meta_Class* meta_class, bool defaults);
Instance* create(const Meta_Method* meta_method);
Instance* clone(const Instance* instance);
void destroy(Instance* instance);
void ref(Instance* instance);
void unref(Instance* instance);

template <class T>
requires(std::derived_from<T, Instance> && !std::same_as<T, Instance>) T* clone(const T* instance) {
  return static_cast<T*>(clone(static_cast<const Instance*>(instance)));
}

/// Stores `target` (its reference is taken over) in a scalar reference field, releasing the old
/// one.
template <class T>
void set_reference(T*& field, T* target) {
  T* old = field;
  field = target;
  unref(old);
}

void copy(Instance* dest, const Instance* src, const Instance* model = nullptr);
void copy_keys(Instance* dest, const Instance* src);
Instance* key_clone(const Instance* instance);
void nullify_properties(Instance* instance, bool include_keys, bool include_non_keys, bool value);
void nullify_non_keys(Instance* instance);
void clear(Instance* instance);
/// Applies a requested property list; -1 if it names a method.
int filter_properties(Instance* instance, const char* const* properties, bool keep_keys);
bool key_eq(const Instance* a, const Instance* b);
bool identical(const Instance* a, const Instance* b);
bool keys_non_null(const Instance* instance);
void create_sub_objects(Instance* instance);
void __visit(Instance* instance, void (*proc)(Instance* instance, void* data), void* data);
void set_name_space(Instance* instance, const char* name_space, bool force);
/// 0, or -1 for a class without keys or with a null or array key.
int instance_to_model_path(const Instance* instance, String& text);
Instance* model_path_to_instance(const Meta_Class* meta_class, const char* path);

bool is_reference_of(const Instance* instance, const Instance* association, const String& role);
/// Far ends of `association` seen from `instance`, or -1 if it is not at any end. `results` has
/// room for `MAX_ASSOCIATORS`; the pointers stay owned by the association.
inline constexpr int MAX_ASSOCIATORS = 16;
int get_associators(const Instance* instance, const Instance* association,
                    const String& result_class, const String& role, const String& result_role,
                    Instance** results);

/// MOF-like dump. Below the first level, or with `keys_only` everywhere, only keys are shown;
/// embedded objects and instances too unless `keys_only`.
void print(std::FILE* stream, const Instance* instance, bool keys_only = false);
/// Parts of it: one stored value of a scalar type up to DATETIME, and an array of such.
void print_scalar(std::FILE* stream, Type type, const void* value);
void print_array(std::FILE* stream, Type type, const Array_Base& array);

/// Null flag of a property or array of references; null for a scalar reference or a method.
std::uint8_t* null_flag(Instance* instance, const Meta_Feature* feature);
const std::uint8_t* null_flag(const Instance* instance, const Meta_Feature* feature);
/// Start of a feature's storage.
void* storage(Instance* instance, const Meta_Feature* feature);
const void* storage(const Instance* instance, const Meta_Feature* feature);

/// Counted pointer over an instance.
template <class T>
class Ref {
 public:
  Ref() = default;
  /// Takes over the caller's reference.
  explicit Ref(T* instance) : _instance(instance) {}
  Ref(const Ref& other) : _instance(other._instance) { ref_one(); }
  Ref(Ref&& other) noexcept : _instance(std::exchange(other._instance, nullptr)) {}
  ~Ref() { unref(_instance); }
  Ref& operator=(Ref other) noexcept {
    std::swap(_instance, other._instance);
    return *this;
  }
  void reset(T* instance = nullptr) { Ref(instance).swap(*this); }
  void swap(Ref& other) noexcept { std::swap(_instance, other._instance); }
  /// Gives the reference to the caller.
  T* release() { return std::exchange(_instance, nullptr); }
  T* get() const { return _instance; }
  T* operator->() const { return _instance; }
  T& operator*() const { return *_instance; }
  explicit operator bool() const { return _instance != nullptr; }

 private:
  void ref_one() {
    if (_instance) ref(_instance);
  }
  T* _instance = nullptr;
};

}  // namespace cimrt
