#include "state/Firmware_Image.h"

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>

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

}  // namespace

std::uint32_t crc32(const std::uint8_t* data, std::size_t size) {
  std::uint32_t crc = 0xFFFFFFFF;
  for (std::size_t i = 0; i < size; ++i) {
    crc ^= data[i];
    for (int bit = 0; bit < 8; ++bit) crc = (crc >> 1) ^ ((crc & 1) != 0 ? 0xEDB88320 : 0);
  }
  return ~crc;
}

Image_Check check_image(const std::string& path, Firmware_Image& image) {
  std::ifstream file(path, std::ios::binary);
  if (!file) return Image_Check::Unreadable;
  const std::vector<char> content{std::istreambuf_iterator<char>(file), {}};
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
