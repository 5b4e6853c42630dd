// Writing into the fixed fields and buffers of a caller, under the faults of the call.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "state/Fault.h"

namespace tvx::sim {

/// Fills a text field of `room` bytes: the text, cut if need be, and zeros behind it; or, under the
/// fault of unterminated texts, the text and "x" up to the very end.
inline void write_text(char* field, std::size_t room, std::string_view text,
                       const Fault_Effect& effect) {
  if (room == 0) return;
  std::memset(field, effect.unterminated ? 'x' : 0, room);
  const std::size_t most = effect.unterminated ? room : room - 1;
  text.copy(field, std::min(most, text.size()));
}

/// Fills a buffer with a pattern that is no sensible content, as the garbage fault asks.
inline void write_garbage(void* buffer, std::size_t room) {
  auto* out = static_cast<std::uint8_t*>(buffer);
  for (std::size_t i = 0; i < room; ++i) out[i] = static_cast<std::uint8_t>(0xA5 ^ (i * 37));
}

/// Copies `size` bytes into a buffer of `room`, fewer under the fault that cuts what is written,
/// a pattern under the garbage fault. Answers how many bytes were written.
inline std::size_t write_bytes(void* buffer, std::size_t room, const void* bytes, std::size_t size,
                               const Fault_Effect& effect) {
  std::size_t written = std::min(room, size);
  if (effect.truncated) written = std::min(written, *effect.truncated);
  if (effect.garbage) {
    write_garbage(buffer, room);
  } else if (written != 0) {
    std::memcpy(buffer, bytes, written);
  }
  return written;
}

}  // namespace tvx::sim
