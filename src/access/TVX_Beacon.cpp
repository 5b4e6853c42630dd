// The beacon of a port, as the property that tells and sets it.
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

const char* beaconName(std::uint32_t state) {
  switch (state) {
    case RM_BEACON_NOT_AVAILABLE:
      return "Not available";
    case RM_BEACON_OFF:
      return "Off";
    case RM_BEACON_ON:
      return "On";
    default:
      return "Unknown";
  }
}

/// What a failed read means.
std::uint16_t indicatorOfFailure(RM_STATUS status) {
  if (status == RM_ERROR_NOT_SUPPORTED) {
    TVX_LOG(TVX_DBG, "Beaconing not supported on host or adapter");
    return TVX_INDICATOR_NOT_SUPPORTED;
  }
  if (status == RM_ERROR_DIAG_UNAVAILABLE) {
    TVX_LOG(TVX_DBG, "Diagnostics not available");
    return TVX_INDICATOR_NOT_SUPPORTED;
  }
  TVX_LOG(TVX_DBG, "Unable to get the beacon state");
  return TVX_INDICATOR_UNKNOWN;
}

}  // namespace

int TVX_MethodWrapper::GetBeaconState(const char* deviceId, std::uint16_t* indicator) {
  TVX_LOG(TVX_DBG, "TVX_DiagTestFunc::GetBeaconState");
  if (indicator == nullptr) {
    TVX_LOG(TVX_DBG, "INVALID Parameter");
    return TVX_BEACON_REFUSED;
  }
  HBA_WWN wwpn{};
  if (deviceIdToWWN(&wwpn, deviceId) != RM_OK) return TVX_BEACON_REFUSED;
  std::uint32_t state = 0;
  if (const RM_STATUS status = LRM_DiagBeaconState(wwpn, &state); status != RM_OK) {
    *indicator = indicatorOfFailure(status);
    return 0;
  }
  TVX_LOG(TVX_DBG, "Beacon state = '%s'\n", beaconName(state));
  if (state == RM_BEACON_ON) *indicator = TVX_INDICATOR_ON;
  if (state == RM_BEACON_OFF) *indicator = TVX_INDICATOR_OFF;
  return 0;
}

int TVX_MethodWrapper::SetBeaconState(const HBA_WWN& wwpn, std::uint16_t indicator) {
  TVX_LOG(TVX_DBG, "TVX_DiagTestFunc::SetBeaconState");
  if (indicator != TVX_INDICATOR_ON && indicator != TVX_INDICATOR_OFF) return TVX_BEACON_REFUSED;
  const std::uint32_t state = indicator == TVX_INDICATOR_ON ? RM_BEACON_ON : RM_BEACON_OFF;
  if (LRM_DiagBeacon(wwpn, state) == RM_OK) {
    TVX_LOG(TVX_DBG, "Successfully set the beacon state");
  } else {
    TVX_LOG(TVX_DBG, "Failed to set the beacon state to %d ", static_cast<int>(state));
  }
  return 0;
}

}  // namespace cimrt
