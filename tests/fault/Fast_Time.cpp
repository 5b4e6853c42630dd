// Time that passes as fast as it is slept: this program's own select and gettimeofday take the
// place of the system's for everything in the process, the libraries opened at run time included.
#include <dlfcn.h>
#include <sys/select.h>
#include <sys/time.h>

#include <atomic>
#include <cstdint>
#include <ctime>

namespace {

std::atomic<std::int64_t> sleptMicroseconds{0};
constexpr std::int64_t SECOND = 1000000;

using Select = int (*)(int, fd_set*, fd_set*, fd_set*, timeval*);

Select systemsSelect() {
  static const Select found = reinterpret_cast<Select>(dlsym(RTLD_NEXT, "select"));
  return found;
}

}  // namespace

extern "C" {

/// A wait for nothing but time is over at once.
[[gnu::visibility("default")]] int select(int count, fd_set* read, fd_set* write, fd_set* except,
                                          timeval* timeout) {
  if (count > 0 || timeout == nullptr) return systemsSelect()(count, read, write, except, timeout);
  sleptMicroseconds += timeout->tv_sec * SECOND + timeout->tv_usec;
  return 0;
}

[[gnu::visibility("default")]] int gettimeofday(timeval* time, void* zone) noexcept {
  timespec now = {};
  clock_gettime(CLOCK_REALTIME, &now);
  const std::int64_t shifted = now.tv_sec * SECOND + now.tv_nsec / 1000 + sleptMicroseconds.load();
  time->tv_sec = shifted / SECOND;
  time->tv_usec = shifted % SECOND;
  if (zone != nullptr) *static_cast<struct timezone*>(zone) = {};
  return 0;
}

}  // extern "C"
