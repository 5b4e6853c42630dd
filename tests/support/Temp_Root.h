// A directory that stands for the machine's root while a test runs.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <string_view>

namespace tvx::test {

/// Makes the directory with the folders of the fixed paths, points TVX_ROOT at it, and removes both
/// at the end.
class Temp_Root {
 public:
  Temp_Root() {
    std::string name = (std::filesystem::temp_directory_path() / "tvx-test-XXXXXX").string();
    if (::mkdtemp(name.data()) == nullptr) std::abort();
    _path = name;
    for (const char* folder : {"etc", "proc", "var/log", "opt/ibm/platform/log", "tmp"}) {
      std::filesystem::create_directories(_path / folder);
    }
    ::setenv("TVX_ROOT", _path.c_str(), 1);
  }
  ~Temp_Root() {
    ::unsetenv("TVX_ROOT");
    std::error_code ignored;
    std::filesystem::remove_all(_path, ignored);
  }
  Temp_Root(const Temp_Root&) = delete;
  Temp_Root& operator=(const Temp_Root&) = delete;

  /// The real path of a fixed absolute path.
  std::string path(std::string_view absolute) const {
    return _path.string() + std::string(absolute);
  }
  void write(std::string_view absolute, std::string_view contents) const {
    std::ofstream out(path(absolute), std::ios::binary | std::ios::trunc);
    out << contents;
  }
  std::string read(std::string_view absolute) const {
    std::ostringstream text;
    text << std::ifstream(path(absolute), std::ios::binary).rdbuf();
    return text.str();
  }
  bool exists(std::string_view absolute) const { return std::filesystem::exists(path(absolute)); }

 private:
  std::filesystem::path _path;
};

}  // namespace tvx::test
