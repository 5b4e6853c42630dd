// The tests themselves: what they ask the library, how they wait, and what they make of its
// answers.
#include <gmock/gmock.h>

#include <cstring>

#include "Diagnostics_Fixture.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;

/// Every fault makes the library answer a status to one entry point.
std::string failing(const char* call, int status, const char* more = "") {
  return std::string(R"({"call": ")") + call + R"(", "status": )" + std::to_string(status) + more +
         "}";
}

class Test_Functions : public Diagnostics_Test {
 protected:
  /// A host whose first port runs its tests by this plan.
  void buildWith(const char* kind, const std::string& plan) {
    build(hostWith(std::string(R"(, "diagnostics": {")") + kind + R"(": )" + plan + "}"));
  }
  void aimAt(const char* target) {
    settings(ECHO_TEST)->TargetDevice.set(target);
    settings(PING_TEST)->TargetDevice.set(target);
  }
  std::size_t records() {
    return agent->m_TVXHBA_DiagnosticServiceRecord_map.size() +
           agent->m_TVXHBA_DiagnosticCompletionRecord_map.size();
  }
  /// A run that made neither job nor record.
  void expectNothingLeft(const Ran& ran) {
    EXPECT_FALSE(ran.job);
    EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
    EXPECT_EQ(records(), 0u);
  }
  void expectJob(const Ran& ran, int state, const std::string& text) {
    ASSERT_TRUE(ran.job) << text;
    EXPECT_EQ(numberOf(ran.job->JobState), state) << text;
    EXPECT_EQ(textOf(lastServiceRecord().RecordData), text);
    EXPECT_EQ(numberOf(lastCompletionRecord().CompletionState), state == 7 ? 2 : 5) << text;
  }
};

constexpr int GOOD = 7;
constexpr int BAD = 10;

// --- The tests that are polled

struct Polled {
  const char* name;
  const char* plan;
  const char* startCall;
  const char* poll;     // before the status
  const char* failure;  // between name and result
  const char* end;      // after the result
  const char* unknown;  // after the name
  const char* port;
};

const Polled POLLED[] = {
    {SELF_TEST, "post", "LRM_DiagRunPOST", "Polling for the results.. ",
     " Resulted with Failure, Result - ", "", " Unknown Error, Exited with error code: 0",
     FIRST_PORT},
    {HOST_LOOPBACK_TEST, "pci", "LRM_DiagPciLoopBackTestV2",
     "Polling for the results.. : ", " Resulted with Failure, Result - ", "",
     " Unknown Error, Exited with error code: 0", FIRST_PORT},
    {INTERNAL_LOOPBACK_TEST, "loopback", "LRM_DiagLoopBackTestV3",
     "Polling for the results.. : ", " Resulted with Failure, Result - ", "",
     " Unknown Error, Exited with error code: 0", FIRST_PORT},
    {ECHO_TEST, "echo", "LRM_DiagEchoTestV2",
     "Polling for the results.. : ", " Resulted with Failure, Result - ", " ",
     " Unknown error, Exited with error code : 0", FIRST_PORT},
    {PING_TEST, "echo", "LRM_DiagEchoTestV2",
     "Polling for the results.. : ", " Resulted with Failure, Result - ", " ",
     " Unknown error, Exited with error code : 0", FIRST_PORT},
};

class Polled_Tests : public Test_Functions, public testing::WithParamInterface<Polled> {
 protected:
  const Polled& row() const { return GetParam(); }
  std::string name() const { return row().name; }
  Ran runIt(const std::string& plan) {
    buildWith(row().plan, plan);
    aimAt(TARGET);
    return run(row().name);
  }
};

TEST_P(Polled_Tests, PassesAfterAFewPolls) {
  const Ran ran = runIt(R"({"polls": 3})");
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(slept(), 4u) << "a second before each poll";
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 4u);
  EXPECT_EQ(tvxsim_calls(row().startCall, FIRST_PORT), 1u);
  EXPECT_EQ(log.count(row().poll + std::string("0")), 4u);
  EXPECT_EQ(log.level(name() + " Resulted with Success"), TVX_DBG);
  EXPECT_EQ(log.level("MapDiagResultStatus"), TVX_DBG);
  EXPECT_EQ(log.level(name() + " Launched/Completed Succesful"), TVX_DBG);
  EXPECT_EQ(log.level("Started Diagnostic : " + name()), TVX_DBG);
}

TEST_P(Polled_Tests, FailsWithTheResultInWordsAndStillAnswersZero) {
  const Ran ran = runIt(R"({"result": 7, "errors": 3})");
  EXPECT_EQ(ran.result, 0);
  const std::string text = name() + row().failure + "Mailbox Error" + row().end;
  expectJob(ran, BAD, text);
  EXPECT_EQ(log.level(text), TVX_DBG);
}

TEST_P(Polled_Tests, EndsInAnUnknownState) {
  const Ran ran = runIt(R"({"final_state": 4})");
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, BAD, name() + row().unknown);
}

