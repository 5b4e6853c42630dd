// A stream whose text a test reads back.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <string>

namespace cimrt::test {

class Captured_Stream {
 public:
  Captured_Stream() : _file(open_memstream(&_data, &_size)) {}
  ~Captured_Stream() {
    std::fclose(_file);
    std::free(_data);
  }
  Captured_Stream(const Captured_Stream&) = delete;
  Captured_Stream& operator=(const Captured_Stream&) = delete;

  std::FILE* file() { return _file; }
  std::string text() {
    std::fflush(_file);
    return {_data, _size};
  }

 private:
  char* _data = nullptr;
  std::size_t _size = 0;
  std::FILE* _file;
};

}  // namespace cimrt::test
