// The program brings its own statvfs, so that the root can be read-only or unreadable.
#include <gtest/gtest.h>
#include <sys/statvfs.h>

#include <cerrno>
#include <string>

#include "common/CLogger.h"
#include "common/TVX_Common.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace {

int calls = 0;
bool fails = true;
std::string asked;

}  // namespace

extern "C" int statvfs(const char* path, struct statvfs* info) noexcept {
  ++calls;
  asked = path;
  if (fails) {
    errno = EIO;
    return -1;
  }
  *info = {};
  info->f_flag = ST_RDONLY;
  return 0;
}

namespace {

TEST(Read_Only_Root, IsAskedUntilAnAnswerComesAndMovesTheDumpFile) {
  const tvx::test::Temp_Root root;
  const tvx::test::Log_Capture capture;
  EXPECT_FALSE(cimrt::IsReadOnlyFS());
  EXPECT_TRUE(capture.has(cimrt::TVX_DBG, " Inside IsReadOnlyFS()"));
  EXPECT_EQ(asked, root.path("/"));
  EXPECT_FALSE(cimrt::IsReadOnlyFS());
  EXPECT_EQ(calls, 2);

  fails = false;
  EXPECT_TRUE(cimrt::IsReadOnlyFS());
  EXPECT_EQ(calls, 3);
  fails = true;  // the answer is kept
  EXPECT_TRUE(cimrt::IsReadOnlyFS());
  EXPECT_EQ(calls, 3);

  EXPECT_EQ(cimrt::getLogger().dumpPath(), "/var/log/torvex_fc_provider.dmp");
  cimrt::getLogger().writeDump();
  EXPECT_EQ(root.read("/var/log/torvex_fc_provider.dmp"), "0,0,1\n");
  EXPECT_FALSE(root.exists("/etc/torvex_fc_provider.dmp"));
}

}  // namespace
