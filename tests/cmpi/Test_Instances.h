// Reads and writes of single features by name, for tests.
#pragma once

#include <gtest/gtest.h>

#include "Test_Classes.h"
#include "runtime/Value.h"

namespace cimrt::test {

/// An instance of a test class with every property null.
inline Ref<Instance> make_instance(const Meta_Class* meta_class) {
  Ref<Instance> instance(create(meta_class, false));
  nullify_properties(instance.get(), true, true, true);
  for (std::uint64_t i = 0; i < meta_class->num_meta_features; ++i)
    if (is_reference(meta_class->meta_features[i]))
      if (std::uint8_t* flag = null_flag(instance.get(), meta_class->meta_features[i])) *flag = 1;
  return instance;
}

inline const Meta_Feature* feature_of(const Instance* instance, const char* name) {
  const Meta_Feature* feature =
      find_feature(instance->meta_class, name, FLAG_PROPERTY | FLAG_REFERENCE);
  if (!feature) ADD_FAILURE() << instance->meta_class->name << " has no " << name;
  return feature;
}

/// Stores a value of the feature's own type.
template <class T>
void put(Instance* instance, const char* name, const T& x) {
  Value value;
  value.set(x);
  EXPECT_EQ(value.set(instance, feature_of(instance, name)), 0) << name;
}
inline void put(Instance* instance, const char* name, const char* text) {
  put(instance, name, String(text));
}
template <class T>
void put(const Ref<Instance>& instance, const char* name, const T& x) {
  put(instance.get(), name, x);
}

/// The stored value; a failure is noted if the feature is null or of another type.
template <class T>
T take(const Instance* instance, const char* name) {
  Value value;
  EXPECT_EQ(value.get(instance, feature_of(instance, name)), 0) << name;
  EXPECT_FALSE(value.null()) << name;
  T x{};
  EXPECT_EQ(value.get(x), 0) << name;
  return x;
}

inline bool null_in(const Instance* instance, const char* name) {
  Value value;
  EXPECT_EQ(value.get(instance, feature_of(instance, name)), 0) << name;
  return value.null();
}

/// A TEST_Part (or another element) with its key.
inline Ref<Instance> make_element(const Meta_Class* meta_class, const char* id) {
  Ref<Instance> element = make_instance(meta_class);
  put(element, "Id", id);
  return element;
}

/// Stores a reference; the target stays the caller's.
inline void refer(Instance* instance, const char* name, const Instance* target) {
  put(instance, name, clone(target));
}

/// Stores a list with one reference; the target stays the caller's.
inline void refer_list(Instance* instance, const char* name, const Instance* target) {
  Array<Instance*> list;
  list.append(clone(target));
  put(instance, name, list);
  // The value above held the only reference beside that of the instance.
  *null_flag(instance, feature_of(instance, name)) = 0;
}

}  // namespace cimrt::test
