#include "state/Wwn.h"

#include <algorithm>
#include <cstdio>

namespace tvx::sim {
namespace {

int digit_value(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// Drops the separators of the long form; any other text comes back as it is.
std::string without_separators(std::string_view text) {
  if (text.size() != 23) return std::string(text);
  std::string digits;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (i % 3 != 2) {
      digits += text[i];
    } else if (text[i] != ':') {
      return {};
    }
  }
  return digits;
}

}  // namespace

std::optional<Wwn> parse_wwn(std::string_view text) {
  const std::string digits = without_separators(text);
  if (digits.size() != 16) return std::nullopt;
  Wwn name{};
  for (std::size_t i = 0; i < name.size(); ++i) {
    const int high = digit_value(digits[2 * i]);
    const int low = digit_value(digits[2 * i + 1]);
    if (high < 0 || low < 0) return std::nullopt;
    name[i] = static_cast<std::uint8_t>(high * 16 + low);
  }
  return name;
}

std::string format_wwn(const Wwn& name) {
  std::string text;
  for (const std::uint8_t byte : name) {
    char pair[4];
    std::snprintf(pair, sizeof pair, "%02X", byte);
    if (!text.empty()) text += ':';
    text += pair;
  }
  return text;
}

std::uint64_t wwn_number(const Wwn& name) {
  std::uint64_t number = 0;
  for (const std::uint8_t byte : name) number = (number << 8) | byte;
  return number;
}

Wwn wwn_from_number(std::uint64_t number) {
  Wwn name{};
  for (auto byte = name.rbegin(); byte != name.rend(); ++byte, number >>= 8) {
    *byte = static_cast<std::uint8_t>(number);
  }
  return name;
}

}  // namespace tvx::sim
