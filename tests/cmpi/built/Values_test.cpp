// What clients send that is not well formed, through the built library: each value that does not
// fit is left out and told in the log, and the operation goes on with the rest.
#include "Built_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Warnings = std::vector<std::string>;

constexpr const char* TIME = "20240229235959.123456+060";

class Built_Values : public Built_Bridge {
 protected:
  Built_Values() {
    play("TEST_All", OPERATION_CREATE_INSTANCE, "0");
    play("TEST_All", OPERATION_INVOKE_METHOD, "0");
    play("TEST_Part", OPERATION_MODIFY_INSTANCE, "0");
  }

  /// What a provider gets of an instance that is to be created.
  std::string created(const NamedValues& properties) {
    Request wish = request(Call::CreateInstance, path("TEST_All", "x"));
    wish.instance = object("TEST_All", properties);
    EXPECT_EQ(run(wish).status.rc, CMPI_RC_OK);
    return asked.empty() ? "" : asked[0];
  }
  /// What a provider gets of the arguments of a call.
  std::string called(const NamedValues& arguments) {
    Request wish = request(Call::InvokeMethod, path("TEST_All", "x"));
    wish.method = "Run";
    wish.arguments = arguments;
    EXPECT_EQ(run(wish).status.rc, CMPI_RC_OK);
    constexpr std::string_view start = "invoke TEST_All(Id=\"x\") ";
    return asked.empty() ? "" : asked[0].substr(start.size());
  }
};

// ---- Property lists

TEST_F(Built_Values, AListOfPropertiesMayBeMissingEmptyOrHoldAnything) {
  play("TEST_Part", OPERATION_ENUM_INSTANCES, "deliver TEST_Part(Id=a, Caption=c, Size=3)");
  play("TEST_Part", OPERATION_GET_INSTANCE, "out TEST_Part(Id=a, Caption=c, Size=3)");
  const struct {
    tvx::host::PropertyList list;
    const char* enumerated;  ///< model of an enumeration
    const char* got;         ///< model of a search
    std::vector<std::string> names;
  } rows[] = {
      {{}, "TEST_Part()", "TEST_Part(Id=\"a\", Caption=\"\", Size=0)", {"Id", "Caption", "Size"}},
      {{std::vector<std::string>()}, "TEST_Part()", "TEST_Part(Id=\"a\")", {}},
      {{{"Size"}}, "TEST_Part(Size=0)", "TEST_Part(Id=\"a\", Size=0)", {"Size"}},
      {{{"Id"}}, "TEST_Part()", "TEST_Part(Id=\"a\")", {"Id"}},
      {{{"cAPTION", "NoSuch", "Id", "", "Size", "Size"}},
       "TEST_Part(Caption=\"\", Size=0)",
       "TEST_Part(Id=\"a\", Caption=\"\", Size=0)",
       {"Id", "Caption", "Size"}},
      {{{"NoSuch"}}, "TEST_Part()", "TEST_Part(Id=\"a\")", {}},
  };
  for (const auto& row : rows) {
    for (const Call call : {Call::EnumerateInstances, Call::GetInstance}) {
      Request wish = request(call, path("TEST_Part", "a"));
      if (call == Call::EnumerateInstances) wish.path.keys = {};
      wish.properties = row.list;
      const Reply reply = run(wish);
      EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
      ASSERT_EQ(reply.instances.size(), 1U);
      std::vector<std::string> names;
      for (const auto& each : reply.instances[0].properties) names.push_back(each.name);
      EXPECT_EQ(names, row.names) << asked[0];
      EXPECT_EQ(reply.instances[0].path.key("Id").asText(), "a");
      EXPECT_EQ(asked[0], call == Call::GetInstance ? std::string("get ") + row.got
                                                    : std::string("enumerate ") + row.enumerated);
      EXPECT_THAT(texts("WARN"), IsEmpty());
    }
  }
}

