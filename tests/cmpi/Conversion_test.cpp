// Values, instances and paths between CMPI and the runtime, in both directions.
#include <gmock/gmock.h>

#include <limits>

#include "Faulty_Broker.h"
#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Value.h"
#include "cmpi/Converter.h"

namespace cimrt::test {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using tvx::host::NamedValues;
using Object = tvx::host::Instance;
using Any = tvx::host::Value;

constexpr const char* TIME = "20240229235959.123456+060";

/// One scalar type with two values on either side.
struct Row {
  Type type;
  CMPIType cmpi_type;
  Any first;
  Any second;
};

const std::vector<Row>& rows() {
  static const std::vector<Row> all = {
      {BOOLEAN, CMPI_boolean, Any::boolean(true), Any::boolean(false)},
      {UINT8, CMPI_uint8, Any::number(CMPI_uint8, 255), Any::number(CMPI_uint8, 0)},
      {SINT8, CMPI_sint8, Any::signedNumber(CMPI_sint8, -128), Any::signedNumber(CMPI_sint8, 127)},
      {UINT16, CMPI_uint16, Any::number(CMPI_uint16, 65535), Any::number(CMPI_uint16, 1)},
      {SINT16, CMPI_sint16, Any::signedNumber(CMPI_sint16, -32768),
       Any::signedNumber(CMPI_sint16, 5)},
      {UINT32, CMPI_uint32, Any::number(CMPI_uint32, 4294967295u), Any::number(CMPI_uint32, 2)},
      {SINT32, CMPI_sint32, Any::signedNumber(CMPI_sint32, -2147483647 - 1),
       Any::signedNumber(CMPI_sint32, 3)},
      {UINT64, CMPI_uint64, Any::number(CMPI_uint64, ~0ull), Any::number(CMPI_uint64, 4)},
      {SINT64, CMPI_sint64,
       Any::signedNumber(CMPI_sint64, std::numeric_limits<std::int64_t>::min()),
       Any::signedNumber(CMPI_sint64, 6)},
      {REAL32, CMPI_real32, Any::real(CMPI_real32, 0.5), Any::real(CMPI_real32, -2.25)},
      {REAL64, CMPI_real64, Any::real(CMPI_real64, 1e300), Any::real(CMPI_real64, -0.125)},
      {CHAR16, CMPI_char16, Any::number(CMPI_char16, 'A'), Any::number(CMPI_char16, 'z')},
      {STRING, CMPI_string, Any::string("first"), Any::string("")},
      {DATETIME, CMPI_dateTime, Any::dateTime(TIME), Any::dateTime("00000002030405.000006:000")},
  };
  return all;
}

class Conversion : public ::testing::Test {
 protected:
  const CMPIBroker* face() { return faulty.face(); }
  const Meta_Repository* repository() const { return classes.repository; }

  Object object(const NamedValues& properties, const char* class_name = "TEST_All") const {
    Object made;
    made.path = path_of(class_name, "x");
    made.properties = properties;
    return made;
  }
  /// Through the containers into an instance of TEST_All.
  Ref<Instance> read(const NamedValues& properties) {
    CMPIInstance* source = objects.instance(object(properties));
    Instance* out = nullptr;
    EXPECT_EQ(make_cimrt_instance(face(), classes.all, objects.path(path_of("TEST_All", "x")),
                                  source, out),
              0);
    return Ref<Instance>(out);
  }
  /// Back again; the result lives as long as the test.
  const Object& write(const Ref<Instance>& instance, const char** properties = nullptr) {
    CMPIObjectPath* path = nullptr;
    EXPECT_EQ(make_CMPI_object_path(face(), instance.get(), "root/test", path), 0);
    CMPIInstance* out = nullptr;
    EXPECT_EQ(make_CMPI_instance(face(), instance.get(), "root/test", path, properties, out), 0);
    return contents_of(out);
  }
  int to_value(const CMPIData& data, Value& value) {
    return cmpi_to_cimrt_value(repository(), face(), "root/test", data, value);
  }
  CMPIArray* array(CMPIType element_type, const Any::List& elements) {
    return tvx::host::makeArray(objects.core, element_type, elements, tvx::host::Origin::HandedOut);
  }

