// Callbacks through which a provider's results reach the server.
#pragma once

#include "cmpi/CMPI_Object.h"
#include "cmpi/CMPI_Thread_Context.h"
#include "runtime/Instance.h"

namespace cimrt {

/// What the callbacks of one operation need. `error` keeps the first conversion failure, after
/// which nothing more is delivered.
struct Delivery {
  const CMPIBroker* broker;
  const CMPIContext* context;
  const CMPIResult* result;
  const char* name_space;   ///< of the path that the request names
  const char** properties;  ///< property list of the request, or null
  int error = 0;
};

/// Makes the object path of `instance` and returns it to the server: 0 or the conversion's code.
int return_object_path(const Delivery& delivery, const Instance* instance, const char* name_space);

/// Makes a CMPI instance of `instance`, filtered by the property list, and returns it to the
/// server. `path` may be null.
int return_instance(const Delivery& delivery, const Instance* instance, const char* name_space,
                    const CMPIObjectPath* path);

}  // namespace cimrt
