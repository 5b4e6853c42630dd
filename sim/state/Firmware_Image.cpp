#include "state/Firmware_Image.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <system_error>

namespace tvx::sim {
namespace {

constexpr std::size_t header_size = 64;
constexpr char magic[] = "TVXFWIMG";

std::uint32_t little_endian(const std::uint8_t* bytes) {
  return static_cast<std::uint32_t>(bytes[0]) | static_cast<std::uint32_t>(bytes[1]) << 8 |
         static_cast<std::uint32_t>(bytes[2]) << 16 | static_cast<std::uint32_t>(bytes[3]) << 24;
}

std::string field(const std::uint8_t* bytes, std::size_t room) {
  const auto* text = reinterpret_cast<const char*>(bytes);
  return std::string(text, strnlen(text, room));
}

// What one byte does to the sum.
constexpr std::array<std::uint32_t, 256> crc_table() {
  std::array<std::uint32_t, 256> table{};
  for (std::uint32_t i = 0; i < table.size(); ++i) {
    table[i] = i;
    for (int bit = 0; bit < 8; ++bit)
      table[i] = (table[i] >> 1) ^ ((table[i] & 1) != 0 ? 0xEDB88320 : 0);
  }
  return table;
}

// Nothing if it is no file or cannot be read whole.
std::optional<std::vector<char>> read_file(const std::string& path) {
  std::error_code error;
  if (!std::filesystem::is_regular_file(path, error)) return std::nullopt;
  const std::uintmax_t size = std::filesystem::file_size(path, error);
  std::ifstream file(path, std::ios::binary);
  if (error || !file) return std::nullopt;
  std::vector<char> content(size);
  if (!file.read(content.data(), static_cast<std::streamsize>(size))) return std::nullopt;
  return content;
}

}  // namespace

std::uint32_t crc32(const std::uint8_t* data, std::size_t size) {
  static constexpr std::array<std::uint32_t, 256> table = crc_table();
  std::uint32_t crc = 0xFFFFFFFF;
  for (std::size_t i = 0; i < size; ++i) crc = (crc >> 8) ^ table[(crc ^ data[i]) & 0xFF];
  return ~crc;
}

Image_Check check_image(const std::string& path, Firmware_Image& image) {
  const std::optional<std::vector<char>> read = read_file(path);
  if (!read) return Image_Check::Unreadable;
  const std::vector<char>& content = *read;
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(content.data());
  if (content.size() < header_size || std::memcmp(bytes, magic, 8) != 0 ||
      little_endian(bytes + 8) != 1 || little_endian(bytes + 12) != content.size() - header_size ||
      little_endian(bytes + 48) != crc32(bytes + header_size, content.size() - header_size)) {
    return Image_Check::Malformed;
  }
  image.version = field(bytes + 16, 16);
  image.model = field(bytes + 32, 16);
  return image.version.empty() ? Image_Check::Malformed : Image_Check::Good;
}

}  // namespace tvx::sim