TEST_P(Polled_Tests, ThatCantBeStartedLeavesNothing) {
  const struct {
    int status;
    const char* text;
  } rows[] = {
      {1, "An unspecified error occurred"},
      {2, "Diagnostics not available/Port not supported"},
      {63, "Diagnostics not available/Port not supported"},
      {190, "Diagnostics not available/Port not supported"},
      {62, "There are too many pending/running requests in diag. results table"},
      {64, "Adapter Busy: Another critical application may be running"},
      {3, "Unknown"},
  };
  build();
  aimAt(TARGET);
  for (const auto& each : rows) {
    tvxsim_clear_faults();
    addFault(failing(row().startCall, each.status));
    log.clear();
    const Ran ran = run(row().name);
    EXPECT_EQ(ran.result, 40000 + each.status);
    expectNothingLeft(ran);
    EXPECT_EQ(log.level(std::string(each.text) +
                        " , Exited with error code : " + std::to_string(each.status)),
              TVX_DBG)
        << each.status;
    EXPECT_EQ(log.level("TVX_DiagTestFunc::MapDiagStatus"), TVX_DBG);
    EXPECT_EQ(log.level(name() + " Failed to Run"), TVX_DBG);
  }
  EXPECT_EQ(slept(), 0u);
}

TEST_P(Polled_Tests, ThatFailsInAPollLeavesNothing) {
  buildWith(row().plan, R"({"polls": 5})");
  aimAt(TARGET);
  addFault(failing("LRM_DiagGetResults", 62, R"(, "nth": 3)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40062);
  expectNothingLeft(ran);
  EXPECT_EQ(slept(), 3u);
}

TEST_P(Polled_Tests, ThatNeverEndsIsCanceledAtThePollBeforeTheLast) {
  const Ran ran = runIt(R"({"endless": true})");
  EXPECT_EQ(ran.result, 0) << "the last status was 0";
  expectNothingLeft(ran);
  EXPECT_EQ(slept(), 122u) << "121 polls and one round of canceling";
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", FIRST_PORT), 1u);
  EXPECT_EQ(log.level("TVX_Diagnostics::CancelTest"), TVX_DBG);
  EXPECT_EQ(log.level("Polling for the Cancel status ..: 0"), TVX_DBG);
  EXPECT_EQ(log.level("Canceled the " + name()), TVX_DBG);
  EXPECT_EQ(log.level("Successful , Exited with error code : 0"), TVX_DBG);
}

TEST_P(Polled_Tests, ThatCantBeCanceledIsPolledOnceMore) {
  buildWith(row().plan, R"({"endless": true})");
  aimAt(TARGET);
  addFault(failing("LRM_DiagCancelDiagnostic", 148));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 122u);
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", FIRST_PORT), 122u);
  EXPECT_EQ(slept(), 244u);
  const char* text = "Unknown error, Unable to cancel the test, Exited with the error code : 148";
  EXPECT_EQ(log.count(text), 122u);
  EXPECT_EQ(log.level(text), TVX_DBG);
}

TEST_P(Polled_Tests, MayEndInTheLastPoll) {
  buildWith(row().plan, R"({"polls": 121})");
  aimAt(TARGET);
  addFault(failing("LRM_DiagCancelDiagnostic", 148));
  const Ran ran = run(row().name);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 122u);
}

