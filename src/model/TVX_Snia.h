// One open adapter of the SNIA library.
#pragma once

#include <cstdint>
#include <string>

#include "rmapi/rmapi.h"

namespace cimrt {

/// Opens an adapter by name and closes it again. For one thread.
class Snia_Adapter {
 public:
  /// Logs and throws `std::exception` if the adapter can't be opened.
  explicit Snia_Adapter(const std::string& name);
  ~Snia_Adapter();
  Snia_Adapter(const Snia_Adapter&) = delete;
  Snia_Adapter& operator=(const Snia_Adapter&) = delete;

  HBA_HANDLE handle() const { return m_Handle; }

  /// Reads into a zeroed record. Stale data are refreshed and read again once; the last status.
  HBA_STATUS attributes(HBA_ADAPTERATTRIBUTES& record) const;
  HBA_STATUS portAttributes(std::uint32_t index, HBA_PORTATTRIBUTES& record) const;

 private:
  HBA_HANDLE m_Handle = 0;
};

/// The text in a fixed field, up to its NUL or its end.
template <std::size_t N>
std::string fieldText(const char (&field)[N]) {
  std::size_t length = 0;
  while (length < N && field[length] != '\0') ++length;
  return {field, length};
}

/// Turns the 16 digits of a port's name into a WWN; logs and throws `std::exception` if refused.
HBA_WWN portNameToWWN(const std::string& name);

}  // namespace cimrt
