// The methods of the installation service over the simulated libraries: every check in its order,
// every result and text.
#include <dlfcn.h>

#include <thread>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "common/TVX_Memory.h"
#include "services/TVXHBA_SoftwareInstallationService_Provider.h"
#include "services/TVX_SoftwareInstallation.h"
#include "support/Firmware_File.h"
#include "support/Full_Disk.h"
#include "support/Loopback_Servers.h"
#include "support/System_Curl.h"
#include "support/Working_Folder.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

using tvx::test::firmwareImage;
using tvx::test::Full_Disk;
using tvx::test::Http_Server;
using tvx::test::openDescriptors;
using tvx::test::Working_Folder;
using Options = std::vector<std::uint16_t>;
using Texts = std::vector<std::string>;

constexpr const char* FIRST = "10000000000000A1";
constexpr const char* REBOOTING = "10000000000000B1";
constexpr const char* CONVERGED = "TVXUCNA_SoftwareInstallationService";

/// A port that takes firmware at its reset, and one that takes it at the next reboot.
constexpr const char* TWO_PORTS = R"({"cards": [
  {"serial_number": "A", "model": "TVX16002", "firmware_version": "2.01a4",
   "ports": [{"wwpn": "10000000000000A1", "features": {"201": 1, "511": 7}}]},
  {"serial_number": "B", "model": "TVX8102", "firmware_version": "1.12a7",
   "ports": [{"wwpn": "10000000000000B1", "firmware": {"activation": "reboot"}}]}]})";

/// The file that a linker in the middle takes for libcurl; empty: there is none.
std::string& libcurl() {
  static std::string file;
  return file;
}

constexpr TVX_Dl_Operations LINKER = {
    [](const char* file, int mode) -> void* {
      const std::string name = file;
      if (name.find("curl") == std::string::npos) return ::dlopen(file, mode);
      return name == "libcurl.so" && !libcurl().empty() ? ::dlopen(libcurl().c_str(), mode)
                                                        : nullptr;
    },
    [](void* handle, const char* name) { return ::dlsym(handle, name); },
    [](void* handle) { return ::dlclose(handle); },
    []() -> const char* { return ::dlerror(); },
};

void* noMemory(std::size_t) {
  return nullptr;
}