TEST_P(Polled_Tests, WaitsForResultsThatAreNotReady) {
  buildWith(row().plan, "{}");
  aimAt(TARGET);
  addFault(failing("LRM_DiagGetResults", 60, R"(, "first": 5)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(log.count(row().poll + std::string("60")), 5u);
}

TEST_P(Polled_Tests, GivesUpOnResultsThatAreNeverReady) {
  buildWith(row().plan, "{}");
  aimAt(TARGET);
  addFault(failing("LRM_DiagGetResults", 60));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40060);
  expectNothingLeft(ran);
  EXPECT_EQ(slept(), 122u);
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", nullptr), 0u);
  EXPECT_EQ(log.level("Unknown , Exited with error code : 60"), TVX_DBG);
}

TEST_P(Polled_Tests, NotReadyButRunningIsCanceledToo) {
  build();
  aimAt(TARGET);
  taken().getResults = [](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
    result->state = RM_DIAG_QUEUED;
    return RM_STATUS{RM_ERROR_DIAG_NOT_READY};
  };
  taken().cancel = [](HBA_WWN, std::uint32_t) {
    taken().getResults = [](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
      result->state = RM_DIAG_CANCELED;
      return RM_STATUS{RM_OK};
    };
    return RM_STATUS{RM_OK};
  };
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40060) << "the status of the last poll";
  expectNothingLeft(ran);
  EXPECT_EQ(slept(), 122u);
}

TEST_P(Polled_Tests, GetsAClearResultForEachPoll) {
  build();
  aimAt(TARGET);
  int polls = 0;
  taken().getResults = [&](HBA_WWN wwpn, std::uint32_t id, RM_DiagResult* result) {
    EXPECT_EQ(wwpn.wwn[7], 0xA1);
    EXPECT_EQ(id, 1u);
    const RM_DiagResult clear{};
    EXPECT_EQ(std::memcmp(result, &clear, sizeof clear), 0);
    std::memset(result, 0x5A, sizeof *result);
    result->state = ++polls < 3 ? RM_DIAG_RUNNING : RM_DIAG_DONE;
    result->result = 0;
    return RM_STATUS{RM_OK};
  };
  expectJob(run(row().name), GOOD, name() + " Resulted with Success");
  EXPECT_EQ(polls, 3);
}

TEST_P(Polled_Tests, OnADisabledPortDoesNothing) {
  build(hostWith(R"(, "state": "disabled")"));
  aimAt(TARGET);
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  EXPECT_EQ(tvxsim_calls(row().startCall, nullptr), 0u);
  const std::string blank = name() == SELF_TEST ? "" : " ";
  EXPECT_EQ(log.level("Source HBA port is disabled. Unable to start " + name() + blank), TVX_DBG);
}

TEST_P(Polled_Tests, OnAPortThatCantBeReadGivesTheStatus) {
  build();
  aimAt(TARGET);
  addFault(failing("LRM_GetPortAttributes", 149));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40149);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("RM_GetPortAttributes command failed. Exited with error code : 149"),
            TVX_DBG);
}

TEST_P(Polled_Tests, WithoutMemoryForTheAttributesGivesTheStatus) {
  build();
  aimAt(TARGET);
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40008);
  expectNothingLeft(ran);
}

INSTANTIATE_TEST_SUITE_P(, Polled_Tests, testing::ValuesIn(POLLED), [](const auto& each) {
  std::string name = each.param.name;
  name.erase(0, std::string("TVX:FCHBA ").size());
  std::erase(name, ' ');
  return name;
});

// --- Canceling

TEST_F(Test_Functions, CancelWantsANameAndAnIdentifier) {
  build();
  const HBA_WWN wwpn{};
  EXPECT_EQ(CancelTest(nullptr, 1, SELF_TEST), 1);
  EXPECT_EQ(CancelTest(&wwpn, 0, SELF_TEST), 1);
  EXPECT_EQ(log.count("Invalid Parameter"), 2u);
  EXPECT_EQ(log.level("Invalid Parameter"), TVX_DBG);
  EXPECT_EQ(slept(), 0u);
}

