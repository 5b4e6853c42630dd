// What all tests share, and the tests that send nothing: self, reset, status and beacon.
#include "diagnostics/TVX_DiagTestFunc.h"

#include "diagnostics/TestSteps.h"

namespace cimrt {

namespace {

/// Rounds of the beacon, and the pause between its switches in microseconds.
constexpr int BEACON_ROUNDS = 20;
constexpr std::uint64_t BEACON_PAUSE = 1'000'000;

/// Room that the library is told for the attributes that the status test reads, in bytes.
constexpr std::uint32_t STATUS_ROOM = 2048;

constexpr const char* FAILED_WITH_CODE = "%s Resulted with Failure, Exited with error code %d";
constexpr const char* RESULTED_WITH_SUCCESS = "%s Resulted with Success";

/// Statuses of an adapter that can't be tested at all.
bool isUnavailable(RM_STATUS status) {
  return status == RM_ERROR_DIAG_UNAVAILABLE || status == RM_ERROR_NOT_SUPPORTED ||
         status == RM_ERROR_DIAG_PORT;
}

bool isLocal(const HBA_WWN& wwpn) {
  if (TVX_MethodWrapper::Validatewwpn(&wwpn) == RM_OK) return true;
  TVX_LOG(TVX_ERR, "INVALID wwpn/Mac Address");
  return false;
}

/// The lights of a port, on and off again.
struct Beacon_Run {
  const HBA_WWN& wwpn;
  const char* name;
  std::string text{};
  bool completed = false;

