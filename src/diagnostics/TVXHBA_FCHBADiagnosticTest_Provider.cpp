#include "diagnostics/TVXHBA_FCHBADiagnosticTest_Provider.h"

#include <cstring>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/Service_Call.h"
#include "diagnostics/DiagnosticTable.h"
#include "diagnostics/TVX_DiagTestFunc.h"
#include "runtime/Typed_Instance.h"

namespace cimrt {

namespace {

constexpr std::uint32_t RESULT_OK = 0;
constexpr std::uint32_t RESULT_UNKNOWN_TEST = 1;
constexpr std::uint32_t RESULT_INVALID = 5;
constexpr std::uint32_t RESULT_FAILED = 40000;
constexpr std::size_t DEVICE_ID_LENGTH = 16;

// --- The tests by name

using Run_Test = RM_STATUS (*)(TVX_DiagTestFunc& tests, Test_Call& call);

template <RM_STATUS (TVX_DiagTestFunc::*TEST)(Test_Call&)>
RM_STATUS run(TVX_DiagTestFunc& tests, Test_Call& call) {
  return (tests.*TEST)(call);
}

template <int TYPE>
RM_STATUS runLoopBack(TVX_DiagTestFunc& tests, Test_Call& call) {
  return tests.LoopBackTest(call, TYPE);
}

struct Test_Entry {
  const char* name;
  Run_Test run;
};

constexpr Test_Entry TESTS[] = {
    {BEACON_TEST, run<&TVX_DiagTestFunc::BeaconTest>},
    {STATUS_TEST, run<&TVX_DiagTestFunc::StatusTest>},
    {RESET_TEST, run<&TVX_DiagTestFunc::FCHBAResetTest>},
    {SELF_TEST, run<&TVX_DiagTestFunc::SelfTest>},
    {EXTERNAL_LOOPBACK_TEST, runLoopBack<LOOPBACK_EXTERNAL>},
    {HOST_LOOPBACK_TEST, runLoopBack<LOOPBACK_HOST>},
    {INTERNAL_LOOPBACK_TEST, runLoopBack<LOOPBACK_INTERNAL>},
    {PING_TEST, run<&TVX_DiagTestFunc::EchoTest>},
    {ECHO_TEST, run<&TVX_DiagTestFunc::EchoTest>},
};

Run_Test findTest(const char* name) {
  for (const Test_Entry& entry : TESTS)
    if (std::strcmp(entry.name, name) == 0) return entry.run;
  return nullptr;
}

// --- One request

/// A request as it is made out, step by step.
struct Request {
  ProviderAgent& agent;
  const TVXHBA_FCHBADiagnosticTest* test;
  const Instance* managedElement;
  const Instance* givenSettings;
  const Instance* givenJobSettings;
  TVX_Diagnostics diagnostics{agent};
  const TVXHBA_PortController* controller = nullptr;  ///< null: tested without one
  HBA_WWN wwpn{};
  TVXHBA_JobSettingData* jobSettings = nullptr;
  TVXHBA_FCHBADiagnosticSettingData* settings = nullptr;

