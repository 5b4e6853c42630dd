// The instances of the dump service: the service, and the settings of every port's dumps.
#pragma once

#include <cstdint>

#include "agent/ProviderAgent.h"

namespace cimrt {

/// Results of a failed build.
inline constexpr std::int32_t DUMP_INSERT_FAILED = 32769;
inline constexpr std::int32_t DUMP_NO_INSTANCE = 40008;

/// Fills the maps of the dump classes: the service with its host, and for each port controller what
/// the library says of its dumps. A directory or count that can't be read is empty or 0. The caller
/// holds the agent's data lock.
/// @return 0, or one of the results above with the maps as far as they got
std::int32_t FC_CreateDumpClasses(ProviderAgent& agent);

/// Empties these maps. Always 0. The caller holds the agent's data lock.
std::int32_t FC_ClearDumpClasses(ProviderAgent& agent);

}  // namespace cimrt
