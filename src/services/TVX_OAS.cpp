#include "services/TVX_OAS.h"

#include <algorithm>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"

namespace cimrt {

namespace {

// Places of the fields in an InstanceID; a ":" stands before each.
constexpr std::size_t OPTION_AT = 8;
constexpr std::size_t OPTION_SIZE = 6;
constexpr std::size_t INITIATOR_AT = 15;
constexpr std::size_t TARGET_AT = 32;
constexpr std::size_t LUN_AT = 49;
constexpr std::size_t DEVICE_ID_SIZE = 16;
constexpr std::size_t MAX_LUN_DIGITS = 18;  // what surely fits a number of 64 bits

/// What the library answers where the hardware knows no optimized access.
constexpr RM_STATUS OAS_UNSUPPORTED = 251;

std::string fieldAt(const std::string& text, std::size_t place, std::size_t size) {
  return text.size() > place ? text.substr(place, size) : std::string();
}

bool isNumber(const std::string& text) {
  return !text.empty() && text.size() <= MAX_LUN_DIGITS &&
         std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

bool hasSeparators(const std::string& id) {
  for (const std::size_t field : {OPTION_AT, INITIATOR_AT, TARGET_AT, LUN_AT})
    if (id.size() <= field || id[field - 1] != ':') return false;
  return true;
}

Ref<TVXHBA_DriverParams> makeUnit(const std::string& port, const std::string& target,
                                  Oas_Option option, const RM_OASLunEntry& record) {
  auto unit = makeInstance<TVXHBA_DriverParams>();
  const std::string id = formatText(
      option == Oas_Option::CONFIGURATION ? "TVX:OAS:Config:%s:%s:%d" : "TVX:OAS:Driver:%s:%s:%d",
      port.c_str(), target.c_str(), static_cast<int>(record.lun));
  unit->InstanceID.set(id.c_str());
  TVX_LOG(TVX_DBG, "OAS Buffer InstanceId: %s", id.c_str());
  setOasProperties(*unit, option, record.state);
  return unit;
}

/// What the answer of the library tells of the chip.
std::uint16_t capabilityOf(RM_STATUS status) {
  if (status == RM_OK) return 1;
  if (status == OAS_UNSUPPORTED || status == RM_ERROR_NOT_SUPPORTED) {
    TVX_LOG(TVX_WARN, "GetOASLunList failed. Unsupported Hardware");
    return 0;
  }
  TVX_LOG(TVX_WARN, "GetOASLunList failed.");
  return 1;
}

/// Removes the ties of one map whose setting data is `unit`. The entry that moves into the place of
/// a removed one is passed over.
template <class T>
void dropTies(Instance_Map<T>& map, const TVXHBA_DriverParams& unit, const char* text) {
  for (std::size_t i = 0; i < map.size(); i++) {
    if (!map[i]->SettingData || !key_eq(map[i]->SettingData, &unit)) continue;
    TVX_LOG(TVX_DBG, "%s", text);
    map.delete_instance(map[i]);
  }
}

}  // namespace

Oas_Fields cutOasInstanceID(const std::string& instanceID) {
  Oas_Fields fields{fieldAt(instanceID, OPTION_AT, OPTION_SIZE),
                    fieldAt(instanceID, INITIATOR_AT, DEVICE_ID_SIZE),
                    fieldAt(instanceID, TARGET_AT, DEVICE_ID_SIZE),
                    fieldAt(instanceID, LUN_AT, std::string::npos)};
  fields.complete = hasSeparators(instanceID) && isNumber(fields.lun);
  return fields;
}

void setOasProperties(TVXHBA_DriverParams& unit, Oas_Option option, std::uint32_t state) {
  unit.paramname.set(OAS_PARAMETER);
  unit.current.set(state);
  unit.ElementName.set("TVX:OAS");
  unit.ConfigurationName.set("Optimized Access Storage");
  unit.Option.set(static_cast<std::uint16_t>(option));
}

std::int32_t createOasUnits(ProviderAgent& agent, const std::string& port,
                            const std::string& target, Oas_Option option,
                            const RM_OASLunList& list) {
  const RM_OASLunEntry* records = list.entry;
  for (std::uint32_t i = 0; i < list.count; i++) {
    const TVXHBA_DriverParams* entry =
        insertInto(agent.m_TVXHBA_DriverParams_map, makeUnit(port, target, option, records[i]),
                   "Insert Failed : m_TVXHBA_DriverParams_map");
    if (!entry) return OAS_UNIT_REFUSED;
    TVX_LOG(TVX_DBG, "Created FC OAS Driver Params");
    auto& services = agent.m_TVXHBA_FCHBADriverParamService_map;
    if (services.size() == 0) continue;
    if (associate(agent.m_TVXHBA_DriverServiceElementSettingData_map, services[0], entry,
                  "Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map"))
      TVX_LOG(TVX_DBG, "TVXUCNA_DriverElementSettingData::create() SUCCESFUL");
  }
  return 0;
}

bool dropOasAssociations(ProviderAgent& agent, const TVXHBA_DriverParams& unit) {
  dropTies(agent.m_TVXHBA_DriverServiceElementSettingData_map, unit,
           "Got the related Driver Element Setting Data");
  dropTies(agent.m_TVXHBA_DriverParameterAffectsFCPort_map, unit,
           "Got the related LocalPort Element SettingData");
  return true;
}

void readOptimizedAccess(ProviderAgent& agent, const std::string& port, const std::string& target,
                         TVXHBA_Chip* chip) {
  for (const Oas_Option option : {Oas_Option::CONFIGURATION, Oas_Option::DRIVER}) {
    TVX_Block list;
    const RM_STATUS status = TVX_MethodWrapper::GetOASLunList(
        port.c_str(), port.c_str(), target.c_str(), static_cast<std::uint32_t>(option), &list);
    const std::uint16_t capability = capabilityOf(status);
    if (chip) chip->OASCapability.set(capability);
    if (status == RM_OK)
      createOasUnits(agent, port, target, option,
                     *reinterpret_cast<const RM_OASLunList*>(list.get()));
  }
}

}  // namespace cimrt
