#include "state/Attributes.h"

#include <cstdlib>
#include <cstring>

namespace tvx::sim {
namespace {

using Kind = Attribute_Kind;

constexpr Attribute_Row card_rows[] = {
    {0x207, Kind::Text, "node_symbolic_name"},   {0x209, Kind::Text, "option_rom_version"},
    {0x20E, Kind::Number, "device_id"},          {0x20F, Kind::Number, "model_id"},
    {0x210, Kind::Text, "operational_firmware"}, {0x211, Kind::Text, "sli1_firmware_name"},
    {0x212, Kind::Text, "sli2_firmware_name"},   {0x213, Kind::Raw, "ieee_address"},
    {0x214, Kind::Number, "boot_code_enabled"},  {0x216, Kind::Text, "boot_bios_version"},
    {0x220, Kind::Number, "diag_version"},       {0x221, Kind::Text, "initial_firmware_load"},
    {0x222, Kind::Text, "kernel_version"},       {0x224, Kind::Text, "sli3_firmware_name"},
    {0x225, Kind::Number, "sli_mode"},           {0x227, Kind::Number, "board_temperature"},
    {0x229, Kind::Number, "port_number"},        {0x22B, Kind::Number, "pci_bus_number"},
    {0x22C, Kind::Number, "function_type"},      {0x230, Kind::Number, "pci_function_number"},
    {0x233, Kind::Text, "sp_firmware_version"},  {0x234, Kind::Text, "sp_firmware_name"},
    {0x235, Kind::Text, "ulp_firmware_version"}, {0x236, Kind::Text, "ulp_firmware_name"},
    {0x24A, Kind::Text, "sub_adapter_id"},       {0x24B, Kind::Text, "fc_universal_version"},
    {0x24C, Kind::Text, "fc_x86_bios_version"},  {0x24D, Kind::Text, "fc_efi_version"},
    {0x24E, Kind::Text, "fc_fcode_version"},     {0x24F, Kind::Text, "firmware_on_flash"},
};

constexpr Attribute_Row port_rows[] = {
    {0x305, Kind::Number, "port_type"},
    {0x306, Kind::Number, "port_state"},
    {0x30F, Kind::Raw, "fabric_name"},
    {0x360, Kind::Number, "fec_state"},
};

constexpr Attribute_Row counter_rows[] = {
    {0x401, Kind::Number64, "seconds_since_reset"},
    {0x402, Kind::Number64, "exchanges_originated"},
    {0x403, Kind::Number64, "exchanges_responded"},
    {0x404, Kind::Number64, "tx_sequences"},
    {0x405, Kind::Number64, "rx_sequences"},
    {0x406, Kind::Number64, "tx_frames"},
    {0x407, Kind::Number64, "rx_frames"},
    {0x408, Kind::Number64, "tx_words"},
    {0x409, Kind::Number64, "rx_words"},
    {0x40C, Kind::Number64, "lip_count"},
    {0x40D, Kind::Number64, "nos_count"},
    {0x40E, Kind::Number64, "error_frames"},
    {0x40F, Kind::Number64, "dumped_frames"},
    {0x410, Kind::Number64, "link_failures"},
    {0x411, Kind::Number64, "loss_of_sync"},
    {0x412, Kind::Number64, "loss_of_signal"},
    {0x413, Kind::Number64, "primitive_sequence_errors"},
    {0x414, Kind::Number64, "invalid_transmission_words"},
    {0x415, Kind::Number64, "crc_errors"},
    {0x416, Kind::Number64, "link_transitions"},
    {0x417, Kind::Number64, "active_rpis"},
    {0x418, Kind::Number64, "active_xris"},
    {0x421, Kind::Number64, "primitive_sequence_timeouts"},
    {0x422, Kind::Number64, "elastic_buffer_overruns"},
    {0x423, Kind::Number64, "arbitration_timeouts"},
};

constexpr Attribute_Row lun_rows[] = {
    {0x601, Kind::Raw, "inquiry"},         {0x602, Kind::Raw, "read_capacity"},
    {0x603, Kind::Text, "device_name"},    {0x604, Kind::Number, "block_size"},
    {0x605, Kind::Number64, "last_block"},
};

constexpr std::uint32_t block_magic = 0x54565842;  // "TVXB"

struct Block_Header {
  std::uint32_t magic;
  std::uint32_t size;
};

struct Entry_Header {
  std::uint32_t id;
  std::uint32_t length;
};

std::size_t padded(std::size_t length) {
  return (length + 7) / 8 * 8;
}

template <class T>
Bytes raw_bytes(const T& value) {
  Bytes bytes(sizeof value);
  std::memcpy(bytes.data(), &value, sizeof value);
  return bytes;
}

std::size_t block_size(const Attribute_Map& values) {
  std::size_t size = sizeof(Block_Header);
  for (const auto& entry : values) size += sizeof(Entry_Header) + padded(entry.second.size());
  return size;
}

}  // namespace

std::span<const Attribute_Row> card_attribute_rows() {
  return card_rows;
}
std::span<const Attribute_Row> port_attribute_rows() {
  return port_rows;
}
std::span<const Attribute_Row> statistic_rows() {
  return counter_rows;
}
std::span<const Attribute_Row> lun_attribute_rows() {
  return lun_rows;
}

const Attribute_Row* find_row(std::span<const Attribute_Row> rows, std::string_view name) {
  for (const Attribute_Row& row : rows) {
    if (name == row.name) return &row;
  }
  return nullptr;
}

std::optional<std::uint32_t> attribute_number(std::span<const Attribute_Row> rows,
                                              const std::string& name) {
  if (const Attribute_Row* row = find_row(rows, name)) return row->id;
  if (name.empty() || name[0] < '0' || name[0] > '9') return std::nullopt;
  char* end = nullptr;
  const unsigned long number = std::strtoul(name.c_str(), &end, 0);
  if (*end != '\0' || number > UINT32_MAX) return std::nullopt;
  return static_cast<std::uint32_t>(number);
}

Bytes number_value(std::uint32_t number) {
  return raw_bytes(number);
}
Bytes number64_value(std::uint64_t number) {
  return raw_bytes(number);
}

Bytes text_value(std::string_view text) {
  Bytes bytes(text.begin(), text.end());
  bytes.push_back(0);
  return bytes;
}

std::size_t write_block(const Attribute_Map& values, void* buffer, std::size_t room) {
  const std::size_t size = block_size(values);
  if (size > room || size > UINT32_MAX || buffer == nullptr) return size;
  auto* out = static_cast<std::uint8_t*>(buffer);
  std::memset(out, 0, size);
  const Block_Header header{block_magic, static_cast<std::uint32_t>(size)};
  std::memcpy(out, &header, sizeof header);
  out += sizeof header;
  for (const auto& [id, value] : values) {
    const Entry_Header entry{id, static_cast<std::uint32_t>(value.size())};
    std::memcpy(out, &entry, sizeof entry);
    out += sizeof entry;
    if (!value.empty()) std::memcpy(out, value.data(), value.size());
    out += padded(value.size());
  }
  return size;
}

std::optional<Block_Value> find_in_block(const void* block, std::uint32_t id) {
  if (block == nullptr) return std::nullopt;
  const auto* start = static_cast<const std::uint8_t*>(block);
  Block_Header header;
  std::memcpy(&header, start, sizeof header);
  if (header.magic != block_magic) return std::nullopt;
  std::size_t at = sizeof header;
  while (at + sizeof(Entry_Header) <= header.size) {
    Entry_Header entry;
    std::memcpy(&entry, start + at, sizeof entry);
    at += sizeof entry;
    if (entry.length > header.size - at) return std::nullopt;
    if (entry.id == id) return Block_Value{start + at, entry.length};
    at += padded(entry.length);
  }
  return std::nullopt;
}

}  // namespace tvx::sim
