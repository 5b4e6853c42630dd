// What the bridge wrote to the runtime's trace log during a test.
#pragma once

#include <string>
#include <vector>

namespace cimrt::test {

struct Log_Line {
  std::string level;
  std::string text;

  bool operator==(const Log_Line&) const = default;
};

/// Reads the lines that were written since it was made. The program's log goes to a temporary home
/// with the level DBG, set up before the first test.
class Trace_Log {
 public:
  Trace_Log();

  std::vector<Log_Line> lines() const;
  /// Texts of one level.
  std::vector<std::string> texts(const std::string& level) const;
  /// True if exactly this line was written.
  bool has(const std::string& level, const std::string& text) const;

 private:
  std::size_t _start;
};

}  // namespace cimrt::test
