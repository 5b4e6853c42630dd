#include "services/TVXHBA_DriverParams_Provider.h"

#include <strings.h>

#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "services/Active_Enumeration.h"
#include "services/Service_Checks.h"
#include "services/TVX_DriverParams.h"
#include "services/TVX_OAS.h"

namespace cimrt {

namespace {

constexpr std::uint16_t ROLE_APPLIES = 2;  ///< of each property of an association that tells a role

std::string instanceIDOf(const TVXHBA_DriverParams& unit) {
  return unit.InstanceID.is_null() ? std::string() : unit.InstanceID.value.c_str();
}

/// The option that a word names, whatever its case. False for any other word.
bool readOption(const std::string& word, Oas_Option& option) {
  TVX_LOG(TVX_DBG, "OptionStr: %s", word.c_str());
  if (strcasecmp(word.c_str(), "Driver") == 0) {
    option = Oas_Option::DRIVER;
  } else if (strcasecmp(word.c_str(), "Config") == 0) {
    option = Oas_Option::CONFIGURATION;
  } else {
    TVX_LOG(TVX_ERR, "TVXHBA_DriverParams_Provider:: Invalid option");
    return false;
  }
  TVX_LOG(TVX_DBG, "Option: %d", static_cast<int>(option));
  return true;
}

/// Sets the state of a unit in the hardware. Fields that are not complete name no unit.
bool setState(const Oas_Fields& fields, std::uint8_t state, std::uint16_t option) {
  const char* initiator = fields.initiator.c_str();
  if (fields.complete &&
      TVX_MethodWrapper::SetOASLunState(initiator, initiator, fields.target.c_str(),
                                        fields.lun.c_str(), state, option) == RM_OK)
    return true;
  TVX_LOG(TVX_ERR, "TVXHBA_DriverParams_Provider::SetOASLunState failed");
  return false;
}

template <class T>
Ref<T> makeTie(const Instance* element, const TVXHBA_DriverParams* unit) {
  Ref<T> tie = makeAssociation<T>(element, unit);
  for (auto* role : {&tie->IsDefault, &tie->IsCurrent, &tie->IsMinimum, &tie->IsMaximum})
    role->set(ROLE_APPLIES);
  tie->IsPending.set(ROLE_APPLIES);
  return tie;
}

bool tieToService(ProviderAgent& agent, const TVXHBA_DriverParams* unit) {
  auto& services = agent.m_TVXHBA_FCHBADriverParamService_map;
  if (services.size() == 0) return true;
  auto tie = makeTie<TVXHBA_DriverServiceElementSettingData>(services[0], unit);
  TVX_LOG(TVX_DBG, "TVXHBA_DriverServiceElementSettingData::create() SUCCESFUL");
  return insertInto(agent.m_TVXHBA_DriverServiceElementSettingData_map, std::move(tie),
                    "Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map") != nullptr;
}

bool tieToPort(ProviderAgent& agent, const std::string& initiator,
               const TVXHBA_DriverParams* unit) {
  const TVXHBA_FCPort* port =
      findByText(agent.m_TVXHBA_FCPort_map, &TVXHBA_FCPort::DeviceID, initiator);
  if (!port) {
    TVX_LOG(TVX_WARN, "Could not find the corresponding FC Port instance.");
    return true;
  }
  return insertInto(agent.m_TVXHBA_DriverParameterAffectsFCPort_map,
                    makeTie<TVXHBA_DriverParameterAffectsFCPort>(port, unit),
                    "Insert Failed : m_TVXHBA_DriverParameterAffectsFCPort_map") != nullptr;
}

/// Puts a unit that is marked now into the maps. False if one of them refuses it.
bool keepUnit(ProviderAgent& agent, const TVXHBA_DriverParams& instance, const Oas_Fields& fields,
              Oas_Option option) {
  Ref<TVXHBA_DriverParams> unit(static_cast<TVXHBA_DriverParams*>(clone(&instance)));
  unit->__name_space = PROVIDER_NAME_SPACE;
  setOasProperties(*unit, option, OAS_ON);
  const TVXHBA_DriverParams* entry = insertInto(agent.m_TVXHBA_DriverParams_map, std::move(unit),
                                                "Insert Failed : m_TVXHBA_DriverParams_map");
  return entry && tieToService(agent, entry) && tieToPort(agent, fields.initiator, entry);
}

}  // namespace

std::int32_t TVXHBA_DriverParams_Provider::enum_instances(const TVXHBA_DriverParams*,
                                                          const Instance_Handler& handler) {
  return enumerateActive("TVXHBA_DriverParams", &Agent_Maps::m_TVXHBA_DriverParams_map, handler,
                         updateLocalDriverParams);
}

std::int32_t TVXHBA_DriverParams_Provider::create_instance(const TVXHBA_DriverParams* instance) {
  Service_Call call;
  if (!instance) {
    TVX_LOG(TVX_ERR, "Invalid(NULL) TVXHBA_DriverParams_Provider instance passed");
    return CREATE_INSTANCE_FAILED;
  }
  if (call.agent.m_TVXHBA_DriverParams_map.find(instance) != Instance_Map_Base::npos) {
    TVX_LOG(TVX_ERR, "TVXHBA_DriverParams_Provider::Duplicate instance found.");
    return CREATE_INSTANCE_DUPLICATE;
  }
  const std::string id = instanceIDOf(*instance);
  if (id.find(OAS_PARAMETER) == std::string::npos) {
    TVX_LOG(TVX_ERR, "InstanceID size = 0, OAS parameter not found in InstanceID: %s", id.c_str());
    return CREATE_INSTANCE_INVALID_PARAMETER;
  }
  TVX_LOG(TVX_DBG, "Input InstanceID: %s", id.c_str());
  const Oas_Fields fields = cutOasInstanceID(id);
  Oas_Option option{};
  if (!readOption(fields.option, option) ||
      !setState(fields, OAS_ON, static_cast<std::uint16_t>(option)) ||
      !keepUnit(call.agent, *instance, fields, option))
    return CREATE_INSTANCE_FAILED;
  TVX_LOG(TVX_DBG, "TVXHBA_DriverParams_Provider::create_instance() Succesful");
  return CREATE_INSTANCE_OK;
}

std::int32_t TVXHBA_DriverParams_Provider::delete_instance(const TVXHBA_DriverParams* instance) {
  Service_Call call;
  if (!instance) {
    TVX_LOG(TVX_ERR, "Invalid TVXHBA_DriverParams_Provider instance passed");
    return DELETE_INSTANCE_NOT_FOUND;
  }
  auto& units = call.agent.m_TVXHBA_DriverParams_map;
  const auto* unit = static_cast<const TVXHBA_DriverParams*>(units.lookup(instance));
  if (!unit) {
    TVX_LOG(TVX_ERR, "Instance Not found");
    return DELETE_INSTANCE_NOT_FOUND;
  }
  if (!setState(cutOasInstanceID(instanceIDOf(*unit)), OAS_OFF, unit->Option.value))
    return DELETE_INSTANCE_FAILED;
  dropOasAssociations(call.agent, *unit);
  return units.delete_instance(unit);
}

}  // namespace cimrt
