// The runtime's own trace log, off unless an rc file in "CIMRT_HOME" turns it on.
#pragma once

#include <atomic>
#include <cstdarg>

namespace cimrt {

enum Log_Level : int { LOG_FATAL_ = 0, LOG_ERR_ = 1, LOG_WARN_ = 2, LOG_INFO_ = 3, LOG_DBG_ = 4 };

/// Tested by callers before anything is formatted. Starts as true.
extern std::atomic<bool> _log_enabled_state;

/// Switches the callers' test: 0, or -1 if it stood so already.
int log_enable(bool flag);
/// Sets the level by its name ("FATAL", "ERR", "WARN", "INFO", "DBG", in any case): 0, or -1 for
/// another name.
int log_set_level(const char* name);
/// The same into `out`, which a wrong name leaves alone.
int string_to_log_level(const char* name, int& out);

/// Writes one line, if the first call in the process found the rc file and `level` is not above the
/// log's. Any thread, several processes; not from a signal handler.
void log(int level, const char* file, int line, const char* fmt, ...)
    __attribute__((format(printf, 4, 5)));
void vlog(int level, const char* file, int line, const char* fmt, va_list args)
    __attribute__((format(printf, 4, 0)));

/// Where a log line comes from.
struct Log_Call {
  int level;
  const char* file;
  int line;
};
void _log_call(const Log_Call& call, const char* fmt, ...) __attribute__((format(printf, 2, 3)));

}  // namespace cimrt

/// Trace line of the runtime; costs one test when the log is switched off.
#define CIMRT_TRACE(LEVEL, ...)                                                            \
  do {                                                                                     \
    if (::cimrt::_log_enabled_state) ::cimrt::log(LEVEL, __FILE__, __LINE__, __VA_ARGS__); \
  } while (0)
