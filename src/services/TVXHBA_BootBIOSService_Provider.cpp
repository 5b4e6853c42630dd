#include "services/TVXHBA_BootBIOSService_Provider.h"

#include "access/TVX_MethodWrapper.h"
#include "services/Service_Checks.h"

namespace cimrt {

namespace {

constexpr const char* OWNER = "TVXHBA_BootBIOSService_Provider";

/// What one method logs, and the character that it hands on.
struct Boot_Method {
  const char* entry;
  const char* nullTarget;
  char controlWord;
};

constexpr Boot_Method ENABLE = {
    "TVXHBA_BootBIOSService_Provider::EnableBootBIOS()",
    "TVXHBA_BootBIOSService_Provider EnableBootBIOS invald fc port ...return", 'E'};
constexpr Boot_Method DISABLE = {
    "TVXHBA_BootBIOSService_Provider::DisableBootBIOS()",
    "TVXHBA_BootBIOSService_Provider DisableBootBIOS invald fc port ...return", 'D'};
constexpr Boot_Method STATUS = {
    "TVXHBA_BootBIOSService_Provider::GetBootBIOSStatus",
    "TVXHBA_BootBIOSService_Provider GetBootBIOS invald fc port ...return", '\0'};

/// What every method does first; METHOD_OK, or its result.
std::uint32_t openCall(ProviderAgent& agent, const Boot_Method& method,
                       const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
                       HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "%s", method.entry);
  if (!isKnownService(agent.m_TVXHBA_BootBIOSService_map, service)) {
    TVX_LOG(TVX_ERR, "Invalid instance of Boot BIOS Service");
    return METHOD_UNKNOWN_SERVICE;
  }
  if (!target) {
    TVX_LOG(TVX_ERR, "%s", method.nullTarget);
    return METHOD_UNKNOWN_PORT;
  }
  const TVXHBA_FCPort* port = findPortOfDevice(agent, target);
  if (!port) {
    TVX_LOG(TVX_ERR, "TVXHBA_BootBIOSService_Provider invald fc port ...return");
    return METHOD_UNKNOWN_PORT;
  }
  return convertPortName(OWNER, port->DeviceID, wwpn) ? METHOD_OK : METHOD_UNKNOWN_PORT;
}

std::uint32_t failure(RM_STATUS status) {
  return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

std::uint32_t setState(const Boot_Method& method, const TVXHBA_BootBIOSService* service,
                       const TVXHBA_FCPort* target) {
  Service_Call call;
  HBA_WWN wwpn{};
  if (const auto refused = openCall(call.agent, method, service, target, wwpn)) return refused;
  TVX_LOG(TVX_DBG,
          "Entering TVXHBA_BootBIOSService_Provider::EnableBootBIOS(): tvxcimSetBootBiosState");
  const RM_STATUS status = TVX_MethodWrapper::tvxcimSetBootBiosState(wwpn, &method.controlWord);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_BootBIOSService_Provider::tvxcimSetBootBiosState failed");
    return failure(status);
  }
  TVX_LOG(TVX_INFO, "TVXHBA_BootBIOSService_Provider::tvxcimSetBootBiosState o.k.");
  return METHOD_OK;
}

std::uint32_t getState(const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
                       Property<std::uint32_t>& out) {
  Service_Call call;
  HBA_WWN wwpn{};
  if (const auto refused = openCall(call.agent, STATUS, service, target, wwpn)) return refused;
  std::uint32_t state = 0;
  const RM_STATUS status = TVX_MethodWrapper::tvxcimGetBootBiosState(wwpn, &state);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_BootBIOSService_Provider::tvxcimGetBootBiosState failed");
    return failure(status);
  }
  out.set(state);
  TVX_LOG(TVX_DBG, "TVXHBA_BootBIOSService_Provider::GetBootBIOSStatus O.K.");
  return METHOD_OK;
}

}  // namespace

std::int32_t TVXHBA_BootBIOSService_Provider::EnableBootBIOS(
    const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
    Property<std::uint32_t>& return_value) {
  return_value.set(setState(ENABLE, service, target));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_BootBIOSService_Provider::DisableBootBIOS(
    const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
    Property<std::uint32_t>& return_value) {
  return_value.set(setState(DISABLE, service, target));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_BootBIOSService_Provider::GetBootBIOSStatus(
    const TVXHBA_BootBIOSService* service, const TVXHBA_FCPort* target,
    Property<std::uint32_t>& state, Property<std::uint32_t>& return_value) {
  return_value.set(getState(service, target, state));
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
