#include "runtime/Datetime.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <ctime>
#include <random>
#include <string>

#include "Captured_Stream.h"
#include "runtime/Threads.h"

namespace cimrt {
namespace {

/// While set, the system's clock fails.
bool clock_fails = false;

extern "C" int __real_gettimeofday(struct timeval* time, void* zone);
extern "C" int __wrap_gettimeofday(struct timeval* time, void* zone) {
  return clock_fails ? -1 : __real_gettimeofday(time, zone);
}

constexpr const char* INTERVAL = "00000001020304.000005:000";
constexpr std::uint64_t INTERVAL_USEC = 93784000005u;  // 1 day, 2 h, 3 min, 4 s, 5 us

std::string text_of(const Datetime& datetime, bool prettify = false) {
  char text[Datetime::ASCII_SIZE];
  datetime.ascii(text, prettify);
  return text;
}

/// Runs with a given time zone.
class Time_Zone {
 public:
  explicit Time_Zone(const char* name) {
    setenv("TZ", name, 1);
    tzset();
  }
  ~Time_Zone() {
    unsetenv("TZ");
    tzset();
  }
};

TEST(Datetime, IsTheZeroIntervalAtFirst) {
  const Datetime datetime;
  EXPECT_TRUE(datetime.is_interval());
  EXPECT_FALSE(datetime.is_timestamp());
  EXPECT_EQ(datetime.usec(), 0u);
  EXPECT_EQ(text_of(datetime), "00000000000000.000000:000");
}

TEST(Datetime, ReadsAnInterval) {
  Datetime datetime(7, 8);
  ASSERT_TRUE(datetime.set(INTERVAL));
  EXPECT_TRUE(datetime.is_interval());
  EXPECT_EQ(datetime.usec(), INTERVAL_USEC);
  std::uint32_t days = 0, hours = 0, minutes = 0, seconds = 0, us = 0;
  datetime.get_interval(days, hours, minutes, seconds, us);
  EXPECT_EQ(days, 1u);
  EXPECT_EQ(hours, 2u);
  EXPECT_EQ(minutes, 3u);
  EXPECT_EQ(seconds, 4u);
  EXPECT_EQ(us, 5u);
}

TEST(Datetime, ReadsATimestampAsLocalTimeAndKeepsTheOffsetAside) {
  const Time_Zone zone("UTC0");
  Datetime datetime;
  ASSERT_TRUE(datetime.set("20010203040506.000007+090"));
  EXPECT_TRUE(datetime.is_timestamp());
  EXPECT_EQ(datetime.usec(), 981173106000007u);
  EXPECT_EQ(datetime.utc(), 90);
  ASSERT_TRUE(datetime.set("20010203040506.000007-090"));
  EXPECT_EQ(datetime.usec(), 981173106000007u);
  EXPECT_EQ(datetime.utc(), -90);
}

TEST(Datetime, ReadsTheSameTextAsAnotherMomentInAnotherZone) {
  const Time_Zone zone("XST-2");
  const Datetime datetime("20010203040506.000000+000");
  EXPECT_EQ(datetime.usec(), 981165906000000u);
  EXPECT_EQ(text_of(datetime), "20010203040506.000000+000");
}

struct Refused_Text {
  const char* name;
  const char* text;
};

class Datetime_Refuses : public testing::TestWithParam<Refused_Text> {};

TEST_P(Datetime_Refuses, LeavingTheValueAlone) {
  Datetime datetime(42, 7);
  const Datetime sharer(datetime);
  EXPECT_FALSE(datetime.set(GetParam().text));
  EXPECT_TRUE(datetime.equal(sharer));
  EXPECT_TRUE(Datetime(GetParam().text).equal(Datetime()));
}

INSTANTIATE_TEST_SUITE_P(
    Texts, Datetime_Refuses,
    testing::Values(Refused_Text{"Null", nullptr}, Refused_Text{"Empty", ""},
                    Refused_Text{"Length24", "0000001020304.000005:000"},
                    Refused_Text{"Length26", "000000001020304.000005:000"},
                    Refused_Text{"IntervalWithoutZeros", "00000001020304.000005:001"},
                    Refused_Text{"IntervalZerosMissing", "00000001020304.000005:0x0"},
                    Refused_Text{"OtherKind", "00000001020304.000005;000"},
                    Refused_Text{"NoDot", "00000001020304,000005:000"},
                    Refused_Text{"LetterInDays", "0000000a020304.000005:000"},
                    Refused_Text{"SpaceInSeconds", "000000010203 4.000005:000"},
                    Refused_Text{"LetterInMicroseconds", "00000001020304.00000x:000"},
                    Refused_Text{"LetterInYear", "2o010203040506.000007+090"},
                    Refused_Text{"TimestampNoDot", "20010203040506:000007+090"},
                    Refused_Text{"LetterInOffset", "20010203040506.000007+09x"},
                    Refused_Text{"SignInOffset", "20010203040506.000007+-90"}),
    [](const auto& param) { return param.param.name; });

/// True if both hold the same rep: a datetime is one pointer to it.
bool share_a_rep(const Datetime& a, const Datetime& b) {
  static_assert(sizeof(Datetime) == sizeof(void*));
  return std::memcmp(static_cast<const void*>(&a), static_cast<const void*>(&b), sizeof a) == 0;
}

TEST(Datetime, CopiesShareTheRepUntilATextIsSetEvenOneThatIsRefused) {
  Datetime datetime(42, 7);
  const Datetime sharer(datetime);
  EXPECT_TRUE(share_a_rep(datetime, sharer));
  EXPECT_FALSE(datetime.set("no datetime"));
  EXPECT_FALSE(share_a_rep(datetime, sharer));
  EXPECT_TRUE(datetime.equal(sharer));
}

TEST(Datetime, DoesNotCheckTheRangeOfFields) {
  Datetime datetime;
  EXPECT_TRUE(datetime.set("00000000997799.000000:000"));
  EXPECT_EQ(datetime.usec(), (99ull * 3600 + 77 * 60 + 99) * 1000000);
  const Time_Zone zone("UTC0");
  EXPECT_TRUE(datetime.set("20001301000000.000000+000"));
  EXPECT_EQ(text_of(datetime), "20010101000000.000000+000");
}

TEST(Datetime, WritesBothFormsOfAnInterval) {
  const Datetime datetime(INTERVAL);
  EXPECT_EQ(text_of(datetime), INTERVAL);
  EXPECT_EQ(text_of(datetime, true), "00000001 02 03 04.000005:000");
}

TEST(Datetime, WritesBothFormsOfATimestamp) {
  const Time_Zone zone("UTC0");
  EXPECT_EQ(text_of(Datetime(981173106000007u, 90)), "20010203040506.000007+090");
  EXPECT_EQ(text_of(Datetime(981173106000007u, -5), true), "2001/02/03 04:05:06.000007-005");
  EXPECT_EQ(text_of(Datetime(0, 0)), "19700101000000.000000+000");
}

TEST(Datetime, WritesExtremeValuesWithinItsRoom) {
  for (const std::int32_t utc : {INT32_MIN, INT32_MAX}) {
    const Datetime datetime(UINT64_MAX, utc);
    EXPECT_LT(text_of(datetime, true).size(), Datetime::ASCII_SIZE);
  }
  EXPECT_LT(text_of(Datetime(UINT64_MAX)).size(), Datetime::ASCII_SIZE);
}

TEST(Datetime, SettersAndGettersOfATimestampAreInverse) {
  const Time_Zone zone("UTC0");
  Datetime datetime;
  datetime.set_timestamp(2024, 2, 29, 23, 59, 58, 123456, -480);
  std::uint32_t year = 0, month = 0, day = 0, hours = 0, minutes = 0, seconds = 0, us = 0;
  std::int32_t utc = 0;
  datetime.get_timestamp(year, month, day, hours, minutes, seconds, us, utc);
  EXPECT_EQ(year, 2024u);
  EXPECT_EQ(month, 2u);
  EXPECT_EQ(day, 29u);
  EXPECT_EQ(hours, 23u);
  EXPECT_EQ(minutes, 59u);
  EXPECT_EQ(seconds, 58u);
  EXPECT_EQ(us, 123456u);
  EXPECT_EQ(utc, -480);
}

TEST(Datetime, ChangesMakeTheRepPrivate) {
  Datetime a(1, 2);
  const Datetime b(a);
  a.usec(10);
  EXPECT_EQ(b.usec(), 1u);
  Datetime c(b);
  c.utc(20);
  EXPECT_EQ(b.utc(), 2);
  EXPECT_EQ(c.usec(), 1u);
  Datetime d(b);
  d.clear();
  EXPECT_TRUE(d.equal(Datetime()));
  EXPECT_EQ(b.usec(), 1u);
  Datetime e(b);
  e.set_interval(0, 0, 0, 1, 0);
  EXPECT_TRUE(e.equal(Datetime(1000000)));
  EXPECT_TRUE(b.is_timestamp());
}

TEST(Datetime, EqualComparesValueOffsetAndKind) {
  EXPECT_TRUE(Datetime(1, 2) == Datetime(1, 2));
  EXPECT_FALSE(Datetime(1, 2) == Datetime(1, 3));
  EXPECT_FALSE(Datetime(1, 2) == Datetime(2, 2));
  EXPECT_FALSE(Datetime(1, 0) == Datetime(1));
}

TEST(Datetime, NowIsATimestampOfTheCurrentTime) {
  const std::uint64_t before = Time::now();
  const Datetime now = Datetime::now();
  const std::uint64_t after = Time::now();
  EXPECT_TRUE(now.is_timestamp());
  EXPECT_GE(now.usec(), before);
  EXPECT_LE(now.usec(), after);
}

TEST(Datetime, NowIsAZeroIntervalWhenTheClockFails) {
  clock_fails = true;
  const Datetime now = Datetime::now();
  clock_fails = false;
  EXPECT_TRUE(now.is_interval());
  EXPECT_EQ(now.usec(), 0U);
  EXPECT_EQ(now.utc(), 0);
}

TEST(Datetime, PrintsItsText) {
  test::Captured_Stream stream;
  Datetime(INTERVAL).print(stream.file(), false);
  EXPECT_EQ(stream.text(), INTERVAL);
}

TEST(Datetime, RandomValuesSurviveTheirText) {
  const Time_Zone zone("UTC0");
  std::mt19937_64 random(7);
  for (int i = 0; i < 2000; ++i) {
    const Datetime interval(random() % (100000000ull * 86400000000ull));
    EXPECT_TRUE(Datetime(text_of(interval).c_str()).equal(interval)) << text_of(interval);
    const Datetime timestamp(random() % 4102444800000000ull,
                             static_cast<std::int32_t>(random() % 1999) - 999);
    EXPECT_TRUE(Datetime(text_of(timestamp).c_str()).equal(timestamp)) << text_of(timestamp);
  }
}

}  // namespace
}  // namespace cimrt
