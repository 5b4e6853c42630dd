// Parameters of the driver, for one port and for all.
#include <cstdlib>

#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

RM_DriverParam record_of(const Driver_Parameter& parameter, const Fault_Effect& effect) {
  RM_DriverParam record{};
  write_text(record.name, sizeof record.name, parameter.name, effect);
  record.low = parameter.low;
  record.high = parameter.high;
  record.def = parameter.initial;
  record.current = parameter.current;
  record.exportFlag = parameter.export_flag;
  record.dynamic = parameter.dynamic;
  write_text(record.help, sizeof record.help, parameter.help, effect);
  return record;
}

// Answers as many records as there is room for, and the number of all.
RM_STATUS answer_parameters(const std::vector<Driver_Parameter>& parameters, RM_DriverParam* out,
                            uint32_t* count, const Fault_Effect& effect) {
  if (out == nullptr || count == nullptr) return RM_ERROR;
  const std::size_t room = *count;
  for (std::size_t i = 0; i < std::min(room, parameters.size()); ++i) {
    const RM_DriverParam record = record_of(parameters[i], effect);
    std::memcpy(out + i, &record, sizeof record);
  }
  *count = effect.returned_size.value_or(static_cast<std::uint32_t>(parameters.size()));
  return parameters.size() > room ? RM_ERROR_MORE_DATA : RM_OK;
}

Driver_Parameter* find_parameter(std::vector<Driver_Parameter>& parameters,
                                 const std::string& name) {
  for (Driver_Parameter& parameter : parameters) {
    if (parameter.name == name) return &parameter;
  }
  return nullptr;
}

// "name=value" with a decimal or "0x" value within the limits.
RM_STATUS set_parameter(std::vector<Driver_Parameter>& parameters, const std::string& text) {
  const std::size_t sign = text.find('=');
  if (sign == std::string::npos) return RM_ERROR;
  Driver_Parameter* parameter = find_parameter(parameters, text.substr(0, sign));
  if (parameter == nullptr || sign + 1 == text.size()) return RM_ERROR;
  char* end = nullptr;
  const unsigned long long value = std::strtoull(text.c_str() + sign + 1, &end, 0);
  if (*end != '\0' || value < parameter->low || value > parameter->high) return RM_ERROR;
  parameter->current = static_cast<std::uint32_t>(value);
  return RM_OK;
}

constexpr uint32_t global_bit = 2;  // of the control word; bit 0 makes the change permanent

}  // namespace

extern "C" {

RM_STATUS LRM_GetDriverParams(HBA_WWN wwpn, RM_DriverParam* params, uint32_t* count) {
  return port_call("LRM_GetDriverParams", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) {
                     return answer_parameters(port.driver_params, params, count, effect);
                   },
                   {.told = count});
}

RM_STATUS LRM_GetDriverParamsGlobal(HBA_WWN wwpn, RM_DriverParam* params, uint32_t* count) {
  return port_call("LRM_GetDriverParamsGlobal", wwpn,
                   [=](const World& world, const Port&, const Fault_Effect& effect) {
                     return answer_parameters(world.global_params, params, count, effect);
                   },
                   {.told = count});
}

RM_STATUS LRM_SetDriverParam(HBA_WWN wwpn, const char* text, uint32_t controlWord) {
  return port_call("LRM_SetDriverParam", wwpn,
                   [=](World& world, Port& port, const Fault_Effect&) -> RM_STATUS {
                     if (text == nullptr) return RM_ERROR;
                     const bool global = (controlWord & global_bit) != 0;
                     return set_parameter(global ? world.global_params : port.driver_params, text);
                   });
}

}  // extern "C"
