// The readers of the parts of a scenario; each throws Scenario_Error.
#pragma once

#include "state/Json_Reader.h"
#include "state/World.h"

namespace tvx::sim {

/// Reads one element of "cards" and appends the card, its ports and its adapters to the world.
void read_card(const Json_Reader& card, World& world);

/// Reads what is said of a port's link; the rest of it stays.
void read_link(const Json_Reader& port_reader, Port& port);

/// Reads the "targets" of a port. An element may stand for several of them.
std::vector<Target> read_targets(const Json_Reader& port_reader);

/// Reads what a port offers to management; its identity and link must be known already.
void read_port_features(const Json_Reader& port_reader, Port& port);
/// Reads vital product data, transceiver and flash contents.
void read_product(const Json_Reader& port_reader, const Card& card, Port& port);

/// Reads one driver parameter.
Driver_Parameter read_parameter(const Json_Reader& parameter);
/// The parameters of a driver when a scenario names none.
std::vector<Driver_Parameter> made_parameters();

/// Reads one element of "faults".
Fault_Rule read_fault(const Json_Reader& fault);

/// Reads an object of attribute values by name or number into `values`; a null value puts the
/// number into `omitted`.
void read_attributes(const Json_Reader& parent, const std::string& key,
                     std::span<const Attribute_Row> rows, Attribute_Map& values,
                     std::set<std::uint32_t>& omitted);

}  // namespace tvx::sim
