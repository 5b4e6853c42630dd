#include "services/TVXHBA_SoftwareInstallationService_Provider.h"

#include "access/TVX_MethodWrapper.h"
#include "services/TVX_SoftwareInstallation.h"

namespace cimrt {

namespace {

using Service = TVXHBA_SoftwareInstallationService;

constexpr std::uint32_t RESET_UNSUPPORTED = 40002;
constexpr std::uint32_t OUT_OF_MEMORY = 32774;

/// Name of the same service on a converged adapter, which can't be reset.
constexpr const char* CONVERGED_SERVICE_NAME = "TVXUCNA_SoftwareInstallationService";

std::uint32_t ofLibrary(RM_STATUS status) {
  return METHOD_LIBRARY_FAILURE + static_cast<std::uint32_t>(status);
}

bool isConverged(const Service& service) {
  return !service.Name.is_null() && service.Name.value.equal(CONVERGED_SERVICE_NAME);
}

std::uint32_t resetHBA(Service_Call& call, const Service* service, const TVXHBA_FCPort* target) {
  if (!checkInstallationService(call.agent, service, TVX_ERR)) return METHOD_UNKNOWN_SERVICE;
  if (isConverged(*service)) {
    TVX_LOG(TVX_ERR, "Reset HBA on CNA is not supported");
    return RESET_UNSUPPORTED;
  }
  const TVXHBA_FCPort* const port = findTargetPort(call.agent, target);
  if (!port) {
    TVX_LOG(TVX_ERR, "TVXHBA_SoftwareInstallationService_Provider invald port ...return");
    return METHOD_UNKNOWN_PORT;
  }
  HBA_WWN wwpn{};
  if (!installationTargetName(*port, wwpn)) return METHOD_UNKNOWN_PORT;
  const char* const deviceID = port->DeviceID.value.c_str();
  const RM_STATUS status = TVX_MethodWrapper::tvxcimReset(&wwpn);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR,
            "TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA failed for target %s",
            deviceID);
    return ofLibrary(status);
  }
  TVX_LOG(TVX_WARN,
          "TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA for target %s is "
          "Successful.. Updating the Provider Data",
          deviceID);
  // A refresh is begun without the data lock: it has to join the thread of the last one.
  call.agent.m_bAdapterRefreshPending = true;
  call.release();
  call.agent.BuildCimrtInfo();
  return METHOD_OK;
}

/// The target of the two methods that tell a wrong one in these words.
TVXHBA_FCPort* findPortQuietly(ProviderAgent& agent, const TVXHBA_FCPort* target) {
  TVXHBA_FCPort* const port = findTargetPort(agent, target);
  if (!port) TVX_LOG(TVX_DBG, "TVXHBA_SoftwareInstallationService_Provider invalid port passed");
  return port;
}

std::uint32_t setPortEnabled(ProviderAgent& agent, const Service* service,
                             const TVXHBA_FCPort* target, const Property<bool>& portEnabled,
                             Property<std::uint8_t>& configStatus) {
  if (!checkInstallationService(agent, service, TVX_DBG)) return METHOD_UNKNOWN_SERVICE;
  const TVXHBA_FCPort* const port = findPortQuietly(agent, target);
  if (!port || portEnabled.is_null()) return METHOD_UNKNOWN_PORT;
  TVX_LOG(TVX_DBG, "Input PortEnable : %d", portEnabled.value);
  std::uint8_t answer = 0;
  const RM_STATUS status =
      TVX_MethodWrapper::SetPortEnabled(port->DeviceID.value.c_str(), portEnabled.value, &answer);
  if (status != RM_OK) return ofLibrary(status);
  configStatus.set(answer);
  return METHOD_OK;
}

std::uint32_t getHBAFeatures(ProviderAgent& agent, const Service* service,
                             const TVXHBA_FCPort* target, Property<Array<std::uint8_t>>& features) {
  if (!service || !isKnownService(agent.m_TVXHBA_SoftwareInstallationService_map, service)) {
    TVX_LOG(TVX_DBG, "Invalid instance of UCNA SoftwareInstallation Service");
    return METHOD_UNKNOWN_SERVICE;
  }
  const TVXHBA_FCPort* const port = findPortQuietly(agent, target);
  HBA_WWN wwpn{};
  if (!port || !installationTargetName(*port, wwpn)) return METHOD_UNKNOWN_PORT;
  const TVX_Block list = tvxAllocate(RM_FEATURE_LIST_SIZE);
  if (list == nullptr) {
    TVX_LOG(TVX_ERR, "Unable to allocate the memory for retrieving features. ");
    return OUT_OF_MEMORY;
  }
  const RM_STATUS status = TVX_MethodWrapper::GetHBAFeatureList(&wwpn, list.get());
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR,
            "TVXHBA_SoftwareInstallationService_Provider::GetHBAFeatureList failed for target %s",
            port->DeviceID.value.c_str());
    return ofLibrary(status);
  }
  features.value.append(list.get(), RM_FEATURE_LIST_SIZE);
  features.null = 0;
  return METHOD_OK;
}

