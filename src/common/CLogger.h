// The provider's logger: one singleton that hands every message to a list of back ends.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>
#include <vector>

#include "common/TVX_Log_Backends.h"
#include "runtime/Lasting.h"
#include "runtime/Threads.h"

namespace cimrt {

/// Levels, by number. Note the order: a warning stands above an error.
inline constexpr int TVX_INVALID = 0;
inline constexpr int TVX_CRIT = 1;
inline constexpr int TVX_WARN = 2;
inline constexpr int TVX_ERR = 3;
inline constexpr int TVX_INFO = 4;
inline constexpr int TVX_DBG = 5;

/// "TVX_INVALID" to "TVX_DBG"; "TVX_INVALID" for any number outside 0 to 5.
const char* tvxLevelName(int level);

/// Log modes.
inline constexpr int TVX_LOG_MODE_OFF = 0;       ///< back ends closed
inline constexpr int TVX_LOG_MODE_MEMORY = 1;    ///< records in memory
inline constexpr int TVX_LOG_MODE_FILE = 2;      ///< log file
inline constexpr int TVX_LOG_MODE_RESERVED = 3;  ///< no consumer
inline constexpr int TVX_LOG_MODE_BOTH = 4;      ///< records and log file

/// Path of the log that is used while nothing is configured, without the TVX_ROOT prefix.
inline constexpr const char* TVX_FFDC_LOG_PATH =
    "/opt/ibm/platform/log/torvex_fc_provider_ffdc.log";

/// The logger. Get it from `getLogger()`. All operations may be called from any thread; the log
/// mutex is the innermost lock of the process, and no back end logs.
class CLogger {
 public:
  /// Formats the message and hands it to every back end in order, under the log mutex. A disabled
  /// logger hands it to the registered `TVX_CIMLogger` alone. No failure reaches the caller.
  /// @param file source file name, kept by nobody
  /// @param line points to the source line; null counts as 0
  void log(const char* file, const unsigned* line, int level, const char* format, ...)
      __attribute__((format(printf, 5, 6)));

  /// Adds a back end (not owned; it must outlive its registration). 1, or 0 if it is there already.
  /// A `TVX_CIMLogger` also becomes the one that a disabled logger feeds.
  int registerInterface(TVX_LoggerInterface* interface);
  /// Removes a back end. 1 if it was found, else 0.
  int unregisterInterface(TVX_LoggerInterface* interface);
  /// Empties the list. Messages after this go nowhere.
  void dropInterfaces();

  /// Reads the dump file and applies it; see `isDumpAccessible` for a file that is not there.
  void loadConfig();
  /// Writes mode, level, enabled and the log file's path to the dump file. False if it can't be
  /// written; then an earlier one stands as it was.
  bool writeDump();
  /// True if the dump file can be read; logs the reason at `TVX_CRIT` if not.
  bool isDumpAccessible();
  /// The dump file without the TVX_ROOT prefix. Settled by the first need.
  const std::string& dumpPath();

  /// Stores the mode; 0 closes every back end, any other opens every one.
  void setMode(int mode);
  int mode() const { return m_Mode.load(std::memory_order_relaxed); }
  /// Accepts 1 to 5; any other value changes nothing.
  void setLevel(int level);
  int level() const { return m_Level.load(std::memory_order_relaxed); }
  void enable() { m_Enabled.store(1, std::memory_order_relaxed); }
  void disable() { m_Enabled.store(0, std::memory_order_relaxed); }
  bool isEnabled() const { return m_Enabled.load(std::memory_order_relaxed) != 0; }
  /// The mark that the first-failure log is in use.
  void setDefaultLog() { m_bDefaultLog.store(true, std::memory_order_relaxed); }
  void clearDefaultLog() { m_bDefaultLog.store(false, std::memory_order_relaxed); }
  bool isDefaultLog() const { return m_bDefaultLog.load(std::memory_order_relaxed); }
  /// Clears every back end: the log file is emptied and the records are dropped.
  void clearAll();

  /// The path of the first `TVX_FileLogger` in the list; empty if it has none, or there is none.
  std::string logFilePath();

  CLogger(const CLogger&) = delete;
  CLogger& operator=(const CLogger&) = delete;

 private:
  friend class Lasting<CLogger>;
  CLogger() = default;
  ~CLogger() = default;

  struct Dump_Settings;
  bool parseDump(char* line, const char* path, Dump_Settings& settings);
  bool takeDumpPath(const char* path);
  TVX_FileLogger* fileLogger();  // caller holds the log mutex

  std::atomic<int> m_Mode{0};
  std::atomic<int> m_Level{0};
  std::atomic<int> m_Enabled{0};
  std::atomic<bool> m_bDefaultLog{false};
  // Guarded by the log mutex.
  std::vector<TVX_LoggerInterface*> m_Interfaces;
  bool m_bDumpPathSet = false;
  std::string m_DumpPath;
};

/// The singleton: made at first use, gone when the library leaves the process.
CLogger& getLogger();

/// The first-failure log's path with the TVX_ROOT prefix.
std::string tvxFfdcLogPath();

}  // namespace cimrt

/// Logs one message of the provider's own code: `TVX_LOG(TVX_ERR, "open failed: %s", text)`.
/// A macro, because file and line of the caller are wanted.
#define TVX_LOG(LEVEL, ...)                                              \
  do {                                                                   \
    static constexpr unsigned tvxLogLine = __LINE__;                     \
    ::cimrt::getLogger().log(__FILE__, &tvxLogLine, LEVEL, __VA_ARGS__); \
  } while (false)
