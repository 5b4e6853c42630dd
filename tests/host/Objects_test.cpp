// Every function of the object tables, called as a provider calls them.
#include <gtest/gtest.h>

#include <algorithm>

#include "Broker.h"
#include "Test_Classes.h"
#include "cmpi/cmpimacs.h"

namespace tvx::host {
namespace {

class ObjectsTest : public ::testing::Test {
 protected:
  ObjectsTest() : m_Broker(options()), mb(m_Broker.face()) {}

  static BrokerOptions options() {
    BrokerOptions result;
    result.strict = true;
    result.classes = &test::testClasses();
    return result;
  }

  CMPIObjectPath* path(const char* className = "FAKE_Widget") {
    return CMNewObjectPath(mb, "root/fake", className, nullptr);
  }
  CMPIInstance* instance() { return CMNewInstance(mb, path(), nullptr); }

  static std::string text(const CMPIString* string) { return CMGetCharsPtr(string, nullptr); }
  static const CMPIValue* chars(const char* text) {
    return reinterpret_cast<const CMPIValue*>(text);
  }

  Broker m_Broker;
  const CMPIBroker* mb;
};

// ---- Strings ----

TEST_F(ObjectsTest, StringsHoldACopyOfTheirText) {
  std::string source = "text";
  CMPIString* string = CMNewString(mb, source.c_str(), nullptr);
  source = "gone";
  CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
  EXPECT_STREQ(CMGetCharsPtr(string, &rc), "text");
  EXPECT_EQ(rc.rc, CMPI_RC_OK);
  CMPIString* clone = CMClone(string, &rc);
  EXPECT_EQ(CMRelease(string).rc, CMPI_RC_OK);
  EXPECT_STREQ(CMGetCharsPtr(clone, nullptr), "text");
  EXPECT_EQ(CMRelease(clone).rc, CMPI_RC_OK);
}

TEST_F(ObjectsTest, AStringMayHoldNoText) {
  const CMPIString* string = CMNewString(mb, nullptr, nullptr);
  CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
  EXPECT_EQ(CMGetCharsPtr(string, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_OK);
}

TEST_F(ObjectsTest, NullHandlesAreAnsweredWithACode) {
  CMPIStatus rc{};
  EXPECT_EQ(m_Broker.face()->eft->newInstance(mb, nullptr, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
  const CMPIString* string = CMNewString(mb, "x", nullptr);
  EXPECT_EQ(string->ft->getCharPtr(nullptr, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(string->ft->release(nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(string->ft->clone(nullptr, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

// ---- Datetimes ----

TEST_F(ObjectsTest, DatetimesComeFromTextAndBinary) {
  CMPIStatus rc{};
  CMPIDateTime* point = CMNewDateTimeFromChars(mb, "19700101000001.000000+000", &rc);
  ASSERT_NE(point, nullptr);
  EXPECT_EQ(CMGetBinaryFormat(point, nullptr), 1000000U);
  EXPECT_FALSE(CMIsInterval(point, nullptr));
  CMPIDateTime* interval = CMNewDateTimeFromBinary(mb, 2000000, 1, &rc);
  EXPECT_TRUE(CMIsInterval(interval, nullptr));
  EXPECT_EQ(text(CMGetStringFormat(interval, nullptr)), "00000000000002.000000:000");
  CMPIDateTime* clone = CMClone(interval, nullptr);
  EXPECT_EQ(CMGetBinaryFormat(clone, nullptr), 2000000U);
  CMRelease(clone);
}

TEST_F(ObjectsTest, BadDatetimeTextGivesNull) {
  CMPIStatus rc{};
  EXPECT_EQ(CMNewDateTimeFromChars(mb, "yesterday", &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(CMNewDateTimeFromChars(mb, nullptr, nullptr), nullptr);
}

TEST_F(ObjectsTest, ANewDatetimeIsNow) {
  const auto before = static_cast<CMPIUint64>(time(nullptr)) * 1000000;
  EXPECT_GE(CMGetBinaryFormat(CMNewDateTime(mb, nullptr), nullptr), before);
}

// ---- Arrays ----

TEST_F(ObjectsTest, ArraysStartWithNullElementsAndKeepWhatIsSet) {
  CMPIArray* array = CMNewArray(mb, 2, CMPI_uint16, nullptr);
  EXPECT_EQ(CMGetArrayCount(array, nullptr), 2U);
  EXPECT_EQ(CMGetArrayType(array, nullptr), CMPI_uint16);
  EXPECT_TRUE(CMIsNullValue(CMGetArrayElementAt(array, 0, nullptr)));
  CMPIValue value{};
  value.uint16 = 7;
  EXPECT_EQ(CMSetArrayElementAt(array, 1, &value, CMPI_uint16).rc, CMPI_RC_OK);
  EXPECT_EQ(CMGetArrayElementAt(array, 1, nullptr).value.uint16, 7);
  EXPECT_EQ(CMSetArrayElementAt(array, 1, nullptr, CMPI_null).rc, CMPI_RC_OK);
  EXPECT_TRUE(CMIsNullValue(CMGetArrayElementAt(array, 1, nullptr)));
}

TEST_F(ObjectsTest, ArraysCheckIndexAndElementType) {
  CMPIArray* array = CMNewArray(mb, 1, CMPI_string, nullptr);
  CMPIValue value{};
  CMPIStatus rc{};
  EXPECT_TRUE(CMIsNullValue(CMGetArrayElementAt(array, 1, &rc)));
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(CMSetArrayElementAt(array, 1, chars("x"), CMPI_chars).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  EXPECT_EQ(CMSetArrayElementAt(array, 0, &value, CMPI_uint8).rc, CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(CMSetArrayElementAt(array, 0, &value, CMPI_args).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
  EXPECT_EQ(CMSetArrayElementAt(array, 0, chars("x"), CMPI_chars).rc, CMPI_RC_OK);
  EXPECT_EQ(text(CMGetArrayElementAt(array, 0, nullptr).value.string), "x");
  EXPECT_EQ(CMNewArray(mb, 1, CMPI_uint8A, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
}

TEST_F(ObjectsTest, ArrayClonesAreIndependent) {
  CMPIArray* array = CMNewArray(mb, 1, CMPI_sint64, nullptr);
  CMPIArray* clone = CMClone(array, nullptr);
  CMPIValue value{};
  value.sint64 = -9;
  CMSetArrayElementAt(array, 0, &value, CMPI_sint64);
  EXPECT_TRUE(CMIsNullValue(CMGetArrayElementAt(clone, 0, nullptr)));
  EXPECT_EQ(CMGetArrayElementAt(array, 0, nullptr).value.sint64, -9);
  CMRelease(clone);
}

// ---- Object paths ----

TEST_F(ObjectsTest, PathsKeepPlaceClassAndKeys) {
  CMPIObjectPath* op = path();
  CMSetHostname(op, "host");
  EXPECT_EQ(text(CMGetHostname(op, nullptr)), "host");
  CMSetNameSpace(op, "root/else");
  EXPECT_EQ(text(CMGetNameSpace(op, nullptr)), "root/else");
  CMSetClassName(op, "FAKE_Gadget");
  EXPECT_EQ(text(CMGetClassName(op, nullptr)), "FAKE_Gadget");
  EXPECT_EQ(CMAddKey(op, "Name", chars("a"), CMPI_chars).rc, CMPI_RC_OK);
  CMPIValue number{};
  number.uint32 = 3;
  EXPECT_EQ(CMAddKey(op, "Number", &number, CMPI_uint32).rc, CMPI_RC_OK);
  EXPECT_EQ(CMGetKeyCount(op, nullptr), 2U);
  const CMPIData data = CMGetKey(op, "NAME", nullptr);
  EXPECT_EQ(data.type, CMPI_string);
  EXPECT_EQ(data.state, CMPI_keyValue);
  EXPECT_EQ(text(data.value.string), "a");
  CMPIString* name = nullptr;
  EXPECT_EQ(CMGetKeyAt(op, 1, &name, nullptr).value.uint32, 3U);
  EXPECT_EQ(text(name), "Number");
  EXPECT_EQ(text(op->ft->toString(op, nullptr)),
            "//host/root/else:FAKE_Gadget.Name=\"a\",Number=3");
}

TEST_F(ObjectsTest, PathsAnswerMissingKeysAndBadTypes) {
  CMPIObjectPath* op = path();
  CMPIStatus rc{};
  EXPECT_TRUE(CMIsNullValue(CMGetKey(op, "Name", &rc)));
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  CMGetKeyAt(op, 0, nullptr, &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  CMPIValue value{};
  EXPECT_EQ(CMAddKey(op, "Number", &value, CMPI_uint64).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
  EXPECT_EQ(CMAddKey(op, nullptr, &value, CMPI_uint32).rc, CMPI_RC_ERR_INVALID_PARAMETER);
  value.array = CMNewArray(mb, 0, CMPI_uint8, nullptr);
  EXPECT_EQ(CMAddKey(op, "Any", &value, CMPI_uint8A).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
  EXPECT_EQ(CMGetKeyCount(op, nullptr), 0U);
}

TEST_F(ObjectsTest, PlacesAreCopiedBetweenPaths) {
  CMPIObjectPath* from = path();
  CMSetHostname(from, "host");
  CMPIObjectPath* to = CMNewObjectPath(mb, nullptr, nullptr, nullptr);
  EXPECT_EQ(text(CMGetNameSpace(to, nullptr)), "");
  EXPECT_EQ(to->ft->setNameSpaceFromObjectPath(to, from).rc, CMPI_RC_OK);
  EXPECT_EQ(text(CMGetNameSpace(to, nullptr)), "root/fake");
  EXPECT_EQ(text(CMGetHostname(to, nullptr)), "");
  EXPECT_EQ(to->ft->setHostAndNameSpaceFromObjectPath(to, from).rc, CMPI_RC_OK);
  EXPECT_EQ(text(CMGetHostname(to, nullptr)), "host");
  EXPECT_EQ(to->ft->setNameSpaceFromObjectPath(to, nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ObjectsTest, ThereAreNoQualifiers) {
  const CMPIObjectPath* op = path();
  CMPIStatus rc{};
  EXPECT_TRUE(CMIsNullValue(op->ft->getClassQualifier(op, "Key", &rc)));
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
  op->ft->getPropertyQualifier(op, "Name", "Key", &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
  op->ft->getMethodQualifier(op, "Paint", "Static", &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
  op->ft->getParameterQualifier(op, "Paint", "Color", "In", &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
}

// ---- Instances ----

TEST_F(ObjectsTest, InstancesKeepTheirPropertiesInOrder) {
  CMPIInstance* inst = instance();
  CMSetProperty(inst, "Color", chars("red"), CMPI_chars);
  CMPIValue value{};
  value.boolean = 1;
  CMSetProperty(inst, "Flag", &value, CMPI_boolean);
  CMSetProperty(inst, "color", chars("blue"), CMPI_chars);
  EXPECT_EQ(CMGetPropertyCount(inst, nullptr), 2U);
  CMPIString* name = nullptr;
  EXPECT_EQ(text(CMGetPropertyAt(inst, 0, &name, nullptr).value.string), "blue");
  EXPECT_EQ(text(name), "Color");
  EXPECT_EQ(CMGetProperty(inst, "FLAG", nullptr).value.boolean, 1);
  CMPIStatus rc{};
  EXPECT_TRUE(CMIsNullValue(CMGetProperty(inst, "Ratio", &rc)));
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  CMGetPropertyAt(inst, 2, nullptr, &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ObjectsTest, PropertyTypesAreCheckedAgainstTheClass) {
  CMPIInstance* inst = instance();
  CMPIValue value{};
  EXPECT_EQ(CMSetProperty(inst, "Color", &value, CMPI_uint8).rc, CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(CMSetProperty(inst, "Sizes", &value, CMPI_uint16).rc, CMPI_RC_ERR_TYPE_MISMATCH);
  EXPECT_EQ(CMSetProperty(inst, "Odd", &value, CMPI_uint8).rc, CMPI_RC_OK)
      << "unknown names are let through";
  EXPECT_EQ(CMSetProperty(inst, nullptr, &value, CMPI_uint8).rc, CMPI_RC_ERR_INVALID_PARAMETER);
  EXPECT_EQ(CMSetProperty(inst, "Color", &value, CMPI_args).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
  const auto complaints = m_Broker.permanentReport().complaints;
  ASSERT_EQ(complaints.size(), 3U);
  EXPECT_EQ(complaints[0], "FAKE_Widget.Color is a string, the provider set a uint8");
  EXPECT_EQ(complaints[1], "FAKE_Widget.Sizes is a uint16[], the provider set a uint16");
  EXPECT_EQ(complaints[2], "FAKE_Widget has no property Odd");
}

TEST_F(ObjectsTest, SettingAKeyFillsThePath) {
  CMPIInstance* inst = instance();
  CMSetProperty(inst, "Name", chars("a"), CMPI_chars);
  CMPIObjectPath* op = CMGetObjectPath(inst, nullptr);
  EXPECT_EQ(text(CMGetKey(op, "Name", nullptr).value.string), "a");
  EXPECT_EQ(CMGetKeyCount(op, nullptr), 1U);
}

TEST_F(ObjectsTest, TheFilterKeepsOtherPropertiesOut) {
  CMPIInstance* inst = instance();
  CMSetProperty(inst, "Caption", chars("before"), CMPI_chars);
  const char* properties[] = {"color", nullptr};
  const char* keys[] = {"Name", nullptr};
  EXPECT_EQ(CMSetPropertyFilter(inst, properties, keys).rc, CMPI_RC_OK);
  EXPECT_EQ(CMGetPropertyCount(inst, nullptr), 0U) << "what was set before is filtered too";
  EXPECT_EQ(CMSetProperty(inst, "Caption", chars("x"), CMPI_chars).rc, CMPI_RC_OK);
  CMSetProperty(inst, "Color", chars("red"), CMPI_chars);
  CMSetProperty(inst, "Name", chars("a"), CMPI_chars);
  EXPECT_EQ(CMGetPropertyCount(inst, nullptr), 2U);
  CMSetPropertyFilter(inst, nullptr, nullptr);
  CMSetProperty(inst, "Caption", chars("x"), CMPI_chars);
  EXPECT_EQ(CMGetPropertyCount(inst, nullptr), 3U);
}

TEST_F(ObjectsTest, AFilteredKeyStillFillsThePath) {
  CMPIInstance* inst = instance();
  const char* properties[] = {"Color", nullptr};
  CMSetPropertyFilter(inst, properties, nullptr);
  CMSetProperty(inst, "Name", chars("a"), CMPI_chars);
  EXPECT_EQ(CMGetPropertyCount(inst, nullptr), 0U);
  EXPECT_EQ(CMGetKeyCount(CMGetObjectPath(inst, nullptr), nullptr), 1U);
}

TEST_F(ObjectsTest, PathAndOriginCanBeSet) {
  CMPIInstance* inst = instance();
  EXPECT_EQ(inst->ft->setObjectPath(inst, path("FAKE_Gadget")).rc, CMPI_RC_OK);
  EXPECT_EQ(text(CMGetClassName(CMGetObjectPath(inst, nullptr), nullptr)), "FAKE_Gadget");
  EXPECT_EQ(
      inst->ft->setPropertyWithOrigin(inst, "Color", chars("red"), CMPI_chars, "CIM_Thing").rc,
      CMPI_RC_OK);
  EXPECT_EQ(text(CMGetProperty(inst, "Color", nullptr).value.string), "red");
  CMPIInstance* clone = CMClone(inst, nullptr);
  CMSetProperty(inst, "Color", chars("blue"), CMPI_chars);
  EXPECT_EQ(text(CMGetProperty(clone, "Color", nullptr).value.string), "red");
  CMRelease(clone);
}

// ---- Values of every type, through arguments ----

struct ScalarRow {
  const char* name;
  CMPIType type;
  CMPIUint64 bits;
};

class ScalarTest : public ObjectsTest, public ::testing::WithParamInterface<ScalarRow> {};

TEST_P(ScalarTest, ComesBackAsItWentIn) {
  CMPIArgs* args = CMNewArgs(mb, nullptr);
  CMPIValue value{};
  value.uint64 = GetParam().bits;
  ASSERT_EQ(CMAddArg(args, "A", &value, GetParam().type).rc, CMPI_RC_OK);
  const CMPIData data = CMGetArg(args, "a", nullptr);
  EXPECT_EQ(data.type, GetParam().type);
  EXPECT_EQ(data.state, CMPI_goodValue);
  EXPECT_EQ(data.value.uint64, GetParam().bits);
}

INSTANTIATE_TEST_SUITE_P(AllTypes, ScalarTest,
                         ::testing::Values(ScalarRow{"boolean", CMPI_boolean, 1},
                                           ScalarRow{"char16", CMPI_char16, 0xABCD},
                                           ScalarRow{"uint8", CMPI_uint8, 0xFE},
                                           ScalarRow{"uint16", CMPI_uint16, 0xFEDC},
                                           ScalarRow{"uint32", CMPI_uint32, 0xFEDCBA98},
                                           ScalarRow{"uint64", CMPI_uint64, 0xFEDCBA9876543210},
                                           ScalarRow{"sint8", CMPI_sint8, 0x80},
                                           ScalarRow{"sint16", CMPI_sint16, 0x8000},
                                           ScalarRow{"sint32", CMPI_sint32, 0x80000000},
                                           ScalarRow{"sint64", CMPI_sint64, 0x8000000000000000},
                                           ScalarRow{"real32", CMPI_real32, 0x3FC00000},
                                           ScalarRow{"real64", CMPI_real64, 0x3FF8000000000000}),
                         [](const auto& row) { return std::string(row.param.name); });

TEST_F(ObjectsTest, ArgumentsHoldObjectsAndNulls) {
  CMPIArgs* args = CMNewArgs(mb, nullptr);
  CMPIValue value{};
  value.ref = path();
  CMAddArg(args, "Ref", &value, CMPI_ref);
  value.inst = instance();
  CMAddArg(args, "Inst", &value, CMPI_instance);
  value.dateTime = CMNewDateTimeFromBinary(mb, 0, 1, nullptr);
  CMAddArg(args, "Time", &value, CMPI_dateTime);
  char held[] = "held";
  value.chars = held;
  CMAddArg(args, "Chars", &value, CMPI_charsptr);
  CMAddArg(args, "Null", nullptr, CMPI_uint16);
  value.array = nullptr;
  CMAddArg(args, "NullArray", &value, CMPI_uint8A);
  EXPECT_EQ(CMGetArgCount(args, nullptr), 6U);
  EXPECT_EQ(text(CMGetClassName(CMGetArg(args, "Ref", nullptr).value.ref, nullptr)), "FAKE_Widget");
  EXPECT_EQ(CMGetPropertyCount(CMGetArg(args, "Inst", nullptr).value.inst, nullptr), 0U);
  EXPECT_TRUE(CMIsInterval(CMGetArg(args, "Time", nullptr).value.dateTime, nullptr));
  EXPECT_EQ(CMGetArg(args, "Chars", nullptr).type, CMPI_string);
  const CMPIData null = CMGetArg(args, "Null", nullptr);
  EXPECT_EQ(null.type, CMPI_uint16);
  EXPECT_EQ(null.state, CMPI_nullValue);
  EXPECT_EQ(CMGetArg(args, "NullArray", nullptr).type, CMPI_uint8A);
  CMPIString* name = nullptr;
  EXPECT_EQ(CMGetArgAt(args, 3, &name, nullptr).type, CMPI_string);
  EXPECT_EQ(text(name), "Chars");
  CMPIStatus rc{};
  CMGetArgAt(args, 6, &name, &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  CMGetArg(args, "None", &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  CMPIArgs* clone = CMClone(args, nullptr);
  EXPECT_EQ(CMGetArgCount(clone, nullptr), 6U);
  CMRelease(clone);
}

TEST_F(ObjectsTest, AnArrayOfAnotherTypeIsRefused) {
  CMPIArgs* args = CMNewArgs(mb, nullptr);
  CMPIValue value{};
  value.array = CMNewArray(mb, 1, CMPI_uint16, nullptr);
  EXPECT_EQ(CMAddArg(args, "A", &value, CMPI_uint8A).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
  EXPECT_EQ(CMAddArg(args, nullptr, &value, CMPI_uint16A).rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

// ---- Select expressions and the rest of the makers ----

TEST_F(ObjectsTest, SelectExpressionsKeepTheirText) {
  CMPIArray* projection = nullptr;
  CMPIStatus rc{};
  CMPISelectExp* select = mb->eft->newSelectExp(mb, "SELECT * FROM X", "WQL", &projection, &rc);
  ASSERT_NE(select, nullptr);
  EXPECT_EQ(text(select->ft->getString(select, nullptr)), "SELECT * FROM X");
  EXPECT_EQ(select->ft->evaluate(select, instance(), &rc), 0);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(select->ft->getDOC(select, &rc), nullptr);
  EXPECT_EQ(select->ft->getCOD(select, &rc), nullptr);
  EXPECT_EQ(select->ft->evaluateUsingAccessor(select, nullptr, nullptr, &rc), 0);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(mb->eft->newSelectExp(mb, nullptr, "WQL", nullptr, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_QUERY);
  CMPISelectExp* clone = CMClone(select, nullptr);
  EXPECT_EQ(CMRelease(clone).rc, CMPI_RC_OK);
}

TEST_F(ObjectsTest, ObjectsTellTheirTypeAndText) {
  const CMPIObjectPath* op = path();
  const CMPIString* string = CMNewString(mb, "x", nullptr);
  EXPECT_EQ(text(mb->eft->getType(mb, op, nullptr)), "CMPIObjectPath");
  EXPECT_TRUE(mb->eft->isOfType(mb, string, "CMPIString", nullptr));
  EXPECT_FALSE(mb->eft->isOfType(mb, string, "CMPIArgs", nullptr));
  EXPECT_EQ(text(mb->eft->toString(mb, op, nullptr)), "root/fake:FAKE_Widget");
  EXPECT_EQ(text(mb->eft->toString(mb, string, nullptr)), "x");
  EXPECT_EQ(text(mb->eft->toString(mb, instance(), nullptr)), "instance of FAKE_Widget");
  EXPECT_EQ(text(mb->eft->toString(mb, CMNewArgs(mb, nullptr), nullptr)), "CMPIArgs");
  EXPECT_EQ(text(mb->eft->toString(mb, CMNewDateTimeFromBinary(mb, 0, 1, nullptr), nullptr)),
            "00000000000000.000000:000");
  CMPIStatus rc{};
  EXPECT_EQ(mb->eft->toString(mb, nullptr, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ObjectsTest, ClassTestsUseTheDescriptions) {
  const CMPIObjectPath* op = path("FAKE_Gadget");
  CMPIStatus rc{};
  EXPECT_TRUE(mb->eft->classPathIsA(mb, op, "CIM_Thing", &rc));
  EXPECT_FALSE(mb->eft->classPathIsA(mb, op, "FAKE_Link", &rc));
  EXPECT_EQ(rc.rc, CMPI_RC_OK);
  mb->eft->classPathIsA(mb, op, nullptr, &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(ObjectsTest, MessagesAndLogLines) {
  CMPIStatus rc{};
  EXPECT_EQ(text(mb->eft->getMessage(mb, "id", "the default", &rc, 0)), "the default");
  mb->eft->logMessage(mb, 3, "ID7", "a text", nullptr);
  mb->eft->trace(mb, 1, "part", nullptr, CMNewString(mb, "from a string", nullptr));
  EXPECT_EQ(m_Broker.logLines(),
            (std::vector<std::string>{"log 3 ID7: a text", "trace 1 part: from a string"}));
  EXPECT_EQ(mb->eft->newCMPIError(mb, "o", "i", "m", 0, 0, 0, &rc), nullptr);
  EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

}  // namespace
}  // namespace tvx::host
