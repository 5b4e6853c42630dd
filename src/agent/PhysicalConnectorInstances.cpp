// The connector of a port.
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

Ref<TVXHBA_PhysicalConnector> describeConnector(const FCAdapterAttributes& from) {
  const std::string id =
      formatText("%s:%d", from.SerialNumber.c_str(), static_cast<int>(from.PortNumber));
  Ref<TVXHBA_PhysicalConnector> connector = makeInstance<TVXHBA_PhysicalConnector>();
  connector->CreationClassName.set("TVXHBA_PhysicalConnector");
  connector->Tag.set(from.PortWWN.c_str());
  connector->Name.set(from.PortWWN.c_str());
  connector->InstanceID.set(id.c_str());
  connector->OtherIdentifyingInfo.set(id.c_str());
  connector->Manufacturer.set(from.Manufacturer.c_str());
  connector->Model.set(from.Model.c_str());
  connector->Description.set(from.ModelDescription.c_str());
  connector->SerialNumber.set(from.SerialNumber.c_str());
  connector->ElementName.set(formatText("TVX HBA Port:%s:Network Connector:%d",
                                        from.SerialNumber.c_str(),
                                        static_cast<int>(from.PortNumber))
                                 .c_str());
  connector->ConnectorLayout.set(12);
  return connector;
}

bool buildConnector(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  ProviderAgent& agent = adapter.host.agent;
  build.connector =
      insertInto(agent.m_TVXHBA_PhysicalConnector_map, describeConnector(adapter.attributes),
                 "Insert Failed (HBA): m_TVXHBA_PhysicalConnector");
  if (!build.connector) return false;
  if (!associate(agent.m_TVXHBA_ProductPhysicalConnector_map, adapter.product, build.connector,
                 "Insert Failed (HBA): TVXHBA_ProductPhysicalConnector"))
    return false;
  if (!adapter.card || !build.chip) return true;
  return associate(agent.m_TVXHBA_CardContainsConnector_map, adapter.card, build.connector,
                   "Insert Failed (HBA): TVXHBA_CardContainsConnector") &&
         associate(agent.m_TVXHBA_ConnectorDependsOnChip_map, build.connector, build.chip,
                   "Insert Failed (CNA): TVXHBA_ConnectorDependsOnChip");
}

}  // namespace

std::int32_t CreatePhysicalConnectorInstances(Port_Build& build) {
  if (buildConnector(build)) return 0;
  TVX_LOG(TVX_CRIT, "CreatePhysicalConnectorInstances failed");
  return MAP_BUILD_FAILED;
}

}  // namespace cimrt