TEST_F(Test_Functions, CancelGoesOnUntilTheTestIsCanceled) {
  build();
  int rounds = 0;
  taken().cancel = [&](HBA_WWN, std::uint32_t) {
    ++rounds;
    return rounds == 2 ? RM_STATUS{148} : RM_STATUS{RM_OK};
  };
  taken().getResults = [&](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
    result->state = rounds < 4 ? RM_DIAG_RUNNING : RM_DIAG_CANCELED;
    return rounds == 3 ? RM_STATUS{62} : RM_STATUS{RM_OK};
  };
  const HBA_WWN wwpn{};
  EXPECT_EQ(CancelTest(&wwpn, 9, SELF_TEST), 0);
  EXPECT_EQ(rounds, 4);
  EXPECT_EQ(slept(), 4u);
  EXPECT_EQ(log.count("Polling for the Cancel status ..: 0"), 3u);
  EXPECT_EQ(log.count("Polling for the Cancel status ..: 148"), 1u);
  EXPECT_EQ(log.count("Polling for the results.. : 0"), 2u);
  EXPECT_EQ(log.count("Polling for the results.. : 62"), 1u);
  EXPECT_EQ(log.count("Canceled the TVX:FCHBA Self Test"), 1u);
}

TEST_F(Test_Functions, CancelGivesTheLastStatusAfterItsRounds) {
  build();
  taken().cancel = [](HBA_WWN, std::uint32_t) { return RM_STATUS{RM_OK}; };
  taken().getResults = [](HBA_WWN, std::uint32_t, RM_DiagResult*) { return RM_STATUS{62}; };
  const HBA_WWN wwpn{};
  EXPECT_EQ(CancelTest(&wwpn, 9, SELF_TEST), 62);
  EXPECT_EQ(slept(), 122u);
}

// --- Loopbacks

TEST_F(Test_Functions, LoopbacksHandTheirSettingsOver) {
  build();
  for (const char* name : {HOST_LOOPBACK_TEST, INTERNAL_LOOPBACK_TEST, EXTERNAL_LOOPBACK_TEST}) {
    settings(name)->LoopControlParameter.set({"250"});
    settings(name)->HaltOnError.set(true);
  }
  Texts calls;
  const auto note = [&](const std::string& call, std::uint32_t cycles, std::uint32_t halt,
                        std::uint32_t* id, std::uint32_t option, const char* pattern) {
    calls.push_back(call + " " + std::to_string(cycles) + " " + std::to_string(halt) + " " +
                    std::to_string(option) + " " + pattern);
    *id = 7;
    return RM_STATUS{62};
  };
  taken().pciLoopback = [&](HBA_WWN, std::uint32_t cycles, std::uint32_t halt, std::uint32_t* id,
                            std::uint32_t option, const char* pattern) {
    return note("pci", cycles, halt, id, option, pattern);
  };
  taken().loopback = [&](HBA_WWN, std::uint32_t kind, std::uint32_t cycles, std::uint32_t halt,
                         std::uint32_t* id, std::uint32_t option, const char* pattern) {
    return note("loop " + std::to_string(kind), cycles, halt, id, option, pattern);
  };
  EXPECT_EQ(run(HOST_LOOPBACK_TEST).result, 40062);
  EXPECT_EQ(run(INTERNAL_LOOPBACK_TEST).result, 40062);
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST, nullptr, nullptr, PLUGGED_PORT).result, 40062);
  EXPECT_EQ(calls,
            (Texts{"pci 250 1 0 1a2b3c4d", "loop 1 250 1 0 1a2b3c4d", "loop 0 250 1 0 1a2b3c4d"}));
  EXPECT_EQ(log.level(HOST_LOOPBACK_TEST), TVX_DBG);
  EXPECT_EQ(log.count("Number of test cycles set to run : 250 "), 3u);
  EXPECT_EQ(log.count("HaltOnError value : 1 "), 3u);
  EXPECT_EQ(log.count("The Input pattern used for testing 1a2b3c4d"), 3u);
}

