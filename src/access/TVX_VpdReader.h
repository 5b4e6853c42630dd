// The vital product data of a port, entry by entry.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "access/TVX_MethodWrapper.h"

namespace cimrt {

/// Bytes of an entry's value buffer, the closing NUL included.
inline constexpr std::size_t TVX_VPD_VALUE_SIZE = 256;

/// One entry: a keyword of two characters, and its value. The value is text with a NUL behind it,
/// but for identifiers, which are plain bytes.
struct TVX_VpdEntry {
  std::array<char, 2> keyword;
  std::array<char, TVX_VPD_VALUE_SIZE> value;  ///< the last byte is always NUL

  /// True if the keyword is these two characters.
  bool is(const char* name) const { return keyword[0] == name[0] && keyword[1] == name[1]; }
  /// True for the two bytes that mark the product name.
  bool isProductName() const;
  std::string name() const { return std::string(keyword.data(), keyword.size()); }
  const char* text() const { return value.data(); }
};

/// Reads the data of the first or of the second form into `entries`, in their order. The library's
/// status; `entries` is empty unless it is 0. Reports nothing: the callers' texts differ.
RM_STATUS readVpd(const HBA_WWN& wwpn, std::vector<TVX_VpdEntry>& entries);
RM_STATUS readVpdV2(const HBA_WWN& wwpn, std::vector<TVX_VpdEntry>& entries);

}  // namespace cimrt