  const Test_Classes& classes = Test_Classes::get();
  Test_Server server;
  Request_Objects objects{server};
  Faulty_Broker faulty{server.broker.face()};
};

// ---- Type codes

TEST_F(Conversion, TypeCodesMapBothWays) {
  for (const Row& row : rows()) {
    EXPECT_EQ(type_of_cmpi(row.cmpi_type), row.type);
    EXPECT_EQ(cmpi_type_of(row.type, 0), row.cmpi_type);
    const auto array_type = static_cast<Type>(row.type | ARRAY_BIT);
    EXPECT_EQ(type_of_cmpi(static_cast<CMPIType>(row.cmpi_type | CMPI_ARRAY)), array_type);
    EXPECT_EQ(cmpi_type_of(array_type, 0), row.cmpi_type | CMPI_ARRAY);
  }
  EXPECT_EQ(type_of_cmpi(CMPI_instance), INSTANCE);
  EXPECT_EQ(type_of_cmpi(CMPI_ref), INSTANCE);
  EXPECT_EQ(type_of_cmpi(CMPI_instanceA), INSTANCE_ARRAY);
  EXPECT_EQ(type_of_cmpi(CMPI_refA), INSTANCE_ARRAY);
  EXPECT_EQ(cmpi_type_of(INSTANCE, 0), CMPI_ref);
  EXPECT_EQ(cmpi_type_of(INSTANCE_ARRAY, 0), CMPI_refA);
  EXPECT_EQ(cmpi_type_of(INSTANCE, FLAG_EMBEDDED_INSTANCE), CMPI_instance);
  EXPECT_EQ(cmpi_type_of(INSTANCE_ARRAY, FLAG_EMBEDDED_OBJECT), CMPI_instanceA);
  for (const CMPIType unknown : {CMPI_null, CMPI_args, CMPI_chars, CMPI_ptr, CMPI_charsA})
    EXPECT_EQ(type_of_cmpi(unknown), NONE);
  EXPECT_EQ(cmpi_type_of(NONE, 0), CMPI_null);
}

// ---- Round trips

TEST_F(Conversion, EveryScalarAndArrayGoesThroughBothWays) {
  NamedValues values{{"Id", Any::string("x")}};
  for (const Row& row : rows()) {
    values.set(std::string("V") + short_name(row.type), row.first);
    values.set(std::string("A") + short_name(row.type),
               Any::array(row.cmpi_type, {row.first, row.second, row.first}));
  }
  Trace_Log log;
  const Ref<Instance> instance = read(values);
  const Object& back = write(instance);
  EXPECT_EQ(back.properties.size(), values.size());
  for (const tvx::host::NamedValue& each : values) {
    ASSERT_TRUE(back.has(each.name)) << each.name;
    EXPECT_EQ(back.property(each.name), each.value) << each.name;
  }
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Conversion, TheRuntimeHoldsWhatCameIn) {
  const Ref<Instance> instance = read({{"Vboolean", Any::boolean(true)},
                                       {"Vsint16", Any::signedNumber(CMPI_sint16, -7)},
                                       {"Vreal32", Any::real(CMPI_real32, 0.5)},
                                       {"Vstring", Any::string("text")},
                                       {"Vdatetime", Any::dateTime(TIME)},
                                       {"Astring", Any::array(CMPI_string, {Any::string("a")})}});
  EXPECT_TRUE(take<bool>(instance.get(), "Vboolean"));
  EXPECT_EQ(take<std::int16_t>(instance.get(), "Vsint16"), -7);
  EXPECT_EQ(take<float>(instance.get(), "Vreal32"), 0.5f);
  EXPECT_EQ(take<String>(instance.get(), "Vstring"), "text");
  EXPECT_EQ(take<Datetime>(instance.get(), "Vdatetime"), Datetime(TIME));
  EXPECT_EQ(take<Array<String>>(instance.get(), "Astring")[0], "a");
  EXPECT_TRUE(null_in(instance.get(), "Vuint8"));
  EXPECT_TRUE(null_in(instance.get(), "Id"));
  EXPECT_STREQ(instance->__name_space.c_str(), "root/test");
}

TEST_F(Conversion, CharactersBeyondAsciiLoseTheirHighByteOnTheWayOut) {
  const Ref<Instance> instance = make_element(classes.all, "x");
  put(instance, "Vchar16", char16_t{0x1241});
  EXPECT_EQ(write(instance).property("Vchar16").asUnsigned(), 0x41u);
}

TEST_F(Conversion, EmptyArraysStayEmpty) {
  const Ref<Instance> instance = read({{"Auint16", Any::array(CMPI_uint16, {})}});
  EXPECT_EQ(take<Array<std::uint16_t>>(instance.get(), "Auint16").size(), 0u);
  EXPECT_TRUE(write(instance).property("Auint16").elements().empty());
}

TEST_F(Conversion, NullPropertiesAreNotSet) {
  const Ref<Instance> instance = make_element(classes.all, "x");
  const Object& made = write(instance);
  EXPECT_EQ(made.properties.size(), 1u);
  EXPECT_TRUE(made.has("Id"));
}

TEST_F(Conversion, ArraysOfManyElementsGoThrough) {
  Any::List elements;
  for (unsigned i = 0; i < 100000; ++i) elements.push_back(Any::number(CMPI_uint8, i & 0xFF));
  const Ref<Instance> instance = read({{"Auint8", Any::array(CMPI_uint8, elements)}});
  const auto bytes = take<Array<std::uint8_t>>(instance.get(), "Auint8");
  ASSERT_EQ(bytes.size(), elements.size());
  EXPECT_EQ(bytes[99999], 99999 & 0xFF);
}

// ---- Nulls and oddities of single values

TEST_F(Conversion, NullDataGiveTheEmptyValueOfTheType) {
  for (const Row& row : rows())
    for (const CMPIType array_bit : {CMPI_null, CMPI_ARRAY}) {
      CMPIData data = {};
      data.type = static_cast<CMPIType>(row.cmpi_type | array_bit);
      data.state = CMPI_nullValue;
      Value value;
      ASSERT_EQ(to_value(data, value), 0);
      EXPECT_TRUE(value.null());
      EXPECT_EQ(value.type(), type_of_cmpi(data.type));
    }
  for (const CMPIType type : {CMPI_ref, CMPI_instance, CMPI_refA, CMPI_instanceA}) {
    CMPIData data = {};
    data.type = type;
    data.state = CMPI_nullValue;
    Value value;
    ASSERT_EQ(to_value(data, value), 0);
    EXPECT_TRUE(value.null());
    EXPECT_EQ(value.type(), type_of_cmpi(type));
  }
}

TEST_F(Conversion, UnknownTypesAreRefused) {
  for (const CMPIValueState state : {CMPI_goodValue, CMPI_nullValue}) {
    Trace_Log log;
    CMPIData data = {};
    data.type = CMPI_args;
    data.state = state;
    Value value;
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_TRUE(log.has("WARN", "unknown type"));
  }
}

TEST_F(Conversion, AbsentAndBrokenValuesAreNotLookedAt) {
  for (const CMPIValueState state : {CMPI_notFound, CMPI_badValue}) {
    CMPIData data = {};
    data.type = CMPI_string;
    data.state = state;
    data.value.string = reinterpret_cast<CMPIString*>(8);
    Value value;
    EXPECT_EQ(to_value(data, value), -1);
  }
}

TEST_F(Conversion, BooleansBecomeZeroOrOne) {
  CMPIData data = {};
  data.type = CMPI_boolean;
  data.value.boolean = 0x80;
  Value value;
  ASSERT_EQ(to_value(data, value), 0);
  bool x = false;
  EXPECT_EQ(value.get(x), 0);
  EXPECT_TRUE(x);
}

TEST_F(Conversion, MissingTextsAreEmpty) {
  CMPIData data = {};
  data.type = CMPI_string;
  Value value;
  {
    Trace_Log log;
    ASSERT_EQ(to_value(data, value), 0);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("ignored null CMPI string"));
  }
  data.value.string =
      tvx::host::makeString(objects.core, std::nullopt, tvx::host::Origin::HandedOut);
  {
    Trace_Log log;
    ASSERT_EQ(to_value(data, value), 0);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetCharsPtr() failed"));
  }
  String text("before");
  EXPECT_EQ(value.get(text), 0);
  EXPECT_EQ(text, "");
  EXPECT_FALSE(value.null());
}