TEST_F(Test_Functions, AShortPatternEndsAtItsFirstZero) {
  build();
  settings(HOST_LOOPBACK_TEST)->BufferPattern.set({'1', 'a', 0, 0});
  std::string seen;
  taken().pciLoopback = [&](HBA_WWN, std::uint32_t, std::uint32_t, std::uint32_t*, std::uint32_t,
                            const char* pattern) {
    seen = pattern;
    return RM_STATUS{1};
  };
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(seen, "1a");
}

TEST_F(Test_Functions, LoopbacksOfAnotherTypeAreRefused) {
  build();
  HBA_WWN wwpn{};
  ASSERT_EQ(TVX_MethodWrapper::string2HBAName(&wwpn, FIRST_PORT), 1);
  for (const int type : {0, 4, 7, 10, 12}) {
    Test_Call call{wwpn, *settings(HOST_LOOPBACK_TEST), *agent->m_TVXHBA_JobSettingData_map[0],
                   controller()};
    EXPECT_EQ(TVX_DiagTestFunc(*agent).LoopBackTest(call, type), 4);
    EXPECT_FALSE(call.job);
    EXPECT_EQ(log.level("Error: Wrong Test type passed: " + std::to_string(type)), TVX_DBG);
  }
}

constexpr const char* NO_PLUG =
    "Loopback plug is not detected. Unabled to run test. Install loopback plug and make sure HBA "
    "Port is Up/Ready.. ";

TEST_F(Test_Functions, ExternalLoopbackRunsOverAPlug) {
  build();
  const Ran ran = run(EXTERNAL_LOOPBACK_TEST, nullptr, nullptr, PLUGGED_PORT);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, std::string(EXTERNAL_LOOPBACK_TEST) + " Resulted with Success");
  EXPECT_EQ(slept(), 1u + 2u) << "one second before the look for the plug";
  EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", PLUGGED_PORT), 2u) << "read afresh";
}

TEST_F(Test_Functions, ExternalLoopbackWithoutAPlugLeavesNothing) {
  const struct {
    const char* port;
    const char* why;
  } rows[] = {
      {R"("type": "n", "fabric_name": "0000000000000000")", "neither loop nor point to point"},
      {R"("type": "loop", "fabric_name": "100000054D5A8001")", "a fabric"},
      {R"("type": "point to point", "fabric_name": "0000000000000001")", "a fabric's last byte"},
      {R"("type": "loop", "fabric_name": "0000000000000000",
          "targets": [{"wwpn": "50060000000000B1", "luns": {"count": 1}}])",
       "a target"},
  };
  for (const auto& row : rows) {
    build(std::string(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", )") + row.port +
          "}]}]}");
    const Ran ran = run(EXTERNAL_LOOPBACK_TEST);
    EXPECT_EQ(ran.result, 40001) << row.why;
    expectNothingLeft(ran);
    EXPECT_EQ(log.level(NO_PLUG), TVX_DBG) << row.why;
    EXPECT_EQ(tvxsim_calls("LRM_DiagLoopBackTestV3", nullptr), 0u) << row.why;
  }
}

TEST_F(Test_Functions, APortFromPointToPointMayHaveAPlug) {
  build(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", "type": "point to point",
            "fabric_name": "0000000000000000"}]}]})");
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST).result, 0);
  EXPECT_EQ(tvxsim_calls("LRM_DiagLoopBackTestV3", FIRST_PORT), 1u);
}

TEST_F(Test_Functions, ExternalLoopbackRunsIfThePlugCantBeLookedFor) {
  build();
  addFault(failing("LRM_GetPortAttributes", 148, R"(, "nth": 2)"));
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST).result, 0);
  EXPECT_EQ(tvxsim_calls("LRM_DiagLoopBackTestV3", FIRST_PORT), 1u);
  EXPECT_EQ(log.count(NO_PLUG), 0u);
}

TEST_F(Test_Functions, TargetsThatCantBeCountedAreTakenForSome) {
  build();
  addFault(failing("LRM_GetFcpTargetMapping", 1));
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST, nullptr, nullptr, PLUGGED_PORT).result, 40001);
}

