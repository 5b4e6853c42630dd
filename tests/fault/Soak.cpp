// Many clients at once for a bounded time: every class read, every method called, settings changed,
// refreshes forced, providers cleaned up under their requests, the library unloaded and loaded
// again.
//
// usage: soak [--seconds N] [--clients N] [--strict] [--report FILE]
// Ends with 1 if a reply was lost or not what a client expects, a request leaked, an unload was
// refused, nothing was refreshed, or memory kept growing.
#include <sys/select.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <fstream>
#include <iostream>
#include <list>
#include <map>
#include <mutex>
#include <random>
#include <shared_mutex>
#include <thread>

#include "Trial_Root.h"
#include "Whole_Client.h"
#include "schema/ClassData.h"
#include "tests/support/Request_Thread.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using Clock = std::chrono::steady_clock;
using host::Broker;
using host::ClassData;

struct Choice {
  std::chrono::seconds time{5};
  std::size_t clients = 6;
  bool strict = false;
  std::string report;
};

/// Everything the threads share.
struct Trial {
  Trial(const Choice& what, const host::ClassCatalogue& all) : choice(what), classes(all) {
    if (tvxsim_load(TVX_MATRIX_SCENARIO) != 0) throw std::runtime_error(tvxsim_last_error());
    host::BrokerOptions options;
    options.strict = choice.strict;
    options.classes = &classes;
    broker = std::make_unique<Broker>(options);
    broker->load(TVX_PROVIDER_LIBRARY);
    for (const ClassData* each : classes.all())
      if (each->isServed) served.push_back(each);
  }

  bool isOver() const { return Clock::now() >= end; }

  const Choice choice;
  const host::ClassCatalogue& classes;
  Trial_Root root;
  std::unique_ptr<Broker> broker;
  std::vector<const ClassData*> served;
  /// A request's part of the library: many at a time.
  std::shared_lock<std::shared_mutex> use() {
    const std::lock_guard<std::mutex> queue(turn);
    return std::shared_lock<std::shared_mutex>(loading);
  }
  /// The whole library. Requests that come later wait: the lock alone would let them pass for ever.
  std::unique_lock<std::shared_mutex> own() {
    const std::lock_guard<std::mutex> queue(turn);
    return std::unique_lock<std::shared_mutex>(loading);
  }

  std::mutex turn;
  std::shared_mutex loading;
  const Clock::time_point end = Clock::now() + choice.time;
  std::mutex tallyMutex;
  Client_Tally tally;
  std::atomic<std::size_t> lives{1};
  std::atomic<std::size_t> cleanUps{0};
  std::atomic<std::size_t> refusals{0};
};

std::size_t residentKilobytes() {
  std::ifstream status("/proc/self/status");
  for (std::string word; status >> word;) {
    std::size_t value = 0;
    if (word == "VmRSS:" && status >> value) return value;
  }
  return 0;
}

/// One client: mostly reads, now and then a method or a change.
void runClient(Trial& trial, unsigned seed, std::atomic<std::size_t>& beats) {
  Whole_Client client(*trial.broker, trial.classes, trial.root.files());
  const std::vector<Method_Call> calls = purposefulCalls(trial.root.files());
  std::mt19937 random(seed);
  const auto below = [&random](std::size_t n) { return random() % n; };
  while (!trial.isOver()) {
    const auto lock = trial.use();
    const std::size_t dice = below(20);
    if (dice < 14) {
      client.readClass(*trial.served[below(trial.served.size())]);
    } else if (dice < 19) {
      const Method_Call& call = calls[below(calls.size())];
      for (const char* name : {call.className, "TVXHBA_FCPort"})
        client.readClass(*trial.classes.find(name));
      client.call(call);
    } else {
      client.changeEverything();
    }
    ++beats;
  }
  const std::lock_guard<std::mutex> lock(trial.tallyMutex);
  trial.tally.add(client.tally());
}

/// Lets the cache grow older than any setting allows: time passes here as fast as it is slept.
void passHalfAnHour() {
  timeval time = {31 * 60, 0};
  select(0, nullptr, nullptr, nullptr, &time);
}

/// Cleans providers up while requests run, forces refreshes, and every so often takes the library
/// down and up again.
void runServer(Trial& trial) {
  std::mt19937 random(1);
  for (std::size_t round = 1; !trial.isOver(); ++round) {
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    const char* name = trial.served[random() % trial.served.size()]->name;
    for (const auto kind : {host::InterfaceKind::Instance, host::InterfaceKind::Association,
                            host::InterfaceKind::Method}) {
      const auto lock = trial.use();
      trial.broker->cleanup(name, kind, true);
      ++trial.cleanUps;
    }
    tvxsim_advance(1);
    if (round % 5 == 0) passHalfAnHour();
    if (round % 10 != 0) continue;
    const auto lock = trial.own();
    const host::Status status = trial.broker->unload(true);
    if (!status.ok()) {
      std::cerr << "unload: " << status.rc << " " << status.message << "\n";
      ++trial.refusals;
    }
    trial.broker->load(TVX_PROVIDER_LIBRARY);
    ++trial.lives;
  }
}

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool UNDER_SANITIZER = true;
#else
constexpr bool UNDER_SANITIZER = false;
#endif

/// Answers that a client gets when all is well. A request fails that deletes what cannot be deleted
/// or comes between the cleanup of its provider and the provider's next life, and one that makes or
/// changes something may come when a refresh has just taken that away.
const std::map<int, const char*> EXPECTED = {{CMPI_RC_OK, "succeeded"},
                                             {CMPI_RC_ERR_FAILED, "failed"},
                                             {CMPI_RC_ERR_INVALID_PARAMETER, "were refused"},
                                             {CMPI_RC_ERR_NOT_FOUND, "found nothing"},
                                             {CMPI_RC_ERR_NOT_SUPPORTED, "were not supported"},
                                             {CMPI_RC_ERR_ALREADY_EXISTS, "made what was there"}};

