// What the installation service does besides installing: every check in its order, every result and
// text.
#include "Installation_Test.h"

namespace cimrt::test {
namespace {

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
