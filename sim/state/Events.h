// Port events of the SNIA interface.
#pragma once

#include <cstdint>

#include "rmapi/snia_hba.h"
#include "state/Wwn.h"

namespace tvx::sim {

/// Remembers a callback for the events of one local port and answers its handle, never null.
HBA_CALLBACKHANDLE add_callback(HBA_PORT_EVENT_CALLBACK callback, void* data, const Wwn& port);

/// Forgets it; no call of it runs afterwards. False if there is no such handle.
bool remove_callback(HBA_CALLBACKHANDLE handle);

/// Calls the callbacks of the port, on this thread. Answers how many there were.
int post_event(const Wwn& port, std::uint32_t type, std::uint32_t fabric_port);

}  // namespace tvx::sim
