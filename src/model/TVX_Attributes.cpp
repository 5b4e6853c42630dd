#include "model/TVX_Attributes.h"

#include <algorithm>
#include <cstdio>
#include <exception>
#include <iterator>
#include <variant>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"
#include "common/TVX_Memory.h"
#include "model/TVX_Data.h"
#include "model/TVX_Snia.h"

namespace cimrt {

namespace {

std::string wwnText(const HBA_WWN& wwn) {
  return WWNToString(wwn.wwn);
}

TVX_Block allocateBlock(std::uint32_t size) {
  TVX_Block block = allocateAttributeBlock(size);
  if (block == nullptr) throw std::exception();
  return block;
}

}  // namespace

// ---- Adapter ----

FCAdapterAttributes::FCAdapterAttributes(const Adapter* adapter) {
  TVX_LOG(TVX_DBG, "FCAdapterName:%s", adapter->getName().c_str());
  const HBA_WWN wwpn = readSnia(adapter->getName());
  const TVX_Block block = allocateBlock(RM_HBA_ATTRIBUTES_SIZE);
  std::uint32_t length = RM_HBA_ATTRIBUTES_SIZE;
  const RM_STATUS status = LRM_GetHBAAttributes(wwpn, block.get(), &length);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
    throw std::exception();
  }
  readKeys(wwpn, block.get());
}

/// Asks the SNIA library; gives the name of port 0.
HBA_WWN FCAdapterAttributes::readSnia(const std::string& adapterName) {
  {
    const Snia_Adapter snia(adapterName);
    HBA_ADAPTERATTRIBUTES record;
    HBA_STATUS status = snia.attributes(record);
    if (status == HBA_STATUS_OK) {
      takeSnia(record);
    } else {
      TVX_LOG(TVX_ERR, "Error hbaStatus=%d, skipping Adapter %s", static_cast<int>(status),
              adapterName.c_str());
    }
    HBA_PORTATTRIBUTES port;
    status = snia.portAttributes(0, port);
    if (status != HBA_STATUS_OK) {
      TVX_LOG(TVX_ERR, "(portIndex = %d) failed with hbaStatus %d", 0, static_cast<int>(status));
      throw std::exception();
    }
    PortWWN = wwnText(port.PortWWN);
    TVX_LOG(TVX_DBG, "Port 0's WWPN: %s", PortWWN.c_str());
  }
  return portNameToWWN(PortWWN);
}

void FCAdapterAttributes::takeSnia(const HBA_ADAPTERATTRIBUTES& record) {
  Manufacturer = fieldText(record.Manufacturer);
  SerialNumber = fieldText(record.SerialNumber);
  Model = fieldText(record.Model);
  ModelDescription = fieldText(record.ModelDescription);
  // Still empty here: it is read from the attribute block later.
  TVX_LOG(TVX_DBG, "_NodeSymbolicName=%s", NodeSymbolicName.c_str());
  HardwareVersion = fieldText(record.HardwareVersion);
  DriverVersion = fieldText(record.DriverVersion);
  FirmwareVersion = fieldText(record.FirmwareVersion);
  DriverName = fieldText(record.DriverName);
  NodeWWN = wwnText(record.NodeWWN);
  VendorSpecificID = record.VendorSpecificID;
  NumberOfPorts = record.NumberOfPorts;
}

/// One key of the attribute block: the number or text field it fills, or the step that reads it.
struct FCAdapterAttributes::Key {
  using Number = std::uint32_t FCAdapterAttributes::*;
  using Text = std::string FCAdapterAttributes::*;
  using Step = void (FCAdapterAttributes::*)(const HBA_WWN& wwpn, const void* block);

  const char* label;
  std::uint32_t key;
  std::variant<Number, Text, Step> target;
};

