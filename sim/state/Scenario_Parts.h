// The readers of the parts of a scenario; each throws Scenario_Error.
#pragma once

#include "state/Json_Reader.h"
#include "state/World.h"

namespace tvx::sim {

/// Reads one element of "cards" and appends the card, its ports and its adapters to the world.
void read_card(const Json_Reader& card, World& world);

/// Reads one element of "faults".
Fault_Rule read_fault(const Json_Reader& fault);

/// Reads an object of attribute values by name or number into `values`; a null value puts the
/// number into `omitted`.
void read_attributes(const Json_Reader& parent, const std::string& key,
                     std::span<const Attribute_Row> rows, Attribute_Map& values,
                     std::set<std::uint32_t>& omitted);

}  // namespace tvx::sim
