// Back trace of the process to the system log, for use as a signal handler.
#pragma once

#include <csignal>

namespace cimrt {

/// The description of a handler that writes the execution path to the system log and ends the
/// process with exit code 1. It is not installed: signals belong to the CIM server.
struct sigaction signalTraceAction();

}  // namespace cimrt
