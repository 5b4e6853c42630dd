// The instances that show the three settings of the provider's cache.
#pragma once

#include "agent/MapBuild.h"

namespace cimrt {

/// Positions of the settings in their map. A change of a setting goes by these.
enum Setting_Index : std::size_t {
  SETTING_CACHE_TIMEOUT,
  SETTING_ADAPTER_REFRESH,
  SETTING_SAN_REFRESH
};

/// Build step: makes the three instances from the values of the settings file. Fails when one is
/// refused by the map.
std::int32_t buildProviderConfigSettings(Host_Build& host);

}  // namespace cimrt
