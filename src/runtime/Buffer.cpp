#include "runtime/Buffer.h"

#include <bit>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <vector>

namespace cimrt {
namespace {

constexpr std::size_t MIN_CAPACITY = 4096;

/// First guess of the room that one formatted text takes.
constexpr std::size_t FIRST_GUESS = 128;
/// A text that still cannot be formatted into this room never will be: its arguments are bad.
constexpr std::size_t LARGEST_BLIND_GUESS = std::size_t{1} << 20;

std::size_t insert_capacity(std::size_t n) {
  return n < MIN_CAPACITY ? MIN_CAPACITY : std::bit_ceil(n);
}

char* allocate(std::size_t capacity) {
  auto* block = static_cast<char*>(std::malloc(capacity + 1));
  if (!block) throw std::bad_alloc();
  return block;
}

void copy_bytes(char* to, const void* from, std::size_t n) {
  if (n != 0) std::memcpy(to, from, n);
}

template <class T>
void append_decimal(Buffer& buffer, T value) {
  char digits[20];
  char* first = digits + sizeof digits;
  T rest = value;
  do {
    *--first = static_cast<char>('0' + rest % 10);
    rest = static_cast<T>(rest / 10);
  } while (rest != 0);
  buffer.append(first, static_cast<std::size_t>(digits + sizeof digits - first));
}

}  // namespace

Buffer::Buffer(const Buffer& other) {
  if (other._size == 0) return;
  _data = allocate(other._size);
  _capacity = other._size;
  _size = other._size;
  std::memcpy(_data, other._data, _size);
}

Buffer& Buffer::operator=(const Buffer& other) {
  if (this == &other) return *this;
  Buffer copy(other);
  std::swap(_data, copy._data);
  std::swap(_size, copy._size);
  std::swap(_capacity, copy._capacity);
  return *this;
}

Buffer::~Buffer() {
  std::free(_data);
}

void Buffer::reserve(std::size_t n) {
  if (n < MIN_CAPACITY) n = MIN_CAPACITY;
  if (n <= _capacity) return;
  auto* block = static_cast<char*>(std::realloc(_data, n + 1));
  if (!block) throw std::bad_alloc();
  _data = block;
  _capacity = n;
}

void Buffer::grow() {
  reserve(_capacity == 0 ? MIN_CAPACITY : _capacity * 2);
}

void Buffer::insert(std::size_t pos, const void* data, std::size_t n) {
  if (n == 0) return;
  if (pos > _size) pos = _size;
  const std::size_t new_size = _size + n;
  if (new_size > _capacity) {
    insert_into_new_block(pos, data, n);
    return;
  }
  const auto* bytes = static_cast<const char*>(data);
  std::vector<char> own;
  if (bytes >= _data && bytes < _data + _size) {
    own.assign(bytes, bytes + n);
    bytes = own.data();
  }
  std::memmove(_data + pos + n, _data + pos, _size - pos);
  std::memcpy(_data + pos, bytes, n);
  _size = new_size;
}

void Buffer::insert_into_new_block(std::size_t pos, const void* data, std::size_t n) {
  const std::size_t capacity = insert_capacity(_size + n);
  char* block = allocate(capacity);
  copy_bytes(block, _data, pos);
  copy_bytes(block + pos, data, n);
  copy_bytes(block + pos + n, _data + pos, _size - pos);
  std::free(_data);
  _data = block;
  _capacity = capacity;
  _size += n;
}

void Buffer::remove(std::size_t pos, std::size_t n) {
  if (pos >= _size) return;
  if (n > _size - pos) n = _size - pos;
  std::memmove(_data + pos, _data + pos + n, _size - pos - n);
  _size -= n;
}

void Buffer::append(char byte) {
  insert(_size, &byte, 1);
}

void Buffer::append(const void* data, std::size_t n) {
  insert(_size, data, n);
}

void Buffer::append_uint16(std::uint16_t value) {
  append_decimal(*this, value);
}

void Buffer::append_uint32(std::uint32_t value) {
  append_decimal(*this, value);
}

void Buffer::append_uint64(std::uint64_t value) {
  append_decimal(*this, value);
}

void Buffer::format(const char* fmt, ...) {
  va_list args;
  va_start(args, fmt);
  vformat(fmt, args);
  va_end(args);
}

void Buffer::vformat(const char* fmt, va_list args) {
  for (std::size_t guess = FIRST_GUESS;;) {
    reserve(_size + guess);
    va_list copy;
    va_copy(copy, args);
    const int wanted = std::vsnprintf(_data + _size, guess, fmt, copy);
    va_end(copy);
    if (wanted < 0) {
      if (guess >= LARGEST_BLIND_GUESS) return;
      guess *= 2;
    } else if (static_cast<std::size_t>(wanted) >= guess) {
      guess = static_cast<std::size_t>(wanted) + 1;
    } else {
      _size += static_cast<std::size_t>(wanted);
      return;
    }
  }
}

const char* Buffer::c_str() {
  if (!_data) reserve(MIN_CAPACITY);
  // NOLINTNEXTLINE(clang-analyzer-core.NullDereference): reserve made the block
  _data[_size] = '\0';
  return _data;
}

}  // namespace cimrt
