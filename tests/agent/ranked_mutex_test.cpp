// The lock order and its checker.
#include "agent/Ranked_Mutex.h"

#include <gtest/gtest.h>

#include <thread>

namespace cimrt {
namespace {

/// Books a lock for a scope, as a ranked mutex does.
class Held {
 public:
  explicit Held(Lock_Rank rank) : m_Rank(rank) { note_lock_taken(rank); }
  ~Held() { note_lock_released(m_Rank); }
  Held(const Held&) = delete;
  Held& operator=(const Held&) = delete;

 private:
  Lock_Rank m_Rank;
};

TEST(LockOrder, AllowsEveryInnerLockAndNoOuterOne) {
  const Lock_Rank order[] = {Lock_Rank::ADAPTER_DATA, Lock_Rank::ADAPTER_MAPS, Lock_Rank::SAN_MAPS,
                             Lock_Rank::DATA, Lock_Rank::CLASS_STATIC};
  for (const Lock_Rank outer : order) {
    const Held held(outer);
    for (const Lock_Rank inner : order)
      EXPECT_EQ(may_take_lock(inner, false), inner > outer)
          << "holding " << int(outer) << ", taking " << int(inner);
  }
}

TEST(LockOrder, ThreadLockIsTakenAlone) {
  {
    const Held held(Lock_Rank::THREAD);
    for (int rank = 0; rank <= int(Lock_Rank::CLASS_STATIC); rank++)
      EXPECT_FALSE(may_take_lock(Lock_Rank(rank), true)) << rank;
  }
  {
    const Held held(Lock_Rank::ADAPTER_DATA);
    EXPECT_FALSE(may_take_lock(Lock_Rank::THREAD, false));
  }
  const Held held(Lock_Rank::INSTANCE);
  EXPECT_TRUE(may_take_lock(Lock_Rank::THREAD, false));
}

TEST(LockOrder, InstanceLockIsOutermost) {
  const Held held(Lock_Rank::DATA);
  EXPECT_FALSE(may_take_lock(Lock_Rank::INSTANCE, false));
}

TEST(LockOrder, RecursiveLockMayBeTakenAgain) {
  const Held held(Lock_Rank::CLASS_STATIC);
  EXPECT_TRUE(may_take_lock(Lock_Rank::CLASS_STATIC, true));
  EXPECT_FALSE(may_take_lock(Lock_Rank::CLASS_STATIC, false));
  EXPECT_FALSE(may_take_lock(Lock_Rank::DATA, true));
}

TEST(LockOrder, CountsForEachThreadByItself) {
  const Held held(Lock_Rank::DATA);
  bool allowed = false;
  std::thread([&] { allowed = may_take_lock(Lock_Rank::ADAPTER_DATA, false); }).join();
  EXPECT_TRUE(allowed);
}

TEST(RankedMutex, GivesItsRankBackWithTheLock) {
  Ranked_Mutex data(Lock_Rank::DATA);
  Ranked_Mutex maps(Lock_Rank::ADAPTER_MAPS);
  for (int i = 0; i < 2; i++) {
    Ranked_Lock outer(maps);
    Ranked_Lock inner(data);
    inner.release();
    inner.release();
  }
  EXPECT_TRUE(may_take_lock(Lock_Rank::ADAPTER_DATA, false));
}

#ifndef NDEBUG
TEST(RankedMutexDeathTest, LockOutOfOrderAborts) {
  Ranked_Mutex data(Lock_Rank::DATA);
  Ranked_Mutex maps(Lock_Rank::ADAPTER_MAPS);
  Ranked_Lock inner(data);
  EXPECT_DEATH(maps.lock(), "may_take_lock");
}
#endif

TEST(RankedCond, SleepsOverWakeUpsWithoutCause) {
  Ranked_Mutex mutex(Lock_Rank::ADAPTER_MAPS);
  Ranked_Cond cond;
  int tests = 0;
  bool ready = false;
  std::thread waiter([&] {
    Ranked_Lock lock(mutex);
    cond.wait_until(mutex, [&] {
      tests++;
      return ready;
    });
  });
  // The waiter is woken without cause until it was seen to have looked again.
  for (bool looked = false; !looked;) {
    Ranked_Lock lock(mutex);
    cond.broadcast();
    looked = tests >= 3;
  }
  {
    Ranked_Lock lock(mutex);
    ready = true;
    cond.broadcast();
  }
  waiter.join();
  EXPECT_TRUE(ready);
}

}  // namespace
}  // namespace cimrt
