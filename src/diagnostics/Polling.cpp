#include "diagnostics/Polling.h"

#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"
#include "common/TVX_Clock.h"

namespace cimrt {

namespace {

bool isRunning(const RM_DiagResult& result) {
  return result.state == RM_DIAG_QUEUED || result.state == RM_DIAG_RUNNING;
}

void poll(Running_Test& test, const char* pollText) {
  tvxSleep(DIAGNOSTIC_PAUSE);
  test.result = {};
  test.status = LRM_DiagGetResults(test.wwpn, test.id, &test.result);
  TVX_LOG(TVX_DBG, pollText, test.status);
}

bool wasCanceled(const HBA_WWN& wwpn, std::uint32_t id, RM_STATUS& status) {
  RM_DiagResult result{};
  status = LRM_DiagGetResults(wwpn, id, &result);
  TVX_LOG(TVX_DBG, "Polling for the results.. : %d", status);
  return status == RM_OK && result.state == RM_DIAG_CANCELED;
}

}  // namespace

bool pollForResult(Running_Test& test, const char* pollText) {
  for (int left = DIAGNOSTIC_ROUNDS - 1; left >= 0; left--) {
    poll(test, pollText);
    if (test.status != RM_OK && test.status != RM_ERROR_DIAG_NOT_READY) return false;
    const bool running = isRunning(test.result);
    if (test.status == RM_OK && !running) return true;
    if (running && left == 1 && CancelTest(&test.wwpn, test.id, test.name) == RM_OK) return false;
  }
  return false;
}

RM_STATUS CancelTest(const HBA_WWN* wwpn, std::uint32_t id, const char* testName) {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::CancelTest");
  if (!wwpn || id == 0) {
    TVX_LOG(TVX_DBG, "Invalid Parameter");
    return RM_ERROR;
  }
  RM_STATUS status = RM_ERROR;
  for (int round = 0; round < DIAGNOSTIC_ROUNDS; round++) {
    status = LRM_DiagCancelDiagnostic(*wwpn, id);
    TVX_LOG(TVX_DBG, "Polling for the Cancel status ..: %d", status);
    tvxSleep(DIAGNOSTIC_PAUSE);
    if (status != RM_OK) {
      TVX_LOG(TVX_DBG, "Unknown error, Unable to cancel the test, Exited with the error code : %d",
              status);
    } else if (wasCanceled(*wwpn, id, status)) {
      TVX_LOG(TVX_DBG, "Canceled the %s", testName);
      return RM_OK;
    }
  }
  return status;
}

}  // namespace cimrt
