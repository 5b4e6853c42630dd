#include "state/San.h"

#include <algorithm>
#include <cstdio>

namespace tvx::sim {
namespace {

void put_big_endian(Bytes& out, std::uint64_t number, int width) {
  for (int shift = (width - 1) * 8; shift >= 0; shift -= 8) {
    out.push_back(static_cast<std::uint8_t>(number >> shift));
  }
}

// Exactly `width` characters, filled up with blanks.
void put_text(Bytes& out, const std::string& text, std::size_t width) {
  for (std::size_t i = 0; i < width; ++i) {
    out.push_back(static_cast<std::uint8_t>(i < text.size() ? text[i] : ' '));
  }
}

std::string unit_serial(const Lun_Group& group, std::uint64_t lun) {
  char number[24];
  std::snprintf(number, sizeof number, "%06llX", static_cast<unsigned long long>(lun));
  return group.serial + number;
}

Bytes unit_identifier(const Lun_Group& group, std::uint64_t lun) {
  Bytes identifier = group.identifier;
  const std::size_t numbered = std::min<std::size_t>(identifier.size(), 4);
  if (group.count > 1) {
    for (std::size_t i = 0; i < numbered; ++i) {
      identifier[identifier.size() - 1 - i] = static_cast<std::uint8_t>(lun >> (8 * i));
    }
  }
  return identifier;
}

Bytes standard_inquiry(const Lun_Group& group) {
  const bool removable = group.type == 1 || group.type == 5;
  Bytes out = {group.type, static_cast<std::uint8_t>(removable ? 0x80 : 0), 6, 2, 91, 0, 0x10, 2};
  put_text(out, group.vendor, 8);
  put_text(out, group.model, 16);
  put_text(out, group.revision, 4);
  out.resize(96);
  return out;
}

Bytes page(const Lun_Group& group, std::uint8_t code, const Bytes& content) {
  Bytes out = {group.type, code};
  put_big_endian(out, content.size(), 2);
  out.insert(out.end(), content.begin(), content.end());
  return out;
}

Bytes identification(const Lun_Group& group, std::uint64_t lun) {
  const Bytes identifier = unit_identifier(group, lun);
  Bytes descriptor = {group.identifier_code, group.identifier_type, 0,
                      static_cast<std::uint8_t>(identifier.size())};
  descriptor.insert(descriptor.end(), identifier.begin(), identifier.end());
  return page(group, 0x83, descriptor);
}

// "a" to "z", "aa" and so on, as disks are named.
std::string disk_letters(std::uint64_t ordinal) {
  std::string letters;
  for (std::uint64_t rest = ordinal + 1; rest > 0; rest = (rest - 1) / 26) {
    letters.insert(letters.begin(), static_cast<char>('a' + (rest - 1) % 26));
  }
  return letters;
}

}  // namespace

const Lun_Group* Target::find_group(std::uint64_t lun) const {
  for (const Lun_Group& group : groups) {
    if (group.contains(lun)) return &group;
  }
  return nullptr;
}

std::uint64_t Target::unit_count() const {
  std::uint64_t sum = 0;
  for (const Lun_Group& group : groups) sum += group.count;
  return sum;
}

std::array<std::uint8_t, 8> lun_bytes(std::uint64_t lun) {
  std::array<std::uint8_t, 8> bytes{};
  if (lun < 0x4000) {
    bytes[0] = static_cast<std::uint8_t>(lun < 0x100 ? 0 : 0x40 | (lun >> 8));
    bytes[1] = static_cast<std::uint8_t>(lun);
  } else {
    bytes[0] = 0xD2;
    for (std::size_t i = 0; i < 3; ++i) {
      bytes[1 + i] = static_cast<std::uint8_t>(lun >> (16 - 8 * i));
    }
  }
  return bytes;
}

std::optional<std::uint64_t> lun_number(const std::array<std::uint8_t, 8>& bytes) {
  std::uint64_t lun = 0;
  if (bytes[0] == 0xD2) {
    lun = static_cast<std::uint64_t>(bytes[1]) << 16 | static_cast<std::uint64_t>(bytes[2]) << 8 |
          bytes[3];
  } else {
    lun = static_cast<std::uint64_t>(bytes[0] & 0x3F) << 8 | bytes[1];
  }
  if (lun_bytes(lun) != bytes) return std::nullopt;
  return lun;
}

std::optional<Bytes> inquiry_answer(const Lun_Group& group, std::uint64_t lun,
                                    std::uint32_t page_code) {
  const auto given = group.pages.find(page_code);
  if (given != group.pages.end()) return given->second;
  switch (page_code) {
    case standard_page:
      return standard_inquiry(group);
    case 0x00:
      return page(group, 0x00, {0x00, 0x80, 0x83});
    case 0x80:
      return page(group, 0x80, [&] {
        const std::string serial = unit_serial(group, lun);
        return Bytes(serial.begin(), serial.end());
      }());
    case 0x83:
      return identification(group, lun);
    default:
      return std::nullopt;
  }
}

std::optional<Bytes> capacity_answer(const Lun_Group& group) {
  if (group.blocks == 0) return std::nullopt;
  const std::uint64_t last = group.blocks - 1;
  Bytes out;
  put_big_endian(out, std::min<std::uint64_t>(last, 0xFFFFFFFF), 4);
  put_big_endian(out, group.block_size, 4);
  if (last >= 0xFFFFFFFF) put_big_endian(out, last, 8);
  return out;
}

Bytes sense_data(std::uint8_t key, std::uint8_t code, std::uint8_t qualifier) {
  Bytes sense(18);
  sense[0] = 0x70;
  sense[2] = key;
  sense[7] = 10;
  sense[12] = code;
  sense[13] = qualifier;
  return sense;
}

std::string os_device_name(const Lun_Group& group, std::uint64_t ordinal) {
  if (!group.os_device.empty()) return group.os_device + std::to_string(ordinal);
  if (group.type == 0 || group.type == 14) return "/dev/sd" + disk_letters(ordinal);
  if (group.type == 1) return "/dev/st" + std::to_string(ordinal);
  if (group.type == 5) return "/dev/sr" + std::to_string(ordinal);
  return "/dev/sg" + std::to_string(ordinal);
}

}  // namespace tvx::sim