// --- Echo and ping

TEST_F(Test_Functions, EchoAndPingHandTheirSettingsOver) {
  for (const char* name : {ECHO_TEST, PING_TEST}) {
    build();
    aimAt(TARGET);
    settings(name)->LoopControlParameter.set({"12"});
    int calls = 0;
    taken().echo = [&](HBA_WWN wwpn, HBA_WWN target, std::uint32_t cycles, std::uint32_t halt,
                       std::uint32_t*, std::uint32_t option, const char* pattern) {
      ++calls;
      EXPECT_EQ(wwpn.wwn[7], 0xA1);
      EXPECT_EQ(target.wwn[0], 0x50);
      EXPECT_EQ(target.wwn[7], 0xB1);
      EXPECT_EQ(cycles, 12u);
      EXPECT_EQ(halt, 0u);
      EXPECT_EQ(option, 0u);
      EXPECT_STREQ(pattern, "1a2b3c4d");
      return RM_STATUS{1};
    };
    EXPECT_EQ(run(name).result, 40001);
    EXPECT_EQ(calls, 1);
    const Texts steps = {"TVX_Diagnostics::EchoTest/Ping",
                         std::string("Diagnostics Name : ") + name,
                         "Number of test cycles set to run : 12 ",
                         "HaltOnError value : 0 ",
                         "Pattern used for testing 1a2b3c4d",
                         std::string("TargetDevice WWPN to check : ") + TARGET};
    EXPECT_EQ(log.only(steps), steps);
    for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG);
  }
}

TEST_F(Test_Functions, EchoToATargetThatIsNoNameFails) {
  build();
  aimAt("50060000000000XY");
  const Ran ran = run(ECHO_TEST);
  EXPECT_EQ(ran.result, 40001);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("TVX_Diagnostics::EchoTest::str2HBAName failed"), TVX_DBG);
}

// --- Reset and status

struct Once {
  const char* name;
  const char* call;
  const char* success;  // after the name
};

const Once ONCE[] = {
    {RESET_TEST, "LRM_ResetHBA", " Success"},
    {STATUS_TEST, "LRM_GetPortAttributes", " Resulted with Success"},
};

class Tests_Without_Polls : public Test_Functions, public testing::WithParamInterface<Once> {
 protected:
  void SetUp() override {
    Test_Functions::SetUp();
    build();
  }
  const Once& row() const { return GetParam(); }
  std::string name() const { return row().name; }
};

TEST_P(Tests_Without_Polls, Pass) {
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + row().success);
  EXPECT_EQ(log.level(name() + " Succesful"), TVX_DBG);
  EXPECT_EQ(tvxsim_calls(row().call, FIRST_PORT), 1u);
  EXPECT_EQ(slept(), 0u);
}

TEST_P(Tests_Without_Polls, TryAgainWhileTheAdapterIsBusy) {
  addFault(failing(row().call, 64, R"(, "first": 121)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + row().success);
  EXPECT_EQ(tvxsim_calls(row().call, FIRST_PORT), 122u);
}

TEST_P(Tests_Without_Polls, GiveUpOnAnAdapterThatStaysBusy) {
  addFault(failing(row().call, 64));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40064);
  expectNothingLeft(ran);
  EXPECT_EQ(tvxsim_calls(row().call, FIRST_PORT), 122u);
  EXPECT_EQ(log.count("Adapter Busy: Another critical application may be running , Exited with "
                      "error code : 64"),
            1u);
  EXPECT_EQ(slept(), 0u);
}

TEST_P(Tests_Without_Polls, LeaveNothingWhereThereAreNoDiagnostics) {
  for (const int status : {63, 2, 190}) {
    tvxsim_clear_faults();
    addFault(failing(row().call, status));
    log.clear();
    const Ran ran = run(row().name);
    EXPECT_EQ(ran.result, 40000 + status);
    expectNothingLeft(ran);
    EXPECT_EQ(log.count("Diagnostics not available/Port not supported , Exited with error code : " +
                        std::to_string(status)),
              1u);
  }
}

TEST_P(Tests_Without_Polls, FailWithAJobAndAStatus) {
  addFault(failing(row().call, 148));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40148);
  expectJob(ran, BAD, name() + " Resulted with Failure, Exited with error code 148");
}

