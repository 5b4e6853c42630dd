// The driver's parameters: as instances, brought up to date, and set.
#include <new>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/TVX_Memory.h"
#include "services/Service_Checks.h"
#include "services/TVXHBA_DriverParamGlobal_Provider.h"
#include "services/TVXHBA_DriverParams_Provider.h"
#include "services/TVXHBA_FCHBADriverParamService_Provider.h"
#include "services/TVX_DriverParams.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr std::uint64_t SECOND = 1'000'000;
constexpr const char* FIRST = "10000000000000A1";
constexpr const char* SECOND_PORT = "10000000000000A2";
constexpr const char* ALLOCATION = "ERROR: tvxcimGetDriverParamsGlobal: Unable to allocate buffer";

constexpr const char* TWO_PORTS = R"({
  "global_driver_params": [
    {"name": "log_level", "low": 0, "high": 9, "default": 2, "current": 3, "export": 1,
     "dynamic": 1, "help": "How much is logged"}],
  "cards": [
    {"serial_number": "A", "ports": [{"wwpn": "10000000000000A1", "driver_params": [
      {"name": "depth", "low": 1, "high": 512, "default": 30, "current": 31, "export": 2,
       "dynamic": 3, "help": "Commands for each unit"},
      {"name": "speed", "low": 0, "high": 32, "default": 0, "current": 16}]}]},
    {"serial_number": "B", "ports": [{"wwpn": "10000000000000A2", "driver_params": [
      {"name": "depth", "low": 1, "high": 512, "default": 30, "current": 40}]}]}]})";

void* noMemory(std::size_t) {
  return nullptr;
}

std::size_t allocationsLeft = 0;
void* someMemory(std::size_t size) {
  return allocationsLeft-- > 0 ? std::calloc(1, size != 0 ? size : 1) : nullptr;
}
void* throwing(std::size_t) {
  throw std::bad_alloc();
}

class Driver_Params : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& scenario = TWO_PORTS) {
    useScenario(scenario);
    ProviderAgent& agent = startAgent();
    refresh(agent);
    return agent;
  }
  void TearDown() override {
    tvxSetAllocator(nullptr);
    Agent_Test::TearDown();
  }
  static void readLocal(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParams_map, to.handler(),
                              updateLocalDriverParams);
  }
  static void readGlobal(ProviderAgent& agent, Delivered& to) {
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParamGlobal_map, to.handler(),
                              updateGlobalDriverParams);
  }
  /// Sets a parameter of a port as its owner would, apart from the provider.
  void set(const char* port, const char* text, std::uint32_t controlWord = 0) {
    HBA_WWN wwpn{};
    ASSERT_EQ(TVX_MethodWrapper::string2HBAName(&wwpn, port), 1);
    ASSERT_EQ(LRM_SetDriverParam(wwpn, text, controlWord), RM_OK);
  }
  static std::int64_t current(const Delivered& from, std::size_t i) {
    return numberOf(from.at<TVXHBA_DriverParams>(i)->current);
  }
  /// A list of so many parameters, "p0" and on, in JSON.
  static std::string manyParams(int count) {
    std::string json;
    for (int i = 0; i < count; i++)
      json += std::string(i == 0 ? "" : ",") + R"({"name": "p)" + std::to_string(i) +
              R"(", "high": 1000, "current": )" + std::to_string(i) + "}";
    return json;
  }
};

// --- Built with the maps

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
  turnClock(5 * SECOND);
  set(FIRST, "p52=77");
  Delivered got;
  readLocal(agent, got);
  ASSERT_EQ(got.size(), 53u);
  EXPECT_EQ(current(got, 52), 77);
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

// --- Brought up to date

TEST_F(Driver_Params, CurrentValuesAreReadOnceInFiveSeconds) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  set(FIRST, "depth=99");
  set(SECOND_PORT, "depth=50");
  Delivered first;
  readLocal(agent, first);
  EXPECT_EQ(current(first, 0), 99);
  EXPECT_EQ(current(first, 1), 16);
  EXPECT_EQ(current(first, 2), 50);
  set(FIRST, "depth=100");
  turnClock(5 * SECOND - 1);
  Delivered second;
  readLocal(agent, second);
  EXPECT_EQ(current(second, 0), 99);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 1u);
  turnClock(1);
  Delivered third;
  readLocal(agent, third);
  EXPECT_EQ(current(third, 0), 100);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", SECOND_PORT), 2u);
}