TEST_F(Conversion, BadTimestampsAreRefused) {
  CMPIData data = {};
  data.type = CMPI_dateTime;
  Value value;
  {
    Trace_Log log;
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetStringFormat() failed"));
  }
  data.value.dateTime =
      tvx::host::makeDateTime(objects.core, "tomorrow", tvx::host::Origin::HandedOut);
  {
    Trace_Log log;
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("conversion error"));
  }
}

TEST_F(Conversion, ArraysNeedElementsOfTheirType) {
  CMPIData data = {};
  data.type = CMPI_uint16A;
  Value value;
  EXPECT_EQ(to_value(data, value), -1);
  {
    Trace_Log log;
    data.value.array = array(CMPI_uint32, {Any::number(CMPI_uint32, 1)});
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("type mismatch"));
  }
  {
    Trace_Log log;
    data.value.array = array(CMPI_uint16, {Any::number(CMPI_uint16, 1), Any::null(CMPI_uint16)});
    EXPECT_EQ(to_value(data, value), -1);
    EXPECT_THAT(log.texts("WARN"), ElementsAre("encountered null array element"));
  }
}

TEST_F(Conversion, ATextElementWithoutCharactersIsKeptEmpty) {
  Trace_Log log;
  CMPIData data = {};
  data.type = CMPI_stringA;
  data.value.array = array(CMPI_string, {Any::string("a"), Any::stringWithoutText()});
  Value value;
  ASSERT_EQ(to_value(data, value), 0);
  Array<String> texts;
  ASSERT_EQ(value.get(texts), 0);
  ASSERT_EQ(texts.size(), 2u);
  EXPECT_EQ(texts[1], "");
  EXPECT_THAT(log.texts("WARN"), ElementsAre("CMGetCharsPtr() failed"));
}

