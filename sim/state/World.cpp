#include "state/World.h"

#include <algorithm>
#include <ctime>

namespace tvx::sim {
namespace {

constexpr std::uint32_t operational_firmware_id = 0x210;
constexpr std::uint32_t kernel_version_id = 0x222;

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
    port.firmware.pending.reset();
  }
}

Attribute_Map adapter_attributes(const Port& port) {
  Attribute_Map values = port.card_values;
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
