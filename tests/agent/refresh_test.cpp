// When the cache is rebuilt, what a run of the thread does, and that nobody waits for ever.
#include <chrono>
#include <cstring>
#include <thread>
#include <utility>

#include "Agent_Fixture.h"
#include "Lock_Witness.h"
#include "model/TVX_Data.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr std::uint64_t SECOND = 1'000'000;
constexpr const char* BEGIN = "PERF: DataFetch_Handler Thread BEGIN";
constexpr const char* END = "PERF: DataFetch_Handler Thread END";
constexpr const char* ADAPTER_DATA = "PERF: Building Adapter Data...";
constexpr const char* ADAPTER_MAPS = "PERF: Updating Adapter Maps...";
constexpr const char* SAN_DATA = "PERF: Building SAN Data...";
constexpr const char* SAN_MAPS = "PERF: Updating SAN Maps...";
constexpr const char* RUNNING = "DataFetch_Handler thread already running-BuildCimrtInfo";
constexpr const char* JOIN = "PERF: Clearing the previous thread...with join";

class Refresh : public Agent_Test {
 protected:
  bool timedOut(ProviderAgent& agent) {
    Ranked_Lock lock(agent.m_ThreadMutex);
    return agent.isTimeOut();
  }
};

TEST_F(Refresh, CacheTimesOutExactlyAtItsAge) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  agent.m_CacheTimeout = 1;
  turnClock(60 * SECOND - 1);
  EXPECT_FALSE(timedOut(agent));
  EXPECT_EQ(log.count("PERF: Refresh Not yet required"), 1u);
  turnClock(1);
  EXPECT_TRUE(timedOut(agent));
}

TEST_F(Refresh, AgeTestTellsItsTimes) {
  ProviderAgent& agent = startAgent();
  EXPECT_TRUE(timedOut(agent));
  char now[Datetime::ASCII_SIZE];
  Datetime(1'700'000'000'000'000).ascii(now, false);
  const auto messages = log.all();
  ASSERT_GE(messages.size(), 3u);
  const auto* last = &messages.back();
  EXPECT_EQ(last->text, "PERF: TimeOut");
  const std::string times = (last - 1)->text;
  EXPECT_EQ(times.find("loadedtime = 00000000000000.000000:000; currenttime = 2023"), 0u) << times;
  EXPECT_NE(times.find("; cache timeout = 10"), std::string::npos) << times;
  EXPECT_EQ((last - 2)->text, "Checking if TimeOut...");
}

TEST_F(Refresh, FreshCacheStartsNothing) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  log.clear();
  EXPECT_EQ(agent.BuildCimrtInfo(), 0);
  EXPECT_EQ(log.count("PERF: ---No timeout BuildCimrtInfo END---"), 1u);
  EXPECT_EQ(log.level(" Entering BuildCimrtInfo()"), TVX_INFO);
  awaitIdle(agent);
  EXPECT_EQ(log.count(BEGIN), 0u);
}

TEST_F(Refresh, FirstRunBuildsAdaptersAndSAN) {
  ProviderAgent& agent = startAgent();
  agent.BuildCimrtInfo();
  awaitIdle(agent);
  const std::vector<std::string> steps = {
      "PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---"};
  EXPECT_EQ(log.count(steps[0]), 1u);
  const std::vector<std::string> stages = {BEGIN, ADAPTER_DATA, ADAPTER_MAPS, SAN_DATA, SAN_MAPS};
  EXPECT_EQ(log.only(stages), stages);
  EXPECT_TRUE(agent.m_bIsAdapterDataReady);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  EXPECT_FALSE(agent.m_bIsAdapterDataBuilding);
  EXPECT_FALSE(agent.m_bIsAdapterMapsBuilding);
  EXPECT_FALSE(agent.m_bIsSANMapsBuilding);
  EXPECT_FALSE(agent.m_bAdapterRefreshPending);
  EXPECT_EQ(log.count(JOIN), 0u);
}

