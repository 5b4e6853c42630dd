// From one instance to the next, as a client goes: by associations, roles and result classes.
#include <algorithm>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

constexpr const char* SCENARIO = R"({"cards": [{"model": "TVX1", "serial_number": "SN1", "ports": [
    {"wwpn": "10:00:00:00:00:00:00:01", "fru": [],
     "vports": [{"wwpn": "20:AB:00:00:00:00:00:01", "name": "guest"}]}]}]})";

class Walks : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    useScenario(SCENARIO);
    load();
  }

  host::ObjectPath only(const std::string& className) {
    const std::vector<host::Instance> found = instances(className);
    EXPECT_EQ(found.size(), 1u) << className;
    return found.empty() ? host::ObjectPath{} : found[0].path;
  }

  /// The computer system, as every service names it.
  host::ObjectPath system() {
    const host::ObjectPath service = only("TVXHBA_BootBIOSService");
    host::ObjectPath path;
    path.nameSpace = "root/torvex";
    path.className = "CIM_ComputerSystem";
    path.keys.set("CreationClassName", service.key("SystemCreationClassName"));
    path.keys.set("Name", service.key("SystemName"));
    return path;
  }

  /// A key of what lies behind `association`, seen from `source`, sorted.
  std::vector<std::string> behind(const host::ObjectPath& source, const std::string& association,
                                  const std::string& key, const std::string& resultClass = "",
                                  const std::string& role = "",
                                  const std::string& resultRole = "") {
    const host::Reply reply =
        broker->associatorNames(source, association, resultClass, role, resultRole);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << association << ": " << reply.status.message;
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    std::vector<std::string> keys;
    for (const host::ObjectPath& path : reply.paths) keys.push_back(path.key(key).asText());
    std::sort(keys.begin(), keys.end());
    return keys;
  }
};

using Texts = std::vector<std::string>;

TEST_F(Walks, FromTheSystemToItsServicesAndBack) {
  const host::ObjectPath host = system();
  const std::pair<const char*, const char*> services[] = {
      {"TVXHBA_HostedInstallationService", "TVXHBA_SoftwareInstallationService"},
      {"TVXHBA_HostedFCHBAWWNService", "TVXHBA_FCHBAWWNService"},
      {"TVXHBA_HostedFCTagService", "TVXHBA_FCTagService"},
      {"TVXHBA_HostedBootBIOSService", "TVXHBA_BootBIOSService"},
      {"TVXHBA_HostedFCHBADriverParamService", "TVXHBA_FCHBADriverParamService"},
  };
  for (const auto& [association, service] : services) {
    EXPECT_EQ(behind(host, association, "CreationClassName"), Texts{service});
    EXPECT_EQ(behind(only(service), association, "Name"), Texts{host.key("Name").asText()});
  }
}

TEST_F(Walks, FromTheSystemThroughTheHardwareToThePortAndBack) {
  const struct {
    const char* association;
    const char* role;  // of the end that the way comes from
    const char* resultRole;
    const char* next;
  } steps[] = {
      {"TVXHBA_PortControllerSystemDevice", "GroupComponent", "PartComponent",
       "TVXHBA_PortController"},
      {"TVXHBA_PHYConnectorRealizesPortController", "Dependent", "Antecedent",
       "TVXHBA_PhysicalConnector"},
      {"TVXHBA_CardContainsConnector", "PartComponent", "GroupComponent", "TVXHBA_Card"},
      {"TVXHBA_CardContainsChip", "GroupComponent", "PartComponent", "TVXHBA_Chip"},
      {"TVXHBA_ConnectorDependsOnChip", "Dependent", "Antecedent", "TVXHBA_PhysicalConnector"},
      {"TVXHBA_PHYConnectorRealizesPortController", "Antecedent", "Dependent",
       "TVXHBA_PortController"},
      {"TVXHBA_ControlledBy", "Antecedent", "Dependent", "TVXHBA_FCPort"},
      {"TVXHBA_DeviceSAPImplementation", "Antecedent", "Dependent",
       "TVXHBA_SCSIProtocolInitiatorEndpoint"},
      {"TVXHBA_LocalHostedInitiatorAccessPoint", "Dependent", "Antecedent", "CIM_ComputerSystem"},
  };
  host::ObjectPath here = system();
  for (const auto& step : steps) {
    const auto next =
        broker->associatorNames(here, step.association, step.next, step.role, step.resultRole);
    ASSERT_EQ(next.status.rc, CMPI_RC_OK) << step.association << ": " << next.status.message;
    ASSERT_EQ(next.paths.size(), 1u) << step.association;
    EXPECT_EQ(next.paths[0].className, step.next);
    // The system is another provider's, so there is only its name.
    const bool isOwn = std::string(step.next).starts_with("TVXHBA_");
    EXPECT_EQ(broker->associators(here, step.association, step.next, step.role, step.resultRole)
                  .instances.size(),
              isOwn ? 1u : 0u)
        << step.association;
    EXPECT_EQ(broker->references(here, step.association, step.role).instances.size(), 1u)
        << step.association;
    EXPECT_EQ(broker->references(here, step.association, step.resultRole).instances.size(), 0u)
        << step.association;
    const auto back = broker->associatorNames(next.paths[0], step.association, here.className,
                                              step.resultRole, step.role);
    ASSERT_EQ(back.paths.size(), 1u) << step.association;
    EXPECT_EQ(back.paths[0].className, here.className);
    here = next.paths[0];
  }
  EXPECT_EQ(here.key("Name").asText(), system().key("Name").asText());
  EXPECT_EQ(behind(only("TVXHBA_Card"), "TVXHBA_ChassisContainsCard", "CreationClassName",
                   "CIM_Chassis", "PartComponent", "GroupComponent"),
            Texts{"CIM_Chassis"});
  EXPECT_EQ(behind(only("TVXHBA_FCPort"), "TVXHBA_ElementStatisticalData", "InstanceID",
                   "TVXHBA_FCPortStatistics", "ManagedElement", "Stats"),
            Texts{"TVX FC HBA:HBA Statistics:1000000000000001"});
  EXPECT_EQ(behind(only("TVXHBA_FCPortStatistics"), "TVXHBA_ElementStatisticalData", "DeviceID",
                   "TVXHBA_FCPort", "Stats", "ManagedElement"),
            Texts{"1000000000000001"});
}

