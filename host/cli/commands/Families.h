// One function for each family of commands.
#pragma once

#include "cli/CommandFamily.h"

namespace tvx::host {

void addDiagCommands(CLI::App& app, const CommandChooser& choose);
void addBootCodeCommands(CLI::App& app, const CommandChooser& choose);
void addDumpCommands(CLI::App& app, const CommandChooser& choose);
void addWwnCommands(CLI::App& app, const CommandChooser& choose);
void addLogCommands(CLI::App& app, const CommandChooser& choose);
void addFirmwareCommands(CLI::App& app, const CommandChooser& choose);
void addPortCommands(CLI::App& app, const CommandChooser& choose);
void addSanCommands(CLI::App& app, const CommandChooser& choose);
void addSettingsCommands(CLI::App& app, const CommandChooser& choose);
void addStatsCommands(CLI::App& app, const CommandChooser& choose);
void addTagCommands(CLI::App& app, const CommandChooser& choose);
void addServeCommand(CLI::App& app, const CommandChooser& choose);

}  // namespace tvx::host
