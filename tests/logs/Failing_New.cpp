#include "Failing_New.h"

#include <algorithm>
#include <cstdlib>
#include <new>
#include <utility>

namespace {

thread_local std::size_t refusedSize = 0;
thread_local int sparedBlocks = 0;

thread_local const std::vector<const void*>* watchedBlocks = nullptr;
thread_local std::vector<std::size_t>* freedBlocks = nullptr;

void release(void* block) {
  if (watchedBlocks && block) {
    const auto found = std::find(watchedBlocks->begin(), watchedBlocks->end(), block);
    if (found != watchedBlocks->end())
      freedBlocks->push_back(static_cast<std::size_t>(found - watchedBlocks->begin()));
  }
  std::free(block);
}

}  // namespace

void* operator new(std::size_t size) {
  if (size != 0 && size == refusedSize && sparedBlocks-- <= 0) throw std::bad_alloc();
  if (void* block = std::malloc(size == 0 ? 1 : size)) return block;
  throw std::bad_alloc();
}

void operator delete(void* block) noexcept {
  release(block);
}

void operator delete(void* block, std::size_t) noexcept {
  release(block);
}

namespace cimrt::test {

Failing_New::Failing_New(std::size_t size, int spare) {
  refusedSize = size;
  sparedBlocks = spare;
}

Failing_New::~Failing_New() {
  refusedSize = 0;
}

Freed_Order::Freed_Order(std::vector<const void*> blocks) : m_Blocks(std::move(blocks)) {
  m_Freed.reserve(2 * m_Blocks.size());  // no block may be asked for while one is freed
  freedBlocks = &m_Freed;
  watchedBlocks = &m_Blocks;
}

Freed_Order::~Freed_Order() {
  watchedBlocks = nullptr;
}

}  // namespace cimrt::test
