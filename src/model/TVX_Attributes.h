// Records of the device tree: attributes and statistics of adapters and ports.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>

#include "rmapi/rmapi.h"

namespace cimrt {

class Adapter;

class AdapterAttributes {
 public:
  virtual ~AdapterAttributes() noexcept(false) {}
};

/// What an FC adapter reports. Texts are empty and numbers 0 where it reports nothing.
class FCAdapterAttributes : public AdapterAttributes {
 public:
  /// Reads the hardware. Throws `std::exception` if the adapter can't be opened, its first port or
  /// its attribute block can't be read, or its name is invalid.
  explicit FCAdapterAttributes(const Adapter* adapter);

  std::string Manufacturer;
  std::string SerialNumber;
  std::string Model;
  std::string ModelDescription;
  std::string NodeSymbolicName;
  std::string HardwareVersion;
  std::string DriverVersion;
  std::string OptionROMVersion;
  std::string FirmwareVersion;
  std::string DriverName;
  std::string NodeWWN;  ///< 16 upper-case digits
  std::string PortWWN;  ///< of port 0, same form
  std::uint32_t VendorSpecificID = 0;
  std::uint32_t NumberOfPorts = 0;
  std::uint32_t BoardTemperature = 0;
  std::uint32_t ThresholdWarningTemp = 0;
  std::uint32_t ThresholdCriticalTemp = 0;
  std::uint32_t DeviceID = 0;
  std::uint32_t ModelID = 0;
  std::uint32_t DriverType = 0;
  std::uint32_t DiagVersion = 0;
  std::uint32_t PortNumber = 0;
  std::uint32_t FunctionType = 0;
  std::uint32_t SLIMode = 0;
  std::uint32_t PCIFunctionNumber = 0;
  std::uint32_t PCIBusNumber = 0;
  std::string IEEEAddress;  ///< "aa:bb:cc:dd:ee:ff"
  std::string BootBIOSVersion;
  std::string KernelVersion;
  std::string InitialFirmwareLoad;
  std::string OperationalFirmware;
  std::string FirmwareOnFlash;
  std::string FCUniversalVersion;
  std::string FCX86BIOSVersion;
  std::string FCEFIVersion;
  std::string FCFCodeVersion;
  std::string ULPFirmwareVersion;
  std::string ULPFirmwareName;
  std::string SPFirmwareVersion;
  std::string SPFirmwareName;
  std::string SLI1FirmwareName;
  std::string SLI2FirmwareName;
  std::string SLI3FirmwareName;
  std::string SubAdapterID;
  bool BootCodeEnabled = false;

 private:
  HBA_WWN readSnia(const std::string& adapterName);
  void takeSnia(const HBA_ADAPTERATTRIBUTES& record);
  void readKeys(const HBA_WWN& wwpn, const void* block);
  void readBoardTemperature(const HBA_WWN& wwpn, const void* block);
  void readDriverType(const HBA_WWN& wwpn, const void* block);
  void readIEEEAddress(const HBA_WWN& wwpn, const void* block);
  void readBootCodeEnabled(const HBA_WWN& wwpn, const void* block);
  struct Key;
};

class AdapterStatistics {
 public:
  virtual ~AdapterStatistics() noexcept(false) {}
};

/// Carries no data.
class FCAdapterStatistics : public AdapterStatistics {
 public:
  explicit FCAdapterStatistics(const Adapter* adapter);
};

class PortAttributes {
 public:
  virtual ~PortAttributes() noexcept(false) {}
};

/// What an FC port reports.
class FCPortAttributes : public PortAttributes {
 public:
  /// Reads the port of that index. Throws `std::exception` if it can't be read or its name is
  /// invalid.
  FCPortAttributes(const Adapter* adapter, std::uint32_t index);

  std::string NodeWWN;  ///< 16 upper-case digits
  std::string PortWWN;  ///< same form
  std::uint32_t PortFcId = 0;
  std::uint32_t PortType = HBA_PORTTYPE_UNKNOWN;
  std::uint32_t PortState = HBA_PORTSTATE_UNKNOWN;
  std::uint32_t PortSupportedClassofService = 0;
  std::array<std::uint32_t, 32> PortSupportedFc4Types{};  ///< one word for each byte of the mask
  std::array<std::uint32_t, 32> PortActiveFc4Types{};     ///< the same
  std::string PortSymbolicName;
  std::string OSDeviceName;
  std::uint32_t PortSupportedSpeed = 0;
  std::uint32_t PortSpeed = 0;
  std::uint32_t PortMaxFrameSize = 0;
  std::string FabricName;  ///< 16 upper-case digits
  std::uint32_t NumberofDiscoveredPorts = 0;
  std::uint32_t FECState = 2;

 private:
  void takeSnia(const HBA_PORTATTRIBUTES& record);
  void readManagement(const HBA_WWN& wwpn);
};

class PortStatistics {
 public:
  virtual ~PortStatistics() noexcept(false) {}
};

/// The counters of an FC port, by the statistic numbers of the management library.
class FCPortStatistics : public PortStatistics {
 public:
  static constexpr std::size_t COUNT = 25;
  /// A counter that was not supplied.
  static constexpr std::uint64_t NOT_SUPPLIED = 0xFFFFFFFF;
  /// Number of each counter, in order; a 0 ends the list.
  static const std::array<std::uint32_t, COUNT + 1> IDENTIFIERS;

  /// Reads the port with that name (16 digits). Throws `std::exception` if the read fails.
  explicit FCPortStatistics(const std::string& portName);

  /// Counter by number (0x401 ...); `NOT_SUPPLIED` for a number that is not in the list.
  std::uint64_t counter(std::uint32_t identifier) const;

  std::array<std::uint64_t, COUNT> m_Counters;
};

}  // namespace cimrt
