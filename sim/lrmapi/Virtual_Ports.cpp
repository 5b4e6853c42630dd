// The virtual ports of a physical port.
#include "lrmapi/Call.h"

using namespace tvx::sim;

extern "C" {

RM_STATUS LRM_VPList(HBA_WWN wwpn, RM_VPortList* list) {
  return port_call(
      "LRM_VPList", wwpn,
      [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
        if (!port.vports_supported) return RM_ERROR_VPORT_UNSUPPORTED;
        if (list == nullptr) return RM_ERROR;
        const std::size_t room = list->count;
        auto* out = reinterpret_cast<std::uint8_t*>(list->entry);
        for (std::size_t i = 0; i < std::min(room, port.vports.size()); ++i) {
          const Virtual_Port& vport = port.vports[i];
          RM_VPortEntry record{};
          record.wwpn = from_wwn(vport.names.port);
          record.wwnn = from_wwn(vport.names.node);
          record.fcId = vport.fc_id;
          std::memcpy(out + i * sizeof record, &record, sizeof record);
        }
        list->count = effect.returned_size.value_or(static_cast<std::uint32_t>(port.vports.size()));
        return port.vports.size() > room ? RM_ERROR_MORE_DATA : RM_OK;
      },
      {.told = list == nullptr ? nullptr : &list->count});
}

RM_STATUS LRM_VPGetAttributes(HBA_WWN wwpn, HBA_WWN vport, RM_VPortAttributes* attributes) {
  constexpr uint8_t known_version = 3;
  return port_call({.name = "LRM_VPGetAttributes", .port = to_wwn(wwpn), .target = to_wwn(vport)},
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     if (!port.vports_supported) return RM_ERROR_VPORT_UNSUPPORTED;
                     if (attributes == nullptr || attributes->version != known_version) {
                       return RM_ERROR;
                     }
                     for (const Virtual_Port& candidate : port.vports) {
                       if (candidate.names.port != to_wwn(vport)) continue;
                       write_text(attributes->name, sizeof attributes->name, candidate.name,
                                  effect);
                       return RM_OK;
                     }
                     return RM_ERROR_INVALID_WWN;
                   });
}

}  // extern "C"
