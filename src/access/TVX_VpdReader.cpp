#include "access/TVX_VpdReader.h"

#include <algorithm>
#include <functional>

#include "common/TVX_Memory.h"

namespace cimrt {

namespace {

/// Both bytes of the keyword that marks the product name.
constexpr char PRODUCT_NAME_MARK = static_cast<char>(130);

/// An entry takes at least its keyword and a length byte: no buffer holds more than this.
constexpr std::uint32_t SMALLEST_ENTRY = 3;

constexpr std::uint32_t KEYWORD_SIZE = 4;

/// What the library writes for one entry.
struct Raw_Entry {
  char keyword[KEYWORD_SIZE] = {};
  char value[TVX_VPD_VALUE_SIZE] = {};
};

TVX_VpdEntry entryOf(const Raw_Entry& raw) {
  TVX_VpdEntry entry;
  std::copy_n(raw.keyword, entry.keyword.size(), entry.keyword.begin());
  std::copy_n(raw.value, entry.value.size(), entry.value.begin());
  entry.value.back() = '\0';
  return entry;
}

/// Walks a buffer that the library filled. It says where to go on; that the walk ends, and that it
/// stays in the buffer, is seen to here.
void walk(const std::uint8_t* buffer, std::uint32_t size, std::vector<TVX_VpdEntry>& entries) {
  const auto isInside = [=](const void* place) {
    return std::greater_equal<>()(place, static_cast<const void*>(buffer)) &&
           std::less<>()(place, static_cast<const void*>(buffer + size));
  };
  const void* cursor = buffer;
  for (std::uint32_t left = size / SMALLEST_ENTRY; left != 0 && isInside(cursor); --left) {
    Raw_Entry raw;
    cursor =
        RM_GetNextVpdEntry(cursor, raw.keyword, sizeof raw.keyword, raw.value, sizeof raw.value);
    // Some libraries end the walk together with the last entry, others after it.
    if (raw.keyword[0] != '\0') entries.push_back(entryOf(raw));
  }
}

template <class Read>
RM_STATUS readEntries(std::uint32_t size, std::vector<TVX_VpdEntry>& entries, Read read) {
  entries.clear();
  // Longer than the library is told: an entry that begins at the very end is still read in bounds.
  const TVX_Block buffer = tvxAllocate(size + 2 * TVX_VPD_VALUE_SIZE);
  if (!buffer) return RM_ERROR_NO_MEMORY;
  std::uint32_t told = size;
  const RM_STATUS status = read(buffer.get(), &told);
  if (status == RM_OK) walk(buffer.get(), size, entries);
  return status;
}

}  // namespace

bool TVX_VpdEntry::isProductName() const {
  return keyword[0] == PRODUCT_NAME_MARK && keyword[1] == PRODUCT_NAME_MARK;
}

RM_STATUS readVpd(const HBA_WWN& wwpn, std::vector<TVX_VpdEntry>& entries) {
  return readEntries(RM_VPD_SIZE, entries, [&wwpn](void* buffer, std::uint32_t* size) {
    return LRM_GetVPD(wwpn, buffer, size);
  });
}

RM_STATUS readVpdV2(const HBA_WWN& wwpn, std::vector<TVX_VpdEntry>& entries) {
  return readEntries(RM_VPD_V2_SIZE, entries, [&wwpn](void* buffer, std::uint32_t* size) {
    return LRM_GetVPDV2(wwpn, 1, buffer, size);
  });
}

}  // namespace cimrt