  const char* testName() const { return test->Name.value.c_str(); }
};

bool checkInstances(const Request& request) {
  auto& tests = request.agent.m_TVXHBA_FCHBADiagnosticTest_map;
  if (tests.find(request.test) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_ERR, "Invalid instance: TVXHBA_FCHBADiagnosticTest");
    return false;
  }
  const auto* element = typed<TVXHBA_PortController>(request.managedElement);
  if (element && request.agent.m_TVXHBA_PortController_map.find(element) != Instance_Map_Base::npos)
    return true;
  TVX_LOG(TVX_ERR, "Either ManagedElement is NULL or Invalid instance: TVXHBA_PortController");
  return false;
}

bool readPort(Request& request) {
  const auto* element = typed<TVXHBA_PortController>(request.managedElement);
  const char* deviceID = element->DeviceID.value.c_str();
  TVX_LOG(TVX_DBG, "Device ID %s", deviceID);
  request.controller = findByText(request.agent.m_TVXHBA_PortController_map,
                                  &TVXHBA_PortController::DeviceID, deviceID);
  if (!request.controller) TVX_LOG(TVX_DBG, "Could not find the passed PORTController in the map");
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  if (TVX_MethodWrapper::Id2HBAName(hbaName, deviceID) != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCHBADiagnosticTest_Provider::Id2HBAName failed");
    return false;
  }
  if (TVX_MethodWrapper::str2HBAName(&request.wwpn, hbaName) != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCHBADiagnosticTest_Provider::str2HBAName failed");
    return false;
  }
  return true;
}

void takeJobSettings(Request& request) {
  TVX_Diagnostics& diagnostics = request.diagnostics;
  if (!request.givenJobSettings) {
    TVX_LOG(TVX_DBG, "Using the default TVXHBA_JobSettingData Instance");
    request.jobSettings = diagnostics.getDefaultTVXHBA_JobSettingDataInstance(request.testName());
    return;
  }
  request.jobSettings =
      diagnostics.getTVXHBA_JobSettingDataInstance(request.givenJobSettings, request.testName());
  if (!request.jobSettings) TVX_LOG(TVX_DBG, "Invalid input instance: TVXHBA_JobSettingData");
}

void takeTestSettings(Request& request) {
  TVX_Diagnostics& diagnostics = request.diagnostics;
  if (!request.givenSettings) {
    TVX_LOG(TVX_DBG, "Using default TVXHBA_FCHBADiagnosticSettingData Instance");
    request.settings =
        diagnostics.getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance(request.testName());
    return;
  }
  TVX_LOG(TVX_DBG, "Entered embedded instance");
  request.settings = diagnostics.getTVXHBA_FCHBADiagnosticSettingDataInstance(request.givenSettings,
                                                                              request.testName());
  if (!request.settings)
    TVX_LOG(TVX_DBG, "Invalid input instance: TVXHBA_FCHBADiagnosticSettingData");
}

bool takeSettings(Request& request) {
  takeJobSettings(request);
  takeTestSettings(request);
  if (request.jobSettings && request.settings) return true;
  TVX_LOG(TVX_DBG, "Unable to get the Job/Diagnostic SettingData, Not able to continue");
  return false;
}

/// False for a test that has no target to go to.
bool hasTarget(const Request& request) {
  const Diagnostic_Row* row = findDiagnosticTest(request.testName());
  if (!row || !row->needsTarget()) return true;
  if (request.settings->TargetDevice.value.size() == DEVICE_ID_LENGTH) return true;
  TVX_LOG(TVX_DBG, "Invalid TargetDevice, Enter Target WWPN");
  return false;
}

/// Puts the settings that were used into the record of them.
void embedSettings(Request& request, const TVXHBA_ConcreteJob& job) {
  if (request.settings->OverridedSettingData.value != 1) return;
  TVXHBA_DiagnosticSettingDataRecord* record =
      findByText(request.agent.m_TVXHBA_DiagnosticSettingDataRecord_map,
                 &TVXHBA_DiagnosticSettingDataRecord::Caption, job.InstanceID.value.c_str());
  if (!record) return;
  TVX_LOG(TVX_DBG, "Adding the embedded instance for Settingdatarecord : %s",
          job.InstanceID.value.c_str());
  Instance* used = clone(request.settings);
  set_reference(record->Settings, static_cast<CIM_DiagnosticSettingData*>(used));
}

/// The result of a test that returned this status.
std::uint32_t resultOf(const char* testName, RM_STATUS status) {
  if (status == RM_OK) {
    TVX_LOG(TVX_DBG, "%s Launched/Completed Succesful", testName);
    return RESULT_OK;
  }
  TVX_LOG(TVX_DBG, "%s Failed to Run", testName);
  return RESULT_FAILED + static_cast<std::uint32_t>(status);
}

std::uint32_t runSelected(Request& request, CIM_ConcreteJob*& job) {
  const Run_Test runTest = findTest(request.testName());
  if (!runTest) {
    TVX_LOG(TVX_DBG, "Invalid Test Name");
    return RESULT_UNKNOWN_TEST;
  }
  TVX_LOG(TVX_DBG, "Started Diagnostic : %s", request.testName());
  if (!hasTarget(request)) return RESULT_INVALID;
  TVX_DiagTestFunc tests(request.agent);
  Test_Call call{request.wwpn, *request.settings, *request.jobSettings, request.controller};
  const RM_STATUS status = runTest(tests, call);
  const std::uint32_t result = resultOf(request.testName(), status);
  if (call.job) {
    embedSettings(request, *call.job);
    Instance* made = call.job.release();
    set_reference(job, static_cast<CIM_ConcreteJob*>(made));
  }
  return result;
}

}  // namespace

std::int32_t TVXHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService(
    const TVXHBA_FCHBADiagnosticTest* test, const CIM_ManagedElement* ManagedElement,
    const CIM_DiagnosticSettingData* DiagnosticSettings, const CIM_JobSettingData* JobSettings,
    CIM_ConcreteJob*& Job, Property<std::uint32_t>& return_value) {
  TVX_LOG(TVX_DBG, "TVXHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService");
  Service_Call call;
  Request request{call.agent, test, ManagedElement, DiagnosticSettings, JobSettings};
  if (checkInstances(request) && readPort(request) && takeSettings(request))
    return_value.set(runSelected(request, Job));
  else
    return_value.set(RESULT_INVALID);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
