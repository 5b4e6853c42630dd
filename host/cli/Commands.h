// The commands of tvxcim.
#pragma once

#include <ostream>

#include "cim/ClassCatalogue.h"
#include "cli/ExitCode.h"
#include "cli/Options.h"

namespace tvx::host {

/// Runs the command that the options name. Results go to `out`, errors to `err`; with --json an
/// error also goes to `out` as {"version": 1, "command": ..., "error": {...}}.
ExitCode runCommand(const Options& options, const ClassCatalogue& classes, std::ostream& out,
                    std::ostream& err);

/// The whole program: options, environment, command. Answers the exit status.
int runProgram(int argc, const char* const* argv, const ClassCatalogue& classes);

}  // namespace tvx::host
