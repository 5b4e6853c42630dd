#include "common/TvxConfigFile.h"

#include <sys/stat.h>

#include <array>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string_view>

#include "common/CLogger.h"
#include "common/TVX_File.h"
#include "common/TVX_Path.h"
#include "common/TVX_Replace_File.h"
#include "runtime/Buffer.h"
#include "runtime/Safe_Open.h"

namespace cimrt {

namespace {

constexpr std::string_view KEY_CACHE_TIMEOUT = "TVX_PROVIDER_CACHE_TIMEOUT";
constexpr std::string_view KEY_ADAPTER = "TVX_PROVIDER_REFRESH_ADAPTERDATA";
constexpr std::string_view KEY_SAN = "TVX_PROVIDER_REFRESH_SANDATA";
constexpr const char* RULER = "##################################################";

constexpr int MAX_LINES = 1000;
constexpr std::size_t LINE_SIZE = 1024;  // with the NUL
constexpr std::size_t WEBLAUNCH_LINE_SIZE = 256;

constexpr long MIN_TIMEOUT = 1;  // minutes
constexpr long MAX_TIMEOUT = 30;

bool isSpace(char c) {
  return std::isspace(static_cast<unsigned char>(c)) != 0;
}

std::string_view stripped(std::string_view text) {
  while (!text.empty() && isSpace(text.front())) text.remove_prefix(1);
  while (!text.empty() && isSpace(text.back())) text.remove_suffix(1);
  return text;
}

std::optional<bool> truth(std::string_view value) {
  if (value == "TRUE") return true;
  if (value == "FALSE") return false;
  return std::nullopt;
}

const char* truthText(bool value) {
  return value ? "TRUE" : "FALSE";
}

/// True if the path names nothing. Whatever `errno` held before does not count.
bool isMissing(const char* path) {
  struct stat info {};
  errno = 0;
  static_cast<void>(::stat(path, &info));
  return errno == ENOENT;
}

}  // namespace

/// Which keys a valid line has set already.
struct TvxConfigFile::Keys_Set {
  bool cacheTimeout = false;
  bool adapter = false;
  bool san = false;
};

TvxConfigFile::TvxConfigFile() = default;

TvxConfigFile::~TvxConfigFile() {
  write();
}

void TvxConfigFile::load(const char* path) {
  if (path == nullptr) return;
  m_Path = path;
  if (isMissing(path)) return;
  const TVX_File stream = tvxOpenFile(path);
  if (stream == nullptr) {
    TVX_LOG(TVX_ERR, "Unable to open provider config setting file - %s", path);
    return;
  }
  Keys_Set set;
  std::array<char, LINE_SIZE> line{};
  for (int count = 0; count < MAX_LINES; ++count) {
    if (!tvxReadLine(stream.get(), line)) return;
    takeLine(line.data(), set);
  }
}

void TvxConfigFile::takeLine(std::string_view text, Keys_Set& set) {
  const std::string_view line = stripped(text);
  const std::size_t equals = line.find('=');
  if (line.starts_with('#') || equals == std::string_view::npos) return;
  const std::string_view key = stripped(line.substr(0, equals));
  const std::string_view value = stripped(line.substr(equals + 1));
  const auto takeTruth = [&](bool& isSet, bool& setting) {
    if (const auto parsed = truth(value); parsed && !isSet) {
      setting = *parsed;
      isSet = true;
    }
  };
  if (key == KEY_CACHE_TIMEOUT && !set.cacheTimeout) {
    const long minutes = std::strtol(std::string(value).c_str(), nullptr, 10);
    set.cacheTimeout = minutes >= MIN_TIMEOUT && minutes <= MAX_TIMEOUT;
    if (set.cacheTimeout) m_CacheTimeout = static_cast<std::uint32_t>(minutes);
  } else if (key == KEY_ADAPTER) {
    takeTruth(set.adapter, m_bRefreshAdapterData);
  } else if (key == KEY_SAN) {
    takeTruth(set.san, m_bRefreshSANData);
  }
}

void TvxConfigFile::write() {
  if (m_Path.empty()) return;
  Buffer text;
  text.format("%s\n# Torvex HBA CIM Provider Configuration Settings #\n%s\n", RULER, RULER);
  text.format("%s = %d\n", KEY_CACHE_TIMEOUT.data(), static_cast<int>(getCacheTimeout()));
  text.format("%s = %s\n", KEY_ADAPTER.data(), truthText(getAdapterRefresh()));
  text.format("%s = %s\n", KEY_SAN.data(), truthText(getSANRefresh()));
  tvxReplaceFile(m_Path, text.c_str(), SETTINGS_PERMISSIONS);
}

// ---- Access to the values ----

int TvxConfigFile::setCacheTimeout(std::uint32_t minutes) {
  if (minutes < MIN_TIMEOUT || minutes > MAX_TIMEOUT) return -1;
  const Auto_Mutex lock(m_Mutex);
  m_CacheTimeout = minutes;
  return 0;
}

int TvxConfigFile::setTruth(bool& setting, std::uint32_t value) {
  if (value >= 2) return -1;
  const Auto_Mutex lock(m_Mutex);
  setting = value == 1;
  return 0;
}

int TvxConfigFile::setAdapterRefresh(std::uint32_t value) {
  return setTruth(m_bRefreshAdapterData, value);
}

int TvxConfigFile::setSANRefresh(std::uint32_t value) {
  return setTruth(m_bRefreshSANData, value);
}

std::uint32_t TvxConfigFile::getCacheTimeout() {
  const Auto_Mutex lock(m_Mutex);
  return m_CacheTimeout;
}

bool TvxConfigFile::getAdapterRefresh() {
  const Auto_Mutex lock(m_Mutex);
  return m_bRefreshAdapterData;
}

bool TvxConfigFile::getSANRefresh() {
  const Auto_Mutex lock(m_Mutex);
  return m_bRefreshSANData;
}

// ---- WebLaunch ----

namespace {

/// The significant text of a line: from its first character that is no white space to its end.
std::string_view significant(std::string_view line) {
  while (!line.empty() && isSpace(line.front())) line.remove_prefix(1);
  while (!line.empty() && (line.back() == '\n' || line.back() == '\r')) line.remove_suffix(1);
  return line.starts_with('#') ? std::string_view() : line;
}

}  // namespace

WebLaunchConfig::WebLaunchConfig() {
  const std::string path = tvxPath(TVX_WEBLAUNCH_PATH);
  const TVX_File stream = tvxOpenFile(path.c_str());
  if (stream == nullptr) {
    TVX_LOG(TVX_INFO, "WebLaunch config file '%s' not found.", path.c_str());
    return;
  }
  std::array<char, WEBLAUNCH_LINE_SIZE> line{};
  while (m_Address.empty() && tvxReadLine(stream.get(), line)) {
    m_Address = significant(line.data());
  }
}

}  // namespace cimrt
