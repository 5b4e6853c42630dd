#include "Scenario.h"

namespace tvx::bench {

std::string manyUnits(std::size_t units, unsigned deviceType) {
  constexpr std::size_t remotePorts = 10;
  const std::string luns = R"(", "luns": {"count": )" + std::to_string(units / remotePorts) +
                           R"(, "blocks": 209715200, "type": )" + std::to_string(deviceType) + "}}";
  std::string targets;
  for (std::size_t i = 0; i < remotePorts; i++) {
    if (i > 0) targets += ",";
    targets += R"({"wwpn": "500C0FF12A00100)" + std::to_string(i) + luns;
  }
  return R"({"cards": [{"model": "TVX16001", "serial_number": "TX52100099", "ports": [
    {"wwpn": "10000254560C3001", "targets": [)" +
         targets + "]}]}]}";
}

}  // namespace tvx::bench
