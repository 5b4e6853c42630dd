// Settings of one port that the library takes at once: enabling, forward error correction.
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

/// What the library says of a setting that waits for a reset.
constexpr std::uint8_t AFTER_RESET = 5;

const char* textOf(const char* deviceId) {
  return deviceId != nullptr ? deviceId : "";
}

}  // namespace

RM_STATUS TVX_MethodWrapper::SetFECState(const char* deviceId, bool enable) {
  TVX_LOG(TVX_DBG, "Entered SetFECState %s %d", textOf(deviceId), enable);
  HBA_WWN wwpn{};
  if (deviceIdToWWN(&wwpn, deviceId) != RM_OK) return RM_ERROR;
  const int value = enable ? 1 : 0;
  static_assert(sizeof value == 4, "the attribute has four bytes");
  return LRM_SetAdapterAttribute(wwpn, RM_PA_FEC_STATE, &value, sizeof value);
}

RM_STATUS TVX_MethodWrapper::SetPortEnabled(const char* deviceId, bool enable,
                                            std::uint8_t* configStatus) {
  TVX_LOG(TVX_DBG, "Entered SetPortEnabled %s %d", textOf(deviceId), enable);
  if (configStatus == nullptr) return RM_ERROR_INVALID_POINTER;
  HBA_WWN wwpn{};
  if (deviceIdToWWN(&wwpn, deviceId) != RM_OK) return RM_ERROR;
  TVX_LOG(TVX_DBG, "Invoking RM_SetPortEnabled API ");
  std::uint8_t answer = 0;
  const RM_STATUS status = LRM_SetPortEnabled(wwpn, enable ? 1 : 0, &answer);
  TVX_LOG(TVX_DBG, " SetPortEnabled RM Status: %d", status);
  if (status == RM_ERROR_BOOT_CODE_ENABLED) {
    TVX_LOG(TVX_DBG, "SetPortEnabled::One or more port Functions have Boot Code enabled");
    TVX_LOG(TVX_DBG, "Please disable boot Code and try again");
    return status;
  }
  if (status != RM_OK) {
    TVX_LOG(TVX_DBG, "RM_SetPortEnabled() Failed.");
    return status;
  }
  if (answer == AFTER_RESET) TVX_LOG(TVX_DBG, "Please reset the HBA to activate the new setting");
  *configStatus = answer;
  TVX_LOG(TVX_DBG, "Exiting SetPortEnabled function call. Dynamic value\t: %d", answer);
  return status;
}

}  // namespace cimrt
