// `stats`: the counters of the FC ports, once or again and again.
#include <CLI/CLI.hpp>
#include <cmath>
#include <csignal>
#include <ctime>
#include <memory>

#include "cli/Output.h"
#include "cli/Ports.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Stats.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

/// Keeps the signals that end a program from ending it while it lives, so that the library is
/// unloaded as it should be: a pause notices them. Threads that start meanwhile leave them alone
/// too. Once one has come, more of them (timeout(1) sends two) do not end the program either.
class EndingSignals {
 public:
  EndingSignals() {
    sigemptyset(&m_Signals);
    sigaddset(&m_Signals, SIGINT);
    sigaddset(&m_Signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &m_Signals, &m_Before);
  }
  ~EndingSignals() {
    if (!m_Came) {
      pthread_sigmask(SIG_SETMASK, &m_Before, nullptr);
    }
  }
  EndingSignals(const EndingSignals&) = delete;
  EndingSignals& operator=(const EndingSignals&) = delete;

  /// Waits so long. False if a signal came instead.
  bool pause(double seconds) {
    constexpr double nanosecondsPerSecond = 1e9;
    double whole = 0;
    const double rest = std::modf(seconds, &whole);
    const timespec time = {static_cast<time_t>(whole),
                           static_cast<long>(rest * nanosecondsPerSecond)};
    m_Came = sigtimedwait(&m_Signals, nullptr, &time) > 0;
    return !m_Came;
  }

 private:
  sigset_t m_Signals;
  sigset_t m_Before;
  bool m_Came = false;
};

struct StatsWords {
  std::string port;
  double watch = 0;         ///< seconds between two samples; 0: one sample
  std::uint64_t count = 0;  ///< samples with --watch; 0: until a signal comes
  /// With --watch: from the moment that the word is read, which is before the library is loaded.
  std::unique_ptr<EndingSignals> signals;
};

void printSample(Session& session, const std::string& wwpn, StatsRates& rates, bool watching) {
  const std::vector<StatsRow> rows =
      rates.add(statsSamples(instancesOf(session, "TVXHBA_FCPortStatistics"), wwpn));
  if (session.options().format == Format::Json) {
    printJson(session, "ports", statsJson(rows, watching));
  } else {
    session.out() << statsTable(rows, watching);
  }
  session.out().flush();
}

ExitCode showStats(Session& session, const StatsWords& words) {
  const bool watching = words.watch > 0;
  const std::string wwpn =
      words.port.empty() ? std::string() : wwnText(findPort(session, words.port).text("DeviceID"));
  StatsRates rates;
  printSample(session, wwpn, rates, watching);
  for (std::uint64_t shown = 1; watching && (words.count == 0 || shown < words.count); ++shown) {
    if (!words.signals->pause(words.watch)) {
      break;
    }
    printSample(session, wwpn, rates, watching);
  }
  return ExitCode::Ok;
}

}  // namespace

void addStatsCommands(CLI::App& app, const CommandChooser& choose) {
  constexpr double shortest = 0.1;
  constexpr double aDay = 86400;
  auto words = std::make_shared<StatsWords>();
  CLI::App* stats = app.add_subcommand("stats", "counters of the FC ports, and their rates");
  stats->add_option("PORT", words->port, portWords);
  CLI::Option* watch =
      stats->add_option("--watch", words->watch, "seconds between two samples, with rates")
          ->check(CLI::Range(shortest, aDay))
          ->each([words = words.get()](const std::string&) {
            words->signals = std::make_unique<EndingSignals>();
          });
  stats->add_option("--count", words->count, "end after so many samples")
      ->needs(watch)
      ->check(CLI::PositiveNumber);
  choose(stats, "stats", [words](Session& session) { return showStats(session, *words); });
}

}  // namespace tvx::host