class Installation : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    libcurl().clear();
    setDlOperations(&LINKER);
    useScenario(TWO_PORTS);
    agent = &startAgent();
    refresh(*agent);
    service.reset(clone(agent->m_TVXHBA_SoftwareInstallationService_map[0]));
    target.reset(clone(port(FIRST)));
    folder.write("image.fw", firmwareImage("2.02a1", "TVX16"));
    folder.write("small.fw", firmwareImage("1.13a1", "TVX8"));
    tvxsim_forget_calls();
    log.clear();
  }
  void TearDown() override {
    awaitIdle(*agent);
    Agent_Test::TearDown();
    setDlOperations(nullptr);
    unref(job);
  }

  TVXHBA_FCPort* port(const char* deviceID) const {
    return findByText(agent->m_TVXHBA_FCPort_map, &TVXHBA_FCPort::DeviceID, deviceID);
  }
  std::string onFlash(const char* deviceID) const {
    const TVXHBA_SoftwareIdentity* identity = findByText(
        agent->m_TVXHBA_SoftwareIdentity_map, &TVXHBA_SoftwareIdentity::PortWWN, deviceID);
    return identity ? textOf(identity->FirmwareOnFlash) : "(no identity)";
  }
  void aim(const char* deviceID) { target.reset(clone(port(deviceID))); }
  /// Makes the agent forget its services: then it takes any.
  void forgetServices() {
    Ranked_Lock lock(agent->m_DataMutex);
    agent->m_TVXHBA_SoftwareInstallationService_map.clear();
  }
  std::uint32_t takeResult() {
    EXPECT_FALSE(result.is_null());
    EXPECT_TRUE(isFree(agent->m_DataMutex));
    return result.value;
  }

  static Property<Array<std::uint16_t>> listOf(const Options& options) {
    return {Array<std::uint16_t>(options.data(), options.size()), 0};
  }
  static Property<Array<String>> listOf(const Texts& texts) {
    Property<Array<String>> list{{}, 0};
    for (const std::string& text : texts) list.append(String(text.c_str()));
    return list;
  }

  const CIM_ManagedElement* element() const {
    return static_cast<const CIM_ManagedElement*>(target.get());
  }
  std::uint32_t fromURI(const std::string& uri, const Options& options = {}) {
    result = {0, 1};
    EXPECT_EQ(provider.InstallFromURI(service.get(), job, {String(uri.c_str()), 0}, element(),
                                      listOf(options), listOf(Texts{}), result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t fromBytes(const std::string& bytes, const Options& options, const Texts& values) {
    const auto* data = reinterpret_cast<const std::uint8_t*>(bytes.data());
    result = {0, 1};
    EXPECT_EQ(provider.InstallFromByteStream(service.get(), job,
                                             {Array<std::uint8_t>(data, bytes.size()), 0},
                                             element(), listOf(options), listOf(values), result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  const TVXHBA_FCPort* targetPort() const {
    return static_cast<const TVXHBA_FCPort*>(target.get());
  }
  std::uint32_t reset() {
    result = {0, 1};
    EXPECT_EQ(provider.ResetHBA(service.get(), targetPort(), result), INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t setFEC(const Property<bool>& flag) {
    result = {0, 1};
    EXPECT_EQ(provider.SetFECState(service.get(), targetPort(), flag, result), INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t setEnabled(const Property<bool>& flag) {
    result = {0, 1};
    EXPECT_EQ(provider.SetPortEnabled(service.get(), targetPort(), flag, config, result),
              INVOKE_METHOD_OK);
    return takeResult();
  }
  std::uint32_t getFeatures() {
    result = {0, 1};
    EXPECT_EQ(provider.GetHBAFeatures(service.get(), targetPort(), features, result),
              INVOKE_METHOD_OK);
    return takeResult();
  }

  Working_Folder folder;
  ProviderAgent* agent = nullptr;
  TVXHBA_SoftwareInstallationService_Provider provider;
  Ref<TVXHBA_SoftwareInstallationService> service;
  Ref<Instance> target;
  CIM_ConcreteJob* job = nullptr;
  Property<std::uint32_t> result{0, 1};
  Property<std::uint8_t> config{0, 1};
  Property<Array<std::uint8_t>> features{{}, 1};
};

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

// ---- FirmwareOnFlash ----

TEST_F(Installation, FirmwareOnFlashIsReadAgain) {
  const HBA_WWN wwn = {{0x10, 0, 0, 0, 0, 0, 0, 0xA1}};
  Ranked_Lock lock(agent->m_DataMutex);
  tvxSetAllocator(noMemory);
  EXPECT_EQ(TVX_MethodWrapper::UpdateFirmwareOnFlash(&wwn), 1);
  EXPECT_EQ(log.level("ERROR: GetHBAAttributes: Unable to allocate buffer"), TVX_ERR);
  tvxSetAllocator(nullptr);
  addFault(R"({"call": "LRM_GetHBAAttributes", "status": 12})");
  EXPECT_EQ(TVX_MethodWrapper::UpdateFirmwareOnFlash(&wwn), 1);
  EXPECT_EQ(log.level("ERROR: RM_GetHBAAttributes call failed (12)"), TVX_ERR);
  EXPECT_EQ(onFlash(FIRST), "2.01a4");
  tvxsim_clear_faults();
  addFault(R"({"call": "RM_GetAttributeValue", "status": 13})");
  EXPECT_EQ(TVX_MethodWrapper::UpdateFirmwareOnFlash(&wwn), 0);
  EXPECT_EQ(log.level("ERROR: _FirmwareOnFlash: RM_GetHBAAttributes call failed (13)"), TVX_DBG);
  EXPECT_EQ(onFlash(FIRST), "");
  tvxsim_clear_faults();
  agent->m_TVXHBA_SoftwareIdentity_map.clear();
  EXPECT_EQ(TVX_MethodWrapper::UpdateFirmwareOnFlash(&wwn), 0);
  EXPECT_EQ(TVX_MethodWrapper::UpdateFirmwareOnFlash(nullptr), 1);
  EXPECT_EQ(log.level("INVALID wwpn"), TVX_ERR);
}

// ---- ResetHBA ----

TEST_F(Installation, AResetIsFollowedByARefresh) {
  EXPECT_EQ(fromURI(folder.path("image.fw")), 0u);
  EXPECT_EQ(reset(), 0u);
  awaitIdle(*agent);
  EXPECT_EQ(textOf(port(FIRST)->OperationalFirmware), "2.02a1");
  const Texts texts = {"Entering ResetHBA", "TVX_MethodWrapper::tvxcimReset",
                       "WWN 10:00:00:00:00:00:00:A1 is reset",
                       "TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA for target "
                       "10000000000000A1 is Successful.. Updating the Provider Data",
                       "PERF: ---Created DataFetch_Handler thread -- BuildCimrtInfo END---"};
  EXPECT_EQ(log.only(texts), texts);
  EXPECT_EQ(log.level(texts[3]), TVX_WARN);
}

TEST_F(Installation, AFailedResetIsNotFollowedByOne) {
  addFault(R"({"call": "LRM_ResetHBA", "status": 35})");
  EXPECT_EQ(reset(), 40035u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider::tvxcimResetHBA failed for "
                      "target 10000000000000A1"),
            TVX_ERR);
  EXPECT_FALSE(agent->m_bAdapterRefreshPending);
}

TEST_F(Installation, AResetChecksTheServiceThenTheTarget) {
  const char* const WRONG_PORT =
      "TVXHBA_SoftwareInstallationService_Provider invald port ...return";
  target.reset();
  EXPECT_EQ(reset(), 32968u);
  EXPECT_EQ(log.level(WRONG_PORT), TVX_ERR);
  service->Name.set(CONVERGED);
  EXPECT_EQ(reset(), 33068u);
  forgetServices();
  EXPECT_EQ(reset(), 40002u);
  EXPECT_EQ(log.level("Reset HBA on CNA is not supported"), TVX_ERR);
  service->Name.set("another");
  EXPECT_EQ(reset(), 32968u);
  EXPECT_EQ(log.count(WRONG_PORT), 2u);
  EXPECT_EQ(tvxsim_calls("LRM_ResetHBA", nullptr), 0u);
}

// ---- SetFECState ----

TEST_F(Installation, ErrorCorrectionShowsInThePortAtOnce) {
  EXPECT_EQ(setFEC({true, 0}), 0u);
  EXPECT_EQ(numberOf(port(FIRST)->FECState), 1);
  EXPECT_EQ(setFEC({false, 0}), 0u);
  EXPECT_EQ(numberOf(port(FIRST)->FECState), 0);
  for (const char* text :
       {"TVXHBAA_SoftwareInstallationService_Provider::FCPort found. Target: 10000000000000A1",
        "Input FEC Flag : 1", "Entered SetFECState 10000000000000A1 1", "Input FEC Flag : 0",
        "TVXHBA_SoftwareInstallationService_Provider::SetFECPortState for target 10000000000000A1 "
        "is Successful. "})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Installation, ErrorCorrectionNeedsServicePortAndFlag) {
  const std::int64_t before = numberOf(port(FIRST)->FECState);
  EXPECT_EQ(setFEC({true, 1}), 32968u);
  static_cast<TVXHBA_FCPort*>(target.get())->SystemName.set("another");
  EXPECT_EQ(setFEC({true, 0}), 32968u);
  EXPECT_EQ(log.level("Invalid Port is passed, Cannot Enable/Disable FEC"), TVX_DBG);
  target.reset();
  EXPECT_EQ(setFEC({true, 0}), 32968u);
  EXPECT_EQ(log.level("Target Port is NULL"), TVX_DBG);
  service->Name.set("another");
  EXPECT_EQ(setFEC({true, 0}), 33068u);
  EXPECT_EQ(log.level("Invalid instance of Software Installation Service"), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("LRM_SetAdapterAttribute", nullptr), 0u);
  EXPECT_EQ(numberOf(port(FIRST)->FECState), before);
}

TEST_F(Installation, AFailedErrorCorrectionLeavesThePort) {
  const std::int64_t before = numberOf(port(FIRST)->FECState);
  addFault(R"({"call": "LRM_SetAdapterAttribute", "status": 36})");
  EXPECT_EQ(setFEC({before != 1, 0}), 40036u);
  EXPECT_EQ(numberOf(port(FIRST)->FECState), before);
  const Texts texts = {
      "TVXHBA_SoftwareInstallationService_Provider::SetFECPortState failed for target "
      "10000000000000A1",
      "Status: <36>"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

// ---- SetPortEnabled ----

TEST_F(Installation, EnablingAPortAnswersWhatTheLibrarySays) {
  EXPECT_EQ(setEnabled({false, 0}), 0u);
  EXPECT_EQ(numberOf(config), 5);
  EXPECT_EQ(log.level("Input PortEnable : 0"), TVX_DBG);
  addFault(R"({"call": "LRM_SetPortEnabled", "status": 221})");
  config = {77, 1};
  EXPECT_EQ(setEnabled({true, 0}), 40221u);
  EXPECT_TRUE(config.is_null());
}

TEST_F(Installation, EnablingNeedsServicePortAndFlag) {
  EXPECT_EQ(setEnabled({true, 1}), 32968u);
  static_cast<TVXHBA_FCPort*>(target.get())->DeviceID.set("another");
  EXPECT_EQ(setEnabled({true, 0}), 32968u);
  target.reset();
  EXPECT_EQ(setEnabled({true, 0}), 32968u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider invalid port passed"), TVX_DBG);
  EXPECT_EQ(log.count("TVXHBA_SoftwareInstallationService_Provider invalid port passed"), 2u);
  service->Name.set("another");
  EXPECT_EQ(setEnabled({true, 0}), 33068u);
  EXPECT_EQ(log.level("Invalid instance of Software Installation Service"), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("LRM_SetPortEnabled", nullptr), 0u);
}

// ---- GetHBAFeatures ----

TEST_F(Installation, AllFeaturesAreAppended) {
  features.append(99);
  EXPECT_EQ(getFeatures(), 0u);
  const std::vector<std::uint8_t> bytes = numbersOf(features);
  ASSERT_EQ(bytes.size(), 513u);
  EXPECT_EQ(bytes[0], 99);
  EXPECT_EQ(bytes[1 + 201], 1);
  EXPECT_EQ(bytes[1 + 511], 7);
  EXPECT_EQ(log.level("Entering TVXHBA_SoftwareInstallationService_Provider::GetHBAFeatures"),
            TVX_DBG);
}

TEST_F(Installation, FeaturesNeedServicePortMemoryAndLibrary) {
  addFault(R"({"call": "LRM_GetHBAFeatureList", "status": 37})");
  EXPECT_EQ(getFeatures(), 40037u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider::GetHBAFeatureList failed for "
                      "target 10000000000000A1"),
            TVX_ERR);
  tvxSetAllocator(noMemory);
  EXPECT_EQ(getFeatures(), 32774u);
  EXPECT_EQ(log.level("Unable to allocate the memory for retrieving features. "), TVX_ERR);
  target.reset();
  EXPECT_EQ(getFeatures(), 32968u);
  EXPECT_EQ(log.level("TVXHBA_SoftwareInstallationService_Provider invalid port passed"), TVX_DBG);
  service->Name.set("another");
  EXPECT_EQ(getFeatures(), 33068u);
  EXPECT_EQ(log.level("Invalid instance of UCNA SoftwareInstallation Service"), TVX_DBG);
  EXPECT_TRUE(features.is_null());
}

}  // namespace
}  // namespace cimrt::test