  /// Switches and tells how it went. A switch that failed ends the run.
  bool switchTo(std::uint32_t state) {
    const RM_STATUS status = LRM_DiagBeacon(wwpn, state);
    text = status == RM_OK ? formatText(RESULTED_WITH_SUCCESS, name)
                           : formatText(FAILED_WITH_CODE, name, status);
    if (status == RM_OK) tvxSleep(BEACON_PAUSE);
    return status == RM_OK;
  }
  /// The first round decides on the state of the job, as soon as the lights were switched on.
  void flash() {
    for (int round = 0; round < BEACON_ROUNDS; round++) {
      if (!switchTo(RM_BEACON_ON)) return;
      completed = true;
      if (!switchTo(RM_BEACON_OFF)) return;
    }
  }
};

}  // namespace

// --- What all tests share

void TVX_DiagTestFunc::report(Test_Call& call, const Test_End& end, bool keepReference) {
  const Property<bool>& deleteOnCompletion = call.jobSettings.DeleteOnCompletion;
  TVXHBA_ConcreteJob* job = m_Diagnostics.CreateConcreteJobInstantiateNonBlocking(
      call.testName(), deleteOnCompletion, end.completed ? JOB_COMPLETED : JOB_FAILED, end.id,
      call.element);
  if (!job) return;
  const Diagnostic_Outcome outcome{call.testName(),
                                   end.text,
                                   job->InstanceID.value.c_str(),
                                   end.result,
                                   end.completed ? COMPLETION_OK : COMPLETION_FAILED,
                                   call.element,
                                   call.settings.OverridedSettingData.value == 1};
  m_Diagnostics.CreateDiagnosticServiceRecord(outcome);
  m_Diagnostics.CreateDiagnosticCompletionRecord(outcome);
  const bool dropped = !deleteOnCompletion.is_null() && deleteOnCompletion.value;
  if (!dropped || keepReference) call.job.reset(clone(job));
  if (dropped) m_Diagnostics.DeleteConcreteJob(job);
}

RM_STATUS TVX_DiagTestFunc::leaveWithoutJob(Test_Call& call, RM_STATUS status) {
  call.job.reset();
  TVX_LOG(TVX_DBG, "%s , Exited with error code : %d", MapDiagStatus(status), status);
  return status;
}

RM_STATUS TVX_DiagTestFunc::finish(Test_Call& call, RM_STATUS status, std::uint32_t id,
                                   const Poll_Texts& texts) {
  if (status != RM_OK) return leaveWithoutJob(call, status);
  Running_Test test{call.wwpn, call.testName(), id};
  if (!pollForResult(test, texts.poll)) return leaveWithoutJob(call, test.status);
  Test_End end{{}, false, id, &test.result};
  if (test.result.state == RM_DIAG_DONE) {
    const char* result = MapDiagResultStatus(test.result.result);
    end.completed = std::strcmp(result, DIAGNOSTIC_SUCCESS) == 0;
    end.text = end.completed ? formatText(RESULTED_WITH_SUCCESS, call.testName())
                             : formatText(texts.failure, call.testName(), result);
  } else {
    end.text = formatText(texts.unknown, call.testName(), 0);
  }
  TVX_LOG(TVX_DBG, "%s", end.text.c_str());
  report(call, end);
  return test.status;
}

template <class Attempt>
RM_STATUS TVX_DiagTestFunc::runOnce(Test_Call& call, const char* successText, Attempt attempt) {
  RM_STATUS status = RM_ERROR_ADAPTER_BUSY;
  int round = 0;
  for (; round < DIAGNOSTIC_ROUNDS && status == RM_ERROR_ADAPTER_BUSY; round++) status = attempt();
  const bool wasBusy = round > 1;
  if (status == RM_OK) {
    report(call, {formatText(successText, call.testName()), true, NO_DIAGNOSTIC_ID, nullptr});
    TVX_LOG(TVX_DBG, "%s Succesful", call.testName());
    return status;
  }
  if (status == RM_ERROR_ADAPTER_BUSY || isUnavailable(status) || wasBusy)
    return leaveWithoutJob(call, status);
  report(call,
         {formatText(FAILED_WITH_CODE, call.testName(), status), false, NO_DIAGNOSTIC_ID, nullptr});
  return status;
}

// --- The tests

const TVX_DiagTestFunc::Poll_Texts TVX_DiagTestFunc::SELF_TEXTS = {
    "Polling for the results.. %d", "%s Resulted with Failure, Result - %s",
    "%s Unknown Error, Exited with error code: %d"};

RM_STATUS TVX_DiagTestFunc::SelfTest(Test_Call& call) {
  Port_View port;
  if (const RM_STATUS status = port.read(call.wwpn); status != RM_OK) return status;
  if (port.isDisabled()) {
    TVX_LOG(TVX_DBG, "Source HBA port is disabled. Unable to start %s", call.testName());
    return RM_OK;
  }
  std::uint32_t id = 0;
  const RM_STATUS status = LRM_DiagRunPOST(call.wwpn, &id);
  return finish(call, status, id, SELF_TEXTS);
}

RM_STATUS TVX_DiagTestFunc::FCHBAResetTest(Test_Call& call) {
  if (!isLocal(call.wwpn)) return RM_ERROR_INVALID_WWN;
  return runOnce(call, "%s Success", [&] { return TVX_MethodWrapper::tvxcimReset(&call.wwpn); });
}

RM_STATUS TVX_DiagTestFunc::StatusTest(Test_Call& call) {
  if (!isLocal(call.wwpn)) return RM_ERROR_INVALID_WWN;
  const TVX_Block block = allocateAttributeBlock(STATUS_ROOM);
  if (!block) {
    TVX_LOG(TVX_DBG, "ERROR: GetPHYPortAttributeValues: Unable to allocate buffer");
    return RM_ERROR_NO_MEMORY;
  }
  return runOnce(call, RESULTED_WITH_SUCCESS, [&] {
    std::uint32_t size = STATUS_ROOM;
    const RM_STATUS status = LRM_GetPortAttributes(call.wwpn, block.get(), &size);
    TVX_LOG(TVX_DBG, "RM_GetPortAttributes call result : %d", status);
    return status;
  });
}

RM_STATUS TVX_DiagTestFunc::BeaconTest(Test_Call& call) {
  if (!isLocal(call.wwpn)) return RM_ERROR;
  Beacon_Run beacon{call.wwpn, call.testName()};
  std::uint32_t before = 0;
  if (const RM_STATUS status = LRM_DiagBeaconState(call.wwpn, &before); status != RM_OK) {
    beacon.text = formatText(FAILED_WITH_CODE, beacon.name, status);
  } else if (before == RM_BEACON_NOT_AVAILABLE) {
    TVX_LOG(TVX_DBG, "Beacon state Not Available. Beaconing not set");
    TVX_LOG(TVX_DBG, FAILED_WITH_CODE, beacon.name, 0);
    return RM_OK;
  } else {
    beacon.flash();
    if (LRM_DiagBeacon(call.wwpn, before) != RM_OK)
      TVX_LOG(TVX_DBG, "Unable to set the previous beacon state");
  }
  report(call, {beacon.text, beacon.completed, NO_DIAGNOSTIC_ID, nullptr}, true);
  return RM_OK;
}

}  // namespace cimrt
