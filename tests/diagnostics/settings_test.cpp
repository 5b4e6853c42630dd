// What a client may put over the settings of a test, and what stays.
#include "Diagnostics_Fixture.h"
#include "Refused_Calls.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;
using Given = TVXHBA_FCHBADiagnosticSettingData;

constexpr const char* BAD_CONTROL =
    "Invalid LoopControl, Valid value is '3'. Using the default value";
constexpr const char* BAD_PARAMETER =
    "Invalid LoopControlParam, Valid value range[1-4000]. Using the default value";
constexpr const char* BAD_SIZE =
    "Invalid BufferSizes, Valid value is '<8'. Using the default value";
constexpr const char* BAD_PATTERN =
    "Invalid BufferPattern, Use hex values. Using the default value";
constexpr const char* USING =
    "Using the overrided values if valid, else default settings values are used";

class Settings : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
  }
  /// Lays `given` over the settings of its test.
  Given* lay(const Ref<Given>& given) {
    log.clear();
    return TVX_Diagnostics(*agent).getTVXHBA_FCHBADiagnosticSettingDataInstance(
        given.get(), given->InstanceID.value.c_str());
  }
  static std::string pattern(const Given& data) {
    return {data.BufferPattern.value.begin(), data.BufferPattern.value.end()};
  }
  static void setPattern(Given& data, const std::string& bytes) {
    Array<std::uint8_t> array;
    for (const char byte : bytes) array.append(static_cast<std::uint8_t>(byte));
    data.BufferPattern.set(array);
  }
};

TEST_F(Settings, CyclesFromOneToFourThousandAreTaken) {
  const struct {
    const char* text;
    bool taken;
  } rows[] = {{"1", true},   {"4000", true},   {"0004", true},   {"4001", false},
              {"0", false},  {"12345", false}, {"abc", false},   {"", false},
              {"-5", false}, {"12a", false},   {"00001", false}, {"9999", false}};
  for (const auto& row : rows) {
    settings(HOST_LOOPBACK_TEST)->LoopControlParameter.set({"100"});
    Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
    given->LoopControlParameter.set({row.text});
    Given* laid = lay(given);
    ASSERT_EQ(laid, settings(HOST_LOOPBACK_TEST));
    EXPECT_EQ(textsOf(laid->LoopControlParameter), Texts{row.taken ? row.text : "100"});
    EXPECT_EQ(log.count(std::string("Input LoopControlParam : ") + row.text), 2u);
    EXPECT_EQ(log.count(BAD_PARAMETER), row.taken ? 0u : 2u) << row.text;
    EXPECT_EQ(numberOf(laid->OverridedSettingData), 1);
  }
}

TEST_F(Settings, LoopControlMustBeThree) {
  for (const std::uint16_t value : {std::uint16_t{3}, std::uint16_t{2}}) {
    Ref<Given> given = givenFor(ECHO_TEST);
    given->LoopControl.set({value, 9});
    Given* laid = lay(given);
    EXPECT_EQ(numbersOf(laid->LoopControl), std::vector<std::uint16_t>{3});
    EXPECT_EQ(log.count("Input LoopControl : " + std::to_string(value)), 2u);
    EXPECT_EQ(log.count(BAD_CONTROL), value == 3 ? 0u : 2u);
  }
}

TEST_F(Settings, BufferSizesUpToEightAreTaken) {
  const struct {
    std::uint32_t size;
    bool taken;
  } rows[] = {{0, true}, {4, true}, {8, true}, {9, false}, {0xFFFFFFFF, false}};
  for (const auto& row : rows) {
    settings(HOST_LOOPBACK_TEST)->BufferSizes.set({8});
    Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
    given->BufferSizes.set({row.size});
    EXPECT_EQ(numbersOf(lay(given)->BufferSizes),
              std::vector<std::uint32_t>{row.taken ? row.size : 8});
    EXPECT_EQ(log.count("Input Buffer Size : " + std::to_string(static_cast<int>(row.size))), 2u);
    EXPECT_EQ(log.count(BAD_SIZE), row.taken ? 0u : 2u) << row.size;
  }
}

