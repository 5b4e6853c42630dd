// What the library's diagnostic numbers mean, in words.
#pragma once

#include <cstdint>

#include "rmapi/rmapi.h"

namespace cimrt {

/// The text that says a test went well.
inline constexpr const char* DIAGNOSTIC_SUCCESS = "Success";

/// The text of a test's result code. It lives as long as the library.
const char* MapDiagResultStatus(std::uint32_t code);
/// The text of a status of the diagnostic entry points. It lives as long as the library.
const char* MapDiagStatus(RM_STATUS status);

}  // namespace cimrt
