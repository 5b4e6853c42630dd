// Up-calls of providers, with and without a context, and threads that providers start.
#include <gmock/gmock.h>
#include <unistd.h>

#include <thread>

#include "Faulty_Broker.h"
#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "cmpi/CMPI_Thread_Context.h"
#include "cmpi/cimom.h"
#include "runtime/Threads.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr const char* NS = "root/test";

/// A provider of TEST_Element whose requests run what a test wants, in a server that also serves
/// TEST_All and keeps two foreign parts.
class Up_Calls : public ::testing::Test {
 protected:
  Up_Calls() {
    server.serve<0>(caller, classes.element);
    server.serve<1>(target, classes.all);
    server.broker.addForeign(R"({"version": 1, "instances": [
      {"class": "TEST_Part", "namespace": "root/test", "keys": ["Id"], "properties":
        {"Id": {"type": "string", "value": "one"}, "Size": {"type": "uint32", "value": 1}}},
      {"class": "TEST_Part", "namespace": "root/test", "keys": ["Id"], "properties":
        {"Id": {"type": "string", "value": "two"}, "Size": {"type": "uint32", "value": 2}}}],
      "failures": [{"class": "TEST_Spare", "operation": "enumerateInstances", "rc": 1},
                   {"class": "TEST_Spare", "operation": "getInstance", "rc": 2}]})");
  }

  /// Runs `work` as a provider would, inside a request.
  tvx::host::Reply in_request(std::function<void()> work) {
    bool ran = false;
    caller.enumerate = [&](const Instance*, const Instance_Handler&) {
      work();
      ran = true;
      return 0;
    };
    tvx::host::Reply reply = server.broker.enumerateInstances("TEST_Element");
    EXPECT_TRUE(ran);
    EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    return reply;
  }
  Ref<Instance> part(const char* id) const { return make_element(classes.part, id); }

  const Test_Classes& classes = Test_Classes::get();
  Script caller;
  Script target;
  Test_Server server;
};

// ---- Without a context

TEST_F(Up_Calls, WithoutAContextEachFailsInItsOwnWay) {
  ASSERT_EQ(Thread_Context::top(), nullptr);
  const Ref<Instance> model = part("one");
  String name("before");
  EXPECT_FALSE(cimom::get_username(name));
  EXPECT_EQ(name, "before");
  cimom::allow_unload(false);
  EXPECT_EQ(cimom::create_instance(NS, model.get()), -1);
  EXPECT_EQ(cimom::modify_instance(NS, model.get()), -1);
  EXPECT_EQ(cimom::delete_instance(NS, model.get()), -1);
  EXPECT_EQ(cimom::invoke_method(NS, model.get(), model.get()), -1);
  EXPECT_FALSE(cimom::get_instance(NS, model.get()));
  Instance_Enumerator enumerator;
  EXPECT_EQ(cimom::enum_instances(NS, model.get(), enumerator), -1);
  EXPECT_FALSE(enumerator.more());
  enumerator.next();
  EXPECT_FALSE(enumerator.get());
}

TEST_F(Up_Calls, AContextOfAnotherThreadIsNoContext) {
  in_request([&] {
    std::thread([&] { EXPECT_FALSE(cimom::get_instance(NS, part("one").get())); }).join();
    EXPECT_TRUE(cimom::get_instance(NS, part("one").get()));
  });
}

TEST_F(Up_Calls, TheListFormIsNotAvailable) {
  const auto call = [this] {
    dup2(STDERR_FILENO, STDOUT_FILENO);  // what is printed is looked at as well
    alignas(Array_Base) unsigned char place[sizeof(Array_Base)] = {};
    cimom::enum_instances(NS, part("one").get(), reinterpret_cast<Array<Instance>&>(place));
  };
  EXPECT_DEATH(call(), "NOT IMPLEMENTED\\.\n(.*\n)*.*assert: false");
}

// ---- Instances

TEST_F(Up_Calls, GetAnswersTheServersInstance) {
  in_request([&] {
    const Ref<Instance> found = cimom::get_instance(NS, part("two").get());
    ASSERT_TRUE(found);
    EXPECT_EQ(class_of(found.get()), classes.part);
    EXPECT_EQ(take<std::uint32_t>(found.get(), "Size"), 2u);
    EXPECT_STREQ(found->__name_space.c_str(), NS);
  });
}

