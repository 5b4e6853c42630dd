// The three forms of enumeration: what is delivered, when, and with which locks.
#include <atomic>
#include <stdexcept>
#include <string>
#include <thread>

#include "Agent_Fixture.h"
#include "Lock_Witness.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr const char* BEGIN = "PERF: DataFetch_Handler Thread BEGIN";
constexpr const char* PLAIN_EXCEPTION = "Exception in CIM Provider Enumeration - do nothing";
constexpr const char* ACTIVE_EXCEPTION =
    "Exception in Active CIM Provider Enumeration - do nothing";
constexpr const char* SAN_EXCEPTION = "Exception in SAN CIM Provider Enumeration - do nothing";

ProviderAgent* theAgent;  // of the running test, for functions without data
bool everyLockWasFree;

void probeLocks() {
  // In a thread that holds nothing: it gets each lock, or the test hangs.
  everyLockWasFree = isFree(theAgent->m_AdapterDataReadyMutex) &&
                     isFree(theAgent->m_AdapterMapsReadyMutex) &&
                     isFree(theAgent->m_SANMapsReadyMutex) && isFree(theAgent->m_DataMutex) &&
                     isFree(theAgent->m_ThreadMutex);
}

void throwing() {
  throw std::runtime_error("the server failed");
}

void noUpdate(ProviderAgent&) {}

class Enumeration : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    theAgent = nullptr;
    everyLockWasFree = false;
  }
  ProviderAgent& readyAgent() {
    ProviderAgent& agent = startAgent();
    refresh(agent);
    theAgent = &agent;
    log.clear();
    return agent;
  }
  /// A volume in the SAN maps, as the SAN stage would put it there.
  static void addVolume(ProviderAgent& agent, const char* id) {
    Ref<TVXHBA_StorageVolume> volume(TVXHBA_StorageVolume::create());
    volume->DeviceID.set(id);
    Ranked_Lock ready(agent.m_SANMapsReadyMutex);
    Ranked_Lock data(agent.m_DataMutex);
    ASSERT_NE(agent.m_TVXHBA_StorageVolume_map.insert(volume.get()), Instance_Map_Base::npos);
    volume.release();
  }
  /// Gives the second entry the key of the first, as no builder can.
  static void makeDuplicate(ProviderAgent& agent) {
    Ranked_Lock data(agent.m_DataMutex);
    auto& map = agent.m_TVXHBA_FCPort_map;
    map[1]->DeviceID.set(map[0]->DeviceID.value);
    map.key_changed(1);
  }
};

TEST_F(Enumeration, EmptyMapGivesNothing) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_ConcreteJob_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 0u);
}

TEST_F(Enumeration, FirstReaderWaitsForTheMaps) {
  ProviderAgent& agent = startAgent();
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 4u);
  awaitIdle(agent);
}

TEST_F(Enumeration, DeliversClonesInTheOrderOfTheMap) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  ASSERT_EQ(delivered.size(), agent.m_TVXHBA_FCPort_map.size());
  for (std::size_t i = 0; i < delivered.size(); i++) {
    const TVXHBA_FCPort* entry = agent.m_TVXHBA_FCPort_map[i];
    EXPECT_NE(delivered.at<TVXHBA_FCPort>(i), entry);
    EXPECT_TRUE(identical(delivered.at<TVXHBA_FCPort>(i), entry));
  }
}

TEST_F(Enumeration, DeliversWithEveryLockFree) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  delivered.probe = probeLocks;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_TRUE(everyLockWasFree);
  everyLockWasFree = false;
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), noUpdate);
  EXPECT_TRUE(everyLockWasFree);
  everyLockWasFree = false;
  addVolume(agent, "one");
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  EXPECT_TRUE(everyLockWasFree);
}

TEST_F(Enumeration, ReadersOfOneGroupCopyOneAfterTheOtherUnderTheDataLock) {
  ProviderAgent& agent = readyAgent();
  const struct {
    void (*read)(ProviderAgent&, const Instance_Handler&);
    Ranked_Mutex& group;
  } forms[] = {{[](ProviderAgent& a, const Instance_Handler& handler) {
                  a.enumInstances(a.m_TVXHBA_FCPort_map, handler);
                },
                agent.m_AdapterMapsReadyMutex},
               {[](ProviderAgent& a, const Instance_Handler& handler) {
                  a.enumSANInstances(a.m_TVXHBA_FCPort_map, handler);
                },
                agent.m_SANMapsReadyMutex}};
  for (const auto& form : forms) {
    Delivered first, second;
    std::atomic<int> done{0};
    Ranked_Lock data(agent.m_DataMutex);
    std::thread one([&] {
      form.read(agent, first.handler());
      done++;
    });
    while (done == 0 && agent.m_DataMutex.waiting() == 0) std::this_thread::yield();
    std::thread other([&] {
      form.read(agent, second.handler());
      done++;
    });
    while (done == 0 && form.group.waiting() == 0) std::this_thread::yield();
    EXPECT_EQ(done, 0);
    data.release();
    one.join();
    other.join();
    EXPECT_EQ(first.size() + second.size(), 8u);
  }
}

TEST_F(Enumeration, StopsWhenTheHandlerHasEnough) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  delivered.limit = 2;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 2u);
}