void FCAdapterAttributes::readKeys(const HBA_WWN& wwpn, const void* block) {
  using A = FCAdapterAttributes;
  static const Key KEYS[] = {
      {"_BoardTemperature", RM_HA_BOARD_TEMPERATURE, &A::readBoardTemperature},
      {"_DeviceID", RM_HA_DEVICE_ID, &A::DeviceID},
      {"_ModelID", RM_HA_MODEL_ID, &A::ModelID},
      {"_DiagVersion", RM_HA_DIAG_VERSION, &A::DiagVersion},
      {"_DriverType", 0, &A::readDriverType},  // a call of its own
      {"_FunctionType", RM_HA_FUNCTION_TYPE, &A::FunctionType},
      {"_IEEE_ADDRESS", RM_HA_IEEE_ADDRESS, &A::readIEEEAddress},
      {"_BOOTBIOS_VERSION", RM_HA_BOOT_BIOS_VERSION, &A::BootBIOSVersion},
      {"_KERNEL_VERSION", RM_HA_KERNEL_VERSION, &A::KernelVersion},
      {"INITIAL_FW_LOAD", RM_HA_INITIAL_FW_LOAD, &A::InitialFirmwareLoad},
      {"Operational Firmware", RM_HA_OPERATIONAL_FIRMWARE, &A::OperationalFirmware},
      {"_FirmwareOnFlash", RM_HA_FIRMWARE_ON_FLASH, &A::FirmwareOnFlash},
      {"_BootCodeEnabled", RM_HA_BOOT_CODE_ENABLED, &A::readBootCodeEnabled},
      {"_PortNumber", RM_HA_PORT_NUMBER, &A::PortNumber},
      {"_SLIMode", RM_HA_SLI_MODE, &A::SLIMode},
      {"_FCUniversalVersion", RM_HA_FC_UNIVERSAL_VERSION, &A::FCUniversalVersion},
      {"FC_X86_BIOSVersion", RM_HA_FC_X86_BIOS_VERSION, &A::FCX86BIOSVersion},
      {"_FC_EFIVersion", RM_HA_FC_EFI_VERSION, &A::FCEFIVersion},
      {"_FC_FCODEVersion", RM_HA_FC_FCODE_VERSION, &A::FCFCodeVersion},
      {"_ULPFirmwareVersion", RM_HA_ULP_FIRMWARE_VERSION, &A::ULPFirmwareVersion},
      {"_ULPFirmwareName", RM_HA_ULP_FIRMWARE_NAME, &A::ULPFirmwareName},
      {"_SPFirmwareVersion", RM_HA_SP_FIRMWARE_VERSION, &A::SPFirmwareVersion},
      {"_SPFirmwareName", RM_HA_SP_FIRMWARE_NAME, &A::SPFirmwareName},
      {"_PCIFunctionNumber", RM_HA_PCI_FUNCTION_NUMBER, &A::PCIFunctionNumber},
      {"_PCIBusNumber", RM_HA_PCI_BUS_NUMBER, &A::PCIBusNumber},
      {"_SLI1FirmwareName", RM_HA_SLI1_FIRMWARE_NAME, &A::SLI1FirmwareName},
      {"_SLI2FirmwareName", RM_HA_SLI2_FIRMWARE_NAME, &A::SLI2FirmwareName},
      {"_SLI3FirmwareName", RM_HA_SLI3_FIRMWARE_NAME, &A::SLI3FirmwareName},
      {"_OptionROMVersion", RM_HA_OPTION_ROM_VERSION, &A::OptionROMVersion},
      {"_NodeSymbolicName", RM_HA_NODE_SYMBOLIC_NAME, &A::NodeSymbolicName},
      {"_SubadapterID", RM_HA_SUBADAPTER_ID, &A::SubAdapterID},
  };
  for (const Key& key : KEYS) {
    if (const auto* number = std::get_if<Key::Number>(&key.target)) {
      readNumberAttribute(block, key.key, key.label, this->**number);
    } else if (const auto* text = std::get_if<Key::Text>(&key.target)) {
      readTextAttribute(block, key.key, key.label, this->**text);
    } else {
      (this->*std::get<Key::Step>(key.target))(wwpn, block);
    }
  }
}

void FCAdapterAttributes::readBoardTemperature(const HBA_WWN&, const void* block) {
  std::uint32_t word = 0;
  if (!readNumberAttribute(block, RM_HA_BOARD_TEMPERATURE, "_BoardTemperature", word)) return;
  BoardTemperature = word & 0xFF;
  ThresholdCriticalTemp = word >> 8 & 0xFF;
  ThresholdWarningTemp = word >> 16 & 0xFF;
}

void FCAdapterAttributes::readDriverType(const HBA_WWN& wwpn, const void*) {
  std::uint32_t type = 0;
  const RM_STATUS status = LRM_GetDriverType(wwpn, &type);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetDriverType call failed (%d)", status);
    return;
  }
  TVX_LOG(TVX_DBG, "_DriverType: [ %d ]", static_cast<int>(type));
  DriverType = type;
}

