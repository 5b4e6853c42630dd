// `ports`: the FC ports as a table.
#include <CLI/CLI.hpp>

#include "cli/Output.h"
#include "cli/Ports.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

nlohmann::ordered_json portJson(const PortRow& row) {
  return {
      {"wwpn", row.wwpn},           {"model", row.model},   {"adapter", row.adapter},
      {"serialNumber", row.serial}, {"speed", row.speed},   {"speedText", speedWords(row.speed)},
      {"maxSpeed", row.maxSpeed},   {"state", row.state},   {"type", row.type},
      {"fcId", row.fcId},           {"fabric", row.fabric}, {"firmware", row.firmware}};
}

ExitCode listPorts(Session& session) {
  const auto rows =
      portRows(instancesOf(session, "TVXHBA_FCPort"), instancesOf(session, "TVXHBA_Card"));
  if (session.options().format != Format::Json) {
    session.out() << portTable(rows);
    return ExitCode::Ok;
  }
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  for (const PortRow& row : rows) {
    list.push_back(portJson(row));
  }
  printJson(session, "ports", std::move(list));
  return ExitCode::Ok;
}

}  // namespace

void addPortCommands(CLI::App& app, const CommandChooser& choose) {
  choose(app.add_subcommand("ports", "table of the FC ports"), "ports", listPorts);
}

}  // namespace tvx::host
