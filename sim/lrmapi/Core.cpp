// Initialisation, attributes of adapters and ports, and the reading of attribute blocks.
#include "lrmapi/Call.h"

using namespace tvx::sim;

extern "C" {

RM_STATUS LRM_InitLib(void) {
  refresh_quietly();
  return rm_call(Call_Site{.name = "LRM_InitLib"},
                 [](World&, const Fault_Effect&) { return RM_OK; });
}

RM_STATUS LRM_ExitLib(void) {
  return rm_call(Call_Site{.name = "LRM_ExitLib"},
                 [](World&, const Fault_Effect&) { return RM_OK; });
}

RM_STATUS LRM_SetDebugTraces(int, int) {
  return rm_call(Call_Site{.name = "LRM_SetDebugTraces"},
                 [](World&, const Fault_Effect&) { return RM_OK; });
}

RM_STATUS LRM_GetHBAAttributes(HBA_WWN wwpn, void* block, uint32_t* size) {
  return port_call("LRM_GetHBAAttributes", wwpn,
                   [=](const World& world, const Port& port, const Fault_Effect& effect) {
                     return answer_block(adapter_attributes(world, port), block, size, effect);
                   });
}

RM_STATUS LRM_GetPortAttributes(HBA_WWN wwpn, void* block, uint32_t* size) {
  return port_call("LRM_GetPortAttributes", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) {
                     return answer_block(port_attributes(port), block, size, effect);
                   });
}

RM_STATUS LRM_GetDriverType(HBA_WWN wwpn, uint32_t* type) {
  return port_call("LRM_GetDriverType", wwpn,
                   [=](const World& world, const Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (type == nullptr) return RM_ERROR;
                     *type = world.cards[port.card].driver_type;
                     return RM_OK;
                   });
}

// The block is the caller's, so the world is not needed; faults apply. One that answers status 0
// gives a success without a value.
void* RM_GetAttributeValue(const void* block, uint32_t attribute, uint32_t* length,
                           RM_STATUS* status) {
  Block_Value value{};
  const RM_STATUS result = rm_call(Call_Site{.name = "RM_GetAttributeValue"},
                                   [&](World&, const Fault_Effect& effect) -> RM_STATUS {
                                     const std::optional<Block_Value> found =
                                         find_in_block(block, attribute);
                                     if (!found || effect.omitted.contains(attribute))
                                       return RM_ERROR;
                                     value = *found;
                                     value.length = effect.returned_size.value_or(found->length);
                                     return RM_OK;
                                   });
  if (status != nullptr) *status = result;
  if (length != nullptr && result == RM_OK) *length = value.length;
  return const_cast<void*>(value.data);
}

}  // extern "C"
