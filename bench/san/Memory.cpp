#include "Memory.h"

#include <malloc.h>
#include <unistd.h>

#include <fstream>

namespace tvx::bench {

std::size_t allocatedBytes() {
  const auto info = mallinfo2();
  return info.uordblks + info.hblkhd;
}

void returnFreedMemory() {
  malloc_trim(0);
}

std::size_t residentBytes() {
  std::size_t total = 0;
  std::size_t resident = 0;
  std::ifstream("/proc/self/statm") >> total >> resident;
  return resident * static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
}

}  // namespace tvx::bench