void FCAdapterAttributes::readIEEEAddress(const HBA_WWN&, const void* block) {
  constexpr std::uint32_t SIZE = 6;
  const TVX_Attribute attribute = findAttribute(block, RM_HA_IEEE_ADDRESS);
  if (attribute.length < SIZE) {
    TVX_LOG(TVX_DBG, "ERROR: %s: RM_GetHBAAttributes call failed (%d)", "_IEEE_ADDRESS",
            attribute.status);
    return;
  }
  const std::uint8_t* b = attribute.value;
  char text[3 * SIZE];
  std::snprintf(text, sizeof text, "%02x:%02x:%02x:%02x:%02x:%02x", b[0], b[1], b[2], b[3], b[4],
                b[5]);
  IEEEAddress = text;
  TVX_LOG(TVX_DBG, "%s : [ %s ]", "_IEEE_ADDRESS", text);
}

void FCAdapterAttributes::readBootCodeEnabled(const HBA_WWN&, const void* block) {
  std::uint32_t value = 0;
  BootCodeEnabled =
      readNumberAttribute(block, RM_HA_BOOT_CODE_ENABLED, "_BootCodeEnabled", value) && value != 0;
}

// ---- Port ----

FCPortAttributes::FCPortAttributes(const Adapter* adapter, std::uint32_t index) {
  HBA_PORTATTRIBUTES record;
  // The adapter is closed again before anything is made of the answer.
  const HBA_STATUS status = Snia_Adapter(adapter->getName()).portAttributes(index, record);
  if (status != HBA_STATUS_OK) {
    TVX_LOG(TVX_ERR, "(portIndex=%d) failed with hbaStatus %d", static_cast<int>(index),
            static_cast<int>(status));
    throw std::exception();
  }
  takeSnia(record);
  TVX_LOG(TVX_DBG, "Port's WWPN: %s", PortWWN.c_str());
  readManagement(portNameToWWN(PortWWN));
}

void FCPortAttributes::takeSnia(const HBA_PORTATTRIBUTES& record) {
  PortFcId = record.PortFcId;
  PortType = record.PortType;
  PortState = record.PortState;
  PortSupportedClassofService = record.PortSupportedClassofService;
  std::copy(std::begin(record.PortSupportedFc4Types.bits),
            std::end(record.PortSupportedFc4Types.bits), PortSupportedFc4Types.begin());
  std::copy(std::begin(record.PortActiveFc4Types.bits), std::end(record.PortActiveFc4Types.bits),
            PortActiveFc4Types.begin());
  PortSymbolicName = fieldText(record.PortSymbolicName);
  OSDeviceName = fieldText(record.OSDeviceName);
  PortSupportedSpeed = record.PortSupportedSpeed;
  PortSpeed = record.PortSpeed;
  PortMaxFrameSize = record.PortMaxFrameSize;
  PortWWN = wwnText(record.PortWWN);
  NodeWWN = wwnText(record.NodeWWN);
  FabricName = wwnText(record.FabricName);
  NumberofDiscoveredPorts = record.NumberofDiscoveredPorts;
}

namespace {

/// Reads a number of a port; keeps `value` on failure.
bool readPortNumber(const void* block, std::uint32_t key, const char* label, std::uint32_t& value) {
  const TVX_Attribute attribute = findAttribute(block, key);
  if (attributeNumber(attribute, value)) return true;
  TVX_LOG(TVX_DBG, "ERROR: RM_GetPortAttributes HA_%s call failed (%d)", label, attribute.status);
  return false;
}

}  // namespace

void FCPortAttributes::readManagement(const HBA_WWN& wwpn) {
  const TVX_Block block = allocateBlock(RM_PORT_ATTRIBUTES_SIZE);
  std::uint32_t length = RM_PORT_ATTRIBUTES_SIZE;
  const RM_STATUS status = LRM_GetPortAttributes(wwpn, block.get(), &length);
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "RM_GetPortAttributes call failed (%d)\n", status);
    throw std::exception();
  }
  if (readPortNumber(block.get(), RM_PA_PORT_STATE, "_PortState", PortState)) {
    TVX_LOG(TVX_DBG, "Physical port state for FC Port: %d", static_cast<int>(PortState));
  }
  if (readPortNumber(block.get(), RM_PA_FEC_STATE, "_FECState", FECState)) {
    TVX_LOG(TVX_DBG, "FEC state for FC Port: %d", static_cast<int>(FECState));
  }
}

}  // namespace cimrt
