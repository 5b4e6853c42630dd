// Files that the library writes: who may read them, and what it does not write into.
#include "runtime/Safe_Open.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>

namespace cimrt {
namespace {

namespace fs = std::filesystem;

struct Close {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using Stream = std::unique_ptr<std::FILE, Close>;

/// A folder of its own, and one inside it in which everybody may make files.
class Safe_Open_Test : public testing::Test {
 protected:
  Safe_Open_Test() : _mask(umask(0)) {
    char name[] = "/tmp/safe_open_test.XXXXXX";
    _folder = mkdtemp(name);
    fs::create_directory(shared());
    chmod(shared().c_str(), 01777);
  }
  ~Safe_Open_Test() override {
    umask(_mask);
    fs::remove_all(_folder);
  }

  fs::path own() const { return _folder; }
  fs::path shared() const { return _folder / "shared"; }

  static Stream open(const fs::path& path, const char* mode, mode_t permissions = LOG_PERMISSIONS) {
    return Stream(open_for_writing(path.c_str(), mode, permissions));
  }
  static void write(const fs::path& path, const std::string& text) { std::ofstream(path) << text; }
  static std::string read(const fs::path& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
  }
  static mode_t mode_of(const fs::path& path) {
    struct stat info = {};
    return stat(path.c_str(), &info) == 0 ? info.st_mode & 07777 : 0;
  }

 private:
  mode_t _mask;
  fs::path _folder;
};

TEST_F(Safe_Open_Test, NoOneElseMayWriteWhatItMakesWhateverTheMask) {
  for (const fs::path& folder : {own(), shared()}) {
    ASSERT_TRUE(open(folder / "log", "a"));
    EXPECT_EQ(mode_of(folder / "log"), 0640U);
    ASSERT_TRUE(open(folder / "settings", "w", SETTINGS_PERMISSIONS));
    EXPECT_EQ(mode_of(folder / "settings"), 0644U);
  }
}

TEST_F(Safe_Open_Test, AppendingKeepsAndWritingEmptiesWhatIsThere) {
  for (const fs::path& folder : {own(), shared()}) {
    const fs::path file = folder / "file";
    write(file, "first ");
    std::fputs("second", open(file, "a").get());
    EXPECT_EQ(read(file), "first second");
    std::fputs("third", open(file, "w").get());
    EXPECT_EQ(read(file), "third");
  }
}

TEST_F(Safe_Open_Test, AppendingWithReadingReadsToo) {
  write(own() / "file", "text");
  const Stream stream = open(own() / "file", "a+");
  std::rewind(stream.get());
  EXPECT_EQ(std::fgetc(stream.get()), 't');
}

TEST_F(Safe_Open_Test, ALinkInASharedFolderIsNotFollowed) {
  write(own() / "victim", "kept");
  fs::create_symlink(own() / "victim", shared() / "log");
  for (const char* mode : {"w", "a", "a+"}) {
    errno = 0;
    EXPECT_FALSE(open(shared() / "log", mode)) << mode;
    EXPECT_EQ(errno, ELOOP);
  }
  fs::create_symlink(own() / "none yet", shared() / "dangling");
  EXPECT_FALSE(open(shared() / "dangling", "w"));
  EXPECT_FALSE(fs::exists(own() / "none yet"));
  EXPECT_EQ(read(own() / "victim"), "kept");
}

TEST_F(Safe_Open_Test, ASecondNameInASharedFolderIsNotWritten) {
  write(own() / "victim", "kept");
  fs::create_hard_link(own() / "victim", shared() / "log");
  EXPECT_FALSE(open(shared() / "log", "w"));
  EXPECT_EQ(errno, EPERM);
  EXPECT_EQ(read(own() / "victim"), "kept");
}

TEST_F(Safe_Open_Test, APipeInASharedFolderIsNotWaitedFor) {
  ASSERT_EQ(mkfifo((shared() / "log").c_str(), 0666), 0);
  EXPECT_FALSE(open(shared() / "log", "a"));
  EXPECT_FALSE(open(shared() / "log", "a+"));
}

TEST_F(Safe_Open_Test, AnothersFileInASharedFolderIsNotWritten) {
  const fs::path file = shared() / "log";
  write(file, "theirs");
  if (chown(file.c_str(), 65534, 65534) != 0) {
    EXPECT_NE(geteuid(), 0U) << "only root can give a file away";
    return;
  }
  EXPECT_FALSE(open(file, "w"));
  EXPECT_EQ(errno, EPERM);
  EXPECT_EQ(read(file), "theirs");
}

TEST_F(Safe_Open_Test, ALinkInAFolderOfOnesOwnIsTheOwnersChoice) {
  write(own() / "elsewhere", "");
  fs::create_symlink(own() / "elsewhere", own() / "log");
  std::fputs("line", open(own() / "log", "a").get());
  EXPECT_EQ(read(own() / "elsewhere"), "line");
}

TEST_F(Safe_Open_Test, APipeThatNobodyReadsKeepsNobodyWaiting) {
  ASSERT_EQ(mkfifo((own() / "pipe").c_str(), 0600), 0);
  EXPECT_FALSE(open(own() / "pipe", "w"));
  EXPECT_EQ(errno, ENXIO);
  EXPECT_FALSE(open(own() / "pipe", "a"));
}

TEST_F(Safe_Open_Test, WhatCannotBeOpenedIsNull) {
  EXPECT_FALSE(open(own() / "no such folder" / "log", "a"));
  EXPECT_EQ(errno, ENOENT);
  EXPECT_FALSE(open(own(), "w"));
  EXPECT_EQ(errno, EISDIR);
}

TEST_F(Safe_Open_Test, AFullDeviceIsOpenedAsAnyOther) {
  const Stream full = open("/dev/full", "w");
  ASSERT_TRUE(full) << "a device cannot be emptied, and need not";
  EXPECT_GE(std::fputs("text", full.get()), 0);
  EXPECT_EQ(std::fflush(full.get()), EOF);
}

}  // namespace
}  // namespace cimrt
