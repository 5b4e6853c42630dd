// Reading, changing and restoring the names of a port.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

// What ChangeWWN, RestoreWWN and ReadWWN tell beside their status.
enum Operation_Status : uint32_t {
  Already_Active = 1,
  Current_Is_Volatile = 3,
  Current_Is_Non_Volatile = 4,
  Volatile_After_Reboot = 5,
  Non_Volatile_After_Reboot = 6,
  Volatile_After_Reset = 7,
  Non_Volatile_After_Reset = 8,
  Does_Not_Exist = 9,
};

enum Capability : uint32_t {
  Can_Change_Non_Volatile = 4,
  Can_Change_Volatile = 8,
  Read_Only = 0x8000
};

enum Read_Type : uint32_t {
  Read_Volatile,
  Read_Non_Volatile,
  Read_Factory,
  Read_Current,
  Read_Configured
};

uint32_t activation_status(const Wwn_Store& store, bool is_volatile) {
  if (store.activation == Activation::Reboot) {
    return is_volatile ? Volatile_After_Reboot : Non_Volatile_After_Reboot;
  }
  return is_volatile ? Volatile_After_Reset : Non_Volatile_After_Reset;
}

// Stores new names and leaves them to their activation.
uint32_t configure(Port& port, const Wwn_Pair& names, bool is_volatile) {
  Wwn_Store& store = port.wwns;
  if (is_volatile) {
    store.temporary = names;
  } else {
    store.non_volatile = names;
  }
  store.pending = names;
  store.pending_is_volatile = is_volatile;
  const uint32_t status = activation_status(store, is_volatile);
  activate(port, Activation::At_Once);
  return status;
}

// Statuses that come before any change: not offered, not allowed, still busy.
RM_STATUS refusal(Wwn_Store& store, bool is_volatile) {
  if (store.capability == 0 || (store.capability & Read_Only) != 0) return RM_ERROR_WWN_UNAVAILABLE;
  const uint32_t wanted = is_volatile ? Can_Change_Volatile : Can_Change_Non_Volatile;
  if ((store.capability & wanted) == 0) return RM_ERROR_WWN_NOT_SUPPORTED;
  if (store.busy_left > 0) {
    --store.busy_left;
    return RM_ERROR_WWN_IN_PROGRESS;
  }
  store.busy_left = store.busy_calls;
  return RM_OK;
}

/// The names of one kind, and what is told of them; no names where there are none.
struct Reading {
  std::optional<Wwn_Pair> names;
  uint32_t status = 0;
};

Reading read_configured(const Wwn_Store& store) {
  if (!store.pending) return {{}, Does_Not_Exist};
  return {store.pending, activation_status(store, store.pending_is_volatile)};
}

Reading read_names(const Port& port, uint32_t type) {
  const Wwn_Store& store = port.wwns;
  switch (type) {
    case Read_Volatile:
      if (!store.temporary) return {{}, Does_Not_Exist};
      return {store.temporary, store.current_is_volatile ? uint32_t{Already_Active} : 0};
    case Read_Non_Volatile:
      return {store.non_volatile, 0};
    case Read_Factory:
      return {store.factory, 0};
    case Read_Current:
      return {port.names,
              store.current_is_volatile ? Current_Is_Volatile : Current_Is_Non_Volatile};
    default:
      return read_configured(store);
  }
}

}  // namespace

extern "C" {

RM_STATUS LRM_GetWWNCapability(HBA_WWN wwpn, uint32_t* capability) {
  return port_call("LRM_GetWWNCapability", wwpn,
                   [=](World&, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (capability == nullptr) return RM_ERROR;
                     if (port.wwns.capability == 0) return RM_ERROR_WWN_UNAVAILABLE;
                     *capability = port.wwns.capability;
                     return RM_OK;
                   });
}

RM_STATUS LRM_ChangeWWN(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, uint32_t type,
                        uint32_t* operationStatus) {
  return port_call("LRM_ChangeWWN", wwpn,
                   [=](World& world, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (operationStatus == nullptr || type > 1) return RM_ERROR;
                     const Wwn_Pair names{to_wwn(newWwpn), to_wwn(newWwnn)};
                     const Port* holder = world.find_port(names.port);
                     if (holder != nullptr && holder != &port) return RM_ERROR;
                     const bool is_volatile = type == 0;
                     const RM_STATUS refused = refusal(port.wwns, is_volatile);
                     if (refused != RM_OK) return refused;
                     *operationStatus = configure(port, names, is_volatile);
                     return RM_OK;
                   },
                   {.told = operationStatus});
}

RM_STATUS LRM_RestoreWWN(HBA_WWN wwpn, uint32_t type, uint32_t* operationStatus) {
  return port_call("LRM_RestoreWWN", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (operationStatus == nullptr || type > 1) return RM_ERROR;
                     const RM_STATUS refused = refusal(port.wwns, false);
                     if (refused != RM_OK) return refused;
                     const Wwn_Pair wanted = type == 0 ? port.wwns.factory : port.wwns.non_volatile;
                     if (wanted == port.names && !port.wwns.pending) {
                       *operationStatus = Already_Active;
                       return RM_OK;
                     }
                     port.wwns.temporary.reset();
                     *operationStatus = configure(port, wanted, false);
                     return RM_OK;
                   },
                   {.told = operationStatus});
}

RM_STATUS LRM_ReadWWN(HBA_WWN wwpn, uint32_t type, HBA_WWN* outWwpn, HBA_WWN* outWwnn,
                      uint32_t* operationStatus) {
  return port_call("LRM_ReadWWN", wwpn,
                   [=](World&, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (outWwpn == nullptr || outWwnn == nullptr || operationStatus == nullptr)
                       return RM_ERROR;
                     if (type > Read_Configured) return RM_ERROR;
                     if (port.wwns.capability == 0) return RM_ERROR_WWN_UNAVAILABLE;
                     const bool can_be_volatile = (port.wwns.capability & Can_Change_Volatile) != 0;
                     if (type == Read_Volatile && !can_be_volatile)
                       return RM_ERROR_WWN_NOT_SUPPORTED;
                     const Reading reading = read_names(port, type);
                     *operationStatus = reading.status;
                     const Wwn_Pair names = reading.names.value_or(Wwn_Pair{});
                     *outWwpn = from_wwn(names.port);
                     *outWwnn = from_wwn(names.node);
                     return RM_OK;
                   },
                   {.told = operationStatus});
}

}  // extern "C"
