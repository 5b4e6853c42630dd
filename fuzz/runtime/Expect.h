// How a fuzz target states what must hold.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace cimrt::fuzz {

/// Stops the run with a finding unless `holds`.
inline void expect(bool holds) {
  if (!holds) __builtin_trap();
}

/// The input as a text that ends exactly where its block ends, so that a read past it is seen.
inline std::string text_of(const std::uint8_t* data, std::size_t size) {
  std::string text(reinterpret_cast<const char*>(data), size);
  text.resize(text.find('\0') == std::string::npos ? text.size() : text.find('\0'));
  text.shrink_to_fit();
  return text;
}

}  // namespace cimrt::fuzz
