// What the simulated host holds: cards, their ports, and the adapters that the SNIA library shows.
#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "state/Attributes.h"
#include "state/Fault.h"
#include "state/Wwn.h"

namespace tvx::sim {

/// A port name with its node name.
struct Wwn_Pair {
  Wwn port{};
  Wwn node{};
  bool operator==(const Wwn_Pair&) const = default;
};

/// One physical port. Everything that a library call can change is here.
struct Port {
  std::size_t card = 0;  ///< index in World::cards
  std::uint32_t number = 0;
  Wwn_Pair names;
  Wwn fabric_name{};
  std::uint32_t fc_id = 0;
  std::uint32_t type = 0;
  std::uint32_t state = 0;
  std::uint32_t hba_state = 0;  ///< what the SNIA library tells; 0: follows `state`
  std::uint32_t class_of_service = 0;
  Bytes supported_fc4_types;
  Bytes active_fc4_types;
  std::string symbolic_name;
  std::string os_device_name;
  std::uint32_t supported_speed = 0;
  std::uint32_t speed = 0;
  std::uint32_t max_frame_size = 0;
  std::uint32_t discovered_ports = 0;
  Attribute_Map card_values;        ///< what LRM_GetHBAAttributes tells through this port
  Attribute_Map values;             ///< what LRM_GetPortAttributes tells beyond the live values
  std::set<std::uint32_t> omitted;  ///< attribute numbers that this port never reports
};

/// What the ports of one card share.
struct Card {
  std::string manufacturer;
  std::string serial_number;
  std::string model;
  std::string model_description;
  std::string node_symbolic_name;
  std::string hardware_version;
  std::string driver_version;
  std::string driver_name;
  std::string option_rom_version;
  std::string firmware_version;
  std::uint32_t vendor_specific_id = 0;
  std::uint32_t driver_type = 0;
};

/// An adapter as the SNIA library shows it: one port of a card, or all of them.
struct Adapter {
  std::string name;
  std::size_t card = 0;
  std::vector<std::size_t> ports;  ///< indices in World::ports
};

/// Versions and texts that belong to the libraries.
struct Library_Texts {
  std::string mili_version;
  std::map<std::uint32_t, std::string> versions;  ///< by selector of RM_GetVersion
};

struct World {
  std::string scenario;  ///< path of the file, or "built-in"
  Library_Texts library;
  std::vector<Card> cards;
  std::vector<Port> ports;
  std::vector<Adapter> adapters;
  std::vector<Fault_Rule> faults;
  std::vector<std::string> omitted_symbols;
  std::map<std::uint32_t, std::size_t> handles;  ///< open SNIA handles, to adapter indices
  std::uint32_t next_handle = 1;

  /// The port with this current port name; null when there is none.
  Port* find_port(const Wwn& name);
};

/// The attributes that LRM_GetHBAAttributes reports through this port.
Attribute_Map adapter_attributes(const Port& port);
/// The attributes that LRM_GetPortAttributes reports.
Attribute_Map port_attributes(const Port& port);
/// The port state as the SNIA library tells it.
std::uint32_t hba_port_state(const Port& port);

}  // namespace tvx::sim
