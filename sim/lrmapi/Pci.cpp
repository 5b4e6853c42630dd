// Configuration registers of a port's PCI function.
#include <iterator>

#include "lrmapi/Call.h"

using namespace tvx::sim;

namespace {

std::uint32_t card_number(const Port& port, std::uint32_t id) {
  const auto found = port.card_values.find(id);
  std::uint32_t number = 0;
  if (found != port.card_values.end() && found->second.size() == sizeof number) {
    std::memcpy(&number, found->second.data(), sizeof number);
  }
  return number;
}

RM_PCIHeader header_of(const Port& port) {
  const Pci_Function& pci = port.pci;
  RM_PCIHeader header{};
  header.pciType = pci.family;
  header.vendorId = pci.vendor_id;
  header.deviceId = pci.device_id != 0
                        ? pci.device_id
                        : static_cast<std::uint16_t>(card_number(port, RM_HA_DEVICE_ID));
  header.command = 0x0546;  // memory space, bus master, parity, SERR, no legacy interrupts
  header.status = 0x0010;   // has capabilities
  header.revisionId = pci.revision;
  header.subClass = 0x04;   // Fibre Channel
  header.baseClass = 0x0C;  // of the serial bus controllers
  header.cacheLineSize = 16;
  header.headerType = 0x80;  // multi-function
  const auto function = card_number(port, RM_HA_PCI_FUNCTION_NUMBER);
  header.baseAddresses[0] = 0xF7E00004 + function * 0x4000;
  header.baseAddresses[2] = 0xF7D00004 + function * 0x4000;
  header.subVendorId = pci.vendor_id;
  header.subsystemId = pci.subsystem_id != 0 ? pci.subsystem_id : header.deviceId;
  header.expansionROMBaseAddress = 0xF7C00000 + function * 0x40000;
  header.capabilitiesPtr = 0x54;
  header.interruptLine = pci.interrupt_line;
  header.interruptPin = static_cast<std::uint8_t>(function % 4 + 1);
  return header;
}

// Registers that the scenario leaves open hold their own number, so that each can be told apart.
RM_PCIRegisters registers_of(const Port& port) {
  RM_PCIRegisters registers{};
  registers.header = header_of(port);
  if (port.pci.family == RM_PCI_NONE) return registers;
  const std::size_t count = std::size(registers.family.words);
  for (std::uint32_t i = 0; i < count; ++i) {
    registers.family.words[i] = i < port.pci.words.size() ? port.pci.words[i] : 0x50000000 + i;
  }
  return registers;
}

}  // namespace

extern "C" {

RM_STATUS LRM_DiagReadPCIRegistersV2(HBA_WWN wwpn, RM_PCIRegisters* registers, uint32_t* size) {
  return port_call("LRM_DiagReadPCIRegistersV2", wwpn,
                   [=](World&, const Port& port, const Fault_Effect& effect) -> RM_STATUS {
                     if (registers == nullptr || size == nullptr) return RM_ERROR;
                     const RM_PCIRegisters content = registers_of(port);
                     const std::uint32_t room = *size;
                     *size = effect.returned_size.value_or(std::uint32_t{sizeof content});
                     if (room < sizeof content) return RM_ERROR_MORE_DATA;
                     write_bytes(registers, room, &content, sizeof content, effect);
                     return RM_OK;
                   },
                   {.told = size});
}

}  // extern "C"
