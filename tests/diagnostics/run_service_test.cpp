// The request to run a test: its arguments, and what it hands out.
#include <atomic>
#include <chrono>
#include <thread>

#include "Diagnostics_Fixture.h"
#include "Refused_Calls.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;

class Run_Service : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
  }
  /// The request with any objects.
  std::int64_t ask(const TVXHBA_FCHBADiagnosticTest* model, const Instance* element) {
    TVXHBA_FCHBADiagnosticTest_Provider provider;
    CIM_ConcreteJob* job = nullptr;
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(provider.RunDiagnosticService(model, static_cast<const CIM_ManagedElement*>(element),
                                            nullptr, nullptr, job, result),
              INVOKE_METHOD_OK);
    EXPECT_EQ(job, nullptr);
    return numberOf(result);
  }
  /// A test of another name with settings, as no host has it.
  void addTest(const char* name) {
    Ref<TVXHBA_FCHBADiagnosticTest> other(clone(test(SELF_TEST)));
    other->Name.set(name);
    agent->m_TVXHBA_FCHBADiagnosticTest_map.insert(other.release());
    Ref<TVXHBA_FCHBADiagnosticSettingData> data(clone(settings(SELF_TEST)));
    data->InstanceID.set(name);
    agent->m_TVXHBA_FCHBADiagnosticSettingData_map.insert(data.release());
  }
};

TEST_F(Run_Service, TellsItsSteps) {
  run(STATUS_TEST);
  const Texts steps = {"TVXHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService",
                       "Device ID 10000000000000A1",
                       "Using the default TVXHBA_JobSettingData Instance",
                       "Using default TVXHBA_FCHBADiagnosticSettingData Instance",
                       "Started Diagnostic : TVX:FCHBA Status Test",
                       "TVX:FCHBA Status Test Launched/Completed Succesful"};
  EXPECT_EQ(log.only(steps), steps);
  for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG) << step;
}

TEST_F(Run_Service, WantsAKnownTest) {
  Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(SELF_TEST)));
  model->Name.set("no test");
  EXPECT_EQ(ask(model.get(), controller()), 5);
  EXPECT_EQ(log.level("Invalid instance: TVXHBA_FCHBADiagnosticTest"), TVX_ERR);
}

TEST_F(Run_Service, WantsAKnownPortController) {
  const char* text = "Either ManagedElement is NULL or Invalid instance: TVXHBA_PortController";
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(SELF_TEST)));
  EXPECT_EQ(ask(model.get(), nullptr), 5);
  EXPECT_EQ(ask(model.get(), agent->m_TVXHBA_FCPort_map[0]), 5);
  Ref<TVXHBA_PortController> unknown(clone(controller()));
  unknown->DeviceID.set("10000000000000FF");
  EXPECT_EQ(ask(model.get(), unknown.get()), 5);
  EXPECT_EQ(log.count(text), 3u);
  EXPECT_EQ(log.level(text), TVX_ERR);
}

TEST_F(Run_Service, WantsAPortWithAName) {
  controller()->DeviceID.set("not a name");
  Ref<TVXHBA_PortController> element(clone(agent->m_TVXHBA_PortController_map[0]));
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(SELF_TEST)));
  EXPECT_EQ(ask(model.get(), element.get()), 5);
  EXPECT_EQ(log.level("TVXHBA_FCHBADiagnosticTest_Provider::str2HBAName failed"), TVX_ERR);
}

TEST_F(Run_Service, WantsAPortWhoseNameCanBeConverted) {
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(SELF_TEST)));
  const Refused_Calls refused([](const char* id) { return std::string(id) == FIRST_PORT; });
  EXPECT_EQ(ask(model.get(), controller()), 5);
  EXPECT_EQ(log.level("TVXHBA_FCHBADiagnosticTest_Provider::Id2HBAName failed"), TVX_ERR);
  EXPECT_EQ(log.count("Using the default TVXHBA_JobSettingData Instance"), 0u);
}

