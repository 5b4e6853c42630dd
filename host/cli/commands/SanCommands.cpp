// `luns` and `tree`: what lies behind the ports.
#include <CLI/CLI.hpp>
#include <iterator>
#include <memory>

#include "cli/Luns.h"
#include "cli/Output.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

/// Classes that a logical unit can be an instance of.
constexpr const char* deviceClasses[] = {"TVXHBA_StorageVolume", "TVXHBA_TapeDrive",
                                         "TVXHBA_StorageExtent", "TVXHBA_LogicalDisk",
                                         "TVXHBA_SCSIArbitraryLogicalUnit"};

std::vector<LunRow> allRows(Session& session) {
  std::vector<Instance> devices;
  for (const char* name : deviceClasses) {
    std::vector<Instance> some = instancesOf(session, name);
    devices.insert(devices.end(), std::make_move_iterator(some.begin()),
                   std::make_move_iterator(some.end()));
  }
  return lunRows(instancesOf(session, "TVXHBA_SCSIProtocolEndpoint"), devices);
}

Json lunJson(const LunRow& row) {
  return {{"port", row.port},
          {"target", row.target},
          {"targetFcId", row.targetId},
          {"lun", row.lun},
          {"class", row.className},
          {"type", row.type},
          {"vendor", row.vendor},
          {"model", row.model},
          {"revision", row.revision},
          {"serialNumber", row.serial},
          {"capacity", row.capacity ? Json(*row.capacity) : Json()},
          {"osDevice", row.osDevice},
          {"answers", row.answers}};
}

Json lunsJson(const std::vector<LunRow>& rows) {
  Json list = Json::array();
  for (const LunRow& row : rows) list.push_back(lunJson(row));
  return list;
}

// ---- luns ----

ExitCode listLuns(Session& session, const std::string& portName) {
  std::string port;
  if (!portName.empty()) port = wwnText(findPort(session, portName).text("DeviceID"));
  std::vector<LunRow> rows = allRows(session);
  if (!port.empty()) std::erase_if(rows, [&](const LunRow& row) { return row.port != port; });
  if (session.options().format == Format::Json) {
    printJson(session, "luns", lunsJson(rows));
  } else {
    session.out() << lunTable(rows);
  }
  return ExitCode::Ok;
}

// ---- tree ----

Json targetJson(const TargetNode& target) {
  return {{"wwpn", target.wwpn},
          {"fcId", target.fcId},
          {"mark", std::string(1, targetMark(target.units))},
          {"luns", lunsJson(target.units)}};
}

Json portJson(const PortRow& port, const std::vector<LunRow>& rows) {
  Json targets = Json::array();
  for (const TargetNode& target : targetNodes(port, rows)) targets.push_back(targetJson(target));
  return {{"wwpn", port.wwpn},
          {"speed", port.speed},
          {"state", port.state},
          {"mark", std::string(1, portMark(port))},
          {"targets", std::move(targets)}};
}

Json cardJson(const CardNode& card, const std::vector<LunRow>& rows) {
  Json ports = Json::array();
  for (const PortRow& port : card.ports) ports.push_back(portJson(port, rows));
  return {{"model", card.model},
          {"serialNumber", card.serial},
          {"mark", std::string(1, cardMark(card))},
          {"ports", std::move(ports)}};
}

ExitCode showTree(Session& session) {
  const std::vector<Instance> ports = instancesOf(session, "TVXHBA_FCPort");
  const std::vector<CardNode> cards = cardNodes(ports, instancesOf(session, "TVXHBA_Card"));
  const std::vector<LunRow> rows = allRows(session);
  const std::string host = ports.empty() ? std::string() : ports.front().text("SystemName");
  if (session.options().format != Format::Json) {
    session.out() << treeText(host, cards, rows);
    return ExitCode::Ok;
  }
  Json list = Json::array();
  for (const CardNode& card : cards) list.push_back(cardJson(card, rows));
  printJson(session, "tree", {{"host", host}, {"cards", std::move(list)}});
  return ExitCode::Ok;
}

}  // namespace

void addSanCommands(CLI::App& app, const CommandChooser& choose) {
  auto port = std::make_shared<std::string>();
  CLI::App* luns = app.add_subcommand("luns", "table of the logical units behind the ports");
  luns->add_option("PORT", *port, std::string(portWords) + "; all if left out");
  choose(luns, "luns", [port](Session& session) { return listLuns(session, *port); });
  choose(app.add_subcommand("tree", "host, cards, ports, targets and logical units as a tree"),
         "tree", showTree);
}

}  // namespace tvx::host
