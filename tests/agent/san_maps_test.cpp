// Targets and logical units after a refresh.
#include "San_Test.h"
#include "agent/Map_Insert.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;
using Numbers = std::vector<std::uint16_t>;

/// `Name` of a unit's target endpoint.
std::string endpointName(unsigned lun) {
  return std::string(SAN_PORT) + ":" + SAN_TARGET + ":" + smallLun(lun);
}

template <class Association>
bool tiesThree(const Association& path, const Instance* initiator, const Instance* target,
               const Instance* unit) {
  return identical(reinterpret_cast<const Instance*>(path.Initiator), initiator) &&
         identical(reinterpret_cast<const Instance*>(path.Target), target) &&
         identical(reinterpret_cast<const Instance*>(path.LogicalUnit), unit);
}

// --- Endpoints -----------------------------------------------------------------------------------

TEST_F(San_Maps, TargetEndpoint) {
  ProviderAgent& agent = buildUnits(
      R"({"first": 3, "vendor": "ACMESTOR", "model": "ARRAY 7200", "revision": "0410",
          "serial": "AS72", "os_device": "/dev/unit"})");
  ASSERT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 1u);
  const TVXHBA_SCSIProtocolEndpoint& endpoint = *agent.m_TVXHBA_SCSIProtocolEndpoint_map[0];
  const CIM_ComputerSystem& system = *agent.m_CIM_ComputerSystem_map[0];
  EXPECT_TRUE(endpoint.__name_space == "root/torvex");
  EXPECT_EQ(text(endpoint.TargetWWPN), SAN_TARGET);
  EXPECT_EQ(text(endpoint.TargetWWNN), "500C0FF12A0010FF");
  EXPECT_EQ(text(endpoint.Description),
            "ACMESTOR ARRAY 7200       Revision 0410 Serial Number AS72000003");
  EXPECT_EQ(text(endpoint.SystemCreationClassName), text(system.CreationClassName));
  EXPECT_EQ(text(endpoint.SystemName), text(system.Name));
  EXPECT_EQ(text(endpoint.CreationClassName), "TVXHBA_SCSIProtocolEndpoint");
  EXPECT_EQ(text(endpoint.ElementName), "ARRAY 7200      ");
  EXPECT_EQ(text(endpoint.Name), "10000254560C3001:500C0FF12A001001:0003000000000000");
  EXPECT_EQ(endpoint.ProtocolType.value, 18);
  EXPECT_EQ(endpoint.ProtocolIFType.value, 56);
  EXPECT_EQ(endpoint.ConnectionType.value, 2);
  EXPECT_EQ(endpoint.Role.value, 3);
  EXPECT_EQ(endpoint.EnabledDefault.value, 5);
  EXPECT_EQ(endpoint.EnabledState.value, 0);
  EXPECT_EQ(endpoint.RequestedState.value, 0);
  EXPECT_EQ(numbers(endpoint.OperationalStatus), Numbers{0});
  EXPECT_EQ(endpoint.FCID.value, 0x010203u);
  EXPECT_EQ(endpoint.SCSIBusNumber.value, 0u);
  EXPECT_FALSE(endpoint.SCSIBusNumber.is_null());
  EXPECT_EQ(endpoint.SCSITargetNumber.value, 0u);
  EXPECT_FALSE(endpoint.SCSITargetNumber.is_null());
  EXPECT_EQ(texts(endpoint.OtherIdentifyingInfo), Texts{"/dev/unit0"});
  EXPECT_EQ(texts(endpoint.IdentifyingDescriptions), Texts{"OS Device Name"});
}

TEST_F(San_Maps, EndpointTellsWhatTheSystemCountsAndTheWholeIdentifierOfThePort) {
  ProviderAgent& agent = buildUnits(R"({"first": 7})");
  Target& target = *agent.m_pData->m_Ports.at(0)->getTarget(0);
  target.fcId = 0xFFFFFFFF;
  target.scsiBusNumber = 5;
  target.scsiTargetNumber = 6;
  target.scsiOSLun = 0xFFFFFFFF;
  EXPECT_EQ(rebuildSAN(agent), 0);
  const TVXHBA_SCSIProtocolEndpoint& endpoint = *agent.m_TVXHBA_SCSIProtocolEndpoint_map[0];
  EXPECT_EQ(endpoint.FCID.value, std::uint64_t{0xFFFFFFFF});
  EXPECT_EQ(endpoint.SCSIBusNumber.value, 5u);
  EXPECT_EQ(endpoint.SCSITargetNumber.value, 6u);
  // The number of the device is the system's, not the unit's, and is written signed.
  EXPECT_EQ(text(endpoint.Name), endpointName(7));
  EXPECT_EQ(text(agent.m_TVXHBA_StorageVolume_map[0]->ElementName), "Storage Volume: -1");
}

