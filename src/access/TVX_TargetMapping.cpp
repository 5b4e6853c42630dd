// What the management library knows of one logical unit behind a port.
#include <algorithm>
#include <array>
#include <cstring>
#include <string>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_MethodWrapper.h"
#include "common/CLogger.h"
#include "common/TVX_Memory.h"

namespace cimrt {

namespace {

constexpr std::uint8_t DEVICE_TYPE_MASK = 0x1F;
constexpr std::uint8_t DEVICE_TYPE_DISK = 0;
constexpr std::uint32_t INQUIRY_SIZE = 256;
constexpr std::uint32_t CAPACITY_SIZE = 32;
constexpr std::uint32_t SENSE_SIZE = 255;  // what the library is told; the buffer has one more
constexpr std::size_t SENSE_ASC = 12;      // additional sense code
constexpr std::uint8_t ASC_INVALID_OPCODE = 0x20;
constexpr std::size_t FIRST_LIST_SIZE = 32;
constexpr std::uint32_t MAX_LIST_COUNT = 1U << 20;  // more than any adapter has
constexpr std::uint32_t MAX_WALKED = 256;           // entries that an 8-bit index reaches
constexpr std::uint8_t OS_LUN_MARK = 0x80;

/// One logical unit and how it is reached.
struct Lun_Path {
  HBA_WWN initiator{};
  HBA_WWN target{};
  std::uint64_t lun = 0;
};

struct Capacity {
  std::uint64_t blockSize = 0;
  std::uint64_t lastLba = 0;
};

std::uint64_t bigEndian(const std::uint8_t* bytes, std::size_t count) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < count; ++i) value = value << 8 | bytes[i];
  return value;
}

bool isDisk(std::uint8_t firstInquiryByte) {
  return (firstInquiryByte & DEVICE_TYPE_MASK) == DEVICE_TYPE_DISK;
}

/// READ CAPACITY data: last address and block length, or behind them the long form of the address.
Capacity decodeCapacity(const std::uint8_t* data, std::size_t length) {
  Capacity capacity;
  if (length < 8) return capacity;
  capacity.lastLba = bigEndian(data, 4);
  capacity.blockSize = bigEndian(data + 4, 4);
  if (capacity.lastLba == 0xFFFFFFFF && length >= 16) {
    const std::uint64_t longLba = bigEndian(data + 8, 8);
    if (longLba != 0) capacity.lastLba = longLba;
  }
  return capacity;
}

// ---- By the attributes of the unit ----

Capacity attributeCapacity(const void* block) {
  const TVX_Attribute lastLba = findAttribute(block, RM_LA_LAST_LBA);
  const TVX_Attribute blockSize = findAttribute(block, RM_LA_BLOCK_SIZE);
  Capacity capacity;
  if (lastLba.length >= sizeof capacity.lastLba && blockSize.length >= sizeof(std::uint32_t)) {
    std::uint32_t size = 0;
    attributeNumber(blockSize, size);
    capacity.blockSize = size;
    std::memcpy(&capacity.lastLba, lastLba.value, sizeof capacity.lastLba);
    return capacity;
  }
  const TVX_Attribute raw = findAttribute(block, RM_LA_READ_CAPACITY);
  return decodeCapacity(raw.value, raw.length);
}

std::string attributeDeviceName(const void* block) {
  const TVX_Attribute attribute = findAttribute(block, RM_LA_DEVICE_NAME);
  std::string name = attributeText(attribute);
  TVX_LOG(TVX_DBG, " %-15s: %s", "Lun Device Name",
          attribute.value != nullptr ? name.c_str() : "Not Available");
  return name;
}

void readAttributes(const void* block, Capacity& capacity, std::string& deviceName) {
  const TVX_Attribute inquiry = findAttribute(block, RM_LA_INQUIRY);
  if (inquiry.value == nullptr) {
    TVX_LOG(TVX_ERR,
            "ERROR: tvxcimGetTargetMapping: RM_GetAttributeValue call failed for scsi inquiry; "
            "( %x )",
            static_cast<unsigned>(inquiry.status));
  }
  deviceName = attributeDeviceName(block);
  if (inquiry.length != 0 && isDisk(inquiry.value[0])) capacity = attributeCapacity(block);
}

// ---- By SCSI commands ----

void logInquiryFailure(RM_STATUS status, std::uint8_t asc) {
  if (status != RM_ERROR_SCSI_CHECK) {
    TVX_LOG(TVX_ERR, "ERROR: tvxcimGetTargetMapping: RM_ScsiInquiry call failed ( %d )", status);
  } else if (asc != ASC_INVALID_OPCODE) {
    TVX_LOG(TVX_ERR,
            "ERROR: tvxcimGetTargetMapping: RM_ScsiInquiry call failed with SCSI Check Condition: "
            "Sense Key = 0x %0x",
            asc);
  }
}