TEST_F(Walks, RolesDecideWhichEndIsTheSource) {
  const host::ObjectPath host = system();
  const char* hosted = "TVXHBA_HostedBootBIOSService";
  EXPECT_EQ(behind(host, hosted, "Name", "", "Antecedent", "Dependent").size(), 1u);
  EXPECT_EQ(behind(host, hosted, "Name", "", "Dependent").size(), 0u);
  EXPECT_EQ(behind(host, hosted, "Name", "", "", "Antecedent").size(), 0u);
  EXPECT_EQ(behind(host, hosted, "Name", "TVXHBA_BootBIOSService").size(), 1u);
  EXPECT_EQ(behind(host, hosted, "Name", "TVXHBA_FCTagService").size(), 0u);
}

TEST_F(Walks, FromThePortToItsSoftwareAndBack) {
  const host::ObjectPath port = only("TVXHBA_FCPort");
  EXPECT_EQ(behind(port, "TVXHBA_ElementSoftwareIdentity", "InstanceID").size(), 4u);
  EXPECT_EQ(behind(port, "TVXHBA_ElementFlashImageSoftwareIdentity", "InstanceID").size(), 3u);
  const host::Reply reply =
      broker->associators(port, "TVXHBA_ElementSoftwareIdentity", "TVXHBA_SoftwareIdentity");
  ASSERT_EQ(reply.instances.size(), 4u);
  for (const host::Instance& identity : reply.instances)
    EXPECT_EQ(behind(identity.path, "TVXHBA_ElementSoftwareIdentity", "DeviceID"),
              Texts{"1000000000000001"});
}

TEST_F(Walks, FromThePortToItsServices) {
  const host::ObjectPath port = only("TVXHBA_FCPort");
  for (const char* association :
       {"TVXHBA_BootBIOSServiceAffectsFCPort", "TVXHBA_FCHBAWWNServiceAffectsFCPort",
        "TVXHBA_FCHBADriverParamServiceAffectsFCPort", "TVXHBA_FCTagServiceAffectsPort"})
    EXPECT_EQ(behind(port, association, "Name", "", "AffectedElement", "AffectingElement").size(),
              1u)
        << association;
}

TEST_F(Walks, FromTheChipToItsFirmwareToTheServiceThatInstallsIt) {
  const Texts firmware =
      behind(only("TVXHBA_Chip"), "TVXHBA_FirmwareElementSoftwareIdentity", "InstanceID");
  ASSERT_EQ(firmware.size(), 1u);
  host::ObjectPath identity;
  for (const host::Instance& candidate : instances("TVXHBA_SoftwareIdentity"))
    if (candidate.text("InstanceID") == firmware[0]) identity = candidate.path;
  EXPECT_EQ(behind(identity, "TVXHBA_InstallServiceAffectsFirmwareIdentity", "Name"),
            Texts{"TVXHBA_FCSoftwareInstallationService"});
  EXPECT_EQ(behind(identity, "TVXHBA_InstalledSoftwareIdentity", "CreationClassName"),
            Texts{"CIM_ComputerSystem"});
}

TEST_F(Walks, FromAProfileToWhatConformsToIt) {
  host::ObjectPath asset;
  host::ObjectPath inventory;
  for (const host::Instance& profile : instances("TVXHBA_RegisteredProfile")) {
    if (profile.text("RegisteredName") == "Physical Asset") asset = profile.path;
    if (profile.text("RegisteredName") == "Software Inventory") inventory = profile.path;
  }
  EXPECT_EQ(asset.nameSpace, "root/pg_interop");
  EXPECT_EQ(behind(asset, "TVXHBA_CardConformsToProfile", "Tag"), Texts{"SN1"});
  EXPECT_EQ(behind(asset, "TVXHBA_ComputerSystemConformsToProfile", "CreationClassName"),
            Texts{"CIM_ComputerSystem"});
  // Driver, diagnostics and the four of the port.
  EXPECT_EQ(behind(inventory, "TVXHBA_SoftwareConformsToProfile", "InstanceID").size(), 6u);
  EXPECT_EQ(behind(inventory, "TVXHBA_ReferencedProfile", "InstanceID", "", "Dependent"),
            Texts{"TVX:Profile Registration"});
}

