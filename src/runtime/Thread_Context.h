// Per-thread stack of request contexts, through which provider code reaches the CIM server.
#pragma once

#include "runtime/Instance.h"

namespace cimrt {

/// One request (or one provider thread) as seen by provider code. Contexts are per thread and form
/// a strict stack; `pop` does not delete.
class Thread_Context {
 public:
  Thread_Context() = default;
  virtual ~Thread_Context();
  Thread_Context(const Thread_Context&) = delete;
  Thread_Context& operator=(const Thread_Context&) = delete;

  static Thread_Context* top();
  static void push(Thread_Context* context);
  static void pop();
  static void __cimrt_trace(const char* file, int line, const char* text);
  [[noreturn]] static void __cimrt_assert(const char* file, int line, const char* function,
                                          const char* text);

  virtual Thread_Context* thread_create_hook(void* arg) = 0;
  virtual void thread_start_hook() = 0;
  virtual void thread_exit_hook() = 0;
  virtual void* instance_enumerator_create(const char* name_space, const Instance* model) = 0;
  virtual void instance_enumerator_destroy(void* enumerator) = 0;
  virtual bool instance_enumerator_more(void* enumerator) = 0;
  virtual void instance_enumerator_next(void* enumerator) = 0;
  virtual Ref<Instance> instance_enumerator_get(void* enumerator) = 0;
  virtual Ref<Instance> get_instance(const char* name_space, const Instance* model) = 0;
  virtual int create_instance(const char* name_space, const Instance* instance) = 0;
  virtual int delete_instance(const char* name_space, const Instance* instance) = 0;
  virtual int modify_instance(const char* name_space, const Instance* instance) = 0;
  virtual int invoke_method(const char* name_space, const Instance* instance, Instance* method) = 0;
  virtual void allow_unload(bool flag) = 0;
  virtual bool get_username(String& name) = 0;

 private:
  Thread_Context* _prev = nullptr;
};

}  // namespace cimrt

/// Aborts with the failed condition's text; for states that only a programming error can reach.
#define CIMRT_ASSERT(COND)                                                                     \
  do {                                                                                         \
    if (!(COND))                                                                               \
      ::cimrt::Thread_Context::__cimrt_assert(__FILE__, __LINE__, __PRETTY_FUNCTION__, #COND); \
  } while (0)