TEST_F(Settings, PatternIsCutOrPaddedToTheBuffer) {
  const struct {
    std::uint32_t size;
    std::string given;
    std::string stored;
  } rows[] = {{8, "1a2", std::string("1a2\0\0\0\0\0", 8)},
              {8, "00FFaa99", "00FFaa99"},
              {4, "12345678", "1234"},
              {1, "F", "F"}};
  for (const auto& row : rows) {
    Ref<Given> given = givenFor(INTERNAL_LOOPBACK_TEST);
    given->BufferSizes.set({row.size});
    setPattern(*given, row.given);
    EXPECT_EQ(pattern(*lay(given)), row.stored);
    EXPECT_EQ(log.count("Valid Pattern entered"), 2u);
    EXPECT_EQ(log.level("Valid Pattern entered"), TVX_DBG);
    EXPECT_EQ(log.count(BAD_PATTERN), 0u);
  }
}

TEST_F(Settings, PatternMustBeHexadecimalAndHaveRoom) {
  for (const char* bytes : {"xyz", "12g4", "", "1 2"}) {
    Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
    setPattern(*given, bytes);
    EXPECT_EQ(pattern(*lay(given)), "1a2b3c4d") << bytes;
    EXPECT_EQ(log.count(BAD_PATTERN), 2u) << bytes;
    EXPECT_EQ(log.count("Valid Pattern entered"), 0u);
  }
  Ref<Given> noRoom = givenFor(HOST_LOOPBACK_TEST);
  noRoom->BufferSizes.set({0});
  setPattern(*noRoom, "12");
  EXPECT_EQ(pattern(*lay(noRoom)), "1a2b3c4d");
  EXPECT_EQ(log.count(BAD_PATTERN), 2u);
}

TEST_F(Settings, EmptyArraysAreRefused) {
  Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
  given->LoopControl.set(Array<std::uint16_t>());
  given->LoopControlParameter.set(Array<String>());
  given->BufferSizes.set(Array<std::uint32_t>());
  Given* laid = lay(given);
  for (const char* text : {BAD_CONTROL, BAD_PARAMETER, BAD_SIZE}) EXPECT_EQ(log.count(text), 2u);
  EXPECT_EQ(numbersOf(laid->BufferSizes), std::vector<std::uint32_t>{8});
}

TEST_F(Settings, ChecksRunTwiceInTheirOrder) {
  Ref<Given> given = givenFor(EXTERNAL_LOOPBACK_TEST);
  given->LoopControl.set({1});
  given->LoopControlParameter.set({"x"});
  given->BufferSizes.set({99});
  setPattern(*given, "?");
  lay(given);
  const Texts once = {"Input LoopControl : 1",
                      BAD_CONTROL,
                      "Input LoopControlParam : x",
                      BAD_PARAMETER,
                      "Input Buffer Size : 99",
                      BAD_SIZE,
                      BAD_PATTERN};
  Texts twice = once;
  twice.insert(twice.end(), once.begin(), once.end());
  EXPECT_EQ(log.only(once), twice);
  for (const std::string& text : once) EXPECT_EQ(log.level(text), TVX_DBG);
}

/// The tests that send a pattern take all of it; no test takes more.
constexpr const char* SENDING[] = {EXTERNAL_LOOPBACK_TEST, HOST_LOOPBACK_TEST,
                                   INTERNAL_LOOPBACK_TEST, PING_TEST, ECHO_TEST};

