// A lack of memory for one kind of object.
#pragma once

#include <cstddef>

namespace cimrt::test {

/// While it lives, `operator new` refuses this thread blocks of exactly that size, after letting
/// `spare` of them through.
class Failing_New {
 public:
  explicit Failing_New(std::size_t size, int spare = 0);
  ~Failing_New();
  Failing_New(const Failing_New&) = delete;
  Failing_New& operator=(const Failing_New&) = delete;
};

}  // namespace cimrt::test
