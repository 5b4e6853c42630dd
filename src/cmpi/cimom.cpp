#include "cmpi/cimom.h"

#include <cstdio>

#include "runtime/Thread_Context.h"

namespace cimrt {

Instance_Enumerator::~Instance_Enumerator() {
  Thread_Context* context = Thread_Context::top();
  if (context && _enumerator) context->instance_enumerator_destroy(_enumerator);
}

bool Instance_Enumerator::more() const {
  Thread_Context* context = Thread_Context::top();
  return context && context->instance_enumerator_more(_enumerator);
}

void Instance_Enumerator::next() {
  Thread_Context* context = Thread_Context::top();
  if (context) context->instance_enumerator_next(_enumerator);
}

Ref<Instance> Instance_Enumerator::get() const {
  Thread_Context* context = Thread_Context::top();
  return context ? context->instance_enumerator_get(_enumerator) : Ref<Instance>();
}

bool cimom::get_username(String& name) {
  Thread_Context* context = Thread_Context::top();
  return context && context->get_username(name);
}

void cimom::allow_unload(bool flag) {
  Thread_Context* context = Thread_Context::top();
  if (context) context->allow_unload(flag);
}

Ref<Instance> cimom::get_instance(const char* name_space, const Instance* model) {
  Thread_Context* context = Thread_Context::top();
  return context ? context->get_instance(name_space, model) : Ref<Instance>();
}

int cimom::create_instance(const char* name_space, const Instance* instance) {
  Thread_Context* context = Thread_Context::top();
  return context ? context->create_instance(name_space, instance) : -1;
}

int cimom::delete_instance(const char* name_space, const Instance* instance) {
  Thread_Context* context = Thread_Context::top();
  return context ? context->delete_instance(name_space, instance) : -1;
}

int cimom::modify_instance(const char* name_space, const Instance* instance) {
  Thread_Context* context = Thread_Context::top();
  return context ? context->modify_instance(name_space, instance) : -1;
}

int cimom::invoke_method(const char* name_space, const Instance* instance, Instance* method) {
  Thread_Context* context = Thread_Context::top();
  return context ? context->invoke_method(name_space, instance, method) : -1;
}

int cimom::enum_instances(const char* name_space, const Instance* model,
                          Instance_Enumerator& enumerator) {
  Thread_Context* context = Thread_Context::top();
  if (!context) return -1;

  if (enumerator._enumerator) context->instance_enumerator_destroy(enumerator._enumerator);
  enumerator._enumerator = context->instance_enumerator_create(name_space, model);
  return enumerator._enumerator ? 0 : -1;
}

int cimom::enum_instances(const char* /*name_space*/, const Instance* /*model*/,
                          Array<Instance>& /*instances*/) {
  std::printf("NOT IMPLEMENTED.\n");
  std::fflush(stdout);
  CIMRT_ASSERT(false);
  return -1;
}

}  // namespace cimrt
