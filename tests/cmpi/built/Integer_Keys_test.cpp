// Keys that are integers, in every width and in every form in which servers hand them over. No
// class of the product has one, so only the test library can show what the bridge makes of them.
#include "Built_Fixture.h"

namespace cimrt::test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using tvx::host::BrokerOptions;
using tvx::host::KeyForm;

BrokerOptions server(int version, KeyForm keys = KeyForm::OfVersion) {
  BrokerOptions options;
  options.version = version;
  options.keys = keys;
  return options;
}

/// A bridge on a server whose options a test picks.
class On_Server : public Built_Bridge {
 public:
  explicit On_Server(const BrokerOptions& options = {}) : Built_Bridge(options) {}
  void TestBody() override {}

  static ObjectPath keys(const NamedValues& values) {
    return {"", NAME_SPACE, "TEST_Keys", values};
  }
  /// The keys of the model that a provider gets.
  std::string model_of(const NamedValues& values) {
    play("TEST_Keys", OPERATION_DELETE_INSTANCE, "0");
    EXPECT_EQ(run(request(Call::DeleteInstance, keys(values))).status.rc, CMPI_RC_OK);
    EXPECT_EQ(asked.size(), 1U);
    return asked.empty() ? "" : asked[0];
  }

  using Built_Bridge::asked;
  using Built_Bridge::control;
  using Built_Bridge::lines;
  using Built_Bridge::play;
  using Built_Bridge::request;
  using Built_Bridge::run;
  using Built_Bridge::texts;
};

const NamedValues least = {{"Kuint8", Any::number(CMPI_uint8, 0)},
                           {"Ksint8", Any::signedNumber(CMPI_sint8, -128)},
                           {"Kuint16", Any::number(CMPI_uint16, 0)},
                           {"Ksint16", Any::signedNumber(CMPI_sint16, -32768)},
                           {"Kuint32", Any::number(CMPI_uint32, 0)},
                           {"Ksint32", Any::signedNumber(CMPI_sint32, -2147483648LL)},
                           {"Kuint64", Any::number(CMPI_uint64, 0)},
                           {"Ksint64", Any::signedNumber(CMPI_sint64, INT64_MIN)}};
const NamedValues most = {{"Kuint8", Any::number(CMPI_uint8, 255)},
                          {"Ksint8", Any::signedNumber(CMPI_sint8, 127)},
                          {"Kuint16", Any::number(CMPI_uint16, 65535)},
                          {"Ksint16", Any::signedNumber(CMPI_sint16, 32767)},
                          {"Kuint32", Any::number(CMPI_uint32, 4294967295U)},
                          {"Ksint32", Any::signedNumber(CMPI_sint32, 2147483647)},
                          {"Kuint64", Any::number(CMPI_uint64, UINT64_MAX)},
                          {"Ksint64", Any::signedNumber(CMPI_sint64, INT64_MAX)}};

constexpr const char* LEAST_MODEL =
    "delete TEST_Keys(Kuint8=0, Ksint8=-128, Kuint16=0, Ksint16=-32768, Kuint32=0, "
    "Ksint32=-2147483648, Kuint64=0, Ksint64=-9223372036854775808)";
constexpr const char* MOST_MODEL =
    "delete TEST_Keys(Kuint8=255, Ksint8=127, Kuint16=65535, Ksint16=32767, Kuint32=4294967295, "
    "Ksint32=2147483647, Kuint64=18446744073709551615, Ksint64=9223372036854775807)";

const BrokerOptions numeric_servers[] = {server(200),
                                         server(100),
                                         server(0),
                                         server(200, KeyForm::Declared),
                                         server(200, KeyForm::Unsigned64),
                                         server(200, KeyForm::Signed64)};

TEST(Built_Integer_Keys, HaveTheirWidthInWhateverFormTheyCome) {
  for (const BrokerOptions& options : numeric_servers) {
    On_Server bridge(options);
    EXPECT_EQ(bridge.model_of(least), LEAST_MODEL) << options.version;
    EXPECT_THAT(bridge.texts("WARN"), IsEmpty());
    EXPECT_EQ(bridge.model_of(most), MOST_MODEL) << options.version;
    EXPECT_THAT(bridge.texts("WARN"), IsEmpty());
  }
}

TEST(Built_Integer_Keys, GoBackInTheirOwnTypes) {
  for (const BrokerOptions& options : numeric_servers) {
    On_Server bridge(options);
    bridge.play("TEST_Keys", OPERATION_ENUM_INSTANCES, "echo");
    bridge.play("TEST_Keys", OPERATION_GET_INSTANCE, "echo");
    for (const NamedValues& values : {least, most}) {
      const Reply names =
          bridge.run(bridge.request(Call::EnumerateInstanceNames, bridge.keys(values)));
      ASSERT_EQ(names.paths.size(), 1U);
      EXPECT_EQ(names.paths[0].keys, values) << options.version;
      const Reply got = bridge.run(bridge.request(Call::GetInstance, bridge.keys(values)));
      ASSERT_EQ(got.instances.size(), 1U);
      for (const tvx::host::NamedValue& each : values)
        EXPECT_EQ(got.instances[0].property(each.name), each.value) << each.name;
    }
  }
}

