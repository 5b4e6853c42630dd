// The `stats` command: counters of FC ports, and their rates between two samples.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <vector>

#include "Broker.h"

namespace tvx::host {

/// One counter that is shown.
struct CounterColumn {
  const char* property;  ///< of TVXHBA_FCPortStatistics
  const char* title;
  const char* rateTitle;      ///< null: no rate is shown
  std::uint64_t notSupplied;  ///< how the hardware says that it does not count this
};

inline constexpr std::uint64_t notSupplied = 0xFFFFFFFF;

inline constexpr std::array<CounterColumn, 9> counterColumns = {{
    {"BytesTransmitted", "TX BYTES", "TX/S", 4 * notSupplied},
    {"BytesReceived", "RX BYTES", "RX/S", 4 * notSupplied},
    {"PacketsTransmitted", "TX FRAMES", "TX FRAMES/S", notSupplied},
    {"PacketsReceived", "RX FRAMES", "RX FRAMES/S", notSupplied},
    {"ErrorFrames", "ERRORS", nullptr, notSupplied},
    {"CRCErrors", "CRC", nullptr, notSupplied},
    {"LinkFailures", "LINK FAIL", nullptr, notSupplied},
    {"LossOfSyncCounter", "SYNC LOSS", nullptr, notSupplied},
    {"LossOfSignalCounter", "SIGNAL LOSS", nullptr, notSupplied},
}};

template <class T>
using PerCounter = std::array<std::optional<T>, counterColumns.size()>;

/// What one port counted up to one moment.
struct StatsSample {
  std::string wwpn;                ///< pairs of digits
  std::string time;                ///< CIM datetime of the reading; empty if there was none
  std::uint64_t microseconds = 0;  ///< the same since 1970; 0 if there was none
  PerCounter<std::uint64_t> counters;
};

/// A sample with the rates since an earlier reading; without one there are no rates.
struct StatsRow {
  StatsSample sample;
  PerCounter<double> perSecond;
};

/// A sample of each TVXHBA_FCPortStatistics instance; of one port alone if `wwpn` (pairs of digits)
/// is not empty.
std::vector<StatsSample> statsSamples(const std::vector<Instance>& statistics,
                                      const std::string& wwpn = "");

/// Keeps what was sampled, port by port. The provider reads the hardware at its own pace: a sample
/// of a reading that is known already keeps the rates of that reading.
class StatsRates {
 public:
  std::vector<StatsRow> add(const std::vector<StatsSample>& samples);

 private:
  std::map<std::string, StatsRow> m_Last;
};

/// "1.4 GB/s" and so on, for a rate of bytes.
std::string byteRateWords(double bytesPerSecond);

/// @param withRates adds the columns of the rates, "-" where there is none yet
std::string statsTable(const std::vector<StatsRow>& rows, bool withRates);
nlohmann::ordered_json statsJson(const std::vector<StatsRow>& rows, bool withRates);

}  // namespace tvx::host