TEST_F(Built_Values, AChangeWantsWhatItsListNamesAndEverythingWithoutOne) {
  const struct {
    tvx::host::PropertyList list;
    const char* model;
  } rows[] = {{{}, "TEST_Part(Id=\"a\", Caption=\"\", Size=7)"},
              {{std::vector<std::string>()}, "TEST_Part(Id=\"a\")"},
              {{{"Size"}}, "TEST_Part(Id=\"a\", Size=7)"},
              {{{"Caption"}}, "TEST_Part(Id=\"a\", Caption=\"\")"},
              {{{"id", "NoSuch"}}, "TEST_Part(Id=\"a\")"}};
  for (const auto& row : rows) {
    Request wish = request(Call::ModifyInstance, path("TEST_Part", "a"));
    wish.instance =
        object("TEST_Part", {{"Id", Any::string("a")}, {"Size", Any::number(CMPI_uint32, 7)}});
    wish.properties = row.list;
    const Reply reply = run(wish);
    EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
    EXPECT_THAT(
        asked, ElementsAre(std::string("modify ") + row.model + " by TEST_Part(Id=\"a\", Size=7)"));
    ASSERT_EQ(reply.paths.size(), 1U);
    EXPECT_EQ(reply.paths[0].key("Id").asText(), "a");
  }
}

TEST_F(Built_Values, AChangeAnswersThePathThatItWasSentTo) {
  Request wish = request(Call::ModifyInstance, path("TEST_Part", "there"));
  wish.instance = object("TEST_Part", {{"Id", Any::string("inside")}});
  EXPECT_EQ(run(wish).paths.at(0).key("Id").asText(), "there");
}

TEST_F(Built_Values, ACreationAnswersThePathOfWhatTheProviderMade) {
  play("TEST_All", OPERATION_CREATE_INSTANCE, "set Id=made");
  Request wish = request(Call::CreateInstance, path("TEST_All", "x"));
  wish.instance = object("TEST_All", {{"Id", Any::string("wanted")}});
  EXPECT_EQ(run(wish).paths.at(0).key("Id").asText(), "made");
}

// ---- Properties

TEST_F(Built_Values, AnUnknownPropertyIsToldAndLeftOut) {
  EXPECT_EQ(created({{"Id", Any::string("a")}, {"Colour", Any::string("red")}}),
            "create TEST_All(Id=\"a\")");
  EXPECT_THAT(texts("WARN"), ElementsAre("unknown feature: TEST_All.Colour"));
  EXPECT_EQ(created({{"Run", Any::string("a")}}), "create TEST_All()");
  EXPECT_THAT(texts("WARN"), ElementsAre("unknown feature: TEST_All.Run"));
}