/// An instance of the test class as text, with keys of other types empty and two that a test picks.
std::string stored(int small, const char* wide) {
  return "deliver TEST_Keys(Kboolean=false, Kuint8=" + std::to_string(small) +
         ", Ksint8=-128, Kuint16=65535, Ksint16=-2, Kuint32=3000000000, Ksint32=-3, Kuint64=" +
         wide +
         ", Ksint64=-9223372036854775808, Kreal32=0, Kreal64=0, Kchar16=0, Kstring=, "
         "Kdatetime=00000000000000.000000:000)";
}

TEST(Built_Integer_Keys, FindTheirInstance) {
  for (const BrokerOptions& options : numeric_servers) {
    On_Server bridge(options);
    bridge.play("TEST_Keys", OPERATION_ENUM_INSTANCES,
                stored(1, "18446744073709551615") + "; " + stored(255, "18446744073709551615"));
    const auto code = [&](std::uint64_t small, std::uint64_t wide) {
      const NamedValues keys = {{"Kuint8", Any::number(CMPI_uint8, small)},
                                {"Ksint8", Any::signedNumber(CMPI_sint8, -128)},
                                {"Kuint16", Any::number(CMPI_uint16, 65535)},
                                {"Ksint16", Any::signedNumber(CMPI_sint16, -2)},
                                {"Kuint32", Any::number(CMPI_uint32, 3000000000)},
                                {"Ksint32", Any::signedNumber(CMPI_sint32, -3)},
                                {"Kuint64", Any::number(CMPI_uint64, wide)},
                                {"Ksint64", Any::signedNumber(CMPI_sint64, INT64_MIN)}};
      return bridge.run(bridge.request(Call::GetInstance, bridge.keys(keys))).status.rc;
    };
    EXPECT_EQ(code(255, UINT64_MAX), CMPI_RC_OK) << options.version;
    EXPECT_EQ(code(1, UINT64_MAX), CMPI_RC_OK) << options.version;
    EXPECT_EQ(code(2, UINT64_MAX), CMPI_RC_ERR_NOT_FOUND) << options.version;
    EXPECT_EQ(code(1, UINT64_MAX - 1), CMPI_RC_ERR_NOT_FOUND) << options.version;
  }
}

TEST(Built_Integer_Keys, AreCutToTheirWidthWithoutAWord) {
  On_Server bridge(server(200, KeyForm::Declared));
  const auto all = [](const Any& value) {
    NamedValues values;
    for (const tvx::host::NamedValue& each : least) values.set(each.name, value);
    return values;
  };
  EXPECT_EQ(bridge.model_of(all(Any::number(CMPI_uint64, 0x1FFFFFFF80000182))),
            "delete TEST_Keys(Kuint8=130, Ksint8=-126, Kuint16=386, Ksint16=386, "
            "Kuint32=2147484034, Ksint32=-2147483262, Kuint64=2305843007066210690, "
            "Ksint64=2305843007066210690)");
  EXPECT_THAT(bridge.texts("WARN"), IsEmpty());
  EXPECT_EQ(bridge.model_of(all(Any::signedNumber(CMPI_sint64, -2))),
            "delete TEST_Keys(Kuint8=254, Ksint8=-2, Kuint16=65534, Ksint16=-2, "
            "Kuint32=4294967294, Ksint32=-2, Kuint64=18446744073709551614, Ksint64=-2)");
  EXPECT_THAT(bridge.texts("WARN"), IsEmpty());
}

TEST(Built_Integer_Keys, ThatAreNullStayNull) {
  On_Server bridge(server(200, KeyForm::Declared));
  EXPECT_EQ(bridge.model_of({{"Kuint8", Any::null(CMPI_uint64)},
                             {"Ksint8", Any::null(CMPI_sint64)},
                             {"Kuint16", Any::null(CMPI_uint16)},
                             {"Kuint32", Any::number(CMPI_uint64, 1)}}),
            "delete TEST_Keys(Kuint32=1)");
  EXPECT_THAT(bridge.texts("WARN"), IsEmpty());
}

