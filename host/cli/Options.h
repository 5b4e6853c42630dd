// The command line as parsed.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "Broker.h"
#include "cli/CommandFamily.h"

namespace tvx::host {

enum class Format { Table, Json, Mof };

struct Options {
  std::string program;

  // Global options.
  std::string library;                  ///< empty: looked for
  std::optional<std::string> scenario;  ///< set with --sim; empty for the default one
  bool freshSimulation = false;         ///< forget what earlier runs changed
  std::string root;
  std::vector<std::string> preloaded;  ///< libraries for the default scope
  std::string nameSpace;
  Format format = Format::Table;
  PropertyList properties;
  int brokerVersion = 200;
  bool strict = false;
  std::string foreignFile;

  // The command and its words.
  std::string command;
  CommandRun run;  ///< set for the commands of a family
  std::string className;
  std::string path;
  std::string method;
  std::vector<std::string> assignments;
  std::string assocClass;
  std::string resultClass;
  std::string role;
  std::string resultRole;
  bool withMethods = false;
  bool allClasses = false;
};

/// Parses the command line. Prints help and errors itself; then the answer has no value and
/// `exitCode` tells how to end.
std::optional<Options> parseOptions(int argc, const char* const* argv, int& exitCode);

}  // namespace tvx::host
