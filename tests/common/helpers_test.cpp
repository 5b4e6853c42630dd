#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdarg>
#include <filesystem>
#include <stdexcept>
#include <string>

#include "common/CLogger.h"
#include "common/TVX_Clock.h"
#include "common/TVX_Common.h"
#include "common/TVX_Formatted.h"
#include "common/TVX_Memory.h"
#include "common/TVX_Path.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::ParsedVersion;
using cimrt::parseVersion;
using testing::ElementsAre;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using tvx::test::Temp_Root;

constexpr int FAILED = 0x8001;
constexpr std::uint8_t NAME[] = {0x10, 0x00, 0x02, 0xAB, 0xcd, 0x0E, 0xF0, 0x01};

// ---- Formatted texts ----

__attribute__((format(printf, 1, 2))) std::string formatted(const char* format, ...) {
  va_list args;
  va_start(args, format);
  const cimrt::TVX_Formatted text(format, args);
  va_end(args);
  EXPECT_STREQ(text.c_str(), std::string(text.view()).c_str());
  return std::string(text.view());
}

TEST(Formatted, TextsOfAnyLengthAreWhole) {
  EXPECT_EQ(formatted("%d of %s", 3, "four"), "3 of four");
  EXPECT_EQ(formatted("%s", ""), "");
  for (const std::size_t size : {511U, 512U, 513U, 5000U, 100000U}) {
    const std::string text(size, 'x');
    EXPECT_EQ(formatted("%s|%d", text.c_str(), 7), text + "|7") << size;
  }
}

// ---- Text forms ----

TEST(Text_Forms, AWwnIsSixteenUpperCaseDigits) {
  for (auto* const toText : {cimrt::WWPNToText, cimrt::WWNNToText, cimrt::FabricNameToText}) {
    char text[cimrt::TVX_WWN_TEXT_SIZE];
    EXPECT_EQ(toText(NAME, text), 0);
    EXPECT_STREQ(text, "100002ABCD0EF001");
    EXPECT_EQ(toText(NAME, nullptr), 0);
  }
  EXPECT_EQ(cimrt::WWNToString(NAME), "100002ABCD0EF001");
}

TEST(Text_Forms, AMacAddressIsSixLowerCasePairs) {
  char text[cimrt::TVX_MAC_TEXT_SIZE];
  EXPECT_EQ(cimrt::MACToText(NAME, text), 0);
  EXPECT_STREQ(text, "10-00-02-ab-cd-0e");
  EXPECT_EQ(cimrt::MACToText(NAME, nullptr), FAILED);
}

TEST(Text_Forms, AnIdentifierIsThirtyTwoDigits) {
  std::uint8_t bytes[16];
  for (std::uint8_t i = 0; i < 16; ++i) bytes[i] = static_cast<std::uint8_t>(0xF0 + i);
  EXPECT_EQ(cimrt::UUIDToString(bytes), "F0F1F2F3F4F5F6F7F8F9FAFBFCFDFEFF");
}

TEST(Text_Forms, AHexRunIsAppended) {
  std::string text = "x";
  cimrt::appendHex(NAME, NAME + 4, text);
  EXPECT_EQ(text, "x100002AB");
  cimrt::appendHex(nullptr, NAME, text);
  cimrt::appendHex(NAME, nullptr, text);
  cimrt::appendHex(NAME, NAME, text);
  cimrt::appendHex(NAME + 2, NAME, text);
  EXPECT_EQ(text, "x100002AB");
}

TEST(Text_Forms, SixteenDigitsBecomeAWwn) {
  std::uint8_t wwn[8] = {};
  EXPECT_EQ(cimrt::textToWWN("100002abCD0ef001", wwn), 0);
  EXPECT_THAT(wwn, testing::ElementsAreArray(NAME));
}

TEST(Text_Forms, AnyOtherTextIsNoWwn) {
  for (const char* text : {"100002ABCD0EF00", "100002ABCD0EF0011", "", "100002ABCD0EF00G",
                           "0x0002ABCD0EF001", " 10002ABCD0EF001"}) {
    const Log_Capture capture;
    std::uint8_t wwn[8] = {};
    EXPECT_EQ(cimrt::textToWWN(text, wwn), FAILED) << text;
    EXPECT_TRUE(capture.has(cimrt::TVX_ERR, "INVALID WWN"));
  }
  std::uint8_t wwn[8] = {};
  EXPECT_EQ(cimrt::textToWWN(nullptr, wwn), FAILED);
}

