// What the library knows of virtual ports.
#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>
#include <utility>

#include "access/TVX_MethodWrapper.h"
#include "access/TVX_VPortList.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr std::uint8_t ATTRIBUTES_VERSION = 3;

static_assert(sizeof(RM_VPortList) == 28 && sizeof(RM_VPortEntry) == 24);
static_assert(sizeof(RM_VPortAttributes) == 344 && offsetof(RM_VPortAttributes, name) == 20);

/// A list with room for `count` ports, or null.
TVX_Block allocateList(std::uint32_t count) {
  const std::size_t size = std::size_t{count} * sizeof(RM_VPortEntry) + sizeof(std::uint32_t);
  TVX_Block block = tvxAllocate(std::max(size, sizeof(RM_VPortList)));
  if (block) reinterpret_cast<RM_VPortList*>(block.get())->count = count;
  return block;
}

/// One question with room for `room` ports.
TVX_VPort_List askForVPorts(const HBA_WWN& wwpn, std::uint32_t room) {
  TVX_VPort_List answer{allocateList(room)};
  if (answer.block) answer.status = LRM_VPList(wwpn, &answer.list());
  return answer;
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

RM_VPortEntry TVX_VPort_List::entry(std::uint32_t i) const {
  RM_VPortEntry record;
  const std::size_t offset = offsetof(RM_VPortList, entry) + std::size_t{i} * sizeof record;
  std::memcpy(&record, block.get() + offset, sizeof record);
  return record;
}

TVX_VPort_List readVPorts(const HBA_WWN& wwpn, std::uint32_t most) {
  std::uint32_t room = 1;
  TVX_VPort_List answer = askForVPorts(wwpn, room);
  if (answer.block && answer.status == RM_ERROR_MORE_DATA && answer.list().count <= most) {
    room = answer.list().count;
    answer = askForVPorts(wwpn, room);
  }
  if (answer.block && answer.status == RM_OK)
    answer.list().count = std::min(answer.list().count, room);
  return answer;
}

RM_STATUS TVX_MethodWrapper::ListVPorts(const HBA_WWN* wwpn, TVX_Block* list) {
  if (list == nullptr) {
    TVX_LOG(TVX_DBG, "Invalid input pointer");
    return RM_ERROR_INVALID_POINTER;
  }
  if (!isLocal(wwpn)) return RM_ERROR;
  TVX_VPort_List answer = readVPorts(*wwpn, std::numeric_limits<std::uint32_t>::max());
  if (!answer.block) {
    TVX_LOG(TVX_ERR, "FABCMD_ListVPorts: Unable to allocate buffer");
    return RM_ERROR;
  }
  if (answer.status != RM_OK) return logFailure(answer.status);
  *list = std::move(answer.block);
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
