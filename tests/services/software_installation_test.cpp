// Installing from files, servers and byte streams: every check in its order, every result and text.
#include <thread>

#include "Installation_Test.h"
#include "support/Full_Disk.h"
#include "support/Loopback_Servers.h"
#include "support/System_Curl.h"

namespace cimrt::test {
namespace {

using tvx::test::firmwareImage;
using tvx::test::Full_Disk;
using tvx::test::Http_Server;
using tvx::test::openDescriptors;

// ---- InstallFromURI ----

TEST_F(Installation, ALocalFileIsInstalledAndStays) {
  const std::int64_t before = numberOf(port(FIRST)->FWDownloadStatus);
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
  EXPECT_EQ(onFlash(REBOOTING), "1.12a7");
  EXPECT_EQ(numberOf(port(FIRST)->FWDownloadStatus), before);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
  EXPECT_EQ(log.count("File not found on local file system. Trying libcURL..."), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
  const Texts texts = {"entering InstallFromURI",
                       "Checking the FCPort",
                       "Valid FCPort WWPN Passed",
                       "size of InstallOptions array = 0, first member 0",
                       "File found in local file system.",
                       "filename is : " + folder.path("image.fw"),
                       "entering the tvxcimDownloadFW function",
                       "FC download functionality complete for target 10000000000000A1",
                       "tvxcimDownloadFW: Removing the FW file from CIMOM's repository ",
                       "Entering TVX_MethodWrapper::UpdateFirmwareOnFlash",
                       "_FirmwareOnFlash : [ 2.02a1 ]"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::size_t text : {3U, 8U}) EXPECT_EQ(log.level(texts[text]), TVX_DBG) << texts[text];
  EXPECT_EQ(log.level(texts[4]), TVX_ERR);
  EXPECT_EQ(log.level(texts[7]), TVX_WARN);
}

TEST_F(Installation, AFileUriServesAsWell) {
  EXPECT_EQ(fromURI("file://" + folder.path("image.fw")), 0u);
  EXPECT_EQ(fromURI("file://localhost" + folder.path("image.fw")), 0u);
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
}

TEST_F(Installation, OptionTwoResetsOnceForEachTime) {
  EXPECT_EQ(fromURI(folder.path("image.fw"), {2, 4, 5, 2, 6, 7, 11}), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", FIRST), 2u);
  EXPECT_EQ(log.count("HBA RESET OPTION SELECTED"), 2u);
  EXPECT_EQ(log.count("size of InstallOptions array = 7, first member 2"), 1u);
  EXPECT_EQ(log.level("Fiwmware download functionality complete with Reset on the HBA"), TVX_WARN);
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
  refresh(*agent);
  EXPECT_EQ(textOf(port(FIRST)->OperationalFirmware), "2.02a1");
}

TEST_F(Installation, WithoutAResetTheOldFirmwareRuns) {
  EXPECT_EQ(fromURI(folder.path("image.fw"), {4}), 0u);
  refresh(*agent);
  EXPECT_EQ(textOf(port(FIRST)->OperationalFirmware), "2.01a4");
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
}

TEST_F(Installation, AStrangeOptionIsRefused) {
  for (const Options& options : std::vector<Options>{{0}, {1}, {3}, {2, 8}, {12}, {32768}, {65535}})
    EXPECT_EQ(fromURI(folder.path("image.fw"), options), 5u) << options[0];
  EXPECT_EQ(log.level("invalid value of Install options"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("RM_ImportHBAFileA", nullptr), 0u);
}

TEST_F(Installation, FirmwareThatWaitsForARebootIsASuccessWithoutReset) {
  aim(REBOOTING);
  EXPECT_EQ(fromURI(folder.path("small.fw"), {2}), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
  EXPECT_EQ(numberOf(port(REBOOTING)->FWDownloadStatus), 40247);
  EXPECT_EQ(onFlash(REBOOTING), "1.13a1");
  EXPECT_EQ(log.level("FC Firmware download completed for target 10000000000000B1 Please reboot "
                      "system to activate new firmware."),
            TVX_WARN);
  EXPECT_TRUE(log.count("HBA RESET OPTION SELECTED") == 0);
}

TEST_F(Installation, AFailedDownloadIsNotedInThePort) {
  for (const int status : {148, 149, 150, 17}) {
    tvxsim_clear_faults();
    addFault(R"({"call": "LRM_DownloadFirmware", "status": )" + std::to_string(status) + "}");
    EXPECT_EQ(fromURI(folder.path("image.fw"), {2}), 40000u + static_cast<unsigned>(status));
    EXPECT_EQ(numberOf(port(FIRST)->FWDownloadStatus), 40000 + status);
  }
  EXPECT_EQ(log.level("Error - in the firmware download functionality"), TVX_ERR);
  EXPECT_EQ(log.level("\nERROR: RM_DownloadFirmware: Mailbox busy; retry.\n"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
  EXPECT_EQ(onFlash(FIRST), "2.01a4");
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
}

TEST_F(Installation, WhatIsNoFirmwareForThePortIsRefusedByTheLibrary) {
  folder.write("empty", "");
  folder.write("text", std::string(200, 'x'));
  EXPECT_EQ(fromURI(folder.path("empty")), 40145u);
  EXPECT_EQ(fromURI(folder.path("text")), 40145u);
  EXPECT_EQ(fromURI(folder.path("small.fw")), 40144u);
  EXPECT_EQ(fromURI(folder.path("")), 40026u);  // a folder
  EXPECT_EQ(onFlash(FIRST), "2.01a4");
}

TEST_F(Installation, AFailedResetAnswersItsStatusAndLeavesTheCache) {
  addFault(R"({"call": "LRM_ResetHBA", "status": 33})");
  EXPECT_EQ(fromURI(folder.path("image.fw"), {2, 2}), 40033u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA failed"),
            TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 1u);
  EXPECT_EQ(onFlash(FIRST), "2.01a4");
}

TEST_F(Installation, TheChecksComeInTheirOrder) {
  // Everything is wrong at first; each round puts the next thing right.
  const char* const WRONG_PORT =
      "TVXHBA_SoftwareInstallationService_Provider invald port ...return";
  service->Name.set("another");
  target.reset();
  EXPECT_EQ(fromURI("", {3}), 33068u);
  EXPECT_EQ(log.level("Invalid instance of Software Installation Service"), TVX_ERR);
  service->Name.set(INSTALLATION_SERVICE_NAME);
  EXPECT_EQ(fromURI("", {3}), 4097u);
  EXPECT_EQ(log.level("Target has a null pointer"), TVX_ERR);
  target.reset(clone(static_cast<const Instance*>(service.get())));
  EXPECT_EQ(fromURI("", {3}), 32968u);
  EXPECT_EQ(log.level(WRONG_PORT), TVX_ERR);
  EXPECT_EQ(log.count("Checking the FCPort"), 0u);
  aim(FIRST);
  static_cast<TVXHBA_FCPort*>(target.get())->DeviceID.set("10000000000000FF");
  EXPECT_EQ(fromURI("", {3}), 32968u);
  EXPECT_EQ(log.count(WRONG_PORT), 2u);
  EXPECT_EQ(log.level("Could not find the passed FCPort in the map"), TVX_ERR);
  static_cast<TVXHBA_FCPort*>(target.get())->DeviceID.null = 1;
  EXPECT_EQ(fromURI("", {3}), 32968u);
  aim(FIRST);
  EXPECT_EQ(fromURI("", {3}), 4097u);
  EXPECT_EQ(log.level("Null sized URI..returning"), TVX_ERR);
  EXPECT_EQ(fromURI("gone", {3}), 5u);
  EXPECT_EQ(fromURI("gone"), 4107u);
  EXPECT_EQ(log.level("ERROR: tvxcimDownloadFW: FW file not found"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("RM_ImportHBAFileA", nullptr), 0u);
}

TEST_F(Installation, NullArgumentsAreEmptyOnes) {
  result = {0, 1};
  provider.InstallFromURI(service.get(), job, {String(), 1}, element(), {{}, 1}, {{}, 1}, result);
  EXPECT_EQ(takeResult(), 4097u);
  result = {0, 1};
  provider.InstallFromURI(service.get(), job, {String(folder.path("image.fw").c_str()), 0},
                          element(), {{}, 1}, {{}, 1}, result);
  EXPECT_EQ(takeResult(), 0u);
  result = {0, 1};
  provider.InstallFromByteStream(service.get(), job, {{}, 1}, element(), {{}, 1}, {{}, 1}, result);
  EXPECT_EQ(takeResult(), 5u);
  service.reset();
  EXPECT_EQ(fromURI("x"), 33068u);
  EXPECT_EQ(reset(), 33068u);
  EXPECT_EQ(getFeatures(), 33068u);
}

TEST_F(Installation, APathThatCannotBeLookedAtIsInvalid) {
  EXPECT_EQ(fromURI(std::string(5000, 'x')), 5u);
  EXPECT_EQ(fromURI(folder.path("image.fw/more")), 5u);
  EXPECT_EQ(log.count("ERROR: tvxcimDownloadFW: Can't stat FW file "), 2u);
  EXPECT_EQ(log.level("ERROR: tvxcimDownloadFW: Can't stat FW file "), TVX_ERR);
}

TEST_F(Installation, TheJobIsSetToNull) {
  job = CIM_ConcreteJob::create();
  EXPECT_EQ(fromURI("gone"), 4107u);
  EXPECT_NE(job, nullptr);
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
  EXPECT_EQ(job, nullptr);
  job = CIM_ConcreteJob::create();
  EXPECT_EQ(fromBytes("", {32768}, {"stream.fw"}), 40145u);
  EXPECT_EQ(job, nullptr);
}

TEST_F(Installation, OnlyTheServiceOfThisNameInstalls) {
  forgetServices();
  service->Name.set("tvxhba_FCSOFTWAREInstallationService");
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
  service->Name.set("another");
  EXPECT_EQ(fromURI(folder.path("image.fw")), 4u);
  EXPECT_EQ(fromBytes("x", {32768}, {"stream.fw"}), 4u);
  service->Name.null = 1;
  EXPECT_EQ(fromURI(folder.path("image.fw")), 4u);
  EXPECT_EQ(log.level("Error - The SoftwareInstallationService instance selected is incorrect "),
            TVX_ERR);
}

TEST_F(Installation, APortWhoseNameIsNoneIsNotTouched) {
  {
    Ranked_Lock lock(agent->m_DataMutex);
    port(FIRST)->DeviceID.set("short");
  }
  static_cast<TVXHBA_FCPort*>(target.get())->DeviceID.set("short");
  EXPECT_EQ(fromURI(folder.path("image.fw")), 4097u);
  EXPECT_EQ(fromBytes("x", {32768}, {"stream.fw"}), 4097u);
  EXPECT_EQ(reset(), 32968u);
  EXPECT_EQ(getFeatures(), 32968u);
  EXPECT_EQ(setEnabled({true, 0}), 40001u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider::str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(log.count("TVXHBA_SoftwareInstallationService_Provider::str2HBAName failed"), 4u);
}

TEST_F(Installation, APortThatIsNotLocalIsNotTouched) {
  addFault(R"({"call": "RM_IsLocalHBA", "status": 5})");
  EXPECT_EQ(fromURI(folder.path("image.fw")), 40001u);
  EXPECT_EQ(reset(), 40001u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_DownloadFirmware", nullptr), 0u);
}

// ---- Files from servers ----

class Fetching : public Installation {
 protected:
  static void SetUpTestSuite() { ASSERT_TRUE(tvx::test::keepSystemCurl()); }
  void SetUp() override {
    Installation::SetUp();
    libcurl() = TVX_SYSTEM_CURL;
    server.put("new.fw", firmwareImage("2.02a1", "TVX16", 100'000));
    ::unsetenv("http_proxy");
  }
  Http_Server server;
};

TEST_F(Fetching, AFetchedFileIsInstalledAndRemoved) {
  EXPECT_EQ(fromURI(server.url("new.fw"), {2}), 0u);
  const std::size_t before = openDescriptors();
  EXPECT_EQ(fromURI(server.url("new.fw"), {2}), 0u);
  EXPECT_EQ(openDescriptors(), before);
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
  EXPECT_EQ(log.count("filename is : new.fw"), 2u);
  EXPECT_EQ(log.level("tvxcimDownloadFW: FW file new.fw removed successfully"), TVX_DBG);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
}

TEST_F(Fetching, AFetchedFileStaysWhenItsDownloadFails) {
  addFault(R"({"call": "LRM_DownloadFirmware", "status": 149})");
  EXPECT_EQ(fromURI(server.url("new.fw")), 40149u);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "new.fw", "small.fw"}));
}

TEST_F(Fetching, AFetchedFileGoesWhenItWaitsForAReboot) {
  addFault(R"({"call": "LRM_DownloadFirmware", "status": 247})");
  EXPECT_EQ(fromURI(server.url("new.fw")), 0u);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
}

TEST_F(Fetching, AFetchedFileThatIsGoneIsTold) {
  addFault(R"({"call": "LRM_DownloadFirmware", "status": 247, "delay_ms": 60})");
  std::thread thief([this] {
    while (tvxsim_calls("LRM_DownloadFirmware", nullptr) == 0) std::this_thread::yield();
    std::filesystem::remove(folder.path("new.fw"));
  });
  EXPECT_EQ(fromURI(server.url("new.fw")), 0u);
  thief.join();
  EXPECT_EQ(log.level("tvxcimDownloadFW: Can't stat file new.fw"), TVX_DBG);
}

TEST_F(Fetching, AFailedTransferIsAMissingFile) {
  server.cutAfter = 50;
  EXPECT_EQ(fromURI(server.url("new.fw")), 4107u);
  EXPECT_EQ(log.level("ERROR: CURL returned with Error :18"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("RM_ImportHBAFileA", nullptr), 0u);
  EXPECT_EQ(fromURI("http://127.0.0.1:bad/new.fw"), 4107u);
  EXPECT_EQ(log.level("ERROR: CURL returned with Error :3"), TVX_ERR);
  EXPECT_EQ(fromURI("http://127.0.0.1:1/new.fw"), 4107u);
  EXPECT_EQ(fromURI("file:///no/such/new.fw"), 4107u);
}

TEST_F(Fetching, AFullDiskIsAMissingFile) {
  {
    const Full_Disk disk(8192);
    EXPECT_EQ(fromURI(server.url("new.fw")), 4107u);
  }
  EXPECT_EQ(log.level("ERROR: CURL returned with Error :23"), TVX_ERR);
  EXPECT_EQ(fromURI(server.url("new.fw")), 0u);
}

TEST_F(Fetching, WithoutLibcurlOnlyLocalFilesInstall) {
  libcurl().clear();
  EXPECT_EQ(fromURI(server.url("new.fw")), 4107u);
  EXPECT_EQ(log.level("ERROR: tvxcimDownloadFW: FW file not found"), TVX_ERR);
  EXPECT_EQ(log.count("ERROR: CURL returned with Error :0"), 0u);
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
}

// ---- InstallFromByteStream ----

TEST_F(Installation, AnImageIsWrittenInstalledAndRemoved) {
  const std::size_t before = openDescriptors();
  EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {32768}, {"stream.fw"}), 0u);
  EXPECT_EQ(openDescriptors(), before);
  const Texts texts = {"Entering InstallFromByteStream",
                       "size of InstallOptions array = 1, first member 32768",
                       "filename is : stream.fw",
                       "entering the tvxcimDownloadFW function",
                       "tvxcimDownloadFW: FW file stream.fw removed successfully",
                       "FC download functionality complete for target 10000000000000A1",
                       "PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---"};
  EXPECT_EQ(log.only(texts), texts);
  EXPECT_EQ(log.level(texts[5]), TVX_WARN);
  EXPECT_EQ(log.count("Entering TVX_MethodWrapper::UpdateFirmwareOnFlash"), 0u);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
  awaitIdle(*agent);
  EXPECT_EQ(onFlash(FIRST), "2.02a1");
}

TEST_F(Installation, AnImageWithAResetLeavesTheCacheAlone) {
  EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {2, 32768}, {"", "stream.fw"}), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", FIRST), 1u);
  EXPECT_EQ(log.level("Fiwmware download functionality complete with Reset on the HBA"), TVX_WARN);
  EXPECT_EQ(log.count("PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---"), 0u);
  EXPECT_EQ(onFlash(FIRST), "2.01a4");
}

TEST_F(Installation, TheLaterNameIsTaken) {
  EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {32768, 4, 32768}, {"first", "x", "../second %s"}),
            0u);
  EXPECT_EQ(log.count("filename is : ../second %s"), 1u);
  EXPECT_EQ(log.count("tvxcimDownloadFW: FW file ../second %s removed successfully"), 1u);
}

TEST_F(Installation, AnImageNeedsANameAtTheRightPlace) {
  const std::string empty =
      "InstallOptionsValues is empty. Should have the correct firmware file name. Returning "
      "Invalid Parameter";
  EXPECT_EQ(fromBytes("x", {32768}, {}), 5u);
  EXPECT_EQ(log.level(empty), TVX_ERR);
  EXPECT_EQ(fromBytes("x", {3}, {}), 5u);
  EXPECT_EQ(log.count("invalid value of Install options"), 0u);
  EXPECT_EQ(fromBytes("x", {32768, 3}, {"stream.fw"}), 5u);
  EXPECT_EQ(log.level("invalid value of Install options"), TVX_ERR);
  EXPECT_EQ(fromBytes("x", {2, 4}, {"stream.fw"}), 5u);
  EXPECT_EQ(fromBytes("x", {}, {"stream.fw"}), 5u);
  EXPECT_EQ(log.count("InstallOptions does not have the value 32768"), 2u);
  EXPECT_EQ(log.level("InstallOptions does not have the value 32768"), TVX_ERR);
  EXPECT_EQ(fromBytes("x", {2, 32768}, {"stream.fw"}), 5u);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
}

TEST_F(Installation, AnImageThatCannotBeWrittenFails) {
  for (const std::string name : {"", ".", "..", "/no/such/folder/stream.fw"})
    EXPECT_EQ(fromBytes("x", {32768}, {name}), 4u) << name;
  EXPECT_EQ(log.level("Could not open file to copy the firmware from ByteStream"), TVX_ERR);
  {
    const Full_Disk disk(100);
    EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {32768}, {"stream.fw"}), 4u);
  }
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
  EXPECT_EQ(tvxsim_calls("RM_ImportHBAFileA", nullptr), 0u);
}

TEST_F(Installation, AnEmptyImageIsHandedToTheLibrary) {
  EXPECT_EQ(fromBytes("", {32768}, {"stream.fw"}), 40145u);
  EXPECT_EQ(tvxsim_calls("RM_ImportHBAFileA", nullptr), 1u);
  EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
}

TEST_F(Installation, AFailedDownloadOfAnImageIsNotNotedInThePort) {
  const std::int64_t before = numberOf(port(FIRST)->FWDownloadStatus);
  for (const int status : {148, 247}) {
    tvxsim_clear_faults();
    addFault(R"({"call": "LRM_DownloadFirmware", "status": )" + std::to_string(status) + "}");
    EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {2, 32768}, {"", "stream.fw"}),
              40000u + static_cast<unsigned>(status));
    EXPECT_EQ(folder.files(), (Texts{"image.fw", "small.fw"}));
  }
  EXPECT_EQ(numberOf(port(FIRST)->FWDownloadStatus), before);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
  EXPECT_EQ(log.level("Error - in the firmware download functionality"), TVX_ERR);
}

TEST_F(Installation, AFailedResetAfterAnImageAnswersItsStatus) {
  addFault(R"({"call": "LRM_ResetHBA", "status": 34})");
  EXPECT_EQ(fromBytes(firmwareImage("2.02a1"), {2, 32768}, {"", "stream.fw"}), 40034u);
  EXPECT_EQ(log.count("PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---"), 0u);
}

TEST_F(Installation, TheChecksOfAnImageComeInTheirOrder) {
  service->Name.set("another");
  target.reset();
  EXPECT_EQ(fromBytes("x", {3}, {}), 33068u);
  service->Name.set(INSTALLATION_SERVICE_NAME);
  EXPECT_EQ(fromBytes("x", {3}, {}), 4097u);
  EXPECT_EQ(log.level("Target has a null pointer"), TVX_ERR);
  target.reset(clone(static_cast<const Instance*>(service.get())));
  EXPECT_EQ(fromBytes("x", {3}, {}), 32968u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider::Wrong DeviceID passed"),
            TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test
