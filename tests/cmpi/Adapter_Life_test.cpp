// Factories, clean-up and the life of a class's adapter.
#include <gmock/gmock.h>

#include <atomic>
#include <stdexcept>
#include <thread>

#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "cmpi/cimom.h"
#include "runtime/Thread_Context.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::StartsWith;
using tvx::host::InterfaceKind;

class Adapter_Life : public ::testing::Test {
 protected:
  Adapter_Life() { server.serve<0>(script, Test_Classes::get().element); }

  using Class = Slot<0>;

  const CMPIBroker* face() { return server.broker.face(); }
  void* make(char letter) { return Class::make(face(), objects.context, letter); }
  CMPIStatus cleanup_instance(bool terminating) {
    return Class::data.instance_mi.ft->cleanup(&Class::data.instance_mi, objects.context,
                                               terminating ? 1 : 0);
  }
  CMPIStatus enumerate() {
    tvx::host::Reply reply;
    CMPIResult* result = tvx::host::makeResult(server.core(), reply);
    return Class::data.instance_mift.enumerateInstanceNames(
        &Class::data.instance_mi, objects.context, result,
        objects.path(path_of("TEST_Element", "a")));
  }
  /// Takes off whatever a test left.
  ~Adapter_Life() override {
    while (Class::data.adapter) cleanup_instance(true);
  }

  Script script;
  Test_Server server;
  Request_Objects objects{server};
};

TEST_F(Adapter_Life, EachLetterAnswersItsOwnInterface) {
  EXPECT_EQ(make('I'), &Class::data.instance_mi);
  EXPECT_EQ(make('M'), &Class::data.method_mi);
  EXPECT_EQ(make('A'), &Class::data.association_mi);
  EXPECT_EQ(make('N'), &Class::data.indication_mi);

  EXPECT_EQ(Class::data.instance_mi.hdl, &Class::data);
  EXPECT_EQ(Class::data.instance_mi.ft, &Class::data.instance_mift);
  EXPECT_EQ(Class::data.method_mi.hdl, &Class::data);
  EXPECT_EQ(Class::data.method_mi.ft, &Class::data.method_mift);
  EXPECT_EQ(Class::data.association_mi.hdl, &Class::data);
  EXPECT_EQ(Class::data.association_mi.ft, &Class::data.association_mift);
  EXPECT_EQ(Class::data.indication_mi.hdl, &Class::data);
  EXPECT_EQ(Class::data.indication_mi.ft, &Class::data.indication_mift);
  EXPECT_EQ(Class::data.adapter->load_count, 4u);
}

TEST_F(Adapter_Life, AnUnknownLetterAnswersNothingButCounts) {
  EXPECT_EQ(make('X'), nullptr);
  ASSERT_NE(Class::data.adapter, nullptr);
  EXPECT_EQ(Class::data.adapter->load_count, 1u);
  EXPECT_EQ(make('P'), nullptr);
  EXPECT_EQ(Class::data.adapter->load_count, 2u);
}

TEST_F(Adapter_Life, TheFactoryAlwaysAnswersZero) {
  void* result = nullptr;
  for (const char letter : {'I', 'M', 'A', 'N', 'Z'})
    EXPECT_EQ(cimrt_cmpi_adapter('C', &Class::data, &Class::registration, face(), objects.context,
                                 "TEST_Provider", letter, &result),
              0);
}

