// The present library names.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "access/TVX_Runtime_Loader.h"
#include "support/Log_Capture.h"

namespace {

TEST(Loader_With_Libraries, StubsCallThem) {
  const tvx::test::Log_Capture capture;
  EXPECT_EQ(cimrt::LoadRuntimeLibraries(), 0);
  EXPECT_TRUE(capture.lines().empty());
  EXPECT_NE(cimrt::runtimeLibraryHandle(cimrt::TVX_SLOT_HBAAPI), nullptr);
  EXPECT_NE(cimrt::runtimeLibraryHandle(cimrt::TVX_SLOT_LRMAPI), nullptr);
  EXPECT_EQ(cimrt::runtimeLibraryHandle(cimrt::TVX_SLOT_RMAPI), nullptr);
  EXPECT_EQ(cimrt::LRM_InitLib(), 0);
  std::uint32_t type = 0;
  EXPECT_EQ(cimrt::LRM_GetDriverType(HBA_WWN{{0, 0, 0, 0, 0, 0, 0, 9}}, &type), 0);
  EXPECT_EQ(type, 9U);
  EXPECT_EQ(cimrt::HBA_GetNumberOfAdapters(), 3U);
  cimrt::HBA_CloseAdapter(1);
  EXPECT_EQ(cimrt::LRM_GetWWNCapability(HBA_WWN{}, &type), 1);  // the library has none
  EXPECT_EQ(cimrt::UnloadRuntimeLibraries(), 0);
  EXPECT_TRUE(capture.lines().empty());
}

TEST(Loader_With_Libraries, CanBeLoadedAgain) {
  for (int round = 0; round < 3; ++round) {
    EXPECT_EQ(cimrt::LoadRuntimeLibraries(), 0);
    char version[64] = {};
    EXPECT_EQ(cimrt::RM_MiliVersion(version, sizeof version), 0);
    EXPECT_STREQ(version, "present");
    EXPECT_EQ(cimrt::UnloadRuntimeLibraries(), 0);
    EXPECT_EQ(cimrt::runtimeLibraryHandle(cimrt::TVX_SLOT_LRMAPI), nullptr);
  }
}

TEST(Loader_With_Libraries, StubsMayBeCalledFromManyThreads) {
  ASSERT_EQ(cimrt::LoadRuntimeLibraries(), 0);
  std::vector<std::thread> threads;
  for (std::uint8_t number = 0; number < 4; ++number) {
    threads.emplace_back([number] {
      for (int i = 0; i < 500; ++i) {
        std::uint32_t type = 0;
        EXPECT_EQ(cimrt::LRM_GetDriverType(HBA_WWN{{0, 0, 0, 0, 0, 0, 0, number}}, &type), 0);
        EXPECT_EQ(type, number);
        EXPECT_EQ(cimrt::HBA_GetNumberOfAdapters(), 3U);
        EXPECT_EQ(cimrt::LRM_ResetHBA(HBA_WWN{}, 1), 1);
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(cimrt::UnloadRuntimeLibraries(), 0);
}

}  // namespace
