// Logical units as devices: the class that the device type selects, what each class carries, and
// its place in the system and on the path.
#include <cstdio>
#include <iterator>

#include "agent/Map_Insert.h"
#include "agent/SanBuild.h"

namespace cimrt {

namespace {

constexpr std::uint16_t STATUS_UNKNOWN = 0;
constexpr const char* OS_DEVICE_NAME = "OS Device Name";
constexpr const char* INQUIRY_DATA = "Standard SCSI inquiry data";
constexpr const char* TAPE_INQUIRY_DATA = "standard SCSI Inquery data";
constexpr const char* BYTE = "Byte";

// --- What differs by class -----------------------------------------------------------------------

/// What a class of devices is called in the log, where its instances go, and what they carry
/// beyond what all have.
template <class Device>
struct Device_Class;

/// The texts of a class whose name is CLASS and that of its paths PATH.
struct Class_Texts {
  const char* className;
  const char* label;  ///< what the log calls the device
  const char* deviceFailure;
  const char* systemDevice;
  const char* systemDeviceFailure;
  const char* path;
  const char* pathFailure;
};

template <class Device>
void setInfo(Device& device, const San_Unit_Build& build, const std::string& inquiry,
             const char* firstDescription, const char* secondDescription) {
  Constant_Texts& constants = build.port.san.constants;
  device.OtherIdentifyingInfo.set({build.osDeviceName, String(inquiry.c_str())});
  device.IdentifyingDescriptions.set({constants[firstDescription], constants[secondDescription]});
}

bool hasCapacity(const Target& target) {
  return target.blockSize != 0 && target.blockCount != 0;
}

template <class Device>
void setCapacity(Device& device, const San_Unit_Build& build) {
  const Target& target = build.target;
  if (!hasCapacity(target)) return;
  device.Capacity.set(target.blockCount * target.blockSize);
  device.CapacityUnit.set(build.port.san.constants[BYTE]);
}

template <class Device>
void setBlocks(Device& device, const Target& target) {
  if (!hasCapacity(target)) return;
  device.BlockSize.set(target.blockSize);
  device.NumberOfBlocks.set(target.blockCount);
}

template <class Device>
void setIdentifierName(Device& device, const San_Unit_Build& build) {
  device.Name.set(deviceName(build.target.deviceIdentification, build.texts.identifier).c_str());
}

// --- Volumes -------------------------------------------------------------------------------------

/// How a volume's name is to be read, by the type of its identifier. Null texts stay unset.
struct Name_Format {
  std::uint16_t nameFormat;
  const char* otherNameFormat;
  std::uint16_t nameNamespace;
  const char* otherNameNamespace;
};

constexpr Name_Format NAME_FORMATS[] = {
    {6, nullptr, 1, "Vendor specific"},
    {5, nullptr, 4, nullptr},
    {10, nullptr, 3, nullptr},
    {9, nullptr, 2, nullptr},
    {1, "Relative target port identifier", 1, "Relative target port idientifier"},
    {1, "Target port group", 1, "Target port group"},
    {1, "Logical port group", 1, "Logical unit group"},
    {1, "MD5 logical unit identifier", 1, "MD5 logical unit identifier"},
    {1, "SCSI name std::string", 1, "SCSI name std::string"},
};

void setNameFormat(TVXHBA_StorageVolume& volume, const San_Unit_Build& build) {
  const std::uint32_t identifierType = build.target.deviceIdentification.identifierType;
  Constant_Texts& constants = build.port.san.constants;
  if (identifierType >= std::size(NAME_FORMATS)) return;
  const Name_Format& format = NAME_FORMATS[identifierType];
  volume.NameFormat.set(format.nameFormat);
  if (format.otherNameFormat) volume.OtherNameFormat.set(constants[format.otherNameFormat]);
  volume.NameNamespace.set(format.nameNamespace);
  if (format.otherNameNamespace)
    volume.OtherNameNamespace.set(constants[format.otherNameNamespace]);
}

template <>
struct Device_Class<TVXHBA_StorageVolume> {
  static constexpr auto MAP = &Agent_Maps::m_TVXHBA_StorageVolume_map;
  static constexpr auto SYSTEM_DEVICES = &Agent_Maps::m_TVXHBA_StorageVolumeSystemDevice_map;
  static constexpr auto PATHS = &Agent_Maps::m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map;
  static constexpr Class_Texts TEXTS = {
      "TVXHBA_StorageVolume",
      "Storage Volume",
      "Insert Failed : m_TVXHBA_StorageVolume_map",
      "TVXHBA_StorageVolumeSystemDevice",
      "Insert Failed : m_TVXHBA_StorageVolumeSystemDevice_map",
      "TVXHBA_SCSIInitiatorTargetStorageVolumePath",
      "Insert Failed : m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map"};

