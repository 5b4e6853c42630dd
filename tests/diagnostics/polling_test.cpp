// The tests that the library runs: how they are waited for, how they end, and how they are
// canceled.
#include <cstring>

#include "Test_Functions_Fixture.h"

namespace cimrt::test {
namespace {

// --- The tests that are polled

struct Polled {
  const char* name;
  const char* plan;
  const char* startCall;
  const char* poll;          // before the status
  const char* failure;       // between name and result
  const char* end;           // after the result
  const char* unknown;       // after the name
  std::uint64_t before = 0;  // seconds slept before the start
  const char* port = "";     // more members of the port
};

const Polled POLLED[] = {
    {SELF_TEST, "post", "LRM_DiagRunPOST", "Polling for the results.. ",
     " Resulted with Failure, Result - ", "", " Unknown Error, Exited with error code: 0"},
    {HOST_LOOPBACK_TEST, "pci", "LRM_DiagPciLoopBackTestV2", "Polling for the results.. : ",
     " Resulted with Failure, Result - ", "", " Unknown Error, Exited with error code: 0"},
    {INTERNAL_LOOPBACK_TEST, "loopback", "LRM_DiagLoopBackTestV3", "Polling for the results.. : ",
     " Resulted with Failure, Result - ", "", " Unknown Error, Exited with error code: 0"},
    {EXTERNAL_LOOPBACK_TEST, "loopback", "LRM_DiagLoopBackTestV3", "Polling for the results.. : ",
     " Resulted with Failure, Result - ", "", " Unknown Error, Exited with error code: 0", 1,
     R"(, "type": "loop", "fabric_name": "0000000000000000", "targets": [])"},
    {ECHO_TEST, "echo", "LRM_DiagEchoTestV2", "Polling for the results.. : ",
     " Resulted with Failure, Result - ", " ", " Unknown error, Exited with error code : 0"},
    {PING_TEST, "echo", "LRM_DiagEchoTestV2", "Polling for the results.. : ",
     " Resulted with Failure, Result - ", " ", " Unknown error, Exited with error code : 0"},
};

class Polled_Tests : public Test_Functions, public testing::WithParamInterface<Polled> {
 protected:
  const Polled& row() const { return GetParam(); }
  std::string name() const { return row().name; }
  /// A host whose first port can be tested, and runs the test by this plan.
  void prepare(const std::string& plan = "{}") {
    build(hostWith(std::string(row().port) + R"(, "diagnostics": {")" + row().plan + R"(": )" +
                   plan + "}"));
    aimAt(TARGET);
  }
  Ran runIt(const std::string& plan) {
    prepare(plan);
    return run(row().name);
  }
  /// Seconds that it was waited for the end of the test.
  std::uint64_t waited() const { return slept() - row().before; }
};

TEST_P(Polled_Tests, PassesAfterAFewPolls) {
  const Ran ran = runIt(R"({"polls": 3})");
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(waited(), 4u) << "a second before each poll";
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 4u);
  EXPECT_EQ(tvxsim_calls(row().startCall, FIRST_PORT), 1u);
  EXPECT_EQ(log.count(row().poll + std::string("0")), 4u);
  EXPECT_EQ(log.level(row().poll + std::string("0")), TVX_DBG);
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
  EXPECT_EQ(log.level(name() + row().unknown), TVX_DBG);
  for (const std::uint32_t state : {0u, 3u, 5u, 7u}) {
    taken().getResults = [=](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
      result->state = state;
      return RM_STATUS{RM_OK};
    };
    expectJob(run(row().name), BAD, name() + row().unknown);
  }
}

TEST_P(Polled_Tests, FailsWithAnyResult) {
  prepare();
  for (std::uint32_t code = 1; code <= 20; code++) {
    taken().getResults = [=](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
      result->state = RM_DIAG_DONE;
      result->result = code;
      return RM_STATUS{RM_OK};
    };
    const Ran ran = run(row().name);
    EXPECT_EQ(ran.result, 0);
    expectJob(ran, BAD, name() + row().failure + MapDiagResultStatus(code) + row().end);
  }
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
  prepare();
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
  EXPECT_EQ(slept(), row().before * std::size(rows)) << "nothing was waited for";
}

TEST_P(Polled_Tests, ThatFailsInAPollLeavesNothing) {
  prepare(R"({"polls": 5})");
  addFault(failing("LRM_DiagGetResults", 62, R"(, "nth": 3)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40062);
  expectNothingLeft(ran);
  EXPECT_EQ(waited(), 3u);
}

TEST_P(Polled_Tests, ThatNeverEndsIsCanceledAtThePollBeforeTheLast) {
  const Ran ran = runIt(R"({"endless": true})");
  EXPECT_EQ(ran.result, 0) << "the last status was 0";
  expectNothingLeft(ran);
  EXPECT_EQ(waited(), 122u) << "121 polls and one round of canceling";
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", FIRST_PORT), 1u);
  EXPECT_EQ(log.level("TVX_Diagnostics::CancelTest"), TVX_DBG);
  EXPECT_EQ(log.level("Polling for the Cancel status ..: 0"), TVX_DBG);
  EXPECT_EQ(log.level("Canceled the " + name()), TVX_DBG);
  EXPECT_EQ(log.level("Successful , Exited with error code : 0"), TVX_DBG);
}

TEST_P(Polled_Tests, ThatCantBeCanceledIsPolledOnceMore) {
  prepare(R"({"endless": true})");
  addFault(failing("LRM_DiagCancelDiagnostic", 148));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 122u);
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", FIRST_PORT), 122u);
  EXPECT_EQ(waited(), 244u);
  const char* text = "Unknown error, Unable to cancel the test, Exited with the error code : 148";
  EXPECT_EQ(log.count(text), 122u);
  EXPECT_EQ(log.level(text), TVX_DBG);
}

TEST_P(Polled_Tests, MayEndInTheLastPoll) {
  prepare(R"({"polls": 121})");
  addFault(failing("LRM_DiagCancelDiagnostic", 148));
  const Ran ran = run(row().name);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(tvxsim_calls("LRM_DiagGetResults", FIRST_PORT), 122u);
}

TEST_P(Polled_Tests, AnswersTheStatusOfTheLastPoll) {
  prepare(R"({"endless": true})");
  addFault(failing("LRM_DiagCancelDiagnostic", 148));
  addFault(failing("LRM_DiagGetResults", 62, R"(, "nth": 122)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40062);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("There are too many pending/running requests in diag. results table , Exited "
                      "with error code : 62"),
            TVX_DBG);
}

TEST_P(Polled_Tests, WaitsForResultsThatAreNotReady) {
  prepare();
  addFault(failing("LRM_DiagGetResults", 60, R"(, "first": 5)"));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectJob(ran, GOOD, name() + " Resulted with Success");
  EXPECT_EQ(log.count(row().poll + std::string("60")), 5u);
}

TEST_P(Polled_Tests, GivesUpOnResultsThatAreNeverReady) {
  prepare();
  addFault(failing("LRM_DiagGetResults", 60));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40060);
  expectNothingLeft(ran);
  EXPECT_EQ(waited(), 122u);
  EXPECT_EQ(tvxsim_calls("LRM_DiagCancelDiagnostic", nullptr), 0u);
  EXPECT_EQ(log.level("Unknown , Exited with error code : 60"), TVX_DBG);
}

TEST_P(Polled_Tests, NotReadyButRunningIsCanceledToo) {
  prepare();
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
  EXPECT_EQ(waited(), 122u);
}

TEST_P(Polled_Tests, GetsAClearResultForEachPoll) {
  prepare();
  int polls = 0;
  taken().getResults = [&](HBA_WWN wwpn, std::uint32_t id, RM_DiagResult* result) {
    EXPECT_EQ(wwpn.wwn[7], 0xA1);
    EXPECT_EQ(id, 1u);
    const RM_DiagResult clear{};
    EXPECT_EQ(std::memcmp(result, &clear, sizeof clear), 0);
    std::memset(result, 0x5A, sizeof *result);
    const std::uint32_t states[] = {RM_DIAG_QUEUED, RM_DIAG_RUNNING, RM_DIAG_DONE};
    result->state = states[polls++];
    result->result = 0;
    return RM_STATUS{RM_OK};
  };
  expectJob(run(row().name), GOOD, name() + " Resulted with Success");
  EXPECT_EQ(polls, 3);
}

TEST_P(Polled_Tests, OnADisabledPortDoesNothing) {
  build(hostWith(row().port + std::string(R"(, "state": "disabled")")));
  aimAt(TARGET);
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  EXPECT_EQ(tvxsim_calls(row().startCall, nullptr), 0u);
  const std::string blank = name() == SELF_TEST ? "" : " ";
  EXPECT_EQ(log.level("Source HBA port is disabled. Unable to start " + name() + blank), TVX_DBG);
}

TEST_P(Polled_Tests, OnAPortThatCantBeReadGivesTheStatus) {
  prepare();
  addFault(failing("LRM_GetPortAttributes", 149));
  const Ran ran = run(row().name);
  EXPECT_EQ(ran.result, 40149);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("RM_GetPortAttributes command failed. Exited with error code : 149"),
            TVX_DBG);
}

