// Buffers handed to foreign libraries.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <memory>

namespace cimrt {

struct TVX_Free {
  void operator()(void* block) const { std::free(block); }
};

/// A block of `calloc`, freed with `free`; null when memory ran out.
using TVX_Block = std::unique_ptr<std::uint8_t, TVX_Free>;

/// A zeroed block of that size, aligned for any type; null when memory ran out, or for over 512
/// MiB.
TVX_Block tvxAllocate(std::size_t size);

/// Gives zeroed memory from `calloc`, or null.
using TVX_Allocate_Function = void* (*)(std::size_t size);

/// Installs what `tvxAllocate` takes memory from; null goes back to `calloc`. For tests.
void tvxSetAllocator(TVX_Allocate_Function allocate);

}  // namespace cimrt
