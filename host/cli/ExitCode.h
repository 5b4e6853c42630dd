// What the program's exit status says; the list of the manual page and of --help.
#pragma once

#include <stdexcept>
#include <string>

namespace tvx::host {

enum class ExitCode : int {
  Ok = 0,
  Internal = 1,
  Usage = 2,
  Library = 3,
  UnknownClass = 4,
  UnknownNameSpace = 5,
  NotFound = 6,
  CimError = 7,
  BadArgument = 8,
  MethodResult = 9,
  File = 10,
  Strict = 11,
  TestFailed = 12,
};

struct ExitCodeText {
  ExitCode code;
  const char* text;
};

inline constexpr ExitCodeText exitCodeTexts[] = {
    {ExitCode::Ok, "success"},
    {ExitCode::Internal, "unexpected failure of tvxcim itself"},
    {ExitCode::Usage, "wrong usage of the command line"},
    {ExitCode::Library, "a library cannot be found or loaded"},
    {ExitCode::UnknownClass, "unknown class"},
    {ExitCode::UnknownNameSpace, "unknown namespace"},
    {ExitCode::NotFound, "no such instance, or a path or key that is wrong"},
    {ExitCode::CimError, "another CIM error, told in words"},
    {ExitCode::BadArgument, "unknown method, parameter or property, or a value that does not fit"},
    {ExitCode::MethodResult, "the method ran and its return value is not 0"},
    {ExitCode::File, "a file that was named cannot be read"},
    {ExitCode::Strict, "--strict found an object or memory that leaked"},
    {ExitCode::TestFailed, "a diagnostic test failed, or left no result"},
};

/// Ends a command: the message names the thing and, after it, the remedy.
class CommandError : public std::runtime_error {
 public:
  CommandError(ExitCode code, const std::string& message, int rc = -1)
      : std::runtime_error(message), m_Code(code), m_Rc(rc) {}

  ExitCode code() const { return m_Code; }
  /// CMPI return code behind the error, or -1.
  int rc() const { return m_Rc; }

 private:
  ExitCode m_Code;
  int m_Rc;
};

}  // namespace tvx::host
