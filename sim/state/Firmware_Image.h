// The simulator's firmware images.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tvx::sim {

/// What the header of an image says. The file begins with 64 bytes, integers in little-endian:
///
/// | offset | size | content |
/// |---|---|---|
/// | 0 | 8 | "TVXFWIMG" |
/// | 8 | 4 | version of the header, 1 |
/// | 12 | 4 | length of the payload behind the header |
/// | 16 | 16 | firmware version, filled up with zeros |
/// | 32 | 16 | the start of the models it is for, filled up with zeros; empty fits all |
/// | 48 | 4 | CRC-32 (polynomial 0xEDB88320) of the payload |
/// | 52 | 12 | zeros |
struct Firmware_Image {
  std::string version;
  std::string model;
};

enum class Image_Check { Good, Unreadable, Malformed };

/// Reads and checks a file; `image` is filled when the answer is Good.
Image_Check check_image(const std::string& path, Firmware_Image& image);

/// CRC-32 as Ethernet and zip files use it.
std::uint32_t crc32(const std::uint8_t* data, std::size_t size);

}  // namespace tvx::sim
