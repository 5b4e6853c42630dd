// The texts that name a logical unit.
#pragma once

#include <cstdint>
#include <string>

#include "model/TVX_Target.h"

namespace cimrt {

/// Identifier types of inquiry page 0x83 that the names of devices look at.
inline constexpr std::uint32_t IDENTIFIER_EUI64 = 2;
inline constexpr std::uint32_t IDENTIFIER_NAA = 3;

/// The eight bytes of a LUN in memory order, as 16 upper-case digits.
std::string lunText(std::uint64_t fcpLun);

/// The identifier as upper-case digits, two a byte. It has to be of 8, 12 or 16 bytes: any other is
/// logged and gives an empty text.
std::string identifierText(const DeviceIdentification& identification);

/// `Name` of a device that is named by its identifier. An NAA identifier of format 1, 2 or 5 loses
/// its first two bytes and one of format 6 its first, which may leave nothing; every other one is
/// `identifier`, the text that `identifierText` gave.
std::string deviceName(const DeviceIdentification& identification, const std::string& identifier);

/// The texts that several instances of one unit carry.
struct Unit_Texts {
  std::string port;    ///< WWPN of the port, 16 digits
  std::string target;  ///< WWPN of the remote port, 16 digits
  std::string lun;
  std::string identifier;
  std::string inquiry;      ///< vendor, model and revision, cut to their standard lengths
  std::string description;  ///< the same with the serial number
};

/// Makes the texts of `target`, seen through the port of that name.
Unit_Texts unitTexts(const std::string& port, const Target& target);

}  // namespace cimrt