TEST_F(Settings, EachTestThatSendsTakesAllThatIsValid) {
  for (const char* name : SENDING) {
    Ref<Given> given = givenFor(name);
    given->LoopControl.set({3});
    given->LoopControlParameter.set({"77"});
    given->HaltOnError.set(true);
    given->BufferSizes.set({4});
    setPattern(*given, "cafe");
    settings(name)->LoopControl.set({2});
    Given* laid = lay(given);
    ASSERT_EQ(laid, settings(name));
    EXPECT_EQ(numbersOf(laid->LoopControl), std::vector<std::uint16_t>{3}) << name;
    EXPECT_EQ(textsOf(laid->LoopControlParameter), Texts{"77"}) << name;
    EXPECT_EQ(numberOf(laid->HaltOnError), 1) << name;
    EXPECT_EQ(numbersOf(laid->BufferSizes), std::vector<std::uint32_t>{4}) << name;
    EXPECT_EQ(pattern(*laid), "cafe") << name;
    EXPECT_EQ(numberOf(laid->OverridedSettingData), 1) << name;
    const Texts once = {"Input LoopControl : 3", "Input LoopControlParam : 77",
                        "Input Buffer Size : 4", "Valid Pattern entered"};
    Texts twice = once;
    twice.insert(twice.end(), once.begin(), once.end());
    EXPECT_EQ(log.only(once), twice) << name;
    for (const std::string& text : once) EXPECT_EQ(log.level(text), TVX_DBG) << text;
    for (const char* text : {BAD_CONTROL, BAD_PARAMETER, BAD_SIZE, BAD_PATTERN})
      EXPECT_EQ(log.count(text), 0u) << name << text;
  }
}

TEST_F(Settings, EachTestThatSendsKeepsItsOwnForAllThatIsNot) {
  for (const char* name : SENDING) {
    Ref<Given> given = givenFor(name);
    given->LoopControl.set({4});
    given->LoopControlParameter.set({"4001"});
    given->BufferSizes.set({9});
    setPattern(*given, "xyz");
    Given* laid = lay(given);
    EXPECT_EQ(numbersOf(laid->LoopControl), std::vector<std::uint16_t>{3}) << name;
    EXPECT_EQ(textsOf(laid->LoopControlParameter), Texts{"100"}) << name;
    EXPECT_EQ(numberOf(laid->HaltOnError), 0) << name;
    EXPECT_EQ(numbersOf(laid->BufferSizes), std::vector<std::uint32_t>{8}) << name;
    EXPECT_EQ(pattern(*laid), "1a2b3c4d") << name;
    EXPECT_EQ(numberOf(laid->OverridedSettingData), 1) << name;
    for (const char* text : {BAD_CONTROL, BAD_PARAMETER, BAD_SIZE, BAD_PATTERN})
      EXPECT_EQ(log.count(text), 2u) << name << text;
  }
}

TEST_F(Settings, HaltOnErrorIsTakenAsItIs) {
  Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
  given->HaltOnError.set(true);
  EXPECT_EQ(numberOf(lay(given)->HaltOnError), 1);
  given->HaltOnError.set(false);
  EXPECT_EQ(numberOf(lay(given)->HaltOnError), 0);
}

TEST_F(Settings, WhatIsNotGivenStaysAndIsNotTold) {
  Given* laid = lay(givenFor(HOST_LOOPBACK_TEST));
  EXPECT_EQ(textsOf(laid->LoopControlParameter), Texts{"100"});
  EXPECT_EQ(numberOf(laid->OverridedSettingData), 1);
  EXPECT_EQ(log.only({"getTVXHBA_FCHBADiagnosticSettingDataInstance", USING}),
            (Texts{"getTVXHBA_FCHBADiagnosticSettingDataInstance", USING}));
  EXPECT_EQ(log.all().size(), 4u) << "with constructor and destructor";
}

TEST_F(Settings, TestsWithoutOverridesTellSo) {
  for (const char* name : {STATUS_TEST, RESET_TEST, SELF_TEST}) {
    Ref<Given> given = givenFor(name);
    given->LoopControlParameter.set({"5"});
    given->HaltOnError.set(true);
    Given* laid = lay(given);
    ASSERT_EQ(laid, settings(name));
    EXPECT_EQ(log.level(std::string("No Override Setting Supported for test : ") + name), TVX_DBG);
    EXPECT_TRUE(laid->LoopControlParameter.is_null());
    EXPECT_EQ(numberOf(laid->HaltOnError), 0);
    EXPECT_EQ(numberOf(laid->OverridedSettingData), 0);
    laid->OverridedSettingData.set(1);
    EXPECT_EQ(numberOf(lay(given)->OverridedSettingData), 1) << "left as it is";
  }
}

