// Instances that other providers of the same CIM server hold for the host.
#pragma once

#include "runtime/Instance.h"

namespace cimrt {

/// Asks the CIM server for the instances of `wanted` in the platform's namespace. A clone of the
/// first result of class `kind` or below it, with that namespace; null if the server has none, or
/// the thread no context to ask through. The caller owns it.
Ref<Instance> findOnPlatform(const Meta_Class* wanted, const Meta_Class* kind);

/// Typed form: `Kind` is the class that the result must belong to.
template <class Kind>
Ref<Kind> findOnPlatform(const Meta_Class* wanted) {
  return Ref<Kind>(static_cast<Kind*>(findOnPlatform(wanted, &Kind::static_meta_class).release()));
}

}  // namespace cimrt
