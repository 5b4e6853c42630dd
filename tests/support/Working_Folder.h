// A working directory of a test's own, and what is left behind.
#pragma once

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace tvx::test {

/// A folder that is the working directory while it lives.
class Working_Folder {
 public:
  Working_Folder() : _before(std::filesystem::current_path()) {
    std::string name = (std::filesystem::temp_directory_path() / "tvx-transfer-XXXXXX").string();
    if (::mkdtemp(name.data()) == nullptr) std::abort();
    _path = name;
    std::filesystem::current_path(_path);
  }
  ~Working_Folder() {
    std::filesystem::current_path(_before);
    std::error_code ignored;
    std::filesystem::remove_all(_path, ignored);
  }
  Working_Folder(const Working_Folder&) = delete;
  Working_Folder& operator=(const Working_Folder&) = delete;

  std::string path(const std::string& name) const { return (_path / name).string(); }
  std::string read(const std::string& name) const {
    std::ostringstream text;
    text << std::ifstream(_path / name, std::ios::binary).rdbuf();
    return text.str();
  }
  void write(const std::string& name, const std::string& content) const {
    std::ofstream(_path / name, std::ios::binary) << content;
  }
  /// Names of the files in it, sorted.
  std::vector<std::string> files() const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(_path))
      names.push_back(entry.path().filename().string());
    std::sort(names.begin(), names.end());
    return names;
  }

 private:
  std::filesystem::path _before;
  std::filesystem::path _path;
};

/// How many descriptors this process has open.
inline std::size_t openDescriptors() {
  std::size_t count = 0;
  for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator("/proc/self/fd"))
    count++;
  return count;
}

}  // namespace tvx::test
