// The built tvxcim with the built provider over simulated adapters, in a folder of its own.
#pragma once

#include <algorithm>
#include <filesystem>
#include <string>

#include "Run_Program.h"

namespace tvx::host::test {

/// Fixture: what one command changes in a scenario, the next command of the same test finds.
class Simulated_Program : public ::testing::Test {
 protected:
  Simulated_Program() {
    std::string pattern = testing::TempDir() + "tvxcim-sim-XXXXXX";
    m_Temporary = mkdtemp(pattern.data());
  }
  ~Simulated_Program() override { std::filesystem::remove_all(m_Temporary); }

  /// Runs `tvxcim words`; `environment` is put before it as for env(1).
  Outcome run(const std::string& words, const std::string& environment = "") {
    return runShell("env -u TVX_ROOT -u TVX_SIM_STATE -u TVX_SIM_SCENARIO TMPDIR=" +
                    m_Temporary.string() + " " + environment + " " TVXCIM " " + words);
  }

  static std::size_t lines(const std::string& text) {
    return static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
  }

  std::filesystem::path m_Temporary;
};

}  // namespace tvx::host::test
