// The tests of a port. Each runs to its end on the calling thread, with the agent's data lock held.
#pragma once

#include <cstdint>
#include <string>

#include "diagnostics/TVX_Diagnostics.h"

namespace cimrt {

/// What a test works on.
struct Test_Call {
  const HBA_WWN& wwpn;
  const TVXHBA_FCHBADiagnosticSettingData& settings;  ///< `InstanceID` is the name of the test
  const TVXHBA_JobSettingData& jobSettings;
  const TVXHBA_PortController* element;  ///< what is tested, or null
  /// Out: the job of the run, or null if there is none or it is gone already.
  Ref<TVXHBA_ConcreteJob> job{};

  const char* testName() const { return settings.InstanceID.value.c_str(); }
};

/// Kinds of loopback, as `LoopBackTest` takes them.
inline constexpr int LOOPBACK_INTERNAL = 5;
inline constexpr int LOOPBACK_HOST = 6;
inline constexpr int LOOPBACK_EXTERNAL = 11;

/// The test functions. Each answers 0 or a status; a test that ran and failed may answer 0: the
/// failure then stands in its job and its records, which are made when the test has ended.
class TVX_DiagTestFunc {
 public:
  explicit TVX_DiagTestFunc(ProviderAgent& agent) : m_Diagnostics(agent) {}

  /// The power-on self test of the adapter.
  RM_STATUS SelfTest(Test_Call& call);
  /// Resets the adapter; tries again while it is busy.
  RM_STATUS FCHBAResetTest(Test_Call& call);
  /// Reads the attributes of the port; tries again while it is busy.
  RM_STATUS StatusTest(Test_Call& call);
  /// Flashes the port's lights for some 40 seconds.
  RM_STATUS BeaconTest(Test_Call& call);
  /// One of the three loopbacks; the external one needs a plug.
  RM_STATUS LoopBackTest(Test_Call& call, int type);
  /// Echo and ping, which differ in nothing but the name.
  RM_STATUS EchoTest(Test_Call& call);

 private:
  /// How a test ended, for its job and records.
  struct Test_End {
    std::string text;
    bool completed;    ///< state of job and records
    std::uint32_t id;  ///< the library's identifier, or NO_DIAGNOSTIC_ID
    const RM_DiagResult* result;
  };
  struct Poll_Texts;

  static const Poll_Texts SELF_TEXTS;
  static const Poll_Texts LOOPBACK_TEXTS;
  static const Poll_Texts ECHO_TEXTS;

  /// Job and records of a run. Hands a clone of the job out unless it is deleted at once.
  /// @param keepReference hand it out even then
  void report(Test_Call& call, const Test_End& end, bool keepReference = false);
  /// The end of a test that made no job. Answers the status.
  static RM_STATUS leaveWithoutJob(Test_Call& call, RM_STATUS status);
  /// Waits for a test that was started with `status` and reports it. The status.
  RM_STATUS finish(Test_Call& call, RM_STATUS status, std::uint32_t id, const Poll_Texts& texts);
  /// Tries until the adapter is not busy, and reports.
  template <class Attempt>
  RM_STATUS runOnce(Test_Call& call, const char* successText, Attempt attempt);

  TVX_Diagnostics m_Diagnostics;
};

}  // namespace cimrt
