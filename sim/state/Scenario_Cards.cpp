#include <cstdio>

#include "rmapi/snia_hba.h"
#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

const std::map<std::string, std::uint32_t> port_types = {{"unknown", 1},
                                                         {"other", 2},
                                                         {"not present", 3},
                                                         {"n", 5},
                                                         {"nl", 6},
                                                         {"fl", 7},
                                                         {"f", 8},
                                                         {"e", 9},
                                                         {"g", 10},
                                                         {"loop", 20},
                                                         {"point to point", 21}};

const std::map<std::string, std::uint32_t> port_states = {{"unknown", 1},
                                                          {"online", 2},
                                                          {"offline", 3},
                                                          {"bypassed", 4},
                                                          {"diagnostics", 5},
                                                          {"link down", 6},
                                                          {"error", 7},
                                                          {"loopback", 8},
                                                          {"online, reset wanted", 20},
                                                          {"link down, reset wanted", 21},
                                                          {"disabled", 22}};

// The speed bits of the SNIA interface.
const std::map<std::string, std::uint32_t> speeds = {{"unknown", 0}, {"1G", 1},  {"2G", 2},
                                                     {"10G", 4},     {"4G", 8},  {"8G", 16},
                                                     {"16G", 32},    {"32G", 64}};

const std::map<std::string, std::uint32_t> fec_states = {{"off", 0}, {"on", 1}, {"unsupported", 2}};

Bytes attribute_bytes(const Json_Reader& reader, const std::string& key, const Attribute_Row* row) {
  const nlohmann::json& value = reader.raw(key);
  if (const std::optional<std::uint64_t> number = json_unsigned(value);
      number && (row == nullptr || row->kind != Attribute_Kind::Text)) {
    const bool wide = row ? row->kind == Attribute_Kind::Number64 : *number > UINT32_MAX;
    if (!wide && *number > UINT32_MAX) reader.fail(key, "does not fit 32 bits");
    return wide ? number64_value(*number) : number_value(static_cast<std::uint32_t>(*number));
  }
  if (value.is_object()) {
    const Json_Reader raw = *reader.object(key);
    Bytes bytes = raw.bytes("hex");
    raw.finish();
    return bytes;
  }
  if (!value.is_string()) reader.fail(key, "must be a number, a text, {\"hex\": ...} or null");
  return text_value(value.get<std::string>());
}

const Attribute_Row* row_of(std::span<const Attribute_Row> rows, std::uint32_t id) {
  for (const Attribute_Row& row : rows) {
    if (row.id == id) return &row;
  }
  return nullptr;
}

void set_text(Attribute_Map& values, const char* name, const std::string& text) {
  values.insert_or_assign(find_row(card_attribute_rows(), name)->id, text_value(text));
}

void set_number(Attribute_Map& values, const char* name, std::uint32_t number) {
  values.insert_or_assign(find_row(card_attribute_rows(), name)->id, number_value(number));
}

Card read_card_texts(const Json_Reader& card, std::size_t index) {
  char serial[16];
  std::snprintf(serial, sizeof serial, "TX%08zu", 52100417 + index * 1311);
  Card result;
  result.manufacturer = card.text("manufacturer", "Torvex Corporation");
  result.serial_number = card.text("serial_number", serial);
  result.model = card.text("model", "TVX16002");
  result.model_description =
      card.text("model_description", "Torvex " + result.model + " PCIe Fibre Channel Adapter");
  result.hardware_version = card.text("hardware_version", "0000000b");
  result.driver_version = card.text("driver_version", "5.2.18.4");
  result.driver_name = card.text("driver_name", "tvxfc");
  result.option_rom_version = card.text("option_rom_version", "5.30a2");
  result.firmware_version = card.text("firmware_version", "2.01a4");
  result.node_symbolic_name = card.text(
      "node_symbolic_name", "Torvex " + result.model + " firmware " + result.firmware_version +
                                " driver " + result.driver_version);
  result.vendor_specific_id = card.number<std::uint32_t>("vendor_specific_id", 0xE3001E77);
  result.driver_type = card.number<std::uint32_t>("driver_type", 5);
  return result;
}

void read_temperature(const Json_Reader& card, Attribute_Map& values) {
  std::uint32_t current = 42;
  std::uint32_t critical = 60;
  std::uint32_t warning = 70;
  if (const std::optional<Json_Reader> temperature = card.object("board_temperature")) {
    current = temperature->number<std::uint8_t>("current", 42);
    critical = temperature->number<std::uint8_t>("critical", 60);
    warning = temperature->number<std::uint8_t>("warning", 70);
    temperature->finish();
  }
  set_number(values, "board_temperature", warning << 16 | critical << 8 | current);
}

