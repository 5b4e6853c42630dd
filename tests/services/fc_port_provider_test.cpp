// The provider of FC ports and its beacon; what active classes answer without their libraries.
#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "../agent/Lock_Witness.h"
#include "access/TVX_MethodWrapper.h"
#include "services/TVXHBA_DriverParamGlobal_Provider.h"
#include "services/TVXHBA_DriverParams_Provider.h"
#include "services/TVXHBA_FCPortStatistics_Provider.h"
#include "services/TVXHBA_FCPort_Provider.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr const char* PORT = "10000000000000A1";

class FC_Port_Provider : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& beacon = "off") {
    useScenario(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", "beacon": ")" + beacon +
                R"("}]}]})");
    ProviderAgent& ready = startAgent();
    refresh(ready);
    agent = &ready;
    log.clear();
    return ready;
  }
  TVXHBA_FCPort& entry() { return *agent->m_TVXHBA_FCPort_map[0]; }
  /// Asks for the indicator on a clone of the port's entry.
  std::int32_t modify(std::uint16_t indicator) {
    const Ref<TVXHBA_FCPort> wanted(static_cast<TVXHBA_FCPort*>(clone(&entry())));
    wanted->LocationIndicator.set(indicator);
    return TVXHBA_FCPort_Provider().modify_instance(wanted.get(), wanted.get());
  }
  std::uint32_t beacon() {
    HBA_WWN wwpn{};
    TVX_MethodWrapper::string2HBAName(&wwpn, PORT);
    std::uint32_t state = 0;
    EXPECT_EQ(LRM_DiagBeaconState(wwpn, &state), 0);
    return state;
  }
  ProviderAgent* agent = nullptr;
};

TEST_F(FC_Port_Provider, TellsItsNameAndDeliversThePorts) {
  build();
  Delivered got;
  EXPECT_EQ(TVXHBA_FCPort_Provider().enum_instances(nullptr, got.handler()), 0);
  EXPECT_EQ(got.size(), 1u);
  EXPECT_EQ(log.level("TVXHBA_FCPort_Provider::enum_instances()"), TVX_DBG);
  EXPECT_EQ(log.level("PERF: UpdateFCPortStatus: Entry"), TVX_DBG);
  Delivered statistics;
  EXPECT_EQ(TVXHBA_FCPortStatistics_Provider().enum_instances(nullptr, statistics.handler()), 0);
  EXPECT_EQ(statistics.size(), 1u);
  EXPECT_EQ(log.level("TVXHBA_FCPortStatistics_Provider::enum_instances()"), TVX_DBG);
  EXPECT_EQ(log.level("PERF: GetFCPortStats: Entry"), TVX_DBG);
}

