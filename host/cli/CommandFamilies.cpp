#include <CLI/CLI.hpp>

#include "cli/CommandFamily.h"
#include "cli/Options.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

using AddCommands = void (*)(CLI::App& app, const CommandChooser& choose);

constexpr AddCommands families[] = {
    addDiagCommands, addPortCommands,     addSanCommands,  addFirmwareCommands,
    addWwnCommands,  addBootCodeCommands, addDumpCommands, addStatsCommands,
    addLogCommands,  addSettingsCommands, addTagCommands,  addServeCommand,
};

}  // namespace

void addFamilies(CLI::App& app, Options& options) {
  const CommandChooser choose = [&options](CLI::App* command, const std::string& name,
                                           CommandRun run) {
    command->callback([&options, name, run = std::move(run)] {
      options.command = name;
      options.run = run;
    });
  };
  for (const AddCommands add : families) {
    add(app, choose);
  }
}

}  // namespace tvx::host
