#include "Diagnostics_Fixture.h"

#include <dlfcn.h>

#include <atomic>
#include <cstring>

#include "common/TVX_Clock.h"

namespace cimrt::test {

namespace {

std::atomic<std::uint64_t> sleptMicroseconds{0};

void sleepQuickly(std::uint64_t usec) {
  sleptMicroseconds += usec;
}

Taken_Over takenOver;

/// Stands before one entry point of the simulator.
template <class Function, std::function<Function> Taken_Over::*TAKEN>
struct Gate;
template <class... Arguments, std::function<RM_STATUS(Arguments...)> Taken_Over::*TAKEN>
struct Gate<RM_STATUS(Arguments...), TAKEN> {
  static inline RM_STATUS (*simulated)(Arguments...) = nullptr;
  static RM_STATUS call(Arguments... arguments) {
    const auto& function = takenOver.*TAKEN;
    return function ? function(arguments...) : simulated(arguments...);
  }
  static void* stand(void* found) {
    simulated = reinterpret_cast<RM_STATUS (*)(Arguments...)>(found);
    return found ? reinterpret_cast<void*>(&call) : nullptr;
  }
};

template <class Member>
struct Function_Of;
template <class F>
struct Function_Of<std::function<F> Taken_Over::*> {
  using Type = F;
};
template <auto TAKEN>
using Gate_Of = Gate<typename Function_Of<decltype(TAKEN)>::Type, TAKEN>;

const struct {
  const char* name;
  void* (*stand)(void* found);
} GATES[] = {
    {"RM_DiagGetResults", Gate_Of<&Taken_Over::getResults>::stand},
    {"RM_DiagCancelDiagnostic", Gate_Of<&Taken_Over::cancel>::stand},
    {"RM_DiagRunPOST", Gate_Of<&Taken_Over::runPost>::stand},
    {"RM_DiagEchoTestV2", Gate_Of<&Taken_Over::echo>::stand},
    {"RM_DiagLoopBackTestV3", Gate_Of<&Taken_Over::loopback>::stand},
    {"RM_DiagPciLoopBackTestV2", Gate_Of<&Taken_Over::pciLoopback>::stand},
    {"RM_GetHBAAttributes", Gate_Of<&Taken_Over::adapterAttributes>::stand},
    {"RM_GetPortAttributes", Gate_Of<&Taken_Over::portAttributes>::stand},
    {"RM_GetFcpTargetMapping", Gate_Of<&Taken_Over::targetMapping>::stand},
    {"RM_DiagBeacon", Gate_Of<&Taken_Over::beacon>::stand},
    {"RM_DiagBeaconState", Gate_Of<&Taken_Over::beaconState>::stand},
};

void* findSymbol(void* handle, const char* name) {
  void* found = dlsym(handle, name);
  const char* plain = name[0] == 'L' ? name + 1 : name;
  for (const auto& gate : GATES)
    if (std::strcmp(plain, gate.name) == 0) return gate.stand(found);
  return found;
}

constexpr TVX_Dl_Operations OPERATIONS = {
    [](const char* file, int mode) { return dlopen(file, mode); }, findSymbol,
    [](void* handle) { return dlclose(handle); }, []() -> const char* { return dlerror(); }};

}  // namespace

std::set<std::string> filledIn(const Instance* instance) {
  std::set<std::string> names;
  const Meta_Class* metaClass = class_of(instance);
  const Ref<Instance> fresh(create(metaClass, true));
  const auto isSet = [](const Instance* each, const Meta_Feature* feature) {
    return *null_flag(each, feature) == 0;
  };
  for (std::uint64_t i = 0; i < metaClass->num_meta_features; i++) {
    const Meta_Feature* feature = metaClass->meta_features[i];
    if (is_property(feature) && isSet(instance, feature) && !isSet(fresh.get(), feature))
      names.insert(feature->name);
  }
  return names;
}

void Diagnostics_Test::SetUp() {
  Agent_Test::SetUp();
  getLogger().registerInterface(&m_Levels);
  takenOver = {};
  sleptMicroseconds = 0;
  setDlOperations(&OPERATIONS);
  tvxSetSleep(sleepQuickly);
}

void Diagnostics_Test::TearDown() {
  setDiagnosticFactory(nullptr);
  Agent_Test::TearDown();
  setDlOperations(nullptr);
}

std::string Diagnostics_Test::hostWith(const std::string& port) {
  return R"({"cards": [{"model": "TVX16002", "serial_number": "A", "diag_version": 7,
    "node_symbolic_name": "first card", "ports": [
      {"wwpn": "10000000000000A1", "fabric_name": "100000054D5A8001",
       "targets": [{"wwpn": "50060000000000B1", "luns": {"count": 1}}])" +
         port + R"(},
      {"wwpn": "10000000000000A2", "type": "loop", "fabric_name": "0000000000000000"}]}]})";
}