TEST_F(Up_Calls, GetAnswersNullWhenThereIsNone) {
  in_request([&] {
    EXPECT_FALSE(cimom::get_instance(NS, part("three").get()));
    EXPECT_FALSE(cimom::get_instance(NS, make_element(classes.spare, "x").get()));
    EXPECT_FALSE(cimom::get_instance(nullptr, part("one").get()));
    EXPECT_FALSE(cimom::get_instance(NS, nullptr));
  });
}

TEST_F(Up_Calls, EnumerationsWalkAllInstances) {
  in_request([&] {
    Instance_Enumerator enumerator;
    ASSERT_EQ(cimom::enum_instances(NS, part("").get(), enumerator), 0);
    std::vector<std::string> ids;
    for (; enumerator.more(); enumerator.next()) {
      const Ref<Instance> item = enumerator.get();
      ids.push_back(take<String>(item.get(), "Id").c_str());
      EXPECT_STREQ(item->__name_space.c_str(), NS);
    }
    EXPECT_THAT(ids, ElementsAre("one", "two"));
    EXPECT_FALSE(enumerator.get());
    enumerator.next();
    EXPECT_FALSE(enumerator.more());
  });
}

TEST_F(Up_Calls, AnEnumeratorMayBeLeftEarlyAndUsedAgain) {
  in_request([&] {
    Instance_Enumerator enumerator;
    ASSERT_EQ(cimom::enum_instances(NS, part("").get(), enumerator), 0);
    const Ref<Instance> kept = enumerator.get();
    ASSERT_EQ(cimom::enum_instances(NS, part("").get(), enumerator), 0);
    EXPECT_TRUE(enumerator.more());
    EXPECT_EQ(take<String>(kept.get(), "Id"), "one");
  });
}

TEST_F(Up_Calls, AnEmptyClassHasNothingMore) {
  in_request([&] {
    target.statuses[OPERATION_ENUM_INSTANCES] = 0;
    Instance_Enumerator enumerator;
    ASSERT_EQ(cimom::enum_instances(NS, make_element(classes.all, "").get(), enumerator), 0);
    EXPECT_FALSE(enumerator.more());
    EXPECT_FALSE(enumerator.get());
  });
}

TEST_F(Up_Calls, RefusedEnumerationsAnswerAFailure) {
  in_request([&] {
    Instance_Enumerator enumerator;
    EXPECT_EQ(cimom::enum_instances(NS, make_element(classes.spare, "").get(), enumerator), -1);
    EXPECT_FALSE(enumerator.more());
    EXPECT_EQ(cimom::enum_instances(nullptr, part("").get(), enumerator), -1);
    EXPECT_EQ(cimom::enum_instances(NS, nullptr, enumerator), -1);
  });
}

TEST_F(Up_Calls, AFailedEnumerationForgetsTheOneBefore) {
  in_request([&] {
    Instance_Enumerator enumerator;
    ASSERT_EQ(cimom::enum_instances(NS, part("").get(), enumerator), 0);
    EXPECT_EQ(cimom::enum_instances(NS, make_element(classes.spare, "").get(), enumerator), -1);
    EXPECT_FALSE(enumerator.more());
  });
}

TEST_F(Up_Calls, InstancesAreCreatedChangedAndDeleted) {
  in_request([&] {
    const Ref<Instance> made = part("three");
    put(made, "Size", std::uint32_t{3});
    EXPECT_EQ(cimom::create_instance(NS, made.get()), 0);
    EXPECT_EQ(cimom::create_instance(NS, made.get()), -1);
    ASSERT_TRUE(cimom::get_instance(NS, made.get()));

    put(made, "Size", std::uint32_t{33});
    EXPECT_EQ(cimom::modify_instance(NS, made.get()), 0);
    const Ref<Instance> changed = cimom::get_instance(NS, made.get());
    ASSERT_TRUE(changed);
    EXPECT_EQ(take<std::uint32_t>(changed.get(), "Size"), 33u);

    EXPECT_EQ(cimom::delete_instance(NS, made.get()), 0);
    EXPECT_EQ(cimom::delete_instance(NS, made.get()), -1);
    EXPECT_EQ(cimom::modify_instance(NS, made.get()), -1);
  });
}

