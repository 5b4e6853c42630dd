// Diagnostic tests: started, polled, canceled.
#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

constexpr std::size_t most_runs = 64;

// Starts a test of the port; its plan says how it will go.
RM_STATUS start(const Call_Site& site, const char* kind, uint32_t cycles, uint32_t* id) {
  return port_call(site,
                   [=](World& world, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (id == nullptr) return RM_ERROR;
                     if (port.runs.size() >= most_runs) return RM_ERROR_DIAG_TABLE_FULL;
                     const std::uint32_t made = world.next_diagnostic++;
                     Diagnostic_Run run;
                     run.plan = port.diagnostics.at(kind);
                     run.cycles = cycles;
                     port.runs.emplace(made, run);
                     *id = made;
                     return RM_OK;
                   },
                   {.told = id});
}

bool is_running(const Diagnostic_Run& run) {
  return !run.canceled && (run.plan.endless || run.polls <= run.plan.polls);
}

// The outcome as it stands after one more poll.
RM_DiagResult poll(Diagnostic_Run& run) {
  ++run.polls;
  RM_DiagResult result{};
  result.totalTime = run.polls;
  if (is_running(run)) {
    result.state = RM_DIAG_RUNNING;
    return result;
  }
  result.state = run.canceled ? std::uint32_t{RM_DIAG_CANCELED} : run.plan.final_state;
  result.cyclesCompleted = run.cycles;
  result.result = run.plan.result;
  result.errorCount = run.plan.errors;
  return result;
}

}  // namespace

extern "C" {

RM_STATUS LRM_DiagRunPOST(HBA_WWN wwpn, uint32_t* id) {
  return start({.name = "LRM_DiagRunPOST", .port = to_wwn(wwpn)}, "post", 1, id);
}

RM_STATUS LRM_DiagEchoTestV2(HBA_WWN wwpn, HBA_WWN target, uint32_t cycles, uint32_t, uint32_t* id,
                             uint32_t, const char*) {
  return start({.name = "LRM_DiagEchoTestV2", .port = to_wwn(wwpn), .target = to_wwn(target)},
               "echo", cycles, id);
}

RM_STATUS LRM_DiagLoopBackTestV3(HBA_WWN wwpn, uint32_t, uint32_t cycles, uint32_t, uint32_t* id,
                                 uint32_t, const char*) {
  return start({.name = "LRM_DiagLoopBackTestV3", .port = to_wwn(wwpn)}, "loopback", cycles, id);
}

RM_STATUS LRM_DiagPciLoopBackTestV2(HBA_WWN wwpn, uint32_t cycles, uint32_t, uint32_t* id, uint32_t,
                                    const char*) {
  return start({.name = "LRM_DiagPciLoopBackTestV2", .port = to_wwn(wwpn)}, "pci", cycles, id);
}

RM_STATUS LRM_DiagGetResults(HBA_WWN wwpn, uint32_t id, RM_DiagResult* result) {
  return port_call("LRM_DiagGetResults", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     const auto run = port.runs.find(id);
                     if (result == nullptr || run == port.runs.end()) return RM_ERROR;
                     *result = poll(run->second);
                     // A result that was collected leaves the table.
                     if (!is_running(run->second)) port.runs.erase(run);
                     return RM_OK;
                   });
}

RM_STATUS LRM_DiagCancelDiagnostic(HBA_WWN wwpn, uint32_t id) {
  return port_call("LRM_DiagCancelDiagnostic", wwpn,
                   [=](World&, Port& port, const Fault_Effect&) -> RM_STATUS {
                     const auto run = port.runs.find(id);
                     if (run == port.runs.end()) return RM_ERROR;
                     run->second.canceled = true;
                     return RM_OK;
                   });
}

}  // extern "C"
