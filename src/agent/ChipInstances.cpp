// The chip behind a port.
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

/// Identity of the chip: the card's serial number, with the sub-adapter where there is one.
std::string chipTag(const FCAdapterAttributes& from) {
  return from.SubAdapterID.empty() ? from.SerialNumber
                                   : from.SerialNumber + ":" + from.SubAdapterID;
}

/// A board that measures no temperature leaves all three values unset.
void setTemperatures(TVXHBA_Chip& chip, const FCAdapterAttributes& from) {
  if (from.BoardTemperature == 0) return;
  chip.BoardTemperature.set(from.BoardTemperature);
  chip.ThresholdWarningTemp.set(from.ThresholdWarningTemp);
  chip.ThresholdCriticalTemp.set(from.ThresholdCriticalTemp);
}

Ref<TVXHBA_Chip> describeChip(const FCAdapterAttributes& from) {
  Ref<TVXHBA_Chip> chip = makeInstance<TVXHBA_Chip>();
  chip->CreationClassName.set("TVXHBA_Chip");
  chip->Tag.set(chipTag(from).c_str());
  chip->Name.set(from.Model.c_str());
  chip->Model.set(from.Model.c_str());
  chip->Manufacturer.set(from.Manufacturer.c_str());
  chip->Description.set(from.ModelDescription.c_str());
  chip->SerialNumber.set(from.SerialNumber.c_str());
  chip->SubAdapterId.set(from.SubAdapterID.c_str());
  chip->ElementName.set(
      formatText("TVX HBA ASIC:%s:%s", from.Model.c_str(), from.SerialNumber.c_str()).c_str());
  chip->TemperatureUnit.set("Celsius");
  chip->OASCapability.set(0);
  setTemperatures(*chip.get(), from);
  return chip;
}

}  // namespace

std::int32_t classifyChip(Port_Build& build) {
  const FCAdapterAttributes& from = build.adapter.attributes;
  if (!from.SubAdapterID.empty())
    build.chipKind = Chip_Kind::SUB_ADAPTER;
  else
    build.chipKind = from.DeviceID == E200_DEVICE_ID ? Chip_Kind::E200 : Chip_Kind::OTHER;
  return 0;
}

std::int32_t CreateChipInstances(Port_Build& build) {
  const Adapter_Build& adapter = build.adapter;
  ProviderAgent& agent = adapter.host.agent;
  auto& map = agent.m_TVXHBA_Chip_map;
  build.chip = findLastByText(map, &TVXHBA_Chip::Tag, chipTag(adapter.attributes));
  if (build.chip) return 0;
  build.chip =
      insertInto(map, describeChip(adapter.attributes), "Insert Failed : m_TVXHBA_Chip_map");
  if (!build.chip) return MAP_BUILD_FAILED;
  if (!associate(agent.m_TVXHBA_CardContainsChip_map, adapter.card, build.chip,
                 "Insert Failed : TVXHBA_Container"))
    return MAP_BUILD_FAILED;
  associate(agent.m_TVXHBA_InstallServiceAffectsChip_map, build.chip,
            adapter.host.installationService, "Insert Failed:TVXHBA_InstallServiceAffectsChip");
  return 0;
}

}  // namespace cimrt
