#include "common/TVX_Log_Backends.h"

#include <pthread.h>
#include <sys/stat.h>
#include <syslog.h>

#include <cerrno>
#include <cstring>
#include <limits>

#include "common/CLogger.h"
#include "common/TVX_Clock.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

bool writesFile(int mode) {
  return mode == TVX_LOG_MODE_FILE || mode == TVX_LOG_MODE_BOTH;
}

bool keepsRecords(int mode) {
  return mode == TVX_LOG_MODE_MEMORY || mode == TVX_LOG_MODE_BOTH;
}

unsigned lineOf(const unsigned* line) {
  return line != nullptr ? *line : 0;
}

const char* textOf(const char* text) {
  return text != nullptr ? text : "";
}

/// A regular file, or none yet.
bool canBeLogFile(const char* path) {
  struct stat info {};
  if (::stat(path, &info) == 0) return S_ISREG(info.st_mode);
  return errno == ENOENT;
}

std::FILE* openAppending(const char* path) {
  return open_for_writing(path, "a+", LOG_PERMISSIONS);
}

}  // namespace

// ---- Log file ----

TVX_FileLogger::TVX_FileLogger() {
  getLogger().registerInterface(this);
}

TVX_FileLogger::~TVX_FileLogger() {
  getLogger().unregisterInterface(this);
  closeStream();
}

void TVX_FileLogger::closeStream() {
  if (m_File == nullptr) return;
  std::fclose(m_File);
  m_File = nullptr;
}

void TVX_FileLogger::log(int level, const char* file, const unsigned* line, const char* text) {
  if (!writesFile(getLogger().mode())) return;
  const Auto_Mutex lock(m_Mutex);
  if (m_File == nullptr || level > TVX_DBG) return;
  if (m_bRestricted && level != TVX_CRIT && level != TVX_ERR) return;
  char time[Datetime::ASCII_SIZE];
  tvxNowDatetime().ascii(time, true);
  std::fprintf(m_File, "[threadid =%ul] [%s] [%s:%u][%s] %s\n",
               static_cast<unsigned>(::pthread_self()), time, textOf(file), lineOf(line),
               tvxLevelName(level), textOf(text));
  std::fflush(m_File);
}

void TVX_FileLogger::open() {
  if (!writesFile(getLogger().mode())) return;
  const Auto_Mutex lock(m_Mutex);
  closeStream();
  if (!m_Path.empty()) m_File = openAppending(m_Path.c_str());
}

void TVX_FileLogger::close() {
  const Auto_Mutex lock(m_Mutex);
  closeStream();
  m_Path.clear();
}

void TVX_FileLogger::clear() {
  const Auto_Mutex lock(m_Mutex);
  if (m_File == nullptr) return;
  closeStream();
  if (std::FILE* emptied = open_for_writing(m_Path.c_str(), "w", LOG_PERMISSIONS))
    std::fclose(emptied);
  m_File = openAppending(m_Path.c_str());
}

int TVX_FileLogger::validateAndSetPath(const char* path, bool restricted) {
  if (path == nullptr || !canBeLogFile(path)) return -1;
  std::FILE* stream = openAppending(path);
  if (stream == nullptr) return -1;
  const Auto_Mutex lock(m_Mutex);
  closeStream();
  m_File = stream;
  m_Path = path;
  m_bRestricted = restricted;
  return 0;
}

std::string TVX_FileLogger::path() const {
  const Auto_Mutex lock(m_Mutex);
  return m_Path;
}

bool TVX_FileLogger::isRestricted() const {
  const Auto_Mutex lock(m_Mutex);
  return m_bRestricted;
}

bool TVX_FileLogger::isOpen() const {
  const Auto_Mutex lock(m_Mutex);
  return m_File != nullptr;
}

// ---- Records in memory ----

TVX_CIMLogger::TVX_CIMLogger(std::int32_t capacity) : m_Capacity(capacity > 0 ? capacity : 1) {
  getLogger().registerInterface(this);
}

TVX_CIMLogger::~TVX_CIMLogger() {
  getLogger().unregisterInterface(this);
}

void TVX_CIMLogger::log(int level, const char*, const unsigned*, const char* text) {
  if (!keepsRecords(getLogger().mode()) || text == nullptr || level >= TVX_INFO) return;
  Record record;
  record.level = level;
  record.time = tvxNowDatetime();
  // Whatever does not fit the field is cut off.
  std::snprintf(record.text, sizeof record.text, "[%s]", text);
  const Auto_Mutex lock(m_Mutex);
  // The count keeps growing; near its end it goes back to the same place in the ring.
  if (m_LastIndex == std::numeric_limits<std::int32_t>::max()) m_LastIndex %= m_Capacity;
  const auto index = static_cast<std::size_t>((m_LastIndex + 1) % m_Capacity);
  ++m_LastIndex;
  if (m_Records.size() < static_cast<std::size_t>(m_Capacity)) {
    m_Records.push_back(record);
  } else {
    m_Records[index] = record;
  }
}

void TVX_CIMLogger::clear() {
  const Auto_Mutex lock(m_Mutex);
  m_Records.clear();
  m_LastIndex = -1;
}

std::vector<TVX_CIMLogger::Record> TVX_CIMLogger::records() const {
  const Auto_Mutex lock(m_Mutex);
  return m_Records;
}

std::int32_t TVX_CIMLogger::lastIndex() const {
  const Auto_Mutex lock(m_Mutex);
  return m_LastIndex;
}

// ---- System log ----

namespace {

constexpr int NO_PRIORITY = -1;

/// System log priority of each level.
constexpr int PRIORITIES[] = {NO_PRIORITY, LOG_CRIT, LOG_WARNING, LOG_ERR, LOG_INFO, NO_PRIORITY};

int priorityOf(int level) {
  return level >= TVX_INVALID && level <= TVX_DBG ? PRIORITIES[level] : NO_PRIORITY;
}

/// Messages that are too frequent for the system log.
bool isDropped(const char* formatted) {
  return std::strncmp(formatted, "GetInterfaceState", 15) == 0 ||
         std::strncmp(formatted, "GetIPAddressType", 13) == 0;
}

}  // namespace

TVX_SysLogger::TVX_SysLogger() {
  ::openlog("[TVX][CIM][FC]", LOG_PID | LOG_NDELAY, LOG_USER);
  getLogger().registerInterface(this);
}

TVX_SysLogger::~TVX_SysLogger() {
  getLogger().unregisterInterface(this);
  ::closelog();
}

void TVX_SysLogger::log(int level, const char*, const unsigned*, const char* text) {
  if (level >= TVX_CRIT) return;
  char formatted[2000];
  std::snprintf(formatted, sizeof formatted, "[%s]\n", textOf(text));
  if (isDropped(formatted)) return;
  const int priority = priorityOf(level);
  if (priority != NO_PRIORITY) ::syslog(priority, "%s", formatted);
}

}  // namespace cimrt
