// A program that serves CIM-XML, run for the length of a test.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

namespace tvx::host::test {

/// Starts `program words... serve --port 0` in a folder of its own and learns its port.
class ServedProgram {
 public:
  explicit ServedProgram(std::vector<std::string> words) {
    std::string pattern = testing::TempDir() + "tvx-client-XXXXXX";
    m_Folder = mkdtemp(pattern.data());
    words.insert(words.end(), {"serve", "--port", "0"});
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) {
      return;
    }
    m_Process = fork();
    if (m_Process == 0) {
      run(words, ends[1]);
    }
    close(ends[1]);
    m_Output = fdopen(ends[0], "r");
    readPort();
  }
  ~ServedProgram() {
    if (m_Process > 0) {
      EXPECT_EQ(end(), 0) << "a signal, a sanitizer or a leak ended it";
    }
    if (m_Output != nullptr) {
      fclose(m_Output);
    }
    std::filesystem::remove_all(m_Folder);
  }
  ServedProgram(const ServedProgram&) = delete;
  ServedProgram& operator=(const ServedProgram&) = delete;

  std::uint16_t port() const { return m_Port; }
  /// "127.0.0.1:PORT".
  std::string host() const { return "127.0.0.1:" + std::to_string(m_Port); }

  /// Ends the program as a person does with Ctrl-C. Its exit status, or -1 if a signal ended it.
  int end() {
    kill(m_Process, SIGINT);
    int status = 0;
    waitpid(m_Process, &status, 0);
    m_Process = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

 private:
  [[noreturn]] void run(const std::vector<std::string>& words, int output) {
    dup2(output, STDOUT_FILENO);
    setenv("TMPDIR", m_Folder.c_str(), 1);
    for (const char* name : {"TVX_ROOT", "TVX_SIM_STATE", "TVX_SIM_SCENARIO"}) {
      unsetenv(name);
    }
    std::vector<char*> arguments;
    for (const std::string& word : words) {
      arguments.push_back(const_cast<char*>(word.c_str()));
    }
    arguments.push_back(nullptr);
    execv(arguments[0], arguments.data());
    _exit(127);
  }

  void readPort() {
    char line[256] = {};
    if (m_Output == nullptr || fgets(line, sizeof line, m_Output) == nullptr) {
      return;
    }
    const std::string text(line);
    const std::size_t colon = text.find(':', text.find("127.0.0.1"));
    if (colon != std::string::npos) {
      m_Port = static_cast<std::uint16_t>(std::strtoul(text.c_str() + colon + 1, nullptr, 10));
    }
  }

  std::filesystem::path m_Folder;
  pid_t m_Process = -1;
  FILE* m_Output = nullptr;
  std::uint16_t m_Port = 0;
};

}  // namespace tvx::host::test
