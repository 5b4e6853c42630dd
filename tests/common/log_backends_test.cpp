#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <sys/resource.h>

#include <csignal>
#include <cstdio>
#include <cstring>
#include <string>

#include "common/CLogger.h"
#include "common/TVX_Clock.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::getLogger;
using cimrt::TVX_CIMLogger;
using cimrt::TVX_FileLogger;
using tvx::test::Temp_Root;

constexpr const char* LOG = "/var/log/provider.log";

class Log_Backends : public testing::Test {
 protected:
  void SetUp() override { getLogger().enable(); }
  void TearDown() override {
    getLogger().setMode(0);
    getLogger().disable();
    cimrt::tvxSetClock(nullptr);
  }
  static void log(int level, const char* text) {
    static constexpr unsigned LINE = 17;
    getLogger().log("some/File.cpp", &LINE, level, "%s", text);
  }
  std::string path(const char* absolute) const { return root.path(absolute); }

  const Temp_Root root;
};

// ---- Log file ----

TEST_F(Log_Backends, WritesALineWithThreadTimePlaceLevelAndText) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  log(cimrt::TVX_WARN, "hello %d");
  char thread[40];
  std::snprintf(thread, sizeof thread, "[threadid =%ul]", static_cast<unsigned>(::pthread_self()));
  const std::string text = root.read(LOG);
  EXPECT_EQ(text.substr(0, std::strlen(thread)), thread);
  EXPECT_THAT(
      text.substr(std::strlen(thread)),
      testing::MatchesRegex(
          " \\[[0-9]{4}/[0-9]{2}/[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{6}[+-][0-9]{3}\\] "
          "\\[some/File\\.cpp:17\\]\\[TVX_WARN\\] hello %d\n"));
}

TEST_F(Log_Backends, WritesInModesTwoAndFourOnly) {
  TVX_FileLogger file;
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  for (const int mode : {1, 3, 2, 4}) {
    getLogger().setMode(mode);
    log(cimrt::TVX_ERR, ("mode " + std::to_string(mode)).c_str());
  }
  const std::string text = root.read(LOG);
  EXPECT_EQ(text.find("mode 1"), std::string::npos);
  EXPECT_EQ(text.find("mode 3"), std::string::npos);
  EXPECT_NE(text.find("mode 2"), std::string::npos);
  EXPECT_NE(text.find("mode 4"), std::string::npos);
}

TEST_F(Log_Backends, WritesEveryLevelBelowSix) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  for (int level = 0; level <= 6; ++level) log(level, ("level " + std::to_string(level)).c_str());
  const std::string text = root.read(LOG);
  EXPECT_NE(text.find("[TVX_INVALID] level 0"), std::string::npos);
  EXPECT_NE(text.find("[TVX_DBG] level 5"), std::string::npos);
  EXPECT_EQ(text.find("level 6"), std::string::npos);
}

TEST_F(Log_Backends, ARestrictedFileTakesCriticalAndErrorLinesOnly) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), true), 0);
  EXPECT_TRUE(file.isRestricted());
  for (int level = 0; level <= 5; ++level) log(level, ("level " + std::to_string(level)).c_str());
  const std::string text = root.read(LOG);
  EXPECT_NE(text.find("level 1"), std::string::npos);
  EXPECT_NE(text.find("level 3"), std::string::npos);
  for (const char* dropped : {"level 0", "level 2", "level 4", "level 5"}) {
    EXPECT_EQ(text.find(dropped), std::string::npos) << dropped;
  }
}

TEST_F(Log_Backends, RefusesPathsThatCanNotBeALogFile) {
  TVX_FileLogger file;
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), true), 0);
  EXPECT_EQ(file.validateAndSetPath(nullptr, false), -1);
  EXPECT_EQ(file.validateAndSetPath("", false), -1);
  EXPECT_EQ(file.validateAndSetPath(path("/etc").c_str(), false), -1);            // a directory
  EXPECT_EQ(file.validateAndSetPath("/dev/null", false), -1);                     // a device
  EXPECT_EQ(file.validateAndSetPath(path("/no/such/x").c_str(), false), -1);      // no directory
  EXPECT_EQ(file.validateAndSetPath((path(LOG) + "/x").c_str(), false), -1);      // ENOTDIR
  EXPECT_EQ(file.validateAndSetPath(std::string(5000, 'x').c_str(), false), -1);  // ENAMETOOLONG
  // What was there before stays.
  EXPECT_EQ(file.path(), path(LOG));
  EXPECT_TRUE(file.isRestricted());
  EXPECT_TRUE(file.isOpen());
}