TEST_F(Up_Calls, NullArgumentsAreRefused) {
  in_request([&] {
    const Ref<Instance> model = part("one");
    EXPECT_EQ(cimom::create_instance(nullptr, model.get()), -1);
    EXPECT_EQ(cimom::create_instance(NS, nullptr), -1);
    EXPECT_EQ(cimom::modify_instance(nullptr, model.get()), -1);
    EXPECT_EQ(cimom::modify_instance(NS, nullptr), -1);
    EXPECT_EQ(cimom::delete_instance(nullptr, model.get()), -1);
    EXPECT_EQ(cimom::delete_instance(NS, nullptr), -1);
  });
}

TEST_F(Up_Calls, AnUpCallIntoTheOwnClassReenters) {
  caller.get = [this](const Instance* model, Instance*& out) {
    out = make_element(classes.element, take<String>(model, "Id").c_str()).release();
    return 0;
  };
  in_request([&] {
    const Ref<Instance> own = make_element(classes.element, "self");
    const Ref<Instance> found = cimom::get_instance(NS, own.get());
    ASSERT_TRUE(found);
    EXPECT_EQ(take<String>(found.get(), "Id"), "self");
  });
  EXPECT_EQ(caller.count(OPERATION_GET_INSTANCE), 1u);
}

// ---- Methods

class Method_Calls : public Up_Calls {
 protected:
  Ref<Instance> record() {
    Ref<Instance> made(create(classes.run));
    nullify_properties(made.get(), true, true, true);
    return made;
  }
  Ref<Instance> all = make_element(classes.all, "x");
};

TEST_F(Method_Calls, AMethodTakesItsInParametersAndFillsTheRecord) {
  target.invoke = [&](const Instance* instance, Instance* call) {
    EXPECT_EQ(take<String>(instance, "Id"), "x");
    EXPECT_EQ(take<String>(call, "Istring"), "in");
    EXPECT_TRUE(null_in(call, "Ouint32"));
    put(call, "Ouint32", std::uint32_t{8});
    put(call, "return_value", std::uint32_t{9});
    refer(call, "OPart", part("new").get());
    return 0;
  };
  in_request([&] {
    const Ref<Instance> call = record();
    put(call, "Istring", "in");
    refer(call.get(), "OPart", part("old").get());
    ASSERT_EQ(cimom::invoke_method(NS, all.get(), call.get()), 0);
    EXPECT_EQ(take<std::uint32_t>(call.get(), "Ouint32"), 8u);
    EXPECT_EQ(take<std::uint32_t>(call.get(), "return_value"), 9u);
    EXPECT_EQ(take<String>(take<Instance*>(call.get(), "OPart"), "Id"), "new");
    EXPECT_STREQ(call->__name_space.c_str(), NS);
  });
}

TEST_F(Method_Calls, AStaticMethodIsCalledOnTheClass) {
  target.invoke = [&](const Instance* instance, Instance* call) {
    EXPECT_TRUE(null_in(instance, "Id"));
    put(call, "return_value", std::uint32_t{1});
    return 0;
  };
  in_request([&] {
    const Ref<Instance> call(create(classes.ping));
    EXPECT_EQ(cimom::invoke_method(NS, all.get(), call.get()), 0);
  });
  EXPECT_EQ(target.count(OPERATION_INVOKE_METHOD), 1u);
}

TEST_F(Method_Calls, MissingArgumentsAreLoggedAndNothingIsCalled) {
  in_request([&] {
    const Ref<Instance> call = record();
    Trace_Log log;
    EXPECT_EQ(cimom::invoke_method(nullptr, all.get(), call.get()), -1);
    EXPECT_EQ(cimom::invoke_method(NS, nullptr, call.get()), -1);
    EXPECT_EQ(cimom::invoke_method(NS, all.get(), nullptr), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("failed", "failed", "failed"));
  });
  EXPECT_EQ(target.count(OPERATION_INVOKE_METHOD), 0u);
}

TEST_F(Method_Calls, AClassWithoutRepositoryIsRefused) {
  in_request([&] {
    const Ref<Instance> call = record();
    const Meta_Class* lost = Record_Builder().property("Id", STRING, FLAG_KEY).build_class("Lost");
    Trace_Log log;
    EXPECT_EQ(cimom::invoke_method(NS, make_element(lost, "x").get(), call.get()), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("failed"));
  });
}

TEST_F(Method_Calls, TheServersRefusalIsLoggedWithItsCode) {
  target.statuses[OPERATION_INVOKE_METHOD] = 132;
  in_request([&] {
    const Ref<Instance> call = record();
    Trace_Log log;
    EXPECT_EQ(cimom::invoke_method(NS, all.get(), call.get()), -1);
    EXPECT_TRUE(log.has("WARN", "failed[2]"));
  });
}

