#include "state/World.h"

namespace tvx::sim {

Port* World::find_port(const Wwn& name) {
  for (Port& port : ports) {
    if (port.names.port == name) return &port;
  }
  return nullptr;
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
