// A class provider whose answers a test sets, behind a real registration and dispatcher.
#pragma once

#include <functional>
#include <map>
#include <mutex>
#include <vector>

#include "cmpi/CMPI_Adapter.h"
#include "runtime/Provider_Operations.h"

namespace cimrt::test {

/// What a provider does. An operation without an action answers its status out of `statuses`, or
/// "unsupported" of its family.
struct Script {
  const Meta_Class* meta_class = nullptr;

  std::function<std::int32_t(const Instance* model, Instance*& out)> get;
  std::function<std::int32_t(const Instance* model, const Instance_Handler& handler)> enumerate;
  std::function<std::int32_t(Instance* instance)> create;
  std::function<std::int32_t(const Instance* model)> erase;
  std::function<std::int32_t(const Instance* model, const Instance* instance)> modify;
  std::function<std::int32_t(const Instance* instance, Instance* record)> invoke;
  std::function<std::int32_t(const Instance* source, const String& result_class, const String& role,
                             const String& result_role, const Instance_Handler& handler)>
      associator_names;
  std::function<std::int32_t(const Instance* source, const Instance* model, const String& role,
                             const Instance_Handler& handler)>
      references;
  std::function<std::int32_t(const Instance* source, const String& result_class, const String& role,
                             const String& result_role, const Instance_Handler& handler)>
      associators;
  std::function<std::int32_t()> on_create;
  std::function<std::int32_t()> on_load;
  std::function<std::int32_t()> on_unload;
  std::function<std::int32_t(Instance_Proc proc, void* client_data)> enable;

  std::map<std::uint32_t, std::int32_t> statuses;
  std::vector<std::uint32_t> calls;  ///< every operation code, in order
  std::mutex mutex;                  ///< over `calls`

  /// How often an operation was called.
  std::size_t count(std::uint32_t operation);
  /// The calls without the look-ups of class and repository.
  std::vector<std::uint32_t> work();
};

/// A registration that leads to a script.
struct Scripted_Registration : Registration {
  Script* script;
};

/// Dispatcher of every scripted class.
std::int32_t scripted_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                           void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                           void* arg7);

}  // namespace cimrt::test