TEST_F(Walks, FromThePhysicalPortToItsVirtualOnes) {
  const host::ObjectPath port = only("TVXHBA_FCPort");
  EXPECT_EQ(behind(port, "TVXHBA_VPortHostedDependency", "DeviceID"), Texts{"20AB000000000001"});
  const host::ObjectPath guest = only("TVXHBA_VirtualFCPort");
  EXPECT_EQ(behind(guest, "TVXHBA_ElementAllocatedFromPool", "InstanceID"),
            Texts{"TVX:Resource Pool:1000000000000001"});
  EXPECT_EQ(behind(only("TVXHBA_ResourcePool"), "TVXHBA_HostedResourcePool", "CreationClassName"),
            Texts{"CIM_ComputerSystem"});
}

TEST_F(Walks, FromTheProductDataToTheirDevices) {
  EXPECT_EQ(behind(only("TVXHBA_VitalProductData"), "TVXHBA_ElementVPD", "CreationClassName"),
            Texts{"TVXHBA_PCIDevice"});
  EXPECT_EQ(behind(only("TVXHBA_FRUVitalProductData"), "TVXHBA_FRUElementVPD", "Tag"),
            Texts{"SN1"});
  EXPECT_EQ(behind(only("TVXHBA_Transceiver"), "TVXHBA_TransceiverComponent", "DeviceID"),
            Texts{"1000000000000001"});
}

TEST_F(Walks, ReferencesAreTheAssociationsThemselves) {
  const host::ObjectPath port = only("TVXHBA_FCPort");
  const host::Reply reply = broker->references(port, "TVXHBA_ElementSoftwareIdentity");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_EQ(reply.instances.size(), 4u);
  for (const host::Instance& association : reply.instances) {
    EXPECT_EQ(association.text("UpgradeCondition"), "3");
    EXPECT_TRUE(association.property("Dependent").asReference().sameObject(port));
  }
}

// ---- Profiles of another provider

constexpr const char* SERVER_PROFILES = R"({"version": 1, "namespaces": ["root/pg_interop"],
    "instances": [
      {"class": "PG_RegisteredProfile", "namespace": "root/pg_interop", "keys": ["InstanceID"],
       "properties": {"InstanceID": "PG:Indications", "RegisteredName": "Indications"}},
      {"class": "PG_RegisteredProfile", "namespace": "root/pg_interop", "keys": ["InstanceID"],
       "properties": {"InstanceID": "PG:Base", "RegisteredName": "Base Server"}}]})";

TEST_F(Walks, FromTheServersOwnProfileToThoseOfTheLibraryAndBack) {
  broker->addForeign(SERVER_PROFILES);
  const char* referenced = "TVXHBA_BaseServerReferencedProfile";
  const host::ObjectPath base = {"",
                                 "root/pg_interop",
                                 "PG_RegisteredProfile",
                                 {{"InstanceID", host::Value::string("PG:Base")}}};
  host::ObjectPath other = base;
  other.keys.set("InstanceID", host::Value::string("PG:Indications"));
  EXPECT_EQ(behind(base, referenced, "InstanceID", "TVXHBA_RegisteredProfile", "Antecedent").size(),
            12u);
  EXPECT_TRUE(behind(other, referenced, "InstanceID").empty());

  const host::Reply profiles = broker->associators(base, referenced);
  EXPECT_EQ(profiles.status.rc, CMPI_RC_OK);
  EXPECT_FALSE(profiles.report.leaks()) << profiles.report.text();
  ASSERT_EQ(profiles.instances.size(), 12u);
  for (const host::Instance& each : profiles.instances) {
    EXPECT_EQ(each.path.nameSpace, "root/pg_interop");
    EXPECT_EQ(behind(each.path, referenced, "InstanceID"), Texts{"PG:Base"});
    // The server's own profile is fetched from the server.
    const host::Reply back = broker->associators(each.path, referenced);
    ASSERT_EQ(back.instances.size(), 1u);
    EXPECT_EQ(back.instances[0].text("RegisteredName"), "Base Server");
  }
  EXPECT_EQ(broker->references(base, referenced, "Antecedent").instances.size(), 12u);
  EXPECT_EQ(broker->referenceNames(base, referenced, "Dependent").paths.size(), 0u);
}

TEST_F(Walks, WithoutAProfileOfTheServerThereIsNothingToReferTo) {
  EXPECT_TRUE(instances("TVXHBA_BaseServerReferencedProfile").empty());
  broker->addForeign(R"({"version": 1, "namespaces": ["root/pg_interop"], "failures": [
      {"class": "PG_RegisteredProfile", "operation": "enumerateInstances", "rc": 1}]})");
  EXPECT_TRUE(instances("TVXHBA_BaseServerReferencedProfile").empty());
}

}  // namespace
}  // namespace tvx::test
