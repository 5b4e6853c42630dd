#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cerrno>
#include <filesystem>
#include <string>

#include "common/CLogger.h"
#include "common/TvxConfigFile.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::TvxConfigFile;
using cimrt::WebLaunchConfig;
using tvx::test::Log_Capture;
using tvx::test::Temp_Root;

constexpr const char* CONF = "/etc/torvex_fc_provider.conf";
constexpr const char* WEBLAUNCH = "/etc/tvx_smis.conf";

const std::string HEADER = std::string(50, '#') +
                           "\n# Torvex HBA CIM Provider Configuration Settings #\n" +
                           std::string(50, '#') + "\n";

std::string written(int timeout, const char* adapter, const char* san) {
  return HEADER + "TVX_PROVIDER_CACHE_TIMEOUT = " + std::to_string(timeout) +
         "\nTVX_PROVIDER_REFRESH_ADAPTERDATA = " + adapter +
         "\nTVX_PROVIDER_REFRESH_SANDATA = " + san + "\n";
}

class Config_File : public testing::Test {
 protected:
  /// The settings that a file with these contents gives.
  void load(std::string_view contents) {
    root.write(CONF, contents);
    TvxConfigFile config;
    config.load(root.path(CONF).c_str());
    timeout = config.getCacheTimeout();
    adapter = config.getAdapterRefresh();
    san = config.getSANRefresh();
  }
  void expect(std::uint32_t wantedTimeout, bool wantedAdapter, bool wantedSan) const {
    EXPECT_EQ(timeout, wantedTimeout);
    EXPECT_EQ(adapter, wantedAdapter);
    EXPECT_EQ(san, wantedSan);
  }

  const Temp_Root root;
  std::uint32_t timeout = 0;
  bool adapter = false;
  bool san = false;
};

TEST_F(Config_File, StartsWithTheDefaults) {
  TvxConfigFile config;
  EXPECT_EQ(config.getCacheTimeout(), 10U);
  EXPECT_FALSE(config.getAdapterRefresh());
  EXPECT_TRUE(config.getSANRefresh());
  EXPECT_EQ(config.path(), "");
}

TEST_F(Config_File, AMissingFileIsSilentAndIsMadeAtTheEnd) {
  const Log_Capture capture;
  {
    TvxConfigFile config;
    config.load(root.path(CONF).c_str());
    EXPECT_EQ(config.getCacheTimeout(), 10U);
    EXPECT_FALSE(root.exists(CONF));
  }
  EXPECT_TRUE(capture.lines().empty());
  EXPECT_EQ(root.read(CONF), written(10, "FALSE", "TRUE"));
}

TEST_F(Config_File, NullReadsAndWritesNothing) {
  {
    TvxConfigFile config;
    config.load(nullptr);
    EXPECT_EQ(config.path(), "");
  }
  EXPECT_TRUE(std::filesystem::is_empty(root.path("/etc")));
}

TEST_F(Config_File, AnOlderErrorNumberDoesNotHideTheFile) {
  root.write(CONF, "TVX_PROVIDER_CACHE_TIMEOUT = 7\n");
  TvxConfigFile config;
  errno = ENOENT;
  config.load(root.path(CONF).c_str());
  EXPECT_EQ(config.getCacheTimeout(), 7U);
}

TEST_F(Config_File, AFileThatCanNotBeOpenedIsLogged) {
  const Log_Capture capture;
  root.write("/etc/file", "");
  const std::string path = root.path("/etc/file/below");  // ENOTDIR
  TvxConfigFile config;
  config.load(path.c_str());
  EXPECT_TRUE(capture.has(cimrt::TVX_ERR, "Unable to open provider config setting file - " + path));
  EXPECT_EQ(config.getCacheTimeout(), 10U);
}

TEST_F(Config_File, ADirectoryInItsPlaceLeavesTheDefaults) {
  std::filesystem::create_directory(root.path(CONF));
  TvxConfigFile config;
  config.load(root.path(CONF).c_str());
  EXPECT_EQ(config.getCacheTimeout(), 10U);
}

