// A built host whose tests can be run at once: time passes as fast as it is slept.
#pragma once

#include <functional>
#include <set>
#include <string>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "Level_Watch.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "diagnostics/DiagnosticInstances.h"
#include "diagnostics/DiagnosticTable.h"
#include "diagnostics/DiagnosticTexts.h"
#include "diagnostics/Polling.h"
#include "diagnostics/TVXHBA_DiagnosticsLog_Provider.h"
#include "diagnostics/TVXHBA_FCHBADiagnosticTest_Provider.h"
#include "diagnostics/TVXHBA_HelpService_Provider.h"
#include "diagnostics/TVX_DiagTestFunc.h"
#include "diagnostics/TVX_Diagnostics.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {

inline constexpr const char* FIRST_PORT = "10000000000000A1";
/// A port without a fabric and without targets, as one with a loopback plug.
inline constexpr const char* PLUGGED_PORT = "10000000000000A2";
inline constexpr const char* TARGET = "50060000000000B1";

/// Entry points that a test may take over; what is empty is the simulator's own.
struct Taken_Over {
  std::function<RM_STATUS(HBA_WWN, std::uint32_t, RM_DiagResult*)> getResults;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t)> cancel;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t*)> runPost;
  std::function<RM_STATUS(HBA_WWN, HBA_WWN, std::uint32_t, std::uint32_t, std::uint32_t*,
                          std::uint32_t, const char*)>
      echo;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t, std::uint32_t, std::uint32_t, std::uint32_t*,
                          std::uint32_t, const char*)>
      loopback;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t, std::uint32_t, std::uint32_t*, std::uint32_t,
                          const char*)>
      pciLoopback;
  std::function<RM_STATUS(HBA_WWN, void*, std::uint32_t*)> adapterAttributes;
  std::function<RM_STATUS(HBA_WWN, void*, std::uint32_t*)> portAttributes;
  std::function<RM_STATUS(HBA_WWN, HBA_FCPTARGETMAPPING*)> targetMapping;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t)> beacon;
  std::function<RM_STATUS(HBA_WWN, std::uint32_t*)> beaconState;
};

/// What a run of the service gave.
struct Ran {
  std::int64_t result;
  Ref<TVXHBA_ConcreteJob> job;
};

/// The names of the properties that are not null, unless they would be so in a new instance too.
std::set<std::string> filledIn(const Instance* instance);

class Diagnostics_Test : public Agent_Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  /// The maps of a scenario; a host of two ports without one. May come again with another scenario.
  void build(const std::string& scenario = {});
  /// A host of two ports; `port` are more members of the first.
  static std::string hostWith(const std::string& port);

  TVXHBA_PortController* controller(const char* deviceID = FIRST_PORT);
  TVXHBA_FCHBADiagnosticTest* test(const char* name);
  TVXHBA_FCHBADiagnosticSettingData* settings(const char* name);
  /// New settings with the name of a test and nothing else.
  static Ref<TVXHBA_FCHBADiagnosticSettingData> givenFor(const char* name);
  static Ref<TVXHBA_JobSettingData> givenForJobs();

  /// Runs a test as a client does.
  Ran run(const char* name, const Instance* given = nullptr, const Instance* givenJobs = nullptr,
          const char* deviceID = FIRST_PORT);

  const TVXHBA_DiagnosticServiceRecord& lastServiceRecord();
  const TVXHBA_DiagnosticCompletionRecord& lastCompletionRecord();

  /// Seconds slept since the test began.
  static std::uint64_t slept();
  static Taken_Over& taken();

  ProviderAgent* agent = nullptr;

 private:
  Level_Watch m_Levels;
};

}  // namespace cimrt::test
