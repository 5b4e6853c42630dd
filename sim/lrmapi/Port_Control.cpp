// Enabling, resetting, beacon, boot code and features of a port.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

constexpr uint8_t reset_activates = 5;
constexpr uint32_t disabled_state = 22;
constexpr uint32_t reset_wanted_state = 20;

bool boot_code_is_enabled(const Port& port) {
  const auto found = port.card_values.find(RM_HA_BOOT_CODE_ENABLED);
  return found != port.card_values.end() && !found->second.empty() && found->second[0] != 0;
}

}  // namespace

extern "C" {

RM_STATUS LRM_SetPortEnabled(HBA_WWN wwpn, uint8_t enable, uint8_t* configStatus) {
  return port_call("LRM_SetPortEnabled", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (configStatus == nullptr) return RM_ERROR;
                     if (enable == 0 && boot_code_is_enabled(port)) {
                       return RM_ERROR_BOOT_CODE_ENABLED;
                     }
                     port.state = enable != 0 ? port.enabled_state : disabled_state;
                     *configStatus = port.enable_needs_reset ? reset_activates : 0;
                     return RM_OK;
                   });
}

// A reset activates what waits for it and ends a state that asked for one.
RM_STATUS LRM_ResetHBA(HBA_WWN wwpn, int) {
  return port_call("LRM_ResetHBA", wwpn, [](World& world, Port& port, const Fault_Effect&) {
    for (Port& other : world.ports) {
      if (other.card != port.card) continue;
      activate(other, Activation::Reset);
      if (other.state == reset_wanted_state) other.state = HBA_PORTSTATE_ONLINE;
      if (other.state == reset_wanted_state + 1) other.state = HBA_PORTSTATE_LINKDOWN;
      ++other.resets;
    }
    return RM_OK;
  });
}

RM_STATUS LRM_SetAdapterAttribute(HBA_WWN wwpn, uint32_t attribute, const void* value,
                                  uint32_t size) {
  return port_call("LRM_SetAdapterAttribute", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     uint32_t state = 0;
                     if (value == nullptr || size != sizeof state) return RM_ERROR;
                     if (attribute != RM_PA_FEC_STATE) return RM_ERROR;
                     std::memcpy(&state, value, sizeof state);
                     port.values.insert_or_assign(RM_PA_FEC_STATE, number_value(state));
                     return RM_OK;
                   });
}

RM_STATUS LRM_SetBootBiosState(HBA_WWN wwpn, uint32_t state) {
  return port_call(
      "LRM_SetBootBiosState", wwpn, [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
        if (state > RM_BOOT_ENABLE) return RM_ERROR;
        port.card_values.insert_or_assign(RM_HA_BOOT_CODE_ENABLED, number_value(state));
        return RM_OK;
      });
}

RM_STATUS LRM_DiagBeaconState(HBA_WWN wwpn, uint32_t* state) {
  return port_call("LRM_DiagBeaconState", wwpn,
                   [=](World&, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (state == nullptr) return RM_ERROR;
                     *state = port.beacon;
                     return RM_OK;
                   });
}

RM_STATUS LRM_DiagBeacon(HBA_WWN wwpn, uint32_t state) {
  return port_call("LRM_DiagBeacon", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (port.beacon == RM_BEACON_NOT_AVAILABLE) return RM_ERROR_DIAG_UNAVAILABLE;
                     if (state != RM_BEACON_OFF && state != RM_BEACON_ON) return RM_ERROR;
                     port.beacon = state;
                     return RM_OK;
                   });
}

RM_STATUS LRM_GetHBAFeature(HBA_WWN wwpn, uint32_t feature, uint32_t* value) {
  return port_call("LRM_GetHBAFeature", wwpn,
                   [=](World&, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (value == nullptr) return RM_ERROR;
                     const auto found = port.features.find(feature);
                     *value = found == port.features.end() ? 0 : found->second;
                     return RM_OK;
                   });
}

RM_STATUS LRM_GetHBAFeatureList(HBA_WWN wwpn, uint32_t size, uint8_t* features) {
  return port_call("LRM_GetHBAFeatureList", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     if (features == nullptr) return RM_ERROR;
                     Bytes flags(size);
                     for (const auto& [number, value] : port.features) {
                       if (number < size) flags[number] = static_cast<uint8_t>(value);
                     }
                     write_bytes(features, size, flags.data(), flags.size(), effect);
                     return RM_OK;
                   });
}

RM_STATUS LRM_GetServerAttributes(HBA_WWN name, void* block, uint32_t* size) {
  return rm_call(Call_Site{.name = "LRM_GetServerAttributes", .port = to_wwn(name)},
                 [=](const World& world, const Fault_Effect& effect) {
                   return answer_block({{RM_SA_OS_INFO, text_value(world.library.os_info)}}, block,
                                       size, effect);
                 },
                 {.told = size});
}

// What the interface leaves open is cleared: no quality of service is configured.
RM_STATUS LRM_GetQoS(HBA_WWN wwpn, void* info) {
  return port_call("LRM_GetQoS", wwpn, [=](World&, const Port&, const Fault_Effect&) -> RM_STATUS {
    return info == nullptr ? RM_ERROR : RM_OK;
  });
}

}  // extern "C"