TEST_F(Log_Backends, ANewPathReplacesTheOldOne) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), true), 0);
  ASSERT_EQ(file.validateAndSetPath(path("/tmp/other.log").c_str(), false), 0);
  EXPECT_FALSE(file.isRestricted());
  EXPECT_EQ(getLogger().logFilePath(), path("/tmp/other.log"));
  log(cimrt::TVX_DBG, "moved");
  EXPECT_EQ(root.read(LOG), "");
  EXPECT_NE(root.read("/tmp/other.log").find("moved"), std::string::npos);
}

TEST_F(Log_Backends, OpenAppendsToWhatIsThere) {
  root.write(LOG, "before\n");
  TVX_FileLogger file;
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  getLogger().setMode(2);  // opens again
  log(cimrt::TVX_ERR, "after");
  const std::string text = root.read(LOG);
  EXPECT_EQ(text.find("before\n"), 0U);
  EXPECT_NE(text.find("after"), std::string::npos);
}

TEST_F(Log_Backends, OpenInAnotherModeLeavesTheStreamAlone) {
  TVX_FileLogger file;
  getLogger().setMode(1);
  file.open();
  EXPECT_FALSE(file.isOpen());
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  EXPECT_TRUE(file.isOpen());
}

TEST_F(Log_Backends, CloseForgetsThePath) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  getLogger().setMode(0);
  EXPECT_FALSE(file.isOpen());
  EXPECT_EQ(file.path(), "");
  getLogger().setMode(2);  // nothing to open any more
  EXPECT_FALSE(file.isOpen());
  log(cimrt::TVX_ERR, "dropped");
  EXPECT_EQ(root.read(LOG), "");
}

TEST_F(Log_Backends, ClearEmptiesAnOpenFileAndGoesOnWriting) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  log(cimrt::TVX_ERR, "old");
  getLogger().clearAll();
  EXPECT_EQ(root.read(LOG), "");
  log(cimrt::TVX_ERR, "new");
  EXPECT_NE(root.read(LOG).find("new"), std::string::npos);
}

TEST_F(Log_Backends, ClearWithoutAStreamTouchesNothing) {
  root.write(LOG, "kept");
  TVX_FileLogger file;
  file.clear();
  EXPECT_EQ(root.read(LOG), "kept");
}

TEST_F(Log_Backends, AFullFileDoesNotStopTheCaller) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  rlimit before{};
  ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &before), 0);
  const auto handler = std::signal(SIGXFSZ, SIG_IGN);
  rlimit none = before;
  none.rlim_cur = 0;
  ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &none), 0);
  log(cimrt::TVX_ERR, "no room");
  ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &before), 0);
  std::signal(SIGXFSZ, handler);
  EXPECT_TRUE(file.isOpen());
  log(cimrt::TVX_ERR, "room again");
  EXPECT_NE(root.read(LOG).find("room again"), std::string::npos);
}

TEST_F(Log_Backends, NullTextAndLineAreWrittenAsEmptyAndZero) {
  TVX_FileLogger file;
  getLogger().setMode(2);
  ASSERT_EQ(file.validateAndSetPath(path(LOG).c_str(), false), 0);
  file.log(cimrt::TVX_ERR, nullptr, nullptr, nullptr);
  EXPECT_NE(root.read(LOG).find("[:0][TVX_ERR] \n"), std::string::npos);
}

// ---- Records in memory ----