TEST_F(Method_Calls, AReturnValueOfAnotherTypeFails) {
  server.broker.addForeign(R"({"version": 1, "methods": [
      {"class": "TEST_All", "method": "Run", "return": {"type": "string", "value": "x"}}]})");
  in_request([&] {
    const Ref<Instance> call = record();
    Trace_Log log;
    EXPECT_EQ(cimom::invoke_method(NS, all.get(), call.get()), -1);
    EXPECT_TRUE(log.has("WARN", "failed"));
  });
}

/// A context over a server that makes no objects.
TEST_F(Method_Calls, AServerThatMakesNoObjectsFailsEveryCall) {
  in_request([&] {
    Faulty_Broker faulty(server.broker.face());
    const auto* outer = static_cast<CMPI_Thread_Context*>(Thread_Context::top());
    CMPI_Thread_Context context(faulty.face(), outer->context(), Slot<0>::data.adapter);
    Thread_Context::push(&context);
    const Ref<Instance> call = record();
    const auto expect_failed = [&](const char* function, int from) {
      Trace_Log log;
      faulty.fail(function, from);
      EXPECT_EQ(cimom::invoke_method(NS, all.get(), call.get()), -1) << function;
      EXPECT_TRUE(log.has("WARN", "failed")) << function;
      faulty.heal();
    };
    expect_failed("newObjectPath", 1);
    expect_failed("newArgs", 1);
    expect_failed("newArgs", 2);

    faulty.fail("newObjectPath");
    Instance_Enumerator enumerator;
    EXPECT_FALSE(cimom::get_instance(NS, part("one").get()));
    EXPECT_EQ(cimom::enum_instances(NS, part("one").get(), enumerator), -1);
    EXPECT_EQ(cimom::create_instance(NS, part("one").get()), -1);
    EXPECT_EQ(cimom::modify_instance(NS, part("one").get()), -1);
    EXPECT_EQ(cimom::delete_instance(NS, part("one").get()), -1);
    faulty.heal();
    faulty.fail("newInstance");
    EXPECT_EQ(cimom::create_instance(NS, part("four").get()), -1);
    EXPECT_EQ(cimom::modify_instance(NS, part("one").get()), -1);
    Thread_Context::pop();
  });
  EXPECT_EQ(target.count(OPERATION_INVOKE_METHOD), 0u);
}

// ---- Users

TEST_F(Up_Calls, TheUsersNameComesFromTheRequest) {
  in_request([&] {
    String name;
    EXPECT_TRUE(cimom::get_username(name));
    EXPECT_EQ(name, "root");
  });
}

TEST_F(Up_Calls, AMissingUserIsLogged) {
  Request_Objects objects(server);
  server.broker.interface("TEST_Element", tvx::host::InterfaceKind::Instance);
  CMPI_Thread_Context context(server.broker.face(), objects.context, Slot<0>::data.adapter);
  Thread_Context::push(&context);
  Trace_Log log;
  String name("before");
  EXPECT_FALSE(cimom::get_username(name));
  EXPECT_EQ(name, "before");
  const std::vector<std::string> errors = log.texts("ERR");
  ASSERT_EQ(errors.size(), 1u);
  EXPECT_EQ(errors[0].substr(0, 23), "username not OK cmpirc=");
  Thread_Context::pop();
}

TEST_F(Up_Calls, AUserWithoutTextIsEmpty) {
  tvx::host::BrokerOptions options;
  options.nameSpace = NS;
  options.user.reset();
  tvx::host::Broker silent(options);
  silent.addProvider("TEST_Element", {&Slot<5>::instance, nullptr, nullptr});
  Test_Server registrar;
  Script script;
  registrar.serve<5>(script, classes.element);
  script.enumerate = [](const Instance*, const Instance_Handler&) {
    String name("before");
    EXPECT_TRUE(cimom::get_username(name));
    EXPECT_EQ(name, "");
    return 0;
  };
  EXPECT_EQ(silent.enumerateInstances("TEST_Element").status.rc, CMPI_RC_OK);
  EXPECT_EQ(script.count(OPERATION_ENUM_INSTANCES), 1u);
  silent.unload(true);
}

// ---- Threads

