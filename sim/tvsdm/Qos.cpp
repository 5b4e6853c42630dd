// The frame tagging library: a table of tags by pairs of ports, and a global flag, on each adapter.
#include "rmapi/rmapi.h"
#include "state/Convert.h"
#include "state/Entry.h"

using namespace tvx::sim;

namespace {

constexpr int failed = 1;

// Runs a call on an open adapter; the table and the flag are those of its first port.
template <class Body>
int qos_call(const char* name, HBA_HANDLE handle, Body&& body,
             const Failure_Outputs& outputs = {}) noexcept {
  return run_entry<int>(failed, Call_Site{.name = name}, outputs,
                        [&](World& world, const Fault_Effect& effect) -> int {
                          const auto found = world.qos_handles.find(handle);
                          if (found == world.qos_handles.end()) return failed;
                          const Adapter& adapter = world.adapters[found->second];
                          return body(world.ports[adapter.ports.front()].qos, effect);
                        });
}

CPQFC_QoSEntry record_of(const Qos_Entry& entry) {
  CPQFC_QoSEntry record{};
  record.source = from_wwn(entry.source);
  record.target = from_wwn(entry.target);
  record.tag = static_cast<std::int8_t>(entry.tag);
  return record;
}

}  // namespace

extern "C" {

int CPQFC_LoadLibrary(void) {
  refresh_quietly();
  return run_entry<int>(failed, Call_Site{.name = "CPQFC_LoadLibrary"}, {},
                        [](World&, const Fault_Effect&) { return 0; });
}

int CPQFC_FreeLibrary(void) {
  return run_entry<int>(failed, Call_Site{.name = "CPQFC_FreeLibrary"}, {},
                        [](World& world, const Fault_Effect&) {
                          world.qos_handles.clear();
                          return 0;
                        });
}

uint32_t CPQFC_GetNumberOfAdapters(void) {
  std::uint32_t count = 0;
  const int status = run_entry<int>(failed, Call_Site{.name = "CPQFC_GetNumberOfAdapters"}, {},
                                    [&count](const World& world, const Fault_Effect&) {
                                      count = static_cast<std::uint32_t>(world.adapters.size());
                                      return 0;
                                    });
  return status == 0 ? count : 0;
}

HBA_HANDLE CPQFC_OpenAdapter(const char* adapterName) {
  if (adapterName == nullptr) return 0;
  HBA_HANDLE handle = 0;
  const auto site = [adapterName] {
    return Call_Site{.name = "CPQFC_OpenAdapter", .adapter = adapterName};
  };
  run_entry<int>(failed, site, {}, [&](World& world, const Fault_Effect&) {
    for (std::size_t i = 0; i < world.adapters.size(); ++i) {
      if (world.adapters[i].name != adapterName) continue;
      handle = world.next_handle++;
      world.qos_handles.emplace(handle, i);
      return 0;
    }
    return failed;
  });
  return handle;
}

void CPQFC_CloseAdapter(HBA_HANDLE handle) {
  run_entry<int>(failed, Call_Site{.name = "CPQFC_CloseAdapter"}, {},
                 [handle](World& world, const Fault_Effect&) {
                   return world.qos_handles.erase(handle) != 0 ? 0 : failed;
                 });
}

int CPQFC_QoSGetGlobalFlag(HBA_HANDLE handle, uint32_t* value) {
  return qos_call("CPQFC_QoSGetGlobalFlag", handle, [=](const Qos_Store& qos, const Fault_Effect&) {
    if (value == nullptr) return failed;
    *value = qos.flag;
    return 0;
  });
}

int CPQFC_QoSSetGlobalFlag(HBA_HANDLE handle, uint32_t value) {
  return qos_call("CPQFC_QoSSetGlobalFlag", handle, [=](Qos_Store& qos, const Fault_Effect&) {
    qos.flag = value;
    return 0;
  });
}

int CPQFC_QoSGetConfig(HBA_HANDLE handle, CPQFC_QoSTable* table) {
  return qos_call("CPQFC_QoSGetConfig", handle,
                  [=](const Qos_Store& qos, const Fault_Effect& effect) {
                    if (table == nullptr) return failed;
                    const std::size_t room = table->numberOfEntries;
                    table->numberOfEntries = effect.returned_size.value_or(
                        static_cast<std::uint32_t>(qos.entries.size()));
                    if (room == 0) return 0;
                    if (room < qos.entries.size()) return failed;
                    auto* out = reinterpret_cast<std::uint8_t*>(table->entry);
                    for (const Qos_Entry& entry : qos.entries) {
                      const CPQFC_QoSEntry record = record_of(entry);
                      std::memcpy(out, &record, sizeof record);
                      out += sizeof record;
                    }
                    return 0;
                  },
                  {.told = table == nullptr ? nullptr : &table->numberOfEntries});
}

int CPQFC_QoSSetConfig(HBA_HANDLE handle, CPQFC_QoSTable* table) {
  return qos_call("CPQFC_QoSSetConfig", handle, [=](Qos_Store& qos, const Fault_Effect&) {
    if (table == nullptr) return failed;
    std::vector<Qos_Entry> entries;
    const auto* in = reinterpret_cast<const std::uint8_t*>(table->entry);
    for (std::uint32_t i = 0; i < table->numberOfEntries; ++i, in += sizeof(CPQFC_QoSEntry)) {
      CPQFC_QoSEntry record;
      std::memcpy(&record, in, sizeof record);
      entries.push_back(
          {to_wwn(record.source), to_wwn(record.target), static_cast<std::uint8_t>(record.tag)});
    }
    qos.entries = std::move(entries);
    return 0;
  });
}

}  // extern "C"
