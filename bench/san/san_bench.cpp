// bench_san [build|classes] [once] [CLASS] [units...]: what many logical units cost, as Markdown
// tables.
// Without arguments 1,000, 10,000 and 100,000 units are measured, which takes about fifteen minutes
// and a gigabyte; "build" leaves the classes out, "classes" all else; CLASS keeps to the classes
// of its family; "once" is for tools that count instructions and need no medians.
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "Broker.h"
#include "Child.h"
#include "Library_Replay.h"
#include "Memory.h"
#include "Scenario.h"
#include "agent/ProviderAgent.h"
#include "model/TVX_Data.h"
#include "schema/ClassData.h"
#include "tvxsim/tvxsim.h"

namespace tvx::bench {
namespace {

/// How often what is measured.
struct Repetitions {
  int buildSeries = 5;  ///< of all sizes in turn; the median counts
  int classSeries = 3;
  int rounds = 5;  ///< of a size in a series, five times as many of 1,000; the median counts

  /// Small work is over so soon that whatever else the machine does shows in it.
  int roundsFor(std::size_t units) const {
    return rounds > 1 && units <= 1000 ? 5 * rounds : rounds;
  }
};

Repetitions repetitions;

std::string number(double value, int digits) {
  char text[32];
  std::snprintf(text, sizeof text, "%.*f", digits, value);
  return text;
}

/// Processor time of this process in milliseconds. While anything is timed it has but one thread
/// that works, and what else runs on the machine does not count.
double processorTime() {
  timespec now{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

/// Drives everything out of the processor's caches. A refresh comes minutes after the one before
/// it, and finds none of its data there; without this, small hosts alone would.
void coolCaches() {
  static std::vector<char> other(std::size_t{96} << 20);
  for (std::size_t i = 0; i < other.size(); i += 64) other[i]++;
}

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  return values[values.size() / 2];
}

/// Milliseconds of the middle one of some rounds over so many units, each of which starts with cold
/// caches. What the work answers is disposed of outside of the measured time; `prepare` is called
/// before each.
template <class Work, class Prepare = void (*)()>
double middleTime(
    std::size_t units, const Work& work, const Prepare& prepare = [] {}) {
  std::vector<double> times;
  for (int round = 0; round < repetitions.roundsFor(units); round++) {
    prepare();
    coolCaches();
    const double start = processorTime();
    [[maybe_unused]] const auto answer = work();
    times.push_back(processorTime() - start);
  }
  return median(times);
}

void require(bool holds, const char* what) {
  if (holds) return;
  std::fprintf(stderr, "bench_san: %s\n", what);
  std::exit(1);
}

/// A root folder that goes with the process.
class Private_Root {
 public:
  Private_Root() {
    std::string name = (std::filesystem::temp_directory_path() / "tvx_bench_XXXXXX").string();
    require(mkdtemp(name.data()) != nullptr, "no temporary folder");
    m_Path = name;
    std::filesystem::create_directories(m_Path / "etc");
    std::filesystem::create_directories(m_Path / "opt/ibm/platform/log");
    setenv("TVX_ROOT", m_Path.c_str(), 1);
  }
  ~Private_Root() { std::filesystem::remove_all(m_Path); }

 private:
  std::filesystem::path m_Path;
};

// --- Scan, map build and memory ------------------------------------------------------------------

using cimrt::Agent_Maps;
using cimrt::ProviderAgent;

struct Map_Row {
  const char* name;
  void (*clear)(Agent_Maps& maps);
};

template <auto MEMBER>
void clearMap(Agent_Maps& maps) {
  (maps.*MEMBER).clear();
}

/// The maps that a host of volumes fills. Texts are shared between the copies of an instance and
/// are counted with the last holder, so the copies go first.
constexpr Map_Row MAPS[] = {
    {"paths", clearMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map>},
    {"system devices (with the copy of the volume)",
     clearMap<&Agent_Maps::m_TVXHBA_StorageVolumeSystemDevice_map>},
    {"hosted access points (with the copy of the target)",
     clearMap<&Agent_Maps::m_TVXHBA_LocalHostedAccessPoint_map>},
    {"volumes", clearMap<&Agent_Maps::m_TVXHBA_StorageVolume_map>},
    {"target endpoints", clearMap<&Agent_Maps::m_TVXHBA_SCSIProtocolEndpoint_map>},
};

ProviderAgent& startAgent() {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  ProviderAgent::addRef();
  require(agent.isLoaded(), "the simulated libraries were not found");
  agent.m_bSANRefreshSetting = false;
  agent.BuildCimrtInfo();
  for (bool running = true; running;) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
    cimrt::Ranked_Lock thread(agent.m_ThreadMutex);
    running = agent.m_bThreadRunning;
  }
  return agent;
}

Rows measureBuild(std::size_t units) {
  const Private_Root root;
  require(tvxsim_load_text(manyUnits(units, 0).c_str()) == 0, tvxsim_last_error());
  ProviderAgent& agent = startAgent();
  const auto scan = [&] { return agent.m_pData->buildSANData(), true; };
  const auto build = [&] {
    require(agent.updateSANMaps() == 0, "the map build failed");
    return true;
  };

  const std::size_t residentBefore = residentBytes();
  const std::size_t empty = allocatedBytes();
  scan();
  const std::size_t scanned = allocatedBytes();
  build();
  const std::size_t built = allocatedBytes();
  const std::size_t resident = residentBytes() - residentBefore;
  require(agent.m_TVXHBA_StorageVolume_map.size() == units, "units are missing");

  const double libraryTime = middleTime(units, [&] {
    require(replayScan() == units, "the library tells of other units");
    return true;
  });
  const double own = middleTime(units, scan) - libraryTime;
  const double buildTime = middleTime(units, build);

  const auto perUnit = [&](std::size_t bytes) {
    return number(static_cast<double>(bytes) / static_cast<double>(units), 0);
  };
  Rows rows = {
      {"times", number(own, 1), number(libraryTime, 1), number(buildTime, 1), perUnit(resident)},
      {"targets of the device tree", perUnit(scanned - empty)}};
  std::size_t left = allocatedBytes();
  for (const Map_Row& map : MAPS) {
    map.clear(agent);
    const std::size_t now = allocatedBytes();
    rows.push_back({map.name, perUnit(left - now)});
    left = now;
  }
  rows.push_back({"together", perUnit(built - empty)});
  ProviderAgent::releaseRef();
  return rows;
}

// --- Enumeration ---------------------------------------------------------------------------------

struct Family {
  unsigned deviceType;
  std::vector<const char*> classes;
};

const Family FAMILIES[] = {
    {0,
     {"TVXHBA_SCSIProtocolEndpoint", "TVXHBA_LocalHostedAccessPoint", "TVXHBA_StorageVolume",
      "TVXHBA_StorageVolumeSystemDevice", "TVXHBA_SCSIInitiatorTargetStorageVolumePath"}},
    {1,
     {"TVXHBA_TapeDrive", "TVXHBA_TapeDriveSystemDevice",
      "TVXHBA_SCSIInitiatorTargetTapeDrivePath"}},
    {2,
     {"TVXHBA_StorageExtent", "TVXHBA_StorageExtentSystemDevice",
      "TVXHBA_SCSIInitiatorTargetStorageExtentPath"}},
    {12,
     {"TVXHBA_SCSIArbitraryLogicalUnit", "TVXHBA_SCSIArbitraryLogicalUnitSystemDevice",
      "TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath"}},
    {17,
     {"TVXHBA_LogicalDisk", "TVXHBA_LogicalDiskSystemDevice",
      "TVXHBA_SCSIInitiatorTargetLogicalDiskPath"}},
};

/// Has all instances of a class returned, to a server that has streamed each before the next comes;
/// how many there were.
std::size_t enumerate(host::Broker& broker, const char* className) {
  std::size_t instances = 0;
  host::Request request;
  request.path.className = className;
  request.takeInstance = [&instances](const host::Instance&) { instances++; };
  require(broker.run(request).status.ok(), className);
  return instances;
}

Rows measureClasses(const Family& family, std::size_t units) {
  const Private_Root root;
  require(tvxsim_load_text(manyUnits(units, family.deviceType).c_str()) == 0, tvxsim_last_error());
  const host::ClassCatalogue classes(host::allClasses, host::allClassCount);
  host::BrokerOptions options;
  options.classes = &classes;
  host::Broker broker(options);
  broker.load(TVX_PROVIDER_LIBRARY);
  Rows rows;
  for (const char* name : family.classes) {
    require(enumerate(broker, name) == units, name);
    const double time = middleTime(
        units, [&] { return enumerate(broker, name); }, [] { returnFreedMemory(); });
    rows.push_back({name, number(time, 1)});
  }
  broker.unload();
  return rows;
}

// --- The report ----------------------------------------------------------------------------------

void printRow(const std::vector<std::string>& cells) {
  for (const std::string& cell : cells) std::printf("| %s ", cell.c_str());
  std::printf("|\n");
}

void printHead(std::vector<std::string> head) {
  printRow(head);
  for (std::string& cell : head) cell = "---";
  printRow(head);
}

/// Growth of a time over that of the size before.
std::string ratio(const std::vector<Rows>& results, std::ptrdiff_t size, std::size_t row,
                  std::size_t cell = 1) {
  if (size == 0) return "";
  const auto time = [&](std::ptrdiff_t i) {
    return std::atof(results[static_cast<std::size_t>(i)][row][cell].c_str());
  };
  return time(size - 1) > 0 ? number(time(size) / time(size - 1), 1) : "";
}

/// The rows of several series as one: numbers are the medians, texts those of the first.
Rows middleRows(const std::vector<Rows>& series) {
  Rows middle = series.front();
  for (std::size_t row = 0; row < middle.size(); row++)
    for (std::size_t cell = 1; cell < middle[row].size(); cell++) {
      std::vector<double> values;
      for (const Rows& rows : series) values.push_back(std::atof(rows[row][cell].c_str()));
      const bool whole = middle[row][cell].find('.') == std::string::npos;
      middle[row][cell] = number(median(values), whole ? 0 : 1);
    }
  return middle;
}

/// Measures all sizes in turn, and that several times: what else the machine does meets them all.
/// The middle rows by size.
std::vector<Rows> measureInTurn(int times, const std::vector<std::size_t>& sizes,
                                const std::function<Rows(std::size_t)>& measure) {
  std::vector<std::vector<Rows>> found(sizes.size());
  for (int series = 0; series < times; series++)
    for (std::size_t i = 0; i < sizes.size(); i++)
      found[i].push_back(inChild([&] { return measure(sizes[i]); }));
  std::vector<Rows> middle;
  for (const std::vector<Rows>& series : found) middle.push_back(middleRows(series));
  return middle;
}

void printBuild(const std::vector<std::size_t>& sizes) {
  const std::vector<Rows> results = measureInTurn(repetitions.buildSeries, sizes, measureBuild);
  printHead({"Units", "Scan less the library, ms", "growth", "Library, ms", "Map build, ms",
             "growth", "Resident bytes a unit"});
  for (std::size_t i = 0; i < sizes.size(); i++) {
    const std::vector<std::string>& cells = results[i][0];
    const auto size = static_cast<std::ptrdiff_t>(i);
    printRow({std::to_string(sizes[i]), cells[1], ratio(results, size, 0, 1), cells[2], cells[3],
              ratio(results, size, 0, 3), cells[4]});
  }
  std::printf("\n");
  printHead({"Bytes a unit, of " + std::to_string(sizes.back()) + " units", "Bytes"});
  for (std::size_t row = 1; row < results.back().size(); row++) printRow(results.back()[row]);
  std::printf("\n");
}

bool has(const Family& family, const std::string& className) {
  return className.empty() ||
         std::find(family.classes.begin(), family.classes.end(), className) != family.classes.end();
}

void printClasses(const std::vector<std::size_t>& sizes, const std::string& only) {
  std::vector<std::string> head = {"Class, ms"};
  for (const std::size_t units : sizes) {
    head.push_back(std::to_string(units) + " units");
    head.push_back("growth");
  }
  printHead(head);
  for (const Family& family : FAMILIES) {
    if (!has(family, only)) continue;
    const std::vector<Rows> results =
        measureInTurn(repetitions.classSeries, sizes,
                      [&family](std::size_t units) { return measureClasses(family, units); });
    for (std::size_t i = 0; i < family.classes.size(); i++) {
      std::vector<std::string> row = {family.classes[i]};
      for (const Rows& rows : results) {
        row.push_back(rows[i][1]);
        row.push_back(ratio(results, &rows - results.data(), i));
      }
      printRow(row);
    }
  }
}

/// Starts anew with the folder of the simulated libraries told, which are opened by name.
void findLibraries(char** arguments) {
  const char* path = std::getenv("LD_LIBRARY_PATH");
  if (path != nullptr && std::string(path).starts_with(TVX_SIM_LIBRARIES)) return;
  setenv("LD_LIBRARY_PATH", TVX_SIM_LIBRARIES, 1);
  execv("/proc/self/exe", arguments);
  require(false, "cannot start anew");
}

int run(int count, char** arguments) {
  findLibraries(arguments);
  std::string part;
  std::string only;
  std::vector<std::size_t> sizes;
  for (int i = 1; i < count; i++) {
    const std::size_t units = std::strtoul(arguments[i], nullptr, 10) / 10 * 10;
    if (units > 0) sizes.push_back(units);
    if (units > 0) continue;
    if (std::string(arguments[i]) == "once") {
      repetitions = {1, 1, 1};
    } else if (std::string(arguments[i]).starts_with("TVXHBA_")) {
      only = arguments[i];
    } else {
      part = arguments[i];
    }
  }
  if (sizes.empty()) sizes = {1'000, 10'000, 100'000};
  if (part != "classes") printBuild(sizes);
  if (part != "build") printClasses(sizes, only);
  return 0;
}

}  // namespace
}  // namespace tvx::bench

int main(int count, char** arguments) {
  return tvx::bench::run(count, arguments);
}
