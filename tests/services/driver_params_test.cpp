// The driver's parameters as instances, built with the maps.
#include "Driver_Params_Test.h"

#include <vector>

#include "agent/LiveStatus.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"

namespace cimrt::test {
namespace {

TEST_F(Driver_Params, ParameterOfAPortHasTheValuesOfItsRecord) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 3u);
  const TVXHBA_DriverParams& first = *agent.m_TVXHBA_DriverParams_map[0];
  EXPECT_EQ(textOf(first.InstanceID), "10000000000000A1:depth");
  EXPECT_EQ(textOf(first.deviceID), "10000000000000a1");
  EXPECT_EQ(textOf(first.paramname), "depth");
  EXPECT_EQ(numberOf(first.paramno), 0);
  EXPECT_EQ(numberOf(first.lowRange), 1);
  EXPECT_EQ(numberOf(first.highRange), 512);
  EXPECT_EQ(numberOf(first.def), 30);
  EXPECT_EQ(numberOf(first.current), 31);
  EXPECT_EQ(numberOf(first.exportFlag), 2);
  EXPECT_EQ(numberOf(first.dynamic), 3);
  EXPECT_EQ(textOf(first.help), "Commands for each unit");
  EXPECT_TRUE(first.Option.is_null());
  EXPECT_TRUE(first.ElementName.is_null());
  EXPECT_TRUE(first.ConfigurationName.is_null());
  EXPECT_TRUE(first.__name_space == "root/torvex");
  EXPECT_EQ(numberOf(agent.m_TVXHBA_DriverParams_map[1]->paramno), 1);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[2]->InstanceID), "10000000000000A2:depth");
  EXPECT_EQ(numberOf(agent.m_TVXHBA_DriverParams_map[2]->paramno), 0);
}

TEST_F(Driver_Params, ParameterOfTheDriverHasTheValuesOfItsRecord) {
  ProviderAgent& agent = build();
  ASSERT_EQ(agent.m_TVXHBA_DriverParamGlobal_map.size(), 1u);
  const TVXHBA_DriverParamGlobal& only = *agent.m_TVXHBA_DriverParamGlobal_map[0];
  EXPECT_EQ(textOf(only.InstanceID), "log_level");
  EXPECT_EQ(textOf(only.paramname), "log_level");
  EXPECT_EQ(numberOf(only.paramno), 0);
  EXPECT_EQ(numberOf(only.lowRange), 0);
  EXPECT_EQ(numberOf(only.highRange), 9);
  EXPECT_EQ(numberOf(only.glbl), 2);
  EXPECT_EQ(numberOf(only.current), 3);
  EXPECT_EQ(numberOf(only.exportFlag), 1);
  EXPECT_EQ(numberOf(only.dynamic), 1);
  EXPECT_EQ(textOf(only.help), "How much is logged");
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", FIRST), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", SECOND_PORT), 0u);
}

TEST_F(Driver_Params, EveryParameterIsTiedToTheServiceAndTheServiceToTheDriver) {
  ProviderAgent& agent = build();
  const Instance* service = agent.m_TVXHBA_FCHBADriverParamService_map[0];
  auto& local = agent.m_TVXHBA_DriverServiceElementSettingData_map;
  ASSERT_EQ(local.size(), 3u);
  for (std::size_t i = 0; i < 3; i++)
    EXPECT_TRUE(tiesClones(local[i], service, agent.m_TVXHBA_DriverParams_map[i]));
  auto& global = agent.m_TVXHBA_GlobalDriverServiceElementSettingData_map;
  ASSERT_EQ(global.size(), 1u);
  EXPECT_TRUE(tiesClones(global[0], service, agent.m_TVXHBA_DriverParamGlobal_map[0]));
  auto& affects = agent.m_TVXHBA_FCDriverServiceAffectsDriver_map;
  ASSERT_EQ(affects.size(), 1u);
  const std::vector<const Instance*> ends = endsOf(affects[0]);
  const auto* driver = static_cast<const TVXHBA_SoftwareIdentity*>(ends.at(0));
  EXPECT_EQ(numbersOf(driver->Classifications), std::vector<std::uint16_t>{2});
  EXPECT_TRUE(key_eq(ends.at(1), service));
}

