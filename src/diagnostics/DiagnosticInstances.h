// Making and inserting the instances of the diagnostics, each step with its own text of failure.
//
// All of it runs with the agent's data lock held; entries stay owned by their map.
#pragma once

#include <utility>

#include "agent/Map_Insert.h"
#include "common/CLogger.h"

namespace cimrt {

/// Makes an instance of a class with its defaults, or answers null when memory ran out.
using Diagnostic_Factory = Instance* (*)(const Meta_Class* metaClass);
/// Installs what the instances of the diagnostics are made by; null goes back to `create`. For
/// tests.
void setDiagnosticFactory(Diagnostic_Factory factory);

/// A new instance in the provider's namespace, or null. The caller owns it.
Ref<Instance> makeDiagnosticInstance(const Meta_Class* metaClass);

/// Typed form.
template <class T>
Ref<T> makeDiagnostic() {
  return Ref<T>(static_cast<T*>(makeDiagnosticInstance(&T::static_meta_class).release()));
}

/// A new association between clones of two ends, either of which may be null; or null.
template <class T>
Ref<T> makeDiagnosticAssociation(const Instance* first, const Instance* second) {
  Ref<T> association = makeDiagnostic<T>();
  if (association) setEnds(association.get(), first, second);
  return association;
}

/// Moves `instance` into `map` and answers its entry. Null when there is no instance, or the map
/// refuses it: the instance is gone then, and the text of that failure is logged.
template <class T>
T* insertDiagnostic(Instance_Map<T>& map, Ref<T> instance, int level, const char* creationFailure,
                    const char* insertFailure) {
  if (!instance) {
    TVX_LOG(level, "%s", creationFailure);
    return nullptr;
  }
  if (map.insert(instance.get()) == Instance_Map_Base::npos) {
    TVX_LOG(level, "%s", insertFailure);
    return nullptr;
  }
  return instance.release();
}

}  // namespace cimrt
