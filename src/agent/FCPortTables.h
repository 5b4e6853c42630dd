// How what the libraries say of a port becomes property values.
#pragma once

#include <array>
#include <cstdint>

#include "runtime/Array.h"

namespace cimrt {

/// A status value with its text.
struct Port_Status {
  std::uint32_t state;  ///< port state of the libraries
  std::uint16_t operationalStatus;
  const char* description;
};

/// A port type with the text that goes with it.
struct Port_Type {
  std::uint32_t type;  ///< port type of the libraries
  std::uint16_t portType;
  const char* otherPortType;
};

/// Status by port state; the row of "Unknown" for any state not listed.
const Port_Status& portStatus(std::uint32_t portState);

/// Type by the libraries' port type; the row of "Unknown" for any type not listed.
const Port_Type& portType(std::uint32_t libraryType);

/// Bits a second of the current speed, which is a single value; 0 for any other.
std::uint64_t portSpeed(std::uint32_t speed);

/// Bits a second of the best of a set of speeds, by the first bit found in a fixed order; 0 for
/// none.
std::uint64_t maxPortSpeed(std::uint32_t speeds);

/// Service classes of a bit set; one element 0 if there is none.
Array<std::uint16_t> classesOfService(std::uint32_t bits);

/// FC-4 types of a mask, one word for each byte of it; one element 0 for an empty mask, and a
/// final 1 for a bit that has no value of its own.
Array<std::uint16_t> fc4Types(const std::array<std::uint32_t, 32>& mask);

}  // namespace cimrt
