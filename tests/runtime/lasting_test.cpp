// Static objects and the end of a process around a library at work.
#include "runtime/Lasting.h"

#include <gtest/gtest.h>

namespace cimrt::test {
namespace {

struct Counted {
  explicit Counted(int& count) : ended(count) {}
  ~Counted() { ++ended; }
  int& ended;
};

TEST(Lasting, IsDestroyedWhenNobodyIsAtWork) {
  int ended = 0;
  { const Lasting<Counted> object(ended); }
  EXPECT_EQ(ended, 1);
}

TEST(Lasting, OutlastsItsEndWhileSomebodyIsAtWork) {
  int ended = 0;
  {
    const At_Work first;
    {
      const At_Work second;
      EXPECT_TRUE(At_Work::any());
    }
    { const Lasting<Counted> object(ended); }
    EXPECT_EQ(ended, 0);
  }
  EXPECT_FALSE(At_Work::any());
  { const Lasting<Counted> object(ended); }
  EXPECT_EQ(ended, 1);
}

}  // namespace
}  // namespace cimrt::test
