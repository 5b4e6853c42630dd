// Targets and logical units as the management library tells them.
#include "lrmapi/Call.h"
#include "state/Mapping.h"

using namespace tvx::sim;

namespace {

// The status of a target or unit that the port does not see.
constexpr RM_STATUS no_such_unit = RM_ERROR;

Attribute_Map unit_attributes(const Port& port, const Target& target, const Lun_Group& group,
                              std::uint64_t lun) {
  Attribute_Map values;
  values[RM_LA_DEVICE_NAME] = text_value(os_device_name(group, unit_ordinal(port, target, lun)));
  if (auto inquiry = inquiry_answer(group, lun, standard_page)) values[RM_LA_INQUIRY] = *inquiry;
  if (auto capacity = capacity_answer(group)) {
    values[RM_LA_READ_CAPACITY] = *capacity;
    values[RM_LA_BLOCK_SIZE] = number_value(group.block_size);
    values[RM_LA_LAST_LBA] = number64_value(group.blocks - 1);
  }
  return values;
}

Call_Site unit_site(const char* name, const HBA_WWN& initiator, const HBA_WWN& target,
                    std::uint64_t lun) {
  return {.name = name, .port = to_wwn(initiator), .target = to_wwn(target), .lun = lun};
}

/// Room for the data of a SCSI command and for its sense data.
struct Buffers {
  void* response;
  uint32_t response_size;
  void* sense;
  uint32_t sense_size;
};

template <class Answer>
RM_STATUS scsi_command(const Call_Site& site, const Buffers& buffers, const Bytes& refusal,
                       Answer&& answer) {
  return port_call(
      site,
      [&](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
        const Target* target = find_target(port, *site.target);
        const Lun_Group* group = target != nullptr ? target->find_group(*site.lun) : nullptr;
        if (group == nullptr || buffers.response == nullptr) return no_such_unit;
        if (const std::optional<Bytes> data = answer(*group, *site.lun)) {
          write_bytes(buffers.response, buffers.response_size, data->data(), data->size(), effect);
          return RM_OK;
        }
        if (buffers.sense != nullptr) {
          write_bytes(buffers.sense, buffers.sense_size, refusal.data(), refusal.size(), {});
        }
        return RM_ERROR_SCSI_CHECK;
      },
      {.sense = buffers.sense, .sense_size = buffers.sense_size});
}

RM_LunEntry lun_entry(std::uint64_t lun) {
  RM_LunEntry entry{};
  entry.lunLow = static_cast<std::uint32_t>(lun);
  entry.lunHigh = static_cast<std::uint32_t>(lun >> 32);
  entry.osLunValid = lun < 0x80 ? 1 : 0;
  entry.osLun = static_cast<std::uint8_t>(lun & 0x7F);
  return entry;
}

}  // namespace

extern "C" {

RM_STATUS LRM_GetFcpTargetMapping(HBA_WWN wwpn, HBA_FCPTARGETMAPPING* mapping) {
  return port_call(
      "LRM_GetFcpTargetMapping", wwpn,
      [=](const World& world, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
        if (mapping == nullptr) return RM_ERROR;
        const auto index = static_cast<std::size_t>(&port - world.ports.data());
        return write_mapping(world, {&index, 1}, *mapping, effect) ? RM_OK : RM_ERROR_MORE_DATA;
      },
      {.told = mapping == nullptr ? nullptr : &mapping->NumberOfEntries});
}

RM_STATUS LRM_GetLunList(HBA_WWN initiator, HBA_WWN target, uint32_t, RM_LunList* list) {
  return port_call({.name = "LRM_GetLunList", .port = to_wwn(initiator), .target = to_wwn(target)},
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     const Target* remote = find_target(port, to_wwn(target));
                     if (remote == nullptr || list == nullptr) return no_such_unit;
                     const std::uint64_t room = list->count;
                     std::uint64_t written = 0;
                     for (const Lun_Group& group : remote->groups) {
                       for (std::uint32_t i = 0; i < group.count && written < room; ++i) {
                         list->entry[written++] = lun_entry(group.first + i);
                       }
                     }
                     const std::uint64_t count = remote->unit_count();
                     list->count = effect.returned_size.value_or(static_cast<std::uint32_t>(count));
                     return count > room ? RM_ERROR_MORE_DATA : RM_OK;
                   },
                   {.told = list == nullptr ? nullptr : &list->count});
}

RM_STATUS LRM_GetLunAttributes(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* block,
                               uint32_t* size) {
  const Call_Site site = unit_site("LRM_GetLunAttributes", initiator, target, lun);
  return port_call(site,
                   [&](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     const Target* remote = find_target(port, *site.target);
                     const Lun_Group* group = remote != nullptr ? remote->find_group(lun) : nullptr;
                     if (group == nullptr) return no_such_unit;
                     return answer_block(unit_attributes(port, *remote, *group, lun), block, size,
                                         effect);
                   },
                   {.told = size});
}

RM_STATUS LRM_ScsiInquiry(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* response,
                          uint32_t responseSize, void* sense, uint32_t senseSize) {
  return scsi_command(unit_site("LRM_ScsiInquiry", initiator, target, lun),
                      {response, responseSize, sense, senseSize}, sense_data(5, 0x24, 0),
                      [](const Lun_Group& group, std::uint64_t unit) {
                        return inquiry_answer(group, unit, standard_page);
                      });
}

RM_STATUS LRM_ScsiReadCapacity(HBA_WWN initiator, HBA_WWN target, uint64_t lun, void* response,
                               uint32_t responseSize, void* sense, uint32_t senseSize) {
  return scsi_command(unit_site("LRM_ScsiReadCapacity", initiator, target, lun),
                      {response, responseSize, sense, senseSize}, sense_data(2, 0x3A, 0),
                      [](const Lun_Group& group, std::uint64_t) { return capacity_answer(group); });
}

}  // extern "C"