TEST_F(San_Maps, EachUnitHasAnEndpointInTheSystem) {
  ProviderAgent& agent = buildUnits(R"({"count": 3})");
  ASSERT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 3u);
  ASSERT_EQ(agent.m_TVXHBA_LocalHostedAccessPoint_map.size(), 3u);
  for (unsigned i = 0; i < 3; i++) {
    EXPECT_EQ(text(agent.m_TVXHBA_SCSIProtocolEndpoint_map[i]->Name), endpointName(i));
    EXPECT_TRUE(ties(*agent.m_TVXHBA_LocalHostedAccessPoint_map[i],
                     agent.m_CIM_ComputerSystem_map[0],
                     agent.m_TVXHBA_SCSIProtocolEndpoint_map[i]));
    const std::string generating =
        "Generating TVXHBA_LocalHostedAccessPoint (Local Hosted Access Point " + endpointName(i) +
        ")";
    EXPECT_EQ(log.level(generating), TVX_DBG) << generating;
  }
}

// --- The class by device type --------------------------------------------------------------------

struct Type_Row {
  unsigned type;
  const char* className;
  const char* elementName;
};

constexpr Type_Row TYPE_ROWS[] = {
    {0, "TVXHBA_StorageVolume", "Storage Volume: 7"},
    {1, "TVXHBA_TapeDrive", "Tape Drive 7"},
    {2, "TVXHBA_StorageExtent", "Printer 7"},
    {3, "TVXHBA_StorageExtent", "Processor 7"},
    {4, "TVXHBA_StorageExtent", "Write-once device 7"},
    {5, "TVXHBA_StorageExtent", "CD/DVD 7"},
    {6, "TVXHBA_StorageExtent", "Scanner 7"},
    {7, "TVXHBA_StorageExtent", "Optical memory device 7"},
    {8, "TVXHBA_StorageExtent", "Jukebox 7"},
    {9, "TVXHBA_StorageExtent", "Communications device 7"},
    {10, "TVXHBA_StorageExtent", "Unknown device 7"},
    {11, "TVXHBA_StorageExtent", "Unknown device 7"},
    {12, "TVXHBA_SCSIArbitraryLogicalUnit", "Storage array controller 7"},
    {13, "TVXHBA_SCSIArbitraryLogicalUnit", "Enclosure services 7"},
    {14, "TVXHBA_StorageVolume", "Storage Volume: 7"},
    {15, "TVXHBA_StorageExtent", "Optical card reader/writer 7"},
    {16, "TVXHBA_SCSIArbitraryLogicalUnit", "Bridge controller 7"},
    {17, "TVXHBA_LogicalDisk", "Object-based storage device: 7"},
    {18, "TVXHBA_StorageExtent", "Unknown device 7"},
    {30, "TVXHBA_StorageExtent", "Unknown device 7"},
    {31, "TVXHBA_StorageExtent", "Unknown device 7"},
};

/// What every class of devices carries, with the class's own maps.
struct Device_View {
  std::string creationClassName;
  std::string elementName;
  std::string deviceID;
  std::string description;
  std::string systemName;
  std::string systemCreationClassName;
  Numbers operationalStatus;
  unsigned deviceType;
  bool inSystem;
  bool onPath;
};

template <class Device, class System_Device, class Path>
void viewMap(ProviderAgent& agent, Instance_Map<Device>& devices,
             Instance_Map<System_Device>& systemDevices, Instance_Map<Path>& paths,
             std::vector<Device_View>& views) {
  for (std::size_t i = 0; i < devices.size(); i++) {
    const Device& device = *devices[i];
    const auto* endpoint =
        findByText(agent.m_TVXHBA_SCSIProtocolEndpoint_map,
                   &TVXHBA_SCSIProtocolEndpoint::ElementName, "ARRAY 7200      ");
    views.push_back({text(device.CreationClassName), text(device.ElementName),
                     text(device.DeviceID), text(device.Description), text(device.SystemName),
                     text(device.SystemCreationClassName), numbers(device.OperationalStatus),
                     device.DeviceType.value,
                     ties(*systemDevices[i], agent.m_CIM_ComputerSystem_map[0], &device),
                     tiesThree(*paths[i], agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map[0],
                               endpoint, &device)});
  }
}

