// The two ways in which a request fails.
#pragma once

#include <stdexcept>
#include <string>

namespace tvx::host::http {

/// The message is not one that this server can read: answered by an HTTP status and, where
/// `cimError` is not empty, the header field CIMError.
class MessageError : public std::runtime_error {
 public:
  MessageError(unsigned status, std::string cimError, const std::string& text)
      : std::runtime_error(text), m_Status(status), m_CimError(std::move(cimError)) {}

  unsigned status() const { return m_Status; }
  const std::string& cimError() const { return m_CimError; }

 private:
  unsigned m_Status;
  std::string m_CimError;
};

/// The operation cannot be done: answered by an ERROR element with a CIM status code, which is the
/// number of the CMPI return code where both know it.
class CimError : public std::runtime_error {
 public:
  CimError(int code, const std::string& text) : std::runtime_error(text), m_Code(code) {}

  int code() const { return m_Code; }

 private:
  int m_Code;
};

}  // namespace tvx::host::http