struct Thread_Work {
  std::function<void()> run;
  static void* start(void* self) {
    static_cast<Thread_Work*>(self)->run();
    return nullptr;
  }
};

TEST_F(Up_Calls, AThreadOfAProviderMayCallTheServer) {
  bool found = false;
  Thread_Work work;
  Thread thread;
  work.run = [&] { found = static_cast<bool>(cimom::get_instance(NS, part("one").get())); };
  in_request([&] { ASSERT_EQ(Thread::create_joinable(thread, &Thread_Work::start, &work), 0); });
  void* out = nullptr;
  Thread::join(thread, out);
  EXPECT_TRUE(found);
  EXPECT_EQ(server.broker.openAttachments(), 0u);
  ASSERT_EQ(server.broker.threadReports().size(), 1u);
  EXPECT_FALSE(server.broker.threadReports()[0].leaks());
  EXPECT_THAT(server.broker.lateNotes(), IsEmpty());
}

TEST_F(Up_Calls, AThreadMayOutliveTheAdapterThatStartedIt) {
  std::atomic<bool> go = false;
  bool found = false;
  Thread_Work work;
  Thread thread;
  work.run = [&] {
    while (!go) std::this_thread::yield();
    cimom::allow_unload(false);
    found = static_cast<bool>(cimom::get_instance(NS, part("one").get()));
  };
  in_request([&] { ASSERT_EQ(Thread::create_joinable(thread, &Thread_Work::start, &work), 0); });
  server.broker.cleanup("TEST_Element", tvx::host::InterfaceKind::Instance, false);
  EXPECT_EQ(Slot<0>::data.adapter, nullptr);
  go = true;
  void* out = nullptr;
  Thread::join(thread, out);
  EXPECT_TRUE(found);
}

TEST_F(Up_Calls, AThreadStartedWithoutAContextHasNone) {
  bool had_context = true;
  Thread_Work work;
  Thread thread;
  work.run = [&] { had_context = Thread_Context::top() != nullptr; };
  ASSERT_EQ(Thread::create_joinable(thread, &Thread_Work::start, &work), 0);
  void* out = nullptr;
  Thread::join(thread, out);
  EXPECT_FALSE(had_context);
}

/// Starts a thread of a provider in a server whose table of up-calls was changed, and tells whether
/// it reached the server.
class Odd_Servers : public Up_Calls {
 protected:
  bool thread_reaches_server(const std::function<void(CMPIBrokerFT&)>& change) {
    Thread_Work work;
    Thread thread;
    bool found = true;
    work.run = [&] {
      EXPECT_NE(Thread_Context::top(), nullptr);
      found = static_cast<bool>(cimom::get_instance(NS, part("one").get()));
      String name;
      EXPECT_EQ(cimom::get_username(name), found);
    };
    in_request([&] {
      Faulty_Broker faulty(server.broker.face());
      change(faulty.up_calls());
      const auto* outer = static_cast<CMPI_Thread_Context*>(Thread_Context::top());
      CMPI_Thread_Context context(faulty.face(), outer->context(), Slot<0>::data.adapter);
      Thread_Context::push(&context);
      EXPECT_EQ(Thread::create_joinable(thread, &Thread_Work::start, &work), 0);
      void* out = nullptr;
      Thread::join(thread, out);
      Thread_Context::pop();
    });
    return found;
  }
};

TEST_F(Odd_Servers, OneThatCannotAttachLeavesTheThreadWithoutUpCalls) {
  EXPECT_TRUE(thread_reaches_server([](CMPIBrokerFT&) {}));
  EXPECT_FALSE(thread_reaches_server([](CMPIBrokerFT& table) {
    table.prepareAttachThread = [](const CMPIBroker*, const CMPIContext*) -> CMPIContext* {
      return nullptr;
    };
  }));
}

TEST_F(Odd_Servers, OneThatLacksTheFunctionsLeavesTheThreadWithoutUpCalls) {
  EXPECT_FALSE(
      thread_reaches_server([](CMPIBrokerFT& table) { table.prepareAttachThread = nullptr; }));
  EXPECT_FALSE(thread_reaches_server([](CMPIBrokerFT& table) { table.attachThread = nullptr; }));
  EXPECT_FALSE(thread_reaches_server([](CMPIBrokerFT& table) { table.detachThread = nullptr; }));
  EXPECT_EQ(server.broker.openAttachments(), 0u);
}

}  // namespace
}  // namespace cimrt::test
