#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>

#include "common/CLogger.h"
#include "common/TVX_Replace_File.h"
#include "common/TvxConfigFile.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace {

namespace fs = std::filesystem;

using cimrt::Replace_Result;
using cimrt::tvxReplaceFile;

constexpr const char* FILE_NAME = "/etc/some.conf";

/// Runs `work` in a child process without the superuser's rights. Its result, or -1.
template <class Work>
int asNobody(Work work) {
  constexpr uid_t NOBODY = 65534;
  const pid_t child = ::fork();
  if (child == 0) {
    if (::geteuid() == 0 && (::setgid(NOBODY) != 0 || ::setuid(NOBODY) != 0)) ::_exit(120);
    ::_exit(work());
  }
  int status = 0;
  ::waitpid(child, &status, 0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

/// Lets no file of this process grow beyond so many bytes, as a full disk would.
class Full_Disk {
 public:
  explicit Full_Disk(rlim_t bytes) {
    m_Handler = std::signal(SIGXFSZ, SIG_IGN);
    ::getrlimit(RLIMIT_FSIZE, &m_Before);
    const rlimit limit{bytes, m_Before.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &limit);
  }
  ~Full_Disk() {
    ::setrlimit(RLIMIT_FSIZE, &m_Before);
    std::signal(SIGXFSZ, m_Handler);
  }
  Full_Disk(const Full_Disk&) = delete;
  Full_Disk& operator=(const Full_Disk&) = delete;

 private:
  rlimit m_Before{};
  void (*m_Handler)(int) = nullptr;
};

class Replace_File : public testing::Test {
 protected:
  std::string path() const { return root.path(FILE_NAME); }
  std::size_t filesInFolder() const {
    return static_cast<std::size_t>(
        std::distance(fs::directory_iterator(root.path("/etc")), fs::directory_iterator()));
  }
  const tvx::test::Temp_Root root;
};

TEST_F(Replace_File, MakesANewFileWithThePermissions) {
  const mode_t mask = ::umask(0);
  EXPECT_EQ(tvxReplaceFile(path(), "text\n", 0640), Replace_Result::WRITTEN);
  ::umask(mask);
  EXPECT_EQ(root.read(FILE_NAME), "text\n");
  EXPECT_EQ(fs::status(path()).permissions(), fs::perms{0640});
  EXPECT_EQ(filesInFolder(), 1U);
}

TEST_F(Replace_File, KeepsModeOwnerAndLinks) {
  root.write("/var/log/target", "a longer text that was there before");
  fs::permissions(root.path("/var/log/target"), fs::perms{0604});
  if (::geteuid() == 0) {
    ASSERT_EQ(::chown(root.path("/var/log/target").c_str(), 1234, 2345), 0);
  }
  fs::create_symlink("../var/log/target", path());
  EXPECT_EQ(tvxReplaceFile(path(), "new", 0640), Replace_Result::WRITTEN);
  EXPECT_EQ(root.read("/var/log/target"), "new");
  EXPECT_TRUE(fs::is_symlink(path()));
  struct stat info {};
  ASSERT_EQ(::stat(path().c_str(), &info), 0);
  EXPECT_EQ(info.st_mode & 07777, 0604U);
  if (::geteuid() == 0) {
    EXPECT_EQ(info.st_uid, 1234U);
    EXPECT_EQ(info.st_gid, 2345U);
  }
  EXPECT_EQ(filesInFolder(), 1U);
}

TEST_F(Replace_File, AFullDiskLeavesWhatWasThere) {
  root.write(FILE_NAME, "what was there");
  const Full_Disk full(4);
  EXPECT_EQ(tvxReplaceFile(path(), "something new", 0640), Replace_Result::NOT_WRITTEN);
  EXPECT_EQ(root.read(FILE_NAME), "what was there");
  EXPECT_EQ(filesInFolder(), 1U) << "nothing is left beside it";
}

TEST_F(Replace_File, WhatCannotBeOpenedIsTold) {
  EXPECT_EQ(tvxReplaceFile(root.path("/missing/some.conf"), "x", 0640), Replace_Result::NOT_OPENED);
  fs::create_directory(path());
  EXPECT_EQ(tvxReplaceFile(path(), "x", 0640), Replace_Result::NOT_OPENED);
}

TEST_F(Replace_File, ADeviceIsWrittenAsItIs) {
  EXPECT_EQ(tvxReplaceFile("/dev/null", "x", 0640), Replace_Result::WRITTEN);
  EXPECT_EQ(tvxReplaceFile("/dev/full", "x", 0640), Replace_Result::NOT_WRITTEN);
  EXPECT_TRUE(fs::is_character_file("/dev/null"));
}

TEST_F(Replace_File, AFileThatMayNotBeWrittenStays) {
  root.write(FILE_NAME, "read me");
  fs::permissions(path(), fs::perms{0444});
  fs::permissions(root.path(""), fs::perms{0755});
  fs::permissions(root.path("/etc"), fs::perms{0777});
  EXPECT_EQ(asNobody([this] {
              return tvxReplaceFile(path(), "x", 0640) == Replace_Result::NOT_OPENED ? 0 : 1;
            }),
            0);
  EXPECT_EQ(root.read(FILE_NAME), "read me");
}

TEST_F(Replace_File, InAClosedFolderTheFileIsRewrittenInPlace) {
  root.write(FILE_NAME, "what was there");
  fs::permissions(path(), fs::perms{0666});
  fs::permissions(root.path(""), fs::perms{0755});
  fs::permissions(root.path("/etc"), fs::perms{0555});
  EXPECT_EQ(asNobody([this] {
              return tvxReplaceFile(path(), "x", 0640) == Replace_Result::WRITTEN ? 0 : 1;
            }),
            0);
  EXPECT_EQ(root.read(FILE_NAME), "x");
}

TEST_F(Replace_File, InAClosedFolderAFullDiskLeavesWhatWasThere) {
  root.write(FILE_NAME, "what was there");
  fs::permissions(path(), fs::perms{0666});
  fs::permissions(root.path(""), fs::perms{0755});
  fs::permissions(root.path("/etc"), fs::perms{0555});
  EXPECT_EQ(asNobody([this] {
              const Full_Disk full(16);
              return tvxReplaceFile(path(), "something that is longer than that", 0640) ==
                             Replace_Result::NOT_WRITTEN
                         ? 0
                         : 1;
            }),
            0);
  EXPECT_EQ(root.read(FILE_NAME), "what was there");
  fs::permissions(root.path("/etc"), fs::perms{0755});
}

TEST_F(Replace_File, SettingsOutliveAFullDisk) {
  constexpr const char* CONF = "/etc/torvex_fc_provider.conf";
  constexpr const char* SETTINGS = "TVX_PROVIDER_CACHE_TIMEOUT = 17\n# mine\n";
  root.write(CONF, SETTINGS);
  {
    const Full_Disk full(40);
    cimrt::TvxConfigFile config;
    config.load(root.path(CONF).c_str());
    EXPECT_EQ(config.getCacheTimeout(), 17U);
  }
  EXPECT_EQ(root.read(CONF), SETTINGS);
  EXPECT_EQ(filesInFolder(), 1U);
}

TEST_F(Replace_File, AnUnreadableSettingsFileIsLoggedAndStays) {
  constexpr const char* CONF = "/etc/torvex_fc_provider.conf";
  root.write(CONF, "TVX_PROVIDER_CACHE_TIMEOUT = 17\n");
  fs::permissions(root.path(CONF), fs::perms{0000});
  fs::permissions(root.path(""), fs::perms{0755});
  EXPECT_EQ(asNobody([this] {
              tvx::test::Log_Capture capture;
              cimrt::TvxConfigFile config;
              config.load(root.path(CONF).c_str());
              const bool told =
                  capture.has(cimrt::TVX_ERR,
                              "Unable to open provider config setting file - " + root.path(CONF));
              return told && config.getCacheTimeout() == 10 ? 0 : 1;
            }),
            0);
  EXPECT_EQ(root.read(CONF), ::geteuid() == 0 ? "TVX_PROVIDER_CACHE_TIMEOUT = 17\n" : "");
}

TEST_F(Replace_File, AnUnreadableDumpFileIsLogged) {
  constexpr const char* DUMP = "/etc/torvex_fc_provider.dmp";
  root.write(DUMP, "4,5,1\n/nowhere");
  fs::permissions(root.path(DUMP), fs::perms{0000});
  fs::permissions(root.path(""), fs::perms{0755});
  EXPECT_EQ(asNobody([this] {
              tvx::test::Log_Capture capture;
              cimrt::getLogger().loadConfig();
              const bool accessible = cimrt::getLogger().isDumpAccessible();
              const bool told =
                  capture.has(cimrt::TVX_ERR,
                              "Unable to open config data file - " + root.path(DUMP)) &&
                  capture.has(cimrt::TVX_CRIT, "File access failed with Permission denied");
              return told && !accessible && cimrt::getLogger().mode() == 0 ? 0 : 1;
            }),
            0);
}

TEST_F(Replace_File, AnUnreadableWebLaunchFileGivesNoAddress) {
  root.write("/etc/tvx_smis.conf", "https://somewhere\n");
  fs::permissions(root.path("/etc/tvx_smis.conf"), fs::perms{0000});
  fs::permissions(root.path(""), fs::perms{0755});
  EXPECT_EQ(asNobody([this] {
              tvx::test::Log_Capture capture;
              const cimrt::WebLaunchConfig config;
              return config.address().empty() &&
                             capture.has(cimrt::TVX_INFO, "WebLaunch config file '" +
                                                              root.path("/etc/tvx_smis.conf") +
                                                              "' not found.")
                         ? 0
                         : 1;
            }),
            0);
}

}  // namespace
