#include "runtime/Lasting.h"

#include <atomic>

namespace cimrt {

namespace {

constinit std::atomic<unsigned> at_work{0};

}  // namespace

At_Work::At_Work() noexcept {
  at_work.fetch_add(1);
}

At_Work::~At_Work() {
  at_work.fetch_sub(1);
}

bool At_Work::any() noexcept {
  return at_work.load() != 0;
}

}  // namespace cimrt
