// No management library on the machine.
#include <gtest/gtest.h>

#include <string>

#include "access/TVX_Runtime_Loader.h"
#include "support/Log_Capture.h"

namespace {

TEST(Loader_Without_Libraries, EveryStubTakesItsMissingPath) {
  const tvx::test::Log_Capture capture;
  EXPECT_EQ(cimrt::LoadRuntimeLibraries(), 0);
  EXPECT_EQ(cimrt::HbaApiUnavailable, 1);
  EXPECT_EQ(cimrt::LrmApiUnavailable, 1);
  EXPECT_EQ(cimrt::RmApiUnavailable, 1);
  EXPECT_EQ(capture.lines().size(), 4U);
  for (const auto& line : capture.lines()) {
    EXPECT_EQ(line.level, cimrt::TVX_ERR);
    EXPECT_TRUE(line.text.starts_with("dlopen failed :")) << line.text;
    EXPECT_GT(line.text.size(), std::string("dlopen failed :").size());
  }
  EXPECT_EQ(cimrt::LRM_InitLib(), 1);
  EXPECT_EQ(cimrt::HBA_GetNumberOfAdapters(), 0U);
  EXPECT_EQ(cimrt::RM_GetAttributeValue(nullptr, 0, nullptr, nullptr), nullptr);
  EXPECT_EQ(cimrt::UnloadRuntimeLibraries(), 0);
}

}  // namespace
