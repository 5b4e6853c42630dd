// What becomes of the blocks of `operator new`: a lack of memory for one kind of object, and the
// order in which objects go.
#pragma once

#include <cstddef>
#include <vector>

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

/// Notes, while it lives, in which order this thread frees certain blocks.
class Freed_Order {
 public:
  explicit Freed_Order(std::vector<const void*> blocks);
  ~Freed_Order();
  Freed_Order(const Freed_Order&) = delete;
  Freed_Order& operator=(const Freed_Order&) = delete;

  /// Positions of the freed ones in the list, the first freed first.
  const std::vector<std::size_t>& freed() const { return m_Freed; }

 private:
  std::vector<const void*> m_Blocks;
  std::vector<std::size_t> m_Freed;
};

}  // namespace cimrt::test
