// Calls between the provider's own parts that no adapter and no client can make fail. The linker
// puts a gate before them, so that what comes after their failure can be seen too.
#pragma once

#include <functional>

#include "runtime/Instance_Map.h"

namespace cimrt::test {

/// True for the device ids that can't be made a name of.
using Refuse_Name = std::function<bool(const char* deviceID)>;
/// True for the instances that their map doesn't take.
using Refuse_Insert = std::function<bool(const Instance& instance)>;

/// Refuses while it lives. One at a time, on one thread.
class Refused_Calls {
 public:
  explicit Refused_Calls(Refuse_Name name, Refuse_Insert insert = {});
  ~Refused_Calls();
  Refused_Calls(const Refused_Calls&) = delete;
  Refused_Calls& operator=(const Refused_Calls&) = delete;
};

}  // namespace cimrt::test
