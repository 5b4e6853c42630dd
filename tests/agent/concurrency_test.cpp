// Many readers, refreshes and reloads at once. What each test says holds in any build; under
// ThreadSanitizer it also shows that nothing is touched without its lock.
#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

#include "San_Test.h"
#include "agent/LiveStatus.h"
#include "services/TVX_DriverParams.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr std::uint64_t MINUTE = 60'000'000;

class Concurrency : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    useScenario(singlePortCards(2));
  }
};

/// Reads every form once. Counts the answers that are neither empty nor whole.
void readAll(ProviderAgent& agent, std::atomic<int>& mixtures) {
  Delivered ports;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, ports.handler());
  Delivered live;
  agent.enumActiveInstances(
      agent.m_TVXHBA_FCPortStatistics_map, live.handler(), [](ProviderAgent& a) {
        for (std::size_t i = 0; i < a.m_TVXHBA_FCPortStatistics_map.size(); i++)
          a.m_TVXHBA_FCPortStatistics_map[i]->LinkFailures.set(i);
      });
  Delivered volumes;
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, volumes.handler());
  if (ports.size() != 2 || live.size() != 2) mixtures++;
}

TEST_F(Concurrency, ReadersOfAllFormsDuringRefreshes) {
  ProviderAgent& agent = startAgent();
  std::atomic<int> mixtures{0};
  std::atomic<bool> stop{false};
  std::vector<std::thread> readers;
  for (int i = 0; i < 2; i++)
    readers.emplace_back([&] {
      while (!stop) readAll(agent, mixtures);
    });
  for (int run = 0; run < 5; run++) {
    turnClock(11 * MINUTE);
    agent.BuildCimrtInfo();
    awaitIdle(agent);
  }
  stop = true;
  for (std::thread& reader : readers) reader.join();
  awaitIdle(agent);
  EXPECT_EQ(mixtures, 0);
  EXPECT_GE(log.count("PERF: Building Adapter Data..."), 5u);
}

/// Four readers at once, each of whom finds the throttle open or is kept from it by another.
template <class Read>
void readTogether(Read read) {
  std::vector<std::thread> readers;
  for (int i = 0; i < 4; i++)
    readers.emplace_back([&] {
      for (int n = 0; n < 5; n++) read();
    });
  for (std::thread& reader : readers) reader.join();
}

TEST_F(Concurrency, OneOfManyReadersPassesAThrottle) {
  ProviderAgent& agent = startAgent();
  refresh(agent);
  addFault(R"({"call": ["LRM_GetPortStatistics", "LRM_GetPortAttributes"], "delay_ms": 3})");
  tvxsim_forget_calls();
  std::atomic<int> wrong{0};
  readTogether([&] {
    Delivered statistics;
    agent.enumActiveInstances(agent.m_TVXHBA_FCPortStatistics_map, statistics.handler(),
                              GetFCPortStats);
    Delivered ports;
    agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, ports.handler(), UpdateFCPortStatus);
    Delivered parameters;
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParams_map, parameters.handler(),
                              updateLocalDriverParams);
    Delivered globals;
    agent.enumActiveInstances(agent.m_TVXHBA_DriverParamGlobal_map, globals.handler(),
                              updateGlobalDriverParams);
    if (statistics.size() != 2 || ports.size() != 2 || parameters.size() == 0) wrong++;
  });
  EXPECT_EQ(wrong, 0);
  for (const char* port : {"1000000000000000", "1000000000000001"}) {
    EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", port), 1u);
    EXPECT_EQ(tvxsim_calls("LRM_GetPortAttributes", port), 1u);
    EXPECT_EQ(tvxsim_calls("LRM_GetDriverParams", port), 1u);
  }
  EXPECT_EQ(tvxsim_calls("LRM_GetDriverParamsGlobal", nullptr), 1u);
}

TEST_F(Concurrency, SANReadersWithoutSANRefreshAllComeBack) {
  ProviderAgent& agent = startAgent();
  agent.m_bSANRefreshSetting = false;
  std::atomic<int> served{0};
  std::vector<std::thread> readers;
  for (int i = 0; i < 3; i++)
    readers.emplace_back([&] {
      for (int read = 0; read < 5; read++) {
        Delivered volumes;
        agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, volumes.handler());
        served++;
        turnClock(11 * MINUTE);  // the next read finds an old cache
      }
    });
  for (std::thread& reader : readers) reader.join();
  awaitIdle(agent);
  EXPECT_EQ(served, 15);
}

TEST_F(Concurrency, LoadsAndUnloadsWhileOthersRead) {
  std::atomic<int> wrong{0};
  std::vector<std::thread> providers;
  for (int i = 0; i < 3; i++)
    providers.emplace_back([&] {
      for (int life = 0; life < 4; life++) {
        if (ProviderAgent::acquire() != LOAD_OK) wrong++;
        ProviderAgent& agent = *ProviderAgent::getInstance();
        Delivered ports;
        agent.enumInstances(agent.m_TVXHBA_FCPort_map, ports.handler());
        if (ports.size() != 2) wrong++;
        ProviderAgent::releaseRef();
      }
    });
  for (std::thread& provider : providers) provider.join();
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
}