/// Notes which groups are ready, and which is being built, when the thread logs certain lines.
class Readiness_Record : public TVX_LoggerInterface {
 public:
  explicit Readiness_Record(const ProviderAgent& agent) : m_Agent(agent) {
    getLogger().registerInterface(this);
  }
  ~Readiness_Record() override { getLogger().unregisterInterface(this); }
  Readiness_Record(const Readiness_Record&) = delete;
  Readiness_Record& operator=(const Readiness_Record&) = delete;

  void log(int, const char*, const unsigned*, const char* text) override {
    for (const char* moment : {BEGIN, "buildAdapterData", ADAPTER_MAPS, SAN_DATA, SAN_MAPS})
      if (std::strcmp(moment, text) == 0) m_Moments.push_back(now());
  }
  void open() override {}
  void close() override {}
  void clear() override {}

  /// Adapter data, adapter maps, SAN maps: "r" ready, "b" being built, "-" neither.
  std::vector<std::string> take() { return std::exchange(m_Moments, {}); }
  std::string now() const {
    EXPECT_FALSE(m_Agent.m_bIsAdapterDataReady && m_Agent.m_bIsAdapterDataBuilding);
    EXPECT_FALSE(m_Agent.m_bIsAdapterMapsReady && m_Agent.m_bIsAdapterMapsBuilding);
    EXPECT_FALSE(m_Agent.m_bIsSANMapsReady && m_Agent.m_bIsSANMapsBuilding);
    return {sign(m_Agent.m_bIsAdapterDataReady, m_Agent.m_bIsAdapterDataBuilding),
            sign(m_Agent.m_bIsAdapterMapsReady, m_Agent.m_bIsAdapterMapsBuilding),
            sign(m_Agent.m_bIsSANMapsReady, m_Agent.m_bIsSANMapsBuilding)};
  }

 private:
  static char sign(bool ready, bool building) { return building ? 'b' : ready ? 'r' : '-'; }
  const ProviderAgent& m_Agent;
  std::vector<std::string> m_Moments;
};

TEST_F(Refresh, ReadinessMovesFromGroupToGroup) {
  ProviderAgent& agent = startAgent();
  Readiness_Record readiness(agent);
  refresh(agent);
  using Moments = std::vector<std::string>;
  EXPECT_EQ(readiness.take(), (Moments{"---", "b--", "rb-", "rr-", "rrb"}));
  EXPECT_EQ(readiness.now(), "rrr");
  // Until the next run clears them, readers are served from the old maps; those of the SAN stand
  // until the adapters' are rebuilt.
  refresh(agent);
  EXPECT_EQ(readiness.take(), (Moments{"rrr", "b-r", "rb-", "rr-", "rrb"}));
  agent.m_bSANRefreshSetting = false;
  refresh(agent);
  EXPECT_EQ(readiness.take(), (Moments{"rrr", "b-r", "rb-"}));
  EXPECT_EQ(readiness.now(), "rr-");
  // A scan alone touches neither of the adapter groups.
  for (const char* before : {"rr-", "rrr"}) {
    agent.m_bSANRefreshPending = true;
    agent.BuildCimrtInfo();
    awaitIdle(agent);
    EXPECT_EQ(readiness.take(), (Moments{before, "rr-", "rrb"}));
  }
}

#ifndef NDEBUG  // locks are only booked in debug builds
TEST_F(Refresh, SANIsScannedAndItsMapsAreBuiltUnderTheDataLock) {
  ProviderAgent& agent = startAgent();
  Lock_Witness before(BEGIN);
  before.wasHeld = true;
  Lock_Witness scan("buildSANData");
  Lock_Witness command("Send Read Capacity");
  Lock_Witness maps("PERF: updateSANMaps: Entry");
  refresh(agent);
  EXPECT_FALSE(before.wasHeld);
  EXPECT_TRUE(scan.wasHeld);
  EXPECT_TRUE(command.wasHeld);
  EXPECT_TRUE(maps.wasHeld);
}
#endif

TEST_F(Refresh, FurtherRunsJoinTheOneBefore) {
  ProviderAgent& agent = startAgent();
  for (int run = 0; run < 3; run++) refresh(agent);
  EXPECT_EQ(log.count(BEGIN), 3u);
  EXPECT_EQ(log.count(JOIN), 2u);
}

