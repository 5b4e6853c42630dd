// The runtime's own trace log, off unless an rc file in "CIMRT_HOME" turns it on.
#pragma once

#include <cstdarg>

namespace cimrt {

enum Log_Level : int { LOG_FATAL_ = 0, LOG_ERR_ = 1, LOG_WARN_ = 2, LOG_INFO_ = 3, LOG_DBG_ = 4 };

extern bool _log_enabled_state;

int log_enable(bool flag);
int log_set_level(const char* name);
int string_to_log_level(const char* name, int& out);
void log(int level, const char* file, int line, const char* fmt, ...)
    __attribute__((format(printf, 4, 5)));
void vlog(int level, const char* file, int line, const char* fmt, va_list args)
    __attribute__((format(printf, 4, 0)));

}  // namespace cimrt

/// Trace line of the runtime; costs one test when the log is switched off.
#define CIMRT_TRACE(LEVEL, ...)                                                            \
  do {                                                                                     \
    if (::cimrt::_log_enabled_state) ::cimrt::log(LEVEL, __FILE__, __LINE__, __VA_ARGS__); \
  } while (0)
