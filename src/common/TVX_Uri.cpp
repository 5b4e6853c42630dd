#include "common/TVX_Uri.h"

#include <algorithm>
#include <cctype>

namespace cimrt {

namespace {

constexpr std::string_view HIDDEN = "***";

/// Where the user's name begins, if there is one.
std::size_t authorityStart(std::string_view uri) {
  const std::size_t mark = uri.find("://");
  return mark == std::string_view::npos ? 0 : mark + 3;
}

bool isPort(std::string_view text) {
  return std::all_of(text.begin(), text.end(),
                     [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; });
}

}  // namespace

std::string tvxWithoutPassword(std::string_view uri) {
  const std::size_t start = authorityStart(uri);
  const std::string_view rest = uri.substr(start);
  const std::string_view authority = rest.substr(0, rest.find_first_of("/?#"));
  const std::size_t colon = authority.find(':');
  if (colon == std::string_view::npos) return std::string(uri);
  std::size_t at = authority.rfind('@');
  if (at == std::string_view::npos && !isPort(authority.substr(colon + 1))) at = rest.rfind('@');
  if (at == std::string_view::npos || at < colon) return std::string(uri);
  std::string text(uri.substr(0, start + colon + 1));
  text += HIDDEN;
  text += rest.substr(at);
  return text;
}

}  // namespace cimrt