std::vector<Device_View> viewAll(ProviderAgent& agent) {
  std::vector<Device_View> views;
  viewMap(agent, agent.m_TVXHBA_StorageVolume_map, agent.m_TVXHBA_StorageVolumeSystemDevice_map,
          agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map, views);
  viewMap(agent, agent.m_TVXHBA_TapeDrive_map, agent.m_TVXHBA_TapeDriveSystemDevice_map,
          agent.m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map, views);
  viewMap(agent, agent.m_TVXHBA_StorageExtent_map, agent.m_TVXHBA_StorageExtentSystemDevice_map,
          agent.m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map, views);
  viewMap(agent, agent.m_TVXHBA_LogicalDisk_map, agent.m_TVXHBA_LogicalDiskSystemDevice_map,
          agent.m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map, views);
  viewMap(agent, agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map,
          agent.m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map,
          agent.m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map, views);
  return views;
}

TEST_F(San_Maps, DeviceTypeSelectsTheClass) {
  for (const Type_Row& row : TYPE_ROWS) {
    SCOPED_TRACE(row.type);
    log.clear();
    ProviderAgent& agent = buildUnits(
        R"({"first": 7, "model": "ARRAY 7200", "identifier": {"type": 3, "hex": "500254560000A001"},
            "serial": "AS72", "type": )" +
        std::to_string(row.type) + "}");
    const std::vector<Device_View> views = viewAll(agent);
    ASSERT_EQ(views.size(), 1u);
    const Device_View& view = views[0];
    EXPECT_EQ(view.creationClassName, row.className);
    EXPECT_EQ(view.elementName, row.elementName);
    EXPECT_EQ(view.deviceID, "10000254560C3001_500C0FF12A001001_500254560000A001_0007000000000000");
    EXPECT_EQ(view.description, "ACMESTOR ARRAY 7200       Revision 0410 Serial Number AS72000007");
    EXPECT_EQ(view.systemName, text(agent.m_CIM_ComputerSystem_map[0]->Name));
    EXPECT_EQ(view.systemCreationClassName, "CIM_ComputerSystem");
    EXPECT_EQ(view.operationalStatus, Numbers{0});
    EXPECT_EQ(view.deviceType, row.type);
    EXPECT_TRUE(view.inSystem);
    EXPECT_TRUE(view.onPath);
    EXPECT_EQ(log.level("Target 0 is of type " + std::to_string(row.type) + "."), TVX_DBG);
  }
}

// --- Each class ----------------------------------------------------------------------------------

constexpr const char* UNIT_OF_TYPE =
    R"({"first": 1, "block_size": 512, "blocks": 2049, "vendor": "ACMESTOR", "model": "M",
        "revision": "0410", "os_device": "/dev/unit", "identifier": {"type": 3,
        "hex": "500254560000A001"}, "type": )";

TEST_F(San_Maps, StorageVolume) {
  ProviderAgent& agent = buildUnits(UNIT_OF_TYPE + std::string("0}"));
  ASSERT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 1u);
  const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
  // The name leaves out what the identity keeps.
  EXPECT_EQ(text(volume.Name), "54560000A001");
  EXPECT_EQ(text(volume.DeviceID),
            "10000254560C3001_500C0FF12A001001_500254560000A001_0001000000000000");
  // The count is the last address, not one more.
  EXPECT_EQ(volume.NumberOfBlocks.value, 2048u);
  EXPECT_EQ(volume.BlockSize.value, 512u);
  EXPECT_EQ(volume.Capacity.value, 2048u * 512);
  EXPECT_EQ(text(volume.CapacityUnit), "Byte");
  EXPECT_EQ(texts(volume.OtherIdentifyingInfo),
            (Texts{"/dev/unit0", "ACMESTOR M                Revision 0410"}));
  EXPECT_EQ(texts(volume.IdentifyingDescriptions),
            (Texts{"OS Device Name", "Standard SCSI inquiry data"}));
}

TEST_F(San_Maps, TapeDrive) {
  ProviderAgent& agent = buildUnits(UNIT_OF_TYPE + std::string("1}"));
  ASSERT_EQ(agent.m_TVXHBA_TapeDrive_map.size(), 1u);
  const TVXHBA_TapeDrive& drive = *agent.m_TVXHBA_TapeDrive_map[0];
  EXPECT_EQ(text(drive.Name), "/dev/unit0");
  EXPECT_EQ(drive.Capacity.value, 2048u * 512);
  EXPECT_EQ(text(drive.CapacityUnit), "Byte");
  EXPECT_EQ(texts(drive.OtherIdentifyingInfo),
            (Texts{"/dev/unit0", "ACMESTOR M                0410"}));
  EXPECT_EQ(texts(drive.IdentifyingDescriptions),
            (Texts{"OS Device Name", "standard SCSI Inquery data"}));
}

