#include "Trace_Log.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <regex>
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

std::vector<Log_Line> Trace_Log::lines() const {
  static const std::regex form(R"(^.* (FATAL|ERR|WARN|INFO|DBG): \S+\(\d+\): (.*)$)");
  std::ifstream file(home.messages());
  file.seekg(static_cast<std::streamoff>(_start));
  std::vector<Log_Line> result;
  std::string line;
  while (std::getline(file, line)) {
    std::smatch parts;
    if (std::regex_match(line, parts, form)) result.push_back({parts[1], parts[2]});
  }
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