TEST_F(Adapter_Life, TablesAreCompleteAndOfTheFirstVersion) {
  make('I');
  const CMPI_Static_Data& data = Class::data;
  EXPECT_EQ(data.magic, 0x5DE2B131u);
  EXPECT_EQ(data.instance_mift.ftVersion, 100);
  EXPECT_EQ(data.instance_mift.miVersion, 100);
  EXPECT_EQ(data.method_mift.ftVersion, 100);
  EXPECT_EQ(data.method_mift.miVersion, 100);
  EXPECT_EQ(data.indication_mift.ftVersion, 100);
  EXPECT_EQ(data.indication_mift.miVersion, 100);
  EXPECT_EQ(data.association_mift.ftVersion, 100);
  EXPECT_EQ(data.association_mift.miVersion, 100);

  const CMPIInstanceMIFT& i = data.instance_mift;
  EXPECT_TRUE(i.cleanup && i.enumerateInstanceNames && i.enumerateInstances && i.getInstance);
  EXPECT_TRUE(i.createInstance && i.modifyInstance && i.deleteInstance && i.execQuery);
  EXPECT_EQ(i.enumerateInstancesFiltered, nullptr);
  const CMPIAssociationMIFT& a = data.association_mift;
  EXPECT_TRUE(a.cleanup && a.associators && a.associatorNames && a.references && a.referenceNames);
  EXPECT_TRUE(data.method_mift.cleanup && data.method_mift.invokeMethod);
  const CMPIIndicationMIFT& n = data.indication_mift;
  EXPECT_TRUE(n.cleanup && n.authorizeFilter && n.mustPoll && n.activateFilter);
  EXPECT_TRUE(n.deActivateFilter && n.enableIndications && n.disableIndications);
}

TEST_F(Adapter_Life, OnlyTheInstanceTableHasANameAndItIsTheLastOne) {
  make('M');
  EXPECT_STREQ(Class::data.instance_mift.miName, "associationTEST_Provider");
  EXPECT_EQ(Class::data.method_mift.miName, nullptr);
  EXPECT_EQ(Class::data.indication_mift.miName, nullptr);
  EXPECT_EQ(Class::data.association_mift.miName, nullptr);
  EXPECT_STREQ(Class::data.instance_name, "instanceTEST_Provider");
  EXPECT_STREQ(Class::data.method_name, "methodTEST_Provider");
  EXPECT_STREQ(Class::data.indication_name, "indicationTEST_Provider");
}

TEST_F(Adapter_Life, ALongNameIsCutToItsBuffer) {
  const std::string name(400, 'x');
  void* result = nullptr;
  cimrt_cmpi_adapter('C', &Class::data, &Class::registration, face(), objects.context, name.c_str(),
                     'I', &result);
  EXPECT_EQ(std::string(Class::data.instance_mift.miName), "association" + std::string(244, 'x'));
}

TEST_F(Adapter_Life, ThreeFactoriesAndThreeCleanupsUnloadOnce) {
  make('I');
  EXPECT_EQ(Class::data.adapter->load_count, 1u);
  make('M');
  EXPECT_EQ(Class::data.adapter->load_count, 2u);
  make('A');
  EXPECT_EQ(Class::data.adapter->load_count, 3u);
  EXPECT_EQ(script.count(OPERATION_CREATE_PROVIDER), 1u);

  CMPIAssociationMI* association = &Class::data.association_mi;
  CMPIMethodMI* method = &Class::data.method_mi;
  EXPECT_EQ(association->ft->cleanup(association, objects.context, 0).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter->load_count, 2u);
  EXPECT_EQ(method->ft->cleanup(method, objects.context, 0).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter->load_count, 1u);
  EXPECT_EQ(script.count(OPERATION_UNLOAD), 0u);
  EXPECT_EQ(cleanup_instance(false).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter, nullptr);
  EXPECT_EQ(Class::data.magic, 0xDDDDDDDDu);
  EXPECT_THAT(script.work(), ElementsAre(OPERATION_CREATE_PROVIDER, OPERATION_LOAD,
                                         OPERATION_UNLOAD, OPERATION_DESTROY_PROVIDER));
}

TEST_F(Adapter_Life, AProviderSeesCreateThenLoadThenTheClassQuestion) {
  make('I');
  EXPECT_THAT(script.calls,
              ElementsAre(OPERATION_CREATE_PROVIDER, OPERATION_LOAD, OPERATION_GET_META_CLASS));
  EXPECT_EQ(Class::data.adapter->meta_class, Test_Classes::get().element);
}

