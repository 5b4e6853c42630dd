#include "state/Attributes.h"

#include <cstdlib>
#include <cstring>

namespace tvx::sim {
namespace {

using Kind = Attribute_Kind;

constexpr Attribute_Row card_rows[] = {
    {0x207, "node_symbolic_name", Kind::Text},   {0x209, "option_rom_version", Kind::Text},
    {0x20E, "device_id", Kind::Number},          {0x20F, "model_id", Kind::Number},
    {0x210, "operational_firmware", Kind::Text}, {0x211, "sli1_firmware_name", Kind::Text},
    {0x212, "sli2_firmware_name", Kind::Text},   {0x213, "ieee_address", Kind::Raw},
    {0x214, "boot_code_enabled", Kind::Number},  {0x216, "boot_bios_version", Kind::Text},
    {0x220, "diag_version", Kind::Number},       {0x221, "initial_firmware_load", Kind::Text},
    {0x222, "kernel_version", Kind::Text},       {0x224, "sli3_firmware_name", Kind::Text},
    {0x225, "sli_mode", Kind::Number},           {0x227, "board_temperature", Kind::Number},
    {0x229, "port_number", Kind::Number},        {0x22B, "pci_bus_number", Kind::Number},
    {0x22C, "function_type", Kind::Number},      {0x230, "pci_function_number", Kind::Number},
    {0x233, "sp_firmware_version", Kind::Text},  {0x234, "sp_firmware_name", Kind::Text},
    {0x235, "ulp_firmware_version", Kind::Text}, {0x236, "ulp_firmware_name", Kind::Text},
    {0x24A, "sub_adapter_id", Kind::Text},       {0x24B, "fc_universal_version", Kind::Text},
    {0x24C, "fc_x86_bios_version", Kind::Text},  {0x24D, "fc_efi_version", Kind::Text},
    {0x24E, "fc_fcode_version", Kind::Text},     {0x24F, "firmware_on_flash", Kind::Text},
};

constexpr Attribute_Row port_rows[] = {
    {0x305, "port_type", Kind::Number},
    {0x306, "port_state", Kind::Number},
    {0x30F, "fabric_name", Kind::Raw},
    {0x360, "fec_state", Kind::Number},
};

constexpr Attribute_Row counter_rows[] = {
    {0x401, "seconds_since_reset", Kind::Number64},
    {0x402, "exchanges_originated", Kind::Number64},
    {0x403, "exchanges_responded", Kind::Number64},
    {0x404, "tx_sequences", Kind::Number64},
    {0x405, "rx_sequences", Kind::Number64},
    {0x406, "tx_frames", Kind::Number64},
    {0x407, "rx_frames", Kind::Number64},
    {0x408, "tx_words", Kind::Number64},
    {0x409, "rx_words", Kind::Number64},
    {0x40C, "lip_count", Kind::Number64},
    {0x40D, "nos_count", Kind::Number64},
    {0x40E, "error_frames", Kind::Number64},
    {0x40F, "dumped_frames", Kind::Number64},
    {0x410, "link_failures", Kind::Number64},
    {0x411, "loss_of_sync", Kind::Number64},
    {0x412, "loss_of_signal", Kind::Number64},
    {0x413, "primitive_sequence_errors", Kind::Number64},
    {0x414, "invalid_transmission_words", Kind::Number64},
    {0x415, "crc_errors", Kind::Number64},
    {0x416, "link_transitions", Kind::Number64},
    {0x417, "active_rpis", Kind::Number64},
    {0x418, "active_xris", Kind::Number64},
    {0x421, "primitive_sequence_timeouts", Kind::Number64},
    {0x422, "elastic_buffer_overruns", Kind::Number64},
    {0x423, "arbitration_timeouts", Kind::Number64},
};

constexpr Attribute_Row lun_rows[] = {
    {0x601, "inquiry", Kind::Raw},         {0x602, "read_capacity", Kind::Raw},
    {0x603, "device_name", Kind::Text},    {0x604, "block_size", Kind::Number},
    {0x605, "last_block", Kind::Number64},
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