TEST_F(Built_Values, APropertyOfAnotherTypeIsToldAndStaysNull) {
  const struct {
    const char* name;
    Any value;
    const char* warning;
  } rows[] = {
      {"Vboolean", Any::number(CMPI_uint8, 1), "type mismatch on Vboolean: uint8/boolean"},
      {"Vuint8", Any::number(CMPI_uint64, 1), "type mismatch on Vuint8: uint64/uint8"},
      {"Vsint8", Any::signedNumber(CMPI_sint64, 1), "type mismatch on Vsint8: sint64/sint8"},
      {"Vuint16", Any::number(CMPI_uint8, 1), "type mismatch on Vuint16: uint8/uint16"},
      {"Vsint16", Any::number(CMPI_uint16, 1), "type mismatch on Vsint16: uint16/sint16"},
      {"Vuint32", Any::string("1"), "type mismatch on Vuint32: string/uint32"},
      {"Vsint32", Any::number(CMPI_uint32, 1), "type mismatch on Vsint32: uint32/sint32"},
      {"Vuint64", Any::number(CMPI_uint32, 1), "type mismatch on Vuint64: uint32/uint64"},
      {"Vsint64", Any::boolean(true), "type mismatch on Vsint64: boolean/sint64"},
      {"Vreal32", Any::real(CMPI_real64, 1), "type mismatch on Vreal32: real64/real32"},
      {"Vreal64", Any::real(CMPI_real32, 1), "type mismatch on Vreal64: real32/real64"},
      {"Vchar16", Any::number(CMPI_uint16, 65), "type mismatch on Vchar16: uint16/char16"},
      {"Vstring", Any::number(CMPI_uint32, 1), "type mismatch on Vstring: uint32/string"},
      {"Vdatetime", Any::string(TIME), "type mismatch on Vdatetime: string/datetime"},
      {"Auint8", Any::number(CMPI_uint8, 1), "type mismatch on Auint8: uint8/uint8_array"},
      {"Vuint8", Any::array(CMPI_uint8, {Any::number(CMPI_uint8, 1)}),
       "type mismatch on Vuint8: uint8_array/uint8"},
      {"Astring", Any::array(CMPI_uint8, {}), "type mismatch on Astring: uint8_array/string_array"},
      {"VReference", Any::string("TEST_Part"), "type mismatch on VReference: string/instance"},
      {"Vstring", Any::null(CMPI_uint32), "type mismatch on Vstring: uint32/string"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(created({{row.name, row.value}, {"Id", Any::string("a")}}),
              "create TEST_All(Id=\"a\")");
    EXPECT_EQ(texts("WARN"),
              (Warnings{row.warning, std::string("unexpected failure: TEST_All.") + row.name}));
    EXPECT_EQ(ending(), "createInstance(): CMPI_RC_OK");
  }
}

TEST_F(Built_Values, ANullOfTheRightTypeIsNullWithoutAWord) {
  EXPECT_EQ(created({{"Vboolean", Any::null(CMPI_boolean)},
                     {"Vuint8", Any::null(CMPI_uint8)},
                     {"Vstring", Any::null(CMPI_string)},
                     {"Vdatetime", Any::null(CMPI_dateTime)},
                     {"Astring", Any::null(CMPI_stringA)},
                     {"VEmbedded", Any::null(CMPI_instance)}}),
            "create TEST_All()");
  EXPECT_THAT(texts("WARN"), IsEmpty());
}

TEST_F(Built_Values, ATextWithoutCharactersIsEmptyAndTold) {
  EXPECT_EQ(created({{"Vstring", Any::stringWithoutText()}}), "create TEST_All(Vstring=\"\")");
  EXPECT_THAT(texts("WARN"), ElementsAre("CMGetCharsPtr() failed"));
  EXPECT_EQ(
      created({{"Astring", Any::array(CMPI_string, {Any::string("a"), Any::stringWithoutText()})}}),
      "create TEST_All(Astring={\"a\", \"\"})");
  EXPECT_THAT(texts("WARN"), ElementsAre("CMGetCharsPtr() failed"));
}

TEST_F(Built_Values, ANullElementSpoilsAnArrayUnlessItIsOneOfInstances) {
  const std::pair<const char*, CMPIType> rows[] = {
      {"Aboolean", CMPI_boolean}, {"Auint8", CMPI_uint8},      {"Asint8", CMPI_sint8},
      {"Auint16", CMPI_uint16},   {"Asint16", CMPI_sint16},    {"Auint32", CMPI_uint32},
      {"Asint32", CMPI_sint32},   {"Auint64", CMPI_uint64},    {"Asint64", CMPI_sint64},
      {"Areal32", CMPI_real32},   {"Areal64", CMPI_real64},    {"Achar16", CMPI_char16},
      {"Astring", CMPI_string},   {"Adatetime", CMPI_dateTime}};
  for (const auto& [name, type] : rows) {
    EXPECT_EQ(created({{name, Any::array(type, {Any::null(type)})}}), "create TEST_All()");
    EXPECT_EQ(texts("WARN"), (Warnings{"encountered null array element",
                                       std::string("unexpected failure: TEST_All.") + name}));
    EXPECT_EQ(created({{name, Any::array(type, {})}}),
              std::string("create TEST_All(") + name + "={})");
    EXPECT_THAT(texts("WARN"), IsEmpty());
  }
  const Any part = Any::reference(path("TEST_Part", "p"));
  EXPECT_EQ(called({{"IParts", Any::array(CMPI_ref, {part, Any::null(CMPI_ref)})}}),
            "Run(IParts={TEST_Part(Id=\"p\"), null})");
  EXPECT_THAT(texts("WARN"), IsEmpty());
}

TEST_F(Built_Values, NestedInstancesThatTheSchemaDoesNotKnowAreLeftOut) {
  const Object unknown = {path("TEST_Unknown", "u"), {}};
  EXPECT_EQ(created({{"VEmbedded", Any::embedded(unknown)}}), "create TEST_All()");
  EXPECT_THAT(texts("WARN"), ElementsAre("failed to find meta class: TEST_Unknown",
                                         "unexpected failure: TEST_All.VEmbedded"));
  EXPECT_EQ(created({{"VReference", Any::reference(unknown.path)}}), "create TEST_All()");
  EXPECT_THAT(texts("WARN"), ElementsAre("failed to find meta class: TEST_Unknown",
                                         "unexpected failure: TEST_All.VReference"));
  const Any part = Any::reference(path("TEST_Part", "p"));
  EXPECT_EQ(created({{"AReference", Any::array(CMPI_ref, {part, Any::reference(unknown.path)})}}),
            "create TEST_All()");
  EXPECT_THAT(texts("WARN"), ElementsAre("failed to find meta class: TEST_Unknown",
                                         "unexpected failure: TEST_All.AReference"));
}

TEST_F(Built_Values, NestedInstancesKeepWhatFits) {
  Object part = {path("TEST_Part", "p"),
                 {{"Id", Any::string("p")},
                  {"Size", Any::number(CMPI_uint64, 1)},
                  {"Colour", Any::string("red")}}};
  EXPECT_EQ(created({{"VEmbedded", Any::embedded(part)}}),
            "create TEST_All(VEmbedded=TEST_Part(Id=\"p\"))");
  EXPECT_THAT(texts("WARN"), ElementsAre("type mismatch on Size: uint64/uint32",
                                         "unexpected failure: TEST_Part.Size",
                                         "unknown feature: TEST_Part.Colour"));
  // A reference to a class that the feature does not allow.
  EXPECT_EQ(created({{"VReference", Any::reference(path("TEST_Spare", "s"))}}),
            "create TEST_All()");
  EXPECT_THAT(texts("WARN"),
              ElementsAre("failed to assign instance of TEST_Spare to TEST_All.VReference",
                          "unexpected failure: TEST_All.VReference"));
}

// ---- Arguments

TEST_F(Built_Values, TextsAreReadAsNumbersAndTruthsWithAWarning) {
  const struct {
    const char* name;
    const char* text;
    const char* record;
  } rows[] = {{"Iboolean", "TRUE", "Run(Iboolean=true)"},
              {"Iboolean", "truth", "Run()"},
              {"Iboolean", "falsehood", "Run(Iboolean=false)"},
              {"Iuint8", "300", "Run(Iuint8=44)"},
              {"Isint8", "-2", "Run(Isint8=-2)"},
              {"Iuint16", "65537", "Run(Iuint16=1)"},
              {"Isint16", "32768", "Run(Isint16=-32768)"},
              {"Iuint32", "4294967298", "Run(Iuint32=2)"},
              {"Isint32", "-5 apples", "Run(Isint32=-5)"},
              {"Iuint32", "apples", "Run(Iuint32=0)"}};
  for (const auto& row : rows) {
    EXPECT_EQ(called({{row.name, Any::string(row.text)}}), row.record) << row.text;
    if (std::string(row.record) == "Run()")
      EXPECT_THAT(texts("WARN"), ElementsAre("type mismatch on Iboolean: string/boolean",
                                             "unexpected failure: Run.Iboolean"));
    else
      EXPECT_THAT(texts("WARN"), ElementsAre("converting string to registered parameter type"));
    EXPECT_THAT(texts("INFO"), IsEmpty());
  }
}

TEST_F(Built_Values, TextsAreNotReadAsWideNumbersAndTheLogSaysSo) {
  for (const std::string type : {"uint64", "sint64", "real32", "real64"}) {
    EXPECT_EQ(called({{"I" + type, Any::string("1")}}), "Run()");
    EXPECT_EQ(texts("WARN"), (Warnings{"Default case - unsupported type",
                                       "type mismatch on I" + type + ": string/" + type,
                                       "unexpected failure: Run.I" + type}));
  }
}

TEST_F(Built_Values, TextsForAllOtherTypesAreAnInformation) {
  const std::pair<std::string, std::string> rows[] = {{"Ichar16", "char16"},
                                                      {"Idatetime", "datetime"},
                                                      {"INames", "string_array"},
                                                      {"IPart", "instance"},
                                                      {"IParts", "instance_array"}};
  for (const auto& [name, type] : rows) {
    EXPECT_EQ(called({{name, Any::string("1")}}), "Run()");
    EXPECT_THAT(texts("INFO"), ElementsAre("cast_cmpi_string_to_scalar(): Not supported"));
    EXPECT_EQ(texts("WARN"), (Warnings{"type mismatch on " + name + ": string/" + type,
                                       "unexpected failure: Run." + name}));
  }
}

TEST_F(Built_Values, ATextWithoutCharactersIsNoNumber) {
  EXPECT_EQ(called({{"Iuint32", Any::stringWithoutText()}}), "Run()");
  EXPECT_THAT(texts("WARN"), ElementsAre("CMGetCharsPtr() failed", "CMGetCharsPtr() failed",
                                         "type mismatch on Iuint32: string/uint32",
                                         "unexpected failure: Run.Iuint32"));
}

TEST_F(Built_Values, AnArgumentThatCannotBeConvertedHasALineMoreThanAProperty) {
  EXPECT_EQ(called({{"IPart", Any::reference(path("TEST_Unknown", "u"))}}), "Run()");
  EXPECT_THAT(texts("WARN"),
              ElementsAre("failed to find meta class: TEST_Unknown", "cmpi_to_cimrt_value() failed",
                          "unexpected failure: Run.IPart"));
}

TEST_F(Built_Values, UnknownAndOutputArgumentsAreLeftOutAndOnlyTheFirstAreTold) {
  EXPECT_EQ(called({{"Colour", Any::string("red")}, {"Ostring", Any::string("o")}}), "Run()");
  EXPECT_THAT(texts("WARN"), ElementsAre("unknown feature: Run.Colour"));
}

TEST_F(Built_Values, ATruthInThePlaceOfAListOfReferencesIsNoList) {
  EXPECT_EQ(called({{"IParts", Any::boolean(false)}}), "Run()");
  EXPECT_THAT(lines.size(), 2U);
}

TEST_F(Built_Values, TheReturnValueComesWithItsTypeOrNone) {
  Request wish = request(Call::InvokeMethod, path("TEST_All", "x"));
  wish.method = "rUN";
  play("TEST_All", OPERATION_INVOKE_METHOD, "set return_value=7; set Ostring=o; set Istring=i");
  Reply reply = run(wish);
  EXPECT_EQ(reply.returnValue, Any::number(CMPI_uint32, 7));
  EXPECT_EQ(reply.outputs, (NamedValues{{"Ostring", Any::string("o")}}));
  play("TEST_All", OPERATION_INVOKE_METHOD, "0");
  reply = run(wish);
  EXPECT_EQ(reply.returnValue.type(), CMPI_null);
  EXPECT_TRUE(reply.outputs.empty());
  EXPECT_TRUE(reply.done);
}

}  // namespace
}  // namespace cimrt::test