Capacity scsiCapacity(const Lun_Path& path) {
  std::array<std::uint8_t, INQUIRY_SIZE> inquiry{};
  std::array<std::uint8_t, SENSE_SIZE + 1> sense{};
  RM_STATUS status = RM_ERROR;
  for (int tries = 0; tries < 2 && status != RM_OK; ++tries) {
    status = LRM_ScsiInquiry(path.initiator, path.target, path.lun, inquiry.data(), INQUIRY_SIZE,
                             sense.data(), SENSE_SIZE);
  }
  if (status != RM_OK) {
    logInquiryFailure(status, sense[SENSE_ASC]);
    return {};
  }
  if (!isDisk(inquiry[0])) return {};
  std::array<std::uint8_t, CAPACITY_SIZE> data{};
  status = LRM_ScsiReadCapacity(path.initiator, path.target, path.lun, data.data(), CAPACITY_SIZE,
                                sense.data(), SENSE_SIZE);
  return status == RM_OK ? decodeCapacity(data.data(), data.size()) : Capacity{};
}

// ---- The operating system's number ----

/// Room for a list of `count` entries, with the count set; null without memory.
TVX_Block allocateList(std::uint32_t count) {
  if (count > MAX_LIST_COUNT) return nullptr;
  const std::size_t entries = count > 1 ? count - 1 : 0;
  const std::size_t size = entries * sizeof(RM_LunEntry) + sizeof(RM_LunList);
  TVX_Block block = tvxAllocate(std::max(size, FIRST_LIST_SIZE));
  if (block != nullptr) std::memcpy(block.get(), &count, sizeof count);
  return block;
}

std::uint8_t findOsLun(const std::uint8_t* list, std::uint32_t room, std::uint64_t lun) {
  std::uint32_t count = 0;
  std::memcpy(&count, list, sizeof count);
  count = std::min({count, room, MAX_WALKED});
  for (std::uint32_t i = 0; i < count; ++i) {
    RM_LunEntry entry;
    std::memcpy(&entry, list + offsetof(RM_LunList, entry) + i * sizeof entry, sizeof entry);
    const std::uint64_t found = std::uint64_t{entry.lunHigh} << 32 | entry.lunLow;
    if (found != lun) continue;
    return entry.osLunValid == 1 ? static_cast<std::uint8_t>(entry.osLun | OS_LUN_MARK)
                                 : std::uint8_t{0};
  }
  return 0;
}

std::uint8_t osLunByte(const Lun_Path& path) {
  std::uint32_t count = 1;
  RM_STATUS status = RM_ERROR_MORE_DATA;
  TVX_Block list;
  for (int tries = 0; tries < 2 && status == RM_ERROR_MORE_DATA; ++tries) {
    list = allocateList(count);
    if (list == nullptr) {
      TVX_LOG(TVX_CRIT, "ERROR: Unable to allocate buffer");
      return 0;
    }
    auto* const typed = reinterpret_cast<RM_LunList*>(list.get());
    status = LRM_GetLunList(path.initiator, path.target, 0, typed);
    if (status == RM_ERROR_MORE_DATA) std::memcpy(&count, list.get(), sizeof count);
  }
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: RM_GetLunList: RM_GetLunList call failed ( %d )", status);
    return 0;
  }
  return findOsLun(list.get(), count, path.lun);
}

void populate(ExtendedLunInfo& info, const Capacity& capacity, const std::string& deviceName,
              std::uint8_t osLun) {
  TVX_LOG(TVX_DBG, "Populate ExtendedLunInfo structure..");
  info = {};
  info.BlockSize = capacity.blockSize;
  info.MaxLba = static_cast<std::int32_t>(static_cast<std::uint32_t>(capacity.lastLba));
  info.TotalBytes = capacity.blockSize * capacity.lastLba;
  info.OsLunByte = osLun;
  deviceName.copy(info.DeviceName, sizeof info.DeviceName - 1);
}

}  // namespace

RM_STATUS TVX_MethodWrapper::tvxcimGetTargetMapping(const char* initiatorId, const char* targetId,
                                                    std::uint64_t lun, ExtendedLunInfo* info) {
  if (info == nullptr) return RM_ERROR_INVALID_POINTER;
  Lun_Path path;
  path.lun = lun;
  if (deviceIdToWWN(&path.initiator, initiatorId) != RM_OK) return RM_ERROR;
  if (deviceIdToWWN(&path.target, targetId) != RM_OK) return RM_ERROR;
  TVX_Block block = allocateAttributeBlock(RM_LUN_ATTRIBUTES_SIZE);
  if (block == nullptr) {
    TVX_LOG(TVX_CRIT, "Could not allocate memory for Lun Attribute");
    return RM_ERROR;
  }
  Capacity capacity;
  std::string deviceName;
  std::uint32_t size = RM_LUN_ATTRIBUTES_SIZE;
  if (LRM_GetLunAttributes(path.initiator, path.target, lun, block.get(), &size) == RM_OK) {
    readAttributes(block.get(), capacity, deviceName);
  } else {
    capacity = scsiCapacity(path);
  }
  block.reset();
  populate(*info, capacity, deviceName, osLunByte(path));
  TVX_LOG(TVX_DBG, "Clean Exit");
  return RM_OK;
}

}  // namespace cimrt