TEST_F(Driver_Params, GlobalValuesAreReadThroughTheFirstPortOnceInFiveSeconds) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  log.clear();
  set(SECOND_PORT, "log_level=7", 2);
  Delivered first;
  readGlobal(agent, first);
  ASSERT_EQ(first.size(), 1u);
  EXPECT_EQ(numberOf(first.at<TVXHBA_DriverParamGlobal>(0)->current), 7);
  EXPECT_EQ(log.level("number of driver parameters 1"), TVX_DBG);
  turnClock(5 * SECOND - 1);
  Delivered second;
  readGlobal(agent, second);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", FIRST), 1u);
  turnClock(1);
  Delivered third;
  readGlobal(agent, third);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 2u);
}

TEST_F(Driver_Params, FailingPortEndsTheUpdateAndTheOldValuesAreServed) {
  ProviderAgent& agent = build();
  set(FIRST, "depth=99");
  set(SECOND_PORT, "depth=99");
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A1", "status": 1})");
  Delivered got;
  readLocal(agent, got);
  ASSERT_EQ(got.size(), 3u);
  EXPECT_EQ(current(got, 0), 31);
  EXPECT_EQ(current(got, 2), 40);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_ERR);
  tvxsim_clear_faults();
  turnClock(5 * SECOND);
  Delivered next;
  readLocal(agent, next);
  EXPECT_EQ(current(next, 0), 99);
}

TEST_F(Driver_Params, PortBeforeTheFailingOneHasItsNewValues) {
  ProviderAgent& agent = build();
  set(FIRST, "depth=99");
  set(SECOND_PORT, "depth=99");
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A2", "status": 1})");
  Delivered got;
  readLocal(agent, got);
  EXPECT_EQ(current(got, 0), 99);
  EXPECT_EQ(current(got, 2), 40);
}

TEST_F(Driver_Params, FailedGlobalReadServesTheOldValues) {
  ProviderAgent& agent = build();
  set(FIRST, "log_level=9", 2);
  addFault(R"({"call": "LRM_GetDriverParamsGlobal", "status": 3})");
  Delivered got;
  readGlobal(agent, got);
  ASSERT_EQ(got.size(), 1u);
  EXPECT_EQ(numberOf(got.at<TVXHBA_DriverParamGlobal>(0)->current), 3);
}

TEST_F(Driver_Params, FirstAdapterWithoutPortsEndsTheGlobalUpdate) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  std::vector<Port*> ports;
  ports.swap(agent.m_pData->m_Adapters.at(0)->m_Ports);
  Delivered got;
  readGlobal(agent, got);
  EXPECT_EQ(got.size(), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 0u);
  ports.swap(agent.m_pData->m_Adapters.at(0)->m_Ports);
}

TEST_F(Driver_Params, PortWithANameThatIsNoneEndsTheUpdate) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  Port& port = *agent.m_pData->m_Adapters.at(0)->getPort(0);
  port.m_Name = "nonsense";
  Delivered local;
  readLocal(agent, local);
  EXPECT_EQ(local.size(), 3u);
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(global.size(), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", nullptr), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 0u);
  EXPECT_EQ(log.level("INVALID WWN"), TVX_ERR);
}

TEST_F(Driver_Params, MemoryThatRunsOutInAnUpdateLeavesTheValues) {
  ProviderAgent& agent = build();
  addFault(R"({"call": "LRM_GetDriverParams", "status": 7, "returned_size": 60})");
  log.clear();
  allocationsLeft = 1;
  tvxSetAllocator(someMemory);
  Delivered got;
  readLocal(agent, got);
  EXPECT_EQ(got.size(), 3u);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_CRIT);
  turnClock(5 * SECOND);
  log.clear();
  tvxSetAllocator(noMemory);
  Delivered next;
  readLocal(agent, next);
  EXPECT_EQ(next.size(), 3u);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
}