TEST_F(Refresh, LoadedTimeIsThatOfTheEndOfTheRun) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  const std::uint64_t first = agent.m_LoadedTime.usec();
  EXPECT_TRUE(agent.m_LoadedTime.is_timestamp());
  turnClock(5 * SECOND);
  refresh(agent);
  EXPECT_EQ(agent.m_LoadedTime.usec(), first + 5 * SECOND);
}

TEST_F(Refresh, ReadDuringARunStartsNoSecondOneAndKeepsThePendingRefresh) {
  ProviderAgent& agent = startAgent();
  addFault(R"({"call": "LRM_GetHBAAttributes", "nth": 1, "delay_ms": 60})");
  agent.BuildCimrtInfo();
  while (!agent.m_bIsAdapterDataBuilding) std::this_thread::yield();
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
  EXPECT_EQ(log.count(RUNNING), 1u);
  awaitIdle(agent);
  EXPECT_EQ(log.count(BEGIN), 1u);
  EXPECT_TRUE(agent.m_bAdapterRefreshPending);
  agent.BuildCimrtInfo();
  awaitIdle(agent);
  EXPECT_EQ(log.count(BEGIN), 2u);
  EXPECT_EQ(log.count(ADAPTER_DATA), 2u);
  EXPECT_FALSE(agent.m_bAdapterRefreshPending);
}

TEST_F(Refresh, SANReaderOnAFreshCacheRunsTheSANStageAlone) {
  ProviderAgent& agent = startAgent();
  agent.m_bSANRefreshSetting = false;
  refresh(agent);
  EXPECT_FALSE(agent.m_bIsSANMapsReady);
  turnClock(SECOND);
  const std::uint64_t loaded = agent.m_LoadedTime.usec();
  log.clear();
  Delivered delivered;
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  awaitIdle(agent);
  EXPECT_EQ(log.count(BEGIN), 1u);
  EXPECT_EQ(log.count(ADAPTER_DATA), 0u);
  EXPECT_EQ(log.count(SAN_DATA), 1u);
  EXPECT_EQ(agent.m_LoadedTime.usec(), loaded + SECOND);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
  // The second reader finds the maps ready and starts nothing.
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  awaitIdle(agent);
  EXPECT_EQ(log.count(BEGIN), 1u);
}

TEST_F(Refresh, AdapterRefreshSettingRebuildsTheAdaptersForASANReaderToo) {
  ProviderAgent& agent = startAgent();
  agent.m_bSANRefreshSetting = false;
  agent.m_bAdapterRefreshSetting = true;
  refresh(agent);
  log.clear();
  Delivered delivered;
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  awaitIdle(agent);
  const std::vector<std::string> stages = {BEGIN, ADAPTER_DATA, ADAPTER_MAPS, SAN_DATA, SAN_MAPS};
  EXPECT_EQ(log.only(stages), stages);
}

TEST_F(Refresh, AdapterStageMakesTheSANMapsStale) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  agent.m_bSANRefreshSetting = false;
  refresh(agent);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
  EXPECT_FALSE(agent.m_bIsSANMapsReady);
}

TEST_F(Refresh, SANReaderThatComesAfterTheDecisionIsServedByTheSameRun) {
  ProviderAgent& agent = startAgent();
  agent.m_bSANRefreshSetting = false;
  // The run stands still at its beginning until it can no longer end unseen.
  std::atomic<bool> held{false};
  std::atomic<bool> release{false};
  std::thread holder([&] {
    Ranked_Lock data(agent.m_DataMutex);
    held = true;
    while (!release) std::this_thread::yield();
  });
  while (!held) std::this_thread::yield();
  agent.BuildCimrtInfo();
  {
    Ranked_Lock lock(agent.m_ThreadMutex);
    release = true;
    holder.join();
    // It asks for this lock at its end alone, with the decision against the SAN stage behind it.
    while (agent.m_ThreadMutex.waiting() == 0) std::this_thread::yield();
    ASSERT_TRUE(agent.m_bIsAdapterMapsReady);
    ASSERT_TRUE(agent.m_bThreadRunning);
    // What a reader does that finds the thread running: it asks, and waits.
    agent.m_bSANRefreshPending = true;
  }
  awaitIdle(agent);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  EXPECT_FALSE(agent.m_bSANRefreshPending);
  EXPECT_EQ(log.count(BEGIN), 1u);
  EXPECT_EQ(log.count(SAN_MAPS), 1u);
}

