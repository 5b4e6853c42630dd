// Optimized access storage: units that the driver, or the stored configuration, marks.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

RM_OASLunEntry record_of(const Oas_Entry& entry, const Fault_Effect& effect) {
  RM_OASLunEntry record{};
  write_text(record.fcpLun, sizeof record.fcpLun, std::to_string(entry.lun), effect);
  record.lun = static_cast<uint8_t>(entry.lun);
  record.state = entry.state;
  return record;
}

std::vector<Oas_Entry>::iterator find_entry(Port& port, const Oas_Entry& wanted) {
  return std::find_if(port.oas.begin(), port.oas.end(), [&wanted](const Oas_Entry& entry) {
    return entry.target == wanted.target && entry.lun == wanted.lun &&
           entry.option == wanted.option;
  });
}

}  // namespace

extern "C" {

RM_STATUS LRM_SetOASLunState(HBA_WWN initiator, HBA_WWN, HBA_WWN target, uint64_t lun,
                             uint8_t state, uint32_t option) {
  return port_call({.name = "LRM_SetOASLunState",
                    .port = to_wwn(initiator),
                    .target = to_wwn(target),
                    .lun = lun},
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (!port.oas_supported) return RM_ERROR_NOT_SUPPORTED;
                     if (option > 1 || state > 1) return RM_ERROR;
                     const Oas_Entry entry{to_wwn(target), lun, option, state};
                     const auto found = find_entry(port, entry);
                     if (found != port.oas.end()) port.oas.erase(found);
                     if (state == 1) port.oas.push_back(entry);
                     return RM_OK;
                   });
}

RM_STATUS LRM_GetOASLunList(HBA_WWN initiator, HBA_WWN, HBA_WWN target, uint32_t option,
                            RM_OASLunList* list) {
  return port_call(
      {.name = "LRM_GetOASLunList", .port = to_wwn(initiator), .target = to_wwn(target)},
      [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
        if (!port.oas_supported) return RM_ERROR_NOT_SUPPORTED;
        if (list == nullptr) return RM_ERROR;
        const std::uint64_t room = list->count;
        std::uint32_t count = 0;
        auto* out = reinterpret_cast<std::uint8_t*>(list->entry);
        for (const Oas_Entry& entry : port.oas) {
          if (entry.target != to_wwn(target) || entry.option != option) continue;
          const RM_OASLunEntry record = record_of(entry, effect);
          if (count < room) std::memcpy(out + count * sizeof record, &record, sizeof record);
          ++count;
        }
        list->count = effect.returned_size.value_or(count);
        return count > room ? RM_ERROR_MORE_DATA : RM_OK;
      },
      {.told = list == nullptr ? nullptr : &list->count});
}

}  // extern "C"
