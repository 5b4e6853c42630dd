// invokeMethod, with the conversion of parameters in both directions.
#include <gmock/gmock.h>

#include <stdexcept>

#include "Faulty_Broker.h"
#include "Refused_Allocation.h"
#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using tvx::host::NamedValues;
using tvx::host::Reply;
using Any = tvx::host::Value;

class Method_Operations : public ::testing::Test {
 protected:
  Method_Operations() { server.serve<0>(script, classes.all); }

  Reply run(const NamedValues& arguments) {
    return server.broker.invokeMethod(path_of("TEST_All", "x"), "Run", arguments);
  }
  /// Runs the method and looks at the record that the provider gets.
  void expect_record(const NamedValues& arguments, std::function<void(const Instance*)> look) {
    bool called = false;
    script.invoke = [&](const Instance*, Instance* record) {
      called = true;
      look(record);
      return 0;
    };
    EXPECT_EQ(run(arguments).status.rc, CMPI_RC_OK);
    EXPECT_TRUE(called);
  }

  const Test_Classes& classes = Test_Classes::get();
  Script script;
  Test_Server server;
};

TEST_F(Method_Operations, TheProviderGetsModelAndRecord) {
  script.invoke = [&](const Instance* instance, Instance* record) {
    EXPECT_EQ(take<String>(instance, "Id"), "x");
    EXPECT_EQ(record->meta_class, static_cast<const Meta_Record*>(classes.run));
    EXPECT_STREQ(record->__name_space.c_str(), "root/test");
    EXPECT_EQ(take<std::uint32_t>(record, "Iuint32"), 5u);
    EXPECT_TRUE(null_in(record, "Iuint8"));
    EXPECT_TRUE(null_in(record, "return_value"));
    put(record, "return_value", std::uint32_t{4097});
    put(record, "Ostring", "done");
    return 0;
  };
  const Reply reply = run({{"Iuint32", Any::number(CMPI_uint32, 5)}});
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_EQ(reply.returnValue.type(), CMPI_uint32);
  EXPECT_EQ(reply.returnValue.asUnsigned(), 4097u);
  ASSERT_EQ(reply.outputs.size(), 1u);
  EXPECT_EQ(reply.outputs.find("Ostring")->asText(), "done");
  EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
}

TEST_F(Method_Operations, InParametersAreNotSentBackAndOutParametersNotTaken) {
  script.invoke = [&](const Instance*, Instance* record) {
    EXPECT_TRUE(null_in(record, "Ouint32"));
    return 0;
  };
  const Reply reply = run({{"Ouint32", Any::number(CMPI_uint32, 5)},
                           {"Iuint32", Any::number(CMPI_uint32, 6)},
                           {"Both", Any::number(CMPI_uint32, 7)}});
  ASSERT_EQ(reply.outputs.size(), 1u);
  EXPECT_EQ(reply.outputs.find("Both")->asUnsigned(), 7u);
}

TEST_F(Method_Operations, ARecordWithoutReturnValueReturnsTypeZero) {
  script.invoke = [](const Instance*, Instance*) { return 0; };
  const Reply reply = run({});
  EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
  EXPECT_TRUE(reply.done);
  EXPECT_EQ(reply.returnValue.type(), CMPI_null);
}

TEST_F(Method_Operations, StatusesMap) {
  const std::map<int, CMPIrc> codes = {{130, CMPI_RC_ERR_FAILED},
                                       {131, CMPI_RC_ERR_NOT_SUPPORTED},
                                       {132, CMPI_RC_ERR_ACCESS_DENIED}};
  for (const auto& [status, code] : codes) {
    script.statuses[OPERATION_INVOKE_METHOD] = status;
    const Reply reply = run({});
    EXPECT_EQ(reply.status.rc, code);
    EXPECT_FALSE(reply.done);
  }
  for (const int status : {-1, 5, 133}) {
    script.statuses[OPERATION_INVOKE_METHOD] = status;
    EXPECT_EQ(run({}).status.rc, CMPI_RC_OK) << status;
  }
}

TEST_F(Method_Operations, AnUnknownMethodIsNotFoundAndReachesNoProvider) {
  server.broker.interface("TEST_All", tvx::host::InterfaceKind::Method);
  Trace_Log log;
  const Reply reply = server.broker.invokeMethod(path_of("TEST_All", "x"), "Jump");
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
  EXPECT_EQ(script.count(OPERATION_INVOKE_METHOD), 0u);
  EXPECT_THAT(log.texts("DBG"),
              ElementsAre("enter: invokeMethod()",
                          "return: invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND Jump"));
}

TEST_F(Method_Operations, APropertyIsNoMethod) {
  EXPECT_EQ(server.broker.invokeMethod(path_of("TEST_All", "x"), "Id").status.rc,
            CMPI_RC_ERR_METHOD_NOT_FOUND);
}