TEST_F(Refresh, SANReaderIsServedThoughARunMakesItsMapsStaleOnTheWay) {
  ProviderAgent& agent = startAgent();
  agent.m_CacheTimeout = 0;  // every read starts a run
  agent.m_bSANRefreshSetting = false;
  // The reader may find ready maps, ask for nothing, and see them go stale by the run that its own
  // call starts. It must come back all the same; the test's time limit says so.
  while (log.count(ADAPTER_DATA) < 10) {
    Delivered delivered;
    agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  }
  awaitIdle(agent);
  EXPECT_GE(log.count(SAN_MAPS), 1u);
}

TEST_F(Refresh, SANReaderAsksAgainAfterARunThatDidNotServeIt) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  agent.m_bSANRefreshSetting = false;
  turnClock(11 * 60 * SECOND);
  log.clear();
  Delivered delivered;
  std::thread reader;
  {
    Ranked_Lock lock(agent.m_ThreadMutex);
    reader = std::thread(
        [&] { agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler()); });
    // It found its maps ready and asked for nothing. Before it can wait, they go stale.
    while (agent.m_ThreadMutex.waiting() == 0) std::this_thread::yield();
    agent.m_bIsSANMapsReady = false;
  }
  reader.join();
  awaitIdle(agent);
  EXPECT_GT(delivered.size(), 0u);
  EXPECT_EQ(delivered.size(), agent.m_TVXHBA_StorageVolume_map.size());
  // The first run is for the old cache alone.
  const std::vector<std::string> stages = {BEGIN, ADAPTER_DATA, ADAPTER_MAPS, BEGIN, SAN_DATA};
  EXPECT_EQ(log.only(stages), stages);
}

TEST_F(Refresh, FailedMapBuildLeavesTheMapsReadyAsTheyStandAndTheNextRunRepairsThem) {
  ProviderAgent& agent = startAgent();
  useScenario(R"({"cards": [{"serial_number": "TWO", "adapter_per": "card",
      "ports": [{"wwpn": "1000000000000001"}, {"wwpn": "1000000000000002"}]}]})");
  refresh(agent);
  EXPECT_EQ(log.level("Insert Failed (HBA): m_TVXHBA_PhysicalConnector"), TVX_CRIT);
  EXPECT_EQ(log.count("CreatePhysicalConnectorInstances failed"), 1u);
  EXPECT_EQ(log.count("PERF: updateAdapterMaps: cleanExit"), 0u);
  EXPECT_TRUE(agent.m_bIsAdapterMapsReady);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 1u);
  useScenario();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  EXPECT_EQ(log.count("PERF: updateAdapterMaps: cleanExit"), 1u);
}

TEST_F(Refresh, FailingHardwareNeverStopsARun) {
  ProviderAgent& agent = startAgent();
  for (const char* call : {"HBA_GetNumberOfAdapters", "HBA_GetAdapterName", "HBA_OpenAdapter",
                           "HBA_GetAdapterPortAttributes", "LRM_GetHBAAttributes",
                           "LRM_GetPortAttributes", "LRM_DiagReadPCIRegistersV2"}) {
    useScenario();
    addFault(std::string(R"({"call": ")") + call + R"(", "status": 1})");
    refresh(agent);
    EXPECT_TRUE(agent.m_bIsAdapterMapsReady) << call;
    EXPECT_TRUE(agent.m_bIsSANMapsReady) << call;
    EXPECT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1u) << call;
  }
  useScenario();
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
}

}  // namespace
}  // namespace cimrt::test