  static void fill(TVXHBA_StorageVolume& volume, const San_Unit_Build& build) {
    setIdentifierName(volume, build);
    setNameFormat(volume, build);
    setCapacity(volume, build);
    setBlocks(volume, build.target);
    setInfo(volume, build, build.texts.inquiry, OS_DEVICE_NAME, INQUIRY_DATA);
  }
};

// --- Tape drives ---------------------------------------------------------------------------------

template <>
struct Device_Class<TVXHBA_TapeDrive> {
  static constexpr auto MAP = &Agent_Maps::m_TVXHBA_TapeDrive_map;
  static constexpr auto SYSTEM_DEVICES = &Agent_Maps::m_TVXHBA_TapeDriveSystemDevice_map;
  static constexpr auto PATHS = &Agent_Maps::m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map;
  static constexpr Class_Texts TEXTS = {
      "TVXHBA_TapeDrive",
      "Tape Drive",
      "Insert Failed : m_TVXHBA_TapeDrive_map",
      "TVXHBA_TapeDriveSystemDevice",
      "Insert Failed : m_TVXHBA_TapeDriveSystemDevice_map",
      "TVXHBA_SCSIInitiatorTargetTapeDrivePath",
      "Insert Failed : m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map"};

  static void fill(TVXHBA_TapeDrive& drive, const San_Unit_Build& build) {
    const Target& target = build.target;
    drive.Name.set(build.osDeviceName);
    setCapacity(drive, build);
    setInfo(drive, build,
            formatText("%s %s %s", target.vendor.c_str(), target.model.c_str(),
                       target.revision.c_str()),
            OS_DEVICE_NAME, TAPE_INQUIRY_DATA);
  }
};

// --- Extents -------------------------------------------------------------------------------------

template <>
struct Device_Class<TVXHBA_StorageExtent> {
  static constexpr auto MAP = &Agent_Maps::m_TVXHBA_StorageExtent_map;
  static constexpr auto SYSTEM_DEVICES = &Agent_Maps::m_TVXHBA_StorageExtentSystemDevice_map;
  static constexpr auto PATHS = &Agent_Maps::m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map;
  static constexpr Class_Texts TEXTS = {
      "TVXHBA_StorageExtent",
      "Storage Extent",
      "Insert Failed : m_TVXHBA_StorageExtent_map",
      "TVXHBA_StorageExtentSystemDevice",
      "Insert Failed : m_TVXHBA_StorageExtentSystemDevice_map",
      "TVXHBA_SCSIInitiatorTargetStorageExtentPath",
      "Insert Failed : m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map"};

  /// Clients know the descriptions in this order, which is not that of the values.
  static void fill(TVXHBA_StorageExtent& extent, const San_Unit_Build& build) {
    setIdentifierName(extent, build);
    setCapacity(extent, build);
    setBlocks(extent, build.target);
    setInfo(extent, build, build.texts.inquiry, INQUIRY_DATA, OS_DEVICE_NAME);
  }
};

// --- Logical disks -------------------------------------------------------------------------------

template <>
struct Device_Class<TVXHBA_LogicalDisk> {
  static constexpr auto MAP = &Agent_Maps::m_TVXHBA_LogicalDisk_map;
  static constexpr auto SYSTEM_DEVICES = &Agent_Maps::m_TVXHBA_LogicalDiskSystemDevice_map;
  static constexpr auto PATHS = &Agent_Maps::m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map;
  static constexpr Class_Texts TEXTS = {
      "TVXHBA_LogicalDisk",
      "Logical Disk",
      "Insert Failed : m_TVXHBA_LogicalDisk_map",
      "TVXHBA_LogicalDiskSystemDevice",
      "Insert Failed : m_TVXHBA_LogicalDiskSystemDevice_map",
      "TVXHBA_SCSIInitiatorTargetLogicalDiskPath",
      "Insert Failed : m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map"};

