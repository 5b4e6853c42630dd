// Operations of the instance function table, through a server and with every provider status.
#include <gmock/gmock.h>

#include <atomic>
#include <cerrno>
#include <stdexcept>
#include <thread>

#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "runtime/Thread_Context.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::UnorderedElementsAre;
using tvx::host::ObjectPath;
using tvx::host::Reply;
using Object = tvx::host::Instance;
using Any = tvx::host::Value;

class Instance_Operations : public ::testing::Test {
 protected:
  Instance_Operations() { server.serve<0>(script, part); }

  /// A provider with two parts, "a" of size 1 and "b" of size 2.
  void serve_two() {
    script.enumerate = [this](const Instance*, const Instance_Handler& handler) {
      handler.handle(make_part("a", 1)) && handler.handle(make_part("b", 2));
      return 0;
    };
  }
  Instance* make_part(const char* id, std::uint32_t size) const {
    Ref<Instance> made = make_element(part, id);
    put(made, "Size", size);
    return made.release();
  }
  Object part_object(const char* id) const {
    Object object;
    object.path = path_of("TEST_Part", id);
    object.properties.set("Id", Any::string(id));
    object.properties.set("Size", Any::number(CMPI_uint32, 7));
    return object;
  }
  static std::vector<std::string> ids(const Reply& reply) {
    std::vector<std::string> result;
    for (const ObjectPath& path : reply.paths) result.push_back(path.key("Id").asText());
    for (const Object& object : reply.instances) result.push_back(object.text("Id"));
    return result;
  }

  const Meta_Class* part = Test_Classes::get().part;
  Script script;
  Test_Server server;
};

// ---- enumInstanceNames

TEST_F(Instance_Operations, NamesAreReturnedInTheNamespaceOfTheRequest) {
  serve_two();
  const Reply reply = server.broker.enumerateInstanceNames("TEST_Part");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_THAT(ids(reply), ElementsAre("a", "b"));
  EXPECT_EQ(reply.paths[0].nameSpace, "root/test");
  EXPECT_EQ(reply.paths[0].className, "TEST_Part");
  EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
}

TEST_F(Instance_Operations, NamesAskForKeysAlone) {
  bool asked = false;
  script.enumerate = [&](const Instance* model, const Instance_Handler&) {
    asked = true;
    EXPECT_TRUE(null_in(model, "Size"));
    EXPECT_TRUE(null_in(model, "Caption"));
    EXPECT_STREQ(model->__name_space.c_str(), "root/test");
    return 0;
  };
  server.broker.enumerateInstanceNames("TEST_Part");
  EXPECT_TRUE(asked);
}

TEST_F(Instance_Operations, NamesMapTheProvidersStatus) {
  for (const auto& [status, code] :
       {std::pair(70, CMPI_RC_ERR_FAILED), {71, CMPI_RC_ERR_ACCESS_DENIED}}) {
    script.statuses[OPERATION_ENUM_INSTANCES] = status;
    const Reply reply = server.broker.enumerateInstanceNames("TEST_Part");
    EXPECT_EQ(reply.status.rc, code);
    EXPECT_FALSE(reply.done);
  }
}

TEST_F(Instance_Operations, NamesWithAnUnlistedStatusAreOkButNotDone) {
  script.statuses[OPERATION_ENUM_INSTANCES] = 5;
  const Reply reply = server.broker.enumerateInstanceNames("TEST_Part");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_FALSE(reply.done);
}

// ---- enumInstances

TEST_F(Instance_Operations, InstancesAreReturnedWithTheirProperties) {
  serve_two();
  const Reply reply = server.broker.enumerateInstances("TEST_Part");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_THAT(ids(reply), ElementsAre("a", "b"));
  EXPECT_EQ(reply.instances[1].property("Size").asUnsigned(), 2u);
  EXPECT_FALSE(reply.instances[1].has("Caption"));
  EXPECT_EQ(reply.instances[1].path.key("Id").asText(), "b");
  EXPECT_EQ(reply.instances[1].path.nameSpace, "root/test");
  EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
  EXPECT_EQ(reply.report.count(reply.report.leftBehind), 0u) << reply.report.text();
}

