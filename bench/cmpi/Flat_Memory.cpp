// Asks the built library for instances over and over, and tells what the process weighs meanwhile.
//
// usage: cmpi_flat_memory [--requests N] [--every N]
// The classes that have instances are asked in turn, for instances and for names. Ends with 1 if a
// request failed, or if the last quarter weighs more than the second by over a MiB.
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <stdexcept>
#include <string>
#include <vector>

#include "Broker.h"
#include "schema/ClassData.h"

namespace tvx::bench {
namespace {

struct Choice {
  std::size_t requests = 1'000'000;
  std::size_t samples = 20;
};

std::size_t residentKilobytes() {
  std::ifstream file("/proc/self/statm");
  std::size_t total = 0;
  std::size_t resident = 0;
  file >> total >> resident;
  return resident * static_cast<std::size_t>(sysconf(_SC_PAGESIZE)) / 1024;
}

/// A folder that takes the place of the system's root for the library's files.
class Root {
 public:
  Root() {
    std::string name = (std::filesystem::temp_directory_path() / "tvx_flat_XXXXXX").string();
    if (mkdtemp(name.data()) == nullptr) throw std::runtime_error("no folder for files");
    m_Path = name;
    std::filesystem::create_directories(m_Path / "etc");
    setenv("TVX_ROOT", name.c_str(), 1);
  }
  ~Root() { std::filesystem::remove_all(m_Path); }
  Root(const Root&) = delete;
  Root& operator=(const Root&) = delete;

 private:
  std::filesystem::path m_Path;
};

std::vector<std::string> classesWithInstances(host::Broker& broker) {
  std::vector<std::string> names;
  for (std::size_t i = 0; i < host::allClassCount; ++i) {
    const char* name = host::allClasses[i].name;
    if (host::allClasses[i].isServed && !broker.enumerateInstanceNames(name).paths.empty())
      names.emplace_back(name);
  }
  return names;
}

/// Sizes over the run, and what was delivered.
struct Run {
  std::vector<std::size_t> sizes;
  std::size_t instances = 0;
  std::size_t failures = 0;

  std::size_t largest(std::size_t quarter) const {
    const auto at = [&](std::size_t i) {
      return sizes.begin() + static_cast<std::ptrdiff_t>(sizes.size() * i / 4);
    };
    return *std::max_element(at(quarter), at(quarter + 1));
  }
  bool isFlat() const { return largest(3) <= largest(1) + 1024; }
};

Run ask(host::Broker& broker, const Choice& choice) {
  const std::vector<std::string> names = classesWithInstances(broker);
  if (names.empty()) throw std::runtime_error("no class has instances");
  Run run;
  for (std::size_t i = 0; i < choice.requests; ++i) {
    const std::string& name = names[i / 2 % names.size()];
    const host::Reply reply =
        i % 2 == 0 ? broker.enumerateInstances(name) : broker.enumerateInstanceNames(name);
    run.failures += reply.status.ok() ? 0 : 1;
    run.instances += reply.instances.size() + reply.paths.size();
    if ((i + 1) % std::max<std::size_t>(choice.requests / choice.samples, 1) != 0) continue;
    run.sizes.push_back(residentKilobytes());
    std::cout << i + 1 << " requests: " << run.sizes.back() << " KiB\n" << std::flush;
  }
  return run;
}

int measure(const Choice& choice) {
  const Root root;
  const host::ClassCatalogue classes(host::allClasses, host::allClassCount);
  host::BrokerOptions options;
  options.classes = &classes;
  host::Broker broker(options);
  broker.load(TVX_PROVIDER_LIBRARY);
  const Run run = ask(broker, choice);
  std::cout << run.instances << " instances and names delivered, " << run.failures
            << " requests failed; largest of the second quarter " << run.largest(1)
            << " KiB, of the last " << run.largest(3) << " KiB\n";
  return run.isFlat() && run.failures == 0 && broker.unload().ok() ? 0 : 1;
}

Choice parse(int argc, char** argv) {
  Choice choice;
  for (int i = 1; i + 1 < argc; i += 2) {
    if (std::string(argv[i]) == "--requests") choice.requests = std::stoul(argv[i + 1]);
    if (std::string(argv[i]) == "--every")
      choice.samples = choice.requests / std::max<std::size_t>(std::stoul(argv[i + 1]), 1);
  }
  choice.samples = std::clamp<std::size_t>(choice.samples, 4, choice.requests);
  return choice;
}

}  // namespace
}  // namespace tvx::bench

int main(int argc, char** argv) {
  try {
    return tvx::bench::measure(tvx::bench::parse(argc, argv));
  } catch (const std::exception& error) {
    std::cerr << "cmpi_flat_memory: " << error.what() << "\n";
    return 2;
  }
}
