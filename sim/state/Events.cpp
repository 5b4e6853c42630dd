#include "state/Events.h"

#include <map>
#include <mutex>
#include <vector>

#include "state/Convert.h"

namespace tvx::sim {
namespace {

struct Registration {
  HBA_PORT_EVENT_CALLBACK callback;
  void* data;
  Wwn port;
};

struct Registrations {
  // Recursive, as a callback may remove itself.
  std::recursive_mutex mutex;
  std::map<std::uintptr_t, Registration> entries;
  std::uintptr_t next = 1;
};

Registrations& registrations() {
  static auto* const instance = new Registrations;  // as long as the process
  return *instance;
}

}  // namespace

HBA_CALLBACKHANDLE add_callback(HBA_PORT_EVENT_CALLBACK callback, void* data, const Wwn& port) {
  Registrations& all = registrations();
  const std::lock_guard<std::recursive_mutex> guard(all.mutex);
  const std::uintptr_t handle = all.next++;
  all.entries.emplace(handle, Registration{callback, data, port});
  return reinterpret_cast<HBA_CALLBACKHANDLE>(handle);
}

bool remove_callback(HBA_CALLBACKHANDLE handle) {
  Registrations& all = registrations();
  const std::lock_guard<std::recursive_mutex> guard(all.mutex);
  return all.entries.erase(reinterpret_cast<std::uintptr_t>(handle)) != 0;
}

int post_event(const Wwn& port, std::uint32_t type, std::uint32_t fabric_port) {
  Registrations& all = registrations();
  const std::lock_guard<std::recursive_mutex> guard(all.mutex);
  std::vector<std::uintptr_t> handles;
  for (const auto& [handle, entry] : all.entries) {
    if (entry.port == port) handles.push_back(handle);
  }
  int called = 0;
  for (const std::uintptr_t handle : handles) {
    const auto found = all.entries.find(handle);
    if (found == all.entries.end()) continue;  // removed by a callback before it
    const Registration entry = found->second;
    entry.callback(entry.data, from_wwn(port), type, fabric_port);
    ++called;
  }
  return called;
}

}  // namespace tvx::sim