TEST_F(Conversion, ABadTimestampElementFailsTheArray) {
  CMPIData data = {};
  data.type = CMPI_dateTimeA;
  data.value.array = array(CMPI_dateTime, {Any::dateTime(TIME), Any::dateTime("never")});
  Value value;
  EXPECT_EQ(to_value(data, value), -1);
}

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

// ---- What can go wrong on the way out

class Way_Out : public Conversion {
 protected:
  int to_data(const Value& value, CMPIData& data, std::uint32_t flags = 0,
              const char* name_space = "root/test") {
    return _to_cmpi_data(repository(), face(), name_space, value, flags, data);
  }
  static Value of(Instance* instance) {
    Value value;
    value.set(instance);
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

// ---- Keys

class Keys : public Conversion {
 protected:
  Ref<Instance> read_keys(const NamedValues& keys) {
    tvx::host::ObjectPath path = {"", "root/test", "TEST_Keys", keys};
    Instance* out = nullptr;
    EXPECT_EQ(make_cimrt_reference(nullptr, classes.keys, objects.path(path), out), 0);
    return Ref<Instance>(out);
  }
};

TEST_F(Keys, EveryTypeOfKeyGoesThroughBothWays) {
  NamedValues keys;
  for (const Row& row : rows()) keys.set(std::string("K") + short_name(row.type), row.first);
  const Ref<Instance> model = read_keys(keys);
  EXPECT_TRUE(null_in(model.get(), "Note"));
  EXPECT_STREQ(model->__name_space.c_str(), "root/test");
  CMPIObjectPath* path = nullptr;
  ASSERT_EQ(make_CMPI_object_path(face(), model.get(), "root/other", path), 0);
  EXPECT_EQ(contents_of(path).keys, keys);
  EXPECT_EQ(contents_of(path).nameSpace, "root/other");
  EXPECT_EQ(contents_of(path).className, "TEST_Keys");
}

TEST_F(Keys, WideUnsignedKeysAreCutToTheirWidth) {
  NamedValues keys;
  for (const char* name :
       {"Kuint8", "Ksint8", "Kuint16", "Ksint16", "Kuint32", "Ksint32", "Kuint64", "Ksint64"})
    keys.set(name, Any::number(CMPI_uint64, 0x1FFFFFFF80000182));
  const Ref<Instance> model = read_keys(keys);
  EXPECT_EQ(take<std::uint8_t>(model.get(), "Kuint8"), 0x82);
  EXPECT_EQ(take<std::int8_t>(model.get(), "Ksint8"), -126);
  EXPECT_EQ(take<std::uint16_t>(model.get(), "Kuint16"), 0x182);
  EXPECT_EQ(take<std::int16_t>(model.get(), "Ksint16"), 0x182);
  EXPECT_EQ(take<std::uint32_t>(model.get(), "Kuint32"), 0x80000182);
  EXPECT_EQ(take<std::int32_t>(model.get(), "Ksint32"), -2147483262);
  EXPECT_EQ(take<std::uint64_t>(model.get(), "Kuint64"), 0x1FFFFFFF80000182u);
  EXPECT_EQ(take<std::int64_t>(model.get(), "Ksint64"), 0x1FFFFFFF80000182);
}

TEST_F(Keys, WideSignedKeysAreCutToTheirWidth) {
  NamedValues keys;
  for (const char* name : {"Kuint8", "Ksint8", "Kuint16", "Ksint16", "Kuint32", "Ksint32"})
    keys.set(name, Any::signedNumber(CMPI_sint64, -2));
  const Ref<Instance> model = read_keys(keys);
  EXPECT_EQ(take<std::uint8_t>(model.get(), "Kuint8"), 254);
  EXPECT_EQ(take<std::int8_t>(model.get(), "Ksint8"), -2);
  EXPECT_EQ(take<std::uint16_t>(model.get(), "Kuint16"), 65534);
  EXPECT_EQ(take<std::int16_t>(model.get(), "Ksint16"), -2);
  EXPECT_EQ(take<std::uint32_t>(model.get(), "Kuint32"), 4294967294u);
  EXPECT_EQ(take<std::int32_t>(model.get(), "Ksint32"), -2);
}

TEST_F(Keys, ANullWideKeyStaysNull) {
  CMPIObjectPath_Container container(
      repository(), face(), "root/test",
      objects.path({"", "root/test", "TEST_Keys", {{"Kuint16", Any::null(CMPI_uint64)}}}));
  Value value;
  ASSERT_EQ(container.get_value(0, UINT16, value), 0);
  EXPECT_EQ(value.type(), UINT16);
  EXPECT_TRUE(value.null());
}

TEST_F(Keys, OtherTypesAreNotConverted) {
  Trace_Log log;
  const Ref<Instance> model = read_keys({{"Kuint16", Any::number(CMPI_uint32, 1)},
                                         {"Kboolean", Any::number(CMPI_uint64, 1)},
                                         {"Kstring", Any::number(CMPI_uint64, 1)},
                                         {"Kuint32", Any::string("1")}});
  for (const char* name : {"Kuint16", "Kboolean", "Kstring", "Kuint32"})
    EXPECT_TRUE(null_in(model.get(), name)) << name;
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kuint16: uint32/uint16"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kboolean: uint64/boolean"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kstring: uint64/string"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Kuint32: string/uint32"));
}

