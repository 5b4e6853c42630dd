// Providers of the three profile classes that are built on the spot, apart from the agent's maps.
//
// Each delivers through the handler until that answers false, holds no lock of the agent, and
// answers an empty class while the management libraries are not loaded. Everything that they don't
// declare is the skeleton's.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

/// All profiles.
class TVXHBA_RegisteredProfile_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_RegisteredProfile* model,
                              const Instance_Handler& handler);
};

/// "Profile Registration", to each of the profiles that it refers to.
class TVXHBA_ReferencedProfile_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_ReferencedProfile* model,
                              const Instance_Handler& handler);
};

/// The Base Server profile of another provider, to each of the same profiles. Asks the CIM server
/// for it on the calling thread.
class TVXHBA_BaseServerReferencedProfile_Provider {
 public:
  std::int32_t enum_instances(const TVXHBA_BaseServerReferencedProfile* model,
                              const Instance_Handler& handler);
};

}  // namespace cimrt
