// A served host on which every class that can have instances has some.
#pragma once

#include <filesystem>
#include <memory>
#include <string>

#include "Served_Program.h"

namespace tvx::host::test {

/// Runs the built program, strict, on simulated adapters with units of every type, a management
/// page, logs with lines in them, a base profile of the server, and then acts as a client does:
/// runs a diagnostic, switches the driver's log on, marks a unit for optimised access.
class FilledHost {
 public:
  FilledHost();
  ~FilledHost();
  FilledHost(const FilledHost&) = delete;
  FilledHost& operator=(const FilledHost&) = delete;

  /// "127.0.0.1:PORT"; port 0 if the program did not start.
  std::string host() const { return m_Server->host(); }
  /// As ServedProgram::end.
  int end() { return m_Server->end(); }

 private:
  void writeFiles() const;
  void fill() const;
  void runDiagnostic(const std::string& system) const;

  std::filesystem::path m_Folder;
  std::unique_ptr<ServedProgram> m_Server;
};

}  // namespace tvx::host::test