TEST_F(Keys, FeaturesThatAreNoKeysAreSkippedQuietly) {
  Trace_Log log;
  const Ref<Instance> model = read_keys({{"Note", Any::string("n")}});
  EXPECT_TRUE(null_in(model.get(), "Note"));
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Keys, ReferenceKeysAreReadWithTheirOwnKeys) {
  tvx::host::ObjectPath path = {"",
                                "root/test",
                                "TEST_Link",
                                {{"Antecedent", Any::reference(path_of("TEST_Spare", "s"))},
                                 {"Dependent", Any::reference(path_of("TEST_Part", "p"))}}};
  Instance* out = nullptr;
  ASSERT_EQ(make_cimrt_reference(nullptr, classes.link, objects.path(path), out), 0);
  const Ref<Instance> model(out);
  const auto* antecedent = take<Instance*>(model.get(), "Antecedent");
  ASSERT_NE(antecedent, nullptr);
  EXPECT_EQ(class_of(antecedent), classes.spare);
  EXPECT_EQ(take<String>(antecedent, "Id"), "s");
  CMPIObjectPath* back = nullptr;
  ASSERT_EQ(make_CMPI_object_path(face(), model.get(), "root/test", back), 0);
  EXPECT_TRUE(contents_of(back).sameObject(path));
}

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
