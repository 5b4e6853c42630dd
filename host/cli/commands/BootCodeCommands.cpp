// `bootcode on`, `bootcode off` and `bootcode status`.
#include <CLI/CLI.hpp>
#include <memory>

#include "cli/Output.h"
#include "cli/ServiceCalls.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* bootBiosService = "TVXHBA_BootBIOSService";

ExitCode switchBootCode(Session& session, const std::string& port, bool on) {
  const ServicePort target = findServicePort(session, bootBiosService, port);
  const std::uint64_t result =
      resultNumber(callOnPort(session, target, on ? "EnableBootBIOS" : "DisableBootBIOS"));
  const std::string done = on ? "boot code is on" : "boot code is off";
  return tellOutcome(session, "bootcode", target.wwpn, result,
                     result == 0 ? done : resultWords(result));
}

ExitCode tellBootCode(Session& session, const std::string& port) {
  const ServicePort target = findServicePort(session, bootBiosService, port);
  const Reply reply = callOnPort(session, target, "GetBootBIOSStatus");
  const std::uint64_t result = resultNumber(reply);
  const std::uint64_t state = outputNumber(reply, "nBootBIOSStatus", 0);
  const std::string said = state != 0 ? "boot code is on" : "boot code is off";
  return tellOutcome(
      session, "bootcode", target.wwpn, result, result == 0 ? said : resultWords(result),
      result == 0 ? nlohmann::ordered_json{{"state", state}} : nlohmann::ordered_json::object());
}

}  // namespace

void addBootCodeCommands(CLI::App& app, const CommandChooser& choose) {
  auto port = std::make_shared<std::string>();
  CLI::App* bootCode = app.add_subcommand("bootcode", "boot code of a port");
  bootCode->require_subcommand(1);
  CLI::App* on = bootCode->add_subcommand("on", "turn the boot code on");
  CLI::App* off = bootCode->add_subcommand("off", "turn the boot code off");
  CLI::App* status = bootCode->add_subcommand("status", "tell whether it is on");
  for (CLI::App* command : {on, off, status}) {
    command->add_option("PORT", *port, portWords)->required();
  }
  choose(on, "bootcode on",
         [port](Session& session) { return switchBootCode(session, *port, true); });
  choose(off, "bootcode off",
         [port](Session& session) { return switchBootCode(session, *port, false); });
  choose(status, "bootcode status",
         [port](Session& session) { return tellBootCode(session, *port); });
}

}  // namespace tvx::host
