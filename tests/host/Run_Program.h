// Runs a program in a shell and keeps what it prints.
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>

namespace tvx::host::test {

struct Outcome {
  int exitCode;  ///< -1 if a signal ended the program
  std::string out;
  std::string err;
};

inline std::string readAndRemove(const std::string& file) {
  std::ifstream stream(file);
  std::string text((std::istreambuf_iterator<char>(stream)), {});
  unlink(file.c_str());
  return text;
}

inline Outcome runShell(const std::string& command) {
  const std::string base = testing::TempDir() + "tvxcim-run-" + std::to_string(getpid());
  const int status = std::system((command + " >" + base + ".out 2>" + base + ".err").c_str());
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, readAndRemove(base + ".out"),
          readAndRemove(base + ".err")};
}

}  // namespace tvx::host::test
