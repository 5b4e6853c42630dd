// What every entry point of both libraries goes through.
#pragma once

#include <string_view>
#include <type_traits>
#include <utility>

#include "state/Fields.h"
#include "state/Simulation.h"

namespace tvx::sim {

/// Where a call that fails by a fault still has something to tell.
struct Failure_Outputs {
  std::uint32_t* told = nullptr;  ///< size or count, taken from the fault's "returned_size"
  void* sense = nullptr;          ///< SCSI sense data, taken from the fault's "sense"
  std::uint32_t sense_size = 0;
};

inline void write_failure(const Fault_Effect& effect, const Failure_Outputs& outputs) {
  if (outputs.told != nullptr && effect.returned_size) *outputs.told = *effect.returned_size;
  if (outputs.sense != nullptr && !effect.sense.empty()) {
    write_bytes(outputs.sense, outputs.sense_size, effect.sense.data(), effect.sense.size(), {});
  }
}

/// Runs one entry point: counts it, applies the faults, and gives `body` the world under the lock.
/// `site` is a Call_Site, or makes one. The status of a fault is answered in place of the work; an
/// exception is answered as `error`. Nothing is thrown.
template <class Status, class Site, class Body>
Status run_entry(Status error, Site&& site, const Failure_Outputs& outputs, Body&& body) noexcept {
  try {
    Simulation& simulation = Simulation::instance();
    Call_Site made = [&]() -> Call_Site {
      if constexpr (std::is_invocable_v<Site>) {
        return site();
      } else {
        return std::forward<Site>(site);
      }
    }();
    const std::string_view name = made.name;
    const Fault_Effect effect = simulation.begin_call(std::move(made));
    if (effect.status) {
      write_failure(effect, outputs);
      return static_cast<Status>(*effect.status);
    }
    return simulation.with_world([&](World& world) -> Status {
      const Status status = body(world, effect);
      simulation.end_call(name);
      return status;
    });
  } catch (...) {
    return error;
  }
}

}  // namespace tvx::sim
