// What every entry point of the SNIA library goes through.
#pragma once

#include <optional>
#include <utility>

#include "rmapi/snia_hba.h"
#include "state/Convert.h"
#include "state/Entry.h"

namespace tvx::sim {

/// Runs one entry point; see run_entry.
template <class Site, class Body>
HBA_STATUS hba_call(Site&& site, Body&& body, const Failure_Outputs& outputs = {}) noexcept {
  return run_entry<HBA_STATUS>(HBA_STATUS_ERROR, std::forward<Site>(site), outputs,
                               std::forward<Body>(body));
}

/// A call on an open adapter, as the faults see it.
struct Handle_Call {
  const char* name;
  HBA_HANDLE handle;
  std::optional<HBA_UINT32> port_index{};  ///< the local port among those of the adapter
  std::optional<Wwn> target{};             ///< remote port
  std::optional<std::uint64_t> lun{};
  std::optional<std::uint32_t> page{};
};

/// The site of such a call; a handle that is not open leaves it without an adapter.
Call_Site site_of(const Handle_Call& call);

/// Runs a call on an open adapter, which `body` gets; a handle that is not open is an invalid one.
template <class Body>
HBA_STATUS handle_call(const Handle_Call& call, Body&& body,
                       const Failure_Outputs& outputs = {}) noexcept {
  return hba_call([&call] { return site_of(call); },
                  [&](World& world, const Fault_Effect& effect) -> HBA_STATUS {
                    const auto found = world.handles.find(call.handle);
                    if (found == world.handles.end()) return HBA_STATUS_ERROR_INVALID_HANDLE;
                    return body(world, world.adapters[found->second], effect);
                  },
                  outputs);
}

}  // namespace tvx::sim
