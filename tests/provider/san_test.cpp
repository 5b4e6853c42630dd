// Targets and logical units, as a client finds them.
#include <algorithm>
#include <map>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using Texts = std::vector<std::string>;

constexpr const char* PORT = "10000254560C3001";
constexpr const char* SCAN_ON_DEMAND = "TVX_PROVIDER_REFRESH_SANDATA = FALSE\n";

/// One port, one remote port, a unit of each class of devices.
constexpr const char* UNIT_OF_EACH_CLASS = R"({"cards": [{"model": "TVX1", "serial_number": "SN1",
  "ports": [{"wwpn": "10:00:02:54:56:0C:30:01", "targets": [{"wwpn": "50:0C:0F:F1:2A:00:10:01",
    "luns": [{"first": 0, "type": "disk"}, {"first": 1, "type": "tape"},
             {"first": 2, "type": "printer"}, {"first": 3, "type": "array"},
             {"first": 4, "type": "object"}]}]}]}]})";

/// The classes that need a scan, and how many instances that host has of each.
const std::map<std::string, std::size_t> SAN_CLASSES = {
    {"TVXHBA_SCSIProtocolEndpoint", 5},
    {"TVXHBA_LocalHostedAccessPoint", 5},
    {"TVXHBA_StorageVolume", 1},
    {"TVXHBA_TapeDrive", 1},
    {"TVXHBA_StorageExtent", 1},
    {"TVXHBA_SCSIArbitraryLogicalUnit", 1},
    {"TVXHBA_LogicalDisk", 1},
    {"TVXHBA_StorageVolumeSystemDevice", 1},
    {"TVXHBA_TapeDriveSystemDevice", 1},
    {"TVXHBA_StorageExtentSystemDevice", 1},
    {"TVXHBA_SCSIArbitraryLogicalUnitSystemDevice", 1},
    {"TVXHBA_LogicalDiskSystemDevice", 1},
    {"TVXHBA_SCSIInitiatorTargetStorageVolumePath", 1},
    {"TVXHBA_SCSIInitiatorTargetTapeDrivePath", 1},
    {"TVXHBA_SCSIInitiatorTargetStorageExtentPath", 1},
    {"TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath", 1},
    {"TVXHBA_SCSIInitiatorTargetLogicalDiskPath", 1},
};

