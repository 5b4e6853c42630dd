#include "Library_Blocks.h"

#include <link.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <new>

namespace {

std::atomic<std::uintptr_t> code_begin{0};
std::atomic<std::uintptr_t> code_end{0};
std::atomic<std::size_t> live_blocks{0};

thread_local long left = -1;  // until one fails; negative: none does
thread_local bool failed = false;

bool fails() {
  if (left < 0 || left-- > 0) return false;
  failed = true;
  return true;
}

/// Stands before every block.
struct alignas(std::max_align_t) Head {
  bool counted;
};

bool asked_by_library(const void* caller) {
  const auto place = reinterpret_cast<std::uintptr_t>(caller);
  return place >= code_begin && place < code_end;
}

int take_code(dl_phdr_info* info, std::size_t, void* name) {
  if (std::strcmp(info->dlpi_name, static_cast<const char*>(name)) != 0) return 0;
  for (int i = 0; i < info->dlpi_phnum; ++i) {
    const auto& segment = info->dlpi_phdr[i];
    if (segment.p_type != PT_LOAD || (segment.p_flags & PF_X) == 0) continue;
    code_begin = info->dlpi_addr + segment.p_vaddr;
    code_end = code_begin + segment.p_memsz;
  }
  return 1;
}

}  // namespace

namespace cimrt::test {

bool Library_Blocks::watch(const char* library) {
  return dl_iterate_phdr(take_code, const_cast<char*>(library)) != 0 && code_begin < code_end;
}

void Library_Blocks::fail_after(long number) {
  failed = false;
  left = number;
}

bool Library_Blocks::stop() {
  left = -1;
  return failed;
}

std::size_t Library_Blocks::live() {
  return live_blocks;
}

}  // namespace cimrt::test

// The program's own; the library's calls come here as well.

void* operator new(std::size_t size) {
  const bool counted = asked_by_library(__builtin_return_address(0));
  auto* head = counted && fails() ? nullptr : static_cast<Head*>(std::malloc(sizeof(Head) + size));
  if (!head) throw std::bad_alloc();
  head->counted = counted;
  if (head->counted) ++live_blocks;
  return head + 1;
}

void operator delete(void* block) noexcept {
  if (!block) return;
  Head* head = static_cast<Head*>(block) - 1;
  if (head->counted) --live_blocks;
  std::free(head);
}

void operator delete(void* block, std::size_t) noexcept {
  operator delete(block);
}