TEST_F(Config_File, APipeInItsPlaceIsEmptyAndStays) {
  ASSERT_EQ(::mkfifo(root.path(CONF).c_str(), 0600), 0);
  const Log_Capture capture;
  {
    TvxConfigFile config;
    config.load(root.path(CONF).c_str());
    EXPECT_EQ(config.getCacheTimeout(), 10U);
  }
  EXPECT_TRUE(capture.lines().empty());
  EXPECT_TRUE(std::filesystem::is_fifo(root.path(CONF)));
}

TEST_F(Config_File, ReadsTheThreeKeys) {
  load(written(25, "TRUE", "FALSE"));
  expect(25, true, false);
}

TEST_F(Config_File, StripsWhiteSpaceAndCarriageReturns) {
  load(
      "\t TVX_PROVIDER_CACHE_TIMEOUT=  3\t\r\n"
      "TVX_PROVIDER_REFRESH_ADAPTERDATA   =TRUE  \r\n"
      "\v\fTVX_PROVIDER_REFRESH_SANDATA=FALSE");
  expect(3, true, false);
}

TEST_F(Config_File, SkipsCommentsAndLinesWithoutASign) {
  load(
      "  # TVX_PROVIDER_CACHE_TIMEOUT = 4\nTVX_PROVIDER_CACHE_TIMEOUT 5\n\n"
      "tvx_provider_cache_timeout = 6\n");
  expect(10, false, true);
}

TEST_F(Config_File, AnInvalidTimeoutLeavesTheKeyOpen) {
  for (const char* refused : {"31", "0", "-5", "", "ten", "99999999999999999999"}) {
    load(std::string("TVX_PROVIDER_CACHE_TIMEOUT = ") + refused +
         "\nTVX_PROVIDER_CACHE_TIMEOUT = 20\n");
    expect(20, false, true);
  }
}

TEST_F(Config_File, TheFirstValidLineOfAKeyCounts) {
  load(
      "TVX_PROVIDER_CACHE_TIMEOUT = 12\nTVX_PROVIDER_CACHE_TIMEOUT = 20\n"
      "TVX_PROVIDER_REFRESH_ADAPTERDATA = TRUE\nTVX_PROVIDER_REFRESH_ADAPTERDATA = FALSE\n"
      "TVX_PROVIDER_REFRESH_SANDATA = FALSE\nTVX_PROVIDER_REFRESH_SANDATA = TRUE\n");
  expect(12, true, false);
}

TEST_F(Config_File, TrailingTextBehindTheNumberIsNotTested) {
  load("TVX_PROVIDER_CACHE_TIMEOUT = 12 minutes = ok");
  expect(12, false, true);
}

TEST_F(Config_File, TheLimitsAreOneAndThirty) {
  load("TVX_PROVIDER_CACHE_TIMEOUT = 1");
  EXPECT_EQ(timeout, 1U);
  load("TVX_PROVIDER_CACHE_TIMEOUT = 30");
  EXPECT_EQ(timeout, 30U);
}

TEST_F(Config_File, TruthIsComparedExactly) {
  for (const char* refused : {"true", "True", "1", "yes", "", "TRUEX", "FALSE TRUE"}) {
    load(std::string("TVX_PROVIDER_REFRESH_ADAPTERDATA = ") + refused +
         "\nTVX_PROVIDER_REFRESH_SANDATA = " + refused + "\n");
    expect(10, false, true);
  }
  load("TVX_PROVIDER_REFRESH_SANDATA = true\nTVX_PROVIDER_REFRESH_SANDATA = FALSE\n");
  expect(10, false, false);
}

TEST_F(Config_File, AThousandLinesAreRead) {
  const std::string filler(999, '\n');
  load(filler + "TVX_PROVIDER_CACHE_TIMEOUT = 20\n");
  EXPECT_EQ(timeout, 20U);
  load(filler + "\nTVX_PROVIDER_CACHE_TIMEOUT = 20\n");
  EXPECT_EQ(timeout, 10U);
}

