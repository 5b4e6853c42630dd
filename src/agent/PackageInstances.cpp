// What an adapter is sold as, and the collection of its ports.
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

bool buildProduct(Adapter_Build& build) {
  ProviderAgent& agent = build.host.agent;
  const FCAdapterAttributes& from = build.attributes;
  build.product =
      findByText(agent.m_TVXHBA_Product_map, &TVXHBA_Product::IdentifyingNumber, from.SerialNumber);
  if (build.product) return true;
  Ref<TVXHBA_Product> product = makeInstance<TVXHBA_Product>();
  product->Description.set(from.ModelDescription.c_str());
  product->ElementName.set(from.NodeSymbolicName.c_str());
  product->Name.set(from.Model.c_str());
  product->IdentifyingNumber.set(from.SerialNumber.c_str());
  product->Vendor.set(from.Manufacturer.c_str());
  product->Version.set(from.HardwareVersion.c_str());
  build.product = insertInto(agent.m_TVXHBA_Product_map, std::move(product),
                             "Insert Failed : m_TVXHBA_Product_map");
  return build.product != nullptr;
}

bool buildPortGroup(Adapter_Build& build) {
  ProviderAgent& agent = build.host.agent;
  const FCAdapterAttributes& from = build.attributes;
  const std::string id = "TVX FC HBA:" + from.NodeWWN;
  build.portGroup =
      findByText(agent.m_TVXHBA_LogicalPortGroup_map, &TVXHBA_LogicalPortGroup::InstanceID, id);
  if (build.portGroup) return true;
  Ref<TVXHBA_LogicalPortGroup> group = makeInstance<TVXHBA_LogicalPortGroup>();
  group->InstanceID.set(id.c_str());
  group->Name.set(from.NodeWWN.c_str());
  group->NameFormat.set("WWN");
  group->ElementName.set(from.SerialNumber.c_str());
  group->Description.set("The Fibre Channel ports of the HBA.");
  build.portGroup = insertInto(agent.m_TVXHBA_LogicalPortGroup_map, std::move(group),
                               "Insert Failed : m_TVXHBA_LogicalPortGroup_map");
  return build.portGroup &&
         associate(agent.m_TVXHBA_HostedCollection_map, build.host.system, build.portGroup,
                   "Insert Failed : m_TVXHBA_HostedCollection_map");
}

}  // namespace

std::int32_t CreatePackageInstances(Adapter_Build& build) {
  return buildProduct(build) && buildPortGroup(build) ? 0 : MAP_BUILD_FAILED;
}

}  // namespace cimrt