TEST_F(Adapter_Life, CreateRunsWithoutAContextAndLoadWithOne) {
  bool create_had = true;
  bool load_had = false;
  script.on_create = [&] {
    create_had = Thread_Context::top() != nullptr;
    return 0;
  };
  script.on_load = [&] {
    load_had = Thread_Context::top() != nullptr;
    return 0;
  };
  make('I');
  EXPECT_FALSE(create_had);
  EXPECT_TRUE(load_had);
  EXPECT_EQ(Thread_Context::top(), nullptr);
}

TEST_F(Adapter_Life, AFailedLoadLeavesALivingAdapter) {
  script.on_load = [] { return LOAD_FAILED; };
  EXPECT_NE(make('I'), nullptr);
  EXPECT_EQ(enumerate().rc, CMPI_RC_OK);
}

TEST_F(Adapter_Life, AFactoryCallAfterTheUnloadMakesAFreshAdapter) {
  make('I');
  cleanup_instance(false);
  make('I');
  ASSERT_NE(Class::data.adapter, nullptr);
  EXPECT_EQ(Class::data.magic, 0x5DE2B131u);
  EXPECT_EQ(script.count(OPERATION_CREATE_PROVIDER), 2u);
  EXPECT_EQ(script.count(OPERATION_LOAD), 2u);
}

TEST_F(Adapter_Life, AForbiddenUnloadIsRefusedUntilTheServerTerminates) {
  script.enumerate = [](const Instance*, const Instance_Handler&) {
    cimom::allow_unload(false);
    return 0;
  };
  make('I');
  enumerate();
  Trace_Log log;
  EXPECT_EQ(cleanup_instance(false).rc, CMPI_RC_DO_NOT_UNLOAD);
  EXPECT_EQ(Class::data.adapter->load_count, 1u);
  EXPECT_EQ(script.count(OPERATION_UNLOAD), 0u);
  EXPECT_THAT(log.texts("DBG"), ElementsAre("enter: cleanup()", "cleanup do not unload"));

  EXPECT_EQ(cleanup_instance(true).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter, nullptr);
  EXPECT_EQ(script.count(OPERATION_UNLOAD), 1u);
}

TEST_F(Adapter_Life, AnUnloadThatIsAllowedAgainGoesThrough) {
  bool allowed = false;
  script.enumerate = [&](const Instance*, const Instance_Handler&) {
    cimom::allow_unload(allowed);
    return 0;
  };
  make('I');
  enumerate();
  allowed = true;
  enumerate();
  EXPECT_EQ(cleanup_instance(false).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter, nullptr);
}

TEST_F(Adapter_Life, EveryStepOfALifeIsLogged) {
  Trace_Log log;
  make('I');
  make('M');
  cleanup_instance(false);
  cleanup_instance(false);
  EXPECT_THAT(log.texts("DBG"),
              ElementsAre("enter: CMPI_Adapter()", "return: CMPI_Adapter()",
                          "enter: cimrt_cmpi_adapter()", "return: cimrt_cmpi_adapter()",
                          "enter: cimrt_cmpi_adapter()", "return: cimrt_cmpi_adapter()",
                          "enter: cleanup()", "cleanup decrement", "enter: cleanup()",
                          "cleanup unload", "enter: ~CMPI_Adapter()", "return: ~CMPI_Adapter()"));
}

