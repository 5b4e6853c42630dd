// The older library names.
#include <gtest/gtest.h>

#include "access/TVX_Runtime_Loader.h"
#include "support/Log_Capture.h"

namespace {

TEST(Loader_With_Older_Libraries, FindsTheShorterNames) {
  const tvx::test::Log_Capture capture;
  EXPECT_EQ(cimrt::LoadRuntimeLibraries(), 1);
  ASSERT_EQ(capture.lines().size(), 2U);  // HBAAPI.so.2 and liblrmapi.so
  EXPECT_EQ(cimrt::HbaApiUnavailable, 0);
  EXPECT_EQ(cimrt::LrmApiUnavailable, 1);
  EXPECT_EQ(cimrt::RmApiUnavailable, 0);
  EXPECT_EQ(cimrt::HBA_GetNumberOfAdapters(), 3U);
  EXPECT_EQ(cimrt::LRM_InitLib(), 0);
  std::uint32_t status = 0;
  EXPECT_EQ(cimrt::LRM_ChangeWWN(HBA_WWN{{1}}, HBA_WWN{{20}}, HBA_WWN{{100}}, 2, &status), 0);
  EXPECT_EQ(status, 123U);
  EXPECT_EQ(cimrt::UnloadRuntimeLibraries(), 0);
}

}  // namespace
