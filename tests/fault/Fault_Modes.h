// The ways in which a management library can fail a caller.
#pragma once

#include <string>
#include <vector>

#include "rmapi/rmapi.h"
#include "rmapi/snia_hba.h"

namespace tvx::test {

struct Fault_Mode {
  std::string name;
  /// Members of a fault besides "call"; empty for a symbol that is missing.
  std::string members;

  bool isMissingSymbol() const { return members.empty(); }
};

/// Failures that the headers of the libraries name, others that adapters answer, and one that means
/// nothing.
inline constexpr int FAILING_STATUSES[] = {RM_ERROR,
                                           RM_ERROR_NOT_SUPPORTED,
                                           HBA_STATUS_ERROR_INVALID_HANDLE,
                                           RM_ERROR_INVALID_POINTER,
                                           RM_ERROR_INVALID_WWN,
                                           HBA_STATUS_ERROR_ILLEGAL_INDEX,
                                           RM_ERROR_MORE_DATA,
                                           RM_ERROR_NO_MEMORY,
                                           HBA_STATUS_SCSI_CHECK_CONDITION,
                                           HBA_STATUS_ERROR_BUSY,
                                           HBA_STATUS_ERROR_TRY_AGAIN,
                                           HBA_STATUS_ERROR_UNAVAILABLE,
                                           22,
                                           25,
                                           26,
                                           RM_ERROR_DIRECTORY,
                                           41,
                                           RM_ERROR_DIAG_NOT_READY,
                                           61,
                                           RM_ERROR_DIAG_TABLE_FULL,
                                           RM_ERROR_DIAG_UNAVAILABLE,
                                           RM_ERROR_ADAPTER_BUSY,
                                           77,
                                           RM_ERROR_WWN_NOT_SUPPORTED,
                                           RM_ERROR_WWN_DUPLICATE,
                                           RM_ERROR_WWN_UNAVAILABLE,
                                           RM_ERROR_WWN_IN_PROGRESS,
                                           98,
                                           99,
                                           101,
                                           RM_ERROR_VPORT_UNSUPPORTED,
                                           144,
                                           145,
                                           RM_ERROR_MAILBOX_FAILED,
                                           RM_ERROR_MAILBOX_TIMEOUT,
                                           RM_ERROR_MAILBOX_BUSY,
                                           151,
                                           RM_ERROR_CONFIG_FILE,
                                           RM_ERROR_CONFIG_FILE_ALT,
                                           RM_ERROR_SCSI_CHECK,
                                           RM_ERROR_DIAG_PORT,
                                           RM_ERROR_LIST_TOO_SMALL,
                                           RM_ERROR_BOOT_CODE_ENABLED,
                                           RM_NEED_REBOOT,
                                           RM_ERROR_NO_CORE_DUMP,
                                           RM_ERROR_VERSION_TOO_SMALL,
                                           31337,
                                           -1};

/// Statuses that ask for another call with more room.
inline constexpr int TOO_SMALL_STATUSES[] = {RM_ERROR_MORE_DATA, RM_ERROR_LIST_TOO_SMALL,
                                             RM_ERROR_VERSION_TOO_SMALL};

/// All of them, the statuses first.
inline std::vector<Fault_Mode> faultModes() {
  std::vector<Fault_Mode> modes;
  for (const int status : FAILING_STATUSES)
    modes.push_back({"status " + std::to_string(status), R"("status": )" + std::to_string(status)});
  modes.push_back({"first call fails", R"("status": 8, "first": 1)"});
  modes.push_back({"every call but the first fails", R"("status": 1, "from": 2)"});
  modes.push_back({"slow", R"("delay_ms": 20)"});
  modes.push_back({"garbage", R"("garbage": true)"});
  modes.push_back({"texts without an end", R"("unterminated_texts": true)"});
  for (const char* size : {"0", "1", "7"})
    modes.push_back(
        {std::string("only ") + size + " bytes written", std::string(R"("write_only": )") + size});
  for (const std::string size : {"0", "1", "1025", "2147483647", "4294967295"}) {
    modes.push_back({"count told as " + size, R"("returned_size": )" + size});
    for (const int status : TOO_SMALL_STATUSES)
      modes.push_back({"status " + std::to_string(status) + ", wants " + size,
                       R"("status": )" + std::to_string(status) + R"(, "returned_size": )" + size});
  }
  modes.push_back({"missing symbol", ""});
  return modes;
}

}  // namespace tvx::test
