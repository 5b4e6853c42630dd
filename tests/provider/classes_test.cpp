// Every class through the library's factories, on the default host.
#include <algorithm>
#include <map>
#include <string>

#include "Provider_Fixture.h"

namespace tvx::test {
namespace {

class Classes : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    load();
  }
};

TEST_F(Classes, AllOfThemAnswerBothEnumerations) {
  const std::vector<std::string> names = servedClasses();
  ASSERT_EQ(names.size(), 152u);
  for (const std::string& name : names) {
    const std::size_t count = instances(name).size();
    host::Reply reply = broker->enumerateInstanceNames(name);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK) << name << ": " << reply.status.message;
    EXPECT_EQ(reply.paths.size(), count) << name;
    EXPECT_FALSE(reply.report.leaks()) << name << "\n" << reply.report.text();
  }
}

TEST_F(Classes, OfTheHostHaveTheirInstances) {
  const std::map<std::string, std::size_t> expected = {
      {"TVXHBA_Product", 2},
      {"TVXHBA_LogicalPortGroup", 4},
      {"TVXHBA_HostedCollection", 4},
      {"TVXHBA_Card", 2},
      {"TVXHBA_Chip", 2},
      {"TVXHBA_CardContainsChip", 2},
      {"TVXHBA_ChassisContainsCard", 2},
      {"TVXHBA_PCIDevice", 4},
      {"TVXHBA_PhysicalConnector", 4},
      {"TVXHBA_FCPort", 4},
      {"TVXHBA_FCPortStatistics", 4},
      {"TVXHBA_SCSIProtocolController", 4},
      {"TVXHBA_PortController", 4},
      {"TVXHBA_ControlledBy", 4},
      {"TVXHBA_SCSIProtocolInitiatorEndpoint", 4},
      {"TVXHBA_ProviderConfigSetting", 3},
      {"TVXHBA_RegisteredProfile", 14},
      {"TVXHBA_FCRealizes", 0},
      {"TVXHBA_ConcreteJob", 0},
  };
  for (const auto& [name, count] : expected) EXPECT_EQ(instances(name).size(), count) << name;
}

TEST_F(Classes, EveryInstanceIsFoundByItsPath) {
  for (const std::string& name : servedClasses()) {
    for (const host::Instance& instance : instances(name)) {
      host::Reply reply = broker->getInstance(instance.path);
      ASSERT_EQ(reply.status.rc, CMPI_RC_OK) << name << ": " << reply.status.message;
      ASSERT_EQ(reply.instances.size(), 1u) << name;
      EXPECT_TRUE(reply.instances[0].path.sameObject(instance.path)) << name;
      break;  // the first of each class: the search costs an enumeration
    }
  }
}

TEST_F(Classes, UnknownKeyIsNotFound) {
  host::ObjectPath path = instances("TVXHBA_FCPort").at(0).path;
  path.keys.set("DeviceID", host::Value::string("FFFFFFFFFFFFFFFF"));
  EXPECT_EQ(broker->getInstance(path).status.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(Classes, PropertyListLimitsWhatIsReturned) {
  for (const host::Instance& port :
       instances("TVXHBA_FCPort", std::vector<std::string>{"Speed", "FabricName"})) {
    EXPECT_TRUE(port.has("Speed"));
    EXPECT_TRUE(port.has("FabricName"));
    EXPECT_TRUE(!port.has("MaxSpeed") || port.property("MaxSpeed").isNull());
    EXPECT_TRUE(!port.has("PortType") || port.property("PortType").isNull());
  }
}

}  // namespace
}  // namespace tvx::test