TEST_F(Enumeration, RefusedCopyDeliversNothingInAnyForm) {
  ProviderAgent& agent = readyAgent();
  makeDuplicate(agent);
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(log.level("Insert failed for 1"), TVX_CRIT);
  log.clear();
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), noUpdate);
  EXPECT_EQ(log.level("Insert failed for 1"), TVX_CRIT);
  log.clear();
  agent.enumSANInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(log.level("Insert failed for 1"), TVX_CRIT);
  EXPECT_EQ(delivered.size(), 0u);
  probeLocks();
  EXPECT_TRUE(everyLockWasFree);
}

TEST_F(Enumeration, ExceptionOfTheHandlerEndsTheDeliveryWithItsText) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  delivered.probe = throwing;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(log.level(PLAIN_EXCEPTION), TVX_CRIT);
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), noUpdate);
  EXPECT_EQ(log.level(ACTIVE_EXCEPTION), TVX_CRIT);
  addVolume(agent, "one");
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  EXPECT_EQ(log.level(SAN_EXCEPTION), TVX_CRIT);
  EXPECT_EQ(delivered.size(), 0u);
}

TEST_F(Enumeration, ActiveFormUpdatesTheMapBeforeItCopies) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), [](ProviderAgent& a) {
    a.m_TVXHBA_FCPort_map[0]->ElementName.set("updated");
  });
  ASSERT_EQ(delivered.size(), 4u);
  EXPECT_TRUE(delivered.at<TVXHBA_FCPort>(0)->ElementName.value == "updated");
}

#ifndef NDEBUG  // locks are only booked in debug builds
TEST_F(Enumeration, ActiveFormUpdatesUnderAllItsLocks) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  static bool mayTakeAny;
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), [](ProviderAgent&) {
    mayTakeAny = may_take_lock(Lock_Rank::ADAPTER_DATA, false) ||
                 may_take_lock(Lock_Rank::ADAPTER_MAPS, false) ||
                 may_take_lock(Lock_Rank::DATA, false) ||
                 may_take_lock(Lock_Rank::CLASS_STATIC, false);
  });
  EXPECT_FALSE(mayTakeAny);
  EXPECT_EQ(delivered.size(), 4u);
}

TEST_F(Enumeration, ActiveFormCopiesUnderTheDataLockAndNotUnderThatOfItsClass) {
  ProviderAgent& agent = readyAgent();
  makeDuplicate(agent);
  Lock_Witness copying("Insert failed for 1");
  Delivered delivered;
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(), noUpdate);
  EXPECT_TRUE(copying.wasHeld);
  EXPECT_TRUE(copying.classWasFree);
}
#endif

TEST_F(Enumeration, ExceptionOfTheUpdateDeliversNothingAndFreesTheLocks) {
  ProviderAgent& agent = readyAgent();
  Delivered delivered;
  agent.enumActiveInstances(agent.m_TVXHBA_FCPort_map, delivered.handler(),
                            [](ProviderAgent&) { throw std::exception(); });
  EXPECT_EQ(delivered.size(), 0u);
  EXPECT_EQ(log.level(ACTIVE_EXCEPTION), TVX_CRIT);
  probeLocks();
  EXPECT_TRUE(everyLockWasFree);
}

TEST_F(Enumeration, ReaderDuringARebuildGetsTheNewInstancesAndNoMixture) {
  ProviderAgent& agent = readyAgent();
  useScenario(singlePortCards(2));
  addFault(R"({"call": "LRM_GetHBAAttributes", "nth": 1, "delay_ms": 50})");
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
  while (agent.m_bIsAdapterMapsReady) std::this_thread::yield();
  Delivered delivered;
  agent.enumInstances(agent.m_TVXHBA_FCPort_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 2u);
  awaitIdle(agent);
}

TEST_F(Enumeration, WriterWaitsForBothStagesAndHoldsNothingAfterwards) {
  ProviderAgent& agent = startAgent();
  theAgent = &agent;
  addFault(R"({"call": "LRM_GetHBAAttributes", "nth": 1, "delay_ms": 40})");
  agent.BuildCimrtInfo();
  agent.awaitAdapterMaps();
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4u);
  awaitIdle(agent);
  probeLocks();
  EXPECT_TRUE(everyLockWasFree);
}

TEST_F(Enumeration, WriterTellsOfItsWaits) {
  ProviderAgent& agent = readyAgent();
  // As between the stages of a run: the writer has to wait for either.
  agent.m_bIsAdapterDataReady = false;
  agent.m_bIsAdapterMapsReady = false;
  std::thread writer([&] { agent.awaitAdapterMaps(); });
  while (log.count("PERF: Waiting for m_AdapterDataReadyMutex") == 0) std::this_thread::yield();
  {
    Ranked_Lock lock(agent.m_AdapterDataReadyMutex);
    agent.m_bIsAdapterDataReady = true;
    agent.m_AdapterDataReadyCond.broadcast();
  }
  while (log.count("PERF: Waiting for m_AdapterMapsReadyMutex") == 0) std::this_thread::yield();
  {
    Ranked_Lock lock(agent.m_AdapterMapsReadyMutex);
    agent.m_bIsAdapterMapsReady = true;
    agent.m_AdapterMapsReadyCond.broadcast();
  }
  writer.join();
  const std::vector<std::string> steps = {"PERF: Waiting for m_AdapterDataReadyMutex",
                                          "PERF: Woken up from wait for m_AdapterDataReadyMutex",
                                          "PERF: Waiting for m_AdapterMapsReadyMutex",
                                          "PERF: Woken up from wait for m_AdapterMapsReadyMutex"};
  EXPECT_EQ(log.only(steps), steps);
}

}  // namespace
}  // namespace cimrt::test