TEST_F(San_Maps, StorageExtent) {
  ProviderAgent& agent = buildUnits(UNIT_OF_TYPE + std::string("5}"));
  ASSERT_EQ(agent.m_TVXHBA_StorageExtent_map.size(), 1u);
  const TVXHBA_StorageExtent& extent = *agent.m_TVXHBA_StorageExtent_map[0];
  EXPECT_EQ(text(extent.Name), "54560000A001");
  EXPECT_EQ(extent.NumberOfBlocks.value, 2048u);
  EXPECT_EQ(extent.BlockSize.value, 512u);
  EXPECT_EQ(extent.Capacity.value, 2048u * 512);
  EXPECT_EQ(text(extent.CapacityUnit), "Byte");
  EXPECT_TRUE(extent.NameFormat.is_null());
  EXPECT_TRUE(extent.NameNamespace.is_null());
  EXPECT_EQ(texts(extent.OtherIdentifyingInfo),
            (Texts{"/dev/unit0", "ACMESTOR M                Revision 0410"}));
  EXPECT_EQ(texts(extent.IdentifyingDescriptions),
            (Texts{"Standard SCSI inquiry data", "OS Device Name"}));
}

TEST_F(San_Maps, LogicalDisk) {
  ProviderAgent& agent = buildUnits(UNIT_OF_TYPE + std::string("17}"));
  ASSERT_EQ(agent.m_TVXHBA_LogicalDisk_map.size(), 1u);
  const TVXHBA_LogicalDisk& disk = *agent.m_TVXHBA_LogicalDisk_map[0];
  EXPECT_EQ(text(disk.Name), "54560000A001");
  EXPECT_EQ(disk.NumberOfBlocks.value, 2048u);
  EXPECT_EQ(disk.BlockSize.value, 512u);
  EXPECT_EQ(disk.Capacity.value, 2048u * 512);
  EXPECT_EQ(text(disk.CapacityUnit), "Byte");
  EXPECT_EQ(disk.DataOrganization.value, 1);
  EXPECT_EQ(disk.StatusInfo.value, 2);
  EXPECT_EQ(numbers(disk.AdditionalAvailability), Numbers{2});
  EXPECT_EQ(disk.NameFormat.value, 12);  // the class says so for all
  EXPECT_EQ(texts(disk.OtherIdentifyingInfo),
            (Texts{"/dev/unit0", "ACMESTOR M                Revision 0410"}));
  EXPECT_EQ(texts(disk.IdentifyingDescriptions),
            (Texts{"OS Device Name", "Standard SCSI inquiry data"}));
}

TEST_F(San_Maps, ArbitraryLogicalUnit) {
  ProviderAgent& agent = buildUnits(UNIT_OF_TYPE + std::string("13}"));
  ASSERT_EQ(agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map.size(), 1u);
  const TVXHBA_SCSIArbitraryLogicalUnit& unit = *agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map[0];
  EXPECT_EQ(text(unit.Name), "/dev/unit0");
  EXPECT_TRUE(unit.Capacity.is_null());
  EXPECT_TRUE(unit.CapacityUnit.is_null());
  EXPECT_EQ(text(unit.OtherDeviceType), "Peripheral devices type is 0x0D");
  EXPECT_EQ(texts(unit.OtherIdentifyingInfo),
            (Texts{"/dev/unit0", "ACMESTOR M                Revision 0410"}));
  EXPECT_EQ(texts(unit.IdentifyingDescriptions),
            (Texts{"OS Device Name", "Standard SCSI inquiry data"}));
}

template <class Path>
void expectNoValues(const Instance_Map<Path>& paths) {
  ASSERT_EQ(paths.size(), 1u) << Path::static_meta_class.name;
  const Path& path = *paths[0];
  EXPECT_TRUE(path.State.is_null());
  EXPECT_TRUE(path.OSDeviceName.is_null());
  EXPECT_TRUE(path.AdministrativeWeight.is_null());
  EXPECT_TRUE(path.AdministrativeOverride.is_null());
  EXPECT_TRUE(path.LogicalUnitNumber.is_null());
}

TEST_F(San_Maps, PathsCarryNoValuesOfTheirOwn) {
  ProviderAgent& agent = buildUnits(UNIT_OF_EACH_CLASS);
  expectNoValues(agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map);
  expectNoValues(agent.m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map);
  expectNoValues(agent.m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map);
  expectNoValues(agent.m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map);
  expectNoValues(agent.m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map);
}

