// Whole instances and their paths, and failures in the middle of an enumeration.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

// ---- Whole instances

TEST_F(Conversion, AnInstanceWithoutPathGetsOne) {
  Trace_Log log;
  const Ref<Instance> instance = make_element(classes.part, "p");
  CMPIInstance* made = nullptr;
  ASSERT_EQ(make_CMPI_instance(face(), instance.get(), "root/test", nullptr, nullptr, made), 0);
  EXPECT_EQ(contents_of(made).path.className, "TEST_Part");
  EXPECT_EQ(contents_of(made).path.key("Id").asText(), "p");
  EXPECT_THAT(log.texts("WARN"),
              ElementsAre("No ObjectPath built before call to make_CMPI_instance"));
}

TEST_F(Conversion, APropertyListFiltersTheInstance) {
  const Ref<Instance> instance = make_element(classes.part, "p");
  put(instance, "Size", std::uint32_t{1});
  put(instance, "Caption", "c");
  const char* wanted[] = {"size", nullptr};
  const Object& made = write(instance, wanted);
  EXPECT_EQ(made.properties.size(), 1u);
  EXPECT_TRUE(made.has("Size"));
}

TEST_F(Conversion, MakersThatFailAnswerACode) {
  const Ref<Instance> instance = make_element(classes.part, "p");
  CMPIObjectPath* path = nullptr;
  CMPIInstance* made = nullptr;
  faulty.fail("newObjectPath");
  EXPECT_EQ(make_CMPI_object_path(face(), instance.get(), "root/test", path), 1);
  EXPECT_EQ(path, nullptr);
  EXPECT_EQ(make_CMPI_instance(face(), instance.get(), "root/test", nullptr, nullptr, made), 1);
  faulty.heal();
  faulty.fail("newInstance");
  EXPECT_EQ(make_CMPI_instance(face(), instance.get(), "root/test", nullptr, nullptr, made), 1);
  faulty.heal();
  EXPECT_EQ(make_CMPI_object_path(face(), nullptr, "root/test", path), 1);
  EXPECT_EQ(make_CMPI_instance(face(), nullptr, "root/test",
                               objects.path(path_of("TEST_Part", "p")), nullptr, made),
            1);
  EXPECT_EQ(made, nullptr);
}

CMPIStatus refuse_filter(CMPIInstance*, const char**, const char**) {
  return {CMPI_RC_ERR_INVALID_PARAMETER, nullptr};
}
CMPIStatus release_nothing(CMPIInstance*) {
  return {CMPI_RC_OK, nullptr};
}

TEST_F(Conversion, ARefusedPropertyListIsAnswered) {
  static CMPIInstanceFT table = {};
  table.release = &release_nothing;
  table.setPropertyFilter = &refuse_filter;
  static CMPIInstance target = {nullptr, &table};
  CMPIBrokerEncFT makers = *faulty.face()->eft;
  makers.newInstance = [](const CMPIBroker*, const CMPIObjectPath*, CMPIStatus*) {
    return &target;
  };
  CMPIBroker broker = *faulty.face();
  broker.eft = &makers;
  const Ref<Instance> instance = make_element(classes.part, "p");
  const char* wanted[] = {"Size", nullptr};
  CMPIInstance* made = nullptr;
  EXPECT_EQ(make_CMPI_instance(&broker, instance.get(), "root/test",
                               objects.path(path_of("TEST_Part", "p")), wanted, made),
            CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(Conversion, APathWithoutNamespaceTextIsReadAllTheSame) {
  Test_Server old(0);
  Request_Objects own(old);
  tvx::host::ObjectPath path = path_of("TEST_Part", "p");
  path.nameSpace = "";
  Instance* out = nullptr;
  ASSERT_EQ(make_cimrt_reference(nullptr, classes.part, own.path(path), out), 0);
  const Ref<Instance> model(out);
  EXPECT_TRUE(model->__name_space.empty());
  EXPECT_EQ(take<String>(model.get(), "Id"), "p");
}

// ---- Failures in the middle of an enumeration

TEST_F(Conversion, AfterAFailedConversionFurtherNamesAreRefused) {
  Script script;
  script.enumerate = [&](const Instance*, const Instance_Handler& handler) {
    EXPECT_TRUE(handler.handle(make_element(classes.part, "a").release()));
    faulty.fail("newObjectPath");
    EXPECT_FALSE(handler.handle(make_element(classes.part, "b").release()));
    faulty.heal();
    EXPECT_FALSE(handler.handle(make_element(classes.part, "c").release()));
    return 0;
  };
  server.serve<4>(script, classes.part);
  Slot<4>::make(face(), objects.context, 'I');
  const tvx::host::Reply names = server.broker.enumerateInstanceNames("TEST_Part");
  EXPECT_EQ(names.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(names.done);
  EXPECT_EQ(names.paths.size(), 1u);
  const tvx::host::Reply instances = server.broker.enumerateInstances("TEST_Part");
  EXPECT_EQ(instances.status.rc, CMPI_RC_OK);
  EXPECT_EQ(instances.instances.size(), 1u);
  server.broker.unload(true);
  Slot<4>::data.instance_mi.ft->cleanup(&Slot<4>::data.instance_mi, objects.context, 1);
}

}  // namespace
}  // namespace cimrt::test
