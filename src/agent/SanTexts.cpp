#include "agent/SanTexts.h"

#include <algorithm>
#include <cstring>

#include "agent/Format_Text.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

/// "%02X" of each byte.
std::string hexText(const std::uint8_t* bytes, std::size_t count) {
  constexpr const char* digits = "0123456789ABCDEF";
  std::string text;
  text.reserve(2 * count);
  for (std::size_t i = 0; i < count; i++) {
    text += digits[bytes[i] >> 4];
    text += digits[bytes[i] & 0x0F];
  }
  return text;
}

/// Where the vendor's own part of an NAA identifier begins; 0 for a format that is kept whole.
std::size_t naaStart(std::uint8_t firstByte) {
  switch (firstByte >> 4) {
    case 1:
    case 2:
    case 5:
      return 2;
    case 6:
      return 1;
    default:
      return 0;
  }
}

std::size_t identifierSize(const DeviceIdentification& identification) {
  return std::min<std::size_t>(identification.identifierLength, identification.identifier.size());
}

}  // namespace

std::string lunText(std::uint64_t fcpLun) {
  std::uint8_t bytes[sizeof fcpLun];
  std::memcpy(bytes, &fcpLun, sizeof bytes);
  return hexText(bytes, sizeof bytes);
}

std::string identifierText(const DeviceIdentification& identification) {
  switch (identification.identifierLength) {
    case 8:
    case 12:
    case 16:
      return hexText(identification.identifier.data(), identification.identifierLength);
    default:
      TVX_LOG(TVX_ERR, "INVALID Descriptor");
      return {};
  }
}

std::string deviceName(const DeviceIdentification& identification, const std::string& identifier) {
  if (identification.identifierType == IDENTIFIER_EUI64) return identifierText(identification);
  if (identification.identifierType != IDENTIFIER_NAA) return identifier;
  const std::size_t start = naaStart(identification.identifier[0]);
  if (start == 0) return identifier;
  const std::size_t size = identifierSize(identification);
  if (start >= size) return {};
  return hexText(identification.identifier.data() + start, size - start);
}

Unit_Texts unitTexts(const std::string& port, const Target& target) {
  const char* const vendor = target.vendor.c_str();
  const char* const model = target.model.c_str();
  const char* const revision = target.revision.c_str();
  Unit_Texts texts;
  texts.port = port;
  texts.target = target.portWWN;
  texts.lun = lunText(target.fcpLun);
  texts.identifier = identifierText(target.deviceIdentification);
  texts.inquiry = formatText("%.8s %.16s Revision %.4s", vendor, model, revision);
  texts.description = formatText("%.8s %.16s Revision %.4s Serial Number %.40s", vendor, model,
                                 revision, target.serialNumber.c_str());
  return texts;
}

}  // namespace cimrt
