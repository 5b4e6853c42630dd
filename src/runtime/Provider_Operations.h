// What the CIM server boundary and a class provider agree on: registrations, operation codes,
// status numbers and the handler through which instances are delivered.
#pragma once

#include <cstdint>

#include "runtime/Instance.h"

namespace cimrt {

struct Registration;

/// Entry of a class: one operation code, then up to eight arguments whose meaning depends on it.
using Provider_Proc = std::int32_t (*)(const Registration* registration, std::uint32_t operation,
                                       void* arg0, void* arg1, void* arg2, void* arg3, void* arg4,
                                       void* arg5, void* arg6, void* arg7);

/// One provider class; the records form a single list.
struct Registration {
  const char* module_name;
  const char* provider_name;
  Provider_Proc provider_proc;
  const Meta_Class* meta_class;
  const Registration* next;  ///< the record built before this one
};

enum Operation : std::uint32_t {
  OPERATION_GET_META_CLASS = 0,
  OPERATION_CREATE_PROVIDER = 1,
  OPERATION_DESTROY_PROVIDER = 2,
  OPERATION_LOAD = 3,
  OPERATION_UNLOAD = 4,
  OPERATION_GET_INSTANCE = 5,
  OPERATION_ENUM_INSTANCES = 6,
  OPERATION_CREATE_INSTANCE = 7,
  OPERATION_DELETE_INSTANCE = 8,
  OPERATION_MODIFY_INSTANCE = 9,
  OPERATION_INVOKE_METHOD = 10,
  OPERATION_ENABLE_INDICATIONS = 11,
  OPERATION_DISABLE_INDICATIONS = 12,
  OPERATION_GET_REPOSITORY = 13,
  OPERATION_ENUM_ASSOCIATOR_NAMES = 14,
  OPERATION_ENUM_REFERENCES = 15,
  OPERATION_ENUM_ASSOCIATORS = 16,
};

enum Provider_Status : std::int32_t {
  LOAD_OK = 0,
  UNLOAD_OK = 0,
  LOAD_FAILED = 30,
  GET_INSTANCE_OK = 0,
  GET_INSTANCE_NOT_FOUND = 60,
  GET_INSTANCE_UNSUPPORTED = 61,
  GET_INSTANCE_INVALID_PARAMETER = 62,
  GET_INSTANCE_ACCESS_DENIED = 63,
  GET_INSTANCE_FAILED = 64,
  ENUM_INSTANCES_OK = 0,
  ENUM_INSTANCES_FAILED = 70,
  ENUM_INSTANCES_ACCESS_DENIED = 71,
  CREATE_INSTANCE_OK = 0,
  CREATE_INSTANCE_DUPLICATE = 80,
  CREATE_INSTANCE_UNSUPPORTED = 81,
  CREATE_INSTANCE_INVALID_PARAMETER = 82,
  CREATE_INSTANCE_ACCESS_DENIED = 83,
  CREATE_INSTANCE_FAILED = 84,
  DELETE_INSTANCE_OK = 0,
  DELETE_INSTANCE_NOT_FOUND = 90,
  DELETE_INSTANCE_UNSUPPORTED = 91,
  DELETE_INSTANCE_ACCESS_DENIED = 92,
  DELETE_INSTANCE_FAILED = 93,
  MODIFY_INSTANCE_OK = 0,
  MODIFY_INSTANCE_NOT_FOUND = 100,
  MODIFY_INSTANCE_UNSUPPORTED = 101,
  MODIFY_INSTANCE_INVALID_PARAMETER = 102,
  MODIFY_INSTANCE_ACCESS_DENIED = 103,
  MODIFY_INSTANCE_FAILED = 104,
  ENUM_ASSOCIATOR_NAMES_OK = 0,
  ENUM_ASSOCIATOR_NAMES_FAILED = 110,
  ENUM_ASSOCIATOR_NAMES_UNSUPPORTED = 111,
  ENUM_ASSOCIATOR_NAMES_ACCESS_DENIED = 112,
  ENUM_REFERENCES_OK = 0,
  ENUM_REFERENCES_FAILED = 120,
  ENUM_REFERENCES_UNSUPPORTED = 121,
  ENUM_REFERENCES_ACCESS_DENIED = 122,
  INVOKE_METHOD_OK = 0,
  INVOKE_METHOD_FAILED = 130,
  INVOKE_METHOD_UNSUPPORTED = 131,
  INVOKE_METHOD_ACCESS_DENIED = 132,
  ENABLE_INDICATIONS_FAILED = 140,
  DISABLE_INDICATIONS_FAILED = 150,
  ENUM_ASSOCIATORS_OK = 0,
  ENUM_ASSOCIATORS_FAILED = 170,
  ENUM_ASSOCIATORS_UNSUPPORTED = 171,
  ENUM_ASSOCIATORS_ACCESS_DENIED = 172,
};

/// Receives one delivered instance, which it takes over, or null with the final status at the end.
/// False tells the provider to stop.
using Instance_Proc = bool (*)(Instance* instance, std::int32_t status, void* client_data);

/// Callback and client data through which a provider delivers results.
struct Instance_Handler {
  Instance_Proc proc;
  void* client_data;

  bool handle(Instance* instance, std::int32_t status = 0) const {
    return proc(instance, status, client_data);
  }
};

}  // namespace cimrt
