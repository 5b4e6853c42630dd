// Every entry point of the management libraries that the provider calls, times every way in which
// it can fail, while a client asks for everything. The rows run in child processes, so that a crash
// or a hang is an outcome and not the end.
//
// usage: fault_matrix [--every N] [--row TEXT] [--mode NAME]... [--jobs N] [--report FILE]
// [--seconds N]
//   --every N     of each N cells one, another in each row (1: the whole matrix)
//   --row TEXT    only entry points whose name holds the text
//   --mode NAME   only this way of failing, as Fault_Modes.h calls it; may be given several times
//   --jobs N      so many rows at once (default 1)
//   --report FILE the table in Markdown
//   --seconds N   a cell that takes longer hangs (default 60)
// Ends with 1 if a cell crashed, hung or leaked.
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>

#include "Fault_Modes.h"
#include "Trial_Root.h"
#include "Whole_Client.h"
#include "schema/ClassData.h"
#include "tests/support/Elf_File.h"
#include "tests/support/Request_Thread.h"
#include "tvxsim/tvxsim.h"

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>

/// Short stacks of allocations and a small store of freed memory: they take a third of the time
/// otherwise. To look into a finding, run its row with ASAN_OPTIONS=malloc_context_size=30.
extern "C" const char* __asan_default_options();
extern "C" const char* __asan_default_options() {
  return "malloc_context_size=1:quarantine_size_mb=24";
}
#endif

