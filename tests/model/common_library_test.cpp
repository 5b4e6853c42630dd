// Discovery through the SNIA common library of the system, with the simulator as the vendor library
// under it. This program answers the opening of the library's configuration file with its own.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "access/TVX_Runtime_Loader.h"
#include "model/TVX_Data.h"
#include "tvxsim/tvxsim.h"

namespace {

std::string configurationPath;

}  // namespace

// Takes the place of the C library's function for everything that this process loads.
extern "C" __attribute__((visibility("default"))) FILE* fopen(const char* path, const char* mode) {
  using Function = FILE*(const char*, const char*);
  static auto* const next = reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, "fopen"));
  return next(std::strcmp(path, "/etc/hba.conf") == 0 ? configurationPath.c_str() : path, mode);
}

namespace cimrt {
namespace {

TEST(Common_Library, CarriesTheDiscovery) {
  configurationPath =
      (std::filesystem::temp_directory_path() / ("tvx-hba-conf-" + std::to_string(::getpid())))
          .string();
  std::ofstream(configurationPath) << "com.torvex.tvxsim " << TVXSIM_VENDOR << "\n";
  ASSERT_EQ(tvxsim_load(TVXSIM_SCENARIOS "/default.json"), 0) << tvxsim_last_error();
  ASSERT_EQ(LoadRuntimeLibraries(), 0);
  ASSERT_EQ(HbaApiUnavailable, 0);
  // It is the common library: it knows a function that the simulator's own library has not.
  EXPECT_NE(::dlsym(runtimeLibraryHandle(TVX_SLOT_HBAAPI), "HBA_GetWrapperLibraryAttributes"),
            nullptr);
  std::vector<std::string> names;
  std::size_t targets = 0;
  {
    Data data;
    data.buildAdapterData();
    data.buildSANData();
    for (Port* port : data.m_Ports) {
      names.push_back(port->m_Name);
      targets += port->getNumberOfTargets();
    }
  }
  EXPECT_THAT(names, testing::ElementsAre("10000254560C4110", "10000254560C4111",
                                          "10000254560A7E20", "10000254560A7E21"));
  EXPECT_GT(targets, 0U);
  EXPECT_EQ(tvxsim_open_handles(), 0U);
  // The provider never asks the common library to let go of its vendor libraries; this test does,
  // so that what the library keeps does not count as lost.
  using Free = HBA_STATUS();
  auto* const freeLibrary =
      reinterpret_cast<Free*>(::dlsym(runtimeLibraryHandle(TVX_SLOT_HBAAPI), "HBA_FreeLibrary"));
  ASSERT_NE(freeLibrary, nullptr);
  EXPECT_EQ(freeLibrary(), 0U);
  UnloadRuntimeLibraries();
  std::filesystem::remove(configurationPath);
}

}  // namespace
}  // namespace cimrt