TEST_F(Method_Operations, MethodNamesIgnoreCase) {
  script.invoke = [](const Instance*, Instance*) { return 0; };
  EXPECT_EQ(server.broker.invokeMethod(path_of("TEST_All", "x"), "rUN").status.rc, CMPI_RC_OK);
}

TEST_F(Method_Operations, AnUnknownClassFails) {
  server.add<0>("TEST_Unknown");
  Trace_Log log;
  EXPECT_EQ(server.broker.invokeMethod(path_of("TEST_Unknown", "x"), "Run").status.rc,
            CMPI_RC_ERR_FAILED);
  EXPECT_TRUE(log.has("DBG", "return: invokeMethod(): CMPI_RC_ERR_FAILED MetaClass not found"));
}

TEST_F(Method_Operations, AMethodNamedAsTheClassIsAnInvalidClass) {
  const Meta_Method* odd = Record_Builder().build_method("TEST_Odd", UINT32);
  auto* odd_class = const_cast<Meta_Class*>(
      Record_Builder().property("Id", STRING, FLAG_KEY).method(odd).build_class("test_odd"));
  const Meta_Class* list[] = {odd_class};
  const Meta_Repository repository = {list, 1};
  odd_class->meta_repository = &repository;
  Script own;
  Test_Server other;
  other.serve<1>(own, odd_class);
  EXPECT_EQ(other.broker.invokeMethod(path_of("test_odd", "x"), "TEST_Odd").status.rc,
            CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(own.count(OPERATION_INVOKE_METHOD), 0u);
}

TEST_F(Method_Operations, WhatAProviderThrowsEndsAsAFailure) {
  script.invoke = [](const Instance*, Instance*) -> std::int32_t {
    throw std::runtime_error("broken");
  };
  Trace_Log log;
  const Reply reply = run({{"Iuint32", Any::number(CMPI_uint32, 5)}});
  EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_TRUE(log.has("DBG", "return: invokeMethod(): CMPI_RC_ERR_FAILED"));
  EXPECT_FALSE(reply.report.leaks());
}

// ---- Texts for parameters of other types

TEST_F(Method_Operations, TextsAreCastToTheParametersType) {
  Trace_Log log;
  expect_record({{"Iboolean", Any::string("TRUE")},
                 {"Iuint8", Any::string("300")},
                 {"Isint8", Any::string("-2")},
                 {"Iuint16", Any::string("65537")},
                 {"Isint16", Any::string("-3")},
                 {"Iuint32", Any::string("4294967298")},
                 {"Isint32", Any::string("-5 apples")}},
                [](const Instance* record) {
                  EXPECT_TRUE(take<bool>(record, "Iboolean"));
                  EXPECT_EQ(take<std::uint8_t>(record, "Iuint8"), 44u);
                  EXPECT_EQ(take<std::int8_t>(record, "Isint8"), -2);
                  EXPECT_EQ(take<std::uint16_t>(record, "Iuint16"), 1u);
                  EXPECT_EQ(take<std::int16_t>(record, "Isint16"), -3);
                  EXPECT_EQ(take<std::uint32_t>(record, "Iuint32"), 2u);
                  EXPECT_EQ(take<std::int32_t>(record, "Isint32"), -5);
                });
  const std::vector<std::string> warnings = log.texts("WARN");
  EXPECT_EQ(std::count(warnings.begin(), warnings.end(),
                       "converting string to registered parameter type"),
            7);
}

TEST_F(Method_Operations, BooleanTextsAreLookedAtByTheirFirstLetters) {
  for (const char* text : {"false", "FALSE", "Falsehood"})
    expect_record({{"Iboolean", Any::string(text)}},
                  [](const Instance* record) { EXPECT_FALSE(take<bool>(record, "Iboolean")); });
  for (const char* text : {"true", "TrueBlue"})
    expect_record({{"Iboolean", Any::string(text)}},
                  [](const Instance* record) { EXPECT_TRUE(take<bool>(record, "Iboolean")); });
}

TEST_F(Method_Operations, ATextThatIsNoBooleanStaysATextAndDoesNotFit) {
  Trace_Log log;
  expect_record({{"Iboolean", Any::string("tru")}},
                [](const Instance* record) { EXPECT_TRUE(null_in(record, "Iboolean")); });
  EXPECT_TRUE(log.has("WARN", "type mismatch on Iboolean: string/boolean"));
  EXPECT_TRUE(log.has("WARN", "unexpected failure: Run.Iboolean"));
  EXPECT_FALSE(log.has("WARN", "converting string to registered parameter type"));
}

TEST_F(Method_Operations, WideNumbersAreNotReadFromTexts) {
  for (const char* name : {"Iuint64", "Isint64", "Ireal32", "Ireal64"}) {
    Trace_Log log;
    expect_record({{name, Any::string("1")}},
                  [&](const Instance* record) { EXPECT_TRUE(null_in(record, name)); });
    EXPECT_TRUE(log.has("WARN", "Default case - unsupported type")) << name;
    EXPECT_TRUE(
        log.has("WARN", std::string("type mismatch on ") + name + ": string/" + (name + 1)));
  }
}

TEST_F(Method_Operations, OtherTypesAreNotReadFromTexts) {
  for (const char* name : {"Ichar16", "Idatetime", "INames", "IPart"}) {
    Trace_Log log;
    expect_record({{name, Any::string("1")}},
                  [&](const Instance* record) { EXPECT_TRUE(null_in(record, name)); });
    EXPECT_TRUE(log.has("INFO", "cast_cmpi_string_to_scalar(): Not supported")) << name;
  }
}

TEST_F(Method_Operations, ATextParameterTakesATextAsItIs) {
  Trace_Log log;
  expect_record({{"Istring", Any::string("12")}},
                [](const Instance* record) { EXPECT_EQ(take<String>(record, "Istring"), "12"); });
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Method_Operations, ATextObjectWithoutCharactersIsNotCast) {
  Trace_Log log;
  expect_record({{"Iuint32", Any::stringWithoutText()}, {"Istring", Any::stringWithoutText()}},
                [](const Instance* record) {
                  EXPECT_TRUE(null_in(record, "Iuint32"));
                  EXPECT_EQ(take<String>(record, "Istring"), "");
                });
  EXPECT_TRUE(log.has("WARN", "CMGetCharsPtr() failed"));
  EXPECT_TRUE(log.has("WARN", "type mismatch on Iuint32: string/uint32"));
}

TEST_F(Method_Operations, NullsOfTheRightTypeAreNull) {
  Trace_Log log;
  expect_record({{"Iuint32", Any::null(CMPI_uint32)}, {"Istring", Any::null(CMPI_string)}},
                [](const Instance* record) {
                  EXPECT_TRUE(null_in(record, "Iuint32"));
                  EXPECT_TRUE(null_in(record, "Istring"));
                });
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Method_Operations, ABooleanForAListOfReferencesIsAnAbsentList) {
  Trace_Log log;
  expect_record({{"IParts", Any::boolean(false)}},
                [](const Instance* record) { EXPECT_TRUE(null_in(record, "IParts")); });
  EXPECT_THAT(log.texts("WARN"), ElementsAre());
}

TEST_F(Method_Operations, AnUnknownArgumentIsLogged) {
  Trace_Log log;
  expect_record({{"Colour", Any::string("red")}}, [](const Instance*) {});
  EXPECT_TRUE(log.has("WARN", "unknown feature: Run.Colour"));
}

TEST_F(Method_Operations, AnArgumentThatCannotBeReadIsLogged) {
  Trace_Log log;
  expect_record({{"IPart", Any::reference(path_of("TEST_Unknown", "r"))}},
                [](const Instance* record) { EXPECT_TRUE(null_in(record, "IPart")); });
  EXPECT_THAT(log.texts("WARN"),
              ElementsAre("failed to find meta class: TEST_Unknown", "cmpi_to_cimrt_value() failed",
                          "unexpected failure: Run.IPart"));
}

TEST_F(Method_Operations, WithoutMemoryTheCallFailsAndTheLogTellsWhatCouldNotBeMade) {
  const struct {
    const Meta_Record* record;
    const char* detail;
  } rows[] = {{classes.all, "CIMRT reference creation failed"},
              {classes.run, "CIMRT make_cimrt_method function failed"}};
  server.broker.interface("TEST_All", tvx::host::InterfaceKind::Method);
  for (const auto& row : rows) {
    Trace_Log log;
    {
      const Refused_Allocation refused(row.record->size);
      const Reply reply = run({{"Iuint32", Any::number(CMPI_uint32, 5)}});
      EXPECT_EQ(reply.status.rc, CMPI_RC_ERR_FAILED);
      EXPECT_FALSE(reply.done);
      EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
    }
    EXPECT_TRUE(
        log.has("DBG", std::string("return: invokeMethod(): CMPI_RC_ERR_FAILED ") + row.detail));
  }
  EXPECT_EQ(script.count(OPERATION_INVOKE_METHOD), 0u);
}

TEST_F(Method_Operations, WithoutMemoryForAReferenceTheWholeCallFails) {
  script.invoke = [](const Instance*, Instance*) { return 0; };
  const NamedValues arguments = {{"IPart", Any::reference(path_of("TEST_Part", "r"))}};
  EXPECT_EQ(run(arguments).status.rc, CMPI_RC_OK);
  Trace_Log log;
  {
    const Refused_Allocation refused(classes.part->size);
    EXPECT_EQ(run(arguments).status.rc, CMPI_RC_ERR_FAILED);
  }
  EXPECT_THAT(log.texts("WARN"), ElementsAre("failed to create CIMRT instance"));
  EXPECT_EQ(script.count(OPERATION_INVOKE_METHOD), 1u);
}

// ---- References and embedded instances

TEST_F(Method_Operations, ReferencesAndEmbeddedInstancesArrive) {
  tvx::host::Instance embedded;
  embedded.path = path_of("TEST_Part", "e");
  embedded.properties = {{"Id", Any::string("e")}, {"Size", Any::number(CMPI_uint32, 9)}};
  const Any reference = Any::reference(path_of("TEST_Part", "r"));
  expect_record({{"IPart", reference},
                 {"IEmbedded", Any::embedded(embedded)},
                 {"IParts", Any::array(CMPI_ref, {reference, Any::null(CMPI_ref)})}},
                [&](const Instance* record) {
                  const auto* part = take<Instance*>(record, "IPart");
                  ASSERT_NE(part, nullptr);
                  EXPECT_EQ(take<String>(part, "Id"), "r");
                  EXPECT_TRUE(null_in(part, "Size"));
                  EXPECT_STREQ(part->__name_space.c_str(), "root/test");
                  const auto* inner = take<Instance*>(record, "IEmbedded");
                  ASSERT_NE(inner, nullptr);
                  EXPECT_EQ(take<std::uint32_t>(inner, "Size"), 9u);
                  const auto parts = take<Array<Instance*>>(record, "IParts");
                  ASSERT_EQ(parts.size(), 2u);
                  EXPECT_EQ(take<String>(parts[0], "Id"), "r");
                  EXPECT_EQ(parts[1], nullptr);
                });
}

TEST_F(Method_Operations, AReferenceToAnotherClassIsRefused) {
  Trace_Log log;
  expect_record({{"IPart", Any::reference(path_of("TEST_Spare", "r"))}},
                [](const Instance* record) { EXPECT_TRUE(null_in(record, "IPart")); });
  EXPECT_TRUE(log.has("WARN", "unexpected failure: Run.IPart"));
}

TEST_F(Method_Operations, AnArgumentGivenTwiceIsTakenOnce) {
  Request_Objects objects(server);
  const Any first = Any::reference(path_of("TEST_Part", "first"));
  NamedValues arguments;
  arguments.items().push_back({"IPart", first});
  arguments.items().push_back({"IPart", Any::reference(path_of("TEST_Part", "second"))});
  arguments.items().push_back({"IParts", Any::array(CMPI_ref, {first})});
  arguments.items().push_back({"IParts", Any::array(CMPI_ref, {first, first})});
  expect_record(arguments, [](const Instance* record) {
    EXPECT_EQ(take<String>(take<Instance*>(record, "IPart"), "Id"), "second");
    EXPECT_EQ(take<Array<Instance*>>(record, "IParts").size(), 2u);
  });
}

TEST_F(Method_Operations, ReferencesAndEmbeddedInstancesGoOut) {
  script.invoke = [&](const Instance*, Instance* record) {
    Ref<Instance> part = make_element(classes.part, "out");
    put(part, "Size", std::uint32_t{3});
    refer(record, "OPart", part.get());
    part->__name_space = "root/elsewhere";
    refer(record, "OEmbedded", part.get());
    refer_list(record, "OParts", part.get());
    put(record, "ONames", Array<String>{"a", "b"});
    return 0;
  };
  const Reply reply = run({});
  ASSERT_EQ(reply.status.rc, CMPI_RC_OK);
  ASSERT_NE(reply.outputs.find("OPart"), nullptr);
  const tvx::host::ObjectPath& path = reply.outputs.find("OPart")->asReference();
  EXPECT_EQ(path.className, "TEST_Part");
  EXPECT_EQ(path.nameSpace, "root/test");
  EXPECT_EQ(path.key("Id").asText(), "out");
  const tvx::host::Instance& embedded = reply.outputs.find("OEmbedded")->asInstance();
  EXPECT_EQ(embedded.property("Size").asUnsigned(), 3u);
  EXPECT_EQ(embedded.path.nameSpace, "root/elsewhere");
  const Any* list = reply.outputs.find("OParts");
  ASSERT_NE(list, nullptr);
  ASSERT_EQ(list->elements().size(), 1u);
  EXPECT_EQ(list->elements()[0].asReference().nameSpace, "root/elsewhere");
  EXPECT_THAT(reply.outputs.find("ONames")->asTextList(), ElementsAre("a", "b"));
}

}  // namespace
}  // namespace cimrt::test