TEST_F(Config_File, AnOverlongLineCostsNoOtherSetting) {
  load("# " + std::string(1021, 'x') + "TVX_PROVIDER_CACHE_TIMEOUT = 20\n" +
       "TVX_PROVIDER_CACHE_TIMEOUT = 21\n" + std::string(1 << 20, 'y') +
       "\nTVX_PROVIDER_REFRESH_SANDATA = FALSE\n");
  expect(21, false, false);
}

TEST_F(Config_File, BinaryAndTruncatedFilesCostNoValidSetting) {
  std::string binary("\0\x01\xff\xfe=\0\n", 7);
  load(binary + "TVX_PROVIDER_CACHE_TIMEOUT = 5\n" + binary + "TVX_PROVIDER_REFRESH_ADAPTERDATA");
  expect(5, false, true);
}

TEST_F(Config_File, IsRewrittenInFullAtTheEnd) {
  root.write(CONF, "# mine\nOTHER = 1\nTVX_PROVIDER_CACHE_TIMEOUT = 7\n");
  {
    TvxConfigFile config;
    config.load(root.path(CONF).c_str());
    config.setAdapterRefresh(1);
    config.setSANRefresh(0);
  }
  EXPECT_EQ(root.read(CONF), written(7, "TRUE", "FALSE"));
}

TEST_F(Config_File, AFailedRewriteIsSilent) {
  const Log_Capture capture;
  {
    TvxConfigFile config;
    config.load(root.path("/nowhere/x.conf").c_str());
  }
  EXPECT_TRUE(capture.lines().empty());
}

TEST_F(Config_File, SettersRefuseWhatIsOutOfRange) {
  TvxConfigFile config;
  EXPECT_EQ(config.setCacheTimeout(1), 0);
  EXPECT_EQ(config.setCacheTimeout(0), -1);
  EXPECT_EQ(config.getCacheTimeout(), 1U);
  EXPECT_EQ(config.setCacheTimeout(30), 0);
  EXPECT_EQ(config.setCacheTimeout(31), -1);
  EXPECT_EQ(config.getCacheTimeout(), 30U);
  EXPECT_EQ(config.setAdapterRefresh(1), 0);
  EXPECT_EQ(config.setAdapterRefresh(2), -1);
  EXPECT_TRUE(config.getAdapterRefresh());
  EXPECT_EQ(config.setSANRefresh(0), 0);
  EXPECT_EQ(config.setSANRefresh(2), -1);
  EXPECT_FALSE(config.getSANRefresh());
}

TEST_F(Config_File, ItsLockIsRecursive) {
  TvxConfigFile config;
  const cimrt::Auto_Mutex lock(config.mutex());
  EXPECT_EQ(config.getCacheTimeout(), 10U);
}

// ---- WebLaunch ----

TEST_F(Config_File, WithoutAWebLaunchFileTheAddressIsEmpty) {
  const Log_Capture capture;
  EXPECT_EQ(WebLaunchConfig().address(), "");
  EXPECT_TRUE(capture.has(cimrt::TVX_INFO,
                          "WebLaunch config file '" + root.path(WEBLAUNCH) + "' not found."));
}

TEST_F(Config_File, TheFirstSignificantLineIsTheAddress) {
  root.write(WEBLAUNCH, "\n   \n  # comment\n\thttp://host:80/x y \nhttp://other\n");
  EXPECT_EQ(WebLaunchConfig().address(), "http://host:80/x y ");
  root.write(WEBLAUNCH, "http://host\r\n");
  EXPECT_EQ(WebLaunchConfig().address(), "http://host");
}

TEST_F(Config_File, CommentsAloneLeaveTheAddressEmpty) {
  for (const char* contents : {"", "# a\n   # b\n\n", "   "}) {
    root.write(WEBLAUNCH, contents);
    EXPECT_EQ(WebLaunchConfig().address(), "");
  }
}

TEST_F(Config_File, WebLaunchLinesAreBounded) {
  root.write(WEBLAUNCH, std::string(1000, 'a'));
  EXPECT_EQ(WebLaunchConfig().address(), std::string(255, 'a'));
}

}  // namespace