TEST(Built_Integer_Keys, OfOtherWidthsDoNotFit) {
  On_Server bridge(server(200, KeyForm::Declared));
  EXPECT_EQ(bridge.model_of({{"Kuint8", Any::number(CMPI_uint32, 1)},
                             {"Ksint16", Any::signedNumber(CMPI_sint32, 1)},
                             {"Kuint64", Any::number(CMPI_uint32, 1)},
                             {"Kboolean", Any::number(CMPI_uint64, 1)},
                             {"Kchar16", Any::number(CMPI_uint64, 65)},
                             {"Kreal32", Any::signedNumber(CMPI_sint64, 1)},
                             {"Kstring", Any::number(CMPI_uint64, 1)}}),
            "delete TEST_Keys()");
  EXPECT_THAT(
      bridge.texts("WARN"),
      ElementsAre(
          "type mismatch on Kuint8: uint32/uint8", "unexpected failure: TEST_Keys.Kuint8",
          "type mismatch on Ksint16: sint32/sint16", "unexpected failure: TEST_Keys.Ksint16",
          "type mismatch on Kuint64: uint32/uint64", "unexpected failure: TEST_Keys.Kuint64",
          "type mismatch on Kboolean: uint64/boolean", "unexpected failure: TEST_Keys.Kboolean",
          "type mismatch on Kchar16: uint64/char16", "unexpected failure: TEST_Keys.Kchar16",
          "type mismatch on Kreal32: sint64/real32", "unexpected failure: TEST_Keys.Kreal32",
          "type mismatch on Kstring: uint64/string", "unexpected failure: TEST_Keys.Kstring"));
}

TEST(Built_Integer_Keys, WrittenAsTextsAreNotReadAsNumbers) {
  On_Server bridge(server(200, KeyForm::Text));
  EXPECT_EQ(bridge.model_of({{"Kuint8", Any::number(CMPI_uint8, 1)},
                             {"Kboolean", Any::boolean(true)},
                             {"Kstring", Any::string("s")}}),
            "delete TEST_Keys(Kstring=\"s\")");
  EXPECT_THAT(bridge.texts("WARN"), ElementsAre("type mismatch on Kuint8: string/uint8",
                                                "unexpected failure: TEST_Keys.Kuint8",
                                                "type mismatch on Kboolean: string/boolean",
                                                "unexpected failure: TEST_Keys.Kboolean"));
}

TEST(Built_Integer_Keys, ThatTheClassDoesNotHaveAreToldAndNonKeysAreNot) {
  On_Server bridge;
  EXPECT_EQ(bridge.model_of({{"Colour", Any::number(CMPI_uint8, 1)},
                             {"Note", Any::string("n")},
                             {"kUINT8", Any::number(CMPI_uint8, 7)}}),
            "delete TEST_Keys(Kuint8=7)");
  EXPECT_THAT(bridge.texts("WARN"), ElementsAre("unknown feature: TEST_Keys.Colour"));
}

TEST(Built_Integer_Keys, OfReferencesAreCutAsWell) {
  for (const BrokerOptions& options : numeric_servers) {
    On_Server bridge(options);
    const ObjectPath owner = bridge.keys({{"Kuint8", Any::number(CMPI_uint8, 200)},
                                          {"Ksint32", Any::signedNumber(CMPI_sint32, -5)}});
    const ObjectPath tie = {"",
                            NAME_SPACE,
                            "TEST_Tie",
                            {{"Owner", Any::reference(owner)},
                             {"Slot", Any::number(CMPI_uint16, 40000)},
                             {"Place", Any::signedNumber(CMPI_sint8, -1)}}};
    bridge.play("TEST_Tie", OPERATION_DELETE_INSTANCE, "0");
    EXPECT_EQ(bridge.run(bridge.request(Call::DeleteInstance, tie)).status.rc, CMPI_RC_OK);
    EXPECT_THAT(bridge.asked,
                ElementsAre("delete TEST_Tie(Owner=TEST_Keys(Kuint8=200, Ksint32=-5), Slot=40000, "
                            "Place=-1)"));
    EXPECT_THAT(bridge.texts("WARN"), IsEmpty());

    bridge.play("TEST_Tie", OPERATION_ENUM_INSTANCES,
                "deliver TEST_Tie(Owner=TEST_Keys(Kuint8=200, Ksint32=-5), Slot=40000, Place=-1); "
                "deliver TEST_Tie(Owner=TEST_Keys(Kuint8=201, Ksint32=-5), Slot=40000, Place=-1)");
    const Reply of_owner = bridge.run(bridge.request(Call::ReferenceNames, owner, "TEST_Tie"));
    ASSERT_EQ(of_owner.paths.size(), 1U) << options.version;
    EXPECT_EQ(of_owner.paths[0].keys, tie.keys);
    EXPECT_EQ(bridge.run(bridge.request(Call::GetInstance, tie)).status.rc, CMPI_RC_OK);
    ObjectPath other = tie;
    other.keys.set("Slot", Any::number(CMPI_uint16, 40001));
    EXPECT_EQ(bridge.run(bridge.request(Call::GetInstance, other)).status.rc,
              CMPI_RC_ERR_NOT_FOUND);
  }
}

}  // namespace
}  // namespace cimrt::test
