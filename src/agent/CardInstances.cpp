// The card, and what ties a new one to the rest.
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/RegisteredProfiles.h"

namespace cimrt {

namespace {

void nameCard(TVXHBA_Card& card, const FCAdapterAttributes& from) {
  card.CreationClassName.set("TVXHBA_Card");
  card.Tag.set(from.SerialNumber.c_str());
  card.OtherIdentifyingInfo.set(from.SerialNumber.c_str());
  card.SerialNumber.set(from.SerialNumber.c_str());
  card.TVXSerialNumber.set(from.SerialNumber.c_str());
  card.Name.set(from.Model.c_str());
  card.Model.set(from.Model.c_str());
  card.PartNumber.set(from.Model.c_str());
  card.ElementName.set(
      formatText("TVX FCHBA:%s:%s", from.Model.c_str(), from.SerialNumber.c_str()).c_str());
}

Ref<TVXHBA_Card> describeCard(const FCAdapterAttributes& from) {
  Ref<TVXHBA_Card> card = makeInstance<TVXHBA_Card>();
  nameCard(*card.get(), from);
  card->Manufacturer.set(from.Manufacturer.c_str());
  card->Description.set(from.ModelDescription.c_str());
  card->SKU.set("");
  card->PackageType.set(9);
  card->VendorSpecID.set(from.VendorSpecificID);
  card->DeviceID.set(from.DeviceID);
  card->ModelID.set(from.ModelID);
  card->SLIMode.set(from.SLIMode);
  card->HostingBoard.set(false);
  card->Version.set(from.HardwareVersion.c_str());
  return card;
}

}  // namespace

std::int32_t CreateCardInstances(Adapter_Build& build) {
  auto& map = build.host.agent.m_TVXHBA_Card_map;
  build.card = findLastByText(map, &TVXHBA_Card::TVXSerialNumber, build.attributes.SerialNumber);
  if (build.card) return 0;
  build.card = insertInto(map, describeCard(build.attributes), "Insert Failed : m_TVXHBA_Card_map");
  build.cardIsNew = build.card != nullptr;
  return build.card ? 0 : MAP_BUILD_FAILED;
}

namespace {

/// The provider's identity stands for the card's software: current, and installed.
void tieCardToProvider(const Adapter_Build& adapter) {
  if (!adapter.host.providerIdentity) return;
  Ref<TVXHBA_ProviderElementSoftwareIdentity> tie =
      makeAssociation<TVXHBA_ProviderElementSoftwareIdentity>(adapter.host.providerIdentity,
                                                              adapter.card);
  tie->ElementSoftwareStatus.set({2, 6});
  insertInto(adapter.host.agent.m_TVXHBA_ProviderElementSoftwareIdentity_map, std::move(tie),
             "Insert Failed (CNA): m_TVXHBA_ProviderElementSoftwareIdentity_map");
}

}  // namespace

std::int32_t associateNewCard(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  if (!adapter.cardIsNew) return 0;
  TVX_LOG(TVX_DBG, "Card is created. Creating the associations");
  ProviderAgent& agent = adapter.host.agent;
  associate(agent.m_TVXHBA_ProductPhysicalComponent_map, adapter.product, adapter.card,
            "Insert Failed : m_TVXHBA_ProductPhysicalComponent_map");
  tieCardToProvider(adapter);
  associate(agent.m_TVXHBA_CardConformsToProfile_map,
            findRegisteredProfile(agent, "Physical Asset"), adapter.card,
            "Insert Failed : m_TVXHBA_CardConformsToProfile_map");
  associate(agent.m_TVXHBA_ChassisContainsCard_map, adapter.host.chassis, adapter.card,
            "Insert Failed:TVXHBA_ChassisContainsCard");
  return 0;
}

}  // namespace cimrt
