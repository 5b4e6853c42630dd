// Vital product data of ports and field replaceable units.
#pragma once

#include <cstdint>
#include <string>

#include "access/TVX_MethodWrapper.h"
#include "agent/MapBuild.h"
#include "runtime/Array.h"
#include "runtime/String.h"

namespace cimrt {

/// Characters of a text of the unit's data, without the NUL.
inline constexpr std::size_t FRU_TEXT_LENGTH = 256;

/// Result of a failed operation on the unit's data, beside a status of the library.
inline constexpr std::int32_t FRU_FAILED = 32769;
/// Result of a look-up of a code that has no text.
inline constexpr std::int32_t CODE_UNKNOWN = 32768;

/// What a field replaceable unit says of itself. Plain memory: cleared is empty.
struct FRU_Data {
  using Text = char[FRU_TEXT_LENGTH + 1];
  Text manufacturer;
  Text productName;
  Text partNumber;
  Text serialNumber;
  Text uuid;  ///< 32 lower-case digits
  Text firmwareDetail;
  Text fruNumber;
  Text date;          ///< "WWYY"
  Text cardFunction;  ///< hexadecimal digits
  Text revisionID;    ///< hexadecimal digits
};

/// "Driver", "Firmware", ... for a value of `Classifications`. 0, or CODE_UNKNOWN with `text` as it
/// was.
std::int32_t softwareClassificationText(std::uint32_t code, std::string& text);
/// "Ethernet", "Fibre Channel", ... for the function code of a card. The same results.
std::int32_t cardFunctionText(std::uint32_t code, std::string& text);

/// Inserts the vital product data of a port into their map. 0; the library's status; or 1 when the
/// name is invalid or the map refuses. On the refresh thread, with the agent's map and data locks.
RM_STATUS CreateVPD(ProviderAgent& agent, const char* deviceID);

/// The same data as names ("VPD:" and what the keyword means) and values, appended to two arrays.
/// 0, the library's status, or 1 when the name is invalid.
RM_STATUS ListVPD(const char* deviceID, Array<String>& names, Array<String>& values);

class TVX_Vpd {
 public:
  /// Reads the unit's data through a port into `record`; what the unit does not say stays as it is.
  /// 0, the library's status, 1 for an invalid name, or 4 for a null argument.
  static RM_STATUS GetFRUVPD(const char* deviceID, FRU_Data* record);

  /// Takes the unit's data over to a card that has none yet, and makes their instance.
  /// @param kind chip of the port, which selects what stands for the ASIC
  /// @param asicText the ASIC of a sub-adapter
  /// @return 0, also when there are no data; FRU_FAILED when a map refuses
  static std::int32_t UpdateFRUToCard(ProviderAgent& agent, TVXHBA_Card* card, Chip_Kind kind,
                                      const char* asicText, const char* deviceID,
                                      std::uint32_t portIndex);

  /// Takes the unit's data over to the software of each port. 0, or FRU_FAILED without memory.
  static std::int32_t UpdateFRUToFCProvider(ProviderAgent& agent);
};

}  // namespace cimrt
