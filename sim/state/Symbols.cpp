#include "state/Symbols.h"

#include <dlfcn.h>
#include <elf.h>
#include <link.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <string_view>

namespace tvx::sim {
namespace {

struct Symbol_Table {
  ElfW(Sym) * symbols = nullptr;
  const char* texts = nullptr;
  std::size_t count = 0;
};

// The table as the dynamic section describes it; its length is that of the hash table's chain.
Symbol_Table symbol_table(const link_map& map) {
  Symbol_Table table;
  for (const ElfW(Dyn)* entry = map.l_ld; entry->d_tag != DT_NULL; ++entry) {
    void* const address = reinterpret_cast<void*>(entry->d_un.d_ptr);
    if (entry->d_tag == DT_SYMTAB) table.symbols = static_cast<ElfW(Sym)*>(address);
    if (entry->d_tag == DT_STRTAB) table.texts = static_cast<const char*>(address);
    if (entry->d_tag == DT_HASH) table.count = static_cast<const std::uint32_t*>(address)[1];
  }
  return table;
}

bool set_protection(const Symbol_Table& table, int protection) {
  const auto page = static_cast<std::uintptr_t>(sysconf(_SC_PAGESIZE));
  const auto start = reinterpret_cast<std::uintptr_t>(table.symbols) & ~(page - 1);
  const auto end = reinterpret_cast<std::uintptr_t>(table.symbols + table.count);
  return mprotect(reinterpret_cast<void*>(start), end - start, protection) == 0;
}

}  // namespace

int hide_symbols(const void* address, const std::vector<std::string>& names) {
  if (names.empty()) return 0;
  Dl_info info{};
  link_map* map = nullptr;
  if (dladdr1(address, &info, reinterpret_cast<void**>(&map), RTLD_DL_LINKMAP) == 0) return 0;
  const Symbol_Table table = symbol_table(*map);
  if (table.symbols == nullptr || table.texts == nullptr || table.count == 0) return 0;
  if (!set_protection(table, PROT_READ | PROT_WRITE)) return 0;
  int hidden = 0;
  for (std::size_t i = 1; i < table.count; ++i) {
    ElfW(Sym)& symbol = table.symbols[i];
    const std::string_view name = table.texts + symbol.st_name;
    if (symbol.st_shndx == SHN_UNDEF || std::find(names.begin(), names.end(), name) == names.end())
      continue;
    symbol = ElfW(Sym){};  // neither a name nor a value: no lookup matches it
    ++hidden;
  }
  set_protection(table, PROT_READ);
  return hidden;
}

}  // namespace tvx::sim
