#include "Failing_Allocations.h"

#include <link.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <new>

namespace tvx::test {
namespace {

std::atomic<std::uintptr_t> codeBegin{0};
std::atomic<std::uintptr_t> codeEnd{0};
thread_local long left = -1;  // until one fails; negative: none does
thread_local bool failed = false;

bool fails(const void* caller) {
  const auto place = reinterpret_cast<std::uintptr_t>(caller);
  if (left < 0 || place < codeBegin || place >= codeEnd) return false;
  if (left-- > 0) return false;
  failed = true;
  return true;
}

int takeCode(dl_phdr_info* info, std::size_t, void* name) {
  if (std::strcmp(info->dlpi_name, static_cast<const char*>(name)) != 0) return 0;
  for (int i = 0; i < info->dlpi_phnum; ++i) {
    const auto& segment = info->dlpi_phdr[i];
    if (segment.p_type != PT_LOAD || (segment.p_flags & PF_X) == 0) continue;
    codeBegin = info->dlpi_addr + segment.p_vaddr;
    codeEnd = codeBegin + segment.p_memsz;
  }
  return 1;
}

}  // namespace

bool Allocations::watch(const char* library) {
  return dl_iterate_phdr(takeCode, const_cast<char*>(library)) != 0 && codeBegin < codeEnd;
}

void Allocations::failAfter(long number) {
  failed = false;
  left = number;
}

bool Allocations::stop() {
  left = -1;
  return failed;
}

}  // namespace tvx::test

// The program's own; the library's calls come here as well.

void* operator new(std::size_t size) {
  void* memory =
      tvx::test::fails(__builtin_return_address(0)) ? nullptr : std::malloc(size == 0 ? 1 : size);
  if (memory == nullptr) throw std::bad_alloc();
  return memory;
}

void operator delete(void* memory) noexcept {
  std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}
