// Firmware images as the simulated adapters take them.
#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace tvx::test {

inline std::uint32_t crcOf(const std::string& data) {
  static const std::array<std::uint32_t, 256> TABLE = [] {
    std::array<std::uint32_t, 256> table{};
    for (std::uint32_t i = 0; i < 256; i++) {
      std::uint32_t entry = i;
      for (int bit = 0; bit < 8; bit++) entry = (entry >> 1) ^ ((entry & 1) != 0 ? 0xEDB88320 : 0);
      table[i] = entry;
    }
    return table;
  }();
  std::uint32_t crc = 0xFFFFFFFF;
  for (const char c : data) crc = (crc >> 8) ^ TABLE[(crc ^ static_cast<unsigned char>(c)) & 0xFF];
  return ~crc;
}

/// The bytes of an image, `size` of them altogether (at least the 64 of the header).
inline std::string firmwareImage(const std::string& version, const std::string& model = "",
                                 std::size_t size = 320) {
  const auto number = [](std::size_t value) {
    std::string bytes;
    for (int i = 0; i < 4; i++) bytes += static_cast<char>(value >> (8 * i) & 0xFF);
    return bytes;
  };
  const auto field = [](std::string text) {
    text.resize(16);
    return text;
  };
  std::string payload(size - 64, '\0');
  for (std::size_t i = 0; i < payload.size(); i++) payload[i] = static_cast<char>(i * 31 + i / 255);
  return "TVXFWIMG" + number(1) + number(payload.size()) + field(version) + field(model) +
         number(crcOf(payload)) + std::string(12, '\0') + payload;
}

}  // namespace tvx::test
