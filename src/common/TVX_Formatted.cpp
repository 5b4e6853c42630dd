#include "common/TVX_Formatted.h"

#include <cstdio>

namespace cimrt {

TVX_Formatted::TVX_Formatted(const char* format, va_list args) {
  va_list again;
  va_copy(again, args);
  const int size = std::vsnprintf(m_Usual, sizeof m_Usual, format, args);
  if (size >= 0 && static_cast<std::size_t>(size) < sizeof m_Usual) {
    m_Text = {m_Usual, static_cast<std::size_t>(size)};
  } else {
    m_Long.vformat(format, again);
    m_Text = {m_Long.c_str(), m_Long.size()};
  }
  va_end(again);
}

}  // namespace cimrt
