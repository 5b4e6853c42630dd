// The current values of the driver's parameters, brought up to date when they are read.
#include <new>
#include <vector>

#include "Driver_Params_Test.h"
#include "services/TVXHBA_DriverParamGlobal_Provider.h"
#include "services/TVXHBA_DriverParams_Provider.h"

namespace cimrt::test {
namespace {

using Driver_Param_Updates = Driver_Params;

void* throwing(std::size_t) {
  throw std::bad_alloc();
}

TEST_F(Driver_Param_Updates, CurrentValuesAreReadOnceInFiveSeconds) {
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

TEST_F(Driver_Param_Updates, GlobalValuesAreReadThroughTheFirstPortOnceInFiveSeconds) {
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

TEST_F(Driver_Param_Updates, UpdatesTellTheirSteps) {
  ProviderAgent& agent = build();
  using Texts = std::vector<std::string>;
  const Texts notDue = {"Checking driver TimeOut...", "PERF: Refresh Not yet required"};
  EXPECT_EQ(stepsOf(agent, updateLocalDriverParams),
            (Texts{"Checking driver TimeOut...", "PERF: update driver map",
                   "RM_GetDriverParams: status=0", "RM_GetDriverParams: status=0"}));
  EXPECT_EQ(stepsOf(agent, updateGlobalDriverParams),
            (Texts{"Checking driver TimeOut...", "PERF: update driver map",
                   "RM_GetDriverParamsGlobal: status=0", "number of driver parameters 1"}));
  turnClock(5 * SECOND - 1);
  EXPECT_EQ(stepsOf(agent, updateLocalDriverParams), notDue);
  EXPECT_EQ(stepsOf(agent, updateGlobalDriverParams), notDue);
}

TEST_F(Driver_Param_Updates, ThrottlesOutliveARefreshAndTheAgent) {
  ProviderAgent* agent = &build();
  tvxsim_forget_calls();
  for (int life = 0; life < 2; life++) {
    Delivered both;
    readLocal(*agent, both);
    readGlobal(*agent, both);
    refresh(*agent);
    readLocal(*agent, both);
    readGlobal(*agent, both);
    if (life > 0) break;
    stopAgent();
    agent = &startAgent();
    refresh(*agent);
  }
  // Neither the updates nor the builds asked again.
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 1u);
}

TEST_F(Driver_Param_Updates, FailedRunCountsAsARun) {
  ProviderAgent& agent = build();
  tvxsim_forget_calls();
  addFault(R"({"call": ["LRM_GetDriverParams", "LRM_GetDriverParamsGlobal"], "status": 1})");
  for (int reads = 0; reads < 2; reads++) {
    Delivered both;
    readLocal(agent, both);
    readGlobal(agent, both);
    turnClock(5 * SECOND - 1);
  }
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", nullptr), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 1u);
}

TEST_F(Driver_Param_Updates, OnlyTheEntryOfExactlyThatIdIsChangedAndNoneIsMade) {
  ProviderAgent& agent = build();
  auto& entries = agent.m_TVXHBA_DriverParams_map;
  entries[0]->InstanceID.set("10000000000000A1:depth2");
  entries.key_changed(0);
  entries[1]->InstanceID.set("10000000000000A1:spee");
  entries.key_changed(1);
  auto& global = *agent.m_TVXHBA_DriverParamGlobal_map[0];
  global.InstanceID.set("LOG_LEVEL");
  agent.m_TVXHBA_DriverParamGlobal_map.key_changed(0);
  for (const char* text : {"depth=99", "speed=8"}) set(FIRST, text);
  set(SECOND_PORT, "depth=77");
  set(FIRST, "log_level=9", 2);
  Delivered got;
  readLocal(agent, got);
  ASSERT_EQ(got.size(), 3u);
  EXPECT_EQ(current(got, 0), 31);
  EXPECT_EQ(current(got, 1), 16);
  EXPECT_EQ(current(got, 2), 77);
  Delivered all;
  readGlobal(agent, all);
  EXPECT_EQ(all.size(), 1u);
  EXPECT_EQ(numberOf(global.current), 3);
}

TEST_F(Driver_Param_Updates, EitherStatusForATooSmallListIsTriedOnceMore) {
  ProviderAgent& agent = build();
  std::uint32_t value = 40;
  for (const int status : {7, 191}) {
    turnClock(5 * SECOND);
    value++;
    set(FIRST, ("depth=" + std::to_string(value)).c_str());
    set(FIRST, ("log_level=" + std::to_string(value - 40)).c_str(), 2);
    tvxsim_forget_calls();
    const std::string rest =
        R"(", "nth": 1, "returned_size": 60, "status": )" + std::to_string(status) + "}";
    addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A1)" + rest);
    addFault(R"({"call": "LRM_GetDriverParamsGlobal)" + rest);
    Delivered local;
    readLocal(agent, local);
    EXPECT_EQ(current(local, 0), value);
    Delivered global;
    readGlobal(agent, global);
    EXPECT_EQ(numberOf(global.at<TVXHBA_DriverParamGlobal>(0)->current), value - 40);
    EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 2u);
    EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", FIRST), 2u);
    EXPECT_EQ(log.level("RM_GetDriverParams: status=" + std::to_string(status)), TVX_DBG);
    EXPECT_EQ(log.level("RM_GetDriverParamsGlobal: status=" + std::to_string(status)), TVX_DBG);
    tvxsim_clear_faults();
  }
}

