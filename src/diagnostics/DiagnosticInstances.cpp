#include "diagnostics/DiagnosticInstances.h"

#include <atomic>
#include <new>

namespace cimrt {

namespace {

Instance* createWithDefaults(const Meta_Class* metaClass) {
  try {
    return create(metaClass, true);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

std::atomic<Diagnostic_Factory> factory{createWithDefaults};

}  // namespace

void setDiagnosticFactory(Diagnostic_Factory replacement) {
  factory = replacement ? replacement : createWithDefaults;
}

Ref<Instance> makeDiagnosticInstance(const Meta_Class* metaClass) {
  Ref<Instance> instance(factory.load()(metaClass));
  if (instance) instance->__name_space = PROVIDER_NAME_SPACE;
  return instance;
}

}  // namespace cimrt
