#include "cli/Ports.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>

#include "cli/Table.h"

namespace tvx::host {
namespace {

struct Words {
  std::uint64_t value;
  const char* text;
};

constexpr Words statusTable[] = {{0, "Unknown"},
                                 {1, "Other"},
                                 {2, "OK"},
                                 {3, "Degraded"},
                                 {4, "Stressed"},
                                 {5, "Predictive Failure"},
                                 {6, "Error"},
                                 {7, "Non-Recoverable Error"},
                                 {8, "Starting"},
                                 {9, "Stopping"},
                                 {10, "Stopped"},
                                 {11, "In Service"},
                                 {12, "No Contact"},
                                 {13, "Lost Communication"},
                                 {14, "Aborted"},
                                 {15, "Dormant"},
                                 {0x8008, "In Service"},
                                 {0x8014, "Needs Reset"},
                                 {0x8015, "Link Down, Needs Reset"},
                                 {0x8016, "Disabled"}};

constexpr Words typeTable[] = {{0, "Unknown"}, {1, "Other"}, {10, "N"}, {11, "NL"},
                               {12, "F/NL"},   {13, "Nx"},   {14, "E"}, {15, "F"},
                               {16, "FL"},     {17, "B"},    {18, "G"}};

template <std::size_t N>
std::string wordsOf(const Words (&table)[N], std::uint64_t value) {
  for (const Words& each : table) {
    if (each.value == value) {
      return each.text;
    }
  }
  return fmt::format("Unknown({})", value);
}

std::uint64_t numberOf(const Instance& instance, const char* name) {
  const Value* value = instance.properties.find(name);
  return value == nullptr || value->isNull() ? 0 : value->asUnsigned();
}

std::vector<std::string> texts(const Instance& instance, const char* name) {
  std::vector<std::string> result;
  const Value* value = instance.properties.find(name);
  if (value != nullptr && !value->isNull() && value->isArray()) {
    for (const Value& element : value->elements()) {
      result.push_back(element.display());
    }
  }
  return result;
}

/// Entry of the identifying information whose description starts with `what`.
std::string identifying(const Instance& port, const std::string& what) {
  const auto descriptions = texts(port, "IdentifyingDescriptions");
  const auto entries = texts(port, "OtherIdentifyingInfo");
  for (std::size_t i = 0; i < std::min(descriptions.size(), entries.size()); ++i) {
    if (descriptions[i].starts_with(what)) {
      return entries[i];
    }
  }
  return {};
}

const Instance* cardOf(const Instance& port, const std::vector<Instance>& cards) {
  const std::string serial = identifying(port, "SerialNumber");
  for (const Instance& card : cards) {
    const std::string own = card.text("SerialNumber");
    if (!own.empty() && (serial == own || serial.starts_with(own + ":"))) {
      return &card;
    }
  }
  return nullptr;
}

/// The provider's own words if it has some, else those of the status value.
std::string stateOf(const Instance& port) {
  const auto words = texts(port, "StatusDescriptions");
  if (!words.empty() && !words.front().empty()) {
    return words.front();
  }
  const Value* status = port.properties.find("OperationalStatus");
  return status == nullptr || status->isNull() || status->elements().empty()
             ? "Unknown"
             : statusWords(status->elements().front().asUnsigned());
}

std::string typeOf(const Instance& port) {
  const std::string other = port.text("OtherPortType");
  return other.empty() ? portTypeWords(numberOf(port, "PortType")) : other;
}

PortRow rowOf(const Instance& port, const std::vector<Instance>& cards) {
  PortRow row;
  row.wwpn = wwnText(port.text("DeviceID"));
  row.adapter = port.text("AdapterName");
  if (const Instance* card = cardOf(port, cards)) {
    row.model = card->text("Model");
    row.serial = card->text("SerialNumber");
  }
  row.speed = numberOf(port, "Speed");
  row.maxSpeed = numberOf(port, "MaxSpeed");
  row.state = stateOf(port);
  row.type = typeOf(port);
  row.fcId = fmt::format("0x{:06x}", numberOf(port, "FCID"));
  row.fabric = wwnText(port.text("FabricName"));
  row.firmware = port.text("OperationalFirmware");
  return row;
}

}  // namespace

std::string speedWords(std::uint64_t bitsPerSecond) {
  constexpr std::uint64_t giga = 1000000000;
  if (bitsPerSecond == 0) {
    return "unknown";
  }
  return bitsPerSecond % giga == 0 ? fmt::format("{} Gbit/s", bitsPerSecond / giga)
                                   : fmt::format("{} bit/s", bitsPerSecond);
}

std::string statusWords(std::uint64_t status) {
  return wordsOf(statusTable, status);
}

std::string portTypeWords(std::uint64_t type) {
  return wordsOf(typeTable, type);
}

std::string wwnText(const std::string& text) {
  const bool isPlain =
      text.size() == 16 &&
      std::all_of(text.begin(), text.end(), [](unsigned char c) { return std::isxdigit(c) != 0; });
  if (!isPlain) {
    return text;
  }
  std::string result;
  for (std::size_t i = 0; i < text.size(); i += 2) {
    result += (result.empty() ? "" : ":") + text.substr(i, 2);
  }
  return result;
}

std::vector<PortRow> portRows(const std::vector<Instance>& ports,
                              const std::vector<Instance>& cards) {
  std::vector<PortRow> rows;
  rows.reserve(ports.size());
  for (const Instance& port : ports) {
    rows.push_back(rowOf(port, cards));
  }
  return rows;
}

namespace {

/// A port that has not joined a fabric shows the name 0.
std::string fabricText(const std::string& fabric) {
  return fabric.find_first_not_of("0:") == std::string::npos ? "-" : fabric;
}

}  // namespace

std::string portTable(const std::vector<PortRow>& rows) {
  if (rows.empty()) {
    return "no FC ports\n";
  }
  Table table({"WWPN", "MODEL", "SPEED", "STATE", "TYPE", "FC ID", "FABRIC", "FIRMWARE"});
  for (const PortRow& row : rows) {
    table.add({row.wwpn, row.model.empty() ? row.adapter : row.model, speedWords(row.speed),
               row.state, row.type, row.fcId, fabricText(row.fabric), row.firmware});
  }
  return table.text();
}

}  // namespace tvx::host