  static constexpr std::uint16_t OTHER = 1;
  static constexpr std::uint16_t NOT_KNOWN = 2;

  static void fill(TVXHBA_LogicalDisk& disk, const San_Unit_Build& build) {
    setIdentifierName(disk, build);
    setCapacity(disk, build);
    setBlocks(disk, build.target);
    disk.DataOrganization.set(OTHER);
    disk.StatusInfo.set(NOT_KNOWN);
    disk.AdditionalAvailability.set({NOT_KNOWN});
    setInfo(disk, build, build.texts.inquiry, OS_DEVICE_NAME, INQUIRY_DATA);
  }
};

// --- Controllers, enclosures and bridges ---------------------------------------------------------

template <>
struct Device_Class<TVXHBA_SCSIArbitraryLogicalUnit> {
  static constexpr auto MAP = &Agent_Maps::m_TVXHBA_SCSIArbitraryLogicalUnit_map;
  static constexpr auto SYSTEM_DEVICES =
      &Agent_Maps::m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map;
  static constexpr auto PATHS =
      &Agent_Maps::m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map;
  static constexpr Class_Texts TEXTS = {
      "TVXHBA_SCSIArbitraryLogicalUnit",
      "SCSI Arbitrary Logical Unit",
      "Insert Failed : m_TVXHBA_SCSIArbitraryLogicalUnit_map",
      "TVXHBA_SCSIArbitraryLogicalUnitSystemDevice",
      "Insert Failed : m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map",
      "TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath",
      "Insert Failed : m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map"};