TEST_F(FC_Port_Provider, ActiveClassesAreEmptyWithoutTheLibraries) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  ProviderAgent& idle = startAgent();
  ASSERT_FALSE(idle.isLoaded());
  Delivered got;
  EXPECT_EQ(TVXHBA_FCPort_Provider().enum_instances(nullptr, got.handler()), 0);
  EXPECT_EQ(TVXHBA_FCPortStatistics_Provider().enum_instances(nullptr, got.handler()), 0);
  EXPECT_EQ(TVXHBA_DriverParams_Provider().enum_instances(nullptr, got.handler()), 0);
  EXPECT_EQ(TVXHBA_DriverParamGlobal_Provider().enum_instances(nullptr, got.handler()), 0);
  EXPECT_EQ(got.size(), 0u);
  for (const char* text : {"RM Init failed for TVXHBA_FCPort_Provider.cpp",
                           "RM Init failed for TVXHBA_FCPortStatistics_Provider.cpp",
                           "RM Init failed for TVXHBA_DriverParams_Provider.cpp",
                           "RM Init failed for TVXHBA_DriverParamGlobal_Provider.cpp"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
  EXPECT_EQ(log.count(" Entering BuildCimrtInfo()"), 0u);
}

// --- The beacon as it is built

TEST_F(FC_Port_Provider, IndicatorFollowsTheBeacon) {
  EXPECT_EQ(numberOf(build("off").m_TVXHBA_FCPort_map[0]->LocationIndicator), 3);
  stopAgent();
  EXPECT_EQ(numberOf(build("on").m_TVXHBA_FCPort_map[0]->LocationIndicator), 2);
  stopAgent();
  EXPECT_EQ(numberOf(build("not available").m_TVXHBA_FCPort_map[0]->LocationIndicator), 0);
}

TEST_F(FC_Port_Provider, FailedReadsOfTheBeaconHaveTheirIndicators) {
  build("on");
  const struct {
    int status;
    std::uint16_t indicator;
    const char* text;
  } rows[] = {{2, 4, "Beaconing not supported on host or adapter"},
              {63, 4, "Diagnostics not available"},
              {1, 0, "Unable to get the beacon state"},
              {148, 0, "Unable to get the beacon state"}};
  for (const auto& row : rows) {
    addFault(R"({"call": "LRM_DiagBeaconState", "status": )" + std::to_string(row.status) + "}");
    std::uint16_t indicator = 77;
    EXPECT_EQ(TVX_MethodWrapper::GetBeaconState(PORT, &indicator), 0);
    EXPECT_EQ(indicator, row.indicator) << row.status;
    EXPECT_EQ(log.level(row.text), TVX_DBG) << row.text;
    tvxsim_clear_faults();
  }
}

TEST_F(FC_Port_Provider, BeaconNeedsAPlaceToGoAndAName) {
  build();
  std::uint16_t indicator = 77;
  EXPECT_EQ(TVX_MethodWrapper::GetBeaconState(PORT, nullptr), 0x80C8);
  EXPECT_EQ(log.level("INVALID Parameter"), TVX_DBG);
  EXPECT_EQ(TVX_MethodWrapper::GetBeaconState(nullptr, &indicator), 0x80C8);
  EXPECT_EQ(log.level("Id2HBAName failed"), TVX_ERR);
  EXPECT_EQ(TVX_MethodWrapper::GetBeaconState("short", &indicator), 0x80C8);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(indicator, 77);
}

// --- Switching it

TEST_F(FC_Port_Provider, BeaconIsSwitchedAndKept) {
  build();
  EXPECT_EQ(modify(2), 0);
  EXPECT_EQ(log.all().at(0).text, " Entering BuildCimrtInfo()");
  EXPECT_EQ(beacon(), 3u);
  EXPECT_EQ(numberOf(entry().LocationIndicator), 2);
  EXPECT_EQ(modify(3), 0);
  EXPECT_EQ(beacon(), 2u);
  EXPECT_EQ(numberOf(entry().LocationIndicator), 3);
  const std::vector<std::string> steps = {
      "TVXHBA_FCPort_Provider::modify_instance", "Input BeaconState : 2",
      "TVX_DiagTestFunc::SetBeaconState", "Successfully set the beacon state",
      "Beacon state modified successfully"};
  for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG) << step;
  const std::vector<std::string> first = log.only(steps);
  ASSERT_EQ(first.size(), 9u);
  EXPECT_TRUE(std::equal(steps.begin(), steps.end(), first.begin()));
}

TEST_F(FC_Port_Provider, IndicatorIsKeptThoughTheHardwareFails) {
  build();
  addFault(R"({"call": "LRM_DiagBeacon", "status": 63})");
  EXPECT_EQ(modify(2), 0);
  EXPECT_EQ(beacon(), 2u);
  EXPECT_EQ(numberOf(entry().LocationIndicator), 2);
  EXPECT_EQ(log.level("Failed to set the beacon state to 3 "), TVX_DBG);
}

