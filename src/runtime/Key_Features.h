// What generic code over key features shares: which features match across classes, and when two
// stored values are equal. Internal to the runtime.
#pragma once

#include "runtime/Instance.h"

namespace cimrt {

inline bool is_key(const Meta_Feature* f) {
  return (f->flags & FLAG_KEY) != 0;
}

inline bool is_scalar_reference(const Meta_Feature* f) {
  return is_reference(f) && as_reference(f)->subscript == 0;
}

/// Target of a scalar reference; null means null.
inline Instance*& target_of(Instance* instance, const Meta_Feature* reference) {
  return *static_cast<Instance**>(storage(instance, reference));
}
inline const Instance* target_of(const Instance* instance, const Meta_Feature* reference) {
  return *static_cast<Instance* const*>(storage(instance, reference));
}

/// Elements of an array of references.
inline Array<Instance*>& targets_of(Instance* instance, const Meta_Feature* reference) {
  return *static_cast<Array<Instance*>*>(storage(instance, reference));
}
inline const Array<Instance*>& targets_of(const Instance* instance, const Meta_Feature* reference) {
  return *static_cast<const Array<Instance*>*>(storage(instance, reference));
}

/// True if a property or reference holds no value.
inline bool is_null(const Instance* instance, const Meta_Feature* f) {
  return is_scalar_reference(f) ? !target_of(instance, f) : *null_flag(instance, f) != 0;
}

inline Instance* clone_or_null(const Instance* instance) {
  return instance ? clone(instance) : nullptr;
}

/// True if exactly one of two features with a null flag is null.
bool null_differs(const Instance* a, const Meta_Feature* fa, const Instance* b,
                  const Meta_Feature* fb);

/// Compares two properties of the same type and subscript: null flags, then the stored values, also
/// when both are null.
bool property_eq(const Instance* a, const Meta_Property* pa, const Instance* b,
                 const Meta_Property* pb);

/// The key of `record` with which `key_eq` compares `key`, or null when there is none: same name,
/// and same type and subscript for a property, related classes for a reference.
const Meta_Feature* matching_key(const Meta_Feature* key, const Meta_Record* record);

}  // namespace cimrt
