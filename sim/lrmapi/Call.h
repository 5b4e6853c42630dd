// What every entry point of the adapter management library goes through.
#pragma once

#include <optional>
#include <utility>

#include "rmapi/rmapi.h"
#include "state/Convert.h"
#include "state/Entry.h"

namespace tvx::sim {

/// Runs one entry point; see run_entry.
template <class Body>
RM_STATUS rm_call(const Call_Site& site, Body&& body,
                  const Failure_Outputs& outputs = {}) noexcept {
  return run_entry<RM_STATUS>(RM_ERROR, site, outputs, std::forward<Body>(body));
}

/// The same for a call about one local port, which `body` gets; a name that no local port has is
/// an invalid name.
template <class Body>
RM_STATUS port_call(const Call_Site& site, Body&& body,
                    const Failure_Outputs& outputs = {}) noexcept {
  return rm_call(
      site,
      [&](World& world, const Fault_Effect& effect) -> RM_STATUS {
        Port* port = world.find_port(*site.port);
        return port == nullptr ? RM_ERROR_INVALID_WWN : body(world, *port, effect);
      },
      outputs);
}

template <class Body>
RM_STATUS port_call(const char* name, const HBA_WWN& wwpn, Body&& body,
                    const Failure_Outputs& outputs = {}) noexcept {
  return port_call(Call_Site{.name = name, .port = to_wwn(wwpn)}, std::forward<Body>(body),
                   outputs);
}

/// Answers an attribute block under the faults of the call. `size` holds the room on the way in and
/// what was written, or is needed, on the way out.
RM_STATUS answer_block(Attribute_Map values, void* block, std::uint32_t* size,
                       const Fault_Effect& effect);

/// Answers a text whose room is told apart from its size; RM_ERROR_VERSION_TOO_SMALL without room.
RM_STATUS answer_text(const std::string& text, char* buffer, std::size_t room,
                      const Fault_Effect& effect);

}  // namespace tvx::sim
