#include "access/TVX_Runtime_Loader.h"

#include <dlfcn.h>

#include <array>
#include <cstdio>
#include <string>

#include "common/CLogger.h"

namespace cimrt {

std::atomic<int> LrmApiUnavailable{0};
std::atomic<int> RmApiUnavailable{0};
std::atomic<int> HbaApiUnavailable{0};
std::atomic<int> SdmUnavailable{0};

namespace {

constexpr TVX_Dl_Operations SYSTEM_OPERATIONS = {::dlopen, ::dlsym, ::dlclose,
                                                 []() -> const char* { return ::dlerror(); }};

std::atomic<const TVX_Dl_Operations*> installedOperations{&SYSTEM_OPERATIONS};

std::array<std::atomic<void*>, TVX_LIBRARY_SLOTS> handles{};

/// The address found for each row of the table. Writers of one row store the same value.
std::array<std::atomic<void*>, entry_points::COUNT> addresses{};

std::string lastError() {
  const char* text = dlOperations().error();
  return text != nullptr ? text : "";
}

/// Where a family looks first, and the flag that says that it can't.
struct Family_Rule {
  TVX_Library_Slot primary;
  const std::atomic<int>& unavailable;
};

Family_Rule ruleOf(TVX_Family family) {
  switch (family) {
    case TVX_Family::SNIA:
      return {TVX_SLOT_HBAAPI, HbaApiUnavailable};
    case TVX_Family::CPQFC:
    case TVX_Family::CPQFC_FALLBACK:
      return {TVX_SLOT_SDM, SdmUnavailable};
    default:
      return {TVX_SLOT_LRMAPI, LrmApiUnavailable};
  }
}

/// Looks a name up in a slot. An empty slot stands for the default global scope.
void* lookUp(TVX_Library_Slot slot, const char* name) {
  return dlOperations().symbol(handles[slot].load(std::memory_order_acquire), name);
}

void* resolvePrimary(const TVX_Entry_Point& entry, TVX_Library_Slot slot,
                     std::atomic<void*>& cached) {
  void* address = cached.load(std::memory_order_acquire);
  if (address != nullptr) return address;
  address = lookUp(slot, entry.name.data());
  cached.store(address, std::memory_order_release);
  return address;
}

void* resolveFallback(const TVX_Entry_Point& entry, std::atomic<void*>& cached) {
  if (RmApiUnavailable.load() != 0) return nullptr;
  void* address = lookUp(TVX_SLOT_RMAPI, entry.name.data());
  if (address == nullptr) address = lookUp(TVX_SLOT_RMAPI, entry.secondName());
  cached.store(address, std::memory_order_release);
  return address;
}

void closeLibrary(std::atomic<void*>& slot) {
  void* const handle = slot.exchange(nullptr);
  if (handle == nullptr || dlOperations().close(handle) == 0) return;
  char value[2 + 2 * sizeof(void*) + 1];
  std::snprintf(value, sizeof value, "%p", handle);
  TVX_LOG(TVX_ERR, "dlclose for lib %s failed with %s\n", value, lastError().c_str());
}

}  // namespace

const TVX_Dl_Operations& dlOperations() {
  return *installedOperations.load(std::memory_order_acquire);
}

void setDlOperations(const TVX_Dl_Operations* operations) {
  installedOperations.store(operations != nullptr ? operations : &SYSTEM_OPERATIONS,
                            std::memory_order_release);
}

bool isSdmAvailable() {
  return SdmUnavailable.load() == 0;
}

void* runtimeLibraryHandle(int slot) {
  if (slot < 0 || slot >= TVX_LIBRARY_SLOTS) return nullptr;
  return handles[static_cast<std::size_t>(slot)].load();
}

int OpenRuntimeLibrary(int slot, const char* name) {
  if (slot < 0 || slot >= TVX_LIBRARY_SLOTS || name == nullptr) return 0;
  const std::string base = name;
  const std::string file = base.starts_with("HBA") ? base : "lib" + base + ".so";
  std::atomic<void*>& handle = handles[static_cast<std::size_t>(slot)];
  if (handle.load() != nullptr) return 1;
  handle.store(dlOperations().open(file.c_str(), RTLD_NOW), std::memory_order_release);
  if (handle.load() != nullptr) return 1;
  TVX_LOG(TVX_ERR, "dlopen failed :%s", lastError().c_str());
  return 0;
}

int LoadRuntimeLibraries() {
  if (OpenRuntimeLibrary(TVX_SLOT_HBAAPI, "HBAAPI.so.2") == 0 &&
      OpenRuntimeLibrary(TVX_SLOT_HBAAPI, "HBAAPI.so") == 0) {
    HbaApiUnavailable = 1;
  }
  if (OpenRuntimeLibrary(TVX_SLOT_LRMAPI, TVX_LIBRARY_NAMES[TVX_SLOT_LRMAPI]) != 0) return 0;
  LrmApiUnavailable = 1;
  if (OpenRuntimeLibrary(TVX_SLOT_RMAPI, TVX_LIBRARY_NAMES[TVX_SLOT_RMAPI]) != 0) return 1;
  RmApiUnavailable = 1;
  return 0;
}

int UnloadRuntimeLibraries() {
  // The addresses go first: none may be found once its library is closed.
  for (std::atomic<void*>& address : addresses) address.store(nullptr, std::memory_order_release);
  for (std::atomic<void*>& handle : handles) closeLibrary(handle);
  for (std::atomic<int>* flag : {&LrmApiUnavailable, &RmApiUnavailable, &HbaApiUnavailable}) {
    flag->store(0);
  }
  return 0;
}

void* resolveEntryPoint(std::size_t index) {
  if (index >= entry_points::COUNT) return nullptr;
  const TVX_Entry_Point& entry = entry_points::TABLE[index];
  if (entry.name.empty()) return nullptr;
  const Family_Rule rule = ruleOf(entry.family);
  std::atomic<void*>& cached = addresses[index];
  const bool hasPrimary = entry.family != TVX_Family::CPQFC_FALLBACK;
  if (hasPrimary && rule.unavailable.load() == 0)
    return resolvePrimary(entry, rule.primary, cached);
  return resolveFallback(entry, cached);
}

}  // namespace cimrt
