// The targets that an adapter sees, and SCSI commands to their logical units.
#include <cstring>

#include "hbaapi/Call.h"
#include "state/Mapping.h"

using namespace tvx::sim;

namespace {

constexpr HBA_STATUS invalid_lun = 14;
constexpr HBA_STATUS not_a_target = 27;

/// One SCSI command to a logical unit.
struct Command {
  HBA_HANDLE handle;
  HBA_WWN target;
  HBA_UINT64 lun;
  std::uint32_t page;
  void* response;
  HBA_UINT32 response_size;
  void* sense;
  HBA_UINT32 sense_size;
};

std::optional<std::uint64_t> unit_of(HBA_UINT64 lun) {
  std::array<std::uint8_t, 8> bytes;
  std::memcpy(bytes.data(), &lun, bytes.size());
  return lun_number(bytes);
}

const Target* target_of(const World& world, const Adapter& adapter, const HBA_WWN& name) {
  for (const std::size_t index : adapter.ports) {
    if (const Target* target = find_target(world.ports[index], to_wwn(name))) return target;
  }
  return nullptr;
}

HBA_STATUS check_condition(const Command& command, const Bytes& sense) {
  if (command.sense != nullptr) {
    write_bytes(command.sense, command.sense_size, sense.data(), sense.size(), {});
  }
  return HBA_STATUS_SCSI_CHECK_CONDITION;
}

// Runs a command; `answer` gives the data for a unit, or nothing where the unit refuses with
// `refusal` as its sense data.
template <class Answer>
HBA_STATUS run_command(const char* name, const Command& command, const Bytes& refusal,
                       Answer&& answer) {
  const Handle_Call call{.name = name,
                         .handle = command.handle,
                         .target = to_wwn(command.target),
                         .lun = unit_of(command.lun),
                         .page = command.page};
  return handle_call(
      call,
      [&](const World& world, const Adapter& adapter, const Fault_Effect& effect) -> HBA_STATUS {
        if (command.response == nullptr) return HBA_STATUS_ERROR_ARG;
        const Target* target = target_of(world, adapter, command.target);
        if (target == nullptr) return not_a_target;
        const Lun_Group* group = call.lun ? target->find_group(*call.lun) : nullptr;
        if (group == nullptr) return invalid_lun;
        const std::optional<Bytes> data = answer(*group, *call.lun);
        if (!data) return check_condition(command, refusal);
        write_bytes(command.response, command.response_size, data->data(), data->size(), effect);
        return HBA_STATUS_OK;
      },
      {.sense = command.sense, .sense_size = command.sense_size});
}

}  // namespace

extern "C" {

HBA_STATUS HBA_GetFcpTargetMapping(HBA_HANDLE handle, HBA_FCPTARGETMAPPING* mapping) {
  return handle_call(
      {.name = "HBA_GetFcpTargetMapping", .handle = handle},
      [=](const World& world, const Adapter& adapter, const Fault_Effect& effect) -> HBA_STATUS {
        if (mapping == nullptr) return HBA_STATUS_ERROR_ARG;
        return write_mapping(world, adapter.ports, *mapping, effect) ? HBA_STATUS_OK
                                                                     : HBA_STATUS_ERROR_MORE_DATA;
      },
      {.told = mapping == nullptr ? nullptr : &mapping->NumberOfEntries});
}

HBA_STATUS HBA_SendScsiInquiry(HBA_HANDLE handle, HBA_WWN portWWN, HBA_UINT64 fcLUN, HBA_UINT8 evpd,
                               HBA_UINT32 pageCode, void* response, HBA_UINT32 responseSize,
                               void* sense, HBA_UINT32 senseSize) {
  const std::uint32_t page = evpd == 0 ? standard_page : pageCode & 0xFF;
  const Command command{handle, portWWN, fcLUN, page, response, responseSize, sense, senseSize};
  const Bytes invalid_field = sense_data(5, 0x24, 0);
  return run_command("HBA_SendScsiInquiry", command, invalid_field,
                     [page](const Lun_Group& group, std::uint64_t lun) {
                       return inquiry_answer(group, lun, page);
                     });
}

HBA_STATUS HBA_SendReadCapacity(HBA_HANDLE handle, HBA_WWN portWWN, HBA_UINT64 fcLUN,
                                void* response, HBA_UINT32 responseSize, void* sense,
                                HBA_UINT32 senseSize) {
  const Command command{handle, portWWN, fcLUN, 0, response, responseSize, sense, senseSize};
  const Bytes no_medium = sense_data(2, 0x3A, 0);
  return run_command("HBA_SendReadCapacity", command, no_medium,
                     [](const Lun_Group& group, std::uint64_t) { return capacity_answer(group); });
}

}  // extern "C"
