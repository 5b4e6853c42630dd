// Looking for lines in files of any size and any content.
#pragma once

#include <cstddef>
#include <deque>
#include <string>
#include <string_view>

namespace cimrt {

/// How much of one line is kept; the rest of a longer one is passed over, but searched too.
inline constexpr std::size_t TVX_SCANNED_LINE = 64 * 1024;

/// The last `limit` lines of a text file that contain `word` anywhere, oldest first, without their
/// line feeds. Zero bytes are left out of what is kept, since no text value can hold them; all
/// other bytes stay. The file is read once from end to end in bounded memory, and the last line
/// needs no line feed. What cannot be opened or read, and what is no regular file, has no lines;
/// nothing is logged.
std::deque<std::string> tvxLastLinesWith(const char* path, std::string_view word,
                                         std::size_t limit);

}  // namespace cimrt
