#include "Trace_Log.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <stdexcept>

namespace cimrt::test {

namespace {

/// A home directory with an rc file, named by the environment before anything can log.
class Log_Home {
 public:
  Log_Home() {
    std::string pattern = (std::filesystem::temp_directory_path() / "tvx-cmpi-XXXXXX").string();
    if (!mkdtemp(pattern.data())) throw std::runtime_error("no temporary directory");
    _home = pattern;
    std::ofstream(_home / ".cimrtrc") << "LOG_LEVEL = DBG\n";
    setenv("CIMRT_HOME", _home.c_str(), 1);
  }
  ~Log_Home() {
    std::error_code ignored;
    std::filesystem::remove_all(_home, ignored);
  }
  std::filesystem::path messages() const { return _home / ".cimrt" / "messages"; }

 private:
  std::filesystem::path _home;
};

const Log_Home home;

}  // namespace

Trace_Log::Trace_Log() {
  std::error_code absent;
  const auto size = std::filesystem::file_size(home.messages(), absent);
  _start = absent ? 0 : static_cast<std::size_t>(size);
}

namespace {

/// Splits "<date> <LEVEL>: <file>(<line>): <text>"; nothing for a line of another form.
std::optional<Log_Line> parse(const std::string& line) {
  for (const char* level : {"FATAL", "ERR", "WARN", "INFO", "DBG"}) {
    const std::size_t start = line.find(std::string(" ") + level + ": ");
    if (start == std::string::npos) continue;
    const std::size_t place = line.find("): ", start);
    if (place == std::string::npos) continue;
    return Log_Line{level, line.substr(place + 3)};
  }
  return std::nullopt;
}

}  // namespace

std::vector<Log_Line> Trace_Log::lines() const {
  std::ifstream file(home.messages());
  file.seekg(static_cast<std::streamoff>(_start));
  std::vector<Log_Line> result;
  std::string line;
  while (std::getline(file, line))
    if (std::optional<Log_Line> parsed = parse(line)) result.push_back(std::move(*parsed));
  return result;
}

std::vector<std::string> Trace_Log::texts(const std::string& level) const {
  std::vector<std::string> result;
  for (const Log_Line& line : lines())
    if (line.level == level) result.push_back(line.text);
  return result;
}

bool Trace_Log::has(const std::string& level, const std::string& text) const {
  const std::vector<Log_Line> all = lines();
  return std::find(all.begin(), all.end(), Log_Line{level, text}) != all.end();
}

}  // namespace cimrt::test
