// Growable byte buffer with formatted append.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <cstdint>

namespace cimrt {

/// Copies are deep and of exact size. Owns a `malloc`ed block of `capacity() + 1` bytes; the spare
/// byte lets a caller put a NUL behind the contents. Not NUL-terminated by itself.
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

  /// Makes room for exactly `n` bytes (at least 4096) if there is less.
  void reserve(std::size_t n);
  /// Doubles the capacity; an empty buffer gets 4096.
  void grow();
  /// Puts `n` bytes in front of position `pos` (a position behind the end means the end). When they
  /// do not fit, the capacity becomes the next power of two. `data` may lie in this buffer.
  void insert(std::size_t pos, const void* data, std::size_t n);
  /// Takes out `n` bytes from `pos` on, or as many as there are.
  void remove(std::size_t pos, std::size_t n);
  void append(char byte);
  void append(const void* data, std::size_t n);
  /// Decimal text of the value.
  void append_uint16(std::uint16_t value);
  void append_uint32(std::uint32_t value);
  void append_uint64(std::uint64_t value);
  /// Appends printf-style text, without its NUL. Arguments that cannot be formatted append nothing.
  void format(const char* fmt, ...) __attribute__((format(printf, 2, 3)));
  void vformat(const char* fmt, va_list args) __attribute__((format(printf, 2, 0)));

  /// The contents with a NUL put behind them (in the spare byte); never null.
  const char* c_str();

 private:
  void insert_into_new_block(std::size_t pos, const void* data, std::size_t n);

  char* _data = nullptr;
  std::size_t _size = 0;
  std::size_t _capacity = 0;
};

}  // namespace cimrt