namespace tvx::test {
namespace {

using Json = nlohmann::json;
using Clock = std::chrono::steady_clock;

/// Entry points that requests reach; those of other wrappers are tried by the tests of src/access.
constexpr std::size_t REACHED = 72;

struct Choice {
  std::size_t every = 1;
  std::string row;
  std::vector<std::string> modes;
  std::string report;
  std::size_t jobs = 1;
  std::chrono::seconds patience{60};
};

/// What a child tells its parent while it runs; lies in memory that both see.
struct Progress {
  std::atomic<std::size_t> cell{0};  ///< position of the cell under way
  std::atomic<std::size_t> cells{0};
  std::atomic<std::size_t> requests{0};
  std::atomic<std::size_t> methods{0};
  std::atomic<std::size_t> libraryCalls{0};
  std::atomic<std::size_t> leaks{0};
};

struct Row {
  std::string entryPoint;
  std::size_t cells = 0;
  std::size_t requests = 0;
  std::size_t methods = 0;
  std::size_t libraryCalls = 0;
  std::size_t leaks = 0;
  std::vector<std::string> crashes;
  std::vector<std::string> hangs;
};

// ---- One cell ----

/// What makes the provider call what it calls only when something is amiss.
struct Nudge {
  const char* entryPoint;  ///< the one that is amiss
  const char* members;
};
const Nudge NUDGES[] = {
    {"HBA_GetAdapterAttributes", R"("status": 8, "first": 1)"},  // stale data, to be refreshed
};

/// The simulated host: it dumps into that folder, and one of its tests goes on for ever, until it
/// is cancelled.
Json scenario(const std::string& folder) {
  std::ifstream stream(TVX_MATRIX_SCENARIO);
  Json host = Json::parse(stream, nullptr, true, true);
  host["defaults"]["port"]["diagnostics"] = {{"pci", {{"endless", true}}}};
  for (Json& card : host["cards"])
    for (Json& port : card["ports"])
      if (port.contains("dumps")) port["dumps"]["directory"] = folder;
  host["cards"][1]["ports"].back().update(
      {{"type", "loop"}, {"fabric_name", "0000000000000000"}, {"targets", Json::array()}});
  return host;
}

void addFault(const std::string& entryPoint, const std::string& members) {
  const std::string fault = R"({"call": ")" + entryPoint + R"(", )" + members + "}";
  if (tvxsim_add_fault(fault.c_str()) == 0) return;
  std::cerr << "fault_matrix: " << fault << ": " << tvxsim_last_error() << "\n";
  std::_Exit(3);
}

/// The simulated host, with or without one of its symbols, under one fault.
void setUp(const std::string& folder, const std::string& entryPoint, const Fault_Mode* mode) {
  Json host = scenario(folder);
  const bool missing = mode != nullptr && mode->isMissingSymbol();
  if (missing) host["omit_symbols"] = Json::array({entryPoint, "L" + entryPoint});
  if (tvxsim_load_text(host.dump().c_str()) != 0) {
    std::cerr << "fault_matrix: " << tvxsim_last_error() << "\n";
    std::_Exit(3);
  }
  for (const Nudge& nudge : NUDGES)
    if (entryPoint != nudge.entryPoint) addFault(nudge.entryPoint, nudge.members);
  if (mode != nullptr && !missing) addFault(entryPoint, mode->members);
}

/// A provider's whole life under one fault; without one if there is no mode.
void runCell(const host::ClassCatalogue& classes, const std::string& entryPoint,
             const Fault_Mode* mode, Progress& progress) {
  const Trial_Root root;
  setUp(root.files(), entryPoint, mode);
  host::BrokerOptions options;
  options.strict = true;
  options.classes = &classes;
  host::Broker broker(options);
  broker.load(TVX_PROVIDER_LIBRARY);
  Whole_Client client(broker, classes, root.files());
  client.readEverything();
  client.callEverything();
  client.changeEverything();
  client.readInstances();
  broker.unload(true);
  std::size_t leaks = client.tally().leaks.size();
  for (const host::ScopeReport& report : broker.threadReports()) leaks += report.leaks() ? 1 : 0;
  for (const std::string& leak : client.tally().leaks) std::cerr << leak << "\n";
  progress.leaks += leaks + broker.openAttachments() + broker.lateNotes().size();
  progress.requests += client.tally().requests;
  progress.methods += client.tally().methods;
}

// ---- Rows ----

bool isChosen(const Choice& choice, std::size_t row, const std::vector<Fault_Mode>& modes,
              std::size_t mode) {
  const bool named = choice.modes.empty() || std::find(choice.modes.begin(), choice.modes.end(),
                                                       modes[mode].name) != choice.modes.end();
  return named && (row + mode) % choice.every == 0;
}

/// Runs the cells of a row from `first` on; the process's exit status tells of leaked memory.
[[noreturn]] void runRow(const Choice& choice, const host::ClassCatalogue& classes,
                         const std::string& entryPoint, std::size_t row, std::size_t first,
                         Progress& progress) {
  const std::vector<Fault_Mode> modes = faultModes();
  for (std::size_t i = first; i < modes.size(); ++i) {
    if (!isChosen(choice, row, modes, i)) continue;
    progress.cell = i;
    Request_Thread([&] { runCell(classes, entryPoint, &modes[i], progress); });
    progress.libraryCalls += tvxsim_calls(entryPoint.c_str(), nullptr);
    ++progress.cells;
  }
#if defined(__SANITIZE_ADDRESS__)
  if (__lsan_do_recoverable_leak_check() != 0) ++progress.leaks;
#endif
  std::_Exit(0);
}

enum class End { Done, Crash, Hang };

/// Waits for a child that must keep going from cell to cell.
End watch(pid_t child, const Choice& choice, const Progress& progress) {
  std::size_t cell = progress.cells;
  Clock::time_point since = Clock::now();
  for (;;) {
    int status = 0;
    if (waitpid(child, &status, WNOHANG) == child)
      return WIFEXITED(status) && WEXITSTATUS(status) == 0 ? End::Done : End::Crash;
    if (progress.cells != cell) {
      cell = progress.cells;
      since = Clock::now();
    }
    if (Clock::now() - since > choice.patience) {
      kill(child, SIGKILL);
      waitpid(child, &status, 0);
      return End::Hang;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
}

/// Runs a row to its end, however many children that takes.
Row runRowInChildren(const Choice& choice, const host::ClassCatalogue& classes,
                     const std::string& entryPoint, std::size_t row, Progress& progress) {
  new (&progress) Progress;
  Row result;
  result.entryPoint = entryPoint;
  const std::vector<Fault_Mode> modes = faultModes();
  for (std::size_t first = 0; first < modes.size(); first = progress.cell + 1) {
    std::cout.flush();
    const pid_t child = fork();
    if (child < 0) std::abort();
    if (child == 0) runRow(choice, classes, entryPoint, row, first, progress);
    const End end = watch(child, choice, progress);
    if (end == End::Done) break;
    auto& list = end == End::Crash ? result.crashes : result.hangs;
    list.push_back(modes[progress.cell].name);
    ++progress.cells;
  }
  result.cells = progress.cells;
  result.requests = progress.requests;
  result.methods = progress.methods;
  result.libraryCalls = progress.libraryCalls;
  result.leaks = progress.leaks;
  return result;
}

// ---- Which rows ----

/// Names under which the simulated libraries offer something, one for each entry point.
std::set<std::string> offeredEntryPoints() {
  std::set<std::string> names;
  for (const char* library : {TVX_SIM_LRMAPI, TVX_SIM_HBAAPI, TVX_SIM_TVSDM})
    for (std::string name : Elf_File(library).symbols(true))
      names.insert(name.starts_with("LRM_") ? name.substr(1) : name);
  return names;
}

/// Those that the provider calls when nothing fails. Asked in a child: this process stays without
/// threads.
std::vector<std::string> calledEntryPoints(const host::ClassCatalogue& classes,
                                           Progress& progress) {
  const std::set<std::string> offered = offeredEntryPoints();
  int ends[2];
  if (pipe(ends) != 0) std::abort();
  const pid_t child = fork();
  if (child == 0) {
    Request_Thread([&] { runCell(classes, "", nullptr, progress); });
    std::string text;
    for (const std::string& name : offered)
      if (tvxsim_calls(name.c_str(), nullptr) > 0) text += name + "\n";
    const bool written =
        write(ends[1], text.data(), text.size()) == static_cast<ssize_t>(text.size());
    std::_Exit(written ? 0 : 1);
  }
  close(ends[1]);
  std::string text;
  char part[4096];
  for (ssize_t n = 0; (n = read(ends[0], part, sizeof part)) > 0;)
    text.append(part, static_cast<std::size_t>(n));
  close(ends[0]);
  int status = 0;
  waitpid(child, &status, 0);
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0)
    throw std::runtime_error("the run without a fault failed");
  std::istringstream lines(text);
  std::vector<std::string> names;
  for (std::string line; std::getline(lines, line);) names.push_back(line);
  return names;
}

// ---- The report ----

std::string joined(const std::vector<std::string>& texts) {
  std::string all;
  for (const std::string& text : texts) all += (all.empty() ? "" : ", ") + text;
  return all.empty() ? "0" : std::to_string(texts.size()) + " (" + all + ")";
}

void writeReport(std::ostream& out, const std::vector<Row>& rows) {
  Row sum;
  out << "| Entry point | Cells | Requests | Methods | Calls that a fault met | Crashes | Hangs | "
         "Leaks |\n|---|---|---|---|---|---|---|---|\n";
  std::size_t crashes = 0;
  std::size_t hangs = 0;
  for (const Row& row : rows) {
    out << "| `" << row.entryPoint << "` | " << row.cells << " | " << row.requests << " | "
        << row.methods << " | " << row.libraryCalls << " | " << joined(row.crashes) << " | "
        << joined(row.hangs) << " | " << row.leaks << " |\n";
    sum.cells += row.cells;
    sum.requests += row.requests;
    sum.methods += row.methods;
    sum.libraryCalls += row.libraryCalls;
    sum.leaks += row.leaks;
    crashes += row.crashes.size();
    hangs += row.hangs.size();
  }
  out << "| all " << rows.size() << " | " << sum.cells << " | " << sum.requests << " | "
      << sum.methods << " | " << sum.libraryCalls << " | " << crashes << " | " << hangs << " | "
      << sum.leaks << " |\n";
}

bool isGood(const Row& row) {
  return row.crashes.empty() && row.hangs.empty() && row.leaks == 0;
}

constexpr const char* USAGE =
    "usage: fault_matrix [--every N] [--row TEXT] [--mode NAME]... [--jobs N] [--report FILE] "
    "[--seconds N]";

Choice parse(int argc, char** argv) {
  Choice choice;
  for (int i = 1; i < argc; i += 2) {
    const std::string name = argv[i];
    if (i + 1 == argc) throw std::invalid_argument(name + " stands alone; " + USAGE);
    const std::string value = argv[i + 1];
    if (name == "--every")
      choice.every = std::max(1UL, std::stoul(value));
    else if (name == "--row")
      choice.row = value;
    else if (name == "--mode")
      choice.modes.push_back(value);
    else if (name == "--jobs")
      choice.jobs = std::max(1UL, std::stoul(value));
    else if (name == "--report")
      choice.report = value;
    else if (name == "--seconds")
      choice.patience = std::chrono::seconds(std::stol(value));
    else
      throw std::invalid_argument("no option " + name + "; " + USAGE);
  }
  return choice;
}

// ---- Rows at once ----

Json toJson(const Row& row) {
  return {{"entryPoint", row.entryPoint}, {"cells", row.cells},        {"requests", row.requests},
          {"methods", row.methods},       {"calls", row.libraryCalls}, {"leaks", row.leaks},
          {"crashes", row.crashes},       {"hangs", row.hangs}};
}

Row rowOf(const Json& json) {
  return {json["entryPoint"], json["cells"], json["requests"], json["methods"],
          json["calls"],      json["leaks"], json["crashes"],  json["hangs"]};
}

Progress& sharedProgress() {
  void* memory =
      mmap(nullptr, sizeof(Progress), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  if (memory == MAP_FAILED) throw std::runtime_error("there is no shared memory");
  return *new (memory) Progress;
}

/// Runs each N-th row and writes what came of it into the stream, a line for each.
void runShare(const Choice& choice, const host::ClassCatalogue& classes,
              const std::vector<std::string>& names, std::size_t share, std::FILE* out) {
  Progress& progress = sharedProgress();
  for (std::size_t position = share; position < names.size(); position += choice.jobs) {
    if (names[position].find(choice.row) == std::string::npos) continue;
    const Row row = runRowInChildren(choice, classes, names[position], position + 1, progress);
    std::cout << row.entryPoint << ": " << row.cells << " cells, " << row.requests
              << " requests, crashes " << joined(row.crashes) << ", hangs " << joined(row.hangs)
              << ", leaks " << row.leaks << std::endl;
    std::fprintf(out, "%s\n", toJson(row).dump().c_str());
    std::fflush(out);
  }
}

/// The rows of all shares, in the order of their names. A share that ends early is an error.
std::vector<Row> runShares(const Choice& choice, const host::ClassCatalogue& classes,
                           const std::vector<std::string>& names) {
  std::vector<std::FILE*> outs;
  for (std::size_t share = 0; share < choice.jobs; ++share) {
    outs.push_back(std::tmpfile());
    if (outs.back() == nullptr) throw std::runtime_error("there is no temporary file");
    const pid_t child = fork();
    if (child < 0) throw std::runtime_error("there is no process");
    if (child == 0) {
      runShare(choice, classes, names, share, outs.back());
      std::_Exit(0);
    }
  }
  bool whole = true;
  for (int status = 0; wait(&status) > 0;)
    whole = whole && WIFEXITED(status) && WEXITSTATUS(status) == 0;
  if (!whole) throw std::runtime_error("a share of the rows was not run to its end");
  std::vector<Row> rows;
  for (std::FILE* out : outs) {
    std::rewind(out);
    std::string line;
    for (int c = 0; (c = std::fgetc(out)) != EOF; line += static_cast<char>(c))
      if (c == '\n') rows.push_back(rowOf(Json::parse(std::exchange(line, ""))));
    std::fclose(out);
  }
  std::sort(rows.begin(), rows.end(),
            [](const Row& a, const Row& b) { return a.entryPoint < b.entryPoint; });
  return rows;
}

int runMatrix(const Choice& choice) {
  const host::ClassCatalogue classes(host::allClasses, host::allClassCount);
  const std::vector<std::string> names = calledEntryPoints(classes, sharedProgress());
  if (std::find(names.begin(), names.end(), "RM_InitLib") == names.end())
    throw std::runtime_error("no library was found; LD_LIBRARY_PATH has to name their folder");
  if (names.size() < REACHED)
    throw std::runtime_error("the client reaches only " + std::to_string(names.size()) +
                             " entry points");
  const std::vector<Row> rows = runShares(choice, classes, names);
  const bool good = std::all_of(rows.begin(), rows.end(), isGood);
  if (!choice.report.empty()) {
    std::ofstream report(choice.report);
    writeReport(report, rows);
  }
  std::cout << rows.size() << " entry points, " << (good ? "all good" : "NOT all good") << "\n";
  return good && !rows.empty() ? 0 : 1;
}

}  // namespace
}  // namespace tvx::test

int main(int argc, char** argv) {
  try {
    return tvx::test::runMatrix(tvx::test::parse(argc, argv));
  } catch (const std::exception& error) {
    std::cerr << "fault_matrix: " << error.what() << "\n";
    return 2;
  }
}
