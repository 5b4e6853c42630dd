// The driver's parameters, read and set.
#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <string>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

static_assert(sizeof(RM_DriverParam) == 132 && offsetof(RM_DriverParam, help) == 52);

constexpr std::uint32_t FIRST_COUNT = 52;      // what a driver has as a rule
constexpr std::uint32_t MAX_COUNT = 1U << 16;  // more than a driver can truly have
constexpr std::size_t TEXT_SIZE = 256;

constexpr const char* LOCAL_FAILED = "RM_GetDriverParams:failed";
constexpr const char* NO_BUFFER =
    "ERROR: tvxcimGetDriverParamsGlobal: Unable to allocate buffer";  // for either scope

/// Room for so many parameters, in the place of what was there. Missing memory, or a count that
/// can't be true, is logged with the text.
RM_STATUS allocate(std::uint32_t count, const char* text, TVX_Driver_Params& params) {
  params.block.reset();
  if (count <= MAX_COUNT)
    params.block = tvxAllocate(std::max<std::size_t>(count, 1) * sizeof(RM_DriverParam));
  params.count = params.room = params.block ? count : 0;
  if (params.block) return RM_OK;
  TVX_LOG(TVX_CRIT, "%s", text);
  return RM_ERROR_NO_MEMORY;
}

RM_STATUS callLibrary(TVX_Driver_Scope scope, const HBA_WWN& wwpn, TVX_Driver_Params& params) {
  auto* records = reinterpret_cast<RM_DriverParam*>(params.block.get());
  if (scope == TVX_Driver_Scope::GLOBAL) {
    const RM_STATUS status = LRM_GetDriverParamsGlobal(wwpn, records, &params.count);
    TVX_LOG(TVX_DBG, "RM_GetDriverParamsGlobal: status=%d", status);
    return status;
  }
  const RM_STATUS status = LRM_GetDriverParams(wwpn, records, &params.count);
  TVX_LOG(TVX_DBG, "RM_GetDriverParams: status=%d", status);
  return status;
}

/// @param call "b" for the first call, "a" for the second
RM_STATUS logFailure(TVX_Driver_Scope scope, const char* call, RM_STATUS status) {
  if (scope == TVX_Driver_Scope::LOCAL) {
    TVX_LOG(TVX_ERR, "%s", LOCAL_FAILED);
  } else {
    TVX_LOG(TVX_ERR,
            "ERROR: tvxcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (%s) (%d)",
            call, status);
  }
  return status;
}

bool needsMoreRoom(RM_STATUS status) {
  return status == RM_ERROR_MORE_DATA || status == RM_ERROR_LIST_TOO_SMALL;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::AllocateDriverParams(TVX_Driver_Params* params) {
  return allocate(FIRST_COUNT, NO_BUFFER, *params);
}

RM_STATUS TVX_MethodWrapper::ReadDriverParams(const HBA_WWN& wwpn, TVX_Driver_Scope scope,
                                              TVX_Driver_Params* params) {
  if (!params->block && AllocateDriverParams(params) != RM_OK) return RM_ERROR_NO_MEMORY;
  params->count = params->room;
  RM_STATUS status = callLibrary(scope, wwpn, *params);
  if (status != RM_OK && !needsMoreRoom(status)) return logFailure(scope, "b", status);
  if (needsMoreRoom(status)) {
    const char* text = scope == TVX_Driver_Scope::LOCAL ? LOCAL_FAILED : NO_BUFFER;
    if (allocate(params->count, text, *params) != RM_OK) return RM_ERROR_NO_MEMORY;
    status = callLibrary(scope, wwpn, *params);
    if (status != RM_OK) return logFailure(scope, "a", status);
  }
  params->count = std::min(params->count, params->room);
  return RM_OK;
}

RM_STATUS TVX_MethodWrapper::tvxcimSetDriverParam(const char* deviceId, const HBA_WWN* wwpn,
                                                  std::uint32_t cw1, std::uint32_t cw2,
                                                  const char* parameter, const char* value) {
  if (Validatewwpn(wwpn) != RM_OK) {
    TVX_LOG(TVX_ERR, "INVALID wwpn");
    return RM_ERROR;
  }
  const struct {
    bool wrong;
    const char* text;
  } checks[] = {
      {cw1 > 1, "INVALID CW1"},
      {cw2 > 1, "INVALID CW2"},
      {parameter == nullptr, "Null pointer assignment in argument pDriverParam"},
      {value == nullptr, "Null pointer assignment in argument pVal"},
  };
  for (const auto& check : checks) {
    if (!check.wrong) continue;
    TVX_LOG(TVX_ERR, "%s", check.text);
    return RM_ERROR;
  }
  TVX_LOG(TVX_DBG, "tvxcimSetDriverParam Parameters ::");
  TVX_LOG(TVX_DBG, "CW1=%d CW2=%d pDriverParam=%s pVal=%s, deviceID=%s", static_cast<int>(cw1),
          static_cast<int>(cw2), parameter, value, deviceId != nullptr ? deviceId : "");
  const std::uint32_t controlWord = cw1 << 1 | cw2;
  char text[TEXT_SIZE] = {};
  std::snprintf(text, sizeof text, "%s=%s", parameter, value);
  TVX_LOG(TVX_DBG, "pParamStr:[%s], Ccw:[%d]", text, static_cast<int>(controlWord));
  TVX_LOG(TVX_DBG, "Calling RM_SetDriverParam");
  const RM_STATUS status = LRM_SetDriverParam(*wwpn, text, controlWord);
  if (status != RM_OK) TVX_LOG(TVX_ERR, "RM_SetDriverParam fails with status : %d", status);
  return status;
}

}  // namespace cimrt
