#include <gtest/gtest.h>

#include "cim/DateTimeText.h"

namespace tvx::host {
namespace {

TEST(DateTimeTextTest, KnowsTheTextForm) {
  EXPECT_TRUE(isDateTimeText("20230102030405.000006+060"));
  EXPECT_TRUE(isDateTimeText("00000001020304.000005:000"));
  EXPECT_TRUE(isDateTimeText("2023****030405.******+060"));
  EXPECT_FALSE(isDateTimeText(""));
  EXPECT_FALSE(isDateTimeText("20230102030405.000006+06"));
  EXPECT_FALSE(isDateTimeText("20230102030405,000006+060"));
  EXPECT_FALSE(isDateTimeText("2023010203040x.000006+060"));
  EXPECT_FALSE(isDateTimeText("20230102030405.000006*060"));
}

TEST(DateTimeTextTest, PointsInTimeGoToMicrosecondsInUtc) {
  EXPECT_EQ(dateTimeMicroseconds("19700101000000.000000+000"), 0U);
  EXPECT_EQ(dateTimeMicroseconds("19700101010000.000007+060"), 7U);
  EXPECT_EQ(dateTimeMicroseconds("19691231230000.000007-060"), std::nullopt)
      << "the date lies before 1970";
  EXPECT_EQ(dateTimeMicroseconds("19700101000000.000000-001"), 60000000U);
  EXPECT_EQ(dateTimeMicroseconds("20230102030405.000006+000"), 1672628645000006U);
  EXPECT_EQ(dateTimeMicroseconds("20231302030405.000006+000"), std::nullopt)
      << "there is no month 13";
  EXPECT_EQ(dateTimeMicroseconds("nonsense"), std::nullopt);
}

TEST(DateTimeTextTest, BinaryFormGoesBackToText) {
  EXPECT_EQ(dateTimeText(1672628645000006U, false), "20230102030405.000006+000");
  EXPECT_EQ(dateTimeText(0, true), "00000000000000.000000:000");
  const std::uint64_t interval = ((500 * 24 + 1) * 3600 + 2 * 60 + 3) * std::uint64_t{1000000} + 4;
  EXPECT_EQ(dateTimeText(interval, true), "00000500010203.000004:000");
  EXPECT_EQ(dateTimeMicroseconds("00000500010203.000004:000"), interval);
}

TEST(DateTimeTextTest, IntervalsAreToldByTheirColon) {
  EXPECT_TRUE(isIntervalText("00000500010203.000004:000"));
  EXPECT_FALSE(isIntervalText("20230102030405.000006+000"));
  EXPECT_FALSE(isIntervalText(":"));
}

}  // namespace
}  // namespace tvx::host