TEST_F(San_Maps, OtherIdentifiersNameEveryClassThatIsNamedByThem) {
  for (const char* type : {"1", "2", "8"}) {
    ProviderAgent& agent = buildUnits(
        R"([{"first": 0, "type": 0, "identifier": {"hex": "5001020304050607", "type": )" +
        std::string(type) +
        R"(}}, {"first": 1, "type": 7, "identifier": {"hex": "5001020304050607", "type": )" + type +
        R"(}}, {"first": 2, "type": 17, "identifier": {"hex": "5001020304050607", "type": )" +
        type + "}}]");
    EXPECT_EQ(text(agent.m_TVXHBA_StorageVolume_map[0]->Name), "5001020304050607") << type;
    EXPECT_EQ(text(agent.m_TVXHBA_StorageExtent_map[0]->Name), "5001020304050607") << type;
    EXPECT_EQ(text(agent.m_TVXHBA_LogicalDisk_map[0]->Name), "5001020304050607") << type;
  }
}

TEST_F(San_Maps, ExtentsAndDisksWithoutBlocksHaveNoCapacityEither) {
  ProviderAgent& agent = buildUnits(R"([{"first": 0, "type": 5, "blocks": 0},
    {"first": 1, "type": 17, "blocks": 0}])");
  const TVXHBA_StorageExtent& extent = *agent.m_TVXHBA_StorageExtent_map[0];
  const TVXHBA_LogicalDisk& disk = *agent.m_TVXHBA_LogicalDisk_map[0];
  EXPECT_TRUE(extent.Capacity.is_null() && extent.CapacityUnit.is_null());
  EXPECT_TRUE(extent.BlockSize.is_null() && extent.NumberOfBlocks.is_null());
  EXPECT_TRUE(disk.Capacity.is_null() && disk.CapacityUnit.is_null());
  EXPECT_TRUE(disk.BlockSize.is_null() && disk.NumberOfBlocks.is_null());
}

TEST_F(San_Maps, DevicesAreAnnouncedWithTheirAssociations) {
  const struct {
    unsigned type;
    Texts lines;
  } rows[] = {
      {0,
       {"Storage Volume: ", "Generating TVXHBA_StorageVolumeSystemDevice (",
        "creating TVXHBA_SCSIInitiatorTargetStorageVolumePath - Storage Volume"}},
      {1,
       {"Tape Drive: ", "Generating TVXHBA_TapeDriveSystemDevice (",
        "creating TVXHBA_SCSIInitiatorTargetTapeDrivePath - Tape Drive"}},
      {2,
       {"Storage Extent: ", "Generating TVXHBA_StorageExtentSystemDevice (",
        "creating TVXHBA_SCSIInitiatorTargetStorageExtentPath - Storage Extent"}},
      {12,
       {"SCSI Arbitrary Logical Unit: ", "Generating TVXHBA_SCSIArbitraryLogicalUnitSystemDevice (",
        "creating TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath - SCSI Arbitrary Logical "
        "Unit"}},
      {17,
       {"Logical Disk: ", "Generating TVXHBA_LogicalDiskSystemDevice (",
        "creating TVXHBA_SCSIInitiatorTargetLogicalDiskPath - Logical Disk"}},
  };
  for (const auto& row : rows) {
    log.clear();
    buildUnits(UNIT_OF_TYPE + std::to_string(row.type) + "}");
    Texts lines = row.lines;
    lines[1] += "10000254560C3001_500C0FF12A001001_500254560000A001_0001000000000000)";
    EXPECT_EQ(log.only(lines), lines) << row.type;
    for (const std::string& line : lines) EXPECT_EQ(log.level(line), TVX_DBG) << line;
  }
}

// --- Volumes by identifier type ------------------------------------------------------------------

