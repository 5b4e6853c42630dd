// One logical unit seen through one port.
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "rmapi/rmapi.h"

namespace cimrt {

class Adapter;
class Port;

/// First identification descriptor of inquiry page 0x83; all zero if the page could not be read.
struct DeviceIdentification {
  std::uint8_t peripheralType = 0;
  std::uint8_t pageCode = 0;
  std::uint32_t pageLength = 0;  ///< low byte of the page length
  std::uint32_t identifierType = 0;
  std::uint32_t identifierLength = 0;
  std::array<std::uint8_t, 256> identifier{};  ///< `identifierLength` bytes
};

/// Bytes of the response buffer that each SCSI command of discovery gets.
inline constexpr std::uint32_t TVX_SCSI_RESPONSE_SIZE = 255;
/// Bytes of its sense buffer.
inline constexpr std::uint32_t TVX_SCSI_SENSE_SIZE = 128;

/// Takes the descriptor out of a raw page of `TVX_SCSI_RESPONSE_SIZE` bytes. 0, or 0x8001 if
/// `identification` is null.
int parseDeviceIdentification(DeviceIdentification* identification, const std::uint8_t* page);

/// A logical unit: its row of the target mapping and what it answered to four SCSI commands.
class Target {
 public:
  /// Asks the unit. Throws `std::exception` if the adapter can't be opened; a unit that answers
  /// nothing still makes a target.
  Target(Adapter* adapter, Port* port, const HBA_FCPSCSIENTRY& row);
  Target(const Target&) = delete;
  Target& operator=(const Target&) = delete;
  virtual ~Target() noexcept(false) {}

  std::uint32_t fcId = 0;
  std::string nodeWWN;       ///< 16 upper-case digits
  std::string portWWN;       ///< same form; the target's name
  std::uint64_t fcpLun = 0;  ///< the eight LUN bytes in memory order
  std::string osDeviceName;
  std::uint32_t scsiBusNumber = 0;
  std::uint32_t scsiTargetNumber = 0;
  std::uint32_t scsiOSLun = 0;
  std::uint64_t blockSize = 0;   ///< bytes
  std::uint64_t blockCount = 0;  ///< the last block address as it came
  std::uint32_t deviceType = 0;  ///< SCSI peripheral device type
  std::string vendor;
  std::string model;
  std::string revision;
  std::string serialNumber;
  DeviceIdentification deviceIdentification;

 protected:
  Target() = default;  ///< asks nothing

 private:
  /// All commands, over a handle that is closed again when they are done.
  void askUnit(const std::string& adapterName, const HBA_WWN& wwpn);
  void inquireStandard(HBA_HANDLE handle, const HBA_WWN& wwpn);
  void inquireSerialNumber(HBA_HANDLE handle, const HBA_WWN& wwpn);
  void inquireIdentification(HBA_HANDLE handle, const HBA_WWN& wwpn);
  void readCapacity(HBA_HANDLE handle, const HBA_WWN& wwpn);
};

}  // namespace cimrt