TEST_F(Instance_Operations, APropertyListReachesModelAndInstances) {
  script.enumerate = [&](const Instance* model, const Instance_Handler& handler) {
    EXPECT_FALSE(null_in(model, "Size"));
    EXPECT_TRUE(null_in(model, "Caption"));
    Ref<Instance> made(make_part("a", 1));
    put(made, "Caption", "first");
    handler.handle(made.release());
    return 0;
  };
  const Reply reply = server.broker.enumerateInstances("TEST_Part", {{"size", "Unknown", "Id"}});
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_TRUE(reply.instances[0].has("Size"));
  EXPECT_TRUE(reply.instances[0].has("Id"));
  EXPECT_FALSE(reply.instances[0].has("Caption"));
}

TEST_F(Instance_Operations, AnEmptyPropertyListLeavesOnlyThePath) {
  serve_two();
  const Reply reply = server.broker.enumerateInstances("TEST_Part", {std::vector<std::string>()});
  ASSERT_THAT(reply.instances, SizeIs(2));
  EXPECT_TRUE(reply.instances[0].properties.empty());
  EXPECT_EQ(reply.instances[0].path.key("Id").asText(), "a");
}

TEST_F(Instance_Operations, InstancesMapTheProvidersStatus) {
  for (const auto& [status, code] :
       {std::pair(70, CMPI_RC_ERR_FAILED), {71, CMPI_RC_ERR_ACCESS_DENIED}}) {
    script.statuses[OPERATION_ENUM_INSTANCES] = status;
    const Reply reply = server.broker.enumerateInstances("TEST_Part");
    EXPECT_EQ(reply.status.rc, code);
    EXPECT_FALSE(reply.done);
  }
  script.statuses[OPERATION_ENUM_INSTANCES] = 5;
  const Reply reply = server.broker.enumerateInstances("TEST_Part");
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
}

TEST_F(Instance_Operations, AnUnknownClassFailsWithoutAskingTheProvider) {
  server.add<0>("TEST_Unknown");
  for (const Reply& reply : {server.broker.enumerateInstances("TEST_Unknown"),
                             server.broker.enumerateInstanceNames("TEST_Unknown"),
                             server.broker.getInstance(path_of("TEST_Unknown", "a")),
                             server.broker.deleteInstance(path_of("TEST_Unknown", "a"))}) {
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(reply.done);
  }
  EXPECT_THAT(script.work(), ElementsAre(OPERATION_CREATE_PROVIDER, OPERATION_LOAD));
}

TEST_F(Instance_Operations, AnotherClassOfTheRepositoryIsAccepted) {
  server.add<0>("TEST_Spare");
  const Meta_Class* seen = nullptr;
  script.enumerate = [&](const Instance* model, const Instance_Handler&) {
    seen = class_of(model);
    return 0;
  };
  EXPECT_EQ(server.broker.enumerateInstances("TEST_Spare").status.rc, CMPI_RC_OK);
  EXPECT_EQ(seen, Test_Classes::get().spare);
}

// ---- getInstance

