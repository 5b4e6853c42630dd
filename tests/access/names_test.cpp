#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "access/TVX_MethodWrapper.h"
#include "support/Log_Capture.h"

namespace {

using cimrt::TVX_MethodWrapper;
using testing::ElementsAre;
using tvx::test::Log_Capture;
using tvx::test::Logged;

constexpr const char* ID = "100002aB54C60E41";
constexpr const char* NAME = "10:00:02:aB:54:C6:0E:41";
const HBA_WWN WWN = {{0x10, 0x00, 0x02, 0xAB, 0x54, 0xC6, 0x0E, 0x41}};

bool same(const HBA_WWN& a, const HBA_WWN& b) {
  return std::memcmp(&a, &b, sizeof a) == 0;
}

std::string toName(const char* id) {
  char name[24];
  std::memset(name, '?', sizeof name);
  EXPECT_EQ(TVX_MethodWrapper::Id2HBAName(name, id), 0);
  EXPECT_EQ(name[23], '\0');
  return name;
}

TEST(Id_To_Name, PutsColonsBetweenThePairs) {
  const Log_Capture capture;
  EXPECT_EQ(toName(ID), NAME);
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, std::string("DeviceID is:: ") + ID},
                                           Logged{5, std::string("HBA Name is:: ") + NAME}));
}

TEST(Id_To_Name, DropsOneLeadingQuoteOnly) {
  EXPECT_EQ(toName((std::string("\"") + ID).c_str()), NAME);
  EXPECT_EQ(toName((std::string("\"") + ID + "\"").c_str()), NAME);
  EXPECT_EQ(toName("\"\"00002AB54C60E4"), "\"0:00:02:AB:54:C6:0E:4");
}

TEST(Id_To_Name, ChecksNoCharacter) {
  EXPECT_EQ(toName("zz!!zz!!zz!!zz!!trailing"), "zz:!!:zz:!!:zz:!!:zz:!!");
}

TEST(Id_To_Name, StopsAtTheEndOfAShortId) {
  EXPECT_EQ(toName("1234"), "12:34:");
  EXPECT_EQ(toName(""), "");
  EXPECT_EQ(toName("\""), "");
  HBA_WWN wwn;
  EXPECT_EQ(TVX_MethodWrapper::str2HBAName(&wwn, toName("100002aB54C60E4").c_str()), 1);
}

TEST(Id_To_Name, RefusesNull) {
  char name[24];
  for (const auto& [out, id] : {std::pair<char*, const char*>{nullptr, ID}, {name, nullptr}}) {
    const Log_Capture capture;
    EXPECT_EQ(TVX_MethodWrapper::Id2HBAName(out, id), 1);
    EXPECT_THAT(capture.lines(),
                ElementsAre(Logged{3, "Null pointer argument in one of the arguments"}));
  }
}

TEST(Name_To_Wwn, ReadsPairsInEitherCase) {
  const Log_Capture capture;
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::str2HBAName(&wwn, NAME), 0);
  EXPECT_TRUE(same(wwn, WWN));
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "After tokenizing wwpn:( 10  0  2 ab 54 c6  e 41 )"}));
}

TEST(Name_To_Wwn, TakesBlanksForColons) {
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::str2HBAName(&wwn, "10 00:02 AB:54 C6 0E:41"), 0);
  EXPECT_TRUE(same(wwn, WWN));
}

TEST(Name_To_Wwn, RefusesEverythingElse) {
  const std::string name = NAME;
  for (const std::string& refused :
       {std::string(), name + "0", name + ":", name.substr(0, 22), std::string(ID),
        std::string("10-00-02-ab-54-c6-0e-41"), std::string("1g:00:02:ab:54:c6:0e:41"),
        std::string("10:0 :02:ab:54:c6:0e:41"), std::string("0x:00:02:ab:54:c6:0e:41")}) {
    const Log_Capture capture;
    HBA_WWN wwn{};
    EXPECT_EQ(TVX_MethodWrapper::str2HBAName(&wwn, refused.c_str()), 1) << refused;
    EXPECT_THAT(capture.lines(), ElementsAre(Logged{3, "INVALID HBA Name"}));
  }
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::str2HBAName(&wwn, nullptr), 1);
  EXPECT_EQ(TVX_MethodWrapper::str2HBAName(nullptr, NAME), 1);
}

TEST(Digits_To_Wwn, AnswersOneOnSuccess) {
  const Log_Capture capture;
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::string2HBAName(&wwn, ID), 1);
  EXPECT_TRUE(same(wwn, WWN));
  EXPECT_TRUE(capture.lines().empty());
}

TEST(Digits_To_Wwn, AnswersZeroOnFailure) {
  for (const char* refused :
       {"", "100002AB54C60E4", "100002AB54C60E411", "100002AB54C60E4G", NAME}) {
    const Log_Capture capture;
    HBA_WWN wwn{};
    EXPECT_EQ(TVX_MethodWrapper::string2HBAName(&wwn, refused), 0) << refused;
    EXPECT_THAT(capture.lines(), ElementsAre(Logged{3, "INVALID WWN"}));
  }
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::string2HBAName(&wwn, nullptr), 0);
}

TEST(Wwn_To_Name, IsUpperCase) {
  char name[24];
  EXPECT_EQ(TVX_MethodWrapper::HBAName2str(name, WWN), 0);
  EXPECT_STREQ(name, "10:00:02:AB:54:C6:0E:41");
  EXPECT_EQ(TVX_MethodWrapper::HBAName2str(nullptr, WWN), 0);
}

TEST(Id_To_Wwn, TakesBothSteps) {
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::deviceIdToWWN(&wwn, ID), 0);
  EXPECT_TRUE(same(wwn, WWN));
}

TEST(Id_To_Wwn, LogsTheStepThatFailed) {
  const Log_Capture capture;
  HBA_WWN wwn{};
  EXPECT_EQ(TVX_MethodWrapper::deviceIdToWWN(&wwn, nullptr), 1);
  EXPECT_TRUE(capture.has(3, "Id2HBAName failed"));
  EXPECT_EQ(TVX_MethodWrapper::deviceIdToWWN(&wwn, "not a name at all"), 1);
  EXPECT_TRUE(capture.has(3, "str2HBAName failed"));
}

}  // namespace
