// The diagnostics of the ports as instances in the agent's maps: the tests, their settings, and
// what runs of them leave behind.
//
// All operations run with the agent's data lock held. Pointers to instances that they hand out are
// entries of the maps, which own them.
#pragma once

#include <cstdint>
#include <string>

#include "agent/ProviderAgent.h"
#include "generated/Records.h"
#include "rmapi/rmapi.h"

namespace cimrt {

/// Answers of the class feature.
inline constexpr std::int32_t DIAGNOSTICS_NO_ELEMENT = 0x812C;
inline constexpr std::int32_t DIAGNOSTICS_NOT_SUPPORTED = 40002;
/// Answer of `GetDiagnosticVersion` to arguments that it can't work with.
inline constexpr std::int32_t DIAGNOSTICS_VERSION_REFUSED = 0x8000;
/// Answer of `DeleteConcreteJob` to no job.
inline constexpr std::int32_t DIAGNOSTICS_NO_JOB = 0x80C9;

/// `JobState` of a job that ended well, and what a caller gives for all others.
inline constexpr std::uint32_t JOB_COMPLETED = 7;
inline constexpr std::uint32_t JOB_FAILED = 0x8000;
/// `CompletionState` of a test.
inline constexpr std::uint16_t COMPLETION_OK = 2;
inline constexpr std::uint16_t COMPLETION_FAILED = 5;
/// Identifier in the name of a job whose test has none.
inline constexpr std::uint32_t NO_DIAGNOSTIC_ID = 0xFFFF;

/// Which maps `ClearDiagnosticClassMaps` empties.
enum class Diagnostic_Scope : int {
  CLASSES = 0,  ///< the tests and what describes them
  RECORDS = 1,  ///< the results of runs
  JOBS = 2,
};

/// What is written down of a run.
struct Diagnostic_Outcome {
  std::string testName;
  std::string text;                      ///< the result in words
  std::string jobID;                     ///< `InstanceID` of its job
  const RM_DiagResult* result;           ///< the library's result, or null for a test without one
  std::uint16_t completionState;         ///< COMPLETION_OK or COMPLETION_FAILED
  const TVXHBA_PortController* element;  ///< what was tested, or null
  bool overridden;                       ///< the run had settings of its own
};

class TVX_Diagnostics {
 public:
  explicit TVX_Diagnostics(ProviderAgent& agent);
  ~TVX_Diagnostics();
  TVX_Diagnostics(const TVX_Diagnostics&) = delete;
  TVX_Diagnostics& operator=(const TVX_Diagnostics&) = delete;

  // --- The tests (ClassFeature.cpp)

  /// Makes the nine tests with everything around them, for the port controllers of the map. A test
  /// whose instances can't all be made or inserted is left out. 0; DIAGNOSTICS_NO_ELEMENT without a
  /// port controller; DIAGNOSTICS_NOT_SUPPORTED if none tells its version, or without a system.
  std::int32_t CreateFCHBADiagnosticClassFeature();
  /// Empties the maps of a scope, which is one of `Diagnostic_Scope`; others do nothing. Always 0.
  std::int32_t ClearDiagnosticClassMaps(int scope);
  /// The version of a port's diagnostics.
  /// @param deviceID 16 digits
  /// @param version left as it was if the port can't be asked, which is no failure
  /// @return 0, or DIAGNOSTICS_VERSION_REFUSED for a null place or a name that can't be converted
  static std::int32_t GetDiagnosticVersion(const char* deviceID, std::uint32_t* version);

  // --- Settings (JobSettings.cpp, TestSettings.cpp). Null if there are none.

  /// The settings that the jobs of all tests share.
  TVXHBA_JobSettingData* getDefaultTVXHBA_JobSettingDataInstance(const char* testName);
  /// The same, with `DeleteOnCompletion` taken over from what a client gave, for good. Null also if
  /// the client's settings are of another class or of another name.
  TVXHBA_JobSettingData* getTVXHBA_JobSettingDataInstance(const Instance* given,
                                                          const char* testName);
  /// The settings of a test.
  TVXHBA_FCHBADiagnosticSettingData* getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance(
      const char* testName);
  /// The same, with the valid values among a client's taken over, for good. Null also if the
  /// client's settings are of another class or of another test.
  TVXHBA_FCHBADiagnosticSettingData* getTVXHBA_FCHBADiagnosticSettingDataInstance(
      const Instance* given, const char* testName);

  // --- Jobs and records (Jobs.cpp, Records.cpp)

  /// Makes the job of a run that has ended, and ties it to its test and to what was tested.
  /// @param deleteOnCompletion taken over as it is, null too
  /// @param state JOB_COMPLETED, or anything else for a failure
  /// @return the job in its map, or null with the failure logged
  TVXHBA_ConcreteJob* CreateConcreteJobInstantiateNonBlocking(
      const char* testName, const Property<bool>& deleteOnCompletion, std::uint32_t state,
      std::uint32_t diagnosticID, const TVXHBA_PortController* element);
  /// Write the two records of a run. Failures are logged and end the writing; what was inserted by
  /// then stays.
  void CreateDiagnosticServiceRecord(const Diagnostic_Outcome& outcome);
  void CreateDiagnosticCompletionRecord(const Diagnostic_Outcome& outcome);
  /// Takes a job out of its map. Its associations stay, since they refer to clones of it.
  /// @return 0, or DIAGNOSTICS_NO_JOB for null
  std::int32_t DeleteConcreteJob(const TVXHBA_ConcreteJob* job);

 private:
  ProviderAgent& m_Agent;
};

}  // namespace cimrt
