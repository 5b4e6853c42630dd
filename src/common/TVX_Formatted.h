// A formatted text that needs no memory unless it is long.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <string_view>

#include "runtime/Buffer.h"

namespace cimrt {

/// What `printf` makes of a format and its arguments. Log lines and names are made by the million,
/// and hardly one of them outgrows the place on the stack. Not copied: it points into itself.
class TVX_Formatted {
 public:
  TVX_Formatted(const char* format, va_list args) __attribute__((format(printf, 2, 0)));
  TVX_Formatted(const TVX_Formatted&) = delete;
  TVX_Formatted& operator=(const TVX_Formatted&) = delete;

  const char* c_str() const { return m_Text.data(); }  ///< ends with a NUL
  std::string_view view() const { return m_Text; }

 private:
  static constexpr std::size_t USUAL_SIZE = 512;

  char m_Usual[USUAL_SIZE];
  Buffer m_Long;
  std::string_view m_Text;
};

}  // namespace cimrt
