#include "cli/Table.h"

#include <algorithm>

namespace tvx::host {
namespace {

/// Characters of a UTF-8 text: every byte that does not continue another.
std::size_t width(const std::string& text) {
  return static_cast<std::size_t>(
      std::count_if(text.begin(), text.end(), [](char c) { return (c & 0xC0) != 0x80; }));
}

std::string line(const std::vector<std::string>& row, const std::vector<std::size_t>& widths) {
  std::string text;
  for (std::size_t i = 0; i < row.size(); ++i) {
    text += row[i];
    if (i + 1 < row.size()) {
      text.append(widths[i] - width(row[i]) + 2, ' ');
    }
  }
  text.erase(text.find_last_not_of(' ') + 1);
  return text + "\n";
}

}  // namespace

void Table::add(std::vector<std::string> row) {
  row.resize(m_Head.size());
  for (std::string& cell : row) {
    std::replace_if(
        cell.begin(), cell.end(), [](char c) { return static_cast<unsigned char>(c) < ' '; }, '?');
  }
  m_Rows.push_back(std::move(row));
}

std::string Table::text() const {
  std::vector<std::size_t> widths;
  for (std::size_t i = 0; i < m_Head.size(); ++i) {
    std::size_t widest = width(m_Head[i]);
    for (const auto& row : m_Rows) {
      widest = std::max(widest, width(row[i]));
    }
    widths.push_back(widest);
  }
  std::string text = line(m_Head, widths);
  for (const auto& row : m_Rows) {
    text += line(row, widths);
  }
  return text;
}

std::string shortened(const std::string& text, std::size_t limit) {
  if (text.size() <= limit) {
    return text;
  }
  std::size_t end = limit < 3 ? 0 : limit - 3;
  while (end > 0 && (text[end] & 0xC0) == 0x80) {
    --end;
  }
  return text.substr(0, end) + "...";
}

}  // namespace tvx::host