TEST_F(Driver_Params, MemoryIsAskedForOnceAndBeforeAnyName) {
  ProviderAgent& agent = build();
  allocationsLeft = 1;
  tvxSetAllocator(someMemory);
  Delivered both;
  readLocal(agent, both);
  EXPECT_EQ(log.count(ALLOCATION), 0u) << "one block serves both ports";
  turnClock(5 * SECOND);
  log.clear();
  agent.m_pData->m_Adapters.at(0)->getPort(0)->m_Name = "nonsense";
  tvxSetAllocator(noMemory);
  Delivered local;
  readLocal(agent, local);
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(log.count(ALLOCATION), 2u);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
  EXPECT_EQ(log.count("INVALID WWN"), 0u);
}

TEST_F(Driver_Params, ExceptionEndsTheUpdateAndNotTheAnswer) {
  ProviderAgent& agent = build();
  tvxSetAllocator(throwing);
  Delivered local;
  readLocal(agent, local);
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(local.size(), 3u);
  EXPECT_EQ(global.size(), 1u);
  EXPECT_EQ(log.count("Found issue with local Driver Refresh"), 2u);
  EXPECT_EQ(log.level("Found issue with local Driver Refresh"), TVX_CRIT);
}

TEST_F(Driver_Params, AdapterOfAnotherKindIsSkipped) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  Adapter& adapter = *agent.m_pData->m_Adapters.at(0);
  adapter.m_Type = 2;
  Delivered local;
  readLocal(agent, local);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", SECOND_PORT), 1u);
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", SECOND_PORT), 1u);
  adapter.m_Type = TVX_ADAPTER_TYPE_FC;
}

// --- Providers

TEST_F(Driver_Params, ProvidersTellTheirNamesAndDeliver) {
  build();
  Delivered local;
  EXPECT_EQ(TVXHBA_DriverParams_Provider().enum_instances(nullptr, local.handler()), 0);
  EXPECT_EQ(local.size(), 3u);
  Delivered global;
  EXPECT_EQ(TVXHBA_DriverParamGlobal_Provider().enum_instances(nullptr, global.handler()), 0);
  EXPECT_EQ(global.size(), 1u);
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::enum_instances()"), TVX_DBG);
  EXPECT_EQ(log.level("TVXHBA_DriverParamGlobal_Provider::enum_instances()"), TVX_DBG);
}

/// One call of `SetDriverParameter`.
class Set_Driver_Parameter : public Driver_Params {
 protected:
  void SetUp() override {
    Driver_Params::SetUp();
    agent = &build();
    service = agent->m_TVXHBA_FCHBADriverParamService_map[0];
    target = agent->m_TVXHBA_FCPort_map[0];
    log.clear();
  }
  std::uint32_t call(const char* parameter, const char* value, bool permanent = false,
                     bool global = false) {
    Property<bool> bPermanent{permanent, 0};
    Property<bool> bGlobal{global, 0};
    Property<String> strParam{String(), 1};
    Property<String> strValue{String(), 1};
    if (parameter) strParam.set(parameter);
    if (value) strValue.set(value);
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(TVXHBA_FCHBADriverParamService_Provider().SetDriverParameter(
                  service, target, bPermanent, bGlobal, strParam, strValue, result),
              0);
    EXPECT_FALSE(result.is_null());
    return result.value;
  }
  ProviderAgent* agent = nullptr;
  const TVXHBA_FCHBADriverParamService* service = nullptr;
  const TVXHBA_FCPort* target = nullptr;
};

TEST_F(Set_Driver_Parameter, SetsTheParameterOfThePortAndLeavesTheInstance) {
  EXPECT_EQ(call("depth", "64"), 0u);
  EXPECT_EQ(numberOf(agent->m_TVXHBA_DriverParams_map[0]->current), 31);
  turnClock(5 * SECOND);
  refresh(*agent);
  EXPECT_EQ(numberOf(agent->m_TVXHBA_DriverParams_map[0]->current), 64);
  const std::vector<std::string> steps = {
      "TVXHBA_FCHBADriverParamService_Provider::SetDriverParameter()",
      "Checking the FCPort",
      "Valid FCPort WWPN Passed",
      "Entering TVXHBA_FCHBADriverParamService_Provider::SetDriverParam(): tvxcimSetDriverParam",
      "tvxcimSetDriverParam Parameters ::",
      "CW1=0 CW2=0 pDriverParam=depth pVal=64, deviceID=10000000000000A1",
      "pParamStr:[depth=64], Ccw:[0]",
      "Calling RM_SetDriverParam",
      "TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam Succeeded"};
  EXPECT_EQ(log.only(steps), steps);
  EXPECT_EQ(log.level(steps.back()), TVX_INFO);
  for (std::size_t i = 0; i + 1 < steps.size(); i++) EXPECT_EQ(log.level(steps[i]), TVX_DBG);
}

