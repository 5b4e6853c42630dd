#include "services/TVX_FlashImage.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string>

#include "agent/Identity_Version.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "agent/SoftwareIdentities.h"
#include "common/CLogger.h"
#include "common/TVX_Clock.h"
#include "common/TVX_Memory.h"

namespace cimrt {

namespace {

static_assert(sizeof(RM_LoadListEntry) == 100 && offsetof(RM_LoadList, entry) == 4);

constexpr std::uint16_t UPGRADE_BY_PACKAGES = 3;
constexpr std::uint16_t STATUS_INSTALLED = 6;

/// What the instances of one port have in common.
struct Flash_Build {
  ProviderAgent& agent;
  const char* deviceID;
  const FCAdapterAttributes& attributes;
  const Instance* element;
};

template <std::size_t N>
std::string textOf(const char (&field)[N]) {
  return std::string(field, strnlen(field, N));
}

Ref<TVXHBA_FlashImageSoftwareIdentity> makeImage(const Flash_Build& build,
                                                 const RM_LoadListEntry& entry) {
  auto image = makeInstance<TVXHBA_FlashImageSoftwareIdentity>();
  const std::string version = textOf(entry.version);
  image->Next.set(entry.next);
  image->Previous.set(entry.previous);
  image->StartAddress.set(entry.startAddress);
  image->ProgramLength.set(entry.length);
  image->ProgramID.set({entry.programId[0], entry.programId[1]});
  image->IsWakeupParameter.set(entry.wakeup != 0);
  image->Description.set(textOf(entry.description).c_str());
  image->ProgramType.set(textOf(entry.programType).c_str());
  image->Name.set(textOf(entry.programType).c_str());
  image->VersionString.set(version.c_str());
  setParsedVersion(*image, "FlashContentsInstance ", version);
  const std::string name =
      formatText("FC HBA Flash Image %s v %s %s %s", textOf(entry.programType).c_str(),
                 version.c_str(), build.attributes.Model.c_str(), build.deviceID);
  image->ElementName.set(name.c_str());
  image->InstanceID.set(name.c_str());
  return image;
}

void setCommon(TVXHBA_FlashImageSoftwareIdentity& image, const Flash_Build& build) {
  image.Manufacturer.set(build.attributes.Manufacturer.c_str());
  image.Classifications.set({SOFTWARE_FIRMWARE});
  image.ClassificationDescriptions.set({"Firmware Kernel"});
  image.IsEntity.set(true);
  image.IdentityInfoValue.set({image.Description.value, image.VersionString.value});
  image.IdentityInfoType.set({"TORVEX:FLASH_PROGRAM_TYPE", "TORVEX:FLASH_PROGRAM_ID"});
  image.ReleaseDate.set(tvxNowDatetime());
}

RM_STATUS tieToElement(const Flash_Build& build, const Instance* image) {
  using Tie = TVXHBA_ElementFlashImageSoftwareIdentity;
  Ref<Tie> tie = madeOrNull(
      [&] { return build.element ? makeAssociation<Tie>(image, build.element) : Ref<Tie>(); });
  if (!tie) {
    TVX_LOG(TVX_DBG, "Failed to create ElementFlashImageSoftwareIdentityInst");
    return RM_OK;
  }
  tie->UpgradeCondition.set(UPGRADE_BY_PACKAGES);
  tie->ElementSoftwareStatus.set({STATUS_INSTALLED});
  return insertInto(build.agent.m_TVXHBA_ElementFlashImageSoftwareIdentity_map, std::move(tie),
                    "Insert Failed : m_TVXHBA_ElementFlashImageSoftwareIdentityInst_map ")
             ? RM_OK
             : RM_ERROR;
}

RM_STATUS buildImage(const Flash_Build& build, const RM_LoadListEntry& entry) {
  Ref<TVXHBA_FlashImageSoftwareIdentity> made = makeImage(build, entry);
  setCommon(*made, build);
  const Instance* image =
      insertInto(build.agent.m_TVXHBA_FlashImageSoftwareIdentity_map, std::move(made),
                 "Insert Failed : m_TVXHBA_FlashImageSoftwareIdentity_map ");
  return image ? tieToElement(build, image) : RM_ERROR;
}

/// Entries in the list: its count includes one that is not there.
std::uint32_t entriesOf(const RM_LoadList& list) {
  return list.count == 0 ? 0 : std::min<std::uint32_t>(list.count - 1, RM_LOAD_LIST_MAX);
}

/// The list, or null with the failure logged.
TVX_Block readList(const HBA_WWN& wwpn) {
  TVX_Block block = tvxAllocate(sizeof(RM_LoadList));
  const RM_STATUS status =
      block ? LRM_DiagGetLoadListParams(wwpn, reinterpret_cast<RM_LoadList*>(block.get()))
            : RM_ERROR_NO_MEMORY;
  if (status == RM_OK) return block;
  TVX_LOG(TVX_DBG, "Failed to retrieve the flash contents. Exited with ErrorCode %d", status);
  return nullptr;
}

}  // namespace

RM_STATUS CreateFlashImageIdentity(ProviderAgent& agent, const char* deviceID,
                                   const FCAdapterAttributes& attributes, const Instance* element) {
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) != RM_OK) return RM_ERROR;
  const TVX_Block block = readList(wwpn);
  if (!block) return RM_ERROR;
  TVX_LOG(TVX_DBG, "Generating TVXHBA_FlashImageSoftwareIdentity.");
  const auto& list = *reinterpret_cast<const RM_LoadList*>(block.get());
  const Flash_Build build{agent, deviceID, attributes, element};
  for (std::uint32_t i = 0; i < entriesOf(list); i++)
    if (const RM_STATUS status = buildImage(build, list.entry[i]); status != RM_OK) return status;
  TVX_LOG(TVX_DBG, "Success...");
  return RM_OK;
}

std::int32_t buildFlashImages(Port_Build& build) {
  CreateFlashImageIdentity(build.adapter.host.agent, build.port.m_Name.c_str(),
                           build.adapter.attributes, build.fcPort);
  return 0;
}

}  // namespace cimrt
