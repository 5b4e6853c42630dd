// What the library knows of virtual ports.
#include <algorithm>
#include <cstddef>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr std::uint8_t ATTRIBUTES_VERSION = 3;

static_assert(sizeof(RM_VPortList) == 28 && sizeof(RM_VPortEntry) == 24);
static_assert(sizeof(RM_VPortAttributes) == 344 && offsetof(RM_VPortAttributes, name) == 20);

RM_VPortList* listIn(const TVX_Block& block) {
  return reinterpret_cast<RM_VPortList*>(block.get());
}

/// A list with room for `count` ports, or null with the failure logged.
TVX_Block allocateList(std::uint32_t count) {
  const std::size_t size = std::size_t{count} * sizeof(RM_VPortEntry) + sizeof(std::uint32_t);
  TVX_Block block = tvxAllocate(std::max(size, sizeof(RM_VPortList)));
  if (block)
    listIn(block)->count = count;
  else
    TVX_LOG(TVX_ERR, "FABCMD_ListVPorts: Unable to allocate buffer");
  return block;
}

RM_STATUS logFailure(RM_STATUS status) {
  if (status == RM_ERROR_VPORT_UNSUPPORTED) {
    TVX_LOG(TVX_DBG, "FABCMD does not support listing virtual ports on this host.");
  } else {
    TVX_MethodWrapper::StatusString(status);
    TVX_LOG(TVX_DBG, "Unable to list virtual ports!!");
  }
  return RM_ERROR;
}

bool isLocal(const HBA_WWN* wwpn) {
  if (TVX_MethodWrapper::Validatewwpn(wwpn) == RM_OK) return true;
  TVX_LOG(TVX_DBG, "INVALID wwpn");
  return false;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::ListVPorts(const HBA_WWN* wwpn, TVX_Block* list) {
  if (list == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid input pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  if (!isLocal(wwpn)) return RM_ERROR;
  std::uint32_t room = 1;
  TVX_Block block = allocateList(room);
  if (!block) return RM_ERROR;
  RM_STATUS status = LRM_VPList(*wwpn, listIn(block));
  if (status == RM_ERROR_MORE_DATA) {
    room = listIn(block)->count;
    block = allocateList(room);
    if (!block) return RM_ERROR;
    status = LRM_VPList(*wwpn, listIn(block));
  }
  if (status != RM_OK) return logFailure(status);
  listIn(block)->count = std::min(listIn(block)->count, room);
  *list = std::move(block);
  TVX_LOG(TVX_DBG, "Exit the ListVPorts method");
  return RM_OK;
}

RM_STATUS TVX_MethodWrapper::ListVPortAttributes(const HBA_WWN* wwpn, const HBA_WWN& vport,
                                                 TVX_Block* attributes) {
  if (attributes == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid input vp attributes pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  if (!isLocal(wwpn)) return RM_ERROR;
  TVX_Block block = tvxAllocate(sizeof(RM_VPortAttributes));
  if (!block) {
    TVX_LOG(TVX_ERR, "FABCMD_ListVPortAttributes: Unable to allocate buffer");
    return RM_ERROR;
  }
  auto* record = reinterpret_cast<RM_VPortAttributes*>(block.get());
  record->version = ATTRIBUTES_VERSION;
  const RM_STATUS status = LRM_VPGetAttributes(*wwpn, vport, record);
  if (status != RM_OK) return logFailure(status);
  TVX_LOG(TVX_DBG, "VPort details");
  TVX_LOG(TVX_DBG, "VPort Name %.*s ", static_cast<int>(sizeof record->name), record->name);
  *attributes = std::move(block);
  TVX_LOG(TVX_DBG, "Exit the ListVPortattributes method");
  return RM_OK;
}

}  // namespace cimrt
