#include "cli/Places.h"

#include <dlfcn.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <vector>

#include "cli/ExitCode.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;

constexpr const char* libraryName = "libtorvex_fc_provider.so";
constexpr const char* simulatedName = "liblrmapi.so";
constexpr const char* restartMark = "TVXCIM_RESTARTED";

/// Folders relative to the program's, nearest first: build layout, then installed.
std::vector<fs::path> libraryFolders() {
  const fs::path base = programFolder();
  return {base / "../lib",
          base,
          base / "../lib/cmpi",
          base / "../lib64/cmpi",
          "/usr/lib/x86_64-linux-gnu/cmpi",
          "/usr/lib/cmpi",
          "/usr/local/lib/cmpi"};
}

std::vector<fs::path> simulatedFolders() {
  const fs::path base = programFolder();
  return {base / "../lib", base, base / "../lib/torvex-fc-provider/sim",
          base / "../lib/x86_64-linux-gnu/torvex-fc-provider/sim"};
}

std::vector<fs::path> scenarioFolders() {
  const fs::path base = programFolder();
  return {base / "../share/torvex-fc-provider/scenarios", base / "../scenarios",
          base / "../../../sim/scenarios"};
}

bool isFile(const fs::path& path) {
  std::error_code error;
  return fs::is_regular_file(path, error);
}

fs::path tidy(const fs::path& path) {
  std::error_code error;
  const fs::path result = fs::weakly_canonical(path, error);
  return error ? path : result;
}

std::string lookedIn(const std::vector<fs::path>& folders) {
  std::string text;
  for (const fs::path& folder : folders) {
    text += "\n  " + tidy(folder).string();
  }
  return text;
}

std::string knownScenarios() {
  std::vector<std::string> names;
  for (const fs::path& folder : scenarioFolders()) {
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(folder, error)) {
      if (entry.path().extension() == ".json") {
        names.push_back(entry.path().stem().string());
      }
    }
  }
  std::sort(names.begin(), names.end());
  names.erase(std::unique(names.begin(), names.end()), names.end());
  return names.empty() ? "default" : fmt::format("{}", fmt::join(names, ", "));
}

std::string environment(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? "" : value;
}

/// True if the folder is there, belongs to this user and is closed to all others.
bool isPrivate(const fs::path& folder) {
  struct stat info {};
  return ::lstat(folder.c_str(), &info) == 0 && S_ISDIR(info.st_mode) &&
         info.st_uid == ::geteuid() && (info.st_mode & 077) == 0;
}

void setVariable(const char* name, const std::string& value) {
  ::setenv(name, value.c_str(), 1);
}

/// True if the search path already starts with the folder.
bool putBeforeSearchPath(const fs::path& folder) {
  const std::string old = environment("LD_LIBRARY_PATH");
  if (old == folder || old.starts_with(folder.string() + ":")) {
    return true;
  }
  setVariable("LD_LIBRARY_PATH", old.empty() ? folder.string() : folder.string() + ":" + old);
  return false;
}

void restart(const char* const* argv) {
  if (!environment(restartMark).empty()) {
    throw CommandError(ExitCode::Library,
                       "the search path for libraries does not hold across a restart; start tvxcim "
                       "without extra privileges, or set LD_LIBRARY_PATH by hand");
  }
  setVariable(restartMark, "1");
  ::execv("/proc/self/exe", const_cast<char* const*>(argv));
  throw CommandError(ExitCode::Library, "cannot start tvxcim anew with the simulated libraries");
}

/// What commands change in a scenario is kept below the root, one file a scenario, so that the next
/// command finds it.
void prepareState(const Options& options, const fs::path& scenario) {
  if (environment("TVX_SIM_STATE").empty()) {
    const std::string name =
        fmt::format("sim-{}-{:016x}.state", scenario.empty() ? "default" : scenario.stem().string(),
                    std::hash<std::string>()(scenario.string()));
    setVariable("TVX_SIM_STATE", (fs::path(environment("TVX_ROOT")) / name).string());
  }
  // Once: the program may be on its second start.
  if (options.freshSimulation && environment(restartMark).empty()) {
    std::error_code error;
    fs::remove(environment("TVX_SIM_STATE"), error);
  }
}