TEST_P(Tests_Without_Polls, LeaveNothingOfAFailureAfterABusyRound) {
  addFault(failing(row().call, 148, R"(, "nth": 2)"));
  addFault(failing(row().call, 64, R"(, "first": 1)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40148);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("Unknown , Exited with error code : 148"), TVX_DBG);
}

TEST_P(Tests_Without_Polls, RefuseAPortThatIsNotLocal) {
  addFault(failing("LRM_IsLocalHBA", 1));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40005);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("INVALID wwpn/Mac Address"), TVX_ERR);
}

INSTANTIATE_TEST_SUITE_P(, Tests_Without_Polls, testing::ValuesIn(ONCE), [](const auto& each) {
  return std::string(each.param.name == RESET_TEST ? "Reset" : "Status");
});

TEST_F(Test_Functions, StatusTestTellsEachRead) {
  build();
  addFault(failing("LRM_GetPortAttributes", 64, R"(, "first": 2)"));
  run(STATUS_TEST);
  EXPECT_EQ(log.count("RM_GetPortAttributes call result : 64"), 2u);
  EXPECT_EQ(log.count("RM_GetPortAttributes call result : 0"), 1u);
  EXPECT_EQ(log.level("RM_GetPortAttributes call result : 0"), TVX_DBG);
}

TEST_F(Test_Functions, StatusTestNeedsMemory) {
  build();
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  const Ran ran = run(STATUS_TEST);
  EXPECT_EQ(ran.result, 40008);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("ERROR: GetPHYPortAttributeValues: Unable to allocate buffer"), TVX_DBG);
}

// --- Beacon

class Beacon_Test : public Test_Functions {
 protected:
  static std::string failure(int status) {
    return std::string(BEACON_TEST) + " Resulted with Failure, Exited with error code " +
           std::to_string(status);
  }
  std::uint32_t beacon() {
    HBA_WWN wwpn{};
    TVX_MethodWrapper::string2HBAName(&wwpn, FIRST_PORT);
    std::uint32_t state = 0;
    EXPECT_EQ(LRM_DiagBeaconState(wwpn, &state), RM_OK);
    return state;
  }
};

TEST_F(Beacon_Test, FlashesTwentyTimesAndPutsTheLightsBack) {
  for (const std::uint32_t before : {RM_BEACON_OFF, RM_BEACON_ON}) {
    build(hostWith(before == RM_BEACON_ON ? R"(, "beacon": "on")" : ""));
    const std::uint64_t start = slept();
    const Ran ran = run(BEACON_TEST);
    EXPECT_EQ(ran.result, 0);
    expectJob(ran, GOOD, std::string(BEACON_TEST) + " Resulted with Success");
    EXPECT_EQ(slept() - start, 40u);
    EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", FIRST_PORT), 41u);
    EXPECT_EQ(beacon(), before);
  }
}

TEST_F(Beacon_Test, ThatCantBeDrivenLeavesNothing) {
  build(hostWith(R"(, "beacon": "not available")"));
  const Ran ran = run(BEACON_TEST);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  const Texts told = {"Beacon state Not Available. Beaconing not set", failure(0)};
  EXPECT_EQ(log.only(told), told);
  EXPECT_EQ(log.level(told[0]), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", nullptr), 0u);
}

TEST_F(Beacon_Test, ThatCantBeReadTellsItInJobAndRecord) {
  build();
  addFault(failing("LRM_DiagBeaconState", 63));
  const Ran ran = run(BEACON_TEST);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, BAD, failure(63));
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", nullptr), 0u);
}

TEST_F(Beacon_Test, FailsWithTheFirstOnCall) {
  build();
  addFault(failing("LRM_DiagBeacon", 148, R"(, "nth": 1)"));
  const Ran ran = run(BEACON_TEST);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, BAD, failure(148));
  EXPECT_EQ(slept(), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", FIRST_PORT), 2u) << "one to put the lights back";
}