std::string volumes(int count) {
  return R"({"cards": [{"model": "TVX1", "serial_number": "SN1", "ports": [
    {"wwpn": "10:00:02:54:56:0C:30:01", "targets": [{"wwpn": "50:0C:0F:F1:2A:00:10:01",
     "luns": {"count": )" +
         std::to_string(count) + "}}]}]}]}";
}

class San : public Provider_Test {
 protected:
  host::Broker& loadHost(const std::string& scenario) {
    useScenario(scenario);
    tvxsim_forget_calls();
    return load();
  }
  host::ObjectPath only(const std::string& className) {
    const std::vector<host::Instance> found = instances(className);
    EXPECT_EQ(found.size(), 1u) << className;
    return found.empty() ? host::ObjectPath{} : found[0].path;
  }
  /// "Class" of each path, sorted.
  static Texts classNames(const host::Reply& reply) {
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    Texts names;
    for (const host::ObjectPath& path : reply.paths) names.push_back(path.className);
    std::sort(names.begin(), names.end());
    return names;
  }
};

TEST_F(San, EachClassHasTheInstancesOfItsUnits) {
  loadHost(UNIT_OF_EACH_CLASS);
  for (const auto& [name, count] : SAN_CLASSES) EXPECT_EQ(instances(name).size(), count) << name;
}

TEST_F(San, UnitIsFoundByItsPath) {
  loadHost(UNIT_OF_EACH_CLASS);
  for (const char* name : {"TVXHBA_StorageVolume", "TVXHBA_SCSIProtocolEndpoint",
                           "TVXHBA_SCSIInitiatorTargetStorageVolumePath"}) {
    const host::Instance first = instances(name).at(0);
    const host::Reply reply = broker->getInstance(first.path);
    ASSERT_EQ(reply.status.rc, CMPI_RC_OK) << name;
    EXPECT_EQ(reply.instances.at(0).properties, first.properties) << name;
  }
  host::ObjectPath missing = only("TVXHBA_StorageVolume");
  missing.keys.set("DeviceID", host::Value::string("another"));
  EXPECT_EQ(broker->getInstance(missing).status.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(San, PropertyListsAreKept) {
  loadHost(UNIT_OF_EACH_CLASS);
  const host::Instance volume = instances("TVXHBA_StorageVolume", {{"ElementName"}}).at(0);
  EXPECT_EQ(volume.text("ElementName"), "Storage Volume: 0");
  EXPECT_EQ(volume.properties.find("Description"), nullptr);
}

TEST_F(San, PathHasThreeEnds) {
  loadHost(UNIT_OF_EACH_CLASS);
  const std::string name = "TVXHBA_SCSIInitiatorTargetTapeDrivePath";
  const host::ObjectPath initiator = only("TVXHBA_SCSIProtocolInitiatorEndpoint");
  const host::ObjectPath drive = only("TVXHBA_TapeDrive");
  const host::Instance path = instances(name).at(0);
  const host::ObjectPath target = path.property("Target").asReference();
  const Texts ends[] = {{"TVXHBA_SCSIProtocolEndpoint", "TVXHBA_TapeDrive"},
                        {"TVXHBA_SCSIProtocolEndpoint", "TVXHBA_SCSIProtocolInitiatorEndpoint"},
                        {"TVXHBA_SCSIProtocolInitiatorEndpoint", "TVXHBA_TapeDrive"}};
  EXPECT_EQ(classNames(broker->associatorNames(initiator, name)), ends[0]);
  EXPECT_EQ(classNames(broker->associatorNames(drive, name)), ends[1]);
  EXPECT_EQ(classNames(broker->associatorNames(target, name)), ends[2]);
  for (const host::ObjectPath& end : {initiator, drive, target})
    EXPECT_EQ(broker->references(end, name).instances.size(), 1u);
}

TEST_F(San, RolesAndResultClassesPickAnEnd) {
  loadHost(UNIT_OF_EACH_CLASS);
  const std::string name = "TVXHBA_SCSIInitiatorTargetStorageVolumePath";
  const host::ObjectPath initiator = only("TVXHBA_SCSIProtocolInitiatorEndpoint");
  const Texts volume = {"TVXHBA_StorageVolume"};
  EXPECT_EQ(classNames(broker->associatorNames(initiator, name, "CIM_LogicalDevice")), volume);
  EXPECT_EQ(classNames(broker->associatorNames(initiator, name, "", "Initiator", "LogicalUnit")),
            volume);
  EXPECT_EQ(classNames(broker->associatorNames(initiator, name, "", "Target")), Texts{});
  EXPECT_EQ(classNames(broker->associatorNames(initiator, name, "TVXHBA_TapeDrive")), Texts{});
}

TEST_F(San, UnitsOfAnInitiatorComeWithTheirValues) {
  loadHost(UNIT_OF_EACH_CLASS);
  const host::Reply reply =
      broker->associators(only("TVXHBA_SCSIProtocolInitiatorEndpoint"),
                          "TVXHBA_SCSIInitiatorTargetLogicalDiskPath", "TVXHBA_LogicalDisk");
  ASSERT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_EQ(reply.instances.size(), 1u);
  EXPECT_EQ(reply.instances[0].text("ElementName"), "Object-based storage device: 4");
}

TEST_F(San, SystemHasTheEndpointsAndTheDevices) {
  loadHost(UNIT_OF_EACH_CLASS);
  const host::ObjectPath system =
      instances("TVXHBA_StorageVolumeSystemDevice").at(0).property("GroupComponent").asReference();
  EXPECT_EQ(system.className, "CIM_ComputerSystem");
  EXPECT_EQ(broker->associatorNames(system, "TVXHBA_LocalHostedAccessPoint").paths.size(), 5u);
  for (const char* kind :
       {"StorageVolume", "TapeDrive", "StorageExtent", "LogicalDisk", "SCSIArbitraryLogicalUnit"}) {
    const std::string name = std::string("TVXHBA_") + kind;
    EXPECT_EQ(classNames(broker->associatorNames(system, name + "SystemDevice")), Texts{name});
  }
}

TEST_F(San, OtherClassesStartNoScanWhereItIsOnDemand) {
  writeFile("etc/torvex_fc_provider.conf", SCAN_ON_DEMAND);
  loadHost(UNIT_OF_EACH_CLASS);
  std::size_t asked = 0;
  for (const std::string& name : servedClasses()) {
    if (SAN_CLASSES.contains(name)) continue;
    instances(name);
    asked++;
  }
  EXPECT_EQ(asked, 152u - 17u);
  EXPECT_EQ(tvxsim_calls("HBA_GetFcpTargetMapping", nullptr), 0u);
  EXPECT_EQ(tvxsim_calls("HBA_SendScsiInquiry", nullptr), 0u);
}

TEST_F(San, EachOfItsClassesStartsTheScanThatItNeeds) {
  writeFile("etc/torvex_fc_provider.conf", SCAN_ON_DEMAND);
  for (const auto& [name, count] : SAN_CLASSES) {
    loadHost(UNIT_OF_EACH_CLASS);
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 1u);
    EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), 0u);
    EXPECT_EQ(instances(name).size(), count) << name;
    // One scan: the disk tells its capacity, the others have none and are asked three times.
    EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), 1u + 4u * 3u) << name;
    unload();
  }
}

