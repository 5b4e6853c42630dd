// Keeps what the provider logs, for assertions on texts and levels.
#pragma once

#include <algorithm>
#include <mutex>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

#include "common/CLogger.h"

namespace tvx::test {

struct Logged {
  int level;
  std::string text;
  bool operator==(const Logged&) const = default;
};

inline void PrintTo(const Logged& line, std::ostream* out) {
  *out << cimrt::tvxLevelName(line.level) << " \"" << line.text << '"';
}

/// Takes every message while it lives. Enables the logger, and disables it again at the end.
class Log_Capture : public cimrt::TVX_LoggerInterface {
 public:
  Log_Capture() {
    cimrt::getLogger().registerInterface(this);
    cimrt::getLogger().enable();
  }
  ~Log_Capture() override {
    cimrt::getLogger().disable();
    cimrt::getLogger().unregisterInterface(this);
  }
  Log_Capture(const Log_Capture&) = delete;
  Log_Capture& operator=(const Log_Capture&) = delete;

  void log(int level, const char*, const unsigned*, const char* text) override {
    const std::lock_guard lock(_mutex);
    _lines.push_back({level, text});
  }
  void open() override { ++opened; }
  void close() override { ++closed; }
  void clear() override { ++cleared; }

  std::vector<Logged> lines() const {
    const std::lock_guard lock(_mutex);
    return _lines;
  }
  std::vector<std::string> texts() const {
    std::vector<std::string> all;
    for (const Logged& line : lines()) all.push_back(line.text);
    return all;
  }
  /// How often exactly this text came at exactly this level.
  std::size_t count(int level, std::string_view text) const {
    const std::vector<Logged> all = lines();
    return static_cast<std::size_t>(
        std::count(all.begin(), all.end(), Logged{level, std::string(text)}));
  }
  bool has(int level, std::string_view text) const { return count(level, text) != 0; }
  /// Position of the first line with this text; the number of lines if there is none.
  std::size_t position(std::string_view text) const {
    const std::vector<std::string> all = texts();
    return static_cast<std::size_t>(std::find(all.begin(), all.end(), text) - all.begin());
  }
  /// True if nothing came at any other level.
  bool allAt(int level) const {
    const std::vector<Logged> all = lines();
    return std::all_of(all.begin(), all.end(),
                       [level](const Logged& line) { return line.level == level; });
  }
  void forget() {
    const std::lock_guard lock(_mutex);
    _lines.clear();
  }

  int opened = 0;
  int closed = 0;
  int cleared = 0;

 private:
  mutable std::mutex _mutex;
  std::vector<Logged> _lines;
};

}  // namespace tvx::test