TEST_F(Beacon_Test, CountsAsDoneOnceTheLightsWereOn) {
  const struct {
    int call;
    std::uint64_t seconds;
  } rows[] = {{2, 1}, {3, 2}, {40, 39}};
  for (const auto& row : rows) {
    build();
    const std::uint64_t start = slept();
    addFault(failing("LRM_DiagBeacon", 148, (R"(, "nth": )" + std::to_string(row.call)).c_str()));
    const Ran ran = run(BEACON_TEST);
    EXPECT_EQ(ran.result, 0);
    expectJob(ran, GOOD, failure(148));
    EXPECT_EQ(textOf(lastCompletionRecord().RecordData), failure(148)) << "no suggested action";
    EXPECT_EQ(slept() - start, row.seconds);
  }
}

TEST_F(Beacon_Test, LightsThatCantBePutBackAreTold) {
  build();
  addFault(failing("LRM_DiagBeacon", 148, R"(, "nth": 41)"));
  const Ran ran = run(BEACON_TEST);
  expectJob(ran, GOOD, std::string(BEACON_TEST) + " Resulted with Success");
  EXPECT_EQ(log.level("Unable to set the previous beacon state"), TVX_DBG);
}

TEST_F(Beacon_Test, RefusesAPortThatIsNotLocal) {
  build();
  addFault(failing("LRM_IsLocalHBA", 1));
  const Ran ran = run(BEACON_TEST);
  EXPECT_EQ(ran.result, 40001) << "unlike reset and status";
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("INVALID wwpn/Mac Address"), TVX_ERR);
}

// --- Words

TEST_F(Test_Functions, ResultsHaveTheirTexts) {
  const char* const texts[] = {
      "Success",
      "General Error",
      "Link Down",
      "I/O Error",
      "Timeout",
      "Transmit Error",
      "Receive Error",
      "Mailbox Error",
      "Error: Echo test not supported",
      "Error: Echo Failed",
      "Error: Target Unreachable",
      "Error: HBA temperature exceeded operational range. Adapter stopped.\n\nPlease see the "
      "product documentation",
      "Error: Failed to allocate resource",
      "Error: Another diagnostic test is running. Please try again",
      "Error: Sequence Timeout",
      "Error: Bus reset received during test",
      "Error: Read-Write test is running",
      "Error: Driver busy. Please try again",
      "Error: Mailbox not ready",
      "Error: Port not ready",
      "Unknown",
  };
  for (std::uint32_t code = 0; code < std::size(texts); code++)
    EXPECT_STREQ(MapDiagResultStatus(code), texts[code]);
  EXPECT_STREQ(MapDiagResultStatus(0xFFFFFFFF), "Unknown");
  EXPECT_EQ(log.level("MapDiagResultStatus"), TVX_DBG);
}

TEST_F(Test_Functions, StatusesHaveTheirTexts) {
  EXPECT_STREQ(MapDiagStatus(0), "Successful");
  EXPECT_STREQ(MapDiagStatus(1), "An unspecified error occurred");
  for (const int status : {2, 63, 190})
    EXPECT_STREQ(MapDiagStatus(status), "Diagnostics not available/Port not supported");
  EXPECT_STREQ(MapDiagStatus(62),
               "There are too many pending/running requests in diag. results table");
  EXPECT_STREQ(MapDiagStatus(64), "Adapter Busy: Another critical application may be running");
  for (const int status : {-1, 3, 61, 65, 189}) EXPECT_STREQ(MapDiagStatus(status), "Unknown");
}

TEST_F(Test_Functions, EveryResultCodeEndsInTheRecord) {
  build();
  std::uint32_t code = 0;
  taken().getResults = [&](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
    result->state = RM_DIAG_DONE;
    result->result = code;
    return RM_STATUS{RM_OK};
  };
  for (code = 1; code <= 20; code++) {
    const Ran ran = run(SELF_TEST);
    EXPECT_EQ(ran.result, 0);
    expectJob(
        ran, BAD,
        std::string(SELF_TEST) + " Resulted with Failure, Result - " + MapDiagResultStatus(code));
  }
}

}  // namespace
}  // namespace cimrt::test
