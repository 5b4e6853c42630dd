// Optimized access storage: which units are marked, and marking them.
#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

// Where the fields of a record lie, counted from the record.
static_assert(sizeof(RM_OASLunEntry) == 36 && sizeof(RM_OASLunList) == 40);
static_assert(offsetof(RM_OASLunList, entry) == 4 && offsetof(RM_OASLunEntry, lun) == 8);
static_assert(offsetof(RM_OASLunEntry, state) == 17);

constexpr std::uint32_t MAX_ENTRIES = 1U << 20;  // more than a target can truly have
constexpr int DECIMAL = 10;

RM_OASLunList* listIn(const TVX_Block& block) {
  return reinterpret_cast<RM_OASLunList*>(block.get());
}

/// A list with room for `count` units, as its count tells. Null without memory, or for a count that
/// can't be true.
TVX_Block allocateList(std::uint32_t count) {
  if (count > MAX_ENTRIES) return nullptr;
  const std::size_t more = count > 1 ? (count - 1) * sizeof(RM_OASLunEntry) : 0;
  TVX_Block block = tvxAllocate(sizeof(RM_OASLunList) + more);
  if (block) listIn(block)->count = count;
  return block;
}

/// The three names of a unit's path.
struct Path_Names {
  HBA_WWN initiator{};
  HBA_WWN port{};
  HBA_WWN target{};
};

bool convertNames(const char* initiator, const char* port, const char* target, Path_Names& names) {
  return TVX_MethodWrapper::deviceIdToWWN(&names.initiator, initiator) == RM_OK &&
         TVX_MethodWrapper::deviceIdToWWN(&names.port, port) == RM_OK &&
         TVX_MethodWrapper::deviceIdToWWN(&names.target, target) == RM_OK;
}

void logEntries(const RM_OASLunList& list) {
  const RM_OASLunEntry* entries = list.entry;
  for (std::uint32_t i = 0; i < list.count; ++i) {
    TVX_LOG(TVX_DBG, "FCP Lun: %.*s", static_cast<int>(sizeof entries[i].fcpLun),
            entries[i].fcpLun);
    TVX_LOG(TVX_DBG, "OAS Lun: %d", static_cast<int>(entries[i].lun));
    TVX_LOG(TVX_DBG, "OAS State: %d", static_cast<int>(entries[i].state));
  }
}

RM_STATUS readList(const Path_Names& names, std::uint32_t option, TVX_Block& block) {
  std::uint32_t room = 1;
  block = allocateList(room);
  if (!block) {
    TVX_LOG(TVX_DBG, "Memory allocation failed.");
    return RM_ERROR_NO_MEMORY;
  }
  RM_STATUS status =
      LRM_GetOASLunList(names.initiator, names.port, names.target, option, listIn(block));
  if (status == RM_ERROR_MORE_DATA || status == RM_ERROR_LIST_TOO_SMALL) {
    room = listIn(block)->count;
    block = allocateList(room);
    if (!block) {
      TVX_LOG(TVX_DBG, "Memory allocation failed.");
      return RM_ERROR_NO_MEMORY;
    }
    status = LRM_GetOASLunList(names.initiator, names.port, names.target, option, listIn(block));
  }
  if (status == RM_OK) listIn(block)->count = std::min(listIn(block)->count, room);
  return status;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::SetOASLunState(const char* initiator, const char* port,
                                            const char* target, const char* lunText,
                                            std::uint8_t state, std::uint32_t option) {
  Path_Names names;
  if (lunText == nullptr || !convertNames(initiator, port, target, names)) return RM_ERROR;
  const long lun = std::strtol(lunText, nullptr, DECIMAL);
  TVX_LOG(TVX_DBG,
          "Enter TVX_MethodWrapper:SetOASLunState Input OASState: %d, Lun no: %d, option: %d",
          static_cast<int>(state), static_cast<int>(lun), static_cast<int>(option));
  const RM_STATUS status = LRM_SetOASLunState(names.initiator, names.port, names.target,
                                              static_cast<std::uint64_t>(lun), state, option);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, " Operation failure. OAS State has not been set");
    StatusString(status);
  }
  return status;
}

RM_STATUS TVX_MethodWrapper::GetOASLunList(const char* initiator, const char* port,
                                           const char* target, std::uint32_t option,
                                           TVX_Block* list) {
  Path_Names names;
  if (!convertNames(initiator, port, target, names)) return RM_ERROR;
  if (list == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid input pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  TVX_Block block;
  const RM_STATUS status = readList(names, option, block);
  if (status == RM_OK) {
    logEntries(*listIn(block));
    *list = std::move(block);
  } else if (status != RM_ERROR_NO_MEMORY || block) {
    TVX_LOG(TVX_ERR, "RM_GetOASLunList error.");
    StatusString(status);
  }
  TVX_LOG(TVX_DBG, "Exit GetOASLunList");
  return status;
}

}  // namespace cimrt
