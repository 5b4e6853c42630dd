// What the simulated host holds: cards, their ports, and the adapters that the SNIA library shows.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "state/Attributes.h"
#include "state/Fault.h"
#include "state/San.h"
#include "state/Wwn.h"

namespace tvx::sim {

/// The counters of a port: each starts somewhere and moves with time or by a script.
struct Counter {
  std::uint64_t start = 0;
  std::uint64_t per_second = 0;
  std::vector<std::uint64_t> script;  ///< values of the first, second ... read; the last stays
  std::size_t reads = 0;
};

/// When a change of names or firmware takes effect.
enum class Activation { At_Once, Reset, Reboot };

/// The names that a port has stored, and the change that waits for its activation.
struct Wwn_Store {
  Wwn_Pair factory;
  Wwn_Pair non_volatile;
  std::optional<Wwn_Pair> temporary;  ///< the volatile names
  std::optional<Wwn_Pair> pending;    ///< configured, not active yet
  bool pending_is_volatile = false;
  bool current_is_volatile = false;
  std::uint32_t capability = 0;
  Activation activation = Activation::Reset;
  std::uint32_t busy_calls = 0;  ///< so many calls of a change answer "in progress"
  std::uint32_t busy_left = 0;
};

struct Firmware_Store {
  Activation activation = Activation::Reset;
  std::optional<std::string> pending;  ///< on flash, waiting to become operational
  std::string running;                 ///< what took the place of the card's; empty: nothing yet
};

struct Driver_Parameter {
  std::string name;
  std::uint32_t low = 0;
  std::uint32_t high = 0;
  std::uint32_t initial = 0;
  std::uint32_t current = 0;
  std::uint16_t export_flag = 1;
  std::uint16_t dynamic = 0;
  std::string help;
};

struct Virtual_Port {
  Wwn_Pair names;
  std::uint32_t fc_id = 0;
  std::string name;
};

struct Dump_Store {
  std::string directory;
  std::uint32_t retention = 20;
  std::vector<std::string> files;
  std::uint32_t made = 0;  ///< dumps generated so far, for their names
};

/// A unit with optimized access; option 0 is the driver's setting, 1 the stored configuration.
struct Oas_Entry {
  Wwn target{};
  std::uint64_t lun = 0;
  std::uint32_t option = 0;
  std::uint8_t state = 1;
};

/// How one kind of diagnostic goes on this port.
struct Diagnostic_Plan {
  std::uint32_t polls = 1;  ///< so many polls find it running
  bool endless = false;
  std::uint32_t result = 0;
  std::uint32_t final_state = 6;
  std::uint32_t errors = 0;
};

struct Diagnostic_Run {
  Diagnostic_Plan plan;
  std::uint32_t polls = 0;
  std::uint32_t cycles = 1;
  bool canceled = false;
};

struct Flash_Entry {
  std::uint32_t start = 0;
  std::uint32_t length = 0;
  std::array<std::uint32_t, 2> program_id{};
  std::string description;
  std::string type;
  std::string version;
  bool wakeup = false;
};

/// One entry of the vital product data: a keyword of two characters and its text.
struct Vpd_Entry {
  std::string keyword;
  std::string value;
};

/// The transceiver, as its two pages tell it.
struct Transceiver {
  bool present = true;
  std::array<bool, 3> flags = {true, true, true};  ///< identity, diagnostics, third
  std::uint8_t identifier = 3;
  std::uint8_t ext_identifier = 4;
  std::uint8_t connector = 7;
  std::uint16_t wavelength = 850;
  float temperature = 38.5F;
  float vcc = 3.31F;
  float tx_bias = 7.42F;
  float tx_power = 0.54F;
  float rx_power = 0.49F;
  Bytes oui = {0x00, 0x17, 0x6A};
  std::string vendor;
  std::string part_number;
  std::string revision;
  std::string serial_number;
  std::string date_code;
  std::array<std::uint16_t, 20> thresholds{};
};

/// A tag for the frames between two ports.
struct Qos_Entry {
  Wwn source{};
  Wwn target{};
  std::uint8_t tag = 0;
};

struct Qos_Store {
  std::uint32_t flag = 0;
  std::vector<Qos_Entry> entries;
};

/// The configuration registers of a port's PCI function that a scenario chooses.
struct Pci_Function {
  std::uint32_t family = 5;
  std::uint16_t vendor_id = 0x1E77;
  std::uint16_t device_id = 0;  ///< 0: the low half of the card's device number
  std::uint16_t subsystem_id = 0;
  std::uint8_t revision = 0x10;
  std::uint8_t interrupt_line = 11;
  std::vector<std::uint32_t> words;  ///< the family's registers, from the first on
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
  std::uint32_t enabled_state = 2;  ///< what `state` becomes when a disabled port is enabled
  bool enable_needs_reset = true;
  std::map<std::uint32_t, Counter> counters;
  Wwn_Store wwns;
  Firmware_Store firmware;
  std::uint32_t beacon = 2;
  std::vector<Driver_Parameter> driver_params;
  Dump_Store dumps;
  bool oas_supported = true;
  std::vector<Oas_Entry> oas;
  bool vports_supported = true;
  std::vector<Virtual_Port> vports;
  std::map<std::string, Diagnostic_Plan> diagnostics;  ///< by "post", "loopback", "pci", "echo"
  std::map<std::uint32_t, Diagnostic_Run> runs;        ///< by id
  std::vector<Vpd_Entry> vpd;
  std::vector<Vpd_Entry> fru;
  Transceiver transceiver;
  std::vector<Flash_Entry> flash;
  std::map<std::uint32_t, std::uint32_t> features;
  Pci_Function pci;
  Qos_Store qos;
  std::uint32_t resets = 0;
  std::vector<Target> targets;      ///< what lies behind the port while its link is up
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
  std::string os_info;                            ///< what a target is told of the host
};

struct World {
  std::string scenario;  ///< path of the file, or "built-in"
  Library_Texts library;
  std::vector<Card> cards;
  std::vector<Port> ports;
  std::vector<Adapter> adapters;
  std::vector<Fault_Rule> faults;
  std::vector<std::string> omitted_symbols;
  std::vector<Driver_Parameter> global_params;
  std::uint32_t next_diagnostic = 1;
  std::int64_t made_at = 0;                      ///< seconds of the clock when the world was made
  std::int64_t advanced = 0;                     ///< seconds that the clock was put forward since
  bool clock_held = false;                       ///< the clock shows `advanced` alone
  std::map<std::uint32_t, std::size_t> handles;  ///< open SNIA handles, to adapter indices
  std::map<std::uint32_t, std::size_t> qos_handles;  ///< the same of the frame tagging library
  std::uint32_t next_handle = 1;

  /// The port with this current port name; null when there is none.
  Port* find_port(const Wwn& name);
};

/// Whether the port's link is up, so that it sees its targets.
bool link_is_up(const Port& port);
/// The target with this port name among those that the port sees; null when there is none.
const Target* find_target(const Port& port, const Wwn& name);

/// Makes what waits for this activation, or a lesser one, take effect: names and firmware.
void activate(Port& port, Activation event);

/// The firmware version that the port runs: its card's, or what became operational since.
const std::string& running_firmware(const World& world, const Port& port);
/// A text that may tell the firmware version of the port's card, with the version that runs.
std::string with_running_firmware(const World& world, const Port& port, std::string text);

/// The attributes that LRM_GetHBAAttributes reports through this port.
Attribute_Map adapter_attributes(const World& world, const Port& port);
/// The attributes that LRM_GetPortAttributes reports.
Attribute_Map port_attributes(const Port& port);
/// Seconds on the clock of the counters since the world was made.
std::int64_t counter_seconds(const World& world);
/// The port state as the SNIA library tells it.
std::uint32_t hba_port_state(const Port& port);

}  // namespace tvx::sim
