// What the built library shows to a loader: how it is hardened, what it needs, what it exports.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <set>
#include <string>

#include "schema/ClassData.h"
#include "tests/support/Elf_File.h"

namespace tvx::test {
namespace {

class Elf_Test : public testing::Test {
 protected:
  Elf_File file{TVX_PROVIDER_LIBRARY};
};

TEST_F(Elf_Test, TheStackIsNotExecutable) {
  const Elf64_Phdr* stack = file.segment(PT_GNU_STACK);
  ASSERT_NE(stack, nullptr) << "without this entry the loader makes the stack executable";
  EXPECT_EQ(stack->p_flags & PF_X, 0U);
}

TEST_F(Elf_Test, NoMemoryIsWrittenAndExecuted) {
  for (const Elf64_Phdr& each : file.segments())
    EXPECT_NE(each.p_flags & (PF_W | PF_X), static_cast<unsigned>(PF_W | PF_X));
}

TEST_F(Elf_Test, CodeIsNotChangedWhenItIsLoaded) {
  EXPECT_TRUE(file.dynamic(DT_TEXTREL).empty());
  for (const Elf64_Xword flags : file.dynamic(DT_FLAGS)) EXPECT_EQ(flags & DF_TEXTREL, 0U);
}

TEST_F(Elf_Test, LibrariesAreFoundAsTheServersOwnAre) {
  EXPECT_TRUE(file.dynamic(DT_RPATH).empty());
  EXPECT_TRUE(file.dynamic(DT_RUNPATH).empty());
}

TEST_F(Elf_Test, OnlyFactoriesAndTheModuleRecordAreExported) {
  std::set<std::string> expected = {"cimrt_module"};
  for (std::size_t i = 0; i < host::allClassCount; ++i) {
    if (!host::allClasses[i].isServed) continue;
    for (const char* kind : {"Instance", "Association", "Method"})
      for (const char* provider : {"", "_Provider"})
        expected.insert(std::string(host::allClasses[i].name) + provider + "_Create_" + kind +
                        "MI");
  }
  std::size_t factories = 0;
  for (const std::string& name : file.symbols(true)) {
    EXPECT_TRUE(expected.count(name)) << name;
    factories += name.find("_Create_") != std::string::npos ? 1 : 0;
  }
  EXPECT_GE(factories, 152U);
}

#ifdef TVX_HARDENED
TEST_F(Elf_Test, RelocatedTablesAreReadOnlyFromTheStart) {
  EXPECT_NE(file.segment(PT_GNU_RELRO), nullptr);
  bool bindsNow = !file.dynamic(DT_BIND_NOW).empty();
  for (const Elf64_Xword flags : file.dynamic(DT_FLAGS)) bindsNow |= (flags & DF_BIND_NOW) != 0;
  EXPECT_TRUE(bindsNow);
}

TEST_F(Elf_Test, StacksAndBuffersAreGuarded) {
  const std::set<std::string> wanted = file.symbols(false);
  EXPECT_TRUE(wanted.count("__stack_chk_fail"));
  EXPECT_TRUE(std::any_of(wanted.begin(), wanted.end(), [](const std::string& name) {
    return name.ends_with("_chk");
  })) << "no call was replaced by its checked form";
}

TEST_F(Elf_Test, NothingButTheSystemsLibrariesIsNeeded) {
  EXPECT_THAT(file.needed(),
              testing::IsSubsetOf({"libstdc++.so.6", "libgcc_s.so.1", "libm.so.6", "libdl.so.2",
                                   "libpthread.so.0", "libc.so.6", "ld-linux-x86-64.so.2"}));
}
#endif

TEST_F(Elf_Test, NobodyElseMayWriteTheLibrary) {
  struct stat info = {};
  ASSERT_EQ(stat(TVX_PROVIDER_LIBRARY, &info), 0);
  EXPECT_EQ(info.st_mode & S_IWOTH, 0U);
}

}  // namespace
}  // namespace tvx::test
