// What the built library shows to a loader: how it is hardened, what it needs, what it exports.
#include <elf.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include "schema/ClassData.h"

namespace tvx::test {
namespace {

/// A shared object of this machine's own kind, read as bytes.
class Elf_File {
 public:
  explicit Elf_File(const char* path) {
    std::ifstream stream(path, std::ios::binary);
    m_Bytes.assign(std::istreambuf_iterator<char>(stream), {});
    m_Header = at<Elf64_Ehdr>(0);
    for (std::size_t i = 0; i < m_Header.e_phnum; ++i)
      m_Segments.push_back(at<Elf64_Phdr>(m_Header.e_phoff + i * sizeof(Elf64_Phdr)));
    for (std::size_t i = 0; i < m_Header.e_shnum; ++i)
      m_Sections.push_back(at<Elf64_Shdr>(m_Header.e_shoff + i * sizeof(Elf64_Shdr)));
  }

  const Elf64_Phdr* segment(unsigned type) const {
    const auto found = std::find_if(m_Segments.begin(), m_Segments.end(),
                                    [type](const Elf64_Phdr& each) { return each.p_type == type; });
    return found == m_Segments.end() ? nullptr : &*found;
  }
  const std::vector<Elf64_Phdr>& segments() const { return m_Segments; }

  /// Values of one kind of entry of the dynamic section.
  std::vector<Elf64_Xword> dynamic(Elf64_Sxword tag) const {
    std::vector<Elf64_Xword> values;
    const Elf64_Shdr& section = sectionOf(SHT_DYNAMIC);
    for (std::size_t i = 0; i < section.sh_size / sizeof(Elf64_Dyn); ++i) {
      const auto entry = at<Elf64_Dyn>(section.sh_offset + i * sizeof(Elf64_Dyn));
      if (entry.d_tag == tag) values.push_back(entry.d_un.d_val);
    }
    return values;
  }

  std::set<std::string> needed() const {
    std::set<std::string> names;
    for (const Elf64_Xword offset : dynamic(DT_NEEDED)) names.insert(dynamicText(offset));
    return names;
  }

  /// Names of the dynamic symbols that are defined here, or that are wanted from elsewhere.
  std::set<std::string> symbols(bool defined) const {
    std::set<std::string> names;
    const Elf64_Shdr& section = sectionOf(SHT_DYNSYM);
    for (std::size_t i = 1; i < section.sh_size / sizeof(Elf64_Sym); ++i) {
      const auto symbol = at<Elf64_Sym>(section.sh_offset + i * sizeof(Elf64_Sym));
      if ((symbol.st_shndx != SHN_UNDEF) == defined) names.insert(dynamicText(symbol.st_name));
    }
    return names;
  }

 private:
  template <class T>
  T at(std::size_t offset) const {
    if (offset + sizeof(T) > m_Bytes.size()) throw std::out_of_range("the file is cut off");
    T value;
    std::memcpy(&value, m_Bytes.data() + offset, sizeof value);
    return value;
  }
  const Elf64_Shdr& sectionOf(unsigned type) const {
    const auto found =
        std::find_if(m_Sections.begin(), m_Sections.end(),
                     [type](const Elf64_Shdr& each) { return each.sh_type == type; });
    if (found == m_Sections.end()) throw std::out_of_range("there is no such section");
    return *found;
  }
  std::string dynamicText(std::size_t offset) const {
    const Elf64_Shdr& texts = m_Sections.at(sectionOf(SHT_DYNSYM).sh_link);
    return std::string(m_Bytes.data() + texts.sh_offset + offset);
  }

  std::vector<char> m_Bytes;
  Elf64_Ehdr m_Header{};
  std::vector<Elf64_Phdr> m_Segments;
  std::vector<Elf64_Shdr> m_Sections;
};

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
