#include "agent/Format_Text.h"

#include <cstdarg>

#include "runtime/Buffer.h"

namespace cimrt {

std::string formatText(const char* format, ...) {
  Buffer buffer;
  va_list args;
  va_start(args, format);
  buffer.vformat(format, args);
  va_end(args);
  return std::string(buffer.data(), buffer.size());
}

}  // namespace cimrt
