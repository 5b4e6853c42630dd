#include <gtest/gtest.h>

#include "Fake_Broker.h"
#include "broker/ForeignStore.h"

namespace tvx::host {
namespace {

constexpr const char* storeText = R"({
  "version": 1,
  "namespaces": ["root/quiet"],
  "instances": [
    {"class": "FAKE_Foreign", "namespace": "root/ibmse", "properties": {"Id": "a", "Level": 1, "Levels": [-1, 2]}},
    {"class": "FAKE_Foreign", "namespace": "root/ibmse", "properties": {"Id": "b", "Level": 2}},
    {"class": "OTHER_Class", "namespace": "root/x", "keys": ["Key"], "properties": {"Key": "k", "Any": {"type": "uint8", "value": 9}}}],
  "methods": [{"class": "OTHER_Class", "method": "Start", "return": {"type": "uint32", "value": 3}, "out": {"Job": "j"}}],
  "failures": [{"class": "BAD_Class", "operation": "enumerateInstances", "rc": 2, "message": "keep out"}]})";

class ForeignStoreTest : public ::testing::Test {
 protected:
  ForeignStoreTest() : m_Options(test::fakeOptions()), store(m_Options) { store.add(storeText); }

  static Request request(Operation operation, const std::string& path) {
    Request result;
    result.operation = operation;
    result.path = parsePath(path, "", &test::testClasses());
    return result;
  }

 private:
  BrokerOptions m_Options;

 protected:
  ForeignStore store;
};

TEST_F(ForeignStoreTest, KnowsItsClassesAndNamespaces) {
  EXPECT_TRUE(store.knowsClass("fake_foreign"));
  EXPECT_TRUE(store.knowsClass("BAD_Class"));
  EXPECT_FALSE(store.knowsClass("FAKE_Widget"));
  EXPECT_TRUE(store.knowsNameSpace("root/IBMSE"));
  EXPECT_TRUE(store.knowsNameSpace("root/quiet"));
  EXPECT_FALSE(store.knowsNameSpace("root/fake"));
  EXPECT_EQ(store.classesBelow("CIM_Thing"), std::vector<std::string>{"FAKE_Foreign"});
}

TEST_F(ForeignStoreTest, EnumeratesOneClassOfOneNamespace) {
  EXPECT_EQ(store.answer(request(Operation::EnumerateInstances, "FAKE_Foreign")).instances.size(),
            2U);
  EXPECT_EQ(store.answer(request(Operation::EnumerateInstances, "root/else:FAKE_Foreign"))
                .instances.size(),
            0U);
  const Reply names =
      store.answer(request(Operation::EnumerateInstanceNames, "root/ibmse:FAKE_Foreign"));
  ASSERT_EQ(names.paths.size(), 2U);
  EXPECT_EQ(printPath(names.paths[1]), "root/ibmse:FAKE_Foreign.Id=\"b\"");
}

TEST_F(ForeignStoreTest, GetsOneInstanceWithAPropertyList) {
  Request get = request(Operation::GetInstance, "FAKE_Foreign.Id=\"a\"");
  get.properties = std::vector<std::string>{"LEVEL"};
  const Reply reply = store.answer(get);
  ASSERT_EQ(reply.instances.size(), 1U);
  EXPECT_EQ(reply.instances[0].properties, (NamedValues{{"Level", Value::number(CMPI_uint16, 1)}}));
  EXPECT_EQ(store.answer(request(Operation::GetInstance, "FAKE_Foreign.Id=\"c\"")).status.rc,
            CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(ForeignStoreTest, InstancesAreCreatedModifiedAndDeleted) {
  Request create = request(Operation::CreateInstance, "root/ibmse:FAKE_Foreign.Id=\"c\"");
  create.instance.properties.set("Level", Value::number(CMPI_uint16, 3));
  EXPECT_EQ(store.answer(create).paths.at(0), create.path);
  EXPECT_EQ(store.answer(create).status.rc, CMPI_RC_ERR_ALREADY_EXISTS);
  Request modify = request(Operation::ModifyInstance, "FAKE_Foreign.Id=\"c\"");
  modify.instance.properties = {{"Level", Value::number(CMPI_uint16, 4)},
                                {"Id", Value::string("no")}};
  modify.properties = std::vector<std::string>{"Level"};
  EXPECT_EQ(store.answer(modify).status.rc, CMPI_RC_OK);
  EXPECT_EQ(store.instances("FAKE_Foreign").at(2).text("Level"), "4");
  EXPECT_FALSE(store.instances("FAKE_Foreign").at(2).has("Id"));
  EXPECT_EQ(store.answer(request(Operation::DeleteInstance, "FAKE_Foreign.Id=\"c\"")).status.rc,
            CMPI_RC_OK);
  EXPECT_EQ(store.answer(request(Operation::DeleteInstance, "FAKE_Foreign.Id=\"c\"")).status.rc,
            CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(store.answer(request(Operation::ModifyInstance, "FAKE_Foreign.Id=\"c\"")).status.rc,
            CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(ForeignStoreTest, MethodsAnswerAsPlanned) {
  Request call = request(Operation::InvokeMethod, "OTHER_Class.Key=\"k\"");
  call.method = "start";
  const Reply reply = store.answer(call);
  EXPECT_EQ(reply.returnValue, Value::number(CMPI_uint32, 3));
  EXPECT_EQ(reply.outputs, (NamedValues{{"Job", Value::string("j")}}));
  call.method = "Stop";
  EXPECT_EQ(store.answer(call).status.rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
}

TEST_F(ForeignStoreTest, FailuresComeAsPlanned) {
  const Reply reply = store.answer(request(Operation::EnumerateInstances, "BAD_Class"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_ACCESS_DENIED);
  EXPECT_EQ(reply.status.message, "keep out");
  EXPECT_EQ(store.answer(request(Operation::EnumerateInstanceNames, "BAD_Class")).status.rc,
            CMPI_RC_OK);
  EXPECT_EQ(store.answer(request(Operation::ExecQuery, "FAKE_Foreign")).status.rc,
            CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(store.answer(request(Operation::Associators, "FAKE_Foreign")).status.rc, CMPI_RC_OK);
}

TEST_F(ForeignStoreTest, BadTextAddsNothing) {
  const auto add = [&](const char* text) { return [&, text] { store.add(text); }; };
  EXPECT_ANY_THROW(add("{")());
  EXPECT_ANY_THROW(add("[]")());
  EXPECT_ANY_THROW(add(R"({"version": 2})")());
  EXPECT_ANY_THROW(add(
      R"({"version": 1, "instances": [{"class": "NEW_Class"}, {"class": "FAKE_Foreign", "properties": {"Level": -1}}]})")());
  EXPECT_FALSE(store.knowsClass("NEW_Class"));
}

}  // namespace
}  // namespace tvx::host
