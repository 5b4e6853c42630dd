#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "common/CLogger.h"
#include "support/Log_Capture.h"

namespace {

using cimrt::getLogger;
using cimrt::TVX_CIMLogger;
using testing::ElementsAre;
using tvx::test::Log_Capture;
using tvx::test::Logged;

class Logger : public testing::Test {
 protected:
  void TearDown() override {
    getLogger().dropInterfaces();
    getLogger().setMode(cimrt::TVX_LOG_MODE_OFF);
    getLogger().disable();
  }
};

TEST_F(Logger, NamesTheLevels) {
  EXPECT_STREQ(cimrt::tvxLevelName(0), "TVX_INVALID");
  EXPECT_STREQ(cimrt::tvxLevelName(1), "TVX_CRIT");
  EXPECT_STREQ(cimrt::tvxLevelName(2), "TVX_WARN");
  EXPECT_STREQ(cimrt::tvxLevelName(3), "TVX_ERR");
  EXPECT_STREQ(cimrt::tvxLevelName(4), "TVX_INFO");
  EXPECT_STREQ(cimrt::tvxLevelName(5), "TVX_DBG");
  EXPECT_STREQ(cimrt::tvxLevelName(6), "TVX_INVALID");
  EXPECT_STREQ(cimrt::tvxLevelName(-1), "TVX_INVALID");
}

TEST_F(Logger, StartsDisabledInModeZeroWithoutLevel) {
  EXPECT_EQ(getLogger().mode(), 0);
  EXPECT_EQ(getLogger().level(), 0);
  EXPECT_FALSE(getLogger().isEnabled());
  EXPECT_FALSE(getLogger().isDefaultLog());
  EXPECT_EQ(&getLogger(), &getLogger());
}

TEST_F(Logger, TakesLevelsOneToFiveOnly) {
  for (int level = 1; level <= 5; ++level) {
    getLogger().setLevel(level);
    EXPECT_EQ(getLogger().level(), level);
  }
  getLogger().setLevel(3);
  getLogger().setLevel(0);
  EXPECT_EQ(getLogger().level(), 3);
  getLogger().setLevel(6);
  EXPECT_EQ(getLogger().level(), 3);
  getLogger().setLevel(-1);
  EXPECT_EQ(getLogger().level(), 3);
}

TEST_F(Logger, RegistersABackEndOnce) {
  Log_Capture capture;  // registers itself
  EXPECT_EQ(getLogger().registerInterface(&capture), 0);
  EXPECT_EQ(getLogger().unregisterInterface(&capture), 1);
  EXPECT_EQ(getLogger().unregisterInterface(&capture), 0);
  EXPECT_EQ(getLogger().registerInterface(&capture), 1);
  EXPECT_EQ(getLogger().registerInterface(nullptr), 0);
}

TEST_F(Logger, FormatsAndHandsOverWhateverTheLevelSet) {
  const Log_Capture capture;
  getLogger().setLevel(1);
  TVX_LOG(cimrt::TVX_DBG, "%s is %d", "answer", 42);
  TVX_LOG(cimrt::TVX_CRIT, "plain");
  EXPECT_THAT(capture.lines(), ElementsAre(Logged{5, "answer is 42"}, Logged{1, "plain"}));
}

TEST_F(Logger, LongMessagesAreNotCut) {
  const Log_Capture capture;
  const std::string text(100'000, 'x');
  TVX_LOG(cimrt::TVX_ERR, "%s", text.c_str());
  EXPECT_EQ(capture.lines().at(0).text, text);
}

TEST_F(Logger, CallsTheBackEndsInTheOrderOfTheirRegistration) {
  struct Ordered : Log_Capture {
    Ordered(std::string& order, char name) : _order(order), _name(name) {}
    void log(int, const char*, const unsigned*, const char*) override { _order += _name; }
    std::string& _order;
    char _name;
  };
  std::string order;
  Ordered a(order, 'a');
  Ordered b(order, 'b');
  TVX_LOG(cimrt::TVX_ERR, "x");
  EXPECT_EQ(order, "ab");
}

TEST_F(Logger, ADisabledLoggerFeedsTheRecordsAlone) {
  const Log_Capture capture;
  const TVX_CIMLogger records;
  getLogger().setMode(cimrt::TVX_LOG_MODE_MEMORY);
  getLogger().disable();
  TVX_LOG(cimrt::TVX_ERR, "kept");
  EXPECT_TRUE(capture.lines().empty());
  ASSERT_EQ(records.records().size(), 1U);
  EXPECT_STREQ(records.records()[0].text, "[kept]");
}

TEST_F(Logger, ADisabledLoggerWithoutRecordsFeedsEveryBackEnd) {
  const Log_Capture capture;
  getLogger().disable();
  TVX_LOG(cimrt::TVX_ERR, "seen");
  EXPECT_TRUE(capture.has(3, "seen"));
}

TEST_F(Logger, ADestroyedRecordBackEndIsForgotten) {
  const Log_Capture capture;
  { const TVX_CIMLogger gone; }
  getLogger().disable();
  TVX_LOG(cimrt::TVX_ERR, "seen");
  EXPECT_TRUE(capture.has(3, "seen"));
}

TEST_F(Logger, MessagesAfterTheListWasDroppedGoNowhere) {
  const Log_Capture capture;
  const TVX_CIMLogger records;
  getLogger().setMode(cimrt::TVX_LOG_MODE_MEMORY);
  getLogger().dropInterfaces();
  TVX_LOG(cimrt::TVX_CRIT, "lost");
  getLogger().disable();
  TVX_LOG(cimrt::TVX_CRIT, "lost");
  EXPECT_TRUE(capture.lines().empty());
  EXPECT_TRUE(records.records().empty());
}

TEST_F(Logger, ModeZeroClosesTheBackEndsAndAnyOtherOpensThem) {
  const Log_Capture capture;
  getLogger().setMode(3);
  getLogger().setMode(1);
  EXPECT_EQ(capture.opened, 2);
  EXPECT_EQ(capture.closed, 0);
  getLogger().setMode(0);
  EXPECT_EQ(capture.closed, 1);
  EXPECT_EQ(getLogger().mode(), 0);
}

TEST_F(Logger, ClearAllClearsEveryBackEnd) {
  const Log_Capture a;
  const Log_Capture b;
  getLogger().clearAll();
  EXPECT_EQ(a.cleared, 1);
  EXPECT_EQ(b.cleared, 1);
}

TEST_F(Logger, MarksTheDefaultLog) {
  getLogger().setDefaultLog();
  EXPECT_TRUE(getLogger().isDefaultLog());
  getLogger().clearDefaultLog();
  EXPECT_FALSE(getLogger().isDefaultLog());
}

TEST_F(Logger, WithoutAFileBackEndThereIsNoLogPath) {
  EXPECT_EQ(getLogger().logFilePath(), "");
}

}  // namespace
