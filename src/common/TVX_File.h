// Small text files: streams that close themselves, and lines of bounded length.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <cstring>
#include <memory>

namespace cimrt {

struct TVX_Close_File {
  void operator()(std::FILE* stream) const { std::fclose(stream); }
};

/// A stream that closes itself; null if the open failed.
using TVX_File = std::unique_ptr<std::FILE, TVX_Close_File>;

/// Opens a file for reading. No child process inherits the descriptor, and a pipe in the file's
/// place is empty while it has no writer: it does not keep the caller waiting.
inline TVX_File tvxOpenFile(const char* path) {
  const int fd = ::open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd < 0) return nullptr;
  TVX_File stream(::fdopen(fd, "r"));
  if (stream == nullptr) ::close(fd);
  return stream;
}

/// Reads one line into `line`, with its line feed if it fits; what is longer is cut off and passed
/// over. The buffer is NUL-filled first. False at the end of the file.
template <std::size_t N>
bool tvxReadLine(std::FILE* stream, std::array<char, N>& line) {
  line.fill('\0');
  if (std::fgets(line.data(), static_cast<int>(N), stream) == nullptr) return false;
  if (std::memchr(line.data(), '\n', N) != nullptr) return true;
  for (int c = std::fgetc(stream); c != '\n' && c != EOF; c = std::fgetc(stream)) {
  }
  return true;
}

}  // namespace cimrt