TEST_F(San_Maps, NameFormatOfVolumes) {
  const struct {
    unsigned type;
    std::uint16_t nameFormat;
    const char* otherNameFormat;
    std::uint16_t nameNamespace;
    const char* otherNameNamespace;
  } rows[] = {
      {0, 6, "(null)", 1, "Vendor specific"},
      {1, 5, "(null)", 4, "(null)"},
      {2, 10, "(null)", 3, "(null)"},
      {3, 9, "(null)", 2, "(null)"},
      {4, 1, "Relative target port identifier", 1, "Relative target port idientifier"},
      {5, 1, "Target port group", 1, "Target port group"},
      {6, 1, "Logical port group", 1, "Logical unit group"},
      {7, 1, "MD5 logical unit identifier", 1, "MD5 logical unit identifier"},
      {8, 1, "SCSI name std::string", 1, "SCSI name std::string"},
  };
  for (const auto& row : rows) {
    ProviderAgent& agent = buildUnits(R"({"identifier": {"hex": "3001020304050607", "type": )" +
                                      std::to_string(row.type) + "}}");
    const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
    EXPECT_EQ(volume.NameFormat.value, row.nameFormat) << row.type;
    EXPECT_EQ(text(volume.OtherNameFormat), row.otherNameFormat) << row.type;
    EXPECT_EQ(volume.NameNamespace.value, row.nameNamespace) << row.type;
    EXPECT_EQ(text(volume.OtherNameNamespace), row.otherNameNamespace) << row.type;
    EXPECT_EQ(text(volume.Name), "3001020304050607") << row.type;
  }
}

TEST_F(San_Maps, NameFormatOfOtherIdentifiersStaysUnset) {
  for (const char* type : {"9", "15"}) {
    ProviderAgent& agent =
        buildUnits(R"({"identifier": {"length": 8, "type": )" + std::string(type) + "}}");
    const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
    EXPECT_TRUE(volume.NameFormat.is_null());
    EXPECT_TRUE(volume.NameNamespace.is_null());
    EXPECT_TRUE(volume.OtherNameFormat.is_null());
    EXPECT_TRUE(volume.OtherNameNamespace.is_null());
  }
}

// --- Odd units -----------------------------------------------------------------------------------

TEST_F(San_Maps, TapeWithoutMediumHasNoCapacity) {
  ProviderAgent& agent = buildUnits(R"({"type": "tape", "os_device": "/dev/st", "blocks": 0})");
  const TVXHBA_TapeDrive& drive = *agent.m_TVXHBA_TapeDrive_map[0];
  EXPECT_TRUE(drive.Capacity.is_null());
  EXPECT_TRUE(drive.CapacityUnit.is_null());
  EXPECT_EQ(text(drive.Name), "/dev/st0");
  EXPECT_EQ(text(drive.ElementName), "Tape Drive 0");
  EXPECT_EQ(text(drive.Description).substr(0, 8), "ACMESTOR");
  EXPECT_EQ(text(drive.DeviceID).substr(0, 34), std::string(SAN_PORT) + "_" + SAN_TARGET + "_");
  EXPECT_EQ(drive.DeviceType.value, 1);
  EXPECT_EQ(texts(drive.OtherIdentifyingInfo)[0], "/dev/st0");
  EXPECT_EQ(numbers(drive.OperationalStatus), Numbers{0});
}

TEST_F(San_Maps, CapacityNeedsBothNumbers) {
  for (const char* luns : {R"({"blocks": 1, "block_size": 512})",  // one block: last address 0
                           R"({"blocks": 100, "block_size": 0})"}) {
    ProviderAgent& agent = buildUnits(luns);
    const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
    EXPECT_TRUE(volume.Capacity.is_null()) << luns;
    EXPECT_TRUE(volume.CapacityUnit.is_null()) << luns;
    EXPECT_TRUE(volume.BlockSize.is_null()) << luns;
    EXPECT_TRUE(volume.NumberOfBlocks.is_null()) << luns;
  }
}

TEST_F(San_Maps, LargestCapacityIsNotCut) {
  ProviderAgent& agent = buildUnits(R"({"blocks": "0x200000000", "block_size": 4096})");
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map[0]->Capacity.value, 0xFFFFFFFFull * 4096);
}

TEST_F(San_Maps, DeadUnitIsAVolumeWithoutIdentifier) {
  useScenario(unitsBehindOnePort(R"({"first": 2})"));
  addFault(R"({"call": ["HBA_SendScsiInquiry", "HBA_SendReadCapacity"], "status": 9})");
  ProviderAgent& agent = rebuild();
  ASSERT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 1u);
  const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
  EXPECT_EQ(text(volume.DeviceID), "10000254560C3001_500C0FF12A001001__0002000000000000");
  EXPECT_EQ(text(volume.Name), "");
  EXPECT_EQ(text(volume.Description), "Unknown Unknown Revision Unkn Serial Number Unknown");
  EXPECT_EQ(volume.DeviceType.value, 0);
  EXPECT_EQ(volume.NameFormat.value, 6);
  EXPECT_EQ(log.level("INVALID Descriptor"), TVX_ERR);
  EXPECT_EQ(log.level("PERF: updateSANMaps: cleanExit"), TVX_DBG);
}

