#include "state/World.h"

#include <algorithm>
#include <cctype>
#include <ctime>

namespace tvx::sim {
namespace {

constexpr std::uint32_t node_symbolic_name_id = 0x207;
constexpr std::uint32_t operational_firmware_id = 0x210;
constexpr std::uint32_t kernel_version_id = 0x222;

bool is_version_character(char c) {
  return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '.';
}

// "2.01a4" stands by itself in "FV2.01a4 DV5", and not in "12.01a4" or "2.01a41".
bool stands_alone(const std::string& text, std::size_t at, std::size_t size) {
  const char before = at == 0 ? ' ' : text[at - 1];
  const char after = at + size == text.size() ? ' ' : text[at + size];
  return !std::isdigit(static_cast<unsigned char>(before)) && before != '.' &&
         !is_version_character(after);
}

void replace_version(std::string& text, const std::string& old, const std::string& fresh) {
  for (std::size_t at = text.find(old); at != std::string::npos; at = text.find(old, at)) {
    const bool alone = stands_alone(text, at, old.size());
    if (alone) text.replace(at, old.size(), fresh);
    at += alone ? fresh.size() : 1;
  }
}

}  // namespace

Port* World::find_port(const Wwn& name) {
  for (Port& port : ports) {
    if (port.names.port == name) return &port;
  }
  return nullptr;
}

std::int64_t counter_seconds(const World& world) {
  if (world.clock_held) return world.advanced;
  return static_cast<std::int64_t>(std::time(nullptr)) - world.made_at + world.advanced;
}

bool link_is_up(const Port& port) {
  return port.state == 2 || port.state == 20;
}

const Target* find_target(const Port& port, const Wwn& name) {
  if (!link_is_up(port)) return nullptr;
  for (const Target& target : port.targets) {
    if (target.names.port == name) return &target;
  }
  return nullptr;
}

void activate(Port& port, Activation event) {
  Wwn_Store& store = port.wwns;
  if (store.pending && store.activation <= event) {
    port.names = *store.pending;
    store.current_is_volatile = store.pending_is_volatile;
    store.pending.reset();
  }
  if (port.firmware.pending && port.firmware.activation <= event) {
    for (const std::uint32_t id : {operational_firmware_id, kernel_version_id}) {
      port.card_values.insert_or_assign(id, text_value(*port.firmware.pending));
    }
    port.firmware.running = *port.firmware.pending;
    port.firmware.pending.reset();
  }
}

const std::string& running_firmware(const World& world, const Port& port) {
  return port.firmware.running.empty() ? world.cards[port.card].firmware_version
                                       : port.firmware.running;
}

std::string with_running_firmware(const World& world, const Port& port, std::string text) {
  const std::string& old = world.cards[port.card].firmware_version;
  if (!old.empty()) replace_version(text, old, running_firmware(world, port));
  return text;
}

Attribute_Map adapter_attributes(const World& world, const Port& port) {
  Attribute_Map values = port.card_values;
  if (const auto name = values.find(node_symbolic_name_id); name != values.end()) {
    const std::string text(name->second.begin(), name->second.end());
    const std::string told = with_running_firmware(world, port, text);
    name->second.assign(told.begin(), told.end());
  }
  for (const std::uint32_t id : port.omitted) values.erase(id);
  return values;
}

Attribute_Map port_attributes(const Port& port) {
  Attribute_Map values = port.values;
  values.emplace(0x305, number_value(port.type));
  values.emplace(0x306, number_value(port.state));
  values.emplace(0x30F, Bytes(port.fabric_name.begin(), port.fabric_name.end()));
  for (const std::uint32_t id : port.omitted) values.erase(id);
  return values;
}

std::uint32_t hba_port_state(const Port& port) {
  if (port.hba_state != 0) return port.hba_state;
  switch (port.state) {
    case 20:  // operational, reset wanted
      return 2;
    case 21:  // link down, reset wanted
      return 6;
    case 22:  // disabled
      return 3;
    default:
      return port.state;
  }
}

}  // namespace tvx::sim