TEST(Text_Forms, ValuesAreLoggedUnderALabel) {
  const Log_Capture capture;
  EXPECT_EQ(cimrt::arrayToText("Ports", {1, 2, 3}), "Ports: 1,2,3");
  EXPECT_EQ(cimrt::arrayToText("None", {}), "None: ");
  cimrt::logValue("Speed", 16);
  cimrt::logValue("Model", "TVX");
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "Ports: Ports: 1,2,3"}, Logged{5, "None: None: "},
                          Logged{5, "Speed: 16"}, Logged{5, "Model: TVX"}));
}

// ---- Versions ----

TEST(Parse_Version, TakesTheSixPositionsApart) {
  const Log_Capture capture;
  ParsedVersion version;
  EXPECT_EQ(parseVersion("2.01a4", version), 0);
  EXPECT_EQ(version.Major, 2);
  EXPECT_EQ(version.Minor, 0);
  EXPECT_EQ(version.Revision, 1);
  EXPECT_EQ(version.Build, 4);
  EXPECT_EQ(version.ReleaseType, "a");
  EXPECT_EQ(version.TestReleaseVersion, "");
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "Input Version String: [2.01a4]"},
                          Logged{5, "Parsed the major, minor, revision & build numbers"},
                          Logged{5, "Parsed the revision for Test Firmwares"},
                          Logged{5, "Filled Major, Minor, Revision & Build Numbers"},
                          Logged{5, "Filled ReleaseType"},
                          Logged{5, "parseVersion: Version parsing success"}));
}

TEST(Parse_Version, IgnoresWhatFollows) {
  for (const char* text :
       {"2.01a4 ", "2.01a4 tail", "2.01a4r3", "2.01a4rx", "2.01a4R3", "2.01a4x9", "2.01a4r"}) {
    ParsedVersion version;
    EXPECT_EQ(parseVersion(text, version), 0) << text;
    EXPECT_EQ(version.Build, 4);
    EXPECT_EQ(version.TestReleaseVersion, "") << text;
  }
}

TEST(Parse_Version, RefusesAnyOtherLayoutAndKeepsTheResult) {
  for (const char* text :
       {"", "2", "2.01a", "a.01a4", "2,01a4", "2.x1a4", "2.0xa4", "2.0114", "2.01ab", "10.2.107"}) {
    const Log_Capture capture;
    ParsedVersion version{7, 7, 7, 7, "seven", "x"};
    EXPECT_EQ(parseVersion(text, version), FAILED) << text;
    EXPECT_TRUE(capture.has(5, "parseVersion Error: Invalid Firmware String"));
    EXPECT_EQ(version.Major, 7);
    EXPECT_EQ(version.ReleaseType, "seven");
  }
}

TEST(Parse_Version, RefusesNull) {
  const Log_Capture capture;
  ParsedVersion version;
  EXPECT_EQ(parseVersion(nullptr, version), FAILED);
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "parseVersion Error: Input FirmwareVersion is Null"}));
}

/// Back end that fails at one message.
class Failing_Back_End : public cimrt::TVX_LoggerInterface {
 public:
  void log(int, const char*, const unsigned*, const char* text) override {
    if (std::string(text) == "Filled ReleaseType") throw std::runtime_error("back end");
  }
  void open() override {}
  void close() override {}
  void clear() override {}
};

TEST(Parse_Version, CatchesWhatIsThrownOnTheWay) {
  const Log_Capture capture;
  Failing_Back_End failing;
  cimrt::getLogger().registerInterface(&failing);
  ParsedVersion version;
  const int status = parseVersion("2.01a4", version);
  cimrt::getLogger().unregisterInterface(&failing);
  EXPECT_EQ(status, FAILED);
  EXPECT_TRUE(capture.has(5, "parseVersion: error occurred while parsing..."));
  EXPECT_FALSE(capture.has(5, "parseVersion: Version parsing success"));
}

TEST(Version_Numbers, AreCutAtDotsAndHyphens) {
  const Log_Capture capture;
  std::uint16_t numbers[4];
  cimrt::versionNumbers("10.2.107-7", numbers);
  EXPECT_THAT(numbers, ElementsAre(10, 2, 107, 7));
  EXPECT_TRUE(capture.has(5, "10, 2, 107, 7"));
  cimrt::versionNumbers("8.1", numbers);
  EXPECT_THAT(numbers, ElementsAre(8, 1, 0, 0));
  cimrt::versionNumbers(nullptr, numbers);
  EXPECT_THAT(numbers, ElementsAre(0, 0, 0, 0));
  cimrt::versionNumbers("1.2.3.4.5", numbers);
  EXPECT_THAT(numbers, ElementsAre(1, 2, 3, 4));
}

// ---- Operating system ----