TEST_F(Adapter_Life, CallsAfterTheUnloadAreAnswered) {
  make('I');
  cleanup_instance(false);
  EXPECT_EQ(enumerate().rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(cleanup_instance(false).rc, CMPI_RC_OK);
  EXPECT_EQ(script.count(OPERATION_UNLOAD), 1u);
}

TEST_F(Adapter_Life, ACleanupFromInsideARequestIsRefused) {
  CMPIStatus inside = {CMPI_RC_OK, nullptr};
  script.enumerate = [&](const Instance*, const Instance_Handler&) {
    inside = cleanup_instance(true);
    return 0;
  };
  make('I');
  EXPECT_EQ(enumerate().rc, CMPI_RC_OK);
  EXPECT_EQ(inside.rc, CMPI_RC_DO_NOT_UNLOAD);
  EXPECT_NE(Class::data.adapter, nullptr);
}

TEST_F(Adapter_Life, ATerminatingServerWaitsForARunningRequest) {
  make('I');
  std::atomic<bool> inside = false;
  std::atomic<bool> cleaning = false;
  std::atomic<bool> unloaded_while_inside = false;
  script.on_unload = [&] {
    unloaded_while_inside = inside.load();
    return 0;
  };
  script.enumerate = [&](const Instance*, const Instance_Handler&) {
    inside = true;
    while (!cleaning) std::this_thread::yield();
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    inside = false;
    return 0;
  };
  std::thread request([&] {
    Request_Objects own(server);
    tvx::host::Reply reply;
    CMPIResult* result = tvx::host::makeResult(server.core(), reply);
    EXPECT_EQ(Class::data.instance_mift
                  .enumerateInstanceNames(&Class::data.instance_mi, own.context, result,
                                          own.path(path_of("TEST_Element", "a")))
                  .rc,
              CMPI_RC_OK);
  });
  while (!inside) std::this_thread::yield();
  cleaning = true;
  EXPECT_EQ(cleanup_instance(true).rc, CMPI_RC_OK);
  request.join();
  EXPECT_FALSE(unloaded_while_inside);
  EXPECT_EQ(script.count(OPERATION_UNLOAD), 1u);
}

TEST_F(Adapter_Life, FactoriesOnManyThreadsMakeOneAdapter) {
  constexpr int threads = 8;
  std::vector<std::thread> all;
  std::atomic<int> answered = 0;
  for (int i = 0; i < threads; ++i)
    all.emplace_back([&] {
      Request_Objects own(server);
      if (Class::make(face(), own.context, 'I') == &Class::data.instance_mi) ++answered;
    });
  for (std::thread& each : all) each.join();
  EXPECT_EQ(answered, threads);
  EXPECT_EQ(Class::data.adapter->load_count, static_cast<std::uint64_t>(threads));
  EXPECT_EQ(script.count(OPERATION_CREATE_PROVIDER), 1u);
  EXPECT_EQ(script.count(OPERATION_LOAD), 1u);
}

TEST_F(Adapter_Life, AFactoryCallOutOfTheLoadFindsTheAdapter) {
  script.on_load = [&] {
    EXPECT_EQ(make('M'), &Class::data.method_mi);
    return 0;
  };
  EXPECT_EQ(make('I'), &Class::data.instance_mi);
  EXPECT_EQ(script.count(OPERATION_CREATE_PROVIDER), 1u);
}

TEST_F(Adapter_Life, AProviderThatCannotBeMadeGivesNoInterface) {
  script.on_create = []() -> std::int32_t { throw std::runtime_error("no memory"); };
  EXPECT_EQ(make('I'), nullptr);
  EXPECT_EQ(Class::data.adapter, nullptr);
  script.on_create = nullptr;
  EXPECT_EQ(make('I'), &Class::data.instance_mi);
}

TEST_F(Adapter_Life, ThrowingLoadAndUnloadStayInside) {
  script.on_load = []() -> std::int32_t { throw std::runtime_error("load"); };
  script.on_unload = []() -> std::int32_t { throw 1; };
  EXPECT_EQ(make('I'), &Class::data.instance_mi);
  EXPECT_EQ(enumerate().rc, CMPI_RC_OK);
  EXPECT_EQ(cleanup_instance(false).rc, CMPI_RC_OK);
  EXPECT_EQ(Class::data.adapter, nullptr);
  EXPECT_EQ(script.count(OPERATION_DESTROY_PROVIDER), 1u);
  EXPECT_EQ(Thread_Context::top(), nullptr);
}

}  // namespace
}  // namespace cimrt::test
