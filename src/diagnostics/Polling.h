// A test that the library runs: waiting for its end, and canceling it.
#pragma once

#include <cstdint>

#include "rmapi/rmapi.h"

namespace cimrt {

/// Most times that anything is asked for or tried again.
inline constexpr int DIAGNOSTIC_ROUNDS = 122;
/// Pause between two rounds, in microseconds.
inline constexpr std::uint64_t DIAGNOSTIC_PAUSE = 1'000'000;

/// A test that was started.
struct Running_Test {
  const HBA_WWN& wwpn;
  const char* name;
  std::uint32_t id;        ///< given by the start
  RM_DiagResult result{};  ///< as last polled
  RM_STATUS status = 0;    ///< of the last poll
};

/// Asks for the result once a second until there is one. A test that still runs at the poll before
/// the last is canceled. True if the test came to an end of its own; false leaves the reason in
/// `test.status`, which is 0 for a test that was canceled or went on running.
/// @param pollText logged with the status of each poll
bool pollForResult(Running_Test& test, const char* pollText);

/// Cancels a test, with up to `DIAGNOSTIC_ROUNDS` tries of a second each.
/// @return 0 if it was canceled, else the last status; 1 for a null name or the identifier 0
RM_STATUS CancelTest(const HBA_WWN* wwpn, std::uint32_t id, const char* testName);

}  // namespace cimrt
