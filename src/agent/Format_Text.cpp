#include "agent/Format_Text.h"

#include <cstdarg>

#include "common/TVX_Formatted.h"

namespace cimrt {

std::string formatText(const char* format, ...) {
  va_list args;
  va_start(args, format);
  const TVX_Formatted text(format, args);
  va_end(args);
  return std::string(text.view());
}

}  // namespace cimrt