/// The port that a reference names with all its keys.
TVXHBA_FCPort* findPortByKeys(ProviderAgent& agent, const TVXHBA_FCPort* target) {
  if (!target) {
    TVX_LOG(TVX_DBG, "Target Port is NULL");
    return nullptr;
  }
  Instance* const found = agent.m_TVXHBA_FCPort_map.lookup(target);
  if (!found) {
    TVX_LOG(TVX_DBG, "Invalid Port is passed, Cannot Enable/Disable FEC");
    return nullptr;
  }
  auto* const port = static_cast<TVXHBA_FCPort*>(found);
  TVX_LOG(TVX_DBG, "TVXHBAA_SoftwareInstallationService_Provider::FCPort found. Target: %s",
          port->DeviceID.value.c_str());
  return port;
}

std::uint32_t setFECState(ProviderAgent& agent, const Service* service, const TVXHBA_FCPort* target,
                          const Property<bool>& enableFlag) {
  if (!checkInstallationService(agent, service, TVX_DBG)) return METHOD_UNKNOWN_SERVICE;
  TVXHBA_FCPort* const port = findPortByKeys(agent, target);
  if (!port || enableFlag.is_null()) return METHOD_UNKNOWN_PORT;
  TVX_LOG(TVX_DBG, "Input FEC Flag : %d", enableFlag.value);
  const char* const deviceID = port->DeviceID.value.c_str();
  const RM_STATUS status = TVX_MethodWrapper::SetFECState(deviceID, enableFlag.value);
  if (status != RM_OK) {
    TVX_LOG(TVX_DBG,
            "TVXHBA_SoftwareInstallationService_Provider::SetFECPortState failed for target %s",
            deviceID);
    TVX_MethodWrapper::StatusString(status);
    return ofLibrary(status);
  }
  port->FECState.set(enableFlag.value ? 1 : 0);
  TVX_LOG(TVX_DBG,
          "TVXHBA_SoftwareInstallationService_Provider::SetFECPortState for target %s is "
          "Successful. ",
          deviceID);
  return METHOD_OK;
}

}  // namespace

std::int32_t TVXHBA_SoftwareInstallationService_Provider::InstallFromURI(
    const TVXHBA_SoftwareInstallationService* service, CIM_ConcreteJob*& job,
    const Property<String>& uri, const CIM_ManagedElement* target,
    const Property<Array<std::uint16_t>>& options, const Property<Array<String>>& values,
    Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "entering InstallFromURI");
  const Install_Request request{call, service, target, options.value, values.value, job};
  return_value.set(installFromURI(request, uri, return_value));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_SoftwareInstallationService_Provider::InstallFromByteStream(
    const TVXHBA_SoftwareInstallationService* service, CIM_ConcreteJob*& job,
    const Property<Array<std::uint8_t>>& image, const CIM_ManagedElement* target,
    const Property<Array<std::uint16_t>>& options, const Property<Array<String>>& values,
    Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "Entering InstallFromByteStream");
  const Install_Request request{call, service, target, options.value, values.value, job};
  return_value.set(installFromByteStream(request, image.value));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_SoftwareInstallationService_Provider::ResetHBA(
    const TVXHBA_SoftwareInstallationService* service, const TVXHBA_FCPort* target,
    Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "Entering ResetHBA");
  return_value.set(resetHBA(call, service, target));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_SoftwareInstallationService_Provider::SetPortEnabled(
    const TVXHBA_SoftwareInstallationService* service, const TVXHBA_FCPort* target,
    const Property<bool>& portEnabled, Property<std::uint8_t>& configStatus,
    Property<std::uint32_t>& return_value) {
  Service_Call call;
  return_value.set(setPortEnabled(call.agent, service, target, portEnabled, configStatus));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_SoftwareInstallationService_Provider::GetHBAFeatures(
    const TVXHBA_SoftwareInstallationService* service, const TVXHBA_FCPort* target,
    Property<Array<std::uint8_t>>& features, Property<std::uint32_t>& return_value) {
  Service_Call call;
  TVX_LOG(TVX_DBG, "Entering TVXHBA_SoftwareInstallationService_Provider::GetHBAFeatures");
  return_value.set(getHBAFeatures(call.agent, service, target, features));
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_SoftwareInstallationService_Provider::SetFECState(
    const TVXHBA_SoftwareInstallationService* service, const TVXHBA_FCPort* target,
    const Property<bool>& enableFlag, Property<std::uint32_t>& return_value) {
  Service_Call call;
  return_value.set(setFECState(call.agent, service, target, enableFlag));
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
