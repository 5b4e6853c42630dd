// What every entry point of the SNIA library goes through.
#pragma once

#include <optional>
#include <utility>

#include "rmapi/snia_hba.h"
#include "state/Fields.h"
#include "state/Simulation.h"

namespace tvx::sim {

inline HBA_WWN to_hba(const Wwn& name) {
  HBA_WWN result;
  std::memcpy(result.wwn, name.data(), name.size());
  return result;
}

inline Wwn from_hba(const HBA_WWN& name) {
  Wwn result;
  std::memcpy(result.data(), name.wwn, result.size());
  return result;
}

/// Runs one entry point: counts it, applies the faults, and gives `body` the world under the lock.
/// A status of a fault is answered in place of the work; an exception is a plain error.
template <class Body>
HBA_STATUS hba_call(Call_Site site, Body&& body) noexcept {
  try {
    Simulation& simulation = Simulation::instance();
    const Fault_Effect effect = simulation.begin_call(std::move(site));
    if (effect.status) return static_cast<HBA_STATUS>(*effect.status);
    return simulation.with_world([&](World& world) -> HBA_STATUS { return body(world, effect); });
  } catch (...) {
    return HBA_STATUS_ERROR;
  }
}

/// What a call on an open adapter is about; with a port index also the port's name. A handle that
/// is not open leaves the site without an adapter.
Call_Site site_of(const char* name, HBA_HANDLE handle, std::optional<HBA_UINT32> port_index = {});

/// Runs a call on an open adapter, which `body` gets; a handle that is not open is an invalid one.
template <class Body>
HBA_STATUS handle_call(Call_Site site, HBA_HANDLE handle, Body&& body) noexcept {
  return hba_call(std::move(site), [&](World& world, const Fault_Effect& effect) -> HBA_STATUS {
    const auto found = world.handles.find(handle);
    if (found == world.handles.end()) return HBA_STATUS_ERROR_INVALID_HANDLE;
    return body(world, world.adapters[found->second], effect);
  });
}

}  // namespace tvx::sim
