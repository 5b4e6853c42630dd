// The indication function table and the delivery of indications.
#include <gmock/gmock.h>

#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "cmpi/CMPI_Operations.h"
#include "cmpi/CMPI_Thread_Context.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Class = Slot<0>;

class Indications : public ::testing::Test {
 protected:
  Indications() {
    server.serve<0>(script, classes.part);
    Class::make(server.broker.face(), objects.context, 'N');
  }
  ~Indications() override {
    while (Class::data.adapter) mi().ft->cleanup(&mi(), objects.context, 1);
  }

  static CMPIIndicationMI& mi() { return Class::data.indication_mi; }
  CMPIrc activate(const char* name_space) {
    tvx::host::ObjectPath path = {"", name_space, "TEST_Part", {}};
    return mi()
        .ft->activateFilter(&mi(), objects.context, nullptr, "TEST_Part", objects.path(path), 1)
        .rc;
  }
  CMPIrc deactivate(const char* name_space) {
    tvx::host::ObjectPath path = {"", name_space, "TEST_Part", {}};
    return mi()
        .ft->deActivateFilter(&mi(), objects.context, nullptr, "TEST_Part", objects.path(path), 1)
        .rc;
  }
  CMPIrc enable() { return mi().ft->enableIndications(&mi(), objects.context).rc; }
  CMPIrc disable() { return mi().ft->disableIndications(&mi(), objects.context).rc; }
  static std::vector<std::pair<std::string, std::uint32_t>> filters() {
    std::vector<std::pair<std::string, std::uint32_t>> result;
    for (const Indication_Filter& each : Class::data.adapter->indication_filters)
      result.emplace_back(each.name_space.c_str(), each.count);
    return result;
  }

  using Pair = std::pair<std::string, std::uint32_t>;
  const Test_Classes& classes = Test_Classes::get();
  Script script;
  Test_Server server;
  Request_Objects objects{server};
};

TEST_F(Indications, FiltersAreAlwaysAuthorizedAndNeverPolled) {
  const CMPIStatus authorized =
      mi().ft->authorizeFilter(&mi(), objects.context, nullptr, "TEST_Part", nullptr, "root");
  EXPECT_EQ(authorized.rc, CMPI_RC_OK);
  EXPECT_EQ(authorized.msg, nullptr);
  const CMPIStatus polled =
      mi().ft->mustPoll(&mi(), objects.context, nullptr, nullptr, "TEST_Part", nullptr);
  EXPECT_EQ(polled.rc, CMPI_RC_OK);
  EXPECT_EQ(polled.msg, nullptr);
}

TEST_F(Indications, FiltersAreCountedByNamespace) {
  EXPECT_EQ(activate("root/a"), CMPI_RC_OK);
  EXPECT_EQ(activate("root/b"), CMPI_RC_OK);
  EXPECT_EQ(activate("root/a"), CMPI_RC_OK);
  EXPECT_THAT(filters(), ElementsAre(Pair("root/a", 2), Pair("root/b", 1)));
  EXPECT_EQ(deactivate("root/b"), CMPI_RC_OK);
  EXPECT_EQ(deactivate("root/a"), CMPI_RC_OK);
  EXPECT_THAT(filters(), ElementsAre(Pair("root/a", 1)));
  EXPECT_EQ(deactivate("root/unknown"), CMPI_RC_OK);
  EXPECT_EQ(deactivate("root/a"), CMPI_RC_OK);
  EXPECT_EQ(deactivate("root/a"), CMPI_RC_OK);
  EXPECT_THAT(filters(), IsEmpty());
}

TEST_F(Indications, EnablingAndDisablingReachTheProviderOnce) {
  EXPECT_EQ(disable(), CMPI_RC_OK);
  EXPECT_EQ(enable(), CMPI_RC_OK);
  EXPECT_EQ(enable(), CMPI_RC_OK);
  EXPECT_TRUE(Class::data.adapter->indications_enabled);
  EXPECT_EQ(disable(), CMPI_RC_OK);
  EXPECT_EQ(disable(), CMPI_RC_OK);
  EXPECT_FALSE(Class::data.adapter->indications_enabled);
  EXPECT_EQ(script.count(OPERATION_ENABLE_INDICATIONS), 1u);
  EXPECT_EQ(script.count(OPERATION_DISABLE_INDICATIONS), 1u);
}

TEST_F(Indications, ProvidersStatusesMap) {
  script.statuses[OPERATION_ENABLE_INDICATIONS] = 140;
  script.statuses[OPERATION_DISABLE_INDICATIONS] = 150;
  EXPECT_EQ(enable(), CMPI_RC_ERR_FAILED);
  EXPECT_EQ(disable(), CMPI_RC_ERR_FAILED);
  script.statuses[OPERATION_ENABLE_INDICATIONS] = -1;
  script.statuses[OPERATION_DISABLE_INDICATIONS] = -1;
  EXPECT_EQ(enable(), CMPI_RC_OK);
  EXPECT_EQ(disable(), CMPI_RC_OK);
}

TEST_F(Indications, AnIndicationGoesIntoEveryActiveNamespace) {
  activate("root/a");
  activate("root/b");
  script.enable = [&](Instance_Proc proc, void* data) {
    EXPECT_TRUE(proc(make_element(classes.part, "event").release(), 0, data));
    EXPECT_FALSE(proc(nullptr, 0, data));
    return 0;
  };
  EXPECT_EQ(enable(), CMPI_RC_OK);
  const auto delivered = server.broker.indications();
  ASSERT_EQ(delivered.size(), 2u);
  EXPECT_EQ(delivered[0].nameSpace, "root/a");
  EXPECT_EQ(delivered[1].nameSpace, "root/b");
  EXPECT_EQ(delivered[1].instance.text("Id"), "event");
  EXPECT_EQ(delivered[1].instance.path.nameSpace, "root/b");
}

TEST_F(Indications, DeliveryNeedsAContext) {
  EXPECT_DEATH(
      _indication_proc(make_element(classes.part, "event").release(), 0, Class::data.adapter),
      "assert: thread_context != 0");
}

TEST_F(Indications, CleanupHasALineOfItsOwn) {
  Trace_Log log;
  EXPECT_EQ(mi().ft->cleanup(&mi(), objects.context, 0).rc, CMPI_RC_OK);
  const std::vector<std::string> lines = log.texts("DBG");
  ASSERT_GE(lines.size(), 2u);
  EXPECT_EQ(lines[0], "enter: indicationCleanup()");
  EXPECT_EQ(lines[1], "enter: cleanup()");
  EXPECT_EQ(Class::data.adapter, nullptr);
}

}  // namespace
}  // namespace cimrt::test