TEST_F(Log_Backends, KeepsRecordsInModesOneAndFourOnly) {
  TVX_CIMLogger records;
  for (const int mode : {0, 2, 3, 1, 4}) {
    getLogger().setMode(mode);
    log(cimrt::TVX_ERR, std::to_string(mode).c_str());
  }
  ASSERT_EQ(records.records().size(), 2U);
  EXPECT_STREQ(records.records()[0].text, "[1]");
  EXPECT_STREQ(records.records()[1].text, "[4]");
}

TEST_F(Log_Backends, KeepsRecordsWhileTheLoggerIsDisabled) {
  TVX_CIMLogger records;
  getLogger().setMode(1);
  getLogger().disable();
  log(cimrt::TVX_CRIT, "x");
  EXPECT_EQ(records.records().size(), 1U);
}

TEST_F(Log_Backends, InformationNeverReachesTheRecords) {
  TVX_CIMLogger records;
  for (const int mode : {1, 4}) {
    for (const bool enabled : {true, false}) {
      getLogger().setMode(mode);
      getLogger().setLevel(5);
      enabled ? getLogger().enable() : getLogger().disable();
      log(cimrt::TVX_INFO, "information");
      log(cimrt::TVX_DBG, "debugging");
    }
  }
  EXPECT_TRUE(records.records().empty());
}

TEST_F(Log_Backends, ARecordHoldsLevelTimeAndText) {
  TVX_CIMLogger records;
  getLogger().setMode(1);
  cimrt::tvxSetClock([]() -> std::uint64_t { return 1'700'000'000'000'123; });
  log(cimrt::TVX_WARN, "text");
  const TVX_CIMLogger::Record record = records.records().at(0);
  EXPECT_EQ(record.level, 2);
  EXPECT_TRUE(record.time.is_timestamp());
  EXPECT_EQ(record.time.usec(), 1'700'000'000'000'123U);
  EXPECT_STREQ(record.text, "[text]");
}

TEST_F(Log_Backends, NullTextMakesNoRecord) {
  TVX_CIMLogger records;
  getLogger().setMode(1);
  records.log(cimrt::TVX_ERR, "f", nullptr, nullptr);
  EXPECT_TRUE(records.records().empty());
  EXPECT_EQ(records.lastIndex(), -1);
}

TEST_F(Log_Backends, TheRecordAfterTheLastPlaceOverwritesTheFirst) {
  TVX_CIMLogger records;
  EXPECT_EQ(records.capacity(), 1024);
  getLogger().setMode(1);
  for (int i = 0; i < 1024; ++i) log(cimrt::TVX_ERR, std::to_string(i).c_str());
  ASSERT_EQ(records.records().size(), 1024U);
  EXPECT_STREQ(records.records().front().text, "[0]");
  EXPECT_EQ(records.lastIndex(), 1023);
  log(cimrt::TVX_ERR, "1024");
  ASSERT_EQ(records.records().size(), 1024U);
  EXPECT_STREQ(records.records()[0].text, "[1024]");
  EXPECT_STREQ(records.records()[1].text, "[1]");
  EXPECT_EQ(records.lastIndex(), 1024);
}

TEST_F(Log_Backends, TextThatDoesNotFitIsCut) {
  TVX_CIMLogger records;
  getLogger().setMode(1);
  for (const std::size_t size : {190U, 197U, 198U, 199U, 5000U}) {
    records.clear();
    log(cimrt::TVX_ERR, std::string(size, 'x').c_str());
    const std::string kept = records.records().at(0).text;
    EXPECT_EQ(kept.size(), std::min<std::size_t>(size + 2, 199)) << size;
    EXPECT_EQ(kept.front(), '[');
  }
}

TEST_F(Log_Backends, ClearDropsTheRecordsAndStartsTheRingAnew) {
  TVX_CIMLogger records(2);
  getLogger().setMode(1);
  for (const char* text : {"a", "b", "c"}) log(cimrt::TVX_ERR, text);
  getLogger().clearAll();
  EXPECT_TRUE(records.records().empty());
  EXPECT_EQ(records.lastIndex(), -1);
  log(cimrt::TVX_ERR, "d");
  EXPECT_STREQ(records.records().at(0).text, "[d]");
}

}  // namespace