TEST_F(San_Maps, UnitsWithOddIdentifiersDifferByTheirLun) {
  ProviderAgent& agent = buildUnits(R"({"count": 2, "identifier": {"type": 1, "length": 20}})");
  ASSERT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 2u);
  EXPECT_EQ(text(agent.m_TVXHBA_StorageVolume_map[0]->DeviceID),
            "10000254560C3001_500C0FF12A001001__0000000000000000");
  EXPECT_EQ(text(agent.m_TVXHBA_StorageVolume_map[1]->DeviceID),
            "10000254560C3001_500C0FF12A001001__0001000000000000");
  EXPECT_EQ(text(agent.m_TVXHBA_StorageVolume_map[0]->Name), "");
  EXPECT_EQ(log.count("INVALID Descriptor"), 2u);
}

TEST_F(San_Maps, NameOfAnOddIdentifierCanComeFromItsFormat) {
  ProviderAgent& agent = buildUnits(
      R"({"identifier": {"type": 3, "hex": "60000102030405060708090A0B0C0D0E0F101112"}})");
  const TVXHBA_StorageVolume& volume = *agent.m_TVXHBA_StorageVolume_map[0];
  EXPECT_EQ(text(volume.Name), "000102030405060708090A0B0C0D0E0F101112");
  EXPECT_EQ(text(volume.DeviceID), "10000254560C3001_500C0FF12A001001__0000000000000000");
}

// --- The walk ------------------------------------------------------------------------------------

TEST_F(San_Maps, HostWithoutTargetsHasEmptyMaps) {
  ProviderAgent& agent = build(singlePortCards(1));
  EXPECT_EQ(sizesOf(agent), std::vector<std::size_t>(17, 0));
  EXPECT_EQ(log.level("No entries in the set"), TVX_WARN);
  EXPECT_EQ(log.level("PERF: updateSANMaps: cleanExit"), TVX_DBG);
  EXPECT_EQ(rebuildSAN(agent), 0);
  EXPECT_EQ(log.count("No entries in the set"), 2u);
}

TEST_F(San_Maps, WalkTellsItsProgress) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  log.clear();
  EXPECT_EQ(rebuildSAN(agent), 0);
  const Texts lines = {"PERF: updateSANMaps: Entry",
                       "PERF: Entered clearSANMaps()",
                       "Exiting clearSANMaps()",
                       "Creating classes for port 0.",
                       "Creating classes for target 0 of 2.",
                       "Target 0 is of type 0.",
                       "Creating classes for target 1 of 2.",
                       "Target 1 is of type 0.",
                       "Set content: 10000254560C3001|500C0FF12A001001",
                       "PERF: updateSANMaps: cleanExit"};
  EXPECT_EQ(log.only(lines), lines);
  for (const std::string& line : lines) EXPECT_EQ(log.level(line), TVX_DBG) << line;
}

TEST_F(San_Maps, UnitIsBuiltFromTheEndpointToThePath) {
  ProviderAgent& agent = buildUnits(R"({"first": 3, "identifier": {"length": 20}})");
  EXPECT_TRUE(agent.m_TVXHBA_StorageVolume_map[0]->Caption.is_null());
  log.clear();
  EXPECT_EQ(rebuildSAN(agent), 0);
  const Texts lines = {"Creating classes for target 0 of 1.",
                       "Generating TVXHBA_LocalHostedAccessPoint (Local Hosted Access Point " +
                           endpointName(3) + ")",
                       "Target 0 is of type 0.",
                       "Storage Volume: ",  // the class has no caption
                       "Generating TVXHBA_StorageVolumeSystemDevice (" + std::string(SAN_PORT) +
                           "_" + SAN_TARGET + "__" + smallLun(3) + ")",
                       "creating TVXHBA_SCSIInitiatorTargetStorageVolumePath - Storage Volume",
                       "Set content: 10000254560C3001|500C0FF12A001001"};
  EXPECT_EQ(log.only(lines), lines);
}

TEST_F(San_Maps, RebuildReplacesTheOldInstances) {
  ProviderAgent& agent = buildUnits(R"([{"count": 2}, {"first": 2, "type": 17}])");
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 3u);
  useScenario(unitsBehindOnePort(R"({"first": 5})"));
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 1u);
  EXPECT_EQ(agent.m_TVXHBA_LogicalDisk_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_LogicalDiskSystemDevice_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map.size(), 0u);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 1u);
}