TEST_F(Set_Driver_Parameter, ControlWordTellsScopeAndLife) {
  const struct {
    bool permanent;
    bool global;
    const char* text;
  } rows[] = {{false, false, "pParamStr:[log_level=1], Ccw:[0]"},
              {true, false, "pParamStr:[log_level=1], Ccw:[1]"},
              {false, true, "pParamStr:[log_level=1], Ccw:[2]"},
              {true, true, "pParamStr:[log_level=1], Ccw:[3]"}};
  for (const auto& row : rows) {
    call("log_level", "1", row.permanent, row.global);
    EXPECT_EQ(log.count(row.text), 1u) << row.text;
  }
}

TEST_F(Set_Driver_Parameter, FailureOfTheLibraryIsItsStatusAboveFortyThousand) {
  EXPECT_EQ(call("no_such_parameter", "1"), 40001u);
  EXPECT_EQ(log.level("RM_SetDriverParam fails with status : 1"), TVX_ERR);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam failed"),
            TVX_ERR);
  addFault(R"({"call": "LRM_SetDriverParam", "status": 148})");
  EXPECT_EQ(call("depth", "1"), 40148u);
}

TEST_F(Set_Driver_Parameter, MissingTextsAreRefused) {
  EXPECT_EQ(call(nullptr, "1"), 40001u);
  EXPECT_EQ(log.level("Null pointer assignment in argument pDriverParam"), TVX_ERR);
  EXPECT_EQ(call("depth", nullptr), 40001u);
  EXPECT_EQ(log.level("Null pointer assignment in argument pVal"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, ControlWordsBeyondOneAreRefused) {
  HBA_WWN wwpn{{0x10, 0, 0, 0, 0, 0, 0, 0xA1}};
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 2, 0, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID CW1"), TVX_ERR);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 0, 2, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID CW2"), TVX_ERR);
  wwpn.wwn[7] = 0xFF;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimSetDriverParam(FIRST, &wwpn, 0, 0, "depth", "1"), 1);
  EXPECT_EQ(log.level("INVALID wwpn"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, LongTextsAreCutToTheirRoom) {
  const std::string value(300, '7');
  call("depth", value.c_str());
  EXPECT_EQ(log.count("pParamStr:[depth=" + std::string(249, '7') + "], Ccw:[0]"), 1u);
}

TEST_F(Set_Driver_Parameter, UnknownServiceIsRefused) {
  const Ref<TVXHBA_FCHBADriverParamService> other(TVXHBA_FCHBADriverParamService::create());
  other->Name.set("another");
  service = other.get();
  EXPECT_EQ(call("depth", "1"), 33068u);
  EXPECT_EQ(log.level("Invalid instance of HBA Driver Parameter Service"), TVX_ERR);
  agent->m_TVXHBA_FCHBADriverParamService_map.clear();
  EXPECT_EQ(call("depth", "1"), 0u);
}

TEST_F(Set_Driver_Parameter, TargetMustBeAKnownPort) {
  target = nullptr;
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider SetDriverParameter invald fc port "
                      "...return"),
            TVX_ERR);
  const Ref<TVXHBA_FCPort> other(TVXHBA_FCPort::create());
  other->DeviceID.set("10000000000000FF");
  target = other.get();
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("Could not find the passed FCPort in the map"), TVX_ERR);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider invald fc port ...return"), TVX_ERR);
  log.clear();
  const Ref<TVXHBA_Chip> chip(TVXHBA_Chip::create());
  target = reinterpret_cast<const TVXHBA_FCPort*>(chip.get());
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.count("Checking the FCPort"), 0u);
  EXPECT_EQ(log.level("TVXHBA_FCHBADriverParamService_Provider invald fc port ...return"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetDriverParam", nullptr), 0u);
}

TEST_F(Set_Driver_Parameter, PortWhoseNameCannotBeConvertedIsUnknown) {
  agent->m_TVXHBA_FCPort_map[0]->DeviceID.set("nonsense");
  EXPECT_EQ(call("depth", "1"), 32968u);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test