  static void fill(TVXHBA_SCSIArbitraryLogicalUnit& unit, const San_Unit_Build& build) {
    unit.Name.set(build.osDeviceName);
    unit.OtherDeviceType.set(
        formatText("Peripheral devices type is 0x%02X", build.target.deviceType).c_str());
    setInfo(unit, build, build.texts.inquiry, OS_DEVICE_NAME, INQUIRY_DATA);
  }
};

// --- What all classes share ----------------------------------------------------------------------

template <class Device>
void fillCommon(Device& device, const San_Unit_Build& build, const char* className,
                const std::string& elementName) {
  const Unit_Texts& texts = build.texts;
  const CIM_ComputerSystem& system = *build.port.san.system;
  device.Description.set(build.description);
  device.SystemCreationClassName = system.CreationClassName;
  device.SystemName = system.Name;
  device.CreationClassName.set(build.port.san.constants[className]);
  device.DeviceID.set(formatText("%s_%s_%s_%s", texts.port.c_str(), texts.target.c_str(),
                                 texts.identifier.c_str(), texts.lun.c_str())
                          .c_str());
  device.ElementName.set(elementName.c_str());
  device.OperationalStatus.set({STATUS_UNKNOWN});
  device.DeviceType.set(static_cast<std::uint16_t>(build.target.deviceType));
}

template <class Device>
bool placeInSystem(San_Unit_Build& build, const Device* device, Instance* deviceEnd) {
  using Class = Device_Class<Device>;
  const Class_Texts& texts = Class::TEXTS;
  San_Build& san = build.port.san;
  TVX_LOG(TVX_DBG, "Generating %s (%s)", texts.systemDevice, device->DeviceID.value.c_str());
  return associateShared(san.agent.*Class::SYSTEM_DEVICES,
                         {san.systemEnd.of(san.system), deviceEnd},
                         texts.systemDeviceFailure) != nullptr;
}

template <class Device>
bool buildPath(San_Unit_Build& build, Instance* deviceEnd) {
  using Class = Device_Class<Device>;
  const Class_Texts& texts = Class::TEXTS;
  TVX_LOG(TVX_DBG, "creating %s - %s", texts.path, texts.label);
  San_Port_Build& port = build.port;
  return associateShared(port.san.agent.*Class::PATHS,
                         {port.initiatorEnd.of(port.initiator),
                          build.endpointEnd.of(build.endpoint), deviceEnd},
                         texts.pathFailure) != nullptr;
}

template <class Device>
std::int32_t buildDeviceOf(San_Unit_Build& build, const std::string& elementName) {
  using Class = Device_Class<Device>;
  const Class_Texts& texts = Class::TEXTS;
  Ref<Device> made = makeInstance<Device>();
  fillCommon(*made, build, texts.className, elementName);
  Class::fill(*made, build);
  Device* device =
      insertFilledInto(build.port.san.agent.*Class::MAP, std::move(made), texts.deviceFailure);
  if (!device) return MAP_BUILD_FAILED;
  TVX_LOG(TVX_DBG, "%s: %s", texts.label, device->Caption.value.c_str());
  Shared_End end;
  Instance* const deviceEnd = end.of(device);
  const bool tied = placeInSystem(build, device, deviceEnd) && buildPath<Device>(build, deviceEnd);
  return tied ? 0 : MAP_BUILD_FAILED;
}

// --- The class by device type --------------------------------------------------------------------

struct Device_Type {
  const char* elementName;  ///< the number of the unit follows
  std::int32_t (*build)(San_Unit_Build& build, const std::string& elementName);
};

constexpr auto VOLUME = buildDeviceOf<TVXHBA_StorageVolume>;
constexpr auto TAPE = buildDeviceOf<TVXHBA_TapeDrive>;
constexpr auto EXTENT = buildDeviceOf<TVXHBA_StorageExtent>;
constexpr auto DISK = buildDeviceOf<TVXHBA_LogicalDisk>;
constexpr auto UNIT = buildDeviceOf<TVXHBA_SCSIArbitraryLogicalUnit>;

constexpr Device_Type DEVICE_TYPES[] = {
    {"Storage Volume: ", VOLUME},             // 0
    {"Tape Drive ", TAPE},                    // 1
    {"Printer ", EXTENT},                     // 2
    {"Processor ", EXTENT},                   // 3
    {"Write-once device ", EXTENT},           // 4
    {"CD/DVD ", EXTENT},                      // 5
    {"Scanner ", EXTENT},                     // 6
    {"Optical memory device ", EXTENT},       // 7
    {"Jukebox ", EXTENT},                     // 8
    {"Communications device ", EXTENT},       // 9
    {"Unknown device ", EXTENT},              // 10
    {"Unknown device ", EXTENT},              // 11
    {"Storage array controller ", UNIT},      // 12
    {"Enclosure services ", UNIT},            // 13
    {"Storage Volume: ", VOLUME},             // 14
    {"Optical card reader/writer ", EXTENT},  // 15
    {"Bridge controller ", UNIT},             // 16
    {"Object-based storage device: ", DISK},  // 17
    {"Unknown device ", EXTENT},              // 18 and above
};

const Device_Type& deviceType(std::uint32_t type) {
  constexpr std::uint32_t last = std::size(DEVICE_TYPES) - 1;
  return DEVICE_TYPES[type < last ? type : last];
}

}  // namespace

std::int32_t buildDevice(San_Unit_Build& build) {
  const std::uint32_t type = build.target.deviceType;
  TVX_LOG(TVX_DBG, "Target %d is of type %d.", static_cast<int>(build.index),
          static_cast<int>(type));
  const Device_Type& row = deviceType(type);
  // The number is written signed, whatever the operating system counts.
  const auto number = static_cast<std::int32_t>(build.target.scsiOSLun);
  return row.build(build, row.elementName + std::to_string(number));
}

}  // namespace cimrt
