// Single values and arrays between CMPI and the runtime, in both directions.
#include "Conversion_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;

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

}  // namespace
}  // namespace cimrt::test
