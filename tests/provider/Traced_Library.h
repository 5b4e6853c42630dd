// The built library with its trace log at the finest level, in the test's root folder.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include "Provider_Fixture.h"

namespace tvx::test {

class Traced_Library : public Provider_Test {
 protected:
  void SetUp() override {
    Provider_Test::SetUp();
    writeFile(".cimrtrc", "LOG_LEVEL = DBG\n");
    setenv("CIMRT_HOME", root.c_str(), 1);
    load();
  }
  void TearDown() override {
    Provider_Test::TearDown();
    unsetenv("CIMRT_HOME");
  }

  /// Level and text of each line that a request writes: "WARN: unknown feature: Class.Name". The
  /// request must answer `expected`, without a message, and leave nothing behind.
  std::vector<std::string> linesOf(const std::function<host::Reply()>& request, int expected) {
    std::filesystem::resize_file(root / ".cimrt/messages", 0);
    last = request();
    EXPECT_EQ(last.status.rc, expected);
    EXPECT_EQ(last.status.message, "");
    EXPECT_FALSE(last.report.leaks()) << last.report.text();
    EXPECT_TRUE(last.report.complaints.empty());
    return lines();
  }
  /// The same without the two lines that every operation writes.
  std::vector<std::string> linesInside(const std::function<host::Reply()>& request, int expected) {
    std::vector<std::string> all = linesOf(request, expected);
    std::erase_if(all, [](const std::string& line) {
      return line.starts_with("DBG: enter: ") || line.starts_with("DBG: return: ");
    });
    return all;
  }

  host::Reply last;  ///< of `linesOf`

 private:
  /// "<date> <LEVEL>: <file>(<line>): <text>" without date and place.
  std::vector<std::string> lines() const {
    std::ifstream file(root / ".cimrt/messages");
    std::vector<std::string> result;
    for (std::string line; std::getline(file, line);) {
      const std::size_t levelEnd = line.find(": ");
      const std::size_t placeEnd = line.find("): ");
      if (levelEnd == std::string::npos || placeEnd == std::string::npos) continue;
      const std::size_t level = line.rfind(' ', levelEnd) + 1;
      result.push_back(line.substr(level, levelEnd + 2 - level) + line.substr(placeEnd + 3));
    }
    return result;
  }
};

}  // namespace tvx::test
