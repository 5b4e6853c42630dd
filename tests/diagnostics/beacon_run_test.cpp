// The test that flashes the lights of a port, and the words for what the library answers.
#include "Test_Functions_Fixture.h"

namespace cimrt::test {
namespace {

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

TEST_F(Beacon_Test, SwitchesOnAndOffEachSecondAndThenAsItWas) {
  build();
  for (const std::uint32_t before : {0u, 2u, 3u, 9u}) {
    const std::uint64_t start = slept();
    std::vector<std::uint64_t> switches;  // seconds * 10 + state
    taken().beaconState = [&](HBA_WWN wwpn, std::uint32_t* state) {
      EXPECT_EQ(wwpn.wwn[7], 0xA1);
      *state = before;
      return RM_STATUS{RM_OK};
    };
    taken().beacon = [&](HBA_WWN wwpn, std::uint32_t state) {
      EXPECT_EQ(wwpn.wwn[7], 0xA1);
      switches.push_back((slept() - start) * 10 + state);
      return RM_STATUS{RM_OK};
    };
    std::vector<std::uint64_t> expected;
    for (std::uint64_t second = 0; second < 40; second++)
      expected.push_back(second * 10 + (second % 2 == 0 ? 3 : 2));
    expected.push_back(400 + before);
    EXPECT_EQ(run(BEACON_TEST).result, 0);
    EXPECT_EQ(switches, expected);
  }
}

TEST_F(Beacon_Test, ThatCantBeDrivenLeavesNothing) {
  build(hostWith(R"(, "beacon": "not available")"));
  const Ran ran = run(BEACON_TEST);
  EXPECT_EQ(ran.result, 0);
  expectNothingLeft(ran);
  const Texts told = {"Beacon state Not Available. Beaconing not set", failure(0)};
  EXPECT_EQ(log.only(told), told);
  for (const std::string& text : told) EXPECT_EQ(log.level(text), TVX_DBG);
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
  EXPECT_EQ(log.level("TVX_DiagTestFunc::MapDiagStatus"), TVX_DBG);
}

}  // namespace
}  // namespace cimrt::test
