// The transceiver plugged into a port.
#pragma once

#include <cstdint>
#include <string>

#include "agent/MapBuild.h"

namespace cimrt {

/// Reads the transceiver of a port and inserts its instance: the entry, or null when the port has
/// none, can't be read, or the map refuses; the reason is logged. On the refresh thread, with the
/// agent's map and data locks held.
TVXHBA_Transceiver* CreateTransceiver(ProviderAgent& agent, const char* deviceID);

/// A date code (YYMMDD) as the text of a CIM timestamp; years above 69 are of the last century.
/// Empty if it is not six digits.
std::string manufactureDateText(const std::string& dateCode);

/// A low temperature threshold. The sign bit has a rule of its own here, which is not that of two's
/// complement.
float lowTemperature(std::uint16_t word);

}  // namespace cimrt
