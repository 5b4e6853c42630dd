// Load, serve, clean up, unload and load again, in one process.
#include <chrono>
#include <thread>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using Lifecycle = Provider_Test;

TEST_F(Lifecycle, LibraryServesAndLeavesAgainAndAgain) {
  for (int life = 0; life < 3; life++) {
    load();
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
    EXPECT_EQ(instances("TVXHBA_Card").size(), 2u);
    EXPECT_EQ(broker->unload().rc, CMPI_RC_OK);
    EXPECT_FALSE(broker->stillMapped(TVX_PROVIDER_LIBRARY)) << "life " << life;
    broker.reset();
  }
  EXPECT_EQ(tvxsim_open_handles(), 0u);
}

TEST_F(Lifecycle, ClassesComeAndGoWhileOthersStay) {
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
  EXPECT_EQ(instances("TVXHBA_Card").size(), 2u);
  EXPECT_EQ(broker->cleanup("TVXHBA_FCPort", host::InterfaceKind::Instance, false).rc, CMPI_RC_OK);
  const unsigned long calls = tvxsim_calls("LRM_InitLib", nullptr);
  EXPECT_EQ(instances("TVXHBA_Card").size(), 2u);
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
  EXPECT_EQ(tvxsim_calls("LRM_InitLib", nullptr), calls) << "the agent stayed all the time";
}

TEST_F(Lifecycle, UnloadRightBehindAReadJoinsTheRefresh) {
  for (int life = 0; life < 3; life++) {
    useScenario();
    // The reader has its answer when the adapter maps are ready; the scan of the SAN goes on.
    addFault(R"({"call": "HBA_GetFcpTargetMapping", "delay_ms": 5})");
    load();
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
    unload();
    EXPECT_EQ(tvxsim_open_handles(), 0u);
  }
}

TEST_F(Lifecycle, UnloadInTheMiddleOfARefreshWaitsForIt) {
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
  while (tvxsim_calls("HBA_SendReadCapacity", nullptr) == 0) std::this_thread::yield();
  unload();

  // The scan has sent its first inquiry and waits for the answer when the library is taken down.
  useScenario();
  addFault(R"({"call": "HBA_SendScsiInquiry", "nth": 1, "delay_ms": 30})");
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
  while (tvxsim_calls("HBA_SendScsiInquiry", nullptr) == 0) std::this_thread::yield();
  ASSERT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), 0u) << "the scan has just begun";
  unload();
  EXPECT_GT(tvxsim_calls("HBA_SendReadCapacity", nullptr), 0u) << "the scan was finished";
  EXPECT_EQ(tvxsim_open_handles(), 0u);
}

TEST_F(Lifecycle, UnloadInTheMiddleOfALongScanDoesNotWaitForItsEnd) {
  useScenario(R"({"cards": [{"model": "TVX1", "serial_number": "SN1", "ports": [
    {"wwpn": "10:00:02:54:56:0C:30:01", "targets": [{"wwpn": "50:0C:0F:F1:2A:00:10:01",
     "luns": {"count": 100000}}]}]}]})");
  addFault(R"({"call": ["HBA_SendScsiInquiry", "HBA_SendReadCapacity"], "delay_ms": 1})");
  tvxsim_forget_calls();
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 1u);
  while (tvxsim_calls("HBA_SendReadCapacity", nullptr) < 5) std::this_thread::yield();
  unload();
  const unsigned long scanned = tvxsim_calls("HBA_SendReadCapacity", nullptr);
  EXPECT_LT(scanned, 10'000u) << "at four commands of a millisecond a unit, all take minutes";
  EXPECT_EQ(tvxsim_open_handles(), 0u);
  std::this_thread::sleep_for(std::chrono::milliseconds(5));
  EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), scanned) << "nobody scans any more";

  // The next life is a whole one.
  useScenario();
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
  EXPECT_FALSE(instances("TVXHBA_StorageVolume").empty());
}

TEST_F(Lifecycle, RefusedInitialisationAnswersEveryClassEmpty) {
  addFault(R"({"call": "LRM_InitLib", "status": 1})");
  load();
  for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card", "TVXHBA_StorageVolume"})
    EXPECT_TRUE(instances(name).empty()) << name;
  unload();
  // The next life is a healthy one.
  useScenario();
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
}

TEST_F(Lifecycle, SettingsFileIsMadeAtUnload) {
  load();
  instances("TVXHBA_Card");
  EXPECT_FALSE(std::filesystem::exists(root / "etc/torvex_fc_provider.conf"));
  unload();
  EXPECT_TRUE(std::filesystem::exists(root / "etc/torvex_fc_provider.conf"));
}

}  // namespace
}  // namespace tvx::test
