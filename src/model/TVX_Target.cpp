#include "model/TVX_Target.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "access/TVX_Runtime_Loader.h"
#include "common/CLogger.h"
#include "common/TVX_Common.h"
#include "model/TVX_Data.h"
#include "model/TVX_Snia.h"

namespace cimrt {

namespace {

constexpr int COMMAND_TRIES = 3;
constexpr std::uint8_t PAGE_SERIAL_NUMBER = 0x80;
constexpr std::uint8_t PAGE_IDENTIFICATION = 0x83;
constexpr std::size_t LOGGED_SENSE = 24;

/// Buffers of one SCSI command.
struct Command {
  std::array<std::uint8_t, TVX_SCSI_RESPONSE_SIZE> response{};
  std::array<std::uint8_t, TVX_SCSI_SENSE_SIZE> sense{};
  HBA_STATUS status = HBA_STATUS_OK;
};

/// Repeats a command while the unit answers check condition, three calls at most. Every failure has
/// the same text, whatever the command.
template <class Call>
bool run(Command& command, const Call& call) {
  for (int tries = 0; tries < COMMAND_TRIES; ++tries) {
    command.status = call();
    if (command.status != HBA_STATUS_SCSI_CHECK_CONDITION) break;
  }
  if (command.status == HBA_STATUS_OK) return true;
  TVX_LOG(TVX_DBG, "HBA_SendScsiInquiry_t(0x80) returns %d.", static_cast<int>(command.status));
  return false;
}

bool inquire(Command& command, HBA_HANDLE handle, const HBA_WWN& wwpn, std::uint64_t lun,
             std::uint8_t evpd, std::uint8_t page) {
  return run(command, [&] {
    return HBA_SendScsiInquiry(handle, wwpn, static_cast<HBA_UINT64>(lun), evpd, page,
                               command.response.data(), TVX_SCSI_RESPONSE_SIZE,
                               command.sense.data(), TVX_SCSI_SENSE_SIZE);
  });
}

/// Text of at most `size` bytes of a response, up to its first NUL.
std::string responseText(const Command& command, std::size_t offset, std::size_t size) {
  const auto* text = reinterpret_cast<const char*>(command.response.data() + offset);
  return {text, ::strnlen(text, std::min(size, command.response.size() - offset))};
}

std::uint64_t bigEndianWord(const std::uint8_t* bytes) {
  return std::uint64_t{bytes[0]} << 24 | std::uint64_t{bytes[1]} << 16 |
         std::uint64_t{bytes[2]} << 8 | bytes[3];
}

void logSense(const Command& command) {
  std::string text = "Sense Data: ";
  for (std::size_t i = 0; i < LOGGED_SENSE; ++i) {
    char byte[4];
    std::snprintf(byte, sizeof byte, "%02x ", command.sense[i]);
    text += byte;
  }
  TVX_LOG(TVX_DBG, "%s", text.c_str());
}

}  // namespace

int parseDeviceIdentification(DeviceIdentification* identification, const std::uint8_t* page) {
  if (identification == nullptr) return TVX_FAILED;
  DeviceIdentification parsed;
  parsed.peripheralType = page[0] & 0x1F;
  parsed.pageCode = page[1];
  parsed.pageLength = page[3];
  parsed.identifierType = page[5] & 0x0F;
  parsed.identifierLength = page[7];
  // The length may point behind the response.
  const std::size_t room = TVX_SCSI_RESPONSE_SIZE - 8;
  std::copy_n(page + 8, std::min<std::size_t>(parsed.identifierLength, room),
              parsed.identifier.begin());
  *identification = parsed;
  return 0;
}

Target::Target(Adapter* adapter, Port*, const HBA_FCPSCSIENTRY& row) {
  TVX_LOG(TVX_DBG, "Creating Target...");
  fcId = row.FcpId.FcId;
  nodeWWN = WWNToString(row.FcpId.NodeWWN.wwn);
  portWWN = WWNToString(row.FcpId.PortWWN.wwn);
  fcpLun = static_cast<std::uint64_t>(row.FcpId.FcpLun);
  osDeviceName = fieldText(row.ScsiId.OSDeviceName);
  scsiBusNumber = row.ScsiId.ScsiBusNumber;
  scsiTargetNumber = row.ScsiId.ScsiTargetNumber;
  scsiOSLun = row.ScsiId.ScsiOSLun;
  logValue("Node WWN", nodeWWN.c_str());
  logValue("Port WWN", portWWN.c_str());
  askUnit(adapter->getName(), row.FcpId.PortWWN);
  TVX_LOG(TVX_DBG, "End Creating Target...");
}

void Target::askUnit(const std::string& adapterName, const HBA_WWN& wwpn) {
  const Snia_Adapter snia(adapterName);
  inquireStandard(snia.handle(), wwpn);
  inquireSerialNumber(snia.handle(), wwpn);
  inquireIdentification(snia.handle(), wwpn);
  readCapacity(snia.handle(), wwpn);
}

void Target::inquireStandard(HBA_HANDLE handle, const HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "SCSI Inquiry with 0, 0");
  Command command;
  if (!inquire(command, handle, wwpn, fcpLun, 0, 0)) {
    vendor = model = revision = "Unknown";
    return;
  }
  deviceType = command.response[0] & 0x1F;
  TVX_LOG(TVX_DBG, "DeviceType......%d", static_cast<int>(deviceType));
  vendor = responseText(command, 8, 8);
  model = responseText(command, 16, 16);
  revision = responseText(command, 32, 4);
}

void Target::inquireSerialNumber(HBA_HANDLE handle, const HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "SCSI Inquiry with 1, 0x80");
  Command command;
  const bool answered = inquire(command, handle, wwpn, fcpLun, 1, PAGE_SERIAL_NUMBER);
  serialNumber = answered ? responseText(command, 4, TVX_SCSI_RESPONSE_SIZE) : "Unknown";
}

void Target::inquireIdentification(HBA_HANDLE handle, const HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "SCSI Inquiry with 1, 0x83");
  Command command;
  if (inquire(command, handle, wwpn, fcpLun, 1, PAGE_IDENTIFICATION)) {
    parseDeviceIdentification(&deviceIdentification, command.response.data());
  } else if (command.status == HBA_STATUS_SCSI_CHECK_CONDITION) {
    logSense(command);
  }
}

void Target::readCapacity(HBA_HANDLE handle, const HBA_WWN& wwpn) {
  TVX_LOG(TVX_DBG, "Send Read Capacity");
  Command command;
  const bool answered = run(command, [&] {
    return HBA_SendReadCapacity(handle, wwpn, static_cast<HBA_UINT64>(fcpLun),
                                command.response.data(), TVX_SCSI_RESPONSE_SIZE,
                                command.sense.data(), TVX_SCSI_SENSE_SIZE);
  });
  blockCount = answered ? bigEndianWord(command.response.data()) : 0;
  blockSize = answered ? bigEndianWord(command.response.data() + 4) : 0;
}

}  // namespace cimrt