TEST_F(Driver_Param_Updates, SecondFailureEndsTheUpdateWithItsText) {
  ProviderAgent& agent = build();
  set(SECOND_PORT, "depth=99");
  tvxsim_forget_calls();
  log.clear();
  addFault(R"({"call": ["LRM_GetDriverParams", "LRM_GetDriverParamsGlobal"], "status": 7,
               "returned_size": 60})");
  Delivered local;
  readLocal(agent, local);
  EXPECT_EQ(current(local, 2), 40);
  EXPECT_EQ(log.count("RM_GetDriverParams:failed"), 1u);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", FIRST), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", SECOND_PORT), 0u);
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(global.size(), 1u);
  EXPECT_EQ(log.level("ERROR: tvxcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed "
                      "(a) (7)"),
            TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", FIRST), 2u);
  EXPECT_EQ(log.count("number of driver parameters 1"), 0u);
}

TEST_F(Driver_Param_Updates, FailingPortEndsTheUpdateAndTheOldValuesAreServed) {
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

TEST_F(Driver_Param_Updates, PortBeforeTheFailingOneHasItsNewValues) {
  ProviderAgent& agent = build();
  set(FIRST, "depth=99");
  set(SECOND_PORT, "depth=99");
  addFault(R"({"call": "LRM_GetDriverParams", "port": "10000000000000A2", "status": 1})");
  Delivered got;
  readLocal(agent, got);
  EXPECT_EQ(current(got, 0), 99);
  EXPECT_EQ(current(got, 2), 40);
}

TEST_F(Driver_Param_Updates, FailedGlobalReadServesTheOldValues) {
  ProviderAgent& agent = build();
  set(FIRST, "log_level=9", 2);
  addFault(R"({"call": "LRM_GetDriverParamsGlobal", "status": 3})");
  Delivered got;
  readGlobal(agent, got);
  ASSERT_EQ(got.size(), 1u);
  EXPECT_EQ(numberOf(got.at<TVXHBA_DriverParamGlobal>(0)->current), 3);
  EXPECT_EQ(log.level("ERROR: tvxcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed "
                      "(b) (3)"),
            TVX_ERR);
}

TEST_F(Driver_Param_Updates, FirstAdapterWithoutPortsEndsTheGlobalUpdate) {
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

TEST_F(Driver_Param_Updates, PortWithANameThatIsNoneEndsTheUpdate) {
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

TEST_F(Driver_Param_Updates, MemoryThatRunsOutInAnUpdateLeavesTheValues) {
  ProviderAgent& agent = build();
  addFault(R"({"call": "LRM_GetDriverParams", "status": 7, "returned_size": 60})");
  log.clear();
  allocationsLeft = 1;
  tvxSetAllocator(someMemory);
  Delivered got;
  readLocal(agent, got);
  EXPECT_EQ(got.size(), 3u);
  EXPECT_EQ(log.level("RM_GetDriverParams:failed"), TVX_CRIT);
  addFault(R"({"call": "LRM_GetDriverParamsGlobal", "status": 7, "returned_size": 60})");
  allocationsLeft = 1;
  Delivered global;
  readGlobal(agent, global);
  EXPECT_EQ(global.size(), 1u);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
  turnClock(5 * SECOND);
  log.clear();
  tvxSetAllocator(noMemory);
  Delivered next;
  readLocal(agent, next);
  EXPECT_EQ(next.size(), 3u);
  EXPECT_EQ(log.level(ALLOCATION), TVX_CRIT);
}

TEST_F(Driver_Param_Updates, MemoryIsAskedForOnceAndBeforeAnyName) {
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

TEST_F(Driver_Param_Updates, ExceptionEndsTheUpdateAndNotTheAnswer) {
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

TEST_F(Driver_Param_Updates, AdapterOfAnotherKindIsSkipped) {
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

TEST_F(Driver_Param_Updates, ProvidersTellTheirNamesAndDeliver) {
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

}  // namespace
}  // namespace cimrt::test
