// The SNIA common library with the simulator as the vendor library under it. This program answers
// the common library's opening of its configuration file with a file of its own.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

#include "sim/Libraries.h"

namespace {

std::string configuration_path;  // NOLINT: read by the C function below

}  // namespace

// Takes the place of the C library's function for everything that this process loads.
extern "C" __attribute__((visibility("default"))) FILE* fopen(const char* path, const char* mode) {
  using Function = FILE*(const char*, const char*);
  static auto* const next = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "fopen"));
  const bool configuration = std::strcmp(path, "/etc/hba.conf") == 0;
  return next(configuration ? configuration_path.c_str() : path, mode);
}

namespace tvx::sim_test {
namespace {

class Common_Library : public ::testing::Test {
 protected:
  Common_Library() {
    configuration_path =
        std::filesystem::temp_directory_path() / ("tvxsim_hba_conf_" + std::to_string(getpid()));
    std::ofstream(configuration_path) << "com.torvex.tvxsim " << TVXSIM_VENDOR << "\n";
    tvxsim_load(TVXSIM_SCENARIOS "/default.json");
  }
  ~Common_Library() override {
    std::filesystem::remove(configuration_path);
    tvxsim_load_text("{}");
  }
};

TEST_F(Common_Library, ShowsTheSimulatedAdapters) {
  const Library common(TVXSIM_COMMON_LIBRARY);
  ASSERT_EQ(SIM_CALL(common, HBA_LoadLibrary), 0u);
  ASSERT_EQ(SIM_CALL(common, HBA_GetNumberOfAdapters), 5u);
  char name[256] = "";
  ASSERT_EQ(SIM_CALL(common, HBA_GetAdapterName, 2u, name), 0u);
  EXPECT_STREQ(name, "Torvex-TVX8102-3");
  const HBA_HANDLE handle = SIM_CALL(common, HBA_OpenAdapter, name);
  ASSERT_NE(handle, 0u);
  HBA_ADAPTERATTRIBUTES adapter{};
  ASSERT_EQ(SIM_CALL(common, HBA_GetAdapterAttributes, handle, &adapter), 0u);
  EXPECT_STREQ(adapter.SerialNumber, "TX48007733");
  HBA_PORTATTRIBUTES port{};
  ASSERT_EQ(SIM_CALL(common, HBA_GetAdapterPortAttributes, handle, 0u, &port), 0u);
  EXPECT_EQ(number(port.PortWWN), 0x10000254560A7E20ULL);
  SIM_CALL(common, HBA_RefreshInformation, handle);
  std::vector<std::uint64_t> rows(1 + 16 * sizeof(HBA_FCPSCSIENTRY) / 8);
  auto* mapping = reinterpret_cast<HBA_FCPTARGETMAPPING*>(rows.data());
  mapping->NumberOfEntries = 16;
  ASSERT_EQ(SIM_CALL(common, HBA_GetFcpTargetMapping, handle, mapping), 0u);
  ASSERT_EQ(mapping->NumberOfEntries, 8u);
  const HBA_FCPID unit = mapping->entry[0].FcpId;
  std::uint8_t response[255] = {};
  std::uint8_t sense[128] = {};
  ASSERT_EQ(SIM_CALL(common, HBA_SendScsiInquiry, handle, unit.PortWWN, unit.FcpLun, 0, 0u,
                     response, 255u, sense, 128u),
            0u);
  EXPECT_EQ(std::memcmp(response + 8, "ACMESTOR", 8), 0);
  ASSERT_EQ(SIM_CALL(common, HBA_SendReadCapacity, handle, unit.PortWWN, unit.FcpLun, response,
                     255u, sense, 128u),
            0u);
  SIM_CALL(common, HBA_CloseAdapter, handle);
  EXPECT_EQ(SIM_CALL(common, HBA_FreeLibrary), 0u);
}

}  // namespace
}  // namespace tvx::sim_test
