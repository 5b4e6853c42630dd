// Plain text tables.
#pragma once

#include <string>
#include <vector>

namespace tvx::host {

/// Collects rows and writes them with columns aligned on the left, two blanks between them.
class Table {
 public:
  explicit Table(std::vector<std::string> head) : m_Head(std::move(head)) {}

  /// Missing cells are empty; control characters are shown as '?'.
  void add(std::vector<std::string> row);
  std::size_t rows() const { return m_Rows.size(); }
  std::string text() const;

 private:
  std::vector<std::string> m_Head;
  std::vector<std::vector<std::string>> m_Rows;
};

/// Cuts a text to `limit` characters, the last three being dots if it was longer.
std::string shortened(const std::string& text, std::size_t limit);

}  // namespace tvx::host
