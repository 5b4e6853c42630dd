#include "services/TVXHBA_FCHBADriverParamService_Provider.h"

#include <string_view>

#include "access/TVX_MethodWrapper.h"
#include "services/Service_Checks.h"
#include "services/TVX_OAS.h"

namespace cimrt {

namespace {

const char* textOrNull(const Property<String>& property) {
  return property.is_null() ? nullptr : property.value.c_str();
}

bool checkService(const ProviderAgent& agent, const TVXHBA_FCHBADriverParamService* service) {
  if (isKnownService(agent.m_TVXHBA_FCHBADriverParamService_map, service)) return true;
  TVX_LOG(TVX_ERR, "Invalid instance of HBA Driver Parameter Service");
  return false;
}

/// The port that is meant, with its name in both forms.
const char* findTarget(ProviderAgent& agent, const TVXHBA_FCPort* target, HBA_WWN& wwpn) {
  if (!target) {
    TVX_LOG(TVX_ERR,
            "TVXHBA_FCHBADriverParamService_Provider SetDriverParameter invald fc port ...return");
    return nullptr;
  }
  const TVXHBA_FCPort* port = findTargetPort(agent, target);
  if (!port) {
    TVX_LOG(TVX_ERR, "TVXHBA_FCHBADriverParamService_Provider invald fc port ...return");
    return nullptr;
  }
  const char* deviceID = port->DeviceID.value.c_str();
  return TVX_MethodWrapper::deviceIdToWWN(&wwpn, deviceID) == RM_OK ? deviceID : nullptr;
}

std::uint32_t setParameter(const char* deviceID, const HBA_WWN& wwpn, bool global, bool permanent,
                           const Property<String>& parameter, const Property<String>& value) {
  TVX_LOG(TVX_DBG,
          "Entering TVXHBA_FCHBADriverParamService_Provider::SetDriverParam(): "
          "tvxcimSetDriverParam");
  const RM_STATUS status = TVX_MethodWrapper::tvxcimSetDriverParam(
      deviceID, &wwpn, global, permanent, textOrNull(parameter), textOrNull(value));
  if (status == RM_OK) {
    TVX_LOG(TVX_INFO, "TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam Succeeded");
    return METHOD_OK;
  }
  TVX_LOG(TVX_ERR, "TVXHBA_FCHBADriverParamService_Provider::tvxcimSetDriverParam failed");
  return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

bool isMissing(const Property<String>& text) {
  return text.is_null() || text.value.size() == 0;
}

/// True if the entry is a unit of that path, which stands in its name as "initiator:target".
bool isUnitOf(const TVXHBA_DriverParams& entry, const std::string& path) {
  return !entry.paramname.is_null() && entry.paramname.value.equal(OAS_PARAMETER) &&
         !entry.InstanceID.is_null() &&
         std::string_view(entry.InstanceID.value.c_str()).find(path) != std::string_view::npos;
}

bool disableUnit(const TVXHBA_DriverParams& unit, const char* initiator, const char* target) {
  const Oas_Fields fields = cutOasInstanceID(unit.InstanceID.value.c_str());
  if (fields.complete &&
      TVX_MethodWrapper::SetOASLunState(initiator, initiator, target, fields.lun.c_str(), OAS_OFF,
                                        unit.Option.value) == RM_OK)
    return true;
  TVX_LOG(TVX_ERR, "Disable OASLunState failed");
  return false;
}

/// The walk goes on by index, also after a removal: the unit that moved into the free place waits
/// for the next call.
void disableUnits(ProviderAgent& agent, const char* initiator, const char* target) {
  auto& units = agent.m_TVXHBA_DriverParams_map;
  const std::string path = std::string(initiator) + ":" + target;
  const std::size_t count = units.size();
  for (std::size_t i = 0; i < count && i < units.size(); i++) {
    const TVXHBA_DriverParams& unit = *units[i];
    if (!isUnitOf(unit, path) || !disableUnit(unit, initiator, target)) continue;
    if (!dropOasAssociations(agent, unit)) TVX_LOG(TVX_DBG, "Invalid associations ");
    units.delete_instance(&unit);
  }
}

}  // namespace

std::int32_t TVXHBA_FCHBADriverParamService_Provider::SetDriverParameter(
    const TVXHBA_FCHBADriverParamService* service, const TVXHBA_FCPort* target,
    const Property<bool>& bPermanent, const Property<bool>& bGlobal,
    const Property<String>& strParam, const Property<String>& strValue,
    Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "TVXHBA_FCHBADriverParamService_Provider::SetDriverParameter()");
  HBA_WWN wwpn{};
  if (!checkService(call.agent, service)) {
    return_value.set(METHOD_UNKNOWN_SERVICE);
  } else if (const char* deviceID = findTarget(call.agent, target, wwpn); !deviceID) {
    return_value.set(METHOD_UNKNOWN_PORT);
  } else {
    return_value.set(setParameter(deviceID, wwpn, !bGlobal.is_null() && bGlobal.value,
                                  !bPermanent.is_null() && bPermanent.value, strParam, strValue));
  }
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_FCHBADriverParamService_Provider::DisableAllOASLuns(
    const TVXHBA_FCHBADriverParamService* service, const Property<String>& InitiatorWWPN,
    const Property<String>& TargetWWPN, Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "TVXHBA_FCHBADriverParamService_Provider::DisableAllOASLuns()");
  if (!checkService(call.agent, service)) {
    return_value.set(METHOD_UNKNOWN_SERVICE);
    return INVOKE_METHOD_OK;
  }
  if (isMissing(InitiatorWWPN) || isMissing(TargetWWPN)) {
    TVX_LOG(TVX_ERR, "Invalid Initiator fc port or Target device");
    return_value.set(METHOD_UNKNOWN_PORT);
    return INVOKE_METHOD_OK;
  }
  if (!findFCPort(call.agent, InitiatorWWPN.value.c_str())) {
    TVX_LOG(TVX_ERR, "Invald fc port.");
    return_value.set(METHOD_UNKNOWN_PORT);
    return INVOKE_METHOD_OK;
  }
  disableUnits(call.agent, InitiatorWWPN.value.c_str(), TargetWWPN.value.c_str());
  TVX_LOG(TVX_DBG, "DisableAllOASLuns Succeeded");
  return_value.set(METHOD_OK);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
