// Firmware, resets and port settings over scripted management libraries.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>

#include "access/TVX_MethodWrapper.h"
#include "support/Fake_Libraries.h"
#include "support/Log_Capture.h"
#include "support/Working_Folder.h"

namespace cimrt {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using tvx::test::Fake_Libraries;
using tvx::test::Log_Capture;
using tvx::test::Logged;
using tvx::test::Working_Folder;

const HBA_WWN WWN = {{0x10, 0, 0, 0, 0xAB, 0, 0, 0x41}};
constexpr const char* DEVICE = "10000000ab000041";

class Firmware : public testing::Test {
 protected:
  void SetUp() override {
    libraries.load();
    folder.write("image.fw", "firmware");
    libraries.provide(RM_IsLocalHBA, [this](HBA_WWN, std::uint32_t* flag) {
      *flag = local ? 1 : 0;
      return 0;
    });
    libraries.provide(RM_StatusString, [](RM_STATUS status, char* text, std::uint32_t size) {
      std::snprintf(text, size, "text %d", status);
      return 0;
    });
    libraries.provide(RM_ImportHBAFileA, [this](const char* path) {
      calls.push_back(std::string("import ") + path);
      return import;
    });
    libraries.provide(RM_VerifyFirmwareA, [this](int option, HBA_WWN, const char* path) {
      calls.push_back("verify " + std::to_string(option) + " " + path);
      return verify;
    });
    libraries.provide(LRM_DownloadFirmware, [this](HBA_WWN, const char* path, int option) {
      calls.push_back(std::string("download ") + path + " " + std::to_string(option));
      return download;
    });
  }

  /// What was logged after the check of the port.
  std::vector<Logged> told() const {
    std::vector<Logged> lines = capture.lines();
    lines.erase(lines.begin(), lines.begin() + 3);
    return lines;
  }

  Working_Folder folder;
  Fake_Libraries libraries;
  Log_Capture capture;
  std::vector<std::string> calls;
  bool local = true;
  RM_STATUS import = 0;
  RM_STATUS verify = 0;
  RM_STATUS download = 0;
};

TEST_F(Firmware, IsImportedVerifiedAndDownloaded) {
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), 0);
  EXPECT_THAT(calls, ElementsAre("import image.fw", "verify 0 image.fw", "download image.fw 0"));
  EXPECT_EQ(capture.lines()[0], (Logged{5, "entering the tvxcimDownloadFW function"}));
  EXPECT_THAT(told(), ElementsAre(Logged{5, "\n firmware file name \"image.fw\"\n"},
                                  Logged{5, "\n: RM_ImportHBAFile: status = 0"},
                                  Logged{5, "wwpn 10  0  0  0 ab  0  0 41"},
                                  Logged{5, "\n: RM_VerifyFirmware: status = 0"},
                                  Logged{5, "Starting Firmware download"},
                                  Logged{5, "Checking Firmware download status"},
                                  Logged{5, "\nERROR: RM_DownloadFirmware: status = 0"},
                                  Logged{5, "Status: <0>:text 0"}));
}

TEST_F(Firmware, AFailedImportEndsIt) {
  import = 26;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), 26);
  EXPECT_EQ(calls.size(), 1u);
  EXPECT_TRUE(capture.has(5, "\n: RM_ImportHBAFile: status = 26"));
  EXPECT_TRUE(capture.has(5, "Status: <26>:text 26"));
}

TEST_F(Firmware, AFailedVerificationEndsIt) {
  verify = 144;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), 144);
  EXPECT_EQ(calls.size(), 2u);
  EXPECT_TRUE(capture.has(5, "\n: RM_VerifyFirmware: status = 144"));
  EXPECT_TRUE(capture.has(5, "Status: <144>:text 144"));
}

TEST_F(Firmware, EachStatusOfADownloadHasItsText) {
  const struct {
    RM_STATUS status;
    Logged line;
  } rows[] = {
      {148, {3, "\nERROR: RM_DownloadFirmware: Mailbox failed; Internal Driver Error.\n"}},
      {149, {3, "\nERROR: RM_DownloadFirmware: Mailbox timed out.\n"}},
      {150, {3, "\nERROR: RM_DownloadFirmware: Mailbox busy; retry.\n"}},
      {247, {5, "\nERROR: RM_DownloadFirmware: status = 247"}},
      {1, {5, "\nERROR: RM_DownloadFirmware: status = 1"}},
      {-2147483647 - 1, {5, "\nERROR: RM_DownloadFirmware: status = -2147483648"}},
  };
  for (const auto& row : rows) {
    capture.forget();
    download = row.status;
    EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), row.status);
    EXPECT_TRUE(capture.has(row.line.level, row.line.text)) << row.line.text;
  }
}

TEST_F(Firmware, AFileThatIsNotThereEndsIt) {
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "gone.fw"), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, nullptr), 1);
  EXPECT_EQ(capture.count(3, "\nERROR: tvxcimDownloadFW: FW file not found"), 2u);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw/more"), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, std::string(5000, 'x').c_str()), 1);
  EXPECT_EQ(capture.count(3, "\nERROR: tvxcimDownloadFW: Can't stat FW file"), 2u);
  EXPECT_THAT(calls, IsEmpty());
}

