// The header set against the published layout of the binary interface.
#include <gtest/gtest.h>

#include <cstddef>
#include <fstream>
#include <map>
#include <string>

#include "cmpi/cmpimacs.h"

extern "C" int tvx_c_layout_agrees(const char* member, std::size_t offset);

namespace {

using Layout = std::map<std::string, std::size_t>;

// Members are reached with offsetof, which only a macro can name.
#define MEMBER(STRUCT, NAME) \
  { #STRUCT "." #NAME, offsetof(STRUCT, NAME) }
#define SIZE(STRUCT) \
  { "sizeof(" #STRUCT ")", sizeof(STRUCT) }

const Layout& headers() {
  static const Layout layout = {
      MEMBER(CMPIBrokerFT, prepareAttachThread),
      MEMBER(CMPIBrokerFT, attachThread),
      MEMBER(CMPIBrokerFT, detachThread),
      MEMBER(CMPIBrokerFT, deliverIndication),
      MEMBER(CMPIBrokerFT, enumerateInstanceNames),
      MEMBER(CMPIBrokerFT, getInstance),
      MEMBER(CMPIBrokerFT, createInstance),
      MEMBER(CMPIBrokerFT, modifyInstance),
      MEMBER(CMPIBrokerFT, deleteInstance),
      MEMBER(CMPIBrokerFT, execQuery),
      MEMBER(CMPIBrokerFT, enumerateInstances),
      MEMBER(CMPIBrokerFT, associators),
      MEMBER(CMPIBrokerFT, associatorNames),
      MEMBER(CMPIBrokerFT, references),
      MEMBER(CMPIBrokerFT, referenceNames),
      MEMBER(CMPIBrokerFT, invokeMethod),
      MEMBER(CMPIBrokerFT, setProperty),
      MEMBER(CMPIBrokerFT, getProperty),
      MEMBER(CMPIBrokerFT, enumerateInstancesFiltered),
      MEMBER(CMPIBrokerFT, associatorsFiltered),
      MEMBER(CMPIBrokerFT, referencesFiltered),
      MEMBER(CMPIBrokerEncFT, newInstance),
      MEMBER(CMPIBrokerEncFT, newObjectPath),
      MEMBER(CMPIBrokerEncFT, newArgs),
      MEMBER(CMPIBrokerEncFT, newString),
      MEMBER(CMPIBrokerEncFT, newArray),
      MEMBER(CMPIBrokerEncFT, newDateTime),
      MEMBER(CMPIBrokerEncFT, newDateTimeFromBinary),
      MEMBER(CMPIBrokerEncFT, newDateTimeFromChars),
      MEMBER(CMPIBrokerEncFT, newSelectExp),
      MEMBER(CMPIBrokerEncFT, classPathIsA),
      MEMBER(CMPIBrokerEncFT, toString),
      MEMBER(CMPIBrokerEncFT, isOfType),
      MEMBER(CMPIBrokerEncFT, getType),
      MEMBER(CMPIBrokerEncFT, getMessage),
      MEMBER(CMPIBrokerEncFT, logMessage),
      MEMBER(CMPIBrokerEncFT, trace),
      MEMBER(CMPIBrokerEncFT, newCMPIError),
      MEMBER(CMPIBrokerEncFT, openMessageFile),
      MEMBER(CMPIBrokerEncFT, closeMessageFile),
      MEMBER(CMPIBrokerEncFT, getMessage2),
      MEMBER(CMPIBrokerEncFT, newPropertyList),
      MEMBER(CMPIBrokerEncFT, newStringCP),
      MEMBER(CMPIBrokerEncFT, newEnumerationFilter),
      MEMBER(CMPIBrokerExtFT, resolveFileName),
      MEMBER(CMPIBrokerExtFT, newThread),
      MEMBER(CMPIBrokerExtFT, joinThread),
      MEMBER(CMPIBrokerExtFT, exitThread),
      MEMBER(CMPIBrokerExtFT, cancelThread),
      MEMBER(CMPIBrokerExtFT, threadSleep),
      MEMBER(CMPIBrokerExtFT, threadOnce),
      MEMBER(CMPIBrokerExtFT, createThreadKey),
      MEMBER(CMPIBrokerExtFT, destroyThreadKey),
      MEMBER(CMPIBrokerExtFT, getThreadSpecific),
      MEMBER(CMPIBrokerExtFT, setThreadSpecific),
      MEMBER(CMPIBrokerExtFT, newMutex),
      MEMBER(CMPIBrokerExtFT, destroyMutex),
      MEMBER(CMPIBrokerExtFT, lockMutex),
      MEMBER(CMPIBrokerExtFT, unlockMutex),
      MEMBER(CMPIBrokerExtFT, newCondition),
      MEMBER(CMPIBrokerExtFT, destroyCondition),
      MEMBER(CMPIBrokerExtFT, condWait),
      MEMBER(CMPIBrokerExtFT, timedCondWait),
      MEMBER(CMPIBrokerExtFT, signalCondition),
      MEMBER(CMPIBrokerExtFT, destroyMutex2),
      MEMBER(CMPIBrokerExtFT, lockMutex2),
      MEMBER(CMPIBrokerExtFT, unlockMutex2),
      MEMBER(CMPIBrokerExtFT, destroyCondition2),
      MEMBER(CMPIBrokerMemFT, mark),
      MEMBER(CMPIBrokerMemFT, release),
      MEMBER(CMPIBrokerMemFT, cmpiMalloc),
      MEMBER(CMPIBrokerMemFT, cmpiCalloc),
      MEMBER(CMPIBrokerMemFT, cmpiRealloc),
      MEMBER(CMPIBrokerMemFT, cmpiStrDup),
      MEMBER(CMPIBrokerMemFT, cmpiFree),
      MEMBER(CMPIBrokerMemFT, freeInstance),
      MEMBER(CMPIBrokerMemFT, freeObjectPath),
      MEMBER(CMPIBrokerMemFT, freeArgs),
      MEMBER(CMPIBrokerMemFT, freeString),
      MEMBER(CMPIBrokerMemFT, freeArray),
      MEMBER(CMPIBrokerMemFT, freeDateTime),
      MEMBER(CMPIBrokerMemFT, freeSelectExp),
      MEMBER(CMPIBrokerMemFT, freeChars),
      MEMBER(CMPIContextFT, release),
      MEMBER(CMPIContextFT, clone),
      MEMBER(CMPIContextFT, getEntry),
      MEMBER(CMPIContextFT, getEntryAt),
      MEMBER(CMPIContextFT, getEntryCount),
      MEMBER(CMPIContextFT, addEntry),
      MEMBER(CMPIResultFT, release),
      MEMBER(CMPIResultFT, clone),
      MEMBER(CMPIResultFT, returnData),
      MEMBER(CMPIResultFT, returnInstance),
      MEMBER(CMPIResultFT, returnObjectPath),
      MEMBER(CMPIResultFT, returnDone),
      MEMBER(CMPIResultFT, returnError),
      MEMBER(CMPIStringFT, release),
      MEMBER(CMPIStringFT, clone),
      MEMBER(CMPIStringFT, getCharPtr),
      MEMBER(CMPIStringFT, newCharsCP),
      MEMBER(CMPIArrayFT, release),
      MEMBER(CMPIArrayFT, clone),
      MEMBER(CMPIArrayFT, getSize),
      MEMBER(CMPIArrayFT, getSimpleType),
      MEMBER(CMPIArrayFT, getElementAt),
      MEMBER(CMPIArrayFT, setElementAt),
      MEMBER(CMPIEnumerationFT, release),
      MEMBER(CMPIEnumerationFT, clone),
      MEMBER(CMPIEnumerationFT, getNext),
      MEMBER(CMPIEnumerationFT, hasNext),
      MEMBER(CMPIEnumerationFT, toArray),
      MEMBER(CMPIInstanceFT, release),
      MEMBER(CMPIInstanceFT, clone),
      MEMBER(CMPIInstanceFT, getProperty),
      MEMBER(CMPIInstanceFT, getPropertyAt),
      MEMBER(CMPIInstanceFT, getPropertyCount),
      MEMBER(CMPIInstanceFT, setProperty),
      MEMBER(CMPIInstanceFT, getObjectPath),
      MEMBER(CMPIInstanceFT, setPropertyFilter),
      MEMBER(CMPIInstanceFT, setObjectPath),
      MEMBER(CMPIInstanceFT, setPropertyWithOrigin),
      MEMBER(CMPIObjectPathFT, release),
      MEMBER(CMPIObjectPathFT, clone),
      MEMBER(CMPIObjectPathFT, setNameSpace),
      MEMBER(CMPIObjectPathFT, getNameSpace),
      MEMBER(CMPIObjectPathFT, setHostname),
      MEMBER(CMPIObjectPathFT, getHostname),
      MEMBER(CMPIObjectPathFT, setClassName),
      MEMBER(CMPIObjectPathFT, getClassName),
      MEMBER(CMPIObjectPathFT, addKey),
      MEMBER(CMPIObjectPathFT, getKey),
      MEMBER(CMPIObjectPathFT, getKeyAt),
      MEMBER(CMPIObjectPathFT, getKeyCount),
      MEMBER(CMPIObjectPathFT, setNameSpaceFromObjectPath),
      MEMBER(CMPIObjectPathFT, setHostAndNameSpaceFromObjectPath),
      MEMBER(CMPIObjectPathFT, getClassQualifier),
      MEMBER(CMPIObjectPathFT, getPropertyQualifier),
      MEMBER(CMPIObjectPathFT, getMethodQualifier),
      MEMBER(CMPIObjectPathFT, getParameterQualifier),
      MEMBER(CMPIObjectPathFT, toString),
      MEMBER(CMPIArgsFT, release),
      MEMBER(CMPIArgsFT, clone),
      MEMBER(CMPIArgsFT, addArg),
      MEMBER(CMPIArgsFT, getArg),
      MEMBER(CMPIArgsFT, getArgAt),
      MEMBER(CMPIArgsFT, getArgCount),
      MEMBER(CMPIDateTimeFT, release),
      MEMBER(CMPIDateTimeFT, clone),
      MEMBER(CMPIDateTimeFT, getBinaryFormat),
      MEMBER(CMPIDateTimeFT, getStringFormat),
      MEMBER(CMPIDateTimeFT, isInterval),
      MEMBER(CMPISelectExpFT, release),
      MEMBER(CMPISelectExpFT, clone),
      MEMBER(CMPISelectExpFT, evaluate),
      MEMBER(CMPISelectExpFT, getString),
      MEMBER(CMPISelectExpFT, getDOC),
      MEMBER(CMPISelectExpFT, getCOD),
      MEMBER(CMPISelectExpFT, evaluateUsingAccessor),
      MEMBER(CMPISelectCondFT, release),
      MEMBER(CMPISelectCondFT, clone),
      MEMBER(CMPISelectCondFT, getCountAndType),
      MEMBER(CMPISelectCondFT, getSubCondAt),
      MEMBER(CMPISubCondFT, release),
      MEMBER(CMPISubCondFT, clone),
      MEMBER(CMPISubCondFT, getCount),
      MEMBER(CMPISubCondFT, getPredicateAt),
      MEMBER(CMPISubCondFT, getPredicate),
      MEMBER(CMPIPredicateFT, release),
      MEMBER(CMPIPredicateFT, clone),
      MEMBER(CMPIPredicateFT, getData),
      MEMBER(CMPIPredicateFT, evaluateUsingAccessor),
      MEMBER(CMPIErrorFT, release),
      MEMBER(CMPIErrorFT, clone),
      MEMBER(CMPIErrorFT, getErrorType),
      MEMBER(CMPIErrorFT, getOtherErrorType),
      MEMBER(CMPIErrorFT, getOwningEntity),
      MEMBER(CMPIErrorFT, getMessageID),
      MEMBER(CMPIErrorFT, getMessage),
      MEMBER(CMPIErrorFT, getPerceivedSeverity),
      MEMBER(CMPIErrorFT, getProbableCause),
      MEMBER(CMPIErrorFT, getProbableCauseDescription),
      MEMBER(CMPIErrorFT, getRecommendedActions),
      MEMBER(CMPIErrorFT, getErrorSource),
      MEMBER(CMPIErrorFT, getErrorSourceFormat),
      MEMBER(CMPIErrorFT, getOtherErrorSourceFormat),
      MEMBER(CMPIErrorFT, getCIMStatusCode),
      MEMBER(CMPIErrorFT, getCIMStatusCodeDescription),
      MEMBER(CMPIErrorFT, getMessageArguments),
      MEMBER(CMPIErrorFT, setErrorType),
      MEMBER(CMPIErrorFT, setOtherErrorType),
      MEMBER(CMPIErrorFT, setProbableCauseDescription),
      MEMBER(CMPIErrorFT, setRecommendedActions),
      MEMBER(CMPIErrorFT, setErrorSource),
      MEMBER(CMPIErrorFT, setErrorSourceFormat),
      MEMBER(CMPIErrorFT, setOtherErrorSourceFormat),
      MEMBER(CMPIErrorFT, setCIMStatusCodeDescription),
      MEMBER(CMPIErrorFT, setMessageArguments),
      MEMBER(CMPIPropertyListFT, release),
      MEMBER(CMPIPropertyListFT, clone),
      MEMBER(CMPIPropertyListFT, isPropertyInList),
      MEMBER(CMPIPropertyListFT, getProperties),
      MEMBER(CMPIEnumerationFilterFT, release),
      MEMBER(CMPIEnumerationFilterFT, clone),
      MEMBER(CMPIEnumerationFilterFT, match),
      MEMBER(CMPIInstanceMIFT, cleanup),
      MEMBER(CMPIInstanceMIFT, enumerateInstanceNames),
      MEMBER(CMPIInstanceMIFT, enumerateInstances),
      MEMBER(CMPIInstanceMIFT, getInstance),
      MEMBER(CMPIInstanceMIFT, createInstance),
      MEMBER(CMPIInstanceMIFT, modifyInstance),
      MEMBER(CMPIInstanceMIFT, deleteInstance),
      MEMBER(CMPIInstanceMIFT, execQuery),
      MEMBER(CMPIInstanceMIFT, enumerateInstancesFiltered),
      MEMBER(CMPIAssociationMIFT, cleanup),
      MEMBER(CMPIAssociationMIFT, associators),
      MEMBER(CMPIAssociationMIFT, associatorNames),
      MEMBER(CMPIAssociationMIFT, references),
      MEMBER(CMPIAssociationMIFT, referenceNames),
      MEMBER(CMPIAssociationMIFT, associatorsFiltered),
      MEMBER(CMPIAssociationMIFT, referencesFiltered),
      MEMBER(CMPIMethodMIFT, cleanup),
      MEMBER(CMPIMethodMIFT, invokeMethod),
      MEMBER(CMPIPropertyMIFT, cleanup),
      MEMBER(CMPIPropertyMIFT, setProperty),
      MEMBER(CMPIPropertyMIFT, getProperty),
      MEMBER(CMPIPropertyMIFT, setPropertyWithOrigin),
      MEMBER(CMPIIndicationMIFT, cleanup),
      MEMBER(CMPIIndicationMIFT, authorizeFilter),
      MEMBER(CMPIIndicationMIFT, mustPoll),
      MEMBER(CMPIIndicationMIFT, activateFilter),
      MEMBER(CMPIIndicationMIFT, deActivateFilter),
      MEMBER(CMPIIndicationMIFT, enableIndications),
      MEMBER(CMPIIndicationMIFT, disableIndications),
      MEMBER(CMPIIndicationMIFT, authorizeFilterCollection),
      MEMBER(CMPIIndicationMIFT, activateFilterCollection),
      MEMBER(CMPIIndicationMIFT, deActivateFilterCollection),
      MEMBER(CMPIData, type),
      MEMBER(CMPIData, state),
      MEMBER(CMPIData, value),
      MEMBER(CMPIStatus, rc),
      MEMBER(CMPIStatus, msg),
      MEMBER(CMPIBroker, hdl),
      MEMBER(CMPIBroker, bft),
      MEMBER(CMPIBroker, eft),
      MEMBER(CMPIBroker, xft),
      MEMBER(CMPIBroker, mft),
      MEMBER(CMPIInstance, hdl),
      MEMBER(CMPIInstance, ft),
      MEMBER(CMPIInstanceMI, hdl),
      MEMBER(CMPIInstanceMI, ft),
      MEMBER(CMPIValuePtr, ptr),
      MEMBER(CMPIValuePtr, length),
      MEMBER(CMPIBrokerFT, brokerVersion),
      MEMBER(CMPIBrokerFT, brokerName),
      MEMBER(CMPIInstanceMIFT, ftVersion),
      MEMBER(CMPIInstanceMIFT, miVersion),
      MEMBER(CMPIInstanceMIFT, miName),
      SIZE(CMPIData),
      SIZE(CMPIValue),
      SIZE(CMPIStatus),
      SIZE(CMPIValuePtr),
  };
  return layout;
}

/// The published facts: one "Table.member offset" a line.
Layout published() {
  std::ifstream file(CMPI_LAYOUT_FILE);
  Layout layout;
  std::string line;
  while (std::getline(file, line)) {
    const std::size_t blank = line.find(' ');
    if (line.empty() || line[0] == '#' || blank == std::string::npos) continue;
    layout[line.substr(0, blank)] = std::stoul(line.substr(blank + 1));
  }
  return layout;
}

TEST(HeaderLayout, EveryPublishedMemberStandsWhereItShould) {
  const Layout facts = published();
  ASSERT_GT(facts.size(), 250u);
  for (const auto& [name, offset] : facts) {
    const auto found = headers().find(name);
    ASSERT_NE(found, headers().end()) << name;
    EXPECT_EQ(found->second, offset) << name;
  }
  EXPECT_EQ(headers().size(), facts.size());
}

TEST(HeaderLayout, NamesOfTheFirstVersionMeanTheSameSlots) {
  EXPECT_EQ(offsetof(CMPIInstanceMIFT, enumInstanceNames),
            offsetof(CMPIInstanceMIFT, enumerateInstanceNames));
  EXPECT_EQ(offsetof(CMPIInstanceMIFT, enumInstances),
            offsetof(CMPIInstanceMIFT, enumerateInstances));
  EXPECT_EQ(offsetof(CMPIInstanceMIFT, setInstance), offsetof(CMPIInstanceMIFT, modifyInstance));
  EXPECT_EQ(offsetof(CMPIBrokerFT, enumInstanceNames),
            offsetof(CMPIBrokerFT, enumerateInstanceNames));
  EXPECT_EQ(offsetof(CMPIBrokerFT, enumInstances), offsetof(CMPIBrokerFT, enumerateInstances));
  EXPECT_EQ(offsetof(CMPIBrokerFT, setInstance), offsetof(CMPIBrokerFT, modifyInstance));
  EXPECT_EQ(offsetof(CMPIBrokerFT, brokerClassification), 0u);
}

TEST(HeaderLayout, CAndCxxSeeTheSame) {
  for (const auto& [name, offset] : headers()) {
    const bool seen_by_c = name.starts_with("sizeof(") || name.starts_with("CMPIBrokerFT.") ||
                           name.starts_with("CMPIInstanceMIFT.");
    if (!seen_by_c) continue;
    EXPECT_NE(tvx_c_layout_agrees(name.c_str(), offset), 0) << name;
  }
}

TEST(HeaderCodes, TypesHaveTheirNumbers) {
  const std::map<int, int> codes = {{CMPI_null, 0},
                                    {CMPI_boolean, 2},
                                    {CMPI_char16, 3},
                                    {CMPI_real32, 8},
                                    {CMPI_real64, 0xC},
                                    {CMPI_uint8, 0x80},
                                    {CMPI_uint16, 0x90},
                                    {CMPI_uint32, 0xA0},
                                    {CMPI_uint64, 0xB0},
                                    {CMPI_sint8, 0xC0},
                                    {CMPI_sint16, 0xD0},
                                    {CMPI_sint32, 0xE0},
                                    {CMPI_sint64, 0xF0},
                                    {CMPI_instance, 0x1000},
                                    {CMPI_ref, 0x1100},
                                    {CMPI_args, 0x1200},
                                    {CMPI_class, 0x1300},
                                    {CMPI_filter, 0x1400},
                                    {CMPI_enumeration, 0x1500},
                                    {CMPI_string, 0x1600},
                                    {CMPI_chars, 0x1700},
                                    {CMPI_dateTime, 0x1800},
                                    {CMPI_ptr, 0x1900},
                                    {CMPI_charsptr, 0x1A00},
                                    {CMPI_ARRAY, 0x2000},
                                    {CMPI_booleanA, 0x2002},
                                    {CMPI_char16A, 0x2003},
                                    {CMPI_real32A, 0x2008},
                                    {CMPI_real64A, 0x200C},
                                    {CMPI_uint8A, 0x2080},
                                    {CMPI_uint16A, 0x2090},
                                    {CMPI_uint32A, 0x20A0},
                                    {CMPI_uint64A, 0x20B0},
                                    {CMPI_sint8A, 0x20C0},
                                    {CMPI_sint16A, 0x20D0},
                                    {CMPI_sint32A, 0x20E0},
                                    {CMPI_sint64A, 0x20F0},
                                    {CMPI_instanceA, 0x3000},
                                    {CMPI_refA, 0x3100},
                                    {CMPI_stringA, 0x3600},
                                    {CMPI_dateTimeA, 0x3800}};
  EXPECT_EQ(codes.size(), 41u);
  for (const auto& [code, number] : codes) EXPECT_EQ(code, number);
  EXPECT_EQ(CMPI_keyInteger, CMPI_sint64);
  EXPECT_EQ(CMPI_keyString, CMPI_string);
  EXPECT_EQ(CMPI_keyBoolean, CMPI_boolean);
  EXPECT_EQ(CMPI_keyRef, CMPI_ref);
}

TEST(HeaderCodes, StatesFlagsAndEntryNamesAreTheUsual) {
  EXPECT_EQ(CMPI_goodValue, 0);
  EXPECT_EQ(CMPI_nullValue, 0x100);
  EXPECT_EQ(CMPI_keyValue, 0x200);
  EXPECT_EQ(CMPI_notFound, 0x400);
  EXPECT_EQ(CMPI_badValue, 0x8000);
  EXPECT_EQ(CMPI_FLAG_LocalOnly, 1);
  EXPECT_EQ(CMPI_FLAG_DeepInheritance, 2);
  EXPECT_EQ(CMPI_FLAG_IncludeQualifiers, 4);
  EXPECT_EQ(CMPI_FLAG_IncludeClassOrigin, 8);
  EXPECT_STREQ(CMPIInitNameSpace, "CMPIInitNameSpace");
  EXPECT_STREQ(CMPIInvocationFlags, "CMPIInvocationFlags");
  EXPECT_STREQ(CMPIPrincipal, "CMPIPrincipal");
  EXPECT_STREQ(CMPIRole, "CMPIRole");
  EXPECT_STREQ(CMPIAcceptLanguage, "CMPIAcceptLanguage");
  EXPECT_STREQ(CMPIContentLanguage, "CMPIContentLanguage");
}

CMPIStatus leave_with(CMPIrc code) {
  CMReturn(code);
}

TEST(HeaderMacros, StatusesCarryNoMessage) {
  const CMPIStatus returned = leave_with(CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(returned.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(returned.msg, nullptr);

  CMPIString text = {};
  CMPIStatus status = {CMPI_RC_OK, &text};
  CMSetStatus(&status, CMPI_RC_ERROR);
  EXPECT_EQ(status.rc, CMPI_RC_ERROR);
  EXPECT_EQ(status.msg, nullptr);
}

}  // namespace