std::string wordsOf(int status, const Client_Tally& tally) {
  const auto known = EXPECTED.find(status);
  return known != EXPECTED.end()
             ? known->second
             : "had status " + std::to_string(status) + " (" + tally.examples.at(status) + ")";
}

bool isExpected(const Client_Tally& tally) {
  return std::all_of(tally.byStatus.begin(), tally.byStatus.end(),
                     [](const auto& each) { return EXPECTED.count(each.first) != 0; });
}

/// How often the adapters were read anew, the first time of each life among them.
unsigned long refreshes() {
  return tvxsim_calls("HBA_GetNumberOfAdapters", nullptr);
}

/// Resident sizes over the time of the trial, in KiB.
struct Memory {
  std::size_t warm = 0;  ///< the largest of the second quarter
  std::size_t last = 0;  ///< the largest of the last quarter

  /// Sanitizers keep freed memory and a history of their own, so only the plain build can tell.
  bool isFlat() const { return UNDER_SANITIZER || last <= warm + warm / 10 + 4096; }
};

/// Watches clients and memory; false if a client stood still for half a minute.
bool watch(const Trial& trial, std::vector<std::atomic<std::size_t>>& beats, Memory& memory) {
  const Clock::time_point start = Clock::now();
  std::vector<std::size_t> seen(beats.size(), 0);
  std::vector<Clock::time_point> since(beats.size(), start);
  while (!trial.isOver()) {
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    const Clock::time_point now = Clock::now();
    const auto part = 4 * (now - start) / (trial.end - start);
    const std::size_t size = residentKilobytes();
    if (part == 1) memory.warm = std::max(memory.warm, size);
    if (part == 3) memory.last = std::max(memory.last, size);
    for (std::size_t i = 0; i < beats.size(); ++i) {
      if (beats[i] != seen[i]) since[i] = now;
      seen[i] = beats[i];
      if (now - since[i] > std::chrono::seconds(30)) return false;
    }
  }
  return true;
}

void writeReport(std::ostream& out, const Trial& trial, const Memory& memory) {
  out << "| What | Figure |\n|---|---|\n"
      << "| Clients | " << trial.choice.clients << " |\n"
      << "| Seconds | " << trial.choice.time.count() << " |\n"
      << "| Requests answered | " << trial.tally.requests << " |\n";
  for (const auto& [status, number] : trial.tally.byStatus)
    out << "| Of these " << wordsOf(status, trial.tally) << " | " << number << " |\n";
  out << "| Answers without an end | " << trial.tally.lost.size() << " |\n"
      << "| Methods called | " << trial.tally.methods << " |\n"
      << "| Instances delivered | " << trial.tally.instances << " |\n"
      << "| Providers cleaned up under way | " << trial.cleanUps << " |\n"
      << "| Lives of the library | " << trial.lives << " |\n"
      << "| Refreshes of its cache | " << refreshes() << " |\n"
      << "| Unloads refused | " << trial.refusals << " |\n"
      << "| Requests that leaked | " << trial.tally.leaks.size() << " |\n"
      << "| Resident, second quarter, KiB | " << memory.warm << " |\n"
      << "| Resident, last quarter, KiB | " << memory.last << " |\n";
}

int runSoak(const Choice& choice) {
  const host::ClassCatalogue classes(host::allClasses, host::allClassCount);
  Trial trial(choice, classes);
  std::vector<std::atomic<std::size_t>> beats(choice.clients);
  std::list<Request_Thread> threads;
  for (std::size_t i = 0; i < choice.clients; ++i)
    threads.emplace_back(
        [&trial, &beats, i] { runClient(trial, 100U + static_cast<unsigned>(i), beats[i]); });
  std::thread server([&trial] { runServer(trial); });
  Memory memory;
  if (!watch(trial, beats, memory)) {
    std::cerr << "soak: a client has had no reply for 30 s\n";
    std::abort();  // where the threads stand is told by the core file
  }
  threads.clear();
  server.join();
  const bool unloaded = trial.broker->unload(true).ok();
  for (const std::string& leak : trial.tally.leaks) std::cerr << leak << "\n";
  for (const std::string& lost : trial.tally.lost) std::cerr << "without an end: " << lost << "\n";
  writeReport(std::cout, trial, memory);
  if (!choice.report.empty()) {
    std::ofstream report(choice.report);
    writeReport(report, trial, memory);
  }
  const bool good = unloaded && trial.refusals == 0 && trial.tally.leaks.empty() &&
                    trial.tally.lost.empty() && isExpected(trial.tally) && refreshes() > 0 &&
                    memory.isFlat() && trial.tally.requests > 0;
  std::cout << (good ? "good\n" : "NOT good\n");
  return good ? 0 : 1;
}

Choice parse(int argc, char** argv) {
  Choice choice;
  for (int i = 1; i < argc; ++i) {
    const std::string name = argv[i];
    if (name == "--strict") choice.strict = true;
    if (i + 1 == argc) continue;
    if (name == "--seconds") choice.time = std::chrono::seconds(std::stol(argv[i + 1]));
    if (name == "--clients") choice.clients = std::stoul(argv[i + 1]);
    if (name == "--report") choice.report = argv[i + 1];
  }
  return choice;
}

}  // namespace
}  // namespace tvx::test

int main(int argc, char** argv) {
  try {
    return tvx::test::runSoak(tvx::test::parse(argc, argv));
  } catch (const std::exception& error) {
    std::cerr << "soak: " << error.what() << "\n";
    return 2;
  }
}
