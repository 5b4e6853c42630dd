// The data of field replaceable units: how they are read, and what takes them over.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <span>
#include <vector>

#include "access/TVX_VpdReader.h"
#include "agent/Associations.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "agent/SoftwareIdentities.h"
#include "common/CLogger.h"
#include "services/TVX_Vpd.h"

namespace cimrt {

namespace {

/// A keyword of the unit's data, and where its value goes.
struct FRU_Keyword {
  const char* keyword;
  const char* name;
  FRU_Data::Text FRU_Data::*field;
};

constexpr FRU_Keyword KEYWORDS[] = {
    {"PA", "Product Name", &FRU_Data::productName},
    {"SN", "Serial Number", &FRU_Data::serialNumber},
    {"PN", "Part Number", &FRU_Data::partNumber},
    {"MN", "Manufacturer", &FRU_Data::manufacturer},
    {"DM", "Date (WWYY format)", &FRU_Data::date},
    {"UU", "UUID", &FRU_Data::uuid},
    {"CF", "Card Function", &FRU_Data::cardFunction},
    {"RI", "Revision ID", &FRU_Data::revisionID},
    {"FN", "FRU Number", &FRU_Data::fruNumber},
    {"FW", "Firmware", &FRU_Data::firmwareDetail},
};

constexpr std::size_t UUID_BYTES = 16;

struct Code_Text {
  std::uint32_t code;
  const char* text;
};

constexpr Code_Text CLASSIFICATIONS[] = {
    {2, "Driver"}, {10, "Firmware"}, {11, "BIOD/Fcode"}, {32775, "CIM Provider"}};

constexpr Code_Text CARD_FUNCTIONS[] = {
    {0, "Reserved"}, {16, "Infiniband"}, {64, "Ethernet"}, {80, "Fibre Channel"}, {96, "iSCSI"}};

std::int32_t textOf(std::span<const Code_Text> table, std::uint32_t code, std::string& text) {
  for (const Code_Text& row : table) {
    if (row.code != code) continue;
    text = row.text;
    return 0;
  }
  return CODE_UNKNOWN;
}

/// The identifier comes as plain bytes.
void storeUUID(FRU_Data::Text& field, const TVX_VpdEntry& entry) {
  for (std::size_t i = 0; i < UUID_BYTES; ++i)
    std::snprintf(field + 2 * i, 3, "%02x",
                  static_cast<unsigned>(static_cast<unsigned char>(entry.value[i])));
}

void storeText(FRU_Data::Text& field, const TVX_VpdEntry& entry) {
  const std::size_t length = std::min(std::strlen(entry.text()), FRU_TEXT_LENGTH);
  std::memcpy(field, entry.text(), length);
  field[length] = '\0';
}

void storeEntry(FRU_Data& record, const TVX_VpdEntry& entry) {
  for (const FRU_Keyword& row : KEYWORDS) {
    if (!entry.is(row.keyword)) continue;
    TVX_LOG(TVX_DBG, "VPD:%s", row.name);
    entry.is("UU") ? storeUUID(record.*row.field, entry) : storeText(record.*row.field, entry);
    return;
  }
}

bool isEmpty(const char* text) {
  return *text == '\0';
}

std::uint32_t hexNumber(const char* text) {
  return static_cast<std::uint32_t>(std::strtol(text, nullptr, 16));
}

std::string functionOf(const FRU_Data& fru) {
  std::string text;
  cardFunctionText(hexNumber(fru.cardFunction), text);
  return text;
}

/// Sets a text property from a field that says something.
void take(Property<String>& property, const char* text) {
  if (!isEmpty(text)) property.set(text);
}

std::string cardName(const FRU_Data& fru, std::uint32_t portIndex) {
  const std::string function = functionOf(fru);
  if (isEmpty(fru.serialNumber))
    return formatText("%s %s Onboard Adapter %d", fru.manufacturer, function.c_str(),
                      static_cast<int>(portIndex));
  return formatText("%s %s Adapter %s", fru.manufacturer, function.c_str(), fru.serialNumber);
}

/// Gives the card a new `Tag`, which is one of its keys, unless that makes it equal to another
/// card.
void takeTag(ProviderAgent& agent, TVXHBA_Card* card, const char* uuid) {
  auto& map = agent.m_TVXHBA_Card_map;
  const std::size_t position = map.find(card);
  if (isEmpty(uuid) || card->Tag.value == uuid || position == Instance_Map_Base::npos) return;
  const String oldTag = card->Tag.value;
  Ref<TVXHBA_Card> renamed(clone(card));
  renamed->Tag.set(uuid);
  if (map.find(renamed.get()) != Instance_Map_Base::npos) {
    TVX_LOG(TVX_WARN, "The FRU UUID of Card : %s is the Tag of another card", oldTag.c_str());
    return;
  }
  card->Tag.set(uuid);
  map.key_changed(position);
}

void updateCard(ProviderAgent& agent, TVXHBA_Card* card, const FRU_Data& fru,
                std::uint32_t portIndex) {
  take(card->Manufacturer, fru.manufacturer);
  take(card->SerialNumber, fru.serialNumber);
  take(card->PartNumber, fru.partNumber);
  take(card->SKU, fru.fruNumber);
  takeTag(agent, card, fru.uuid);
  if (!isEmpty(fru.manufacturer)) card->Name.set(cardName(fru, portIndex).c_str());
}

Ref<TVXHBA_FRUVitalProductData> makeFRU(const TVXHBA_Card& card, const FRU_Data& fru,
                                        const char* asic) {
  auto made = makeInstance<TVXHBA_FRUVitalProductData>();
  made->InstanceID = card.SerialNumber;
  made->ElementName.set(formatText("TVX HBA FRU:%s", card.SerialNumber.value.c_str()).c_str());
  made->ProductName.set(fru.productName);
  made->SerialNumber.set(fru.serialNumber);
  made->PartNumber.set(fru.partNumber);
  made->Manufacturer.set(fru.manufacturer);
  made->Date.set(fru.date);
  made->UUID.set(fru.uuid);
  made->FRUNumber.set(fru.fruNumber);
  made->FRUFirmwareDetail.set({fru.firmwareDetail});
  made->ASICId.set({asic});
  made->CardFunction.set(hexNumber(fru.cardFunction));
  made->RevisionID.set(hexNumber(fru.revisionID));
  return made;
}

const char* asicOf(const TVXHBA_Card& card, Chip_Kind kind, const char* text,
                   const char* deviceID) {
  switch (kind) {
    case Chip_Kind::SUB_ADAPTER:
      return text;
    case Chip_Kind::OTHER:
      return deviceID;
    default:
      return card.SerialNumber.value.c_str();
  }
}

/// The unit's instance with its association. Data that an earlier port of the card gave stand.
std::int32_t insertFRU(ProviderAgent& agent, const TVXHBA_Card* card,
                       Ref<TVXHBA_FRUVitalProductData> made) {
  auto& map = agent.m_TVXHBA_FRUVitalProductData_map;
  if (map.find(made.get()) != Instance_Map_Base::npos) return 0;
  const auto* fru =
      insertInto(map, std::move(made), "Insert Failed : m_TVXHBA_FRUVitalProductData_map");
  if (!fru) return FRU_FAILED;
  return associate(agent.m_TVXHBA_FRUElementVPD_map, card, fru,
                   "Insert Failed : TVXHBA_FRUElementVPD")
             ? 0
             : FRU_FAILED;
}

// --- The software of the ports ---------------------------------------------------------------

std::uint16_t classificationOf(const TVXHBA_SoftwareIdentity& identity) {
  const auto& classes = identity.Classifications;
  return classes.is_null() || classes.value.size() == 0 ? 0 : classes.value[0];
}

/// Only firmware and boot code are named after their adapter; the others keep their names.
bool isNamedAfterAdapter(const TVXHBA_SoftwareIdentity& identity) {
  return classificationOf(identity) == SOFTWARE_BOOT_CODE ||
         identity.InstanceID.value.find("TVX FC HBA:Firmware:") == 0;
}

void nameSoftware(TVXHBA_SoftwareIdentity& identity, const FRU_Data& fru) {
  if (!isNamedAfterAdapter(identity) || isEmpty(fru.manufacturer) || isEmpty(fru.serialNumber))
    return;
  const std::uint16_t classification = classificationOf(identity);
  std::string kind = "BootCode";
  if (classification != SOFTWARE_BOOT_CODE) softwareClassificationText(classification, kind);
  identity.Name.set(formatText("%s %s Adapter %s %s", fru.manufacturer, functionOf(fru).c_str(),
                               fru.serialNumber, kind.c_str())
                        .c_str());
}

void updateSoftware(ProviderAgent& agent, const String& portName, const FRU_Data& fru) {
  auto& map = agent.m_TVXHBA_SoftwareIdentity_map;
  for (std::size_t i = 0; i < map.size(); i++) {
    TVXHBA_SoftwareIdentity* identity = map[i];
    if (!identity) {
      TVX_LOG(TVX_DBG, "Failed to map CIM_Softwareidentity Instance");
      continue;
    }
    if (identity->PortWWN.is_null() || !(identity->PortWWN.value == portName)) continue;
    take(identity->Manufacturer, fru.manufacturer);
    take(identity->SerialNumber, fru.serialNumber);
    nameSoftware(*identity, fru);
  }
}

void updatePortSoftware(ProviderAgent& agent, const TVXHBA_PortController* controller,
                        FRU_Data& fru) {
  if (!controller) {
    TVX_LOG(TVX_DBG, "Failed to map CIM_PortController Instance");
    return;
  }
  const char* deviceID = controller->DeviceID.value.c_str();
  TVX_LOG(TVX_DBG, "DeviceID %s ", deviceID);
  fru = FRU_Data{};
  if (TVX_Vpd::GetFRUVPD(deviceID, &fru) != RM_OK) {
    TVX_LOG(TVX_DBG, "Unable to get the FRU VPD for Card/Port : %s ", deviceID);
    return;
  }
  updateSoftware(agent, controller->DeviceID.value, fru);
}

}  // namespace

std::int32_t softwareClassificationText(std::uint32_t code, std::string& text) {
  return textOf(CLASSIFICATIONS, code, text);
}

std::int32_t cardFunctionText(std::uint32_t code, std::string& text) {
  return textOf(CARD_FUNCTIONS, code, text);
}

RM_STATUS TVX_Vpd::GetFRUVPD(const char* deviceID, FRU_Data* record) {
  TVX_LOG(TVX_DBG, "TVX_Vpd::GetFRUVPD");
  if (!deviceID || !record) {
    TVX_LOG(TVX_DBG, "Invalid Parameter");
    return RM_ERROR_INVALID_POINTER;
  }
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) != RM_OK) return RM_ERROR;
  std::vector<TVX_VpdEntry> entries;
  if (const RM_STATUS status = readVpdV2(wwpn, entries); status != RM_OK) {
    TVX_LOG(TVX_DBG, "ERROR: RM_GetVPDV2 call failed : %d", status);
    return status;
  }
  for (const TVX_VpdEntry& entry : entries) storeEntry(*record, entry);
  return RM_OK;
}

