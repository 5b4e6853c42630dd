// One round of the class feature: everything that belongs to one test.
#pragma once

#include <cstdint>

#include "diagnostics/DiagnosticInstances.h"
#include "diagnostics/DiagnosticTable.h"

namespace cimrt {

/// What all rounds share.
struct Feature_Build {
  ProviderAgent& agent;
  const CIM_ComputerSystem& system;
  std::uint32_t version = 0;                    ///< of the diagnostics
  Ref<TVXHBA_JobSettingData> newJobSettings{};  ///< made, and in no map yet
  TVXHBA_JobSettingData* jobSettings = nullptr;
};

/// The instances of one test before they are inserted; null where one could not be made.
struct Test_Parts {
  Ref<TVXHBA_FCHBADiagnosticTest> test;
  Ref<TVXHBA_FCHBADiagnosticSettingData> settings;
  Ref<TVXHBA_DiagElementSettingData> elementSettings;
  Ref<TVXHBA_FCHBADiagnosticServiceCapabilities> capabilities;
  Ref<TVXHBA_DiagElementCapabilities> elementCapabilities;
  Ref<TVXHBA_HelpService> help;
  Ref<TVXHBA_ServiceAvailableToElement> helpAvailable;
  Ref<TVXHBA_DiagnosticIdentity> identity;
  Ref<TVXHBA_DiagElementSoftwareIdentity> elementIdentity;
  Ref<TVXHBA_JobElementSettingData> jobElementSettings;
  Ref<TVXHBA_DiagnosticsLog> log;
  Ref<TVXHBA_UseOfLog> useOfLog;
};

/// Makes them all, with the shared job settings on the first round. False as soon as one can't be
/// made.
bool makeTestParts(Feature_Build& feature, const Diagnostic_Row& row, Test_Parts& parts);

}  // namespace cimrt
