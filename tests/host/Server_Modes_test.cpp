// The modes in which the broker treats providers as other servers do, and the walks over foreign
// associations.
#include <gmock/gmock.h>

#include <thread>

#include "Fake_Broker.h"
#include "broker/ProviderCall.h"
#include "cmpi/cmpimacs.h"

namespace tvx::host {
namespace {

using test::FakeBroker;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// ---- What a provider sees of a path ----

struct SeenPath {
  bool hasNameSpace = false;
  CMPIType keyType = CMPI_null;
  int cleanups = 0;
};
SeenPath seen;

CMPIStatus lookAtPath(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                      const CMPIObjectPath* path, const char**) {
  seen.hasNameSpace = CMGetCharsPtr(CMGetNameSpace(path, nullptr), nullptr) != nullptr;
  seen.keyType = CMGetKeyAt(path, 0, nullptr, nullptr).type;
  return {CMPI_RC_ERR_NOT_FOUND, nullptr};
}

CMPIStatus countCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
  ++seen.cleanups;
  return {CMPI_RC_OK, nullptr};
}

CMPIInstanceMI* lookingProvider(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
  static CMPIInstanceMIFT table{};
  table.cleanup = countCleanup;
  table.getInstance = lookAtPath;
  static CMPIInstanceMI interface { nullptr, &table };
  return &interface;
}

struct LookingBroker : Broker {
  explicit LookingBroker(BrokerOptions options) : Broker(std::move(options)) {
    seen = {};
    addProvider("LOOK_Path", {lookingProvider, nullptr, nullptr});
  }
  void look(Value key) { getInstance({"", "root/torvex", "LOOK_Path", {{"Key", std::move(key)}}}); }
};

CMPIType keyTypeIn(KeyForm form, Value key) {
  BrokerOptions options;
  options.keys = form;
  LookingBroker broker(options);
  broker.look(std::move(key));
  return seen.keyType;
}

TEST(ServerModes, KeysReachTheProviderInTheFormThatWasChosen) {
  const Value small = Value::number(CMPI_uint16, 7);
  EXPECT_EQ(keyTypeIn(KeyForm::OfVersion, small), CMPI_sint64);
  EXPECT_EQ(keyTypeIn(KeyForm::Declared, small), CMPI_uint16);
  EXPECT_EQ(keyTypeIn(KeyForm::Unsigned64, small), CMPI_uint64);
  EXPECT_EQ(keyTypeIn(KeyForm::Unsigned64, Value::signedNumber(CMPI_sint8, -1)), CMPI_sint64);
  EXPECT_EQ(keyTypeIn(KeyForm::Signed64, small), CMPI_sint64);
  EXPECT_EQ(keyTypeIn(KeyForm::Text, small), CMPI_string);
  EXPECT_EQ(keyTypeIn(KeyForm::Text, Value::boolean(true)), CMPI_string);
  EXPECT_EQ(keyTypeIn(KeyForm::Text, Value::string("a")), CMPI_string);
}

TEST(ServerModes, APathMayComeWithoutANamespace) {
  BrokerOptions options;
  LookingBroker telling(options);
  telling.look(Value::string("a"));
  EXPECT_TRUE(seen.hasNameSpace);
  options.tellsNameSpace = false;
  LookingBroker silent(options);
  silent.look(Value::string("a"));
  EXPECT_FALSE(seen.hasNameSpace);
}

TEST(ServerModes, OneCleanupMayStandForAllInterfacesOfAKind) {
  LookingBroker broker({});
  broker.addProvider("LOOK_Other", {lookingProvider, nullptr, nullptr});
  EXPECT_NE(broker.interface("LOOK_Path", InterfaceKind::Instance), nullptr);
  EXPECT_NE(broker.interface("LOOK_Other", InterfaceKind::Instance), nullptr);
  EXPECT_EQ(broker.cleanupOncePerKind(false).rc, CMPI_RC_OK);
  EXPECT_EQ(seen.cleanups, 1);
  EXPECT_TRUE(broker.unload().ok());
  EXPECT_EQ(seen.cleanups, 1) << "the others were forgotten";
}

TEST(ServerModes, AttachingMayDoNothing) {
  BrokerOptions options = test::fakeOptions(true);
  options.attaches = false;
  Broker broker(options);
  broker.load(FAKE_PROVIDER);
  broker.addForeign(
      R"({"version": 1, "instances": [{"class": "FAKE_Foreign", "properties": {"Id": "a"}}]})");
  const ObjectPath widget = broker.path("FAKE_Widget.Name=\"widget0\",Number=0");
  const Reply reply = broker.invokeMethod(widget, "Misbehave", {{"How", Value::string("thread")}});
  EXPECT_EQ(reply.returnValue.asUnsigned(), 1U);
  EXPECT_EQ(broker.openAttachments(), 0U);
  EXPECT_THAT(broker.lateNotes(), IsEmpty());
  ASSERT_EQ(broker.threadReports().size(), 1U);
  EXPECT_THAT(broker.threadReports()[0].complaints, IsEmpty());
}

// ---- Walks over foreign associations ----

/// Widget 0 is mounted in rack "r", which stands in hall "h"; both links are foreign.
constexpr const char* racks = R"({"version": 1, "instances": [
  {"class": "RACK_Rack", "namespace": "root/x", "keys": ["Id"], "properties": {"Id": "r", "Units": {"type": "uint16", "value": 42}}},
  {"class": "RACK_Hall", "namespace": "root/x", "keys": ["Id"], "properties": {"Id": "h"}},
  {"class": "RACK_Mounted", "namespace": "root/x", "keys": ["Frame", "Part"], "properties": {
     "Frame": {"type": "ref", "value": "root/x:RACK_Rack.Id=\"r\""},
     "Part": {"type": "ref", "value": "root/fake:FAKE_Widget.Name=\"widget0\",Number=0"}}},
  {"class": "RACK_StandsIn", "namespace": "root/x", "keys": ["Frame", "Room"], "properties": {
     "Frame": {"type": "ref", "value": "root/x:RACK_Rack.Id=\"r\""},
     "Room": {"type": "ref", "value": "root/x:RACK_Hall.Id=\"h\""}}}]})";

