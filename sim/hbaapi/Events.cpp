// Callbacks for port events.
#include "state/Events.h"

#include "hbaapi/Call.h"

using namespace tvx::sim;

extern "C" {

HBA_STATUS HBA_RegisterForAdapterPortEvents(HBA_PORT_EVENT_CALLBACK callback, void* userData,
                                            HBA_HANDLE handle, HBA_WWN portWWN,
                                            HBA_CALLBACKHANDLE* callbackHandle) {
  const Wwn port = to_wwn(portWWN);
  return handle_call(
      {.name = "HBA_RegisterForAdapterPortEvents", .handle = handle},
      [&](const World& world, const Adapter& adapter, const Fault_Effect&) -> HBA_STATUS {
        if (callback == nullptr || callbackHandle == nullptr) return HBA_STATUS_ERROR_ARG;
        for (const std::size_t index : adapter.ports) {
          if (world.ports[index].names.port != port) continue;
          *callbackHandle = add_callback(callback, userData, port);
          return HBA_STATUS_OK;
        }
        return HBA_STATUS_ERROR_ILLEGAL_WWN;
      });
}

// The lock of the world is not held while a callback may be running.
HBA_STATUS HBA_RemoveCallback(HBA_CALLBACKHANDLE callbackHandle) {
  const HBA_STATUS status = hba_call(Call_Site{.name = "HBA_RemoveCallback"},
                                     [](World&, const Fault_Effect&) { return HBA_STATUS_OK; });
  if (status != HBA_STATUS_OK) return status;
  return remove_callback(callbackHandle) ? HBA_STATUS_OK : HBA_STATUS_ERROR_INVALID_HANDLE;
}

}  // extern "C"