TEST_F(Driver_Params, BuildTellsItsSteps) {
  build();
  const std::vector<std::string> steps = {"Checking driver TimeOut...",
                                          "PERF: update driver map",
                                          "TVX_MethodWrapper::tvxcimGetDriverParam()",
                                          "RM_GetDriverParamsGlobal: status=0",
                                          "saving the values of driver parameter 0",
                                          "RM_GetDriverParams: status=0",
                                          "saving the values of driver parameter 1",
                                          "Done with the Driver Parameter fetching"};
  EXPECT_EQ(log.only(steps),
            (std::vector<std::string>{steps[0], steps[1], steps[2], steps[3], steps[4], steps[2],
                                      steps[5], steps[4], steps[6], steps[2], steps[5], steps[4],
                                      steps[7]}));
  for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG) << step;
}

TEST_F(Driver_Params, RefreshWithinFiveSecondsLeavesTheParametersOut) {
  ProviderAgent& agent = build();
  turnClock(5 * SECOND - 1);
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_FCDriverServiceAffectsDriver_map.size(), 0u);
  EXPECT_EQ(log.level("PERF: Refresh Not yet required"), TVX_DBG);
  EXPECT_EQ(log.count("Done with the Driver Parameter fetching"), 2u);
  turnClock(1);
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 3u);
}

TEST_F(Driver_Params, BuildWithinFiveSecondsTellsThatItIsNotDue) {
  ProviderAgent& agent = build();
  turnClock(5 * SECOND - 1);
  EXPECT_EQ(
      stepsOf(agent,
              [](ProviderAgent& of) {
                Host_Build host{of};
                EXPECT_EQ(buildDriverParameters(host), 0);
              }),
      (std::vector<std::string>{"Checking driver TimeOut...", "PERF: Refresh Not yet required",
                                "Done with the Driver Parameter fetching"}));
}

TEST_F(Driver_Params, FirstIdentityWhoseFirstKindIsTheDriverIsTied) {
  ProviderAgent& agent = build();
  auto& identities = agent.m_TVXHBA_SoftwareIdentity_map;
  ASSERT_GE(identities.size(), 4u);
  for (std::size_t i = 0; i < identities.size(); i++) identities[i]->Classifications.set({2});
  identities[0]->Classifications.set({10, 2});
  identities[1]->Classifications.null = 1;
  identities[1]->Classifications.value = Array<std::uint16_t>();
  auto& affects = agent.m_TVXHBA_FCDriverServiceAffectsDriver_map;
  affects.clear();
  turnClock(5 * SECOND);
  Host_Build host{agent};
  EXPECT_EQ(buildDriverParameters(host), 0);
  ASSERT_EQ(affects.size(), 1u);
  EXPECT_TRUE(tiesClones(affects[0], identities[2], agent.m_TVXHBA_FCHBADriverParamService_map[0]));
}

TEST_F(Driver_Params, DriverWithoutItsServiceIsReadAllTheSame) {
  ProviderAgent& agent = build();
  agent.m_TVXHBA_FCHBADriverParamService_map.clear();
  agent.m_TVXHBA_FCDriverServiceAffectsDriver_map.clear();
  agent.m_TVXHBA_DriverParams_map.clear();
  agent.m_TVXHBA_DriverParamGlobal_map.clear();
  turnClock(5 * SECOND);
  Host_Build host{agent};
  EXPECT_EQ(buildDriverParameters(host), 0);
  EXPECT_EQ(agent.m_TVXHBA_FCDriverServiceAffectsDriver_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 3u);
  EXPECT_EQ(agent.m_TVXHBA_DriverParamGlobal_map.size(), 1u);
}

TEST_F(Driver_Params, BuildSkipsAnAdapterOfAnotherKind) {
  ProviderAgent& agent = build();
  agent.m_TVXHBA_DriverParams_map.clear();
  agent.m_TVXHBA_DriverParamGlobal_map.clear();
  turnClock(5 * SECOND);
  tvxsim_forget_calls();
  Adapter& adapter = *agent.m_pData->m_Adapters.at(0);
  adapter.m_Type = 2;
  Host_Build host{agent};
  EXPECT_EQ(buildDriverParameters(host), 0);
  adapter.m_Type = TVX_ADAPTER_TYPE_FC;
  EXPECT_EQ(
      log.level("Skippping Adapter [" + adapter.getName() + "] since it is not an FC Adapter"),
      TVX_DBG);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", SECOND_PORT), 1u);
  ASSERT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[0]->InstanceID), "10000000000000A2:depth");
}

