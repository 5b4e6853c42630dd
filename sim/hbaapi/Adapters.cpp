// Adapters and ports as the SNIA interface tells them.
#include <cstring>

#include "hbaapi/Call.h"

using namespace tvx::sim;

namespace {

void fill(HBA_ADAPTERATTRIBUTES& out, const World& world, const Adapter& adapter,
          const Fault_Effect& effect) {
  const Card& card = world.cards[adapter.card];
  const Port& port = world.ports[adapter.ports.front()];
  const std::string name = with_running_firmware(world, port, card.node_symbolic_name);
  std::memset(&out, 0, sizeof out);
  write_text(out.Manufacturer, sizeof out.Manufacturer, card.manufacturer, effect);
  write_text(out.SerialNumber, sizeof out.SerialNumber, card.serial_number, effect);
  write_text(out.Model, sizeof out.Model, card.model, effect);
  write_text(out.ModelDescription, sizeof out.ModelDescription, card.model_description, effect);
  write_text(out.NodeSymbolicName, sizeof out.NodeSymbolicName, name, effect);
  write_text(out.HardwareVersion, sizeof out.HardwareVersion, card.hardware_version, effect);
  write_text(out.DriverVersion, sizeof out.DriverVersion, card.driver_version, effect);
  write_text(out.OptionROMVersion, sizeof out.OptionROMVersion, card.option_rom_version, effect);
  write_text(out.FirmwareVersion, sizeof out.FirmwareVersion, running_firmware(world, port),
             effect);
  write_text(out.DriverName, sizeof out.DriverName, card.driver_name, effect);
  out.NodeWWN = from_wwn(port.names.node);
  out.VendorSpecificID = card.vendor_specific_id;
  out.NumberOfPorts = effect.returned_size.value_or(static_cast<HBA_UINT32>(adapter.ports.size()));
}

void fill_types(HBA_FC4TYPES& out, const Bytes& types) {
  std::memcpy(out.bits, types.data(), std::min(sizeof out.bits, types.size()));
}

void fill(HBA_PORTATTRIBUTES& out, const World& world, const Port& port,
          const Fault_Effect& effect) {
  std::memset(&out, 0, sizeof out);
  out.NodeWWN = from_wwn(port.names.node);
  out.PortWWN = from_wwn(port.names.port);
  out.PortFcId = port.fc_id;
  out.PortType = port.type;
  out.PortState = hba_port_state(port);
  out.PortSupportedClassofService = port.class_of_service;
  fill_types(out.PortSupportedFc4Types, port.supported_fc4_types);
  fill_types(out.PortActiveFc4Types, port.active_fc4_types);
  write_text(out.PortSymbolicName, sizeof out.PortSymbolicName,
             with_running_firmware(world, port, port.symbolic_name), effect);
  write_text(out.OSDeviceName, sizeof out.OSDeviceName, port.os_device_name, effect);
  out.PortSupportedSpeed = port.supported_speed;
  out.PortSpeed = port.speed;
  out.PortMaxFrameSize = port.max_frame_size;
  out.FabricName = from_wwn(port.fabric_name);
  out.NumberofDiscoveredPorts = port.discovered_ports;
}

std::string adapter_name_at(HBA_UINT32 index) {
  return Simulation::instance().with_world([index](const World& world) {
    return index < world.adapters.size() ? world.adapters[index].name : std::string();
  });
}

}  // namespace

extern "C" {

HBA_STATUS HBA_LoadLibrary(void) {
  refresh_quietly();
  return hba_call(Call_Site{.name = "HBA_LoadLibrary"},
                  [](World&, const Fault_Effect&) { return HBA_STATUS_OK; });
}

HBA_STATUS HBA_FreeLibrary(void) {
  return hba_call(Call_Site{.name = "HBA_FreeLibrary"}, [](World& world, const Fault_Effect&) {
    world.handles.clear();
    return HBA_STATUS_OK;
  });
}

HBA_UINT32 HBA_GetVersion(void) {
  return 2;
}

HBA_UINT32 HBA_GetNumberOfAdapters(void) {
  HBA_UINT32 count = 0;
  const HBA_STATUS status = hba_call(
      Call_Site{.name = "HBA_GetNumberOfAdapters"},
      [&count](const World& world, const Fault_Effect& effect) {
        count = effect.returned_size.value_or(static_cast<HBA_UINT32>(world.adapters.size()));
        return HBA_STATUS_OK;
      });
  return status == HBA_STATUS_OK ? count : 0;
}

HBA_STATUS HBA_GetAdapterName(HBA_UINT32 index, char* name) {
  constexpr std::size_t room = 256;  // what the interface lets a library write
  const auto site = [index] {
    return Call_Site{.name = "HBA_GetAdapterName", .adapter = adapter_name_at(index)};
  };
  return hba_call(site, [=](const World& world, const Fault_Effect& effect) -> HBA_STATUS {
    if (name == nullptr) return HBA_STATUS_ERROR_ARG;
    if (index >= world.adapters.size()) return HBA_STATUS_ERROR_ILLEGAL_INDEX;
    write_text(name, room, world.adapters[index].name, effect);
    return HBA_STATUS_OK;
  });
}

HBA_HANDLE HBA_OpenAdapter(char* name) {
  if (name == nullptr) return 0;
  HBA_HANDLE handle = 0;
  const auto site = [name] { return Call_Site{.name = "HBA_OpenAdapter", .adapter = name}; };
  hba_call(site, [&](World& world, const Fault_Effect&) -> HBA_STATUS {
    for (std::size_t i = 0; i < world.adapters.size(); ++i) {
      if (world.adapters[i].name != name) continue;
      handle = world.next_handle++;
      world.handles.emplace(handle, i);
      return HBA_STATUS_OK;
    }
    return HBA_STATUS_ERROR;
  });
  return handle;
}

void HBA_CloseAdapter(HBA_HANDLE handle) {
  handle_call({"HBA_CloseAdapter", handle},
              [handle](World& world, const Adapter&, const Fault_Effect&) {
                world.handles.erase(handle);
                return HBA_STATUS_OK;
              });
}

HBA_STATUS HBA_GetAdapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES* attributes) {
  return handle_call(
      {"HBA_GetAdapterAttributes", handle},
      [=](const World& world, const Adapter& adapter, const Fault_Effect& effect) -> HBA_STATUS {
        if (attributes == nullptr) return HBA_STATUS_ERROR_ARG;
        fill(*attributes, world, adapter, effect);
        return HBA_STATUS_OK;
      });
}

HBA_STATUS HBA_GetAdapterPortAttributes(HBA_HANDLE handle, HBA_UINT32 index,
                                        HBA_PORTATTRIBUTES* attributes) {
  return handle_call(
      {"HBA_GetAdapterPortAttributes", handle, index},
      [=](const World& world, const Adapter& adapter, const Fault_Effect& effect) -> HBA_STATUS {
        if (attributes == nullptr) return HBA_STATUS_ERROR_ARG;
        if (index >= adapter.ports.size()) return HBA_STATUS_ERROR_ILLEGAL_INDEX;
        fill(*attributes, world, world.ports[adapter.ports[index]], effect);
        return HBA_STATUS_OK;
      });
}

// Nothing is cached here; the call matters to the faults, which may count it.
void HBA_RefreshInformation(HBA_HANDLE handle) {
  handle_call({"HBA_RefreshInformation", handle},
              [](World&, const Adapter&, const Fault_Effect&) { return HBA_STATUS_OK; });
}

}  // extern "C"
