#include "Failing_New.h"

#include <cstdlib>
#include <new>

namespace {

thread_local std::size_t refusedSize = 0;
thread_local int sparedBlocks = 0;

}  // namespace

void* operator new(std::size_t size) {
  if (size != 0 && size == refusedSize && sparedBlocks-- <= 0) throw std::bad_alloc();
  if (void* block = std::malloc(size == 0 ? 1 : size)) return block;
  throw std::bad_alloc();
}

void operator delete(void* block) noexcept {
  std::free(block);
}

void operator delete(void* block, std::size_t) noexcept {
  std::free(block);
}

namespace cimrt::test {

Failing_New::Failing_New(std::size_t size, int spare) {
  refusedSize = size;
  sparedBlocks = spare;
}

Failing_New::~Failing_New() {
  refusedSize = 0;
}

}  // namespace cimrt::test
