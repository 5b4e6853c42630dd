#include "cli/Luns.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>
#include <map>

#include "cli/Table.h"

namespace tvx::host {
namespace {

constexpr std::size_t wwnDigits = 16;

// ---- What the instances say ----

/// Port, target and LUN of a unit as its instances spell them.
using UnitKey = std::string;

/// Key out of "port:target:lun", or empty.
UnitKey endpointKey(const std::string& name) {
  return name.size() == 3 * wwnDigits + 2 ? name : UnitKey();
}

/// The same out of "port_target_identifier_lun", whose identifier has any length.
UnitKey deviceKey(const std::string& id) {
  const std::size_t last = id.rfind('_');
  if (last == std::string::npos || id.size() - last - 1 != wwnDigits || last < 2 * wwnDigits + 1) {
    return {};
  }
  return id.substr(0, wwnDigits) + ":" + id.substr(wwnDigits + 1, wwnDigits) + ":" +
         id.substr(last + 1);
}

std::string trimmed(const std::string& text) {
  const std::size_t end = text.find_last_not_of(' ');
  return end == std::string::npos ? std::string() : text.substr(0, end + 1);
}

std::uint64_t numberOf(const Instance& instance, const char* name) {
  const Value* value = instance.properties.find(name);
  return value == nullptr || value->isNull() ? 0 : value->asUnsigned();
}

std::string firstText(const Instance& instance, const char* name) {
  const Value* value = instance.properties.find(name);
  const bool isThere = value != nullptr && !value->isNull() && !value->elements().empty();
  return isThere ? value->elements().front().display() : std::string();
}

/// The unit's number as the usual forms of addressing tell it.
std::string lunNumber(const std::string& digits) {
  const auto part = [&](std::size_t from, std::size_t count) {
    return std::stoul(digits.substr(from, count), nullptr, 16);
  };
  const bool isHex = digits.find_first_not_of("0123456789ABCDEFabcdef") == std::string::npos;
  if (!isHex || digits.size() != wwnDigits) return digits;
  const bool isSingleLevel = digits.find_first_not_of('0', 4) == std::string::npos;
  if (isSingleLevel && part(0, 2) == 0) return std::to_string(part(2, 2));
  if (isSingleLevel && part(0, 1) >> 2 == 1) return std::to_string(part(0, 4) & 0x3FFF);
  const bool isExtended = digits.find_first_not_of('0', 8) == std::string::npos;
  if (isExtended && part(0, 2) == 0xD2) return std::to_string(part(2, 6));
  return digits;
}

/// Takes vendor, revision and serial number out of "vendor model Revision r Serial Number s". The
/// model, which may hold blanks, is known.
void readDescription(LunRow& row, const std::string& description, const std::string& model) {
  const std::string middle = " " + model + " Revision ";
  const std::string mark = " Serial Number ";
  const std::size_t before = description.find(middle);
  const std::size_t serial =
      before == std::string::npos ? before : description.find(mark, before + middle.size());
  if (serial == std::string::npos) return;
  const std::size_t revision = before + middle.size();
  row.vendor = trimmed(description.substr(0, before));
  row.revision = trimmed(description.substr(revision, serial - revision));
  row.serial = trimmed(description.substr(serial + mark.size()));
}

LunRow endpointRow(const Instance& endpoint, const UnitKey& key) {
  LunRow row;
  row.port = wwnText(key.substr(0, wwnDigits));
  row.target = wwnText(key.substr(wwnDigits + 1, wwnDigits));
  row.lun = lunNumber(key.substr(2 * wwnDigits + 2));
  row.targetId = fmt::format("0x{:06x}", numberOf(endpoint, "FCID"));
  const std::string model = endpoint.text("ElementName");
  row.model = trimmed(model);
  readDescription(row, endpoint.text("Description"), model);
  row.osDevice = firstText(endpoint, "OtherIdentifyingInfo");
  row.answers = row.vendor != "Unknown" || row.model != "Unknown";
  return row;
}

void addDevice(LunRow& row, const Instance& device) {
  row.className = device.path.className;
  row.type = deviceTypeWords(numberOf(device, "DeviceType"));
  const Value* capacity = device.properties.find("Capacity");
  if (capacity != nullptr && !capacity->isNull()) row.capacity = capacity->asUnsigned();
}

// ---- The tree ----

void addLine(std::string& text, std::size_t level, char mark, const std::string& words) {
  text += fmt::format("{:{}}{} {}\n", "", 2 * level, mark, words);
}

std::string unitWords(const LunRow& row) {
  std::string words = "LUN " + row.lun;
  if (!row.type.empty()) words += "  " + row.type;
  words += row.answers ? "  " + row.vendor + " " + row.model : std::string("  no answer");
  if (row.capacity) words += "  " + capacityWords(*row.capacity);
  if (!row.osDevice.empty()) words += "  " + row.osDevice;
  return words;
}

void addTarget(std::string& text, const TargetNode& target) {
  addLine(text, 3, targetMark(target.units),
          fmt::format("target {}  {}", target.wwpn, target.fcId));
  for (const LunRow& unit : target.units) {
    addLine(text, 4, unit.answers ? '+' : '!', unitWords(unit));
  }
}

void addPort(std::string& text, const PortRow& port, const std::vector<LunRow>& rows) {
  addLine(text, 2, portMark(port),
          fmt::format("port {}  {}  {}", port.wwpn, speedWords(port.speed), port.state));
  for (const TargetNode& target : targetNodes(port, rows)) addTarget(text, target);
}

}  // namespace

std::vector<LunRow> lunRows(const std::vector<Instance>& endpoints,
                            const std::vector<Instance>& devices) {
  std::vector<LunRow> rows;
  std::map<UnitKey, std::size_t> places;
  rows.reserve(endpoints.size());
  for (const Instance& endpoint : endpoints) {
    const UnitKey key = endpointKey(endpoint.text("Name"));
    if (key.empty()) continue;
    places[key] = rows.size();
    rows.push_back(endpointRow(endpoint, key));
  }
  for (const Instance& device : devices) {
    const auto place = places.find(deviceKey(device.text("DeviceID")));
    if (place != places.end()) addDevice(rows[place->second], device);
  }
  return rows;
}

std::string deviceTypeWords(std::uint64_t type) {
  constexpr const char* words[] = {
      "disk",    "tape",      "printer", "processor",      "write-once", "CD/DVD",
      "scanner", "optical",   "changer", "communications", nullptr,      nullptr,
      "array",   "enclosure", "disk",    "card reader",    "bridge",     "object storage"};
  const char* const found = type < std::size(words) ? words[type] : nullptr;
  return found != nullptr ? found : fmt::format("type 0x{:02X}", type);
}

std::string capacityWords(std::uint64_t bytes) {
  constexpr const char* units[] = {"B", "KiB", "MiB", "GiB", "TiB", "PiB", "EiB"};
  auto amount = static_cast<double>(bytes);
  std::size_t unit = 0;
  // Rounding must not show 1024 of a unit.
  while (amount >= 1023.5 && unit + 1 < std::size(units)) {
    amount /= 1024;
    unit++;
  }
  const bool isWhole = unit == 0 || amount >= 99.95;
  std::string number = fmt::format("{:.{}f}", amount, isWhole ? 0 : 1);
  if (number.ends_with(".0")) number.resize(number.size() - 2);
  return number + " " + units[unit];
}

std::string lunTable(const std::vector<LunRow>& rows) {
  if (rows.empty()) return "no logical units\n";
  Table table(
      {"PORT", "TARGET", "LUN", "TYPE", "VENDOR", "MODEL", "SERIAL", "CAPACITY", "OS DEVICE"});
  for (const LunRow& row : rows) {
    table.add({row.port, row.target, row.lun, row.type, row.vendor, row.model, row.serial,
               row.capacity ? capacityWords(*row.capacity) : "-", row.osDevice});
  }
  return table.text();
}

std::vector<CardNode> cardNodes(const std::vector<Instance>& ports,
                                const std::vector<Instance>& cards) {
  std::vector<CardNode> nodes;
  for (const Instance& card : cards) {
    nodes.push_back({card.text("Model"), card.text("SerialNumber"), {}});
  }
  CardNode others;
  for (const PortRow& port : portRows(ports, cards)) {
    const auto card = std::find_if(nodes.begin(), nodes.end(), [&](const CardNode& node) {
      return !port.serial.empty() && node.serial == port.serial;
    });
    (card != nodes.end() ? *card : others).ports.push_back(port);
  }
  if (!others.ports.empty()) nodes.push_back(std::move(others));
  return nodes;
}

char portMark(const PortRow& port) {
  if (port.state == "OK" || port.state == "In Service") return '+';
  return port.state == "Unknown" ? '?' : '!';
}

char cardMark(const CardNode& card) {
  const auto has = [&](char mark) {
    return std::any_of(card.ports.begin(), card.ports.end(),
                       [mark](const PortRow& port) { return portMark(port) == mark; });
  };
  if (has('!')) return '!';
  return has('?') || card.ports.empty() ? '?' : '+';
}

char targetMark(const std::vector<LunRow>& units) {
  const bool answers =
      std::any_of(units.begin(), units.end(), [](const LunRow& unit) { return unit.answers; });
  return answers ? '+' : '!';
}

std::vector<TargetNode> targetNodes(const PortRow& port, const std::vector<LunRow>& rows) {
  std::vector<TargetNode> nodes;
  std::map<std::string, std::size_t> places;
  for (const LunRow& row : rows) {
    if (row.port != port.wwpn) continue;
    const auto [place, isNew] = places.try_emplace(row.target, nodes.size());
    if (isNew) nodes.push_back({row.target, row.targetId, {}});
    nodes[place->second].units.push_back(row);
  }
  return nodes;
}

std::string treeText(const std::string& host, const std::vector<CardNode>& cards,
                     const std::vector<LunRow>& rows) {
  std::string text = "host " + (host.empty() ? "(no adapters)" : host) + "\n";
  for (const CardNode& card : cards) {
    const bool isCard = !card.model.empty() || !card.serial.empty();
    addLine(text, 1, cardMark(card),
            isCard ? fmt::format("card {}  {}", card.model, card.serial) : "ports without a card");
    for (const PortRow& port : card.ports) addPort(text, port, rows);
  }
  return text;
}

}  // namespace tvx::host