TEST_F(Run_Service, APortThatIsNotFoundAgainIsTestedWithoutAManagedElement) {
  // A key that is null and still holds its digits is the map's own and nobody's DeviceID.
  TVXHBA_PortController* port = controller();
  port->DeviceID.null = 1;
  const Ref<TVXHBA_PortController> element(clone(port));
  ASSERT_EQ(element->DeviceID.value, FIRST_PORT);
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(STATUS_TEST)));
  TVXHBA_FCHBADiagnosticTest_Provider provider;
  CIM_ConcreteJob* job = nullptr;
  Property<std::uint32_t> result{0, 1};
  Instance* object = element.get();
  provider.RunDiagnosticService(model.get(), static_cast<const CIM_ManagedElement*>(object),
                                nullptr, nullptr, job, result);
  const Ref<Instance> made(job);
  EXPECT_EQ(numberOf(result), 0);
  EXPECT_TRUE(made);
  const Texts steps = {"Device ID 10000000000000A1",
                       "Could not find the passed PORTController in the map",
                       "Using the default TVXHBA_JobSettingData Instance"};
  EXPECT_EQ(log.only(steps), steps);
  EXPECT_EQ(log.level(steps[1]), TVX_DBG);
  EXPECT_EQ(log.level("Invalid managed element"), TVX_DBG);
  EXPECT_EQ(textOf(lastServiceRecord().ManagedElementName), "TVXHBA_Adapter");
  EXPECT_EQ(textOf(lastCompletionRecord().ManagedElementName), "TVXHBA_Adapter");
  EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 0u);
  ASSERT_EQ(agent->m_TVXHBA_AffectedJobElement_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_AffectedJobElement_map[0]->AffectedElement, nullptr);
}

TEST_F(Run_Service, WantsSettings) {
  const char* text = "Unable to get the Job/Diagnostic SettingData, Not able to continue";
  EXPECT_EQ(run(SELF_TEST, givenFor(STATUS_TEST).get()).result, 5);
  EXPECT_EQ(log.level("Invalid input instance: TVXHBA_FCHBADiagnosticSettingData"), TVX_DBG);
  EXPECT_EQ(log.level("Entered embedded instance"), TVX_DBG);
  Ref<TVXHBA_JobSettingData> otherJobs = givenForJobs();
  otherJobs->InstanceID.set("others");
  EXPECT_EQ(run(SELF_TEST, nullptr, otherJobs.get()).result, 5);
  EXPECT_EQ(log.level("Invalid input instance: TVXHBA_JobSettingData"), TVX_DBG);
  EXPECT_EQ(log.count(text), 2u);
  const Texts both = {"Invalid input instance: TVXHBA_JobSettingData", "Entered embedded instance",
                      "Invalid input instance: TVXHBA_FCHBADiagnosticSettingData", text};
  log.clear();
  EXPECT_EQ(run(SELF_TEST, givenFor(STATUS_TEST).get(), otherJobs.get()).result, 5);
  EXPECT_EQ(log.only(both), both);
  agent->m_TVXHBA_JobSettingData_map.clear();
  EXPECT_EQ(run(SELF_TEST).result, 5);
  agent->m_TVXHBA_FCHBADiagnosticSettingData_map.clear();
  EXPECT_EQ(run(SELF_TEST).result, 5);
  EXPECT_EQ(log.count(text), 3u);
  EXPECT_EQ(log.level(text), TVX_DBG);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
}

TEST_F(Run_Service, NamesOfTestsAreExact) {
  addTest("TVX:FCHBA self Test");
  EXPECT_EQ(run("TVX:FCHBA self Test").result, 1);
  EXPECT_EQ(log.level("Invalid Test Name"), TVX_DBG);
  EXPECT_EQ(log.count("Started Diagnostic : TVX:FCHBA self Test"), 0u);
}

TEST_F(Run_Service, EchoAndPingWantATarget) {
  for (const char* name : {ECHO_TEST, PING_TEST}) {
    EXPECT_EQ(run(name).result, 5) << "the default has none";
    settings(name)->TargetDevice.set("50:06:00:00:00:00:00:B1");
    EXPECT_EQ(run(name).result, 5);
  }
  const Texts steps = {std::string("Started Diagnostic : ") + PING_TEST,
                       "Invalid TargetDevice, Enter Target WWPN"};
  EXPECT_EQ(log.only(steps), (Texts{steps[1], steps[1], steps[0], steps[1], steps[0], steps[1]}));
  EXPECT_EQ(log.level("Invalid TargetDevice, Enter Target WWPN"), TVX_DBG);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
}

