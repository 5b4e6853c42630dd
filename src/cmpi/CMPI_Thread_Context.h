// Context of one request, or of one thread that a request started: what up-calls go through.
#pragma once

#include <atomic>
#include <memory>

#include "cmpi/cmpidt.h"
#include "runtime/Thread_Context.h"

namespace cimrt {

class CMPI_Adapter;

/// Flag that a provider clears to forbid its unloading; shared with the contexts of threads that
/// may outlive the adapter.
using Unload_Flag = std::shared_ptr<std::atomic<bool>>;

/// Made with `new` by the frame that pushes it, or for a new thread by `thread_create_hook`, and
/// deleted by the same. Used by its own thread only.
class CMPI_Thread_Context final : public Thread_Context {
 public:
  CMPI_Thread_Context(const CMPIBroker* broker, const CMPIContext* context, CMPI_Adapter* adapter);

  const CMPIBroker* broker() const { return _broker; }
  const CMPIContext* context() const { return _context; }

  Thread_Context* thread_create_hook(void* arg) override;
  void thread_start_hook() override;
  void thread_exit_hook() override;
  void* instance_enumerator_create(const char* name_space, const Instance* model) override;
  void instance_enumerator_destroy(void* enumerator) override;
  bool instance_enumerator_more(void* enumerator) override;
  void instance_enumerator_next(void* enumerator) override;
  Ref<Instance> instance_enumerator_get(void* enumerator) override;
  Ref<Instance> get_instance(const char* name_space, const Instance* model) override;
  int create_instance(const char* name_space, const Instance* instance) override;
  int delete_instance(const char* name_space, const Instance* instance) override;
  int modify_instance(const char* name_space, const Instance* instance) override;
  int invoke_method(const char* name_space, const Instance* instance, Instance* method) override;
  void allow_unload(bool flag) override;
  bool get_username(String& name) override;

 private:
  CMPI_Thread_Context(const CMPIBroker* broker, const CMPIContext* context, CMPI_Adapter* adapter,
                      Unload_Flag allow_unload);
  /// True if there is a server to call and neither argument is null.
  bool can_call(const char* name_space, const Instance* instance) const;

  const CMPIBroker* _broker;
  const CMPIContext* _context;
  CMPI_Adapter* _adapter;  ///< passed on to new threads only, which may outlive it
  Unload_Flag _allow_unload;
};

}  // namespace cimrt
