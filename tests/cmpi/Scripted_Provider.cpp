#include "Scripted_Provider.h"

#include <algorithm>

namespace cimrt::test {

namespace {

/// Opaque object that stands for the provider.
struct Provider_Object {
  int dummy = 0;
};

struct Arguments {
  void* all[8];

  template <class T>
  T* at(int i) const {
    return static_cast<T*>(all[i]);
  }
  Instance_Handler handler(int i) const {
    return {reinterpret_cast<Instance_Proc>(all[i]), all[i + 1]};
  }
  const String& text(int i) const { return *at<const String>(i); }
};

std::int32_t unsupported(std::uint32_t operation) {
  switch (operation) {
    case OPERATION_GET_INSTANCE:
      return GET_INSTANCE_UNSUPPORTED;
    case OPERATION_CREATE_INSTANCE:
      return CREATE_INSTANCE_UNSUPPORTED;
    case OPERATION_DELETE_INSTANCE:
      return DELETE_INSTANCE_UNSUPPORTED;
    case OPERATION_MODIFY_INSTANCE:
      return MODIFY_INSTANCE_UNSUPPORTED;
    case OPERATION_INVOKE_METHOD:
      return INVOKE_METHOD_UNSUPPORTED;
    case OPERATION_ENUM_ASSOCIATOR_NAMES:
      return ENUM_ASSOCIATOR_NAMES_UNSUPPORTED;
    case OPERATION_ENUM_REFERENCES:
      return ENUM_REFERENCES_UNSUPPORTED;
    case OPERATION_ENUM_ASSOCIATORS:
      return ENUM_ASSOCIATORS_UNSUPPORTED;
    default:
      return 0;
  }
}

/// As every dispatcher does: the end call carries the status, unless the provider passes.
std::int32_t end_of(std::int32_t status, std::uint32_t operation, const Instance_Handler& handler) {
  if (operation == OPERATION_ENUM_INSTANCES || status != unsupported(operation))
    handler.handle(nullptr, status);
  return status;
}

std::int32_t manage(Script& script, std::uint32_t operation, const Arguments& args) {
  switch (operation) {
    case OPERATION_GET_META_CLASS:
      *args.at<const Meta_Class*>(0) = script.meta_class;
      return 0;
    case OPERATION_CREATE_PROVIDER:
      if (script.on_create) script.on_create();
      *args.at<void*>(0) = new Provider_Object();
      return 0;
    case OPERATION_DESTROY_PROVIDER:
      delete args.at<Provider_Object>(0);
      return 0;
    case OPERATION_LOAD:
      return script.on_load ? script.on_load() : 0;
    case OPERATION_UNLOAD:
      return script.on_unload ? script.on_unload() : 0;
    case OPERATION_GET_REPOSITORY:
      *args.at<const Meta_Repository*>(0) = script.meta_class->meta_repository;
      return 0;
    case OPERATION_ENABLE_INDICATIONS:
      return script.enable
                 ? script.enable(reinterpret_cast<Instance_Proc>(args.all[1]), args.all[2])
                 : 0;
    default:
      return 0;
  }
}

std::int32_t answer(Script& script, std::uint32_t operation, const Arguments& args) {
  const auto set = script.statuses.find(operation);
  const std::int32_t status = set == script.statuses.end() ? unsupported(operation) : set->second;
  switch (operation) {
    case OPERATION_GET_INSTANCE:
      return script.get ? script.get(args.at<Instance>(1), *args.at<Instance*>(2)) : status;
    case OPERATION_CREATE_INSTANCE:
      return script.create ? script.create(args.at<Instance>(1)) : status;
    case OPERATION_DELETE_INSTANCE:
      return script.erase ? script.erase(args.at<Instance>(1)) : status;
    case OPERATION_MODIFY_INSTANCE:
      return script.modify ? script.modify(args.at<Instance>(1), args.at<Instance>(2)) : status;
    case OPERATION_INVOKE_METHOD:
      return script.invoke ? script.invoke(args.at<Instance>(1), args.at<Instance>(2)) : status;
    default:
      return set == script.statuses.end() ? manage(script, operation, args) : status;
  }
}

std::int32_t enumerate(Script& script, std::uint32_t operation, const Arguments& args) {
  const auto set = script.statuses.find(operation);
  std::int32_t status = set == script.statuses.end() ? unsupported(operation) : set->second;
  const int last = operation == OPERATION_ENUM_INSTANCES    ? 2
                   : operation == OPERATION_ENUM_REFERENCES ? 4
                                                            : 5;
  const Instance_Handler handler = args.handler(last);
  const Instance* source = args.at<Instance>(1);
  if (operation == OPERATION_ENUM_INSTANCES && script.enumerate)
    status = script.enumerate(source, handler);
  if (operation == OPERATION_ENUM_REFERENCES && script.references)
    status = script.references(source, args.at<Instance>(2), args.text(3), handler);
  if (operation == OPERATION_ENUM_ASSOCIATOR_NAMES && script.associator_names)
    status = script.associator_names(source, args.text(2), args.text(3), args.text(4), handler);
  if (operation == OPERATION_ENUM_ASSOCIATORS && script.associators)
    status = script.associators(source, args.text(2), args.text(3), args.text(4), handler);
  return end_of(status, operation, handler);
}

}  // namespace

std::size_t Script::count(std::uint32_t operation) {
  const std::lock_guard guard(mutex);
  return static_cast<std::size_t>(std::count(calls.begin(), calls.end(), operation));
}

std::vector<std::uint32_t> Script::work() {
  const std::lock_guard guard(mutex);
  std::vector<std::uint32_t> result;
  for (const std::uint32_t call : calls)
    if (call != OPERATION_GET_META_CLASS && call != OPERATION_GET_REPOSITORY)
      result.push_back(call);
  return result;
}

std::int32_t scripted_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                           void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                           void* arg7) {
  Script& script = *static_cast<const Scripted_Registration*>(registration)->script;
  {
    const std::lock_guard guard(script.mutex);
    script.calls.push_back(operation);
  }
  const Arguments args = {{arg0, arg1, arg2, arg3, arg4, arg5, arg6, arg7}};
  switch (operation) {
    case OPERATION_ENUM_INSTANCES:
    case OPERATION_ENUM_ASSOCIATOR_NAMES:
    case OPERATION_ENUM_REFERENCES:
    case OPERATION_ENUM_ASSOCIATORS:
      return enumerate(script, operation, args);
    default:
      return operation > OPERATION_ENUM_ASSOCIATORS ? -1 : answer(script, operation, args);
  }
}

}  // namespace cimrt::test
