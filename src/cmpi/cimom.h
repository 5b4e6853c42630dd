// Up-calls: what provider code asks of the CIM server that it runs in.
#pragma once

#include "runtime/Array.h"
#include "runtime/Instance.h"

namespace cimrt {

/// Walks the instances that a server answered. One thread's; to be destroyed in the thread, and
/// inside the request, that filled it.
class Instance_Enumerator {
 public:
  Instance_Enumerator() = default;
  ~Instance_Enumerator();
  Instance_Enumerator(const Instance_Enumerator&) = delete;
  Instance_Enumerator& operator=(const Instance_Enumerator&) = delete;

  /// True while there is a current instance; false on a thread without a context.
  bool more() const;
  /// Moves to the next instance; nothing on a thread without a context.
  void next();
  /// The current instance (a reference of the caller's own), or null at the end.
  Ref<Instance> get() const;

 private:
  friend class cimom;
  void* _enumerator = nullptr;  ///< the context's record, destroyed by it
};

/// Static up-calls. Each asks the calling thread's top `Thread_Context`; on a thread without one
/// every call fails in the way told with it. Namespaces and instances are passed on as given, none
/// may be null, and stay the caller's. The server may take any time, and may call other classes of
/// this provider meanwhile, so no agent lock should be held.
class cimom {
 public:
  /// Name of the user behind the request into `name`. False, with `name` as it was, when the server
  /// does not tell or there is no context.
  static bool get_username(String& name);

  /// Forbids (false) or allows (true) the unloading of the class's provider at an idle clean-up.
  static void allow_unload(bool flag);

  /// The instance that has the keys of `model`; null if there is none, on any failure, and without
  /// a context.
  static Ref<Instance> get_instance(const char* name_space, const Instance* model);

  /// 0, or -1 on any failure and without a context.
  static int create_instance(const char* name_space, const Instance* instance);
  static int delete_instance(const char* name_space, const Instance* instance);
  static int modify_instance(const char* name_space, const Instance* instance);

  /// Calls a method on `instance`: `method` is a call record with its In parameters set; its Out
  /// parameters and "return_value" are filled. 0, or -1 on any failure and without a context.
  static int invoke_method(const char* name_space, const Instance* instance, Instance* method);

  /// Starts an enumeration of the class of `model`. What `enumerator` held before is destroyed. 0,
  /// or -1 if the server refused, or without a context.
  static int enum_instances(const char* name_space, const Instance* model,
                            Instance_Enumerator& enumerator);

  /// Not available: prints "NOT IMPLEMENTED." and aborts.
  static int enum_instances(const char* name_space, const Instance* model,
                            Array<Instance>& instances);
};

}  // namespace cimrt
