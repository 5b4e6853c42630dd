// Both ends of the paths to a logical unit: the port's initiator endpoint and the unit's own.
#include <exception>

#include "agent/Map_Insert.h"
#include "agent/SanBuild.h"

namespace cimrt {

namespace {

constexpr std::uint16_t PROTOCOL_TYPE_FIBRE_CHANNEL = 18;
constexpr std::uint16_t PROTOCOL_IF_TYPE_FIBRE_CHANNEL = 56;
constexpr std::uint16_t CONNECTION_TYPE_FIBRE_CHANNEL = 2;
constexpr std::uint16_t ROLE_TARGET = 3;
constexpr std::uint16_t ENABLED_DEFAULT_NOT_APPLICABLE = 5;
constexpr std::uint16_t UNKNOWN = 0;
constexpr const char* CLASS_NAME = "TVXHBA_SCSIProtocolEndpoint";
constexpr const char* OS_DEVICE_NAME = "OS Device Name";

void nameEndpoint(TVXHBA_SCSIProtocolEndpoint& endpoint, const San_Unit_Build& build) {
  const Unit_Texts& texts = build.texts;
  const CIM_ComputerSystem& system = *build.port.san.system;
  endpoint.TargetWWPN.set(build.port.targetWWPN(texts.target));
  endpoint.TargetWWNN.set(build.port.targetWWNN(build.target.nodeWWN));
  endpoint.Description.set(build.description);
  endpoint.SystemCreationClassName = system.CreationClassName;
  endpoint.SystemName = system.Name;
  endpoint.CreationClassName.set(build.port.san.constants[CLASS_NAME]);
  endpoint.ElementName.set(build.port.model(build.target.model));
  endpoint.Name.set(
      formatText("%s:%s:%s", texts.port.c_str(), texts.target.c_str(), texts.lun.c_str()).c_str());
}

void describeEndpoint(TVXHBA_SCSIProtocolEndpoint& endpoint, const San_Unit_Build& build) {
  const Target& target = build.target;
  endpoint.ProtocolType.set(PROTOCOL_TYPE_FIBRE_CHANNEL);
  endpoint.ProtocolIFType.set(PROTOCOL_IF_TYPE_FIBRE_CHANNEL);
  endpoint.ConnectionType.set(CONNECTION_TYPE_FIBRE_CHANNEL);
  endpoint.Role.set(ROLE_TARGET);
  endpoint.EnabledDefault.set(ENABLED_DEFAULT_NOT_APPLICABLE);
  endpoint.EnabledState.set(UNKNOWN);
  endpoint.RequestedState.set(UNKNOWN);
  endpoint.OperationalStatus.set({UNKNOWN});
  endpoint.FCID.set(target.fcId);
  endpoint.SCSIBusNumber.set(target.scsiBusNumber);
  endpoint.SCSITargetNumber.set(target.scsiTargetNumber);
  endpoint.OtherIdentifyingInfo.set({build.osDeviceName});
  endpoint.IdentifyingDescriptions.set({build.port.san.constants[OS_DEVICE_NAME]});
}

}  // namespace

std::int32_t findInitiatorEndpoint(San_Port_Build& build) {
  build.initiator = findByText(build.san.agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map,
                               &TVXHBA_SCSIProtocolInitiatorEndpoint::Name, build.port.m_Name);
  if (build.initiator) return 0;
  TVX_LOG(TVX_ERR, "Could not find TVXHBA_SCSIProtocolEndpoint Initiator instance.");
  return MAP_BUILD_FAILED;
}

std::int32_t buildTargetEndpoint(San_Unit_Build& build) {
  San_Build& san = build.port.san;
  if (!san.system) throw std::exception();
  Ref<TVXHBA_SCSIProtocolEndpoint> endpoint = makeInstance<TVXHBA_SCSIProtocolEndpoint>();
  nameEndpoint(*endpoint, build);
  describeEndpoint(*endpoint, build);
  build.endpoint =
      insertFilledInto(san.agent.m_TVXHBA_SCSIProtocolEndpoint_map, std::move(endpoint),
                       "Insert Failed : m_TVXHBA_SCSIProtocolEndpoint_map");
  return build.endpoint ? 0 : MAP_BUILD_FAILED;
}

std::int32_t hostTargetEndpoint(San_Unit_Build& build) {
  const Unit_Texts& texts = build.texts;
  San_Build& san = build.port.san;
  const std::string text = formatText("Local Hosted Access Point %s:%s:%s", texts.port.c_str(),
                                      texts.target.c_str(), texts.lun.c_str());
  TVX_LOG(TVX_DBG, "Generating TVXHBA_LocalHostedAccessPoint (%s)", text.c_str());
  const bool hosted =
      associateShared(san.agent.m_TVXHBA_LocalHostedAccessPoint_map,
                      {san.systemEnd.of(san.system), build.endpointEnd.of(build.endpoint)},
                      "Insert Failed : m_TVXHBA_LocalHostedAccessPoint_map") != nullptr;
  return hosted ? 0 : MAP_BUILD_FAILED;
}

}  // namespace cimrt
