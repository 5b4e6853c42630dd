// The boot code of a port: turning it on and off, and asking for its state.
#include <cctype>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

/// What callers get for a read that could not be made.
constexpr RM_STATUS FAILED = RM_ERROR;

/// Bytes that the library is told to have for the attributes.
constexpr std::uint32_t ATTRIBUTES_ROOM = 2048;

/// The state byte out of a block of attributes.
RM_STATUS readBootCodeEnabled(const void* block, std::uint32_t* state) {
  const TVX_Attribute attribute = findAttribute(block, RM_HA_BOOT_CODE_ENABLED);
  if (attribute.value == nullptr) {
    TVX_LOG(TVX_DBG, "ERROR: RM_GetHBAAttributeValue HA__BootCodeEnabled call failed (%d)",
            attribute.status);
    return FAILED;
  }
  *state = attribute.length != 0 ? *attribute.value : 0;
  TVX_LOG(TVX_DBG, "_BootCodeEnabled: [ %d ]", static_cast<int>(*state));
  return RM_OK;
}

}  // namespace

RM_STATUS TVX_MethodWrapper::tvxcimSetBootBiosState(const HBA_WWN& wwpn, const char* controlWord) {
  TVX_LOG(TVX_DBG, "Entering TVX_MethodWrapper::tvxcimSetBootBiosState");
  if (controlWord == nullptr) {
    TVX_LOG(TVX_ERR, "Null Pointer Assignment to argument CtrlWord");
    return RM_ERROR_INVALID_POINTER;
  }
  TVX_LOG(TVX_DBG, "CtrlWord is %2c", *controlWord);
  const int word = std::tolower(static_cast<unsigned char>(*controlWord));
  if (word != 'e' && word != 'd') return FAILED;
  const RM_STATUS status =
      LRM_SetBootBiosState(wwpn, word == 'e' ? RM_BOOT_ENABLE : RM_BOOT_DISABLE);
  if (status == RM_OK)
    TVX_LOG(TVX_DBG, "BootBios State has been set");
  else
    TVX_LOG(TVX_ERR, "ERROR: RM_SetBootBiosState failure: %d", status);
  return status;
}

RM_STATUS TVX_MethodWrapper::tvxcimGetBootBiosState(const HBA_WWN& wwpn, std::uint32_t* state) {
  TVX_LOG(TVX_DBG, "Entering TVX_MethodWrapper::tvxcimGetBootBiosState");
  if (Validatewwpn(&wwpn) != RM_OK) {
    TVX_LOG(TVX_ERR, "INVALID wwpn");
    return FAILED;
  }
  if (state == nullptr) {
    TVX_LOG(TVX_ERR, "Null Pointer Assignment to argument BootBiosState");
    return FAILED;
  }
  const TVX_Block block = allocateAttributeBlock(ATTRIBUTES_ROOM);
  if (block == nullptr) {
    TVX_LOG(TVX_ERR, "Unable to allocate the memory for the HBA attributes");
    return FAILED;
  }
  std::uint32_t size = ATTRIBUTES_ROOM;
  if (const RM_STATUS status = LRM_GetHBAAttributes(wwpn, block.get(), &size); status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
    return FAILED;
  }
  return readBootCodeEnabled(block.get(), state);
}

}  // namespace cimrt