TEST_F(Firmware, OnlyLocalPortsAreTouched) {
  local = false;
  bool reset = false;
  libraries.provide(LRM_ResetHBA, [&](HBA_WWN, int) {
    reset = true;
    return 0;
  });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(nullptr, "image.fw"), 1);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimReset(&WWN), 1);
  EXPECT_EQ(capture.count(3, "INVALID wwpn"), 3u);
  EXPECT_THAT(calls, IsEmpty());
  EXPECT_FALSE(reset);
}

TEST_F(Firmware, ALibraryWithoutTheFunctionsFails) {
  for (const char* name : {"RM_ImportHBAFileA", "RM_StatusString"}) libraries.remove(name);
  EXPECT_EQ(TVX_MethodWrapper::tvxcimDownloadFW(&WWN, "image.fw"), 1);
  EXPECT_TRUE(capture.has(5, "Status: <1>"));
  EXPECT_EQ(TVX_MethodWrapper::tvxcimReset(&WWN), 1);
}

TEST_F(Firmware, AResetNamesThePort) {
  RM_STATUS status = 0;
  libraries.provide(LRM_ResetHBA, [&](HBA_WWN wwpn, int mode) {
    EXPECT_EQ(wwpn.wwn[7], 0x41);
    EXPECT_EQ(mode, 1);
    return status;
  });
  EXPECT_EQ(TVX_MethodWrapper::tvxcimReset(&WWN), 0);
  EXPECT_EQ(capture.lines()[0], (Logged{5, "TVX_MethodWrapper::tvxcimReset"}));
  EXPECT_THAT(told(), ElementsAre(Logged{2, "WWN 10:00:00:00:AB:00:00:41 is reset"}));
  status = 9;
  EXPECT_EQ(TVX_MethodWrapper::tvxcimReset(&WWN), 9);
  EXPECT_TRUE(capture.has(5, "Status: <9>:text 9"));
  EXPECT_EQ(capture.count(2, "WWN 10:00:00:00:AB:00:00:41 is reset"), 1u);
}

TEST_F(Firmware, ErrorCorrectionIsANumberOfFourBytes) {
  int seen = -1;
  libraries.provide(LRM_SetAdapterAttribute, [&](HBA_WWN wwpn, std::uint32_t attribute,
                                                 const void* value, std::uint32_t size) {
    EXPECT_EQ(wwpn.wwn[4], 0xAB);
    EXPECT_EQ(attribute, 864u);
    EXPECT_EQ(size, 4u);
    std::memcpy(&seen, value, sizeof seen);
    return 17;
  });
  EXPECT_EQ(TVX_MethodWrapper::SetFECState(DEVICE, true), 17);
  EXPECT_EQ(seen, 1);
  EXPECT_EQ(TVX_MethodWrapper::SetFECState(DEVICE, false), 17);
  EXPECT_EQ(seen, 0);
  EXPECT_TRUE(capture.has(5, std::string("Entered SetFECState ") + DEVICE + " 1"));
  EXPECT_EQ(TVX_MethodWrapper::SetFECState("no id", true), 1);
  EXPECT_EQ(TVX_MethodWrapper::SetFECState(nullptr, true), 1);
  EXPECT_TRUE(capture.has(3, "str2HBAName failed"));
  EXPECT_TRUE(capture.has(3, "Id2HBAName failed"));
}

TEST_F(Firmware, EnablingAPortTellsWhenItWaitsForAReset) {
  RM_STATUS status = 0;
  std::uint8_t answer = 5;
  libraries.provide(LRM_SetPortEnabled, [&](HBA_WWN, std::uint8_t enable, std::uint8_t* config) {
    EXPECT_EQ(enable, 1);
    *config = answer;
    return status;
  });
  std::uint8_t config = 99;
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled(DEVICE, true, &config), 0);
  EXPECT_EQ(config, 5);
  const std::vector<std::string> texts = {
      std::string("Entered SetPortEnabled ") + DEVICE + " 1", "Invoking RM_SetPortEnabled API ",
      " SetPortEnabled RM Status: 0", "Please reset the HBA to activate the new setting",
      "Exiting SetPortEnabled function call. Dynamic value\t: 5"};
  for (const std::string& text : texts) EXPECT_TRUE(capture.has(5, text)) << text;
  answer = 0;
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled(DEVICE, true, &config), 0);
  EXPECT_EQ(config, 0);
  EXPECT_EQ(capture.count(5, texts[3]), 1u);

  config = 99;
  status = 221;
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled(DEVICE, true, &config), 221);
  EXPECT_TRUE(capture.has(5, "SetPortEnabled::One or more port Functions have Boot Code enabled"));
  EXPECT_TRUE(capture.has(5, "Please disable boot Code and try again"));
  EXPECT_FALSE(capture.has(5, "RM_SetPortEnabled() Failed."));
  status = 3;
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled(DEVICE, true, &config), 3);
  EXPECT_TRUE(capture.has(5, "RM_SetPortEnabled() Failed."));
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled("1000", true, &config), 1);
  EXPECT_EQ(TVX_MethodWrapper::SetPortEnabled(DEVICE, true, nullptr), 4);
  EXPECT_EQ(config, 99);
}

}  // namespace
}  // namespace cimrt