void prepareSimulation(const Options& options, const char* const* argv) {
  const fs::path folder = findSimulatedLibraries();
  const fs::path scenario = findScenario(*options.scenario);
  if (!scenario.empty()) {
    setVariable("TVX_SIM_SCENARIO", scenario.string());
  }
  if (options.root.empty() && environment("TVX_ROOT").empty()) {
    setVariable("TVX_ROOT", privateRoot().string());
  }
  prepareState(options, scenario);
  if (!putBeforeSearchPath(folder)) {
    restart(argv);
  }
  ::unsetenv(restartMark);
}

/// Puts the libraries into the default scope of the process, for good.
void preload(const std::vector<std::string>& libraries) {
  for (const std::string& each : libraries) {
    if (::dlopen(each.c_str(), RTLD_NOW | RTLD_GLOBAL) == nullptr) {
      const char* const reason = ::dlerror();
      throw CommandError(ExitCode::Library,
                         fmt::format("--preload: {}", reason == nullptr ? each : reason));
    }
  }
}

}  // namespace

fs::path programFolder() {
  std::error_code error;
  const fs::path program = fs::read_symlink("/proc/self/exe", error);
  return error ? fs::path(".") : program.parent_path();
}

fs::path findProviderLibrary(const Options& options) {
  if (!options.library.empty()) {
    if (!isFile(options.library)) {
      throw CommandError(ExitCode::Library,
                         fmt::format("there is no library '{}'; check --lib", options.library));
    }
    return options.library;
  }
  for (const fs::path& folder : libraryFolders()) {
    if (isFile(folder / libraryName)) {
      return tidy(folder / libraryName);
    }
  }
  throw CommandError(ExitCode::Library,
                     fmt::format("{} was not found; name it with --lib. Looked in:{}", libraryName,
                                 lookedIn(libraryFolders())));
}

fs::path findSimulatedLibraries() {
  for (const fs::path& folder : simulatedFolders()) {
    if (isFile(folder / simulatedName)) {
      return tidy(folder);
    }
  }
  throw CommandError(ExitCode::Library,
                     fmt::format("the simulated libraries were not found ({}); build or install "
                                 "them, or leave --sim out. Looked in:{}",
                                 simulatedName, lookedIn(simulatedFolders())));
}

fs::path findScenario(const std::string& scenario) {
  const std::string name = scenario.empty() ? "default" : scenario;
  if (isFile(name)) {
    return tidy(fs::absolute(name));
  }
  const bool isName = name.find('/') == std::string::npos;
  for (const fs::path& folder : isName ? scenarioFolders() : std::vector<fs::path>()) {
    for (const fs::path& file : {folder / (name + ".json"), folder / name}) {
      if (isFile(file)) {
        return tidy(file);
      }
    }
  }
  if (name == "default") {
    return {};
  }
  throw CommandError(
      ExitCode::File,
      fmt::format("there is no scenario '{}'; give a file, or one of: {}", name, knownScenarios()));
}

fs::path privateRoot() {
  const std::string temporary = environment("TMPDIR");
  const fs::path base = temporary.empty() ? fs::path("/tmp") : fs::path(temporary);
  fs::path root = base / fmt::format("tvxcim-{}", ::geteuid());
  ::mkdir(root.c_str(), 0700);
  if (!isPrivate(root)) {
    std::string pattern = (base / "tvxcim-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) {
      throw CommandError(
          ExitCode::File,
          fmt::format("cannot make a private folder in '{}'; name one with --root", base.string()));
    }
    root = pattern;
  }
  for (const char* folder : {"etc", "var/log", "opt/ibm/platform/log", "tmp"}) {
    std::error_code error;
    fs::create_directories(root / folder, error);
  }
  return root;
}

void prepareEnvironment(const Options& options, const char* const* argv) {
  if (!options.root.empty()) {
    if (!fs::is_directory(options.root)) {
      throw CommandError(ExitCode::File,
                         fmt::format("there is no folder '{}'; check --root", options.root));
    }
    setVariable("TVX_ROOT", fs::absolute(options.root).string());
  }
  if (options.scenario) {
    prepareSimulation(options, argv);
  }
  preload(options.preloaded);
}

}  // namespace tvx::host