void Diagnostics_Test::build(const std::string& scenario) {
  useScenario(scenario.empty() ? hostWith("") : scenario);
  if (!agent) agent = &startAgent();
  refresh(*agent);
  log.clear();
  tvxsim_forget_calls();
}

TVXHBA_PortController* Diagnostics_Test::controller(const char* deviceID) {
  return entryOf(agent->m_TVXHBA_PortController_map, &TVXHBA_PortController::DeviceID, deviceID);
}

TVXHBA_FCHBADiagnosticTest* Diagnostics_Test::test(const char* name) {
  return entryOf(agent->m_TVXHBA_FCHBADiagnosticTest_map, &TVXHBA_FCHBADiagnosticTest::Name, name);
}

TVXHBA_FCHBADiagnosticSettingData* Diagnostics_Test::settings(const char* name) {
  return entryOf(agent->m_TVXHBA_FCHBADiagnosticSettingData_map,
                 &TVXHBA_FCHBADiagnosticSettingData::InstanceID, name);
}

Ref<TVXHBA_FCHBADiagnosticSettingData> Diagnostics_Test::givenFor(const char* name) {
  Ref<TVXHBA_FCHBADiagnosticSettingData> given(TVXHBA_FCHBADiagnosticSettingData::create(false));
  nullify_properties(given.get(), true, true, true);
  given->InstanceID.set(name);
  return given;
}

Ref<TVXHBA_JobSettingData> Diagnostics_Test::givenForJobs() {
  Ref<TVXHBA_JobSettingData> given(TVXHBA_JobSettingData::create(false));
  nullify_properties(given.get(), true, true, true);
  given->InstanceID.set("TVX:FCHBA JobSettingData");
  return given;
}

Ran Diagnostics_Test::run(const char* name, const Instance* given, const Instance* givenJobs,
                          const char* deviceID) {
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(name)));
  const Ref<TVXHBA_PortController> element(clone(controller(deviceID)));
  Instance* object = element.get();
  TVXHBA_FCHBADiagnosticTest_Provider provider;
  CIM_ConcreteJob* job = nullptr;
  Property<std::uint32_t> result{0, 1};
  EXPECT_EQ(
      provider.RunDiagnosticService(model.get(), static_cast<const CIM_ManagedElement*>(object),
                                    static_cast<const CIM_DiagnosticSettingData*>(given),
                                    static_cast<const CIM_JobSettingData*>(givenJobs), job, result),
      INVOKE_METHOD_OK);
  Instance* made = job;
  return {numberOf(result), Ref<TVXHBA_ConcreteJob>(static_cast<TVXHBA_ConcreteJob*>(made))};
}

const TVXHBA_DiagnosticServiceRecord& Diagnostics_Test::lastServiceRecord() {
  auto& map = agent->m_TVXHBA_DiagnosticServiceRecord_map;
  return *map[map.size() - 1];
}

const TVXHBA_DiagnosticCompletionRecord& Diagnostics_Test::lastCompletionRecord() {
  auto& map = agent->m_TVXHBA_DiagnosticCompletionRecord_map;
  return *map[map.size() - 1];
}

std::uint64_t Diagnostics_Test::slept() {
  constexpr std::uint64_t SECOND = 1'000'000;
  return sleptMicroseconds / SECOND;
}

Taken_Over& Diagnostics_Test::taken() {
  return takenOver;
}

}  // namespace cimrt::test
