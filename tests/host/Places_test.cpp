#include "cli/Places.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>

#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;

class PlacesTest : public ::testing::Test {
 protected:
  PlacesTest() {
    std::string pattern = testing::TempDir() + "tvxcim-places-XXXXXX";
    m_Folder = mkdtemp(pattern.data());
    setenv("TMPDIR", m_Folder.c_str(), 1);
  }
  ~PlacesTest() override {
    unsetenv("TMPDIR");
    fs::remove_all(m_Folder);
  }

  fs::path m_Folder;
};

TEST_F(PlacesTest, TheProgramsFolderHoldsTheProgram) {
  EXPECT_TRUE(fs::exists(programFolder() / "host_program_test"));
}

TEST_F(PlacesTest, ANamedLibraryHasToBeThere) {
  Options options;
  options.library = m_Folder / "lib.so";
  try {
    findProviderLibrary(options);
    FAIL();
  } catch (const CommandError& error) {
    EXPECT_EQ(error.code(), ExitCode::Library);
    EXPECT_EQ(error.what(), "there is no library '" + options.library + "'; check --lib");
  }
  std::ofstream(options.library) << "x";
  EXPECT_EQ(findProviderLibrary(options), options.library);
}

TEST_F(PlacesTest, ScenariosAreFoundByFileAndUnknownNamesAreRefused) {
  const fs::path file = m_Folder / "mine.json";
  std::ofstream(file) << "{}";
  EXPECT_EQ(findScenario(file), fs::canonical(file));
  try {
    findScenario("no-such-scenario");
    FAIL();
  } catch (const CommandError& error) {
    EXPECT_EQ(error.code(), ExitCode::File);
    EXPECT_NE(std::string(error.what()).find("'no-such-scenario'; give a file, or one of: "),
              std::string::npos);
  }
  EXPECT_THROW(findScenario("no/such/file.json"), CommandError);
  EXPECT_EQ(findScenario(""), findScenario("default"));
}

TEST_F(PlacesTest, ThePrivateRootIsMadeOnceAndClosedToOthers) {
  const fs::path root = privateRoot();
  EXPECT_EQ(root.parent_path(), m_Folder);
  struct stat info {};
  ASSERT_EQ(stat(root.c_str(), &info), 0);
  EXPECT_EQ(info.st_mode & 0777, 0700U);
  EXPECT_TRUE(fs::is_directory(root / "var/log"));
  EXPECT_TRUE(fs::is_directory(root / "etc"));
  EXPECT_EQ(privateRoot(), root);
}

TEST_F(PlacesTest, ARootThatOthersCanOpenIsNotUsed) {
  const fs::path usual = privateRoot();
  chmod(usual.c_str(), 0777);
  EXPECT_NE(privateRoot(), usual);
  fs::remove_all(usual);
  fs::create_directory_symlink("/", usual);
  EXPECT_NE(privateRoot(), usual);
}

}  // namespace
}  // namespace tvx::host
