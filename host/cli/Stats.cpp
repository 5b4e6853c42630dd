#include "cli/Stats.h"

#include <fmt/format.h>

#include "cim/DateTimeText.h"
#include "cli/Ports.h"
#include "cli/Table.h"

namespace tvx::host {
namespace {

constexpr double microsecondsPerSecond = 1e6;
constexpr std::size_t byteCounters = 2;  // the first columns count bytes

std::optional<std::uint64_t> counterOf(const Instance& instance, const CounterColumn& column) {
  const Value* value = instance.properties.find(column.property);
  if (value == nullptr || value->isNull() || value->asUnsigned() == column.notSupplied) {
    return std::nullopt;
  }
  return value->asUnsigned();
}

StatsSample sampleOf(const Instance& instance) {
  StatsSample sample;
  sample.wwpn = wwnText(instance.text("ElementName"));
  sample.time = instance.text("StatisticTime");
  sample.microseconds = dateTimeMicroseconds(sample.time).value_or(0);
  for (std::size_t i = 0; i < counterColumns.size(); ++i) {
    sample.counters[i] = counterOf(instance, counterColumns[i]);
  }
  return sample;
}

/// The rate of one counter; nothing if one of the readings lacks it, or if it started anew.
std::optional<double> rate(const std::optional<std::uint64_t>& before,
                           const std::optional<std::uint64_t>& after, double seconds) {
  if (!before || !after || *after < *before) {
    return std::nullopt;
  }
  return static_cast<double>(*after - *before) / seconds;
}

PerCounter<double> ratesBetween(const StatsSample& before, const StatsSample& after) {
  const double seconds =
      static_cast<double>(after.microseconds - before.microseconds) / microsecondsPerSecond;
  PerCounter<double> rates;
  for (std::size_t i = 0; i < rates.size(); ++i) {
    rates[i] = rate(before.counters[i], after.counters[i], seconds);
  }
  return rates;
}

std::string rateWords(std::size_t column, const std::optional<double>& perSecond) {
  if (!perSecond) {
    return "-";
  }
  return column < byteCounters ? byteRateWords(*perSecond) : fmt::format("{:.0f}", *perSecond);
}

std::vector<std::string> headOf(bool withRates) {
  std::vector<std::string> head = {"WWPN"};
  for (const CounterColumn& column : counterColumns) {
    head.emplace_back(column.title);
    if (withRates && column.rateTitle != nullptr) {
      head.emplace_back(column.rateTitle);
    }
  }
  return head;
}

std::vector<std::string> cellsOf(const StatsRow& row, bool withRates) {
  std::vector<std::string> cells = {row.sample.wwpn};
  for (std::size_t i = 0; i < counterColumns.size(); ++i) {
    const std::optional<std::uint64_t>& counter = row.sample.counters[i];
    cells.push_back(counter ? std::to_string(*counter) : "-");
    if (withRates && counterColumns[i].rateTitle != nullptr) {
      cells.push_back(rateWords(i, row.perSecond[i]));
    }
  }
  return cells;
}

template <class T>
nlohmann::ordered_json valueOrNull(const std::optional<T>& value) {
  return value ? nlohmann::ordered_json(*value) : nlohmann::ordered_json(nullptr);
}

nlohmann::ordered_json rowJson(const StatsRow& row, bool withRates) {
  nlohmann::ordered_json json = {{"wwpn", row.sample.wwpn}, {"time", row.sample.time}};
  for (std::size_t i = 0; i < counterColumns.size(); ++i) {
    json["counters"][counterColumns[i].property] = valueOrNull(row.sample.counters[i]);
    if (withRates) {
      json["perSecond"][counterColumns[i].property] = valueOrNull(row.perSecond[i]);
    }
  }
  return json;
}

}  // namespace

std::vector<StatsSample> statsSamples(const std::vector<Instance>& statistics,
                                      const std::string& wwpn) {
  std::vector<StatsSample> samples;
  for (const Instance& instance : statistics) {
    StatsSample sample = sampleOf(instance);
    if (wwpn.empty() || sample.wwpn == wwpn) {
      samples.push_back(std::move(sample));
    }
  }
  return samples;
}

std::vector<StatsRow> StatsRates::add(const std::vector<StatsSample>& samples) {
  std::vector<StatsRow> rows;
  for (const StatsSample& sample : samples) {
    StatsRow& last = m_Last[sample.wwpn];
    if (last.sample.microseconds == 0 || sample.microseconds < last.sample.microseconds) {
      last = {sample, {}};
    } else if (sample.microseconds > last.sample.microseconds) {
      last = {sample, ratesBetween(last.sample, sample)};
    }
    rows.push_back(last);
  }
  return rows;
}

std::string byteRateWords(double bytesPerSecond) {
  constexpr const char* units[] = {"B/s", "kB/s", "MB/s", "GB/s"};
  constexpr double step = 1000;
  std::size_t unit = 0;
  while (bytesPerSecond >= step && unit + 1 < std::size(units)) {
    bytesPerSecond /= step;
    ++unit;
  }
  return unit == 0 ? fmt::format("{:.0f} {}", bytesPerSecond, units[unit])
                   : fmt::format("{:.1f} {}", bytesPerSecond, units[unit]);
}

std::string statsTable(const std::vector<StatsRow>& rows, bool withRates) {
  if (rows.empty()) {
    return "no FC ports\n";
  }
  Table table(headOf(withRates));
  for (const StatsRow& row : rows) {
    table.add(cellsOf(row, withRates));
  }
  return table.text();
}

nlohmann::ordered_json statsJson(const std::vector<StatsRow>& rows, bool withRates) {
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  for (const StatsRow& row : rows) {
    list.push_back(rowJson(row, withRates));
  }
  return list;
}

}  // namespace tvx::host
