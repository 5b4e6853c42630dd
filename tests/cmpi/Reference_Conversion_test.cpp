// References, embedded instances and lists of them, in both directions.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

// ---- References and embedded instances

TEST_F(Conversion, NestedInstancesGoThroughBothWays) {
  Object embedded =
      object({{"Id", Any::string("e")}, {"Size", Any::number(CMPI_uint32, 4)}}, "TEST_Part");
  const Any reference = Any::reference(path_of("TEST_Part", "r"));
  const Ref<Instance> instance =
      read({{"Id", Any::string("x")},
            {"VEmbedded", Any::embedded(embedded)},
            {"AEmbedded", Any::array(CMPI_instance, {Any::embedded(embedded)})},
            {"VReference", reference},
            {"AReference", Any::array(CMPI_ref, {reference, reference})}});
  const auto* inner = take<Instance*>(instance.get(), "VEmbedded");
  ASSERT_NE(inner, nullptr);
  EXPECT_EQ(take<std::uint32_t>(inner, "Size"), 4u);
  const Object& back = write(instance);
  EXPECT_EQ(back.property("VEmbedded").type(), CMPI_instance);
  EXPECT_EQ(back.property("VEmbedded").asInstance().property("Size").asUnsigned(), 4u);
  EXPECT_EQ(back.property("AEmbedded").type(), CMPI_instanceA);
  EXPECT_EQ(back.property("AEmbedded").elements().at(0).asInstance().text("Id"), "e");
  EXPECT_EQ(back.property("VReference").asReference().key("Id").asText(), "r");
  EXPECT_EQ(back.property("AReference").elements().size(), 2u);
}

TEST_F(Conversion, ANullReferenceIsLoggedAndNull) {
  CMPIData data = {};
  data.type = CMPI_ref;
  Value value;
  {
    Trace_Log log;
    ASSERT_EQ(to_value(data, value), 0);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("null instance"));
  }
  data.type = CMPI_instance;
  {
    Trace_Log log;
    ASSERT_EQ(to_value(data, value), 0);
    EXPECT_THAT(log.texts("WARN"), ElementsAre());
  }
  Instance* instance = nullptr;
  EXPECT_EQ(value.get(instance), 0);
  EXPECT_EQ(instance, nullptr);
}

TEST_F(Conversion, NestedInstancesOfUnknownClassesAreRefused) {
  Trace_Log log;
  CMPIData data = {};
  data.type = CMPI_ref;
  data.value.ref = objects.path(path_of("TEST_Unknown", "x"));
  Value value;
  EXPECT_EQ(to_value(data, value), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("failed to find meta class: TEST_Unknown"));
}

/// Objects whose own functions fail.
CMPIObjectPath* no_path(const CMPIInstance*, CMPIStatus* rc) {
  if (rc) rc->rc = CMPI_RC_ERR_FAILED;
  return nullptr;
}
CMPIString* no_class_name(const CMPIObjectPath*, CMPIStatus* rc) {
  if (rc) rc->rc = CMPI_RC_ERR_FAILED;
  return nullptr;
}

TEST_F(Conversion, NestedInstancesThatDoNotTellTheirClassAreRefused) {
  Value value;
  {
    Trace_Log log;
    CMPIInstanceFT table = {};
    table.getObjectPath = &no_path;
    CMPIInstance embedded = {nullptr, &table};
    CMPIData data = {};
    data.type = CMPI_instance;
    data.value.inst = &embedded;
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetObjectPath() failed"));
  }
  Trace_Log log;
  CMPIObjectPathFT table = {};
  table.getClassName = &no_class_name;
  CMPIObjectPath path = {nullptr, &table};
  CMPIData data = {};
  data.type = CMPI_ref;
  data.value.ref = &path;
  EXPECT_EQ(to_value(data, value), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetClassName() failed"));
}

TEST_F(Conversion, ListsOfInstancesKeepNullElements) {
  const Any reference = Any::reference(path_of("TEST_Part", "r"));
  CMPIData data = {};
  data.type = CMPI_refA;
  data.value.array = array(CMPI_ref, {reference, Any::null(CMPI_ref)});
  Value value;
  ASSERT_EQ(to_value(data, value), 0);
  Array<Instance*> list;
  ASSERT_EQ(value.get(list), 0);
  ASSERT_EQ(list.size(), 2u);
  EXPECT_NE(list[0], nullptr);
  EXPECT_EQ(list[1], nullptr);
}

/// An array that answers prepared data.
struct Prepared_Array {
  explicit Prepared_Array(std::vector<CMPIData> all) : elements(std::move(all)) {
    table.getSize = [](const CMPIArray* self, CMPIStatus*) {
      return static_cast<CMPICount>(of(self).elements.size());
    };
    table.getElementAt = [](const CMPIArray* self, CMPICount index, CMPIStatus*) {
      return of(self).elements.at(index);
    };
    face = {this, &table};
  }
  static const Prepared_Array& of(const CMPIArray* self) {
    return *static_cast<const Prepared_Array*>(self->hdl);
  }
  std::vector<CMPIData> elements;
  CMPIArrayFT table{};
  CMPIArray face{};
};

TEST_F(Conversion, ABrokenElementReleasesTheInstancesBeforeIt) {
  CMPIData good = {};
  good.type = CMPI_ref;
  good.value.ref = objects.path(path_of("TEST_Part", "r"));
  CMPIData empty = {};
  empty.type = CMPI_ref;
  CMPIData wrong = {};
  wrong.type = CMPI_instance;
  CMPIData data = {};
  data.type = CMPI_refA;
  Value value;
  {
    Trace_Log log;
    Prepared_Array array({good, empty});
    data.value.array = &array.face;
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("encountered null instance element"));
  }
  Trace_Log log;
  Prepared_Array array({good, wrong});
  data.value.array = &array.face;
  EXPECT_EQ(to_value(data, value), -1);
  EXPECT_THAT(log.texts("WARN"), ElementsAre("array element type mismatch"));
}

TEST_F(Conversion, AnInstanceWithANamespaceOfItsOwnIsReferredToThere) {
  const Ref<Instance> instance = make_element(classes.all, "x");
  const Ref<Instance> target = make_element(classes.part, "t");
  target->__name_space = "root/own";
  refer(instance.get(), "VReference", target.get());
  refer(instance.get(), "VEmbedded", target.get());
  const Object& made = write(instance);
  EXPECT_EQ(made.property("VReference").asReference().nameSpace, "root/own");
  EXPECT_EQ(made.property("VEmbedded").asInstance().path.nameSpace, "root/own");
}

}  // namespace
}  // namespace cimrt::test
