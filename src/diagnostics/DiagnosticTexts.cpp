#include "diagnostics/DiagnosticTexts.h"

#include <iterator>

#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr const char* UNKNOWN = "Unknown";

constexpr const char* TOO_HOT =
    "Error: HBA temperature exceeded operational range. Adapter stopped.\n\n"
    "Please see the product documentation";

/// By result code.
constexpr const char* RESULTS[] = {
    DIAGNOSTIC_SUCCESS,
    "General Error",
    "Link Down",
    "I/O Error",
    "Timeout",
    "Transmit Error",
    "Receive Error",
    "Mailbox Error",
    "Error: Echo test not supported",
    "Error: Echo Failed",
    "Error: Target Unreachable",
    TOO_HOT,
    "Error: Failed to allocate resource",
    "Error: Another diagnostic test is running. Please try again",
    "Error: Sequence Timeout",
    "Error: Bus reset received during test",
    "Error: Read-Write test is running",
    "Error: Driver busy. Please try again",
    "Error: Mailbox not ready",
    "Error: Port not ready",
};

}  // namespace

const char* MapDiagResultStatus(std::uint32_t code) {
  TVX_LOG(TVX_DBG, "MapDiagResultStatus");
  return code < std::size(RESULTS) ? RESULTS[code] : UNKNOWN;
}

const char* MapDiagStatus(RM_STATUS status) {
  TVX_LOG(TVX_DBG, "TVX_DiagTestFunc::MapDiagStatus");
  switch (status) {
    case RM_OK:
      return "Successful";
    case RM_ERROR:
      return "An unspecified error occurred";
    case RM_ERROR_NOT_SUPPORTED:
    case RM_ERROR_DIAG_UNAVAILABLE:
    case RM_ERROR_DIAG_PORT:
      return "Diagnostics not available/Port not supported";
    case RM_ERROR_DIAG_TABLE_FULL:
      return "There are too many pending/running requests in diag. results table";
    case RM_ERROR_ADAPTER_BUSY:
      return "Adapter Busy: Another critical application may be running";
    default:
      return UNKNOWN;
  }
}

}  // namespace cimrt
