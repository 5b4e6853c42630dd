// Provider of the tests: runs them.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_FCHBADiagnosticTest_Provider {
 public:
  /// Runs a test to its end, with the agent's data lock held. The outcome stands in the job and its
  /// records: a test that ran and failed may give 0 as well.
  /// @param ManagedElement the port controller to be tested
  /// @param DiagnosticSettings values to be put over the test's own settings, or null
  /// @param JobSettings values to be put over those that all jobs share, or null
  /// @param Job the job of the run, owned by the caller; null if there is none
  /// @param return_value 0; 1 for an unknown test; 5 for arguments that are no good; else the
  /// library's status and 40000
  std::int32_t RunDiagnosticService(const TVXHBA_FCHBADiagnosticTest* test,
                                    const CIM_ManagedElement* ManagedElement,
                                    const CIM_DiagnosticSettingData* DiagnosticSettings,
                                    const CIM_JobSettingData* JobSettings, CIM_ConcreteJob*& Job,
                                    Property<std::uint32_t>& return_value);
};

}  // namespace cimrt
