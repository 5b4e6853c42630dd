#include "Refused_Allocation.h"

#include <atomic>
#include <cstdlib>
#include <new>

namespace {

std::atomic<std::size_t> refused{0};

}  // namespace

void* operator new(std::size_t size) {
  void* block = size != 0 && size == refused ? nullptr : std::malloc(size == 0 ? 1 : size);
  if (!block) throw std::bad_alloc();
  return block;
}

void operator delete(void* block) noexcept {
  std::free(block);
}

void operator delete(void* block, std::size_t) noexcept {
  std::free(block);
}

namespace cimrt::test {

Refused_Allocation::Refused_Allocation(std::size_t size) {
  refused = size;
}

Refused_Allocation::~Refused_Allocation() {
  refused = 0;
}

}  // namespace cimrt::test