TEST_F(San_Maps, AssociationsOutliveTheirEnds) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  Ref<Instance> volume(clone(agent.m_TVXHBA_StorageVolume_map.at(0)));
  agent.m_TVXHBA_StorageVolume_map.clear();
  agent.m_TVXHBA_SCSIProtocolEndpoint_map.clear();
  EXPECT_TRUE(ties(*agent.m_TVXHBA_StorageVolumeSystemDevice_map[0],
                   agent.m_CIM_ComputerSystem_map[0], volume.get()));
}

/// The records are of no C++ hierarchy: pointers are compared as those of their common base.
const Instance* base(const Instance* instance) {
  return instance;
}

TEST_F(San_Maps, UnitsShareWhatNobodyCanTellApart) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  const auto& hosted = agent.m_TVXHBA_LocalHostedAccessPoint_map;
  const auto& paths = agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map;
  const auto& systemDevices = agent.m_TVXHBA_StorageVolumeSystemDevice_map;
  EXPECT_EQ(base(hosted[0]->Antecedent), base(hosted[1]->Antecedent));
  EXPECT_EQ(base(systemDevices[1]->GroupComponent), base(hosted[0]->Antecedent));
  EXPECT_EQ(base(paths[0]->Initiator), base(paths[1]->Initiator));
  EXPECT_EQ(base(paths[1]->Target), base(hosted[1]->Dependent));
  EXPECT_EQ(base(paths[1]->LogicalUnit), base(systemDevices[1]->PartComponent));
  EXPECT_NE(base(paths[0]->LogicalUnit), base(paths[1]->LogicalUnit));
  // The ends are no entries of their own maps, which may go first.
  EXPECT_NE(base(hosted[0]->Antecedent), base(agent.m_CIM_ComputerSystem_map[0]));
  EXPECT_NE(base(paths[0]->Target), base(agent.m_TVXHBA_SCSIProtocolEndpoint_map[0]));
  const auto& volumes = agent.m_TVXHBA_StorageVolume_map;
  EXPECT_EQ(volumes[0]->CreationClassName.value.rep(), volumes[1]->CreationClassName.value.rep());
  EXPECT_EQ(volumes[0]->__name_space.rep(), paths[1]->__name_space.rep());
}

TEST_F(San_Maps, ReadersOfAssociationsHaveTheirEndsForThemselves) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  Delivered paths;
  agent.enumSANInstances(agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map, paths.handler());
  ASSERT_EQ(paths.size(), 2u);
  using Path = TVXHBA_SCSIInitiatorTargetStorageVolumePath;
  const Path* const own = agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map[0];
  EXPECT_NE(paths.at<Path>(0)->Initiator, paths.at<Path>(1)->Initiator);
  EXPECT_NE(paths.at<Path>(0)->Initiator, own->Initiator);
  EXPECT_TRUE(identical(paths.at<Path>(0), own));
}

TEST_F(San_Maps, MapsOfManyUnitsAreEmptiedWhole) {
  ProviderAgent& agent = buildUnits(
      R"([{"count": 700}, {"first": 700, "type": "tape"}, {"first": 701, "type": 2, "count": 300},
          {"first": 1001, "type": 12}, {"first": 1002, "type": 17}])");
  EXPECT_EQ(sizesOf(agent), (std::vector<std::size_t>{1003, 1003, 700, 700, 700, 1, 1, 1, 300, 300,
                                                      300, 1, 1, 1, 1, 1, 1}));
  log.clear();
  agent.clearSANMaps();
  EXPECT_EQ(log.count("Exiting clearSANMaps()"), 1u);
  EXPECT_EQ(sizesOf(agent), std::vector<std::size_t>(17, 0));
  EXPECT_EQ(agent.updateSANMaps(), 0);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 1003u);
}

TEST_F(San_Maps, OneRemotePortBehindTwoPortsIsTwo) {
  build(R"({"cards": [{"serial_number": "A", "ports": [
    {"wwpn": "1000000000000001", "targets": [{"wwpn": "5000000000000001", "luns": {"count": 2}}]},
    {"wwpn": "1000000000000002", "targets": [{"wwpn": "5000000000000001", "luns": {"count": 2}},
                                             {"wwpn": "5000000000000000", "luns": {"count": 1}}]}
    ]}]})");
  const Texts entries = {"Set content: 1000000000000001|5000000000000001",
                         "Set content: 1000000000000002|5000000000000000",
                         "Set content: 1000000000000002|5000000000000001"};
  EXPECT_EQ(log.only(entries), entries);
}

}  // namespace
}  // namespace cimrt::test
