// Prefix for the fixed absolute paths of the machine.
#pragma once

#include <string>

namespace cimrt {

/// The path to open for a fixed absolute path such as "/etc/issue": the value of the environment
/// variable TVX_ROOT (empty in a privileged process) followed by `absolute`. Every fixed path of
/// the provider passes through here, except the places where libraries are searched. Null gives
/// the prefix alone. Thread-safe as long as nobody changes the environment.
std::string tvxPath(const char* absolute);

}  // namespace cimrt