class ForeignWalks : public ::testing::Test {
 protected:
  ForeignWalks() { broker.addForeign(racks); }

  static std::vector<std::string> classesOf(const Reply& reply) {
    EXPECT_TRUE(reply.status.ok()) << reply.status.message;
    std::vector<std::string> names;
    for (const ObjectPath& path : reply.paths) names.push_back(path.className);
    for (const Instance& instance : reply.instances) names.push_back(instance.className());
    return names;
  }

  FakeBroker broker{true};
  const ObjectPath rack{"", "root/x", "RACK_Rack", {{"Id", Value::string("r")}}};
};

TEST_F(ForeignWalks, ReachEveryFarEnd) {
  EXPECT_THAT(classesOf(broker.associatorNames(rack)), ElementsAre("FAKE_Widget", "RACK_Hall"));
  EXPECT_THAT(classesOf(broker.referenceNames(rack)), ElementsAre("RACK_Mounted", "RACK_StandsIn"));
  EXPECT_THAT(classesOf(broker.references(rack, "RACK_Mounted")), ElementsAre("RACK_Mounted"));
}

TEST_F(ForeignWalks, KeepToTheirFilters) {
  EXPECT_THAT(classesOf(broker.associatorNames(rack, "RACK_StandsIn")), ElementsAre("RACK_Hall"));
  EXPECT_THAT(classesOf(broker.associatorNames(rack, "", "CIM_Thing")), ElementsAre("FAKE_Widget"));
  EXPECT_THAT(classesOf(broker.associatorNames(rack, "", "", "Frame", "Room")),
              ElementsAre("RACK_Hall"));
  EXPECT_THAT(classesOf(broker.associatorNames(rack, "", "", "Room")), IsEmpty());
  EXPECT_THAT(classesOf(broker.referenceNames(rack, "", "Part")), IsEmpty());
  EXPECT_EQ(broker.associators(rack, "RACK_Nothing").status.rc, CMPI_RC_ERR_INVALID_CLASS);
}

TEST_F(ForeignWalks, GoOverToOtherProvidersAndBack) {
  const Reply reply = broker.associators(rack);
  EXPECT_THAT(classesOf(reply), ElementsAre("FAKE_Widget", "RACK_Hall"));
  EXPECT_EQ(reply.instances.at(0).text("Name"), "widget0");
  const Reply back = broker.associators(broker.widget(0), "RACK_Mounted", "", "", "",
                                        std::vector<std::string>{"Units"});
  ASSERT_THAT(classesOf(back), ElementsAre("RACK_Rack"));
  EXPECT_EQ(back.instances[0].properties, (NamedValues{{"Units", Value::number(CMPI_uint16, 42)}}));
}

}  // namespace
}  // namespace tvx::host
