// The vital product data of a port.
#include "services/TVX_Vpd.h"

#include <vector>

#include "access/TVX_VpdReader.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

using Vpd = TVXHBA_VitalProductData;

/// A keyword that has a name, and the property that takes its value.
struct Keyword_Row {
  const char* keyword;
  const char* name;
  Property<String> Vpd::*property;
};

// Searched in this order.
constexpr Keyword_Row KEYWORDS[] = {
    {"CP", "EXT_CAPABILITY", &Vpd::ExtCapability},
    {"EC", "EC_LEVEL", &Vpd::ECLevel},
    {"FG", "FABRIC_GEOGRAPHY", &Vpd::FabricGeography},
    {"LC", "LOCATION", &Vpd::Location},
    {"MN", "MANUFACTURER_ID", &Vpd::ManufactureId},
    {"PG", "PCI_GEOGRAPHY", &Vpd::PCIGeography},
    {"PN", "PART_NUMBER", &Vpd::PartNumber},
    {"SN", "SERIAL_NUMBER", &Vpd::VPDSerialNumber},
    {"YX", "YX (VPD-W)", &Vpd::VPDW},
};

/// The vendor's own fields, which have a property and no name.
struct Field_Row {
  const char* keyword;
  Property<String> Vpd::*property;
};

constexpr Field_Row FIELDS[] = {
    {"V0", &Vpd::FieldV0}, {"V1", &Vpd::FieldV1}, {"V2", &Vpd::FieldV2}, {"V3", &Vpd::FieldV3},
    {"V4", &Vpd::FieldV4}, {"V5", &Vpd::FieldV5}, {"VB", &Vpd::FieldVB},
};

template <class Row, std::size_t N>
const Row* findRow(const Row (&rows)[N], const TVX_VpdEntry& entry) {
  for (const Row& row : rows)
    if (entry.is(row.keyword)) return &row;
  return nullptr;
}

void storeOther(Vpd& vpd, const TVX_VpdEntry& entry) {
  TVX_LOG(TVX_DBG, "%s--%s", entry.name().c_str(), entry.text());
  if (const Field_Row* field = findRow(FIELDS, entry)) {
    (vpd.*field->property).set(entry.text());
    return;
  }
  vpd.VPDTags.append(String(entry.name()));
  vpd.VPDTagValues.append(String(entry.text()));
}

void storeEntry(Vpd& vpd, const TVX_VpdEntry& entry) {
  if (const Keyword_Row* row = findRow(KEYWORDS, entry)) {
    TVX_LOG(TVX_DBG, "VPD:%s", row->name);
    (vpd.*row->property).set(entry.text());
  } else if (entry.isProductName()) {
    vpd.ProductName.set(entry.text());
  } else {
    storeOther(vpd, entry);
  }
}

std::string listedName(const TVX_VpdEntry& entry) {
  if (const Keyword_Row* row = findRow(KEYWORDS, entry)) return std::string("VPD:") + row->name;
  return entry.isProductName() ? "VPD:PRODUCT_NAME" : "VPD:" + entry.name();
}

}  // namespace

RM_STATUS CreateVPD(ProviderAgent& agent, const char* deviceID) {
  TVX_LOG(TVX_DBG, "Inside CreateVPD");
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) != RM_OK) return RM_ERROR;
  std::vector<TVX_VpdEntry> entries;
  if (const RM_STATUS status = readVpd(wwpn, entries); status != RM_OK) {
    TVX_LOG(TVX_DBG, "ERROR: RM_GetVPD call failed : %d", status);
    return status;
  }
  auto vpd = makeInstance<Vpd>();
  vpd->InstanceID.set(deviceID);
  for (const TVX_VpdEntry& entry : entries) storeEntry(*vpd, entry);
  return insertInto(agent.m_TVXHBA_VitalProductData_map, std::move(vpd),
                    "Insert Failed : m_TVXHBA_VitalProductData_map")
             ? RM_OK
             : RM_ERROR;
}

RM_STATUS ListVPD(const char* deviceID, Array<String>& names, Array<String>& values) {
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) != RM_OK) return RM_ERROR;
  std::vector<TVX_VpdEntry> entries;
  if (const RM_STATUS status = readVpd(wwpn, entries); status != RM_OK) {
    TVX_LOG(TVX_DBG, "ERROR: RM_GetVPD call failed, Returned with error code : %d", status);
    return status;
  }
  for (const TVX_VpdEntry& entry : entries) {
    names.append(String(listedName(entry)));
    values.append(String(entry.text()));
  }
  return RM_OK;
}

std::int32_t buildVitalProductData(Port_Build& build) {
  ProviderAgent& agent = build.adapter.host.agent;
  const std::string& deviceID = build.port.m_Name;
  if (CreateVPD(agent, deviceID.c_str()) != RM_OK) {
    TVX_LOG(TVX_DBG, "FC port %s CreateVPD failed", deviceID.c_str());
    return 0;
  }
  associate(agent.m_TVXHBA_ElementVPD_map, build.pciDevice,
            findByText(agent.m_TVXHBA_VitalProductData_map, &Vpd::InstanceID, deviceID),
            "Insert Failed : m_TVXHBA_ElementVPD_map");
  return 0;
}

}  // namespace cimrt
