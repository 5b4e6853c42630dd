// Growable byte buffer with formatted append.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <cstdint>

namespace cimrt {

/// Owns a `malloc`ed block of `capacity() + 1` bytes; the spare byte lets a caller put a NUL behind
/// the contents. Not NUL-terminated by itself.
class Buffer {
 public:
  Buffer() noexcept = default;
  Buffer(const Buffer& other);
  Buffer& operator=(const Buffer& other);
  ~Buffer();

  char* data() noexcept { return _data; }
  const char* data() const noexcept { return _data; }
  std::size_t size() const noexcept { return _size; }
  std::size_t capacity() const noexcept { return _capacity; }

  void reserve(std::size_t n);
  void grow();
  void insert(std::size_t pos, const void* data, std::size_t n);
  void remove(std::size_t pos, std::size_t n);
  void append(char byte);
  void append(const void* data, std::size_t n);
  void append_uint16(std::uint16_t value);
  void append_uint32(std::uint32_t value);
  void append_uint64(std::uint64_t value);
  void format(const char* fmt, ...) __attribute__((format(printf, 2, 3)));
  void vformat(const char* fmt, va_list args) __attribute__((format(printf, 2, 0)));

  /// The contents with a NUL put behind them (in the spare byte); never null.
  const char* c_str();

 private:
  char* _data = nullptr;
  std::size_t _size = 0;
  std::size_t _capacity = 0;
};

}  // namespace cimrt
