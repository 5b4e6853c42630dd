// The tests themselves: what they ask the library, and what they make of its answers.
#include "Refused_Calls.h"
#include "Test_Functions_Fixture.h"

namespace cimrt::test {
namespace {

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
  Texts told;
  for (const char* name : {HOST_LOOPBACK_TEST, INTERNAL_LOOPBACK_TEST, EXTERNAL_LOOPBACK_TEST})
    told.insert(told.end(),
                {name, "Number of test cycles set to run : 250 ", "HaltOnError value : 1 ",
                 "The Input pattern used for testing 1a2b3c4d"});
  EXPECT_EQ(log.only(told), told);
  for (const std::string& text : told) EXPECT_EQ(log.level(text), TVX_DBG) << text;
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
  const std::string noFabric = R"("fabric_name": "0000000000000000")";
  Texts ports = {R"("type": "n", )" + noFabric, R"("type": 19, )" + noFabric,
                 R"("type": 22, )" + noFabric,
                 R"("type": "loop", )" + noFabric +
                     R"(, "targets": [{"wwpn": "50060000000000B1", "luns": {"count": 1}}])",
                 R"("type": "loop", "fabric_name": "100000054D5A8001")"};
  for (std::size_t digit = 0; digit < 16; digit += 2) {
    std::string fabric(16, '0');
    fabric[digit + digit / 2 % 2] = '1';
    ports.push_back(R"("type": "point to point", "fabric_name": ")" + fabric + '"');
  }
  for (const std::string& port : ports) {
    build(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", )" + port + "}]}]}");
    const Ran ran = run(EXTERNAL_LOOPBACK_TEST);
    EXPECT_EQ(ran.result, 40001) << port;
    expectNothingLeft(ran);
    EXPECT_EQ(log.level(NO_PLUG), TVX_DBG) << port;
    EXPECT_EQ(tvxsim_calls("LRM_DiagLoopBackTestV3", nullptr), 0u) << port;
  }
}

TEST_F(Test_Functions, ThePlugIsLookedForAfterASecondAndWithRoomForOneTarget) {
  build();
  std::uint32_t room = 0;
  taken().targetMapping = [&](HBA_WWN wwpn, HBA_FCPTARGETMAPPING* mapping) {
    EXPECT_EQ(wwpn.wwn[7], 0xA2);
    room = mapping->NumberOfEntries;
    mapping->NumberOfEntries = 1;
    return RM_STATUS{RM_OK};
  };
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST, nullptr, nullptr, PLUGGED_PORT).result, 40001);
  EXPECT_EQ(room, 1u);
  const std::uint64_t start = slept();
  std::vector<std::uint64_t> readAt;
  taken().portAttributes = [&](HBA_WWN, void*, std::uint32_t* size) {
    readAt.push_back(slept() - start);
    EXPECT_EQ(*size, 4096u);
    return RM_STATUS{RM_OK};
  };
  EXPECT_EQ(run(EXTERNAL_LOOPBACK_TEST, nullptr, nullptr, PLUGGED_PORT).result, 40001)
      << "a port that tells nothing of itself";
  EXPECT_EQ(readAt, (std::vector<std::uint64_t>{0, 1}));
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

TEST_F(Test_Functions, EchoAndPingToATargetThatCantBeConvertedFail) {
  build();
  aimAt(TARGET);
  const Refused_Calls refused([](const char* id) { return std::string(id) == TARGET; });
  for (const char* name : {ECHO_TEST, PING_TEST}) {
    log.clear();
    const Ran ran = run(name);
    EXPECT_EQ(ran.result, 40001);
    expectNothingLeft(ran);
    EXPECT_EQ(log.level("TVX_Diagnostics::EchoTest::Id2HBAName failed"), TVX_DBG);
  }
  EXPECT_EQ(tvxsim_calls("LRM_DiagEchoTestV2", nullptr), 0u);
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
  const char* text =
      "Adapter Busy: Another critical application may be running , Exited with error code : 64";
  EXPECT_EQ(log.count(text), 1u);
  EXPECT_EQ(log.level(text), TVX_DBG);
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
    EXPECT_EQ(log.level("Diagnostics not available/Port not supported , Exited with error code : " +
                        std::to_string(status)),
              TVX_DBG);
    EXPECT_EQ(tvxsim_calls(row().call, FIRST_PORT), 1u);
    tvxsim_forget_calls();
  }
}

TEST_P(Tests_Without_Polls, FailWithAJobAndAStatus) {
  for (const int status : {1, 3, 60, 62, 148}) {
    tvxsim_clear_faults();
    addFault(failing(row().call, status));
    const Ran ran = run(row().name);
    EXPECT_EQ(ran.result, 40000 + status);
    expectJob(ran, BAD,
              name() + " Resulted with Failure, Exited with error code " + std::to_string(status));
    EXPECT_EQ(log.level(name() + " Failed to Run"), TVX_DBG);
  }
}

TEST_P(Tests_Without_Polls, HaveRecordsWithoutCounts) {
  run(row().name);
  EXPECT_EQ(numberOf(lastServiceRecord().LoopsPassed), 0);
  EXPECT_TRUE(lastServiceRecord().CompletedCycles.is_null());
  EXPECT_EQ(numberOf(lastCompletionRecord().LoopsFailed), 0);
  EXPECT_TRUE(lastCompletionRecord().TimeToExecute.is_null());
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

TEST_F(Test_Functions, StatusTestReadsIntoTwoKilobytes) {
  build();
  std::uint32_t told = 0;
  taken().portAttributes = [&](HBA_WWN wwpn, void*, std::uint32_t* size) {
    EXPECT_EQ(wwpn.wwn[7], 0xA1);
    told = *size;
    return RM_STATUS{RM_OK};
  };
  EXPECT_EQ(run(STATUS_TEST).result, 0);
  EXPECT_EQ(told, 2048u);
}

TEST_F(Test_Functions, StatusTestNeedsMemory) {
  build();
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  const Ran ran = run(STATUS_TEST);
  EXPECT_EQ(ran.result, 40008);
  expectNothingLeft(ran);
  EXPECT_EQ(log.level("ERROR: GetPHYPortAttributeValues: Unable to allocate buffer"), TVX_DBG);
}

}  // namespace
}  // namespace cimrt::test