TEST_F(Driver_Params, HostWithoutADriverIdentityHasNone) {
  ProviderAgent& agent = build();
  auto& identities = agent.m_TVXHBA_SoftwareIdentity_map;
  for (std::size_t i = 0; i < identities.size(); i++)
    if (numbersOf(identities[i]->Classifications) == std::vector<std::uint16_t>{2})
      identities[i]->Classifications.set({9});
  turnClock(5 * SECOND);
  log.clear();
  Host_Build host{agent};
  EXPECT_EQ(buildDriverParameters(host), 0);
  EXPECT_EQ(log.level("Could not locate the FC DriverServiceAffectsDriver Identity"), TVX_CRIT);
  EXPECT_EQ(log.count("TVX_MethodWrapper::tvxcimGetDriverParam()"), 0u);
}

TEST_F(Driver_Params, SecondTieToTheDriverIsRefusedAndTheWalkGoesOn) {
  ProviderAgent& agent = build();
  turnClock(5 * SECOND);
  log.clear();
  Host_Build host{agent};
  EXPECT_EQ(buildDriverParameters(host), 0);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_FCDriverServiceAffectsDriver_map"), TVX_CRIT);
  // The parameters are there already as well.
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverParamGlobal_map"), TVX_CRIT);
  EXPECT_EQ(log.level("Getting Global Driver Parameters failed with code 1"), TVX_ERR);
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_DriverParams_map"), 2u);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverParams_map"), TVX_CRIT);
  EXPECT_EQ(log.count("Retrieving Local Driver Parameters failed with code 1\n"), 2u);
  EXPECT_EQ(log.level("Retrieving Local Driver Parameters failed with code 1\n"), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 3u);
}

TEST_F(Driver_Params, TieThatTheServiceHasAlreadyIsRefusedAndTheParametersStay) {
  ProviderAgent& agent = build();
  agent.m_TVXHBA_DriverParams_map.clear();
  agent.m_TVXHBA_DriverParamGlobal_map.clear();
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL), 0);
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL), 0);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map"), TVX_CRIT);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_GlobalDriverServiceElementSettingData_map"),
            TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_DriverParamGlobal_map.size(), 1u);
}

TEST_F(Driver_Params, WithoutTheServiceThereIsNothingToTieThemTo) {
  ProviderAgent& agent = build();
  agent.clearAdapterMaps();
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL), 0);
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL), 0);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 2u);
  EXPECT_EQ(agent.m_TVXHBA_DriverServiceElementSettingData_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_GlobalDriverServiceElementSettingData_map.size(), 0u);
}

TEST_F(Driver_Params, MoreThanFiftyTwoAreReadWithASecondCall) {
  useScenario(R"({"global_driver_params": [)" + manyParams(60) +
              R"(], "cards": [{"ports": [{"wwpn": "10000000000000A1", "driver_params": [)" +
              manyParams(53) + "]}]}]}");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 53u);
  ASSERT_EQ(agent.m_TVXHBA_DriverParamGlobal_map.size(), 60u);
  EXPECT_EQ(numberOf(agent.m_TVXHBA_DriverParams_map[52]->current), 52);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParamGlobal_map[59]->InstanceID), "p59");
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", FIRST), 2u);
  EXPECT_EQ(log.count("RM_GetDriverParams: status=7"), 1u);
  EXPECT_EQ(log.level("RM_GetDriverParams: status=7"), TVX_DBG);
  EXPECT_EQ(log.count("RM_GetDriverParamsGlobal: status=7"), 1u);
  EXPECT_EQ(log.level("RM_GetDriverParamsGlobal: status=7"), TVX_DBG);
  turnClock(5 * SECOND);
  set(FIRST, "p52=77");
  Delivered got;
  readLocal(agent, got);
  ASSERT_EQ(got.size(), 53u);
  EXPECT_EQ(current(got, 52), 77);
}

TEST_F(Driver_Params, BuffersHaveRoomForFiftyTwoAndThenForTheCountThatWasTold) {
  ProviderAgent& agent =
      build(R"({"global_driver_params": [)" + manyParams(60) +
            R"(], "cards": [{"ports": [{"wwpn": "10000000000000A1", "driver_params": [)" +
            manyParams(53) + "]}]}]}");
  turnClock(5 * SECOND);
  sizes.clear();
  tvxSetAllocator(notedMemory);
  tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL);
  tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL);
  Delivered both;
  readGlobal(agent, both);
  readLocal(agent, both);
  EXPECT_EQ(sizes, (std::vector<std::size_t>{52 * 132, 60 * 132, 52 * 132, 53 * 132, 52 * 132,
                                             60 * 132, 52 * 132, 53 * 132}));
}

