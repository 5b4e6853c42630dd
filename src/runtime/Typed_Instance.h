// Checked step from an instance of some class to a typed record.
#pragma once

#include "runtime/Instance.h"

namespace cimrt {

/// `instance` as a record of class `T`, or null if it is null or of a class that is not `T` or a
/// subclass of it. Paths and references from a server may name any class, so this comes before the
/// first look at a typed field.
template <class T>
const T* typed(const Instance* instance) {
  if (!instance || !is_subclass(&T::static_meta_class, class_of(instance))) return nullptr;
  return static_cast<const T*>(instance);
}

template <class T>
T* typed(Instance* instance) {
  return const_cast<T*>(typed<T>(static_cast<const Instance*>(instance)));
}

}  // namespace cimrt
