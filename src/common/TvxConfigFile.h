// The provider's settings files.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "runtime/Threads.h"

namespace cimrt {

/// Path of the provider's settings, without the TVX_ROOT prefix.
inline constexpr const char* TVX_SETTINGS_PATH = "/etc/torvex_fc_provider.conf";
/// Path of the file with the management page's address, without the TVX_ROOT prefix.
inline constexpr const char* TVX_WEBLAUNCH_PATH = "/etc/tvx_smis.conf";

/// The cache settings: read once, changed through the setters, written back by the destructor.
/// Setters and getters may be called from any thread.
class TvxConfigFile {
 public:
  TvxConfigFile();  ///< the defaults; reads nothing
  /// Rewrites the file of `load` in full. A failure is silent and leaves the file as it was.
  ~TvxConfigFile();
  TvxConfigFile(const TvxConfigFile&) = delete;
  TvxConfigFile& operator=(const TvxConfigFile&) = delete;

  /// Remembers the path (opened as given) and takes the valid settings of the file. A missing file
  /// leaves the defaults. Null does nothing. Takes no lock: call it before other threads know the
  /// object.
  void load(const char* path);

  /// Minutes, 1 to 30. 0, or -1 with nothing changed.
  int setCacheTimeout(std::uint32_t minutes);
  /// 0 or 1. 0, or -1 with nothing changed.
  int setAdapterRefresh(std::uint32_t value);
  int setSANRefresh(std::uint32_t value);

  std::uint32_t getCacheTimeout();
  bool getAdapterRefresh();
  bool getSANRefresh();

  /// The path of `load`, empty before.
  const std::string& path() const { return m_Path; }
  /// The lock of the three values, recursive.
  Mutex& mutex() { return m_Mutex; }

 private:
  struct Keys_Set;
  void takeLine(std::string_view text, Keys_Set& set);
  int setTruth(bool& setting, std::uint32_t value);
  void write();

  bool m_bRefreshAdapterData = false;
  bool m_bRefreshSANData = true;
  std::uint32_t m_CacheTimeout = 10;
  std::string m_Path;
  Mutex m_Mutex{true};
};

/// The address of the WebLaunch management page; the constructor reads it from its file.
class WebLaunchConfig {
 public:
  WebLaunchConfig();
  /// Empty without a file or without a significant line in it.
  const std::string& address() const { return m_Address; }

 private:
  std::string m_Address;
};

}  // namespace cimrt