// Everything that follows from the firmware version and the texts of the card.
void set_versions(const Card& card, Attribute_Map& values) {
  const std::string& firmware = card.firmware_version;
  set_text(values, "node_symbolic_name", card.node_symbolic_name);
  set_text(values, "option_rom_version", card.option_rom_version);
  for (const char* name : {"operational_firmware", "initial_firmware_load", "kernel_version",
                           "firmware_on_flash", "ulp_firmware_version", "sp_firmware_version"}) {
    set_text(values, name, firmware);
  }
  for (const char* name : {"boot_bios_version", "fc_universal_version", "fc_x86_bios_version",
                           "fc_efi_version", "fc_fcode_version"}) {
    set_text(values, name, card.option_rom_version);
  }
  set_text(values, "sli1_firmware_name", "SLI-1 Overlay");
  set_text(values, "sli2_firmware_name", "SLI-2 Overlay");
  set_text(values, "sli3_firmware_name", "SLI-3 Overlay");
  set_text(values, "ulp_firmware_name", "ULP " + card.model);
  set_text(values, "sp_firmware_name", "SP " + card.model);
}

Attribute_Map read_card_values(const Json_Reader& reader, const Card& card, std::size_t index) {
  Attribute_Map values;
  set_versions(card, values);
  read_temperature(reader, values);
  set_number(values, "device_id", reader.number<std::uint32_t>("device_id", 0xE300));
  set_number(values, "model_id", reader.number<std::uint32_t>("model_id", 0xE312));
  set_number(values, "function_type", reader.number<std::uint32_t>("function_type", 0));
  set_number(values, "sli_mode", reader.number<std::uint32_t>("sli_mode", 4));
  set_number(values, "diag_version", reader.number<std::uint32_t>("diag_version", 2));
  set_number(values, "pci_bus_number",
             reader.number<std::uint32_t>("pci_bus_number", static_cast<std::uint32_t>(4 + index)));
  if (reader.has("sub_adapter_id")) {
    set_text(values, "sub_adapter_id", reader.text("sub_adapter_id", {}));
  }
  return values;
}

constexpr std::uint32_t fec_state_id = 0x360;

Bytes fcp_types() {
  Bytes types(32);
  types[2] = 1;  // the FCP bit
  return types;
}

// The link of a port that the scenario says nothing about.
void make_link(Port& port) {
  port.fc_id = 0x010000 + static_cast<std::uint32_t>(port.card * 0x400 + port.number * 0x100);
  port.fabric_name = wwn_from_number(0x100000054D5A8000ULL);
  port.type = HBA_PORTTYPE_NPORT;
  port.state = HBA_PORTSTATE_ONLINE;
  port.supported_speed = 8 | 16 | 32;
  port.speed = 32;
  port.class_of_service = 8;  // class 3
  port.supported_fc4_types = port.active_fc4_types = fcp_types();
  port.max_frame_size = 2048;
  port.discovered_ports = 2;
  port.values.emplace(fec_state_id, number_value(0));
}

void read_names(const Json_Reader& reader, Port& port, std::size_t card, std::size_t host) {
  const std::uint64_t serial = 0x025456000000ULL + card * 0x100 + port.number;
  port.names.port = reader.wwn("wwpn", wwn_from_number(0x1000000000000000ULL | serial));
  port.names.node = reader.wwn("wwnn", wwn_from_number(0x2000000000000000ULL | serial));
  port.os_device_name =
      reader.text("os_device_name", "/sys/class/scsi_host/host" + std::to_string(host));
}

// What LRM_GetHBAAttributes tells of the card, seen through this port.
void read_port_card_values(const Json_Reader& reader, const Attribute_Map& card_values,
                           Port& port) {
  port.card_values = card_values;
  set_number(port.card_values, "port_number", port.number);
  set_number(port.card_values, "pci_function_number",
             reader.number<std::uint32_t>("pci_function_number", port.number));
  set_number(port.card_values, "boot_code_enabled",
             reader.flag("boot_code_enabled", false) ? 1 : 0);
  const Wwn& name = port.names.port;
  port.card_values.insert_or_assign(0x213, Bytes(name.begin() + 2, name.end()));
  if (reader.has("sub_adapter_id")) {
    set_text(port.card_values, "sub_adapter_id", reader.text("sub_adapter_id", {}));
  }
}