TEST_F(Instance_Operations, GetAsksTheProviderWithAllPropertiesWanted) {
  script.get = [&](const Instance* model, Instance*& out) {
    EXPECT_EQ(take<String>(model, "Id"), "b");
    EXPECT_FALSE(null_in(model, "Size"));
    EXPECT_FALSE(null_in(model, "Caption"));
    out = make_part("b", 2);
    return 0;
  };
  const Reply reply = server.broker.getInstance(path_of("TEST_Part", "b"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_EQ(reply.instances[0].property("Size").asUnsigned(), 2u);
  EXPECT_EQ(script.count(OPERATION_ENUM_INSTANCES), 0u);
  EXPECT_EQ(reply.report.count(reply.report.leftBehind), 0u) << reply.report.text();
}

TEST_F(Instance_Operations, GetWithAPropertyListWantsTheListAlone) {
  script.get = [&](const Instance* model, Instance*& out) {
    EXPECT_FALSE(null_in(model, "Size"));
    EXPECT_TRUE(null_in(model, "Caption"));
    EXPECT_FALSE(null_in(model, "Id"));
    out = make_part("b", 2);
    return 0;
  };
  const Reply reply = server.broker.getInstance(path_of("TEST_Part", "b"), {{"Size"}});
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_TRUE(reply.instances[0].has("Size"));
  EXPECT_FALSE(reply.instances[0].has("Id"));
}

TEST_F(Instance_Operations, GetFallsBackToAnEnumeration) {
  serve_two();
  const Reply reply = server.broker.getInstance(path_of("TEST_Part", "b"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_THAT(reply.instances, SizeIs(1));
  EXPECT_EQ(reply.instances[0].property("Size").asUnsigned(), 2u);
}

TEST_F(Instance_Operations, TheFallbackStopsAtTheMatch) {
  int delivered = 0;
  script.enumerate = [&](const Instance*, const Instance_Handler& handler) {
    for (const char* id : {"a", "b", "c"}) {
      ++delivered;
      if (!handler.handle(make_part(id, 1))) break;
    }
    return 0;
  };
  EXPECT_EQ(server.broker.getInstance(path_of("TEST_Part", "b")).status.rc, CMPI_RC_OK);
  EXPECT_EQ(delivered, 2);
}

TEST_F(Instance_Operations, TheFallbackWithoutAMatchIsNotFound) {
  serve_two();
  const Reply reply = server.broker.getInstance(path_of("TEST_Part", "B"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_THAT(reply.instances, IsEmpty());
  EXPECT_FALSE(reply.done);
}

TEST_F(Instance_Operations, AFailedFallbackIsNotFoundEvenWithAMatch) {
  script.enumerate = [&](const Instance*, const Instance_Handler& handler) {
    handler.handle(make_part("b", 1));
    return 71;
  };
  EXPECT_EQ(server.broker.getInstance(path_of("TEST_Part", "b")).status.rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(Instance_Operations, GetMapsTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {{60, CMPI_RC_ERR_NOT_FOUND},
                                       {62, CMPI_RC_ERR_INVALID_PARAMETER},
                                       {63, CMPI_RC_ERR_ACCESS_DENIED},
                                       {64, CMPI_RC_ERR_FAILED}};
  for (const auto& [status, code] : codes) {
    script.statuses[OPERATION_GET_INSTANCE] = status;
    const Reply reply = server.broker.getInstance(path_of("TEST_Part", "b"));
    EXPECT_EQ(reply.status.rc, code) << status;
    EXPECT_THAT(reply.instances, IsEmpty());
  }
}

TEST_F(Instance_Operations, GetWithNothingInHandFails) {
  script.statuses[OPERATION_GET_INSTANCE] = 0;
  EXPECT_EQ(server.broker.getInstance(path_of("TEST_Part", "b")).status.rc, CMPI_RC_ERR_FAILED);
}

// ---- createInstance

TEST_F(Instance_Operations, CreateReturnsThePathWithTheKeysThatTheProviderCompleted) {
  script.create = [&](Instance* instance) {
    EXPECT_EQ(take<std::uint32_t>(instance, "Size"), 7u);
    EXPECT_TRUE(null_in(instance, "Caption"));
    EXPECT_STREQ(instance->__name_space.c_str(), "root/test");
    put(instance, "Id", "made");
    return 0;
  };
  const Reply reply = server.broker.createInstance(part_object("wanted"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_THAT(ids(reply), ElementsAre("made"));
  EXPECT_EQ(reply.paths[0].nameSpace, "root/test");
}

TEST_F(Instance_Operations, CreateMapsTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {{80, CMPI_RC_ERR_ALREADY_EXISTS},
                                       {81, CMPI_RC_ERR_NOT_SUPPORTED},
                                       {82, CMPI_RC_ERR_INVALID_PARAMETER},
                                       {83, CMPI_RC_ERR_ACCESS_DENIED},
                                       {84, CMPI_RC_ERR_FAILED},
                                       {5, CMPI_RC_OK}};
  for (const auto& [status, code] : codes) {
    script.statuses[OPERATION_CREATE_INSTANCE] = status;
    const Reply reply = server.broker.createInstance(part_object("a"));
    EXPECT_EQ(reply.status.rc, code) << status;
    EXPECT_THAT(reply.paths, IsEmpty()) << status;
    EXPECT_FALSE(reply.done) << status;
  }
}

TEST_F(Instance_Operations, UnknownPropertiesAreLoggedAndIgnored) {
  script.create = [](Instance*) { return 0; };
  Object object = part_object("a");
  object.properties.set("Colour", Any::string("red"));
  Trace_Log log;
  EXPECT_EQ(server.broker.createInstance(object).status.rc, CMPI_RC_OK);
  EXPECT_TRUE(log.has("WARN", "unknown feature: TEST_Part.Colour"));
}

TEST_F(Instance_Operations, APropertyOfAnotherTypeStaysNull) {
  script.create = [](Instance* instance) {
    EXPECT_TRUE(null_in(instance, "Size"));
    return 0;
  };
  Object object = part_object("a");
  object.properties.set("Size", Any::number(CMPI_uint64, 7));
  Trace_Log log;
  EXPECT_EQ(server.broker.createInstance(object).status.rc, CMPI_RC_OK);
  EXPECT_TRUE(log.has("WARN", "type mismatch on Size: uint64/uint32"));
  EXPECT_TRUE(log.has("WARN", "unexpected failure: TEST_Part.Size"));
}

// ---- modifyInstance

TEST_F(Instance_Operations, ModifyWithoutAListWantsEverything) {
  script.modify = [](const Instance* model, const Instance* instance) {
    EXPECT_FALSE(null_in(model, "Size"));
    EXPECT_FALSE(null_in(model, "Caption"));
    EXPECT_FALSE(null_in(model, "Id"));
    EXPECT_TRUE(null_in(instance, "Caption"));
    EXPECT_EQ(take<std::uint32_t>(instance, "Size"), 7u);
    return 0;
  };
  const Reply reply = server.broker.modifyInstance(part_object("a"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_THAT(ids(reply), ElementsAre("a"));
}

TEST_F(Instance_Operations, ModifyWithAListWantsTheListAlone) {
  script.modify = [](const Instance* model, const Instance*) {
    EXPECT_TRUE(null_in(model, "Size"));
    EXPECT_FALSE(null_in(model, "Caption"));
    EXPECT_FALSE(null_in(model, "Id"));
    return 0;
  };
  EXPECT_EQ(server.broker.modifyInstance(part_object("a"), {{"Caption"}}).status.rc, CMPI_RC_OK);
  EXPECT_EQ(script.count(OPERATION_MODIFY_INSTANCE), 1u);
}

TEST_F(Instance_Operations, ModifyMapsTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {{100, CMPI_RC_ERR_NOT_FOUND},
                                       {101, CMPI_RC_ERR_NOT_SUPPORTED},
                                       {102, CMPI_RC_ERR_INVALID_PARAMETER},
                                       {103, CMPI_RC_ERR_ACCESS_DENIED},
                                       {104, CMPI_RC_ERR_FAILED},
                                       {5, CMPI_RC_OK}};
  for (const auto& [status, code] : codes) {
    script.statuses[OPERATION_MODIFY_INSTANCE] = status;
    const Reply reply = server.broker.modifyInstance(part_object("a"));
    EXPECT_EQ(reply.status.rc, code) << status;
    EXPECT_THAT(reply.paths, IsEmpty()) << status;
    EXPECT_FALSE(reply.done) << status;
  }
}

// ---- deleteInstance, execQuery

TEST_F(Instance_Operations, DeletePassesTheKeys) {
  script.erase = [](const Instance* model) {
    EXPECT_EQ(take<String>(model, "Id"), "a");
    EXPECT_TRUE(null_in(model, "Size"));
    return 0;
  };
  const Reply reply = server.broker.deleteInstance(path_of("TEST_Part", "a"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_EQ(script.count(OPERATION_DELETE_INSTANCE), 1u);
}

TEST_F(Instance_Operations, DeleteMapsTheProvidersStatus) {
  const std::map<int, CMPIrc> codes = {{90, CMPI_RC_ERR_NOT_FOUND},
                                       {91, CMPI_RC_ERR_NOT_SUPPORTED},
                                       {92, CMPI_RC_ERR_ACCESS_DENIED},
                                       {93, CMPI_RC_ERR_FAILED}};
  for (const auto& [status, code] : codes) {
    script.statuses[OPERATION_DELETE_INSTANCE] = status;
    const Reply reply = server.broker.deleteInstance(path_of("TEST_Part", "a"));
    EXPECT_EQ(reply.status.rc, code) << status;
    EXPECT_FALSE(reply.done) << status;
  }
  script.statuses[OPERATION_DELETE_INSTANCE] = 5;
  const Reply reply = server.broker.deleteInstance(path_of("TEST_Part", "a"));
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
}

TEST_F(Instance_Operations, QueriesAreNotSupportedAndReachNoProvider) {
  server.broker.interface("TEST_Part", tvx::host::InterfaceKind::Instance);
  const std::vector<std::uint32_t> before = script.calls;
  Trace_Log log;
  const Reply reply = server.broker.execQuery("TEST_Part", "select * from TEST_Part", "WQL");
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(script.calls, before);
  EXPECT_THAT(log.texts("DBG"),
              ElementsAre("enter: execQuery()", "return: execQuery(): CMPI_RC_ERR_NOT_SUPPORTED"));
}

// ---- Log lines and failures of every operation

TEST_F(Instance_Operations, EveryOperationLogsItsEnterAndReturnLines) {
  server.broker.interface("TEST_Part", tvx::host::InterfaceKind::Instance);
  const auto expect_lines = [](const Trace_Log& log, const std::string& name,
                               const std::string& code) {
    EXPECT_THAT(log.texts("DBG"),
                ElementsAre("enter: " + name + "()", "return: " + name + "(): " + code));
  };
  script.statuses = {{OPERATION_ENUM_INSTANCES, 71},
                     {OPERATION_GET_INSTANCE, 60},
                     {OPERATION_CREATE_INSTANCE, 80},
                     {OPERATION_MODIFY_INSTANCE, 102},
                     {OPERATION_DELETE_INSTANCE, 91}};
  {
    Trace_Log log;
    server.broker.enumerateInstanceNames("TEST_Part");
    expect_lines(log, "enumInstanceNames", "CMPI_RC_ERR_ACCESS_DENIED");
  }
  {
    Trace_Log log;
    server.broker.enumerateInstances("TEST_Part");
    expect_lines(log, "enumInstances", "CMPI_RC_ERR_ACCESS_DENIED");
  }
  {
    Trace_Log log;
    server.broker.getInstance(path_of("TEST_Part", "a"));
    expect_lines(log, "getInstance", "CMPI_RC_ERR_NOT_FOUND");
  }
  {
    Trace_Log log;
    server.broker.createInstance(part_object("a"));
    expect_lines(log, "createInstance", "CMPI_RC_ERR_ALREADY_EXISTS");
  }
  {
    Trace_Log log;
    server.broker.modifyInstance(part_object("a"));
    expect_lines(log, "modifyInstance", "CMPI_RC_ERR_INVALID_PARAMETER");
  }
  {
    Trace_Log log;
    server.broker.deleteInstance(path_of("TEST_Part", "a"));
    expect_lines(log, "deleteInstance", "CMPI_RC_ERR_NOT_SUPPORTED");
  }
}

TEST_F(Instance_Operations, WhatAProviderThrowsEndsAsAFailure) {
  const auto fail = [](auto&&...) -> std::int32_t { throw std::runtime_error("broken"); };
  script.enumerate = [this](const Instance*, const Instance_Handler& handler) -> std::int32_t {
    handler.handle(make_part("a", 1));
    throw std::runtime_error("broken");
  };
  script.get = [this](const Instance*, Instance*& out) -> std::int32_t {
    out = make_part("a", 1);
    throw 5;
  };
  script.create = fail;
  script.modify = fail;
  script.erase = fail;
  for (const Reply& reply : {server.broker.enumerateInstanceNames("TEST_Part"),
                             server.broker.enumerateInstances("TEST_Part"),
                             server.broker.getInstance(path_of("TEST_Part", "a")),
                             server.broker.createInstance(part_object("a")),
                             server.broker.modifyInstance(part_object("a")),
                             server.broker.deleteInstance(path_of("TEST_Part", "a"))}) {
    EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(reply.done);
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
  }
  EXPECT_EQ(Thread_Context::top(), nullptr);
  EXPECT_EQ(Slot<0>::data.adapter->lock.try_lock(), 0);
  Slot<0>::data.adapter->lock.unlock();
  EXPECT_EQ(Slot<0>::data.requests.load(), 0u);
}

TEST_F(Instance_Operations, AServerOfTheFirstVersionIsServedTheSame) {
  for (const int version : {0, 100}) {
    Script own;
    Test_Server old(version);
    old.serve<1>(own, part);
    own.enumerate = [this](const Instance*, const Instance_Handler& handler) {
      handler.handle(make_part("a", 1));
      return 0;
    };
    EXPECT_THAT(old.broker.enumerateInstances("TEST_Part").instances, SizeIs(1));
    EXPECT_THAT(old.broker.enumerateInstanceNames("TEST_Part").paths, SizeIs(1));
    EXPECT_EQ(old.broker.getInstance(path_of("TEST_Part", "a")).status.rc, CMPI_RC_OK);
  }
}

TEST_F(Instance_Operations, ARequestRunsUnderTheClassLockAndWithAContext) {
  script.enumerate = [](const Instance*, const Instance_Handler&) {
    EXPECT_NE(Thread_Context::top(), nullptr);
    int held = 0;
    std::thread([&] { held = Slot<0>::data.adapter->lock.try_lock(); }).join();
    EXPECT_EQ(held, EBUSY);
    return 0;
  };
  EXPECT_EQ(server.broker.enumerateInstances("TEST_Part").status.rc, CMPI_RC_OK);
  EXPECT_EQ(script.count(OPERATION_ENUM_INSTANCES), 1u);
}

TEST_F(Instance_Operations, TwoClassesAreServedAtTheSameTime) {
  Script other;
  server.serve<1>(other, Test_Classes::get().spare);
  std::atomic<int> inside = 0;
  const auto meet = [&](const Instance*, const Instance_Handler&) {
    ++inside;
    while (inside < 2) std::this_thread::yield();
    return 0;
  };
  script.enumerate = meet;
  other.enumerate = meet;
  std::thread first([&] { server.broker.enumerateInstances("TEST_Part"); });
  server.broker.enumerateInstances("TEST_Spare");
  first.join();
  EXPECT_EQ(inside, 2);
  server.broker.unload(true);
}

TEST_F(Instance_Operations, OneClassServesOneRequestAtATime) {
  std::atomic<int> inside = 0;
  std::atomic<int> most = 0;
  script.enumerate = [&](const Instance*, const Instance_Handler&) {
    const int now = ++inside;
    if (now > most) most = now;
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
    --inside;
    return 0;
  };
  std::vector<std::thread> all;
  for (int i = 0; i < 4; ++i)
    all.emplace_back([&] { server.broker.enumerateInstances("TEST_Part"); });
  for (std::thread& each : all) each.join();
  EXPECT_EQ(most, 1);
}

}  // namespace
}  // namespace cimrt::test
