#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "common/CLogger.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::getLogger;
using cimrt::TVX_FileLogger;
using tvx::test::Log_Capture;
using tvx::test::Temp_Root;

constexpr const char* DUMP = "/etc/torvex_fc_provider.dmp";

class Dump_File : public testing::Test {
 protected:
  void SetUp() override {
    getLogger().setMode(0);
    getLogger().setLevel(5);
    getLogger().clearDefaultLog();
    capture.forget();
    getLogger().disable();
  }
  void TearDown() override { getLogger().setMode(0); }

  void load(std::string_view contents) {
    root.write(DUMP, contents);
    getLogger().loadConfig();
  }
  /// Mode 0, level 5, disabled: what the tests start with.
  static bool isUnchanged() {
    return getLogger().mode() == 0 && getLogger().level() == 5 && !getLogger().isEnabled();
  }
  std::string logPath() const { return root.path("/var/log/x.log"); }

  const Temp_Root root;
  TVX_FileLogger file;
  Log_Capture capture;
};

TEST_F(Dump_File, LiesInEtcWhenTheRootCanBeWritten) {
  EXPECT_EQ(getLogger().dumpPath(), DUMP);
}

TEST_F(Dump_File, IsNotAccessibleWhenItIsNotThere) {
  EXPECT_FALSE(getLogger().isDumpAccessible());
  EXPECT_TRUE(capture.has(cimrt::TVX_CRIT, "File access failed with No such file or directory"));
}

TEST_F(Dump_File, IsAccessibleWhenItIsThere) {
  root.write(DUMP, "");
  EXPECT_TRUE(getLogger().isDumpAccessible());
  EXPECT_EQ(capture.count(cimrt::TVX_CRIT, "File access failed with Success"), 0U);
}

TEST_F(Dump_File, AMissingFileIsLoggedAndChangesNothing) {
  getLogger().loadConfig();
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR, "Unable to open config data file - " + root.path(DUMP)));
  EXPECT_TRUE(isUnchanged());
}

struct Refused {
  const char* contents;
  const char* before;  // of the path
  const char* after;
};

class Refused_Dump : public Dump_File, public testing::WithParamInterface<Refused> {};

TEST_P(Refused_Dump, IsLoggedAndChangesNothing) {
  load(GetParam().contents);
  EXPECT_TRUE(isUnchanged());
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR, GetParam().before + root.path(DUMP) + GetParam().after))
      << testing::PrintToString(capture.lines());
}

INSTANTIATE_TEST_SUITE_P(
    AllFields, Refused_Dump,
    testing::Values(
        Refused{"", "Unable to read Log Mode from config data file - ", ""},
        Refused{",,,", "Unable to read Log Mode from config data file - ", ""},
        Refused{"5,1,1\n", "Invalid value for Log Mode from config data file -", "-5"},
        Refused{"-1,1,1\n", "Invalid value for Log Mode from config data file -", "-4294967295"},
        Refused{"99999999999,1,1\n", "Invalid value for Log Mode from config data file -",
                "-2147483647"},
        Refused{"1", "Unable to read Log Level from config data file - ", ""},
        Refused{"1,6,1\n", "Invalid value for Log Level from config data file -", "-6"},
        Refused{"1,-2,1\n", "Invalid value for Log Level from config data file -", "-4294967294"},
        Refused{"1,2", "Unable to read Log Enabled from config data file - ", ""},
        Refused{"1,2,-1\n", "Invalid value for Log Enabled from config data file - ", ""}));

TEST_F(Dump_File, ModeOneNeedsNoPath) {
  load("1,3,1\n");
  EXPECT_EQ(getLogger().mode(), 1);
  EXPECT_EQ(getLogger().level(), 3);
  EXPECT_TRUE(getLogger().isEnabled());
}

TEST_F(Dump_File, ModeThreeIsTakenAndHasNoConsumer) {
  load("3,3,1\n" + logPath());
  EXPECT_EQ(getLogger().mode(), 3);
  EXPECT_TRUE(getLogger().isEnabled());
  EXPECT_FALSE(file.isOpen());
  EXPECT_EQ(file.path(), "");
}

TEST_F(Dump_File, ModesTwoAndFourNeedAPathLine) {
  for (const char* contents : {"2,3,1\n", "4,3,1\n", "2,3,1", "2,3,1\n\n"}) {
    load(contents);
    EXPECT_TRUE(isUnchanged()) << contents;
  }
}

