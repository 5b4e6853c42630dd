// Requests through the broker into a provider library, and what the provider gets to see.
#include <gtest/gtest.h>

#include <fstream>

#include "Fake_Broker.h"
#include "broker/ProviderCall.h"
#include "cmpi/cmpimacs.h"

namespace tvx::host {
namespace {

using test::FakeBroker;

TEST(LoadTest, AMissingLibraryIsNamed) {
  Broker broker;
  try {
    broker.load("/nowhere/libnothing.so");
    FAIL() << "a missing library was loaded";
  } catch (const LoadError& error) {
    EXPECT_NE(std::string(error.what()).find("'/nowhere/libnothing.so'"), std::string::npos);
  }
  EXPECT_FALSE(broker.isLoaded());
}

TEST(LoadTest, FactoriesAreFoundInBothForms) {
  FakeBroker broker;
  EXPECT_TRUE(broker.hasInterface("FAKE_Widget", InterfaceKind::Instance));
  EXPECT_TRUE(broker.hasInterface("FAKE_Gadget", InterfaceKind::Instance))
      << "the short form of the name";
  EXPECT_FALSE(broker.hasInterface("FAKE_Gadget", InterfaceKind::Method));
  EXPECT_FALSE(broker.hasInterface("FAKE_Widget", InterfaceKind::Association));
  EXPECT_NE(broker.interface("FAKE_Widget", InterfaceKind::Method), nullptr);
  EXPECT_EQ(broker.interface("FAKE_Widget", InterfaceKind::Method),
            broker.interface("fake_widget", InterfaceKind::Method));
}

TEST(LoadTest, AFactoryThatFailsGivesNoInterface) {
  FakeBroker broker;
  EXPECT_EQ(broker.interface("FAKE_Link", InterfaceKind::Instance), nullptr);
  const Reply reply = broker.enumerateInstances("FAKE_Link");
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(reply.status.message, "class 'FAKE_Link' has no provider for enumerateInstances");
}

TEST(LoadTest, UnloadClosesAndTheLibraryLoadsAgain) {
  FakeBroker broker;
  EXPECT_EQ(broker.enumerateInstances("FAKE_Widget").instances.size(), 4U);
  EXPECT_TRUE(broker.unload().ok());
  EXPECT_FALSE(broker.isLoaded());
  EXPECT_FALSE(broker.stillMapped(FAKE_PROVIDER));
  broker.load(FAKE_PROVIDER);
  EXPECT_TRUE(broker.stillMapped(FAKE_PROVIDER));
  EXPECT_EQ(broker.enumerateInstances("FAKE_Widget").instances.size(), 4U);
}

TEST(LoadTest, AProviderMayRefuseToBeUnloadedUntilTheEnd) {
  FakeBroker broker;
  broker.misbehave("refuse-unload");
  EXPECT_EQ(broker.cleanup("FAKE_Widget", InterfaceKind::Instance, false).rc,
            CMPI_RC_DO_NOT_UNLOAD);
  EXPECT_EQ(broker.unload(false).rc, CMPI_RC_DO_NOT_UNLOAD);
  EXPECT_TRUE(broker.isLoaded());
  EXPECT_TRUE(broker.unload(true).ok());
  EXPECT_FALSE(broker.isLoaded());
}

TEST(LoadTest, CleanupOfAnInterfaceThatIsNotInUseIsToldSo) {
  FakeBroker broker;
  EXPECT_EQ(broker.cleanup("FAKE_Widget", InterfaceKind::Instance, false).rc,
            CMPI_RC_ERR_NOT_FOUND);
  broker.interface("FAKE_Widget", InterfaceKind::Instance);
  EXPECT_TRUE(broker.cleanup("FAKE_Widget", InterfaceKind::Instance, false).ok());
}

TEST(RequestTest, EnumerationsReachSubclasses) {
  FakeBroker broker;
  const Reply reply = broker.enumerateInstanceNames("CIM_Thing");
  EXPECT_TRUE(reply.status.ok());
  EXPECT_TRUE(reply.done);
  EXPECT_EQ(reply.providersAsked, 2U);
  ASSERT_EQ(reply.paths.size(), 4U);
  EXPECT_EQ(printPath(reply.paths[0]), "root/fake:FAKE_Gadget.Name=\"widget0\",Number=0");
  EXPECT_EQ(printPath(reply.paths[2]), R"(root/fake:FAKE_Widget.Name="wid get: \"1\"\\",Number=1)");
}

TEST(RequestTest, ExactRequestsDoNot) {
  FakeBroker broker;
  Request request;
  request.operation = Operation::EnumerateInstances;
  request.path.className = "FAKE_Widget";
  request.exact = true;
  EXPECT_EQ(broker.run(request).instances.size(), 3U);
  request.path.className = "CIM_Thing";
  EXPECT_EQ(broker.run(request).status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST(RequestTest, InstancesComeBackTyped) {
  FakeBroker broker;
  const Reply reply = broker.enumerateInstances("FAKE_Widget");
  ASSERT_EQ(reply.instances.size(), 4U) << "the subclass comes too";
  const Reply one = broker.getInstance(broker.widget(2));
  ASSERT_EQ(one.instances.size(), 1U);
  EXPECT_EQ(one.instances[0].property("Number"), Value::number(CMPI_uint32, 2));
  EXPECT_EQ(one.instances[0].property("Sizes").asUnsignedList(),
            (std::vector<std::uint64_t>{10, 20}));
  EXPECT_EQ(one.instances[0].path, broker.widget(2));
}

TEST(RequestTest, ThePropertyListReachesTheProvider) {
  FakeBroker broker;
  const Reply reply = broker.getInstance(broker.widget(0), std::vector<std::string>{"Color"});
  EXPECT_EQ(reply.instances.at(0).properties, (NamedValues{{"Color", Value::string("red")}}));
  EXPECT_EQ(broker.getInstance(broker.widget(0), std::vector<std::string>{})
                .instances.at(0)
                .properties.size(),
            0U);
}

TEST(RequestTest, ErrorsCarryTheProvidersMessage) {
  FakeBroker broker;
  ObjectPath path = broker.widget(0);
  path.keys.set("Name", Value::string("other"));
  const Reply reply = broker.getInstance(path);
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(reply.status.message, "no such widget");
}

TEST(RequestTest, UnknownClassesAndNamespacesDoNotReachAProvider) {
  FakeBroker broker;
  EXPECT_EQ(broker.enumerateInstances("FAKE_Nothing").status.rc, CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(broker.getInstance(broker.path("root/else:FAKE_Widget.Name=\"a\"")).status.rc,
            CMPI_RC_ERR_INVALID_NAMESPACE);
  EXPECT_EQ(broker.associators(broker.widget(0), "FAKE_NoLink").status.rc,
            CMPI_RC_ERR_INVALID_CLASS);
}

TEST(RequestTest, CreateModifyAndDeleteGoThrough) {
  FakeBroker broker;
  Instance instance;
  instance.path = {"",
                   "root/fake",
                   "FAKE_Widget",
                   {{"Name", Value::string("new")}, {"Number", Value::number(CMPI_uint32, 9)}}};
  instance.properties = instance.path.keys;
  EXPECT_EQ(broker.createInstance(instance).paths.at(0), instance.path);
  instance.properties.set("Name", Value::string("widget0"));
  EXPECT_EQ(broker.createInstance(instance).status.rc, CMPI_RC_ERR_ALREADY_EXISTS);
  instance.path = broker.widget(0);
  instance.properties.set("Color", Value::string("green"));
  EXPECT_TRUE(broker.modifyInstance(instance, std::vector<std::string>{"Color"}).status.ok());
  EXPECT_EQ(broker.modifyInstance(instance).status.message, "only the color green can be set");
  EXPECT_TRUE(broker.deleteInstance(broker.widget(1)).status.ok());
  EXPECT_EQ(broker.execQuery("FAKE_Widget", "select", "WQL").status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST(RequestTest, MethodsTakeAndGiveArguments) {
  FakeBroker broker;
  const Reply reply = broker.invokeMethod(broker.widget(0), "Paint",
                                          {{"Color", Value::string("none")},
                                           {"Coats", Value::number(CMPI_uint16, 2)},
                                           {"Target", Value::reference(broker.widget(1))}});
  EXPECT_TRUE(reply.status.ok());
  EXPECT_EQ(reply.returnValue, Value::number(CMPI_uint32, 5));
  EXPECT_EQ(reply.outputs.find("Coats")->asUnsigned(), 3U);
  EXPECT_EQ(reply.outputs.find("Log")->asTextList(),
            (std::vector<std::string>{"Color:5632", "Coats:144", "Target:4352"}));
  EXPECT_EQ(broker.invokeMethod(broker.widget(0), "Polish").status.rc,
            CMPI_RC_ERR_METHOD_NOT_FOUND);
}

TEST(RequestTest, WalksAskEveryAssociationClass) {
  FakeBroker broker;
  EXPECT_EQ(broker.associatorNames(broker.widget(1)).paths,
            (std::vector<ObjectPath>{broker.widget(0), broker.widget(2)}));
  EXPECT_EQ(broker.associatorNames(broker.widget(1), "FAKE_Link", "FAKE_Gadget").paths.size(), 0U);
  EXPECT_EQ(broker.associatorNames(broker.widget(1), "FAKE_Link", "", "Antecedent").paths,
            std::vector<ObjectPath>{broker.widget(2)});
  const Reply far =
      broker.associators(broker.widget(0), "", "", "", "", std::vector<std::string>{"Color"});
  ASSERT_EQ(far.instances.size(), 1U) << "the far end comes by an up-call";
  EXPECT_EQ(far.instances[0].properties, (NamedValues{{"Color", Value::string("blue")}}));
  EXPECT_EQ(broker.references(broker.widget(1)).instances.size(), 2U);
  const Reply names = broker.referenceNames(broker.widget(0), "FAKE_Link", "Antecedent");
  ASSERT_EQ(names.paths.size(), 1U);
  EXPECT_EQ(names.paths[0].key("Dependent").asReference(), broker.widget(1));
}

TEST(RequestTest, ForeignInstancesAreServedToo) {
  FakeBroker broker;
  EXPECT_EQ(broker.enumerateInstances("FAKE_Foreign").instances.size(), 0U);
  broker.addForeign(
      R"({"version": 1, "instances": [{"class": "FAKE_Foreign", "properties": {"Id": "a"}}]})");
  EXPECT_EQ(broker.enumerateInstances("FAKE_Foreign").instances.size(), 1U);
  EXPECT_EQ(broker.enumerateInstances("CIM_Thing").instances.size(), 5U);
  EXPECT_EQ(broker.getInstance(broker.path("FAKE_Foreign.Id=\"a\"")).instances.size(), 1U);
  EXPECT_THROW(broker.addForeignFile("/nowhere/store.json"), std::runtime_error);
}

TEST(RequestTest, ATakerGetsEachInstanceAndTheReplyKeepsNone) {
  FakeBroker broker;
  broker.addForeign(
      R"({"version": 1, "instances": [{"class": "FAKE_Foreign", "properties": {"Id": "a"}}]})");
  for (const char* className : {"CIM_Thing", "FAKE_Foreign"}) {
    const Reply whole = broker.enumerateInstances(className);
    ASSERT_FALSE(whole.instances.empty()) << className;
    Request request;
    request.path.className = className;
    std::vector<std::string> taken;
    request.takeInstance = [&](const Instance& instance) {
      taken.push_back(printPath(instance.path));
    };
    const Reply streamed = broker.run(request);
    EXPECT_EQ(streamed.status.rc, CMPI_RC_OK) << streamed.status.message;
    EXPECT_EQ(streamed.done, whole.done);
    EXPECT_TRUE(streamed.instances.empty());
    std::vector<std::string> expected;
    for (const Instance& instance : whole.instances) expected.push_back(printPath(instance.path));
    EXPECT_EQ(taken, expected) << className;
  }
}

TEST(RequestTest, IndicationsAreCollected) {
  FakeBroker broker;
  broker.misbehave("indication");
  ASSERT_EQ(broker.indications().size(), 1U);
  EXPECT_EQ(broker.indications()[0].nameSpace, "root/fake");
  EXPECT_EQ(broker.indications()[0].instance.property("Number").asUnsigned(), 2U);
}

BrokerOptions optionsOf(int version) {
  BrokerOptions options;
  options.version = version;
  return options;
}

TEST(WideKeysTest, IntegerKeysTakeTheWidthThatServersHandOut) {
  ObjectPath inner{"", "", "X", {{"N", Value::number(CMPI_uint16, 7)}}};
  const ObjectPath path{"",
                        "",
                        "X",
                        {{"A", Value::number(CMPI_uint16, 7)},
                         {"B", Value::signedNumber(CMPI_sint8, -7)},
                         {"C", Value::string("c")},
                         {"D", Value::reference(inner)},
                         {"E", Value::boolean(true)}}};
  const ObjectPath usual = withServersKeys(path, BrokerOptions{});
  EXPECT_EQ(usual.key("A"), Value::signedNumber(CMPI_sint64, 7));
  EXPECT_EQ(usual.key("B"), Value::signedNumber(CMPI_sint64, -7));
  EXPECT_EQ(usual.key("C"), Value::string("c"));
  EXPECT_EQ(usual.key("D").asReference().key("N"), Value::signedNumber(CMPI_sint64, 7));
  EXPECT_EQ(usual.key("E"), Value::boolean(true));
  const ObjectPath zero = withServersKeys(path, optionsOf(0));
  EXPECT_EQ(zero.key("A"), Value::number(CMPI_uint64, 7));
  EXPECT_EQ(zero.key("B"), Value::signedNumber(CMPI_sint64, -7));
}

// ---- What a provider sees of its context and result ----

struct Seen {
  NamedValues entries;
  CMPICount count = 0;
  CMPIrc missing = CMPI_RC_OK;
  bool principalText = false;
  CMPIrc errorRc = CMPI_RC_OK;
};
Seen seen;

CMPIStatus lookAround(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                      const CMPIObjectPath*) {
  CMPIStatus rc{};
  seen = {};
  seen.count = context->ft->getEntryCount(context, nullptr);
  for (CMPICount i = 0; i < seen.count; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = context->ft->getEntryAt(context, i, &name, nullptr);
    const char* text =
        data.type == CMPI_string ? CMGetCharsPtr(data.value.string, nullptr) : nullptr;
    seen.entries.set(
        CMGetCharsPtr(name, nullptr),
        text == nullptr ? Value::number(CMPI_uint32, data.value.uint32) : Value::string(text));
  }
  CMGetContextEntry(context, "Nothing", &rc);
  seen.missing = rc.rc;
  const CMPIData principal = CMGetContextEntry(context, CMPIPrincipal, &rc);
  seen.principalText = CMGetCharsPtr(principal.value.string, nullptr) != nullptr;
  CMPIValue value{};
  value.uint8 = 4;
  CMAddContextEntry(context, "Extra", &value, CMPI_uint8);
  CMReturnData(result, &value, CMPI_uint8);
  seen.errorRc = result->ft->returnError(result, nullptr).rc;
  CMReturnDone(result);
  return CMReturnDone(result);
}

CMPIStatus noCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
  return {CMPI_RC_OK, nullptr};
}

CMPIInstanceMI* lookingProvider(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
  static CMPIInstanceMIFT table{};
  table.cleanup = noCleanup;
  table.enumerateInstanceNames = lookAround;
  static CMPIInstanceMI interface { nullptr, &table };
  return &interface;
}

TEST(ContextTest, TheContextHoldsNamespaceFlagsAndUser) {
  Broker broker;
  broker.addProvider("LOOK_Around", {lookingProvider, nullptr, nullptr});
  const Reply reply = broker.enumerateInstanceNames("LOOK_Around");
  EXPECT_TRUE(reply.status.ok());
  EXPECT_EQ(seen.entries.find(CMPIInitNameSpace)->asText(), "root/torvex");
  EXPECT_EQ(seen.entries.find(CMPIInvocationFlags)->asUnsigned(), 0U);
  EXPECT_EQ(seen.entries.find(CMPIPrincipal)->asText(), "root");
  EXPECT_EQ(seen.missing, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(reply.data, std::vector<Value>{Value::number(CMPI_uint8, 4)});
  EXPECT_EQ(seen.errorRc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(reply.report.complaints, std::vector<std::string>{"returnDone was called twice"});
}

TEST(ContextTest, VersionZeroHasNoNamespaceEntryAndMayHaveNoUser) {
  BrokerOptions options;
  options.version = 0;
  options.user.reset();
  Broker broker(options);
  broker.addProvider("LOOK_Around", {lookingProvider, nullptr, nullptr});
  broker.enumerateInstanceNames("LOOK_Around");
  EXPECT_EQ(seen.entries.find(CMPIInitNameSpace), nullptr);
  EXPECT_EQ(seen.count, 2U);
  EXPECT_FALSE(seen.principalText);
}

}  // namespace
}  // namespace tvx::host
