// Texts of the map builders.
#pragma once

#include <string>

namespace cimrt {

/// Formats a text as `printf` does.
std::string formatText(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace cimrt