TEST(Os_Information, IsTheKernelsFirstLineAndTheIssueFile) {
  const Temp_Root root;
  const Log_Capture capture;
  root.write("/proc/version", "Linux version 6.1.0\nsecond line\n");
  root.write("/etc/issue", "Debian GNU/Linux 12 \\n \\l\n\n");
  std::string name;
  std::string extended;
  EXPECT_EQ(cimrt::getOSInformation(name, extended), 0);
  EXPECT_EQ(name, "Linux version 6.1.0");
  EXPECT_EQ(extended, "Debian GNU/Linux 12 \\n \\l\n\n");
  EXPECT_THAT(capture.lines(),
              ElementsAre(Logged{5, "Inside  getOSInformation"},
                          Logged{5, "Under _LINUX -- getting the os name and version"},
                          Logged{5, "Under _LINUX -- Getting the OS Distribution Name"}));
}

TEST(Os_Information, IsUnknownWithoutTheFiles) {
  const Temp_Root root;
  const Log_Capture capture;
  std::string name;
  std::string extended;
  EXPECT_EQ(cimrt::getOSInformation(name, extended), 0);
  EXPECT_EQ(name, "Unknown");
  EXPECT_EQ(extended, "Unknown");
  EXPECT_TRUE(capture.has(5, "Unable to open the /etc/issue file to get OSDistribution Name"));
}

TEST(Os_Information, WithoutMemoryTheDistributionStaysUnknown) {
  const Temp_Root root;
  const Log_Capture capture;
  root.write("/proc/version", "kernel");
  root.write("/etc/issue", "issue");
  cimrt::tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  std::string name;
  std::string extended;
  EXPECT_NE(cimrt::getOSInformation(name, extended), 0);
  cimrt::tvxSetAllocator(nullptr);
  EXPECT_EQ(name, "kernel");
  EXPECT_EQ(extended, "Unknown");
  EXPECT_TRUE(
      capture.has(cimrt::TVX_ERR, "Unable to allocate the memory to store OSDistributionName"));
}

TEST(Os_Information, LongLinesAndHugeFilesAreBounded) {
  const Temp_Root root;
  root.write("/proc/version", std::string(1000, 'v'));
  root.write("/etc/issue", std::string(1 << 20, 'i'));
  std::string name;
  std::string extended;
  EXPECT_EQ(cimrt::getOSInformation(name, extended), 0);
  EXPECT_EQ(name, std::string(255, 'v'));
  EXPECT_LT(extended.size(), std::size_t{1} << 20);
  EXPECT_EQ(extended.find_first_not_of('i'), std::string::npos);
}

// ---- Prefix, clock, memory ----

TEST(Path_Prefix, StandsBeforeAbsolutePathsWhileItIsSet) {
  EXPECT_EQ(cimrt::tvxPath("/etc/issue"), "/etc/issue");
  const Temp_Root root;
  EXPECT_EQ(cimrt::tvxPath("/etc/issue"), root.path("/etc/issue"));
  EXPECT_EQ(cimrt::tvxPath(nullptr), root.path(""));
}

std::uint64_t slept = 0;

TEST(Clock, CanBeReplaced) {
  const std::uint64_t before = cimrt::Time::now();
  EXPECT_GE(cimrt::tvxNow(), before);
  EXPECT_GE(cimrt::tvxNowDatetime().usec(), before);
  cimrt::tvxSetClock([]() -> std::uint64_t { return 42; });
  EXPECT_EQ(cimrt::tvxNow(), 42U);
  EXPECT_EQ(cimrt::tvxNowDatetime().usec(), 42U);
  EXPECT_TRUE(cimrt::tvxNowDatetime().is_timestamp());
  cimrt::tvxSetClock(nullptr);
  EXPECT_GE(cimrt::tvxNow(), before);
}

TEST(Sleep, CanBeReplaced) {
  cimrt::tvxSetSleep([](std::uint64_t usec) { slept += usec; });
  cimrt::tvxSleep(3'600'000'000);
  cimrt::tvxSetSleep(nullptr);
  EXPECT_EQ(slept, 3'600'000'000U);
  cimrt::tvxSleep(1);
  EXPECT_EQ(slept, 3'600'000'000U);
}

TEST(Memory, IsZeroedAndMayRunOut) {
  const cimrt::TVX_Block block = cimrt::tvxAllocate(64);
  ASSERT_NE(block, nullptr);
  EXPECT_EQ(std::count(block.get(), block.get() + 64, 0), 64);
  EXPECT_NE(cimrt::tvxAllocate(0), nullptr);
  EXPECT_NE(cimrt::tvxAllocate(std::size_t{512} << 20), nullptr);
  EXPECT_EQ(cimrt::tvxAllocate((std::size_t{512} << 20) + 1), nullptr);
  cimrt::tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  EXPECT_EQ(cimrt::tvxAllocate(1), nullptr);
  cimrt::tvxSetAllocator(nullptr);
}

}  // namespace
