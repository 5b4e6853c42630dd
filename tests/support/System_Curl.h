// The system's libcurl in a test program.
#pragma once

#include <dlfcn.h>

namespace tvx::test {

/// Keeps it mapped until the process ends. The libraries under it leave memory behind when they are
/// unloaded, which the leak check would then report without a name.
inline bool keepSystemCurl() {
  return ::dlopen(TVX_SYSTEM_CURL, RTLD_NOW | RTLD_NODELETE) != nullptr;
}

}  // namespace tvx::test
