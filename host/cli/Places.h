// Where things lie: the provider library, the simulated libraries, scenarios, the private root.
#pragma once

#include <filesystem>
#include <string>

#include "cli/Options.h"

namespace tvx::host {

/// Folder of the running program.
std::filesystem::path programFolder();

/// The library named by the options, else the first there is of the build layout, the folder of
/// the program and the installed places. Throws CommandError (Library) listing where it looked.
std::filesystem::path findProviderLibrary(const Options& options);

/// Folder that holds the simulated liblrmapi.so. Throws CommandError (Library).
std::filesystem::path findSimulatedLibraries();

/// File of a scenario given by file path or by name ("default", with or without ".json"); empty
/// if the name is the default's and no file is there, since the simulator has that one built in.
/// Throws CommandError (File) naming the scenarios there are.
std::filesystem::path findScenario(const std::string& scenario);

/// A folder of this user alone, with the folders below it that the provider writes into; the same
/// one each time where possible. Throws CommandError (File).
std::filesystem::path privateRoot();

/// Sets up the environment for `--sim` and `--root`. If the dynamic linker's search path has to
/// change, starts the program anew, once, with the same arguments; then it does not return.
void prepareEnvironment(const Options& options, const char* const* argv);

}  // namespace tvx::host
