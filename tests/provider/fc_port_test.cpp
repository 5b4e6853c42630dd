// The ports of a host as a client sees them.
#include <string>
#include <vector>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

constexpr const char* HOST = R"({"cards": [
  {"model": "TVX16002", "serial_number": "TX52100417", "firmware_version": "2.01a4",
   "model_description": "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter",
   "node_symbolic_name": "Torvex TVX16002 FV2.01a4",
   "ports": [
     {"wwpn": "10000254560C4110", "wwnn": "20000254560C4110", "fc_id": "0x010400",
      "fabric_name": "100000054D5A8001", "state": "online", "speed": "16G", "type": "n",
      "supported_speed": "0x38", "symbolic_name": "first port", "max_frame_size": 2048,
      "class_of_service": 8, "discovered_ports": 2, "os_device_name": "/dev/host0"},
     {"wwpn": "10000254560C4111", "wwnn": "20000254560C4111", "state": "offline"}]},
  {"model": "TVX8102", "serial_number": "TX48007733", "device_id": "0xE200",
   "sub_adapter_id": "1", "firmware_version": "1.12a7",
   "ports": [
     {"wwpn": "10000254560A7E20", "wwnn": "20000254560A7E20", "speed": "8G"},
     {"wwpn": "10000254560A7E21", "wwnn": "20000254560A7E21", "type": "unknown",
      "state": "link down", "speed": "unknown"}]},
  {"adapter_name": "Torvex-OCN11102", "serial_number": "DROPPED", "ports": [{}]}]})";

class FC_Port : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    useScenario(HOST);
    load();
  }
};

TEST_F(FC_Port, IsListedForEveryPortOfAServedAdapter) {
  std::vector<std::string> names;
  for (const host::Instance& port : instances("TVXHBA_FCPort")) names.push_back(port.text("Name"));
  EXPECT_EQ(names, (std::vector<std::string>{"10000254560C4110", "10000254560C4111",
                                             "10000254560A7E20", "10000254560A7E21"}));
}

TEST_F(FC_Port, HasExactlyTheValuesOfItsPort) {
  const host::Instance port = instances("TVXHBA_FCPort").at(0);
  EXPECT_EQ(port.path.nameSpace, "root/torvex");
  EXPECT_EQ(port.path.key("CreationClassName").asText(), "TVXHBA_FCPort");
  EXPECT_EQ(port.path.key("SystemCreationClassName").asText(), "CIM_ComputerSystem");
  EXPECT_EQ(port.path.key("DeviceID").asText(), "10000254560C4110");
  EXPECT_EQ(port.property("Description").asText(),
            "Torvex TVX16002 2-Port 16Gb PCIe Fibre Channel Adapter");
  EXPECT_EQ(port.property("ElementName").asText(), "first port");
  EXPECT_EQ(port.property("PermanentAddress").asText(), "10000254560C4110");
  EXPECT_EQ(port.property("NetworkAddresses").asTextList(),
            (std::vector<std::string>{"10000254560C4110"}));
  EXPECT_EQ(port.property("Speed").asUnsigned(), 16'000'000'000u);
  EXPECT_EQ(port.property("MaxSpeed").asUnsigned(), 16'000'000'000u);
  EXPECT_EQ(port.property("PortType").asUnsigned(), 10u);
  EXPECT_EQ(port.property("OtherPortType").asText(), "N");
  EXPECT_EQ(port.property("OperationalStatus").asUnsignedList(), (std::vector<std::uint64_t>{2}));
  EXPECT_EQ(port.property("StatusDescriptions").asTextList(), (std::vector<std::string>{"OK"}));
  EXPECT_EQ(port.property("FabricName").asText(), "100000054D5A8001");
  EXPECT_EQ(port.property("FCID").asUnsigned(), 0x010400u);
  EXPECT_EQ(port.property("OperationalFirmware").asText(), "2.01a4");
  EXPECT_EQ(port.property("AdapterName").asText(), "Torvex-TVX16002-1");
  EXPECT_EQ(port.property("NumberOfDiscoveredPorts").asUnsigned(), 2u);
  EXPECT_EQ(port.property("SupportedMaximumTransmissionUnit").asUnsigned(), 2048u);
  EXPECT_EQ(port.property("SupportedCOS").asUnsignedList(), (std::vector<std::uint64_t>{3}));
  EXPECT_EQ(port.property("UsageRestriction").asUnsigned(), 4u);
  EXPECT_EQ(port.property("LinkTechnology").asUnsigned(), 4u);
  EXPECT_EQ(port.property("OtherIdentifyingInfo").asTextList(),
            (std::vector<std::string>{"/dev/host0", "02:54:56:0c:41:10", "TX52100417",
                                      "20000254560C4110", "Torvex TVX16002 FV2.01a4"}));
}

TEST_F(FC_Port, ShowsItsState) {
  const std::vector<host::Instance> ports = instances("TVXHBA_FCPort");
  ASSERT_EQ(ports.size(), 4u);
  EXPECT_EQ(ports[1].property("StatusDescriptions").asTextList(),
            (std::vector<std::string>{"Stopped"}));
  EXPECT_EQ(ports[2].property("Speed").asUnsigned(), 8'000'000'000u);
  EXPECT_EQ(ports[2].property("OperationalFirmware").asText(), "1.12a7");
  EXPECT_EQ(ports[3].property("OtherPortType").asText(), "Unknown");
  EXPECT_EQ(ports[3].property("Speed").asUnsigned(), 0u);
}

TEST_F(FC_Port, IsFoundByThePathTextOfAClient) {
  const host::Instance port = instances("TVXHBA_FCPort").at(3);
  host::Reply reply = broker->getInstance(port.path);
  ASSERT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_EQ(reply.instances.size(), 1u);
  EXPECT_TRUE(reply.instances[0] == port);
}

TEST_F(FC_Port, StandsOnThePlatformsComputerSystemIfThereIsOne) {
  unload();
  load();
  broker->addForeign(R"({"version": 1, "namespaces": ["root/ibmse"], "instances": [
      {"class": "IBMSD_ComputerSystem", "namespace": "root/ibmse",
       "keys": ["CreationClassName", "Name"],
       "properties": {"CreationClassName": "IBMSD_ComputerSystem", "Name": "vios1"}},
      {"class": "IBMSD_Chassis", "namespace": "root/ibmse",
       "keys": ["CreationClassName", "Tag"],
       "properties": {"CreationClassName": "IBMSD_Chassis", "Tag": "frame 7"}}]})");
  // The up-call runs on the refresh thread, with a context of its own.
  for (const host::Instance& port : instances("TVXHBA_FCPort")) {
    EXPECT_EQ(port.text("SystemName"), "vios1");
    EXPECT_EQ(port.text("SystemCreationClassName"), "IBMSD_ComputerSystem");
  }
  const std::vector<host::Instance> contained = instances("TVXHBA_ChassisContainsCard");
  ASSERT_EQ(contained.size(), 2u);
  const host::ObjectPath& chassis = contained[0].property("GroupComponent").asReference();
  EXPECT_EQ(chassis.key("Tag").asText(), "frame 7");
  EXPECT_EQ(chassis.nameSpace, "root/ibmse");
  EXPECT_TRUE(instances("TVXHBA_ComputerSystemConformsToProfile").empty());
}

}  // namespace
}  // namespace tvx::test
