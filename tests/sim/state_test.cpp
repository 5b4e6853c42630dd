// What calls changed, found again by the next process.
#include <sys/stat.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <thread>

#include "sim/Libraries.h"
#include "support/Firmware_File.h"

namespace tvx::sim_test {
namespace {

class State : public ::testing::Test {
 protected:
  State() {
    std::string folder = std::filesystem::temp_directory_path() / "tvxsim_state_XXXXXX";
    m_Folder = mkdtemp(folder.data());
    setenv("TVX_SIM_STATE", file().c_str(), 1);
    boot();
  }
  ~State() override {
    unsetenv("TVX_SIM_STATE");
    tvxsim_load_text("{}");
    std::filesystem::remove_all(m_Folder);
  }

  // A new process makes a new world of the same scenario.
  void boot() {
    ASSERT_EQ(tvxsim_load(TVXSIM_SCENARIOS "/default.json"), 0) << tvxsim_last_error();
  }
  std::string file() const { return m_Folder / "state.json"; }

  std::filesystem::path m_Folder;
  Library rm{TVXSIM_LRMAPI};
};

TEST_F(State, NamesAreFoundAgainAfterTheReboot) {
  std::uint32_t status = 0;
  const HBA_WWN fresh = wwn(0x1000025456999999ULL);
  ASSERT_EQ(SIM_CALL(rm, LRM_ChangeWWN, first_port, fresh, wwn(0x2000025456999999ULL), 1u, &status),
            0);
  boot();
  std::uint32_t local = 0;
  SIM_CALL(rm, RM_IsLocalHBA, fresh, &local);
  EXPECT_EQ(local, 1u);
  ASSERT_EQ(SIM_CALL(rm, LRM_RestoreWWN, fresh, 0u, &status), 0);
  boot();
  SIM_CALL(rm, RM_IsLocalHBA, first_port, &local);
  EXPECT_EQ(local, 1u);
}

TEST_F(State, SettingsOfAPortAreFoundAgain) {
  std::uint8_t result = 0;
  const HBA_WWN target = wwn(0x500C0FF12A001001ULL);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetBootBiosState, first_port, 0u), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetPortEnabled, first_port, 0, &result), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetDriverParam, first_port, "unit_queue_depth=77", 0u), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetDriverParam, first_port, "unit_queue_depth=78", 2u), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_GenerateDump, 0, first_port), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetDumpRetentionCount, first_port, 7u), 0);
  ASSERT_EQ(SIM_CALL(rm, LRM_SetOASLunState, first_port, first_port, target, 3ull, 1, 0u), 0);
  std::uint32_t fec = 0;
  ASSERT_EQ(SIM_CALL(rm, LRM_SetAdapterAttribute, first_port, 864u, &fec, 4u), 0);
  boot();
  Block block(rm, 2048);
  ASSERT_EQ(SIM_CALL(rm, LRM_GetPortAttributes, first_port, block.data(), &block.size), 0);
  EXPECT_EQ(block.u32(RM_PA_PORT_STATE), 22u);
  EXPECT_EQ(block.u32(RM_PA_FEC_STATE), 0u);
  std::uint32_t value = 0;
  SIM_CALL(rm, LRM_DiagBeaconState, first_port, &value);
  EXPECT_EQ(value, 3u);
  SIM_CALL(rm, LRM_GetDumpRetentionCount, first_port, &value);
  EXPECT_EQ(value, 7u);
  std::vector<RM_DriverParam> params(32);
  std::uint32_t count = 32;
  SIM_CALL(rm, LRM_GetDriverParams, first_port, params.data(), &count);
  EXPECT_EQ(params[1].current, 77u);
  SIM_CALL(rm, LRM_GetDriverParamsGlobal, first_port, params.data(), &count);
  EXPECT_EQ(params[1].current, 78u);
  std::vector<std::uint64_t> memory(1 + 4 * 32);
  auto* names = reinterpret_cast<RM_DumpFileNames*>(memory.data());
  names->count = 4;
  EXPECT_EQ(SIM_CALL(rm, LRM_GetDumpFileNames, first_port, names), 0);
  EXPECT_EQ(names->count, 1u);
}

TEST_F(State, FirmwareThatRunsIsFoundAgainInTheNamesThatTellItsVersion) {
  const std::string image = m_Folder / "image.fw";
  std::ofstream(image, std::ios::binary) << tvx::test::firmwareImage("2.02a1", "TVX16");
  ASSERT_EQ(SIM_CALL(rm, LRM_DownloadFirmware, first_port, image.c_str(), 0), 0);
  const auto name = [this] {
    Block block(rm);
    EXPECT_EQ(SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size), 0);
    return block.text(RM_HA_NODE_SYMBOLIC_NAME);
  };
  EXPECT_NE(name().find("2.01a4"), std::string::npos) << name();
  boot();
  EXPECT_NE(name().find("2.02a1"), std::string::npos) << name();
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), 0);  // writes the file anew
  boot();
  EXPECT_NE(name().find("2.02a1"), std::string::npos) << name();
}

TEST_F(State, TheFileIsForItsOwnerAlone) {
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), 0);
  struct stat info {};
  ASSERT_EQ(stat(file().c_str(), &info), 0);
  EXPECT_EQ(info.st_mode & 0777, 0600u);
  ASSERT_EQ(chmod(file().c_str(), 0666), 0);
  testing::internal::CaptureStderr();
  boot();
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "tvxsim: " + file() + ": is not a file of this user alone; changes are not kept\n");
  std::uint32_t value = 0;
  SIM_CALL(rm, LRM_DiagBeaconState, first_port, &value);
  EXPECT_EQ(value, 2u);
}

TEST_F(State, AFileThatHoldsNoStateIsLeftAlone) {
  { std::ofstream(file()) << "{\"ports\": 3}"; }
  testing::internal::CaptureStderr();
  boot();
  EXPECT_NE(testing::internal::GetCapturedStderr().find("holds no state"), std::string::npos);
  EXPECT_EQ(SIM_CALL(rm, RM_GetNumberOfLocalAdapters), 5u);
  ASSERT_EQ(SIM_CALL(rm, LRM_DiagBeacon, first_port, 3u), 0);
  EXPECT_EQ(std::filesystem::file_size(file()), 12u);
}

TEST_F(State, CallsFromManyThreadsDoNotDisturbEachOther) {
  unsetenv("TVX_SIM_STATE");
  boot();
  tvxsim_forget_calls();
  const auto work = [this] {
    for (int i = 0; i < 200; ++i) {
      Block block(rm);
      SIM_CALL(rm, LRM_GetHBAAttributes, first_port, block.data(), &block.size);
      SIM_CALL(rm, LRM_DiagBeacon, first_port, 2u + static_cast<std::uint32_t>(i % 2));
      std::uint32_t state = 0;
      SIM_CALL(rm, LRM_DiagBeaconState, first_port, &state);
      if (i % 50 == 0) SIM_CALL(rm, LRM_InitLib);
    }
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) threads.emplace_back(work);
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(tvxsim_calls("LRM_DiagBeacon", "10000254560C4110"), 800u);
}

}  // namespace
}  // namespace tvx::sim_test