Port read_port(const Json_Reader& reader, const Json_Reader& card_reader, World& world,
               const Attribute_Map& card_values, std::uint32_t number) {
  Port port;
  port.card = world.cards.size() - 1;
  port.number = number;
  read_names(reader, port, port.card, world.ports.size());
  make_link(port);
  const Card& card = world.cards.back();
  port.symbolic_name = card.node_symbolic_name + " PORT-" + std::to_string(number);
  read_link(reader, port);
  read_port_card_values(reader, card_values, port);
  read_attributes(card_reader, "attributes", card_attribute_rows(), port.card_values, port.omitted);
  read_attributes(reader, "adapter_attributes", card_attribute_rows(), port.card_values,
                  port.omitted);
  read_attributes(reader, "attributes", port_attribute_rows(), port.values, port.omitted);
  read_port_features(reader, port);
  read_product(reader, card, port);
  port.targets = read_targets(reader);
  reader.finish();
  return port;
}

// One SNIA adapter a port, as dual-port cards show themselves, or one for the whole card.
void append_adapters(const Json_Reader& card, World& world, std::size_t first_port) {
  const std::map<std::string, std::uint32_t> ways = {{"port", 0}, {"card", 1}};
  const bool whole_card = card.choice("adapter_per", 0, ways) == 1;
  const std::string name = card.text("adapter_name", "Torvex-" + world.cards.back().model);
  for (std::size_t port = first_port; port < world.ports.size(); ++port) {
    if (!whole_card || port == first_port) {
      const std::size_t number = world.adapters.size() + 1;
      world.adapters.push_back({name + "-" + std::to_string(number), world.cards.size() - 1, {}});
    }
    world.adapters.back().ports.push_back(port);
  }
}

}  // namespace

void read_link(const Json_Reader& reader, Port& port) {
  port.fc_id = reader.number<std::uint32_t>("fc_id", port.fc_id);
  port.fabric_name = reader.wwn("fabric_name", port.fabric_name);
  port.symbolic_name = reader.text("symbolic_name", port.symbolic_name);
  port.type = reader.choice("type", port.type, port_types);
  port.state = reader.choice("state", port.state, port_states);
  port.hba_state = reader.choice("hba_state", port.hba_state, port_states);
  port.supported_speed = reader.choice("supported_speed", port.supported_speed, speeds);
  port.speed = reader.choice("speed", port.speed, speeds);
  port.class_of_service = reader.number<std::uint32_t>("class_of_service", port.class_of_service);
  if (reader.has("supported_fc4_types")) {
    port.supported_fc4_types = reader.bytes("supported_fc4_types");
  }
  if (reader.has("active_fc4_types")) port.active_fc4_types = reader.bytes("active_fc4_types");
  port.max_frame_size = reader.number<std::uint32_t>("max_frame_size", port.max_frame_size);
  port.discovered_ports = reader.number<std::uint32_t>("discovered_ports", port.discovered_ports);
  if (reader.has("fec_state")) {
    port.values.insert_or_assign(fec_state_id,
                                 number_value(reader.choice("fec_state", 0, fec_states)));
  }
}

void read_attributes(const Json_Reader& parent, const std::string& key,
                     std::span<const Attribute_Row> rows, Attribute_Map& values,
                     std::set<std::uint32_t>& omitted) {
  const std::optional<Json_Reader> attributes = parent.object(key);
  if (!attributes) return;
  for (const auto& member : parent.raw(key).items()) {
    const std::optional<std::uint32_t> id = attribute_number(rows, member.key());
    if (!id) attributes->fail(member.key(), "is not an attribute that is known here");
    if (member.value().is_null()) {
      omitted.insert(*id);
    } else {
      values.insert_or_assign(*id, attribute_bytes(*attributes, member.key(), row_of(rows, *id)));
    }
  }
}

void read_card(const Json_Reader& card, World& world) {
  const std::size_t index = world.cards.size();
  world.cards.push_back(read_card_texts(card, index));
  const Attribute_Map values = read_card_values(card, world.cards.back(), index);
  const std::size_t first_port = world.ports.size();
  std::uint32_t number = 0;
  for (const Json_Reader& port : card.objects("ports")) {
    Port made = read_port(port, card, world, values, number++);
    if (world.find_port(made.names.port) != nullptr) {
      port.fail("wwpn", "is the name of another port too");
    }
    world.ports.push_back(std::move(made));
  }
  if (world.ports.size() == first_port) card.fail("ports", "must hold at least one port");
  append_adapters(card, world, first_port);
  card.finish();
}

}  // namespace tvx::sim