TEST_P(Polled_Tests, ReadsThePortIntoFourKilobytes) {
  prepare();
  std::uint32_t told = 0;
  taken().portAttributes = [&](HBA_WWN wwpn, void*, std::uint32_t* size) {
    EXPECT_EQ(wwpn.wwn[7], 0xA1);
    told = *size;
    return RM_STATUS{RM_ERROR};
  };
  EXPECT_EQ(run(row().name).result, 40001);
  EXPECT_EQ(told, 4096u);
}

TEST_P(Polled_Tests, WithoutMemoryForTheAttributesGivesTheStatus) {
  prepare();
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
  taken().getResults = [&](HBA_WWN, std::uint32_t id, RM_DiagResult* result) {
    EXPECT_EQ(id, 9u);
    const RM_DiagResult clear{};
    EXPECT_EQ(std::memcmp(result, &clear, sizeof clear), 0);
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
  for (const char* text :
       {"Polling for the Cancel status ..: 148", "Polling for the results.. : 62"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Test_Functions, CancelGivesTheLastStatusAfterItsRounds) {
  build();
  taken().cancel = [](HBA_WWN, std::uint32_t) { return RM_STATUS{RM_OK}; };
  taken().getResults = [](HBA_WWN, std::uint32_t, RM_DiagResult*) { return RM_STATUS{62}; };
  const HBA_WWN wwpn{};
  EXPECT_EQ(CancelTest(&wwpn, 9, SELF_TEST), 62);
  EXPECT_EQ(slept(), 122u);
  taken().getResults = [](HBA_WWN, std::uint32_t, RM_DiagResult* result) {
    result->state = RM_DIAG_RUNNING;
    return RM_STATUS{RM_OK};
  };
  EXPECT_EQ(CancelTest(&wwpn, 9, SELF_TEST), 0) << "though it was never seen to be canceled";
  EXPECT_EQ(slept(), 244u);
  EXPECT_EQ(log.count("Canceled the TVX:FCHBA Self Test"), 0u);
}

}  // namespace
}  // namespace cimrt::test
