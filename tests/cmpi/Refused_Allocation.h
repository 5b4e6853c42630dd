// Lets allocations of one size fail, for tests of what the library does without memory.
#pragma once

#include <cstddef>

namespace cimrt::test {

/// While it lives, `operator new` of exactly `size` bytes throws std::bad_alloc on every thread.
/// One at a time.
class Refused_Allocation {
 public:
  explicit Refused_Allocation(std::size_t size);
  ~Refused_Allocation();
  Refused_Allocation(const Refused_Allocation&) = delete;
  Refused_Allocation& operator=(const Refused_Allocation&) = delete;
};

}  // namespace cimrt::test
