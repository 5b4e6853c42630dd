#include "cli/Stats.h"

#include <gtest/gtest.h>

namespace tvx::host {
namespace {

constexpr std::size_t txBytes = 0;
constexpr std::size_t txFrames = 2;
constexpr std::size_t crc = 5;

Instance statistics(const char* wwpn, const char* time, std::uint64_t bytes, std::uint64_t frames) {
  Instance instance;
  instance.path.className = "TVXHBA_FCPortStatistics";
  instance.properties = {{"ElementName", Value::string(wwpn)},
                         {"BytesTransmitted", Value::number(CMPI_uint64, bytes)},
                         {"PacketsTransmitted", Value::number(CMPI_uint64, frames)},
                         {"CRCErrors", Value::null(CMPI_uint64)}};
  if (time != nullptr) {
    instance.properties.set("StatisticTime", Value::dateTime(time));
  }
  return instance;
}

constexpr const char* port = "1000000000000001";
constexpr const char* first = "20261121100000.000000+000";
constexpr const char* later = "20261121100010.500000+000";
constexpr const char* last = "20261121100020.500000+000";

TEST(StatsTest, ASampleHoldsWhatTheHardwareCounts) {
  const auto samples = statsSamples({statistics(port, first, 4 * notSupplied, notSupplied),
                                     statistics("1000000000000002", nullptr, 8, 2)});
  ASSERT_EQ(samples.size(), 2U);
  EXPECT_EQ(samples[0].wwpn, "10:00:00:00:00:00:00:01");
  EXPECT_EQ(samples[0].time, first);
  EXPECT_FALSE(samples[0].counters[txBytes]);
  EXPECT_FALSE(samples[0].counters[txFrames]);
  EXPECT_FALSE(samples[0].counters[crc]);
  EXPECT_EQ(samples[1].counters[txBytes], 8U);
  EXPECT_EQ(samples[1].counters[txFrames], 2U);
  EXPECT_EQ(samples[1].microseconds, 0U);
}

TEST(StatsTest, OnePortMayBeChosen) {
  const std::vector<Instance> both = {statistics(port, first, 1, 1),
                                      statistics("1000000000000002", first, 2, 2)};
  const auto samples = statsSamples(both, "10:00:00:00:00:00:00:02");
  ASSERT_EQ(samples.size(), 1U);
  EXPECT_EQ(samples[0].counters[txBytes], 2U);
}

TEST(StatsTest, RatesAreThoseBetweenTwoReadings) {
  StatsRates rates;
  const auto add = [&](const char* time, std::uint64_t bytes, std::uint64_t frames) {
    return rates.add(statsSamples({statistics(port, time, bytes, frames)})).at(0);
  };
  EXPECT_FALSE(add(first, 1000, 100).perSecond[txBytes]);
  const StatsRow moved = add(later, 22000, 121);
  EXPECT_DOUBLE_EQ(moved.perSecond[txBytes].value(), 2000);
  EXPECT_DOUBLE_EQ(moved.perSecond[txFrames].value(), 2);
  EXPECT_FALSE(moved.perSecond[crc]);
  // The same reading once more keeps its rates.
  EXPECT_DOUBLE_EQ(add(later, 22000, 121).perSecond[txBytes].value(), 2000);
  EXPECT_DOUBLE_EQ(add(last, 32000, 121).perSecond[txBytes].value(), 1000);
  EXPECT_DOUBLE_EQ(add("20261121100030.500000+000", 32000, 121).perSecond[txFrames].value(), 0);
}

TEST(StatsTest, CountersThatStartAnewHaveNoRate) {
  StatsRates rates;
  rates.add(statsSamples({statistics(port, first, 1000, 100)}));
  const StatsRow row = rates.add(statsSamples({statistics(port, later, 10, 205)})).at(0);
  EXPECT_FALSE(row.perSecond[txBytes]);
  EXPECT_DOUBLE_EQ(row.perSecond[txFrames].value(), 10);
}

TEST(StatsTest, AClockThatWasSetBackStartsTheRatesAnew) {
  StatsRates rates;
  rates.add(statsSamples({statistics(port, later, 1000, 100)}));
  EXPECT_FALSE(rates.add(statsSamples({statistics(port, first, 2000, 200)})).at(0).perSecond[0]);
  EXPECT_DOUBLE_EQ(
      rates.add(statsSamples({statistics(port, later, 23000, 200)})).at(0).perSecond[0].value(),
      2000);
}

TEST(StatsTest, AReadingWithoutATimeHasNoRate) {
  StatsRates rates;
  rates.add(statsSamples({statistics(port, nullptr, 1000, 100)}));
  EXPECT_FALSE(rates.add(statsSamples({statistics(port, first, 2000, 200)})).at(0).perSecond[0]);
}

TEST(StatsTest, RatesOfBytesAreInWords) {
  EXPECT_EQ(byteRateWords(0), "0 B/s");
  EXPECT_EQ(byteRateWords(999), "999 B/s");
  EXPECT_EQ(byteRateWords(1500), "1.5 kB/s");
  EXPECT_EQ(byteRateWords(13926400), "13.9 MB/s");
  EXPECT_EQ(byteRateWords(3.2e12), "3200.0 GB/s");
}

TEST(StatsTest, TheTableHasRatesWhenItIsWatched) {
  StatsRates rates;
  rates.add(statsSamples({statistics(port, first, 1000, 100)}));
  const auto rows = rates.add(statsSamples({statistics(port, later, 22000, 121)}));
  EXPECT_EQ(statsTable(rows, false),
            "WWPN                     TX BYTES  RX BYTES  TX FRAMES  RX FRAMES  ERRORS  CRC  "
            "LINK FAIL  SYNC LOSS  SIGNAL LOSS\n"
            "10:00:00:00:00:00:00:01  22000     -         121        -          -       -    "
            "-          -          -\n");
  EXPECT_EQ(statsTable(rows, true),
            "WWPN                     TX BYTES  TX/S      RX BYTES  RX/S  TX FRAMES  "
            "TX FRAMES/S  RX FRAMES  RX FRAMES/S  ERRORS  CRC  LINK FAIL  SYNC LOSS  "
            "SIGNAL LOSS\n"
            "10:00:00:00:00:00:00:01  22000     2.0 kB/s  -         -     121        "
            "2            -          -            -       -    -          -          -\n");
  EXPECT_EQ(statsTable({}, true), "no FC ports\n");
}

TEST(StatsTest, JsonHasCountersAndRatesByProperty) {
  StatsRates rates;
  rates.add(statsSamples({statistics(port, first, 1000, 100)}));
  const auto rows = rates.add(statsSamples({statistics(port, later, 22000, 121)}));
  const auto plain = statsJson(rows, false);
  EXPECT_EQ(plain[0]["wwpn"], "10:00:00:00:00:00:00:01");
  EXPECT_EQ(plain[0]["time"], later);
  EXPECT_EQ(plain[0]["counters"]["BytesTransmitted"], 22000);
  EXPECT_TRUE(plain[0]["counters"]["CRCErrors"].is_null());
  EXPECT_FALSE(plain[0].contains("perSecond"));
  const auto watched = statsJson(rows, true);
  EXPECT_EQ(watched[0]["perSecond"]["BytesTransmitted"], 2000.0);
  EXPECT_TRUE(watched[0]["perSecond"]["CRCErrors"].is_null());
}

}  // namespace
}  // namespace tvx::host
