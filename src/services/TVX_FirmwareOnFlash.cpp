// The version on flash, from the adapter into the software identity of its port.
#include <strings.h>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/ProviderAgent.h"
#include "common/TVX_Common.h"

namespace cimrt {

namespace {

constexpr std::uint32_t BLOCK_SIZE = 2048;

RM_STATUS readFirmwareOnFlash(const HBA_WWN& wwpn, std::string& version) {
  const TVX_Block block = allocateAttributeBlock(BLOCK_SIZE);
  if (block == nullptr) {
    TVX_LOG(TVX_ERR, "ERROR: GetHBAAttributes: Unable to allocate buffer");
    return RM_ERROR;
  }
  std::uint32_t size = BLOCK_SIZE;
  const RM_STATUS status = LRM_GetHBAAttributes(wwpn, block.get(), &size);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
    return RM_ERROR;
  }
  readTextAttribute(block.get(), RM_HA_FIRMWARE_ON_FLASH, "_FirmwareOnFlash", version);
  return RM_OK;
}

void storeFirmwareOnFlash(const HBA_WWN& wwpn, const std::string& version) {
  const std::string name = WWNToString(wwpn.wwn);
  auto& identities = ProviderAgent::getInstance()->m_TVXHBA_SoftwareIdentity_map;
  for (std::size_t i = 0; i < identities.size(); i++) {
    const Property<String>& port = identities[i]->PortWWN;
    if (port.is_null() || !port.value.equali(name.c_str())) continue;
    identities[i]->FirmwareOnFlash.set(version.c_str());
    return;
  }
}

}  // namespace

// Declared with the other operations on a port; it lies here because the identities belong to the
// agent, of which the wrapper knows nothing.
RM_STATUS TVX_MethodWrapper::UpdateFirmwareOnFlash(const HBA_WWN* wwpn) {
  TVX_LOG(TVX_DBG, "Entering TVX_MethodWrapper::UpdateFirmwareOnFlash");
  if (Validatewwpn(wwpn) != RM_OK) {
    TVX_LOG(TVX_ERR, "INVALID wwpn");
    return RM_ERROR;
  }
  std::string version;
  if (const RM_STATUS status = readFirmwareOnFlash(*wwpn, version); status != RM_OK) return status;
  storeFirmwareOnFlash(*wwpn, version);
  return RM_OK;
}

}  // namespace cimrt