TEST_F(Settings, BeaconOnlyNotesThatThereWereSome) {
  Ref<Given> given = givenFor(BEACON_TEST);
  given->LoopControlParameter.set({"9"});
  Given* laid = lay(given);
  EXPECT_EQ(numberOf(laid->OverridedSettingData), 1);
  EXPECT_EQ(textsOf(laid->LoopControlParameter), Texts{"5"});
  EXPECT_EQ(log.count("Input LoopControlParam : 9"), 0u);
}

TEST_F(Settings, EchoAndPingTakeUnitAndTarget) {
  for (const char* name : {ECHO_TEST, PING_TEST}) {
    Ref<Given> given = givenFor(name);
    given->LUN.set(4);
    given->TargetDevice.set(TARGET);
    Given* laid = lay(given);
    EXPECT_EQ(numberOf(laid->LUN), 4);
    EXPECT_EQ(textOf(laid->TargetDevice), TARGET);
    EXPECT_EQ(log.level("Checking the Echo test targetdevice"), TVX_DBG);
    EXPECT_EQ(log.level(std::string("Input TargetDevice : ") + TARGET), TVX_DBG);
    EXPECT_EQ(log.count("Invalid LUN, Using the default value '0' "), 0u);
    EXPECT_EQ(numberOf(laid->OverridedSettingData), 1);
  }
}

TEST_F(Settings, TargetsOfAnotherLengthLeaveTheOldOne) {
  settings(ECHO_TEST)->TargetDevice.set(TARGET);
  for (const char* text : {"", "5006", "50:06:00:00:00:00:00:B1", "50060000000000B10"}) {
    Ref<Given> given = givenFor(ECHO_TEST);
    given->TargetDevice.set(text);
    EXPECT_EQ(textOf(lay(given)->TargetDevice), TARGET) << text;
    EXPECT_EQ(log.count(std::string("Input TargetDevice : ") + text), 1u);
  }
}

TEST_F(Settings, TargetThatIsNoNameEmptiesTheOldOne) {
  const char* text = "getTVXHBA_FCHBADiagnosticSettingDataInstance::Id2HBAName failed";
  const Refused_Calls refused([](const char* id) { return std::string(id) == TARGET; });
  for (const char* name : {ECHO_TEST, PING_TEST}) {
    settings(name)->TargetDevice.set("50060000000000C1");
    Ref<Given> given = givenFor(name);
    given->TargetDevice.set(TARGET);
    EXPECT_EQ(textOf(lay(given)->TargetDevice), "");
    EXPECT_EQ(log.level(text), TVX_DBG);
    EXPECT_EQ(numberOf(settings(name)->OverridedSettingData), 1);
  }
}

TEST_F(Settings, MissingUnitIsTold) {
  settings(PING_TEST)->LUN.set(6);
  EXPECT_EQ(numberOf(lay(givenFor(PING_TEST))->LUN), 6);
  EXPECT_EQ(log.level("Invalid LUN, Using the default value '0' "), TVX_DBG);
  EXPECT_EQ(log.count("Input TargetDevice : "), 0u);
}

TEST_F(Settings, LoopbacksHaveNoTarget) {
  Ref<Given> given = givenFor(HOST_LOOPBACK_TEST);
  given->TargetDevice.set(TARGET);
  EXPECT_TRUE(lay(given)->TargetDevice.is_null());
  EXPECT_EQ(log.count("Checking the Echo test targetdevice"), 0u);
}

TEST_F(Settings, SettingsOfAnotherTestOrClassAreRefused) {
  TVX_Diagnostics diagnostics(*agent);
  const Ref<Given> other = givenFor(ECHO_TEST);
  EXPECT_EQ(diagnostics.getTVXHBA_FCHBADiagnosticSettingDataInstance(other.get(), PING_TEST),
            nullptr);
  EXPECT_EQ(log.count(USING), 0u);
  const char* invalid = "Invalid overrided Diagsetting param, default settings values are used";
  EXPECT_EQ(diagnostics.getTVXHBA_FCHBADiagnosticSettingDataInstance(nullptr, PING_TEST), nullptr);
  EXPECT_EQ(
      diagnostics.getTVXHBA_FCHBADiagnosticSettingDataInstance(givenForJobs().get(), PING_TEST),
      nullptr);
  EXPECT_EQ(log.count(invalid), 2u);
  EXPECT_EQ(log.level(invalid), TVX_DBG);
}