TEST_F(San, FirstReaderScansAndTheNextOnesAreServedFromMemory) {
  writeFile("etc/torvex_fc_provider.conf", SCAN_ON_DEMAND);
  loadHost(volumes(4));
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 1u);
  EXPECT_EQ(instances("TVXHBA_StorageVolume").size(), 4u);
  EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), 4u);
  EXPECT_EQ(instances("TVXHBA_StorageVolume").size(), 4u);
  EXPECT_EQ(instances("TVXHBA_SCSIProtocolEndpoint").size(), 4u);
  EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), 4u);
  EXPECT_EQ(tvxsim_open_handles(), 0u);
}

TEST_F(San, MappingThatGrowsWhileItIsReadIsReadWhole) {
  useScenario(volumes(300));
  addFault(R"({"call": "HBA_GetFcpTargetMapping", "status": 8, "nth": 2})");
  load();
  EXPECT_EQ(instances("TVXHBA_StorageVolume").size(), 300u);
}

TEST_F(San, MappingThatStaysStaleOrGrowsOnLeavesTheClassesEmpty) {
  for (const char* fault :
       {R"({"call": "HBA_GetFcpTargetMapping", "status": 8})",
        R"({"call": "HBA_GetFcpTargetMapping", "status": 7, "returned_size": 600})"}) {
    useScenario(volumes(3));
    addFault(fault);
    load();
    EXPECT_TRUE(instances("TVXHBA_StorageVolume").empty()) << fault;
    EXPECT_TRUE(instances("TVXHBA_SCSIProtocolEndpoint").empty()) << fault;
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 1u) << fault;
    unload();
  }
}

TEST_F(San, UnitThatAnswersNothingStaysVisible) {
  useScenario(volumes(2));
  addFault(R"({"call": ["HBA_SendScsiInquiry", "HBA_SendReadCapacity"], "lun": 1, "status": 9})");
  load();
  const std::vector<host::Instance> found = instances("TVXHBA_StorageVolume");
  ASSERT_EQ(found.size(), 2u);
  EXPECT_EQ(found[1].text("Description"), "Unknown Unknown Revision Unkn Serial Number Unknown");
  EXPECT_EQ(found[1].text("DeviceID"), std::string(PORT) + "_500C0FF12A001001__0001000000000000");
}

TEST_F(San, OverlongPagesAreCut) {
  std::string page =
      "00830100"
      "010300FF";
  for (int i = 0; i < 255; i++) page += "5A";
  std::string serial = "00800100";
  for (int i = 0; i < 256; i++) serial += "41";
  loadHost(R"({"cards": [{"serial_number": "SN1", "ports": [{"wwpn": "10:00:02:54:56:0C:30:01",
    "targets": [{"wwpn": "50:0C:0F:F1:2A:00:10:01", "luns": {"pages": {"0x83": ")" +
           page + R"(", "0x80": ")" + serial + R"("}}}]}]}]})");
  const host::Instance volume = instances("TVXHBA_StorageVolume").at(0);
  // Bytes 2 to 254 of the identifier; those behind the response are zero.
  std::string name;
  for (int i = 2; i < 255; i++) name += i < 247 ? "5A" : "00";
  EXPECT_EQ(volume.text("Name"), name);
  EXPECT_EQ(volume.text("Description"),
            "ACMESTOR ARRAY 7200       Revision 0410 Serial Number " + std::string(40, 'A'));
}

}  // namespace
}  // namespace tvx::test
