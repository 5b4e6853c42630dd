#include "cli/Options.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <iostream>

#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

std::string footer() {
  std::string text = "\nExit codes:\n";
  for (const ExitCodeText& each : exitCodeTexts) {
    text += fmt::format("  {:<3} {}\n", static_cast<int>(each.code), each.text);
  }
  return text +
         "\nPATH is [namespace:]Class.Key=\"text\",Key=1; keys that are left out are filled in if\n"
         "one instance fits. name=value takes numbers, true or false, texts, a,b,c or [JSON] for\n"
         "arrays, paths for references, JSON or @file for embedded instances, @file for bytes.\n"
         "\nExamples:\n"
         "  tvxcim --sim ports\n"
         "  tvxcim --sim ei TVXHBA_Chip --property-list Tag,BoardTemperature\n"
         "  tvxcim --sim --mof gi 'TVXHBA_FCPort.DeviceID=\"10000254560C4110\"'\n"
         "  tvxcim --sim ain 'TVXHBA_FCPort.DeviceID=\"10000254560C4110\"' --assoc-class "
         "TVXHBA_ControlledBy\n"
         "  tvxcim --sim cm TVXHBA_SoftwareInstallationService SetPortEnabled \\\n"
         "      'Target=TVXHBA_FCPort.DeviceID=\"10000254560C4111\"' PortEnabled=false\n";
}

/// Holds what CLI11 writes into until the parse is over.
struct Raw {
  std::vector<std::string> scenario;
  std::string properties;
  bool json = false;
  bool mof = false;
};

void addGlobals(CLI::App& app, Options& options, Raw& raw) {
  app.add_option("--lib", options.library, "provider library to load")->type_name("PATH");
  app.add_option("--sim", raw.scenario,
                 "use the simulated adapter libraries, with a scenario by name or file")
      ->type_name("[SCENARIO]")
      ->expected(0, 1);
  app.add_flag("--fresh", options.freshSimulation,
               "with --sim: forget what earlier commands changed in this scenario");
  app.add_option("--preload", options.preloaded,
                 "library to open for the provider, such as the one for frame tagging")
      ->type_name("LIBRARY")
      ->expected(1)
      ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  app.add_option("--root", options.root, "folder to put before all fixed paths of the provider")
      ->type_name("DIR");
  app.add_option("--namespace", options.nameSpace, "namespace of paths and classes without one")
      ->type_name("NS");
  auto* json = app.add_flag("--json", raw.json, "print JSON");
  app.add_flag("--mof", raw.mof, "print MOF")->excludes(json);
  app.add_option("--property-list", raw.properties, "only these properties")->type_name("A,B,...");
  app.add_option("--broker-version", options.brokerVersion, "act as a server of this version")
      ->check(CLI::IsMember({0, 100, 200}))
      ->capture_default_str();
  app.add_flag("--strict", options.strict, "account for every object the provider makes");
  app.add_option("--foreign", options.foreignFile, "instances of other providers, in JSON")
      ->type_name("FILE");
}

CLI::App* addCommand(CLI::App& app, Options& options, const char* name, const char* text) {
  CLI::App* command = app.add_subcommand(name, text);
  command->callback([&options, name] { options.command = name; });
  return command;
}

void addClassCommands(CLI::App& app, Options& options) {
  auto* classes = addCommand(app, options, "classes", "list the classes of the provider");
  classes->add_flag("--methods", options.withMethods, "with their methods");
  classes->add_flag("--all", options.allClasses, "with the classes they derive from");
  const auto withClass = [&](const char* name, const char* text) {
    auto* command = addCommand(app, options, name, text);
    command->add_option("CLASS", options.className, "class name")->required();
    return command;
  };
  withClass("class", "describe one class: properties, keys, methods");
  withClass("ein", "enumerate instance names");
  withClass("ei", "enumerate instances");
  withClass("ci", "create an instance")
      ->add_option("name=value", options.assignments, "keys and properties");
}

void addPathCommands(CLI::App& app, Options& options) {
  const auto withPath = [&](const char* name, const char* text) {
    auto* command = addCommand(app, options, name, text);
    command->add_option("PATH", options.path, "instance path")->required();
    return command;
  };
  withPath("gi", "get one instance");
  withPath("di", "delete one instance");
  withPath("mi", "modify one instance")
      ->add_option("name=value", options.assignments, "properties")
      ->required();
  auto* method = withPath("cm", "call a method");
  method->add_option("METHOD", options.method, "method name")->required();
  method->add_option("name=value", options.assignments, "arguments");
  for (const char* name : {"ai", "ain"}) {
    auto* walk = withPath(
        name, name == std::string("ai") ? "associated instances" : "names of associated instances");
    walk->add_option("--assoc-class", options.assocClass, "only over this association class");
    walk->add_option("--result-class", options.resultClass, "only instances of this class");
    walk->add_option("--role", options.role, "role of the source");
    walk->add_option("--result-role", options.resultRole, "role of the result");
  }
  for (const char* name : {"ri", "rin"}) {
    auto* walk = withPath(name, name == std::string("ri") ? "association instances that refer to it"
                                                          : "names of association instances");
    walk->add_option("--assoc-class,--result-class", options.resultClass,
                     "only of this association class");
    walk->add_option("--role", options.role, "role of the source");
  }
}

std::vector<std::string> splitNames(const std::string& text) {
  std::vector<std::string> names;
  std::string name;
  for (const char c : text + ",") {
    if (c != ',') {
      name += c;
    } else if (!name.empty()) {
      names.push_back(std::exchange(name, {}));
    }
  }
  return names;
}

void finish(Options& options, const Raw& raw, const CLI::App& app) {
  options.format = raw.json ? Format::Json : raw.mof ? Format::Mof : Format::Table;
  if (app.get_option("--sim")->count() != 0) {
    options.scenario = raw.scenario.empty() ? std::string() : raw.scenario.front();
  }
  if (!raw.properties.empty()) {
    options.properties = splitNames(raw.properties);
  }
}

}  // namespace

std::optional<Options> parseOptions(int argc, const char* const* argv, int& exitCode) {
  CLI::App app("Talks to the Torvex FC provider as a CIM server does, without a server.", "tvxcim");
  Options options;
  Raw raw;
  options.program = argc > 0 ? argv[0] : "tvxcim";
  app.fallthrough();  // commands inherit it, so that global options may follow them
  addGlobals(app, options, raw);
  addClassCommands(app, options);
  addPathCommands(app, options);
  addFamilies(app, options);
  app.require_subcommand(1);
  app.footer(footer());
  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& request) {
    exitCode = app.exit(request);
    return std::nullopt;
  } catch (const CLI::ParseError& error) {
    app.exit(error, std::cout, std::cerr);
    exitCode = static_cast<int>(ExitCode::Usage);
    return std::nullopt;
  }
  finish(options, raw, app);
  return options;
}

}  // namespace tvx::host