TEST_F(Run_Service, EachNameRunsItsTest) {
  const struct {
    const char* name;
    const char* call;
  } rows[] = {{BEACON_TEST, "LRM_DiagBeacon"},
              {STATUS_TEST, "LRM_GetPortAttributes"},
              {RESET_TEST, "LRM_ResetHBA"},
              {SELF_TEST, "LRM_DiagRunPOST"},
              {EXTERNAL_LOOPBACK_TEST, "LRM_DiagLoopBackTestV3"},
              {HOST_LOOPBACK_TEST, "LRM_DiagPciLoopBackTestV2"},
              {INTERNAL_LOOPBACK_TEST, "LRM_DiagLoopBackTestV3"},
              {PING_TEST, "LRM_DiagEchoTestV2"},
              {ECHO_TEST, "LRM_DiagEchoTestV2"}};
  settings(PING_TEST)->TargetDevice.set(TARGET);
  settings(ECHO_TEST)->TargetDevice.set(TARGET);
  for (const auto& row : rows) {
    tvxsim_forget_calls();
    const bool plug = std::string(row.name) == EXTERNAL_LOOPBACK_TEST;
    const Ran ran = run(row.name, nullptr, nullptr, plug ? PLUGGED_PORT : FIRST_PORT);
    EXPECT_EQ(ran.result, 0) << row.name;
    ASSERT_TRUE(ran.job) << row.name;
    EXPECT_EQ(textOf(ran.job->Name), row.name);
    EXPECT_GE(tvxsim_calls(row.call, nullptr), 1u) << row.name;
  }
}

TEST_F(Run_Service, HandsOutAJobOfItsOwn) {
  const Ran ran = run(SELF_TEST);
  ASSERT_TRUE(ran.job);
  const TVXHBA_ConcreteJob* kept = agent->m_TVXHBA_ConcreteJob_map[0];
  EXPECT_NE(ran.job.get(), kept);
  EXPECT_TRUE(identical(ran.job.get(), kept));
}

TEST_F(Run_Service, HoldsTheDataLockToTheEndOfTheTest) {
  std::atomic<bool> gotIn{false};
  std::thread other;
  taken().getResults = [&](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
    other = std::thread([&] {
      const Ranked_Lock lock(agent->m_DataMutex);
      EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 1u) << "all is there";
      gotIn = true;
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    EXPECT_FALSE(gotIn);
    result->state = RM_DIAG_DONE;
    return RM_STATUS{RM_OK};
  };
  EXPECT_EQ(run(SELF_TEST).result, 0);
  other.join();
  EXPECT_TRUE(gotIn);
}

TEST_F(Run_Service, AsksForARefreshThatIsDue) {
  const Ref<TVXHBA_FCHBADiagnosticTest> model(clone(test(STATUS_TEST)));
  agent->m_bAdapterRefreshPending = true;
  EXPECT_EQ(ask(model.get(), nullptr), 5);
  awaitIdle(*agent);
  EXPECT_EQ(log.count("Clearing TVX CDM maps"), 1u);
}

TEST_F(Run_Service, OverridesStayForLaterRuns) {
  Ref<TVXHBA_FCHBADiagnosticSettingData> given = givenFor(HOST_LOOPBACK_TEST);
  given->LoopControlParameter.set({"33"});
  std::vector<std::uint32_t> cycles;
  taken().pciLoopback = [&](HBA_WWN, std::uint32_t count, std::uint32_t, std::uint32_t*,
                            std::uint32_t, const char*) {
    cycles.push_back(count);
    return RM_STATUS{1};
  };
  run(HOST_LOOPBACK_TEST);
  run(HOST_LOOPBACK_TEST, given.get());
  run(HOST_LOOPBACK_TEST);
  refresh(*agent);
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(cycles, (std::vector<std::uint32_t>{100, 33, 33, 100}));
}

TEST_F(Run_Service, SettingsAreRecordedAsLongAsOverridesAreInForce) {
  const auto settingRecords = [&] {
    return agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size();
  };
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(settingRecords(), 0u) << "nothing was given";
  run(HOST_LOOPBACK_TEST, givenFor(HOST_LOOPBACK_TEST).get());
  EXPECT_EQ(settingRecords(), 1u);
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(settingRecords(), 2u) << "it ran with what was given before";
  refresh(*agent);
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(settingRecords(), 2u);
}

TEST_F(Run_Service, SettingsUsedStandInTheirRecord) {
  Ref<TVXHBA_FCHBADiagnosticSettingData> given = givenFor(HOST_LOOPBACK_TEST);
  given->LoopControlParameter.set({"33"});
  const Ran ran = run(HOST_LOOPBACK_TEST, given.get());
  ASSERT_TRUE(ran.job);
  ASSERT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 1u);
  const Instance* used = agent->m_TVXHBA_DiagnosticSettingDataRecord_map[0]->Settings;
  ASSERT_NE(used, nullptr);
  EXPECT_NE(used, settings(HOST_LOOPBACK_TEST));
  EXPECT_TRUE(identical(used, settings(HOST_LOOPBACK_TEST)));
  EXPECT_EQ(log.level("Adding the embedded instance for Settingdatarecord : " +
                      textOf(ran.job->InstanceID)),
            TVX_DBG);
}