TEST_F(Concurrency, UnloadsInTheMiddleOfRunsJoinThem) {
  for (int life = 0; life < 5; life++) {
    ASSERT_EQ(ProviderAgent::acquire(), LOAD_OK);
    ProviderAgent::getInstance()->BuildCimrtInfo();
    ProviderAgent::releaseRef();
  }
  EXPECT_EQ(ProviderAgent::refCount(), 0u);
}

TEST_F(Concurrency, WritersAndReadersShareTheSettings) {
  ProviderAgent& agent = startAgent();
  std::atomic<bool> stop{false};
  std::atomic<int> mixtures{0};
  std::thread reader([&] {
    while (!stop) readAll(agent, mixtures);
  });
  for (int i = 0; i < 20; i++) {
    agent.awaitAdapterMaps();
    Ranked_Lock data(agent.m_DataMutex);
    agent.m_CacheTimeout = 5 + static_cast<std::uint32_t>(i % 5);
    agent.m_bSANRefreshSetting = i % 2 == 0;
    agent.m_TVXHBA_FCPort_map[0]->LocationIndicator.set(2 + i % 2);
  }
  stop = true;
  reader.join();
  EXPECT_EQ(mixtures, 0);
}

// --- A SAN that takes its time -------------------------------------------------------------------

using SAN_Concurrency = San_Maps;

unsigned long unitsScanned() {
  return tvxsim_calls("HBA_SendReadCapacity", nullptr);
}

void awaitScanned(unsigned long units) {
  while (unitsScanned() < units) std::this_thread::sleep_for(std::chrono::milliseconds(1));
}

TEST_F(SAN_Concurrency, ReadersOnAStaleCacheWaitForTheNewScan) {
  ProviderAgent& agent = buildUnits(R"({"count": 3})");
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 3u);
  agent.m_bSANRefreshSetting = false;
  buildUnits(R"({"count": 7})");
  ASSERT_FALSE(agent.m_bIsSANMapsReady);
  tvxsim_forget_calls();
  addFault(R"({"call": "HBA_SendReadCapacity", "delay_ms": 1})");
  Delivered volumes, endpoints, paths;
  std::thread readers[] = {
      std::thread(
          [&] { agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, volumes.handler()); }),
      std::thread([&] {
        agent.enumSANInstances(agent.m_TVXHBA_SCSIProtocolEndpoint_map, endpoints.handler());
      }),
      std::thread([&] {
        agent.enumSANInstances(agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map,
                               paths.handler());
      })};
  for (std::thread& reader : readers) reader.join();
  EXPECT_EQ(volumes.size(), 7u);
  EXPECT_EQ(endpoints.size(), 7u);
  EXPECT_EQ(paths.size(), 7u);
  EXPECT_EQ(unitsScanned(), 7u);  // one scan serves all of them
  awaitIdle(agent);
}

TEST_F(SAN_Concurrency, ReaderThatComesDuringAScanIsServedByIt) {
  constexpr unsigned long UNITS = 30;
  ProviderAgent& agent = buildUnits(R"({"count": 30})");
  agent.m_bSANRefreshSetting = false;
  refresh(agent);
  ASSERT_FALSE(agent.m_bIsSANMapsReady);
  tvxsim_forget_calls();
  addFault(R"({"call": "HBA_SendReadCapacity", "delay_ms": 2})");
  Delivered first, second;
  std::thread reader(
      [&] { agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, first.handler()); });
  awaitScanned(2);
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, second.handler());
  reader.join();
  awaitIdle(agent);
  EXPECT_EQ(first.size(), UNITS);
  EXPECT_EQ(second.size(), UNITS);
  EXPECT_EQ(unitsScanned(), UNITS) << "it asked for a scan that was under way";
}

TEST_F(SAN_Concurrency, ReadersOfAdapterClassesWaitForAScanToEnd) {
  constexpr unsigned long UNITS = 30;
  ProviderAgent& agent = buildUnits(R"({"count": 30})");
  tvxsim_forget_calls();
  addFault(R"({"call": "HBA_SendReadCapacity", "delay_ms": 2})");
  agent.m_bSANRefreshPending = true;
  agent.BuildCimrtInfo();
  awaitScanned(2);
  Delivered plain, live;
  std::thread readers[] = {std::thread([&] {
                             agent.enumInstances(agent.m_TVXHBA_Card_map, plain.handler());
                             EXPECT_EQ(unitsScanned(), UNITS);
                           }),
                           std::thread([&] {
                             agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, live.handler(),
                                                       [](ProviderAgent&) {});
                             EXPECT_EQ(unitsScanned(), UNITS);
                           })};
  for (std::thread& reader : readers) reader.join();
  EXPECT_EQ(plain.size(), 1u);
  EXPECT_EQ(live.size(), 1u);
  awaitIdle(agent);
}

TEST_F(SAN_Concurrency, LongScanIsLeftInTheMiddleByAnUnload) {
  useScenario(unitsBehindOnePort(R"({"count": 100000})"));
  addFault(R"({"call": ["HBA_SendScsiInquiry", "HBA_SendReadCapacity"], "delay_ms": 1})");
  startAgent().BuildCimrtInfo();
  awaitScanned(5);
  stopAgent();
  EXPECT_LT(unitsScanned(), 10'000u);
  EXPECT_EQ(tvxsim_open_handles(), 0u);
  // The next life is a whole one.
  EXPECT_EQ(build(unitsBehindOnePort(R"({"count": 2})")).m_TVXHBA_StorageVolume_map.size(), 2u);
}

}  // namespace
}  // namespace cimrt::test