TEST_F(Driver_Params, ExactlyFiftyTwoNeedOneCall) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", "driver_params": [)" +
              manyParams(52) + "]}]}]}");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 52u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 1u);
}

TEST_F(Driver_Params, StatusForATooSmallListIsUnderstoodToo) {
  useScenario(TWO_PORTS);
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A1", "status": 191,
               "returned_size": 100, "nth": 1})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 3u);
  EXPECT_EQ(log.count("RM_GetDriverParams: status=191"), 1u);
}

TEST_F(Driver_Params, CountBeyondTheRoomIsCutToTheRoom) {
  useScenario(TWO_PORTS);
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A1",
               "returned_size": 4000000000})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  // Two true records, then cleared ones, of which the map refuses the second.
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_DriverParams_map"), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[2]->InstanceID), "10000000000000A1:");
}

TEST_F(Driver_Params, TextsThatFillTheirFieldsEndThere) {
  useScenario(R"({"cards": [{"ports": [{"wwpn": "10000000000000A1", "driver_params": [
      {"name": "abcdefghijklmnopqrstuvwxyz0123456789", "help": ")" +
              std::string(100, 'h') + R"("}]}]}]})");
  addFault(R"({"call": "LRM_GetDriverParams", "unterminated_texts": true})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  ASSERT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[0]->paramname).size(), 32u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[0]->help).size(), 80u);
}

TEST_F(Driver_Params, FailuresOfTheLibraryAreToldAndOtherPortsAreRead) {
  useScenario(TWO_PORTS);
  addFault(R"({"call": "LRM_GetDriverParamsGlobal", "status": 148})");
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A1", "status": 5})");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_EQ(log.level("ERROR: tvxcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed "
                      "(b) (148)"),
            TVX_ERR);
  EXPECT_EQ(log.level("Getting Global Driver Parameters failed with code 148"), TVX_ERR);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_ERR);
  EXPECT_EQ(log.level("Retrieving Local Driver Parameters failed with code 5\n"), TVX_ERR);
  ASSERT_EQ(agent.m_TVXHBA_DriverParams_map.size(), 1u);
  EXPECT_EQ(textOf(agent.m_TVXHBA_DriverParams_map[0]->InstanceID), "10000000000000A2:depth");
}

TEST_F(Driver_Params, FailureOfTheSecondCallIsTold) {
  ProviderAgent& agent = build();
  log.clear();
  addFault(R"({"call": "LRM_GetDriverParamsGlobal", "status": 7, "returned_size": 60})");
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL), 7);
  EXPECT_EQ(log.level("ERROR: tvxcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed "
                      "(a) (7)"),
            TVX_ERR);
  addFault(R"({"call": "LRM_GetDriverParams", "status": 191, "returned_size": 60})");
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL), 191);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_ERR);
}

TEST_F(Driver_Params, MemoryThatRunsOutIsTold) {
  ProviderAgent& agent = build();
  log.clear();
  tvxSetAllocator(noMemory);
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL), 8);
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL), 8);
  EXPECT_EQ(log.count(ALLOCATION), 2u);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
}

TEST_F(Driver_Params, CountThatNoDriverHasIsRefusedLikeMissingMemory) {
  ProviderAgent& agent = build();
  log.clear();
  addFault(R"({"call": ["LRM_GetDriverParams", "LRM_GetDriverParamsGlobal"], "status": 7,
               "returned_size": 4294967295})");
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::LOCAL), 8);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_CRIT);
  EXPECT_EQ(tvxcimGetDriverParam(agent, FIRST, TVX_Driver_Scope::GLOBAL), 8);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
}

TEST_F(Driver_Params, NameThatIsNoLocalPortsIsRefused) {
  ProviderAgent& agent = build();
  for (const char* name : {"10000000000000FF", "no name", "10000000000000A1F"}) {
    log.clear();
    EXPECT_EQ(tvxcimGetDriverParam(agent, name, TVX_Driver_Scope::LOCAL), 1) << name;
    EXPECT_EQ(log.level("INVALID wwpn"), TVX_ERR) << name;
  }
}

}  // namespace
}  // namespace cimrt::test
