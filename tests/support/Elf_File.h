// A shared object of this machine's own kind, read as bytes.
#pragma once

#include <elf.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

namespace tvx::test {

/// Throws std::out_of_range for a file that is cut off or lacks what is asked for.
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

}  // namespace tvx::test
