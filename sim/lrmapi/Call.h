// What every entry point of the adapter management library goes through.
#pragma once

#include <cstring>
#include <optional>
#include <utility>

#include "rmapi/rmapi.h"
#include "state/Fields.h"
#include "state/Simulation.h"

namespace tvx::sim {

inline Wwn to_wwn(const HBA_WWN& name) {
  Wwn result;
  std::memcpy(result.data(), name.wwn, result.size());
  return result;
}

inline HBA_WWN from_wwn(const Wwn& name) {
  HBA_WWN result;
  std::memcpy(result.wwn, name.data(), name.size());
  return result;
}

/// Runs one entry point: counts it, applies the faults, and gives `body` the world under the lock.
/// A status of a fault is answered in place of the work; an exception is a generic failure.
template <class Body>
RM_STATUS rm_call(Call_Site site, Body&& body) noexcept {
  try {
    Simulation& simulation = Simulation::instance();
    const Fault_Effect effect = simulation.begin_call(std::move(site));
    if (effect.status) return static_cast<RM_STATUS>(*effect.status);
    return simulation.with_world([&](World& world) -> RM_STATUS { return body(world, effect); });
  } catch (...) {
    return RM_ERROR;
  }
}

/// The same for a call about one local port, which `body` gets; a name that no local port has is
/// an invalid name.
template <class Body>
RM_STATUS port_call(const char* name, const HBA_WWN& wwpn, Body&& body) noexcept {
  const Wwn wanted = to_wwn(wwpn);
  return rm_call({.name = name, .port = wanted},
                 [&](World& world, const Fault_Effect& effect) -> RM_STATUS {
                   Port* port = world.find_port(wanted);
                   return port == nullptr ? RM_ERROR_INVALID_WWN : body(world, *port, effect);
                 });
}

/// Answers an attribute block under the faults of the call. `size` holds the room on the way in and
/// what was written, or is needed, on the way out.
RM_STATUS answer_block(Attribute_Map values, void* block, std::uint32_t* size,
                       const Fault_Effect& effect);

/// Answers a text whose room is told apart from its size; RM_ERROR_VERSION_TOO_SMALL without room.
RM_STATUS answer_text(const std::string& text, char* buffer, std::size_t room,
                      const Fault_Effect& effect);

}  // namespace tvx::sim