TEST_F(Settings, TestsWithoutSettingsHaveNoDefault) {
  TVX_Diagnostics diagnostics(*agent);
  EXPECT_EQ(diagnostics.getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance("no test"), nullptr);
  EXPECT_EQ(log.level("Could not find the default setting data"), TVX_DBG);
  EXPECT_EQ(diagnostics.getTVXHBA_FCHBADiagnosticSettingDataInstance(givenFor("no test").get(),
                                                                     "no test"),
            nullptr);
  EXPECT_EQ(log.level(USING), TVX_DBG) << "there is no name that it could differ from";
  EXPECT_EQ(diagnostics.getDefaultTVXHBA_FCHBADiagnosticSettingDataInstance(SELF_TEST),
            settings(SELF_TEST));
}

TEST_F(Settings, OverridesOfATestWithoutADefaultGoNowhere) {
  agent->m_TVXHBA_FCHBADiagnosticSettingData_map.clear();
  for (const Diagnostic_Row& row : diagnosticTests()) {
    Ref<Given> given = givenFor(row.name);
    given->LoopControl.set({3});
    EXPECT_EQ(lay(given), nullptr) << row.name;
    EXPECT_EQ(log.count("Could not find the default setting data"), 1u);
    EXPECT_EQ(log.count(USING), 1u);
    const bool takesNone = row.number >= Diagnostic_Test::RESET;
    EXPECT_EQ(log.count(std::string("No Override Setting Supported for test : ") + row.name),
              takesNone ? 1u : 0u);
  }
}

TEST_F(Settings, JobSettingsAreTakenForAllTests) {
  TVX_Diagnostics diagnostics(*agent);
  TVXHBA_JobSettingData* shared = agent->m_TVXHBA_JobSettingData_map[0];
  EXPECT_EQ(diagnostics.getDefaultTVXHBA_JobSettingDataInstance(SELF_TEST), shared);
  Ref<TVXHBA_JobSettingData> given = givenForJobs();
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(given.get(), SELF_TEST), shared);
  EXPECT_TRUE(shared->DeleteOnCompletion.is_null());
  EXPECT_EQ(log.level("Missing DeleteOnCompletion parameter, Valid values are 1 or 0. Using the "
                      "default value"),
            TVX_DBG);
  EXPECT_EQ(log.level(USING), TVX_DBG);
  for (const bool wanted : {true, false}) {
    given->DeleteOnCompletion.set(wanted);
    EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(given.get(), PING_TEST), shared);
    EXPECT_EQ(numberOf(shared->DeleteOnCompletion), wanted);
  }
}

TEST_F(Settings, JobSettingsOfAnotherNameOrClassAreRefused) {
  TVX_Diagnostics diagnostics(*agent);
  Ref<TVXHBA_JobSettingData> given = givenForJobs();
  given->InstanceID.set("another");
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(given.get(), SELF_TEST), nullptr);
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(nullptr, SELF_TEST), nullptr);
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(givenFor(SELF_TEST).get(), SELF_TEST),
            nullptr);
  EXPECT_EQ(log.count(USING), 0u);
  agent->m_TVXHBA_JobSettingData_map.clear();
  EXPECT_EQ(diagnostics.getDefaultTVXHBA_JobSettingDataInstance(SELF_TEST), nullptr);
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(givenForJobs().get(), SELF_TEST), nullptr);
  given->DeleteOnCompletion.set(true);
  EXPECT_EQ(diagnostics.getTVXHBA_JobSettingDataInstance(given.get(), SELF_TEST), nullptr);
  EXPECT_EQ(log.count(USING), 2u) << "there is no name that they could differ from";
}

}  // namespace
}  // namespace cimrt::test
