// Optimized access storage: marked units as instances of the driver's parameters.
#pragma once

#include <cstdint>
#include <string>

#include "agent/ProviderAgent.h"
#include "generated/Records.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// Where a unit is marked.
enum class Oas_Option : std::uint16_t { DRIVER = 0, CONFIGURATION = 1 };

inline constexpr std::int32_t OAS_UNIT_REFUSED = 32769;

/// State of a unit.
inline constexpr std::uint8_t OAS_OFF = 0;
inline constexpr std::uint8_t OAS_ON = 1;

/// `paramname` of a marked unit.
inline constexpr const char* OAS_PARAMETER = "OAS";

/// The fields of an `InstanceID` such as "TVX:OAS:Driver:10000254560C4110:50060E801049CF51:3".
struct Oas_Fields {
  std::string option;     ///< the word at its fixed place, whatever it says
  std::string initiator;  ///< device id
  std::string target;     ///< device id
  std::string lun;        ///< decimal digits
  bool complete = false;  ///< all fields are there, and where they belong
};

/// Takes an `InstanceID` apart by the fixed places of its fields. What is short or malformed is not
/// complete; nothing behind its end is read.
Oas_Fields cutOasInstanceID(const std::string& instanceID);

/// Fills in what all marked units have.
void setOasProperties(TVXHBA_DriverParams& unit, Oas_Option option, std::uint32_t state);

/// Makes an instance of every unit of a list, tied to the service. 0; or OAS_UNIT_REFUSED at the
/// first one that the map refuses, with the rest left out. The caller holds the agent's map and
/// data locks.
/// @param port, target device ids
/// @param list holds as many records as its count tells
std::int32_t createOasUnits(ProviderAgent& agent, const std::string& port,
                            const std::string& target, Oas_Option option,
                            const RM_OASLunList& list);

/// Removes what ties a unit to the service and to its port. Of two ties that stand side by side in
/// a map the second is passed over. The caller holds the data lock. Always true.
bool dropOasAssociations(ProviderAgent& agent, const TVXHBA_DriverParams& unit);

}  // namespace cimrt