#ifndef NDEBUG  // locks are only booked in debug builds
TEST_F(FC_Port_Provider, BeaconIsSwitchedUnderTheDataLock) {
  build();
  Lock_Witness witness("TVX_DiagTestFunc::SetBeaconState");
  EXPECT_EQ(modify(2), 0);
  EXPECT_TRUE(witness.wasHeld);
}
#endif

TEST_F(FC_Port_Provider, OtherIndicatorsAreRefused) {
  build();
  for (const int indicator : {0, 1, 4, 65535}) {
    log.clear();
    EXPECT_EQ(modify(static_cast<std::uint16_t>(indicator)), 102) << indicator;
    EXPECT_EQ(log.count("Input BeaconState : " + std::to_string(indicator)), 1u);
    EXPECT_EQ(log.level("Invalid LocationIndicator, Valid values are '2' or '3'"), TVX_DBG);
  }
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", nullptr), 0u);
  HBA_WWN wwpn{};
  EXPECT_EQ(TVX_MethodWrapper::SetBeaconState(wwpn, 4), 0x80C8);
}

TEST_F(FC_Port_Provider, MissingArgumentsAreRefused) {
  build();
  TVXHBA_FCPort_Provider provider;
  EXPECT_EQ(provider.modify_instance(nullptr, &entry()), 102);
  EXPECT_EQ(provider.modify_instance(&entry(), nullptr), 102);
  EXPECT_EQ(log.count("TVXHBA_FCPort_Provider::modify_instance invalid parameter"), 2u);
  EXPECT_EQ(log.level("TVXHBA_FCPort_Provider::modify_instance invalid parameter"), TVX_DBG);
}

TEST_F(FC_Port_Provider, UnknownPortIsRefused) {
  build();
  const Ref<TVXHBA_FCPort> other(static_cast<TVXHBA_FCPort*>(clone(&entry())));
  other->DeviceID.set("10000000000000FF");
  other->LocationIndicator.set(2);
  EXPECT_EQ(TVXHBA_FCPort_Provider().modify_instance(other.get(), other.get()), 102);
  EXPECT_EQ(log.level("Invalid instance of TVXHBA_FCPort Data"), TVX_DBG);
}

TEST_F(FC_Port_Provider, PropertyThatIsNotMarkedIsNotChanged) {
  build();
  const Ref<TVXHBA_FCPort> model(static_cast<TVXHBA_FCPort*>(clone(&entry())));
  nullify_non_keys(model.get());
  const Ref<TVXHBA_FCPort> wanted(static_cast<TVXHBA_FCPort*>(clone(&entry())));
  wanted->LocationIndicator.set(2);
  EXPECT_EQ(TVXHBA_FCPort_Provider().modify_instance(model.get(), wanted.get()), 102);
  EXPECT_EQ(beacon(), 2u);
}

TEST_F(FC_Port_Provider, EmptyMapKnowsEveryPortAndKeepsNone) {
  build();
  const Ref<TVXHBA_FCPort> wanted(static_cast<TVXHBA_FCPort*>(clone(&entry())));
  wanted->LocationIndicator.set(2);
  agent->m_TVXHBA_FCPort_map.clear();
  EXPECT_EQ(TVXHBA_FCPort_Provider().modify_instance(wanted.get(), wanted.get()), 104);
  EXPECT_EQ(beacon(), 3u);
  EXPECT_EQ(log.count("Beacon state modified successfully"), 0u);
  wanted->DeviceID.set("nonsense");
  EXPECT_EQ(TVXHBA_FCPort_Provider().modify_instance(wanted.get(), wanted.get()), 104);
  EXPECT_EQ(log.level("TVXHBA_FCPort_Provider::::str2HBAName failed"), TVX_DBG);
  wanted->DeviceID.null = 1;
  EXPECT_EQ(TVXHBA_FCPort_Provider().modify_instance(wanted.get(), wanted.get()), 104);
  EXPECT_EQ(log.level("TVXHBA_FCPort_Provider::Id2HBAName failed"), TVX_DBG);
}

}  // namespace
}  // namespace cimrt::test
