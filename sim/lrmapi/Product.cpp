// Vital product data, transceiver data and the contents of the flash.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

// The data is a chain of records, each a mark, the keyword, the length of the value and the value;
// another mark ends it. Only RM_GetNextVpdEntry reads it.
constexpr std::uint8_t entry_mark = 0xE7;
constexpr std::uint8_t end_mark = 0x78;
constexpr std::size_t entry_header = 4;

Bytes encode(const std::vector<Vpd_Entry>& entries) {
  Bytes out;
  for (const Vpd_Entry& entry : entries) {
    out.push_back(entry_mark);
    out.insert(out.end(), entry.keyword.begin(), entry.keyword.end());
    out.push_back(static_cast<std::uint8_t>(entry.value.size()));
    out.insert(out.end(), entry.value.begin(), entry.value.end());
  }
  out.push_back(end_mark);
  return out;
}

RM_STATUS answer_vpd(const std::vector<Vpd_Entry>& entries, void* buffer, uint32_t* size,
                     const Fault_Effect& effect) {
  if (buffer == nullptr || size == nullptr) return RM_ERROR;
  const Bytes data = encode(entries);
  const std::uint32_t room = *size;
  *size = effect.returned_size.value_or(static_cast<std::uint32_t>(data.size()));
  if (data.size() > room) return RM_ERROR_MORE_DATA;
  if (effect.truncated) std::memset(buffer, end_mark, data.size());
  write_bytes(buffer, room, data.data(), data.size(), effect);
  return RM_OK;
}

template <class T>
void put(Bytes& out, std::size_t offset, const T& value) {
  std::memcpy(out.data() + offset, &value, sizeof value);
}

void put_text(Bytes& out, std::size_t offset, std::size_t room, const std::string& text,
              const Fault_Effect& effect) {
  write_text(reinterpret_cast<char*>(out.data() + offset), room, text, effect);
}

// Texts as the transceiver stores them, filled up with blanks.
std::string padded(std::string text, std::size_t width) {
  text.resize(width, ' ');
  return text;
}

Bytes encode(const Transceiver& transceiver, const Fault_Effect& effect) {
  Bytes out(RM_SFF_DATA_SIZE);
  put(out, 296, transceiver.thresholds);
  for (std::size_t i = 0; i < 3; ++i) put(out, 584 + i, std::uint8_t{transceiver.flags[i]});
  put(out, 588, transceiver.identifier);
  put(out, 589, transceiver.ext_identifier);
  put(out, 590, transceiver.connector);
  put(out, 592, transceiver.wavelength);
  put(out, 596, transceiver.temperature);
  put(out, 600, transceiver.vcc);
  put(out, 604, transceiver.tx_bias);
  put(out, 608, transceiver.tx_power);
  put(out, 612, transceiver.rx_power);
  std::memcpy(out.data() + 616, transceiver.oui.data(), 3);
  put_text(out, 620, 18, padded(transceiver.vendor, 16), effect);
  put_text(out, 638, 18, padded(transceiver.part_number, 16), effect);
  put_text(out, 656, 6, padded(transceiver.revision, 4), effect);
  put_text(out, 662, 18, padded(transceiver.serial_number, 16), effect);
  put_text(out, 680, 10, transceiver.date_code, effect);
  return out;
}

RM_LoadListEntry encode(const Flash_Entry& entry, std::uint32_t index, const Fault_Effect& effect) {
  RM_LoadListEntry out{};
  out.next = index + 1;
  out.previous = index == 0 ? 0 : index - 1;
  out.startAddress = entry.start;
  out.length = entry.length;
  out.programId[0] = entry.program_id[0];
  out.programId[1] = entry.program_id[1];
  write_text(out.description, sizeof out.description, entry.description, effect);
  out.wakeup = entry.wakeup ? 1 : 0;
  write_text(out.programType, sizeof out.programType, entry.type, effect);
  write_text(out.version, sizeof out.version, entry.version, effect);
  return out;
}

}  // namespace

extern "C" {

RM_STATUS LRM_GetVPD(HBA_WWN wwpn, void* buffer, uint32_t* size) {
  return port_call("LRM_GetVPD", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) {
                     return answer_vpd(port.vpd, buffer, size, effect);
                   },
                   {.told = size});
}

RM_STATUS LRM_GetVPDV2(HBA_WWN wwpn, int, void* buffer, uint32_t* size) {
  return port_call("LRM_GetVPDV2", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) {
                     return answer_vpd(port.fru, buffer, size, effect);
                   },
                   {.told = size});
}

void* RM_GetNextVpdEntry(const void* cursor, char* keyword, uint32_t keywordSize, char* value,
                         uint32_t valueSize) {
  const auto* at = static_cast<const std::uint8_t*>(cursor);
  const void* next = nullptr;
  rm_call(Call_Site{.name = "RM_GetNextVpdEntry"},
          [&](World&, const Fault_Effect& effect) -> RM_STATUS {
            if (at == nullptr || keyword == nullptr || value == nullptr) return RM_ERROR;
            if (*at != entry_mark) return RM_ERROR;
            const auto* text = reinterpret_cast<const char*>(at);
            write_text(keyword, keywordSize, {text + 1, 2}, {});
            write_text(value, valueSize, {text + entry_header, at[3]}, effect);
            next = at + entry_header + at[3];
            return RM_OK;
          });
  return const_cast<void*>(next);
}

RM_STATUS LRM_GetSffData(HBA_WWN wwpn, void* buffer, uint32_t* size) {
  return port_call("LRM_GetSffData", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     if (buffer == nullptr || size == nullptr || !port.transceiver.present)
                       return RM_ERROR;
                     const Bytes data = encode(port.transceiver, effect);
                     const std::uint32_t room = *size;
                     *size = effect.returned_size.value_or(static_cast<std::uint32_t>(data.size()));
                     if (data.size() > room) return RM_ERROR_MORE_DATA;
                     write_bytes(buffer, room, data.data(), data.size(), effect);
                     return RM_OK;
                   },
                   {.told = size});
}

RM_STATUS LRM_DiagGetLoadListParams(HBA_WWN wwpn, RM_LoadList* list) {
  return port_call(
      "LRM_DiagGetLoadListParams", wwpn,
      [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
        if (list == nullptr) return RM_ERROR;
        std::memset(list, 0, sizeof *list);
        const std::size_t count = std::min<std::size_t>(port.flash.size(), RM_LOAD_LIST_MAX);
        for (std::uint32_t i = 0; i < count; ++i) {
          list->entry[i] = encode(port.flash[i], i, effect);
        }
        list->count = effect.returned_size.value_or(static_cast<std::uint32_t>(count + 1));
        return RM_OK;
      },
      {.told = list == nullptr ? nullptr : &list->count});
}

}  // extern "C"
