// One value copied and dropped by many threads at once; meant for the thread sanitizer.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "Test_Schema.h"
#include "runtime/Log.h"

namespace cimrt {
namespace {

using namespace test;

constexpr int THREADS = 8;
constexpr int ROUNDS = 2000;

template <class Work>
void run_in_threads(Work work) {
  std::vector<std::thread> threads;
  for (int t = 0; t < THREADS; ++t)
    threads.emplace_back([&work] {
      for (int i = 0; i < ROUNDS; ++i) work();
    });
  for (std::thread& thread : threads) thread.join();
}

TEST(Sharing, OneStringIsCopiedAndDroppedByManyThreads) {
  const String text("a text that is shared by many threads");
  run_in_threads([&text] {
    String copy(text);
    String second;
    second = copy;
    copy.append('!');
    ASSERT_EQ(second.size() + 1, copy.size());
  });
  EXPECT_EQ(text.rep()->refs.load(), 1u);
  EXPECT_STREQ(text.c_str(), "a text that is shared by many threads");
}

TEST(Sharing, TheEmptyStringIsCopiedAndChangedByManyThreads) {
  const String empty;
  run_in_threads([&empty] {
    String copy(empty);
    copy.append("x");
    copy.clear();
    copy = empty;
    ASSERT_TRUE(copy.empty());
  });
  EXPECT_EQ(empty.rep(), String::empty_rep());
}

TEST(Sharing, TheLastOwnerOfAStringFreesIt) {
  for (int i = 0; i < 200; ++i) {
    std::vector<std::thread> threads;
    {
      const String text("owned by whoever is last");
      for (int t = 0; t < 4; ++t)
        threads.emplace_back([copy = text] { ASSERT_EQ(copy.size(), 24u); });
    }
    for (std::thread& thread : threads) thread.join();
  }
}

TEST(Sharing, OneDatetimeIsCopiedAndDroppedByManyThreads) {
  const Datetime when(5, 6);
  run_in_threads([&when] {
    Datetime copy(when);
    const Datetime second(copy);
    copy.usec(7);
    ASSERT_EQ(second.usec(), 5u);
  });
  EXPECT_EQ(when.usec(), 5u);
}

TEST(Sharing, OneInstanceIsClonedCountedAndReadByManyThreads) {
  const Ref<T_Link> link = make_link(make_device("a", 1), make_device("b", 2));
  link->__name_space.assign("root/torvex");
  run_in_threads([&link] {
    const Ref<T_Link> counted(link);
    const Ref<T_Link> copy(clone(link.get()));
    copy->Antecedent->Name.set("changed");
    ASSERT_FALSE(key_eq(copy.get(), counted.get()));
  });
  EXPECT_EQ(link->refs.load(), 1u);
  EXPECT_STREQ(link->Antecedent->Name.value.c_str(), "a");
}

TEST(Sharing, ARunTimeClassLivesAsLongAsItsInstances) {
  Meta_Class* mc = clone(&T_Device::static_meta_class);
  run_in_threads([mc] {
    const Ref<Instance> instance(create(mc, true));
    const Ref<Instance> copy(clone(instance.get()));
    ASSERT_EQ(copy->meta_class, mc);
  });
  EXPECT_EQ(mc->refs.load(), 1u);
  unref(mc);
}

TEST(Sharing, TheLogSwitchIsReadAndWrittenByManyThreads) {
  run_in_threads([] {
    log_enable(false);
    CIMRT_TRACE(LOG_DBG_, "traced");
    log_enable(true);
  });
  EXPECT_EQ(log_enable(true), -1);
}

}  // namespace
}  // namespace cimrt
