// What can go wrong on the way from the runtime to the server.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

// ---- What can go wrong on the way out

class Way_Out : public Conversion {
 protected:
  int to_data(const Value& value, CMPIData& data, std::uint32_t flags = 0,
              const char* name_space = "root/test") {
    return _to_cmpi_data(repository(), face(), name_space, value, flags, data);
  }
  template <class T>
  static Value of(const T& x) {
    Value value;
    value.set(x);
    return value;
  }
};

TEST_F(Way_Out, AValueWithoutTypeIsRefused) {
  Trace_Log log;
  CMPIData data;
  EXPECT_EQ(to_data(Value(), data), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("missing type"));
}

TEST_F(Way_Out, ANullValueHasItsTypeAndTheNullState) {
  Value value;
  value.set(std::uint16_t{3});
  value.set_null_flag(true);
  CMPIData data;
  EXPECT_EQ(to_data(value, data), 0);
  EXPECT_EQ(data.type, CMPI_uint16);
  EXPECT_EQ(data.state, CMPI_nullValue);
}

TEST_F(Way_Out, InstancesNeedANamespaceAndAClassName) {
  CMPIData data;
  {
    Trace_Log log;
    EXPECT_EQ(to_data(of(nullptr), data), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("null instance argument"));
  }
  const Value part = of(make_element(classes.part, "t").release());
  for (const char* name_space : {"", static_cast<const char*>(nullptr)}) {
    Trace_Log log;
    EXPECT_EQ(to_data(part, data, 0, name_space), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("null namespace"));
  }
  Trace_Log log;
  const Meta_Class* unnamed = Record_Builder().build_class("");
  EXPECT_EQ(to_data(of(make_instance(unnamed).release()), data), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("null classname"));
}

TEST_F(Way_Out, AServerThatMakesNoObjectsIsReported) {
  const Value part = of(make_element(classes.part, "t").release());
  CMPIData data;
  {
    Trace_Log log;
    faulty.fail("newObjectPath");
    EXPECT_EQ(to_data(part, data), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMNewObjectPath() failed"));
    faulty.heal();
  }
  {
    Trace_Log log;
    faulty.fail("newInstance");
    EXPECT_EQ(to_data(part, data, FLAG_EMBEDDED_INSTANCE), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMNewInstance() failed"));
    faulty.heal();
  }
  for (const char* function : {"newString", "newArray", "newDateTimeFromChars"}) {
    faulty.fail(function);
    const Ref<Instance> instance = make_element(classes.all, "x");
    put(instance, "Vstring", "text");
    put(instance, "Vdatetime", Datetime(TIME));
    put(instance, "Auint8", Array<std::uint8_t>{1});
    CMPIInstance* made = nullptr;
    Trace_Log log;
    EXPECT_EQ(make_CMPI_instance(face(), instance.get(), "root/test",
                                 objects.path(path_of("TEST_All", "x")), nullptr, made),
              0);
    const std::string name = std::string(function) == "newString"  ? "Vstring"
                             : std::string(function) == "newArray" ? "Auint8"
                                                                   : "Vdatetime";
    EXPECT_TRUE(log.has("WARN", "_to_cmpi_data() failed: feature=" + name));
    EXPECT_TRUE(log.has("WARN", "conversion error: TEST_All." + name));
    EXPECT_FALSE(contents_of(made).has(name));
    faulty.heal();
  }
}

TEST_F(Way_Out, ANullElementOfAListOfInstancesFailsTheList) {
  Trace_Log log;
  Array<Instance*> list;
  list.append(static_cast<Instance*>(nullptr));
  Value value;
  value.set(list);
  CMPIData data;
  EXPECT_EQ(to_data(value, data), -1);
  EXPECT_THAT(log.texts("WARN"),
              ElementsAre("null instance argument", "element conversion failed"));
}

CMPIStatus refuse_element(CMPIArray*, CMPICount, const CMPIValue*, CMPIType) {
  return {CMPI_RC_ERR_TYPE_MISMATCH, nullptr};
}

TEST_F(Way_Out, ARefusedElementFailsTheArray) {
  static CMPIArrayFT table = {};
  table.setElementAt = &refuse_element;
  static CMPIArray target = {nullptr, &table};
  CMPIBrokerEncFT makers = *faulty.face()->eft;
  makers.newArray = [](const CMPIBroker*, CMPICount, CMPIType, CMPIStatus*) { return &target; };
  CMPIBroker broker = *faulty.face();
  broker.eft = &makers;
  Trace_Log log;
  Value value;
  value.set(Array<bool>{true});
  CMPIData data;
  EXPECT_EQ(_to_cmpi_data(repository(), &broker, "root/test", value, 0, data), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMSetArrayElementAt() failed"));
}

TEST_F(Way_Out, ATextThatTheServerDoesNotMakeFailsTheArray) {
  const std::pair<const char*, Value> rows[] = {
      {"newString", of(Array<String>{String("a"), String("b")})},
      {"newDateTimeFromChars", of(Array<Datetime>{Datetime(TIME), Datetime(TIME)})}};
  for (const auto& [function, value] : rows) {
    faulty.fail(function, 2);
    Trace_Log log;
    CMPIData data;
    EXPECT_EQ(to_data(value, data), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMSetArrayElementAt() failed"));
    faulty.heal();
  }
}

}  // namespace
}  // namespace cimrt::test
