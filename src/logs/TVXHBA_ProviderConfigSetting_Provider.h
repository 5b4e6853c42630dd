// Changes of the settings of the provider's cache.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_ProviderConfigSetting_Provider {
 public:
  /// Takes `current` of the instance over into the settings, the running agent and the map's entry.
  /// Waits for the adapter maps and holds the agent's data lock. A value out of range changes
  /// nothing.
  /// @param model has `current` set if it is to be changed
  std::int32_t modify_instance(const TVXHBA_ProviderConfigSetting* model,
                               const TVXHBA_ProviderConfigSetting* instance);
};

}  // namespace cimrt
