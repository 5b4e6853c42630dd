// Commands that act on something people know (ports, firmware, diagnostics ...) rather than on any
// class. Each family lies in a file of its own in `commands/` and is one line of the table in
// CommandFamilies.cpp:
//
//   void addFirmwareCommands(CLI::App& app, const CommandChooser& choose) {
//     auto words = std::make_shared<FirmwareWords>();
//     CLI::App* firmware = app.add_subcommand("firmware", "firmware of the ports");
//     firmware->require_subcommand(1);
//     CLI::App* install = firmware->add_subcommand("install", "install a firmware file");
//     install->add_option("PORT", words->port, portWords)->required();
//     choose(install, "firmware install",
//            [words](Session& session) { return installFirmware(session, *words); });
//   }
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "cli/ExitCode.h"

namespace CLI {
class App;
}

namespace tvx::host {

struct Options;
class Session;

/// What a command does, once the library is loaded. Throws CommandError.
using CommandRun = std::function<ExitCode(Session&)>;

/// Ties what `command` does to it. `name` is what "command" says in the JSON that it prints.
using CommandChooser =
    std::function<void(CLI::App* command, const std::string& name, CommandRun run)>;

/// Help text of an argument that `findPort` reads.
inline constexpr const char* portWords = "WWPN, with or without colons, or path of the port";

/// Adds the commands of every family.
void addFamilies(CLI::App& app, Options& options);

}  // namespace tvx::host