TEST_F(Dump_File, ThePathLineBecomesTheLogFile) {
  for (const char* lineEnd : {"", "\n", "\r\n"}) {
    getLogger().setMode(0);
    load("2,4,1\n" + logPath() + lineEnd);
    EXPECT_EQ(getLogger().mode(), 2);
    EXPECT_EQ(getLogger().level(), 4);
    EXPECT_TRUE(getLogger().isEnabled());
    EXPECT_EQ(file.path(), logPath());
    EXPECT_TRUE(file.isOpen());
    EXPECT_FALSE(file.isRestricted());
  }
}

TEST_F(Dump_File, AFileOfAnotherSystemIsRead) {
  load("4,2,1\r\n" + logPath() + "\r\n");
  EXPECT_EQ(getLogger().mode(), 4);
  EXPECT_EQ(file.path(), logPath());
}

TEST_F(Dump_File, TheDefaultLogIsRestricted) {
  getLogger().setDefaultLog();
  load("2,4,1\n" + logPath());
  EXPECT_TRUE(file.isRestricted());
}

TEST_F(Dump_File, APathThatCanNotBeUsedDropsTheSettings) {
  load("2,3,1\n" + root.path("/etc"));
  EXPECT_TRUE(isUnchanged());
  EXPECT_EQ(file.path(), "");
}

TEST_F(Dump_File, WithoutAFileBackEndThePathModesAreDropped) {
  getLogger().unregisterInterface(&file);
  load("2,3,1\n" + logPath());
  EXPECT_TRUE(isUnchanged());
}

TEST_F(Dump_File, LevelZeroAndEnabledZeroApplyTheModeAlone) {
  load("1,0,0\n");
  EXPECT_EQ(getLogger().mode(), 1);
  EXPECT_EQ(getLogger().level(), 5);
  EXPECT_FALSE(getLogger().isEnabled());
}

TEST_F(Dump_File, AnOverlongFirstLineDoesNotSpillIntoThePath) {
  load("2,3,1,aaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaa\n" + logPath());
  EXPECT_EQ(getLogger().mode(), 2);
  EXPECT_EQ(file.path(), logPath());
}

TEST_F(Dump_File, BinaryAndHugeFilesChangeNothing) {
  std::string binary = "\x01\x02\xff";
  binary += '\0';
  load(binary + "1,2,1\n");
  EXPECT_EQ(getLogger().mode(), 0);
  load(std::string(4 << 20, 'x'));
  EXPECT_EQ(getLogger().mode(), 0);
  load("2,3,1\n" + std::string(4 << 20, '/'));
  EXPECT_EQ(getLogger().mode(), 0);
}

TEST_F(Dump_File, ADirectoryInItsPlaceChangesNothing) {
  std::filesystem::create_directory(root.path(DUMP));
  getLogger().loadConfig();
  EXPECT_TRUE(isUnchanged());
  getLogger().writeDump();
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR, "Unable to open dump file\n"));
}

TEST_F(Dump_File, APipeInItsPlaceChangesNothing) {
  ASSERT_EQ(::mkfifo(root.path(DUMP).c_str(), 0600), 0);
  getLogger().loadConfig();
  EXPECT_TRUE(isUnchanged());
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR,
                          "Unable to read Log Mode from config data file - " + root.path(DUMP)));
  EXPECT_FALSE(getLogger().writeDump());
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR, "Unable to open dump file\n"));
}

TEST_F(Dump_File, HoldsModeLevelEnabledAndThePath) {
  getLogger().setLevel(3);
  getLogger().writeDump();
  EXPECT_EQ(root.read(DUMP), "0,3,0\n");
  ASSERT_EQ(file.validateAndSetPath(logPath().c_str(), false), 0);
  getLogger().setMode(4);
  getLogger().enable();
  getLogger().writeDump();
  EXPECT_EQ(root.read(DUMP), "4,3,1\n" + logPath());
}

TEST_F(Dump_File, WhatIsWrittenIsReadBack) {
  ASSERT_EQ(file.validateAndSetPath(logPath().c_str(), false), 0);
  getLogger().setMode(2);
  getLogger().setLevel(2);
  getLogger().enable();
  getLogger().writeDump();
  getLogger().setMode(0);
  getLogger().setLevel(5);
  getLogger().disable();
  getLogger().loadConfig();
  EXPECT_EQ(getLogger().mode(), 2);
  EXPECT_EQ(getLogger().level(), 2);
  EXPECT_TRUE(getLogger().isEnabled());
  EXPECT_EQ(file.path(), logPath());
}

TEST_F(Dump_File, TheFirstFailureLogHasTheRootsPrefix) {
  EXPECT_EQ(cimrt::tvxFfdcLogPath(),
            root.path("/opt/ibm/platform/log/torvex_fc_provider_ffdc.log"));
}

}  // namespace