std::int32_t TVX_Vpd::UpdateFRUToCard(ProviderAgent& agent, TVXHBA_Card* card, Chip_Kind kind,
                                      const char* asicText, const char* deviceID,
                                      std::uint32_t portIndex) {
  TVX_LOG(TVX_DBG, "TVX_Vpd::UpdateFRUToCard");
  if (!card || !card->SKU.value.empty()) return 0;
  FRU_Data fru{};
  if (GetFRUVPD(deviceID, &fru) != RM_OK) {
    TVX_LOG(TVX_DBG, "Unable to get the FRU VPD for Card : %s ", card->Tag.value.c_str());
    return 0;
  }
  updateCard(agent, card, fru, portIndex);
  return insertFRU(agent, card, makeFRU(*card, fru, asicOf(*card, kind, asicText, deviceID)));
}

std::int32_t TVX_Vpd::UpdateFRUToFCProvider(ProviderAgent& agent) {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::UpdateFRUToFCProvider");
  if (agent.m_TVXHBA_Card_map.size() == 0) {
    TVX_LOG(TVX_DBG, "No FC Card exist to fetch FRU infformation");
    return 0;
  }
  if (agent.m_TVXHBA_SoftwareIdentity_map.size() == 0) {
    TVX_LOG(TVX_DBG, "No SoftwareIdentity instance to update the FRU Data");
    return 0;
  }
  const TVX_Block block = tvxAllocate(sizeof(FRU_Data));
  if (!block) {
    TVX_LOG(TVX_ERR, "Failed to allocate the memory to hold the FRU data");
    return FRU_FAILED;
  }
  auto& controllers = agent.m_TVXHBA_PortController_map;
  for (std::size_t i = 0; i < controllers.size(); i++)
    updatePortSoftware(agent, controllers[i], *reinterpret_cast<FRU_Data*>(block.get()));
  return 0;
}

std::int32_t updateCardFromFRU(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  if (TVX_Vpd::UpdateFRUToCard(adapter.host.agent, adapter.card, build.chipKind,
                               adapter.attributes.SubAdapterID.c_str(), build.port.m_Name.c_str(),
                               build.port.m_Index) == 0)
    return 0;
  TVX_LOG(TVX_CRIT, "Update FRU related class failed");
  return MAP_BUILD_FAILED;
}

std::int32_t updateSoftwareFromFRU(Host_Build& host) {
  try {
    if (TVX_Vpd::UpdateFRUToFCProvider(host.agent) != 0)
      TVX_LOG(TVX_ERR,
              "Failed to update FRU VPD data to cim_ Softwareidentity/PhysicalPackage instances");
  } catch (...) {
    TVX_LOG(TVX_ERR,
            "Exception occured during FRU update to cim_ Softwareidentity/PhysicalPackage "
            "instances");
  }
  return 0;
}

}  // namespace cimrt