TEST_F(Run_Service, SelfTestRunsWithItsDefaultsAndLeavesNoSettingRecord) {
  Ref<TVXHBA_FCHBADiagnosticSettingData> given = givenFor(SELF_TEST);
  given->LoopControlParameter.set({"33"});
  const Ran ran = run(SELF_TEST, given.get());
  EXPECT_EQ(ran.result, 0);
  EXPECT_TRUE(ran.job);
  EXPECT_EQ(log.count("No Override Setting Supported for test : TVX:FCHBA Self Test"), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 0u);
}

TEST_F(Run_Service, AJobToBeDeletedIsNotHandedOut) {
  Ref<TVXHBA_JobSettingData> jobs = givenForJobs();
  jobs->DeleteOnCompletion.set(true);
  const Ran ran = run(SELF_TEST, nullptr, jobs.get());
  EXPECT_EQ(ran.result, 0);
  EXPECT_FALSE(ran.job);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_OwningJobElement_map.size(), 1u) << "its ties stay";
  EXPECT_EQ(agent->m_TVXHBA_AffectedJobElement_map.size(), 1u);
  EXPECT_FALSE(run(STATUS_TEST).job) << "for all later runs of all tests";
  refresh(*agent);
  EXPECT_TRUE(run(STATUS_TEST).job) << "until the next refresh";
}

TEST_F(Run_Service, TheBeaconsJobIsHandedOutThoughItIsDeleted) {
  Ref<TVXHBA_JobSettingData> jobs = givenForJobs();
  jobs->DeleteOnCompletion.set(true);
  const Ran ran = run(BEACON_TEST, nullptr, jobs.get());
  ASSERT_TRUE(ran.job);
  EXPECT_EQ(numberOf(ran.job->DeleteOnCompletion), 1);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 1u);
}

TEST_F(Run_Service, SettingsAreOnlyPutInAlongWithAJob) {
  Ref<TVXHBA_JobSettingData> jobs = givenForJobs();
  jobs->DeleteOnCompletion.set(true);
  auto& settingRecords = agent->m_TVXHBA_DiagnosticSettingDataRecord_map;
  EXPECT_FALSE(run(HOST_LOOPBACK_TEST, givenFor(HOST_LOOPBACK_TEST).get(), jobs.get()).job);
  ASSERT_EQ(settingRecords.size(), 1u);
  EXPECT_EQ(settingRecords[0]->Settings, nullptr);
  EXPECT_TRUE(run(BEACON_TEST, givenFor(BEACON_TEST).get(), jobs.get()).job);
  ASSERT_EQ(settingRecords.size(), 2u);
  const Instance* used = settingRecords[1]->Settings;
  ASSERT_NE(used, nullptr);
  EXPECT_TRUE(identical(used, settings(BEACON_TEST)));
}

TEST_F(Run_Service, NoRecordsAreMadeWithoutAJob) {
  setDiagnosticFactory([](const Meta_Class* metaClass) -> Instance* {
    return metaClass == &TVXHBA_ConcreteJob::static_meta_class ? nullptr : create(metaClass, true);
  });
  for (const char* name : {SELF_TEST, STATUS_TEST, BEACON_TEST, HOST_LOOPBACK_TEST}) {
    const Ran ran = run(name);
    EXPECT_EQ(ran.result, 0) << name;
    EXPECT_FALSE(ran.job) << name;
  }
  EXPECT_EQ(log.count("Unable to create TVXHBA_ConcreteJob"), 4u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 0u);
}

TEST_F(Run_Service, RunsWithoutAManagedElementThatIsNotThere) {
  TVX_DiagTestFunc tests(*agent);
  HBA_WWN wwpn{};
  ASSERT_EQ(TVX_MethodWrapper::string2HBAName(&wwpn, FIRST_PORT), 1);
  Test_Call call{wwpn, *settings(STATUS_TEST), *agent->m_TVXHBA_JobSettingData_map[0], nullptr};
  EXPECT_EQ(tests.StatusTest(call), 0);
  EXPECT_TRUE(call.job);
  EXPECT_EQ(log.count("Invalid managed element"), 2u);
  EXPECT_EQ(textOf(lastServiceRecord().ManagedElementName), "TVXHBA_Adapter");
  EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 0u);
}

}  // namespace
}  // namespace cimrt::test
