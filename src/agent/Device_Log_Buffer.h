// The lines of the driver that the agent keeps from the system log.
#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace cimrt {

/// A bounded list of texts. The agent's data lock guards it.
class Device_Log_Buffer {
 public:
  static constexpr std::size_t CAPACITY = 200;

  /// Puts a line behind the others; an empty one is ignored. False if the list was full: then
  /// nothing was added.
  bool add(std::string line) {
    if (line.empty()) return true;
    if (m_Lines.size() >= CAPACITY) return false;
    m_Lines.push_back(std::move(line));
    return true;
  }
  void clear() { m_Lines.clear(); }
  const std::vector<std::string>& lines() const { return m_Lines; }

 private:
  std::vector<std::string> m_Lines;
};

}  // namespace cimrt
