#include "common/CLogger.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>

#include "common/TVX_Common.h"
#include "common/TVX_File.h"
#include "common/TVX_Formatted.h"
#include "common/TVX_Path.h"
#include "common/TVX_Replace_File.h"
#include "runtime/Buffer.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

constexpr std::array<const char*, 6> LEVEL_NAMES = {"TVX_INVALID", "TVX_CRIT", "TVX_WARN",
                                                    "TVX_ERR",     "TVX_INFO", "TVX_DBG"};

constexpr const char* DUMP_PATH = "/etc/torvex_fc_provider.dmp";
constexpr const char* DUMP_PATH_READ_ONLY = "/var/log/torvex_fc_provider.dmp";

/// Room for the dump's lines, with the NUL.
constexpr std::size_t SETTINGS_LINE = 20;
constexpr std::size_t PATH_LINE = 256;

/// The innermost lock of the process; it goes with the library, like the logger.
Mutex& logMutex() {
  static Lasting<Mutex> mutex;
  return *mutex;
}

/// The back end that a disabled logger feeds. Guarded by the log mutex.
TVX_CIMLogger* registeredCIMLogger = nullptr;

void logRefused(const char* name, const char* path, bool shown, int value) {
  if (shown) {
    TVX_LOG(TVX_ERR, "Invalid value for %s from config data file -%s-%u", name, path,
            static_cast<unsigned>(value));
  } else {
    TVX_LOG(TVX_ERR, "Invalid value for %s from config data file - %s", name, path);
  }
}

void cutAtLast(char* text, char c) {
  if (char* found = std::strrchr(text, c)) *found = '\0';
}

}  // namespace

const char* tvxLevelName(int level) {
  const bool known = level >= 0 && static_cast<std::size_t>(level) < LEVEL_NAMES.size();
  return LEVEL_NAMES[known ? static_cast<std::size_t>(level) : 0];
}

std::string tvxFfdcLogPath() {
  return tvxPath(TVX_FFDC_LOG_PATH);
}

CLogger& getLogger() {
  static Lasting<CLogger> logger;
  return *logger;
}

void CLogger::log(const char* file, const unsigned* line, int level, const char* format, ...) {
  va_list args;
  va_start(args, format);
  try {
    const TVX_Formatted text(format, args);
    // Held for a disabled logger too: its back end must not go away under the message.
    const Auto_Mutex lock(logMutex());
    if (!isEnabled() && registeredCIMLogger != nullptr) {
      registeredCIMLogger->log(level, file, line, text.c_str());
    } else {
      for (TVX_LoggerInterface* interface : m_Interfaces)
        interface->log(level, file, line, text.c_str());
    }
  } catch (const std::bad_alloc&) {
    // The message is lost. Whoever has something to say must not fail over it, least of all the
    // refresh thread or a destructor.
  }
  va_end(args);
}

// ---- Back ends ----

int CLogger::registerInterface(TVX_LoggerInterface* interface) {
  if (interface == nullptr) return 0;
  const Auto_Mutex lock(logMutex());
  if (std::find(m_Interfaces.begin(), m_Interfaces.end(), interface) != m_Interfaces.end()) {
    return 0;
  }
  m_Interfaces.push_back(interface);
  if (auto* cim = dynamic_cast<TVX_CIMLogger*>(interface)) registeredCIMLogger = cim;
  return 1;
}

int CLogger::unregisterInterface(TVX_LoggerInterface* interface) {
  const Auto_Mutex lock(logMutex());
  if (static_cast<TVX_LoggerInterface*>(registeredCIMLogger) == interface) {
    registeredCIMLogger = nullptr;
  }
  return std::erase(m_Interfaces, interface) != 0 ? 1 : 0;
}

void CLogger::dropInterfaces() {
  const Auto_Mutex lock(logMutex());
  m_Interfaces.clear();
  registeredCIMLogger = nullptr;
}

void CLogger::setMode(int mode) {
  const Auto_Mutex lock(logMutex());
  m_Mode.store(mode, std::memory_order_relaxed);
  for (TVX_LoggerInterface* interface : m_Interfaces) {
    if (mode == TVX_LOG_MODE_OFF) {
      interface->close();
    } else {
      interface->open();
    }
  }
}

void CLogger::setLevel(int level) {
  if (level >= TVX_CRIT && level <= TVX_DBG) m_Level.store(level, std::memory_order_relaxed);
}

void CLogger::clearAll() {
  const Auto_Mutex lock(logMutex());
  for (TVX_LoggerInterface* interface : m_Interfaces) interface->clear();
}

