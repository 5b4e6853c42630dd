// The three containers: bounds, refused values, and the return value of a method.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

// ---- Containers

CMPIStatus refuse_property(const CMPIInstance*, const char*, const CMPIValue*, CMPIType) {
  return {CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
}
CMPIStatus refuse_key(CMPIObjectPath*, const char*, const CMPIValue*, CMPIType) {
  return {CMPI_RC_ERR_INVALID_DATA_TYPE, nullptr};
}
CMPIStatus refuse_arg(CMPIArgs*, const char*, const CMPIValue*, CMPIType) {
  return {CMPI_RC_ERR_FAILED, nullptr};
}

TEST_F(Conversion, RefusedValuesAreLoggedByEveryContainer) {
  Value value;
  value.set(String("text"));
  {
    Trace_Log log;
    CMPIInstanceFT table = {};
    table.setProperty = &refuse_property;
    CMPIInstance instance = {nullptr, &table};
    CMPIInstance_Container container(repository(), face(), "root/test", &instance);
    EXPECT_EQ(container.set_value("Vstring", value, 0), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMSetProperty() failed: Vstring"));
  }
  {
    Trace_Log log;
    CMPIObjectPathFT table = {};
    table.addKey = &refuse_key;
    CMPIObjectPath path = {nullptr, &table};
    CMPIObjectPath_Container container(repository(), face(), "root/test", &path);
    EXPECT_EQ(container.set_value("Id", value, 0), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMAddKey() failed"));
  }
  Trace_Log log;
  CMPIArgsFT table = {};
  table.addArg = &refuse_arg;
  CMPIArgs args = {nullptr, &table};
  CMPIArgs_Container container(repository(), face(), "root/test", &args);
  EXPECT_EQ(container.set_value("Ostring", value, 0), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMAddArg() failed"));
}

template <class Container_Type, class Object_Type>
void expect_bounds(Container_Type& container, std::uint32_t size, Object_Type) {
  ASSERT_EQ(container.get_size(), size);
  for (const std::uint32_t index : {size, size + 1, ~0u}) {
    Trace_Log log;
    String name;
    Value value;
    EXPECT_EQ(container.get_name(index, name), -1);
    EXPECT_EQ(container.get_value(index, STRING, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("bounds error", "bounds error"));
  }
}

TEST_F(Conversion, EveryContainerChecksItsBounds) {
  CMPIInstance_Container properties(repository(), face(), "root/test",
                                    objects.instance(object({{"Id", Any::string("x")}})));
  expect_bounds(properties, 1, 0);
  CMPIObjectPath_Container keys(repository(), face(), "root/test",
                                objects.path(path_of("TEST_All", "x")));
  expect_bounds(keys, 1, 0);
  CMPIArgs_Container args(repository(), face(), "root/test",
                          objects.args({{"Istring", Any::string("x")}}));
  expect_bounds(args, 1, 0);
  CMPIArgs_Container none(repository(), face(), "root/test", nullptr);
  expect_bounds(none, 0, 0);
}

CMPICount one_property(const CMPIInstance*, CMPIStatus*) {
  return 1;
}
CMPIData no_property(const CMPIInstance*, CMPICount, CMPIString**, CMPIStatus* rc) {
  if (rc) rc->rc = CMPI_RC_ERR_NO_SUCH_PROPERTY;
  return CMPIData{};
}

TEST_F(Conversion, APropertyThatCannotBeReadIsLeftOut) {
  CMPIInstanceFT table = {};
  table.getPropertyCount = &one_property;
  table.getPropertyAt = &no_property;
  CMPIInstance instance = {nullptr, &table};
  Instance* out = nullptr;
  Trace_Log log;
  EXPECT_EQ(make_cimrt_instance(nullptr, classes.part, objects.path(path_of("TEST_Part", "x")),
                                &instance, out),
            0);
  const Ref<Instance> owned(out);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetPropertyAt() failed",
                                             "get_name() failed: class=TEST_Part, index=0"));
}

TEST_F(Conversion, ANullInstanceIsNotConverted) {
  Trace_Log log;
  CMPIObjectPath_Container keys(repository(), face(), "root/test",
                                objects.path(path_of("TEST_All", "x")));
  EXPECT_EQ(keys.convert(nullptr, 0), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("ignored null instance arg"));
}

TEST_F(Conversion, TheReturnValueIsKeptApartFromTheArguments) {
  CMPIArgs* args = objects.args({});
  CMPIArgs_Container container(repository(), face(), "root/test", args);
  EXPECT_EQ(container.return_value().type, CMPI_null);
  Value value;
  value.set(std::uint32_t{7});
  EXPECT_EQ(container.set_value("return_value", value, 0), 0);
  EXPECT_EQ(container.return_value().type, CMPI_uint32);
  EXPECT_EQ(container.return_value().value.uint32, 7u);
  EXPECT_TRUE(contents_of(args).empty());
  EXPECT_EQ(container.set_value("Return_Value", value, 0), 0);
  EXPECT_EQ(contents_of(args).size(), 1u);
}

}  // namespace
}  // namespace cimrt::test
