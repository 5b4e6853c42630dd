#include "common/TVX_Memory.h"

#include <atomic>

namespace cimrt {

namespace {

/// No list of a library is as long as this. A count that wants more is nonsense, and the system
/// might well promise that much and end the process once it is written to.
constexpr std::size_t MOST_BYTES = std::size_t{512} << 20;

std::atomic<TVX_Allocate_Function> installed{nullptr};

}  // namespace

TVX_Block tvxAllocate(std::size_t size) {
  if (size > MOST_BYTES) return nullptr;
  const TVX_Allocate_Function allocate = installed.load(std::memory_order_acquire);
  void* block = allocate != nullptr ? allocate(size) : std::calloc(1, size != 0 ? size : 1);
  return TVX_Block(static_cast<std::uint8_t*>(block));
}

void tvxSetAllocator(TVX_Allocate_Function allocate) {
  installed.store(allocate, std::memory_order_release);
}

}  // namespace cimrt