TVX_FileLogger* CLogger::fileLogger() {
  for (TVX_LoggerInterface* interface : m_Interfaces) {
    if (auto* file = dynamic_cast<TVX_FileLogger*>(interface)) return file;
  }
  return nullptr;
}

std::string CLogger::logFilePath() {
  const Auto_Mutex lock(logMutex());
  const TVX_FileLogger* file = fileLogger();
  return file != nullptr ? file->path() : std::string();
}

// ---- Dump file ----

/// The first line of the dump file.
struct CLogger::Dump_Settings {
  int mode = 0;
  int level = 0;
  int enabled = 0;
};

const std::string& CLogger::dumpPath() {
  {
    const Auto_Mutex lock(logMutex());
    if (m_bDumpPathSet) return m_DumpPath;
  }
  const bool readOnly = IsReadOnlyFS();  // logs, so not under the lock
  const Auto_Mutex lock(logMutex());
  if (!m_bDumpPathSet) m_DumpPath = readOnly ? DUMP_PATH_READ_ONLY : DUMP_PATH;
  m_bDumpPathSet = true;
  return m_DumpPath;
}

bool CLogger::isDumpAccessible() {
  if (::access(tvxPath(dumpPath().c_str()).c_str(), R_OK) == 0) return true;
  const int error = errno;
  TVX_LOG(TVX_CRIT, "File access failed with %s", std::strerror(error));
  return false;
}

bool CLogger::parseDump(char* line, const char* path, Dump_Settings& settings) {
  struct Field {
    const char* name;
    int Dump_Settings::*value;
    int largest;
    bool shown;  // whether the message shows a refused value
  };
  static constexpr Field FIELDS[] = {
      {"Log Mode", &Dump_Settings::mode, TVX_LOG_MODE_BOTH, true},
      {"Log Level", &Dump_Settings::level, TVX_DBG, true},
      {"Log Enabled", &Dump_Settings::enabled, INT_MAX, false},
  };
  char* rest = nullptr;
  for (const Field& field : FIELDS) {
    const char* token = tvxStrtok(line, ",", &rest);
    line = nullptr;
    if (token == nullptr) {
      TVX_LOG(TVX_ERR, "Unable to read %s from config data file - %s", field.name, path);
      return false;
    }
    const long long number = std::strtoll(token, nullptr, 10);
    const int value = static_cast<int>(std::clamp<long long>(number, INT_MIN, INT_MAX));
    if (value < 0 || value > field.largest) {
      logRefused(field.name, path, field.shown, value);
      return false;
    }
    settings.*field.value = value;
  }
  return true;
}

bool CLogger::takeDumpPath(const char* path) {
  const Auto_Mutex lock(logMutex());
  TVX_FileLogger* file = fileLogger();
  return file != nullptr && file->validateAndSetPath(path, isDefaultLog()) == 0;
}

void CLogger::loadConfig() {
  const std::string path = tvxPath(dumpPath().c_str());
  const TVX_File stream = tvxOpenFile(path.c_str());
  if (stream == nullptr) {
    TVX_LOG(TVX_ERR, "Unable to open config data file - %s", path.c_str());
    return;
  }
  std::array<char, SETTINGS_LINE> first{};
  tvxReadLine(stream.get(), first);  // an empty line has no mode
  Dump_Settings settings;
  if (!parseDump(first.data(), path.c_str(), settings)) return;
  if (settings.mode == TVX_LOG_MODE_FILE || settings.mode == TVX_LOG_MODE_BOTH) {
    std::array<char, PATH_LINE> second{};
    if (!tvxReadLine(stream.get(), second)) return;
    cutAtLast(second.data(), '\n');
    cutAtLast(second.data(), '\r');
    if (!takeDumpPath(second.data())) return;
  }
  if (settings.enabled > 0) enable();
  setLevel(settings.level);
  setMode(settings.mode);
}

bool CLogger::writeDump() {
  Buffer text;
  text.format("%d,%d,%d\n%s", mode(), level(), isEnabled() ? 1 : 0, logFilePath().c_str());
  const Replace_Result result =
      tvxReplaceFile(tvxPath(dumpPath().c_str()), text.c_str(), LOG_PERMISSIONS);
  if (result == Replace_Result::NOT_OPENED) TVX_LOG(TVX_ERR, "Unable to open dump file\n");
  return result == Replace_Result::WRITTEN;
}

}  // namespace cimrt
