// A root folder for the provider's files, with a firmware image to install.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

#ifdef TVX_SYSTEM_CURL
#include "tests/support/System_Curl.h"
#endif

namespace tvx::test {

/// While it lives, TVX_ROOT names it. One at a time, made before there are threads.
class Trial_Root {
 public:
  Trial_Root() {
    std::string name = (std::filesystem::temp_directory_path() / "tvx_fault_XXXXXX").string();
    if (mkdtemp(name.data()) == nullptr) std::abort();
    m_Path = name;
    for (const char* folder : {"etc", "opt/ibm/platform/log", "tmp", "var/log", "files"})
      std::filesystem::create_directories(m_Path / folder);
    std::filesystem::copy_file(TVX_MATRIX_FIRMWARE, m_Path / "files/firmware.img");
    setenv("TVX_ROOT", m_Path.c_str(), 1);
#ifdef TVX_SYSTEM_CURL
    if (!keepSystemCurl()) std::abort();
#endif
  }
  ~Trial_Root() {
    std::filesystem::remove_all(m_Path);
  }
  Trial_Root(const Trial_Root&) = delete;
  Trial_Root& operator=(const Trial_Root&) = delete;

  /// Folder for the files that methods read and write.
  std::string files() const {
    return m_Path / "files";
  }

 private:
  std::filesystem::path m_Path;
};

}  // namespace tvx::test
