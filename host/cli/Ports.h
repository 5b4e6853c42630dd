// The `ports` command: FC ports the way a person looks at them.
#pragma once

#include <string>
#include <vector>

#include "Broker.h"

namespace tvx::host {

struct PortRow {
  std::string wwpn;
  std::string adapter;
  std::string model;
  std::string serial;
  std::uint64_t speed = 0;     ///< bits a second, 0 unknown
  std::uint64_t maxSpeed = 0;  ///< the same
  std::string state;
  std::string type;
  std::string fcId;
  std::string fabric;
  std::string firmware;
};

/// Makes the rows out of TVXHBA_FCPort and TVXHBA_Card instances. A port finds its card by the
/// serial number among its identifying information.
std::vector<PortRow> portRows(const std::vector<Instance>& ports,
                              const std::vector<Instance>& cards);

/// "16 Gbit/s", "unknown" for 0.
std::string speedWords(std::uint64_t bitsPerSecond);

/// Words of an OperationalStatus value; "Unknown(n)" for one that has none.
std::string statusWords(std::uint64_t status);

/// Words of a PortType value; "Unknown(n)" for one that has none.
std::string portTypeWords(std::uint64_t type);

/// Sixteen hexadecimal digits in pairs with ':' between them; other texts as they stand.
std::string wwnText(const std::string& text);

std::string portTable(const std::vector<PortRow>& rows);

}  // namespace tvx::host
