// `serve`: the provider behind a CIM-XML port, for clients of CIM servers.
#include <semaphore.h>
#include <signal.h>

#include <CLI/CLI.hpp>
#include <cerrno>
#include <memory>

#include "cli/Output.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"
#include "http/CimServer.h"
#include "http/Listener.h"

namespace tvx::host {
namespace {

sem_t endRequested;

void requestEnd(int /*signal*/) {
  sem_post(&endRequested);
}

/// While it lives, SIGINT and SIGTERM end `wait` instead of the program.
class EndSignals {
 public:
  EndSignals() {
    sem_init(&endRequested, 0, 0);
    struct sigaction action {};
    action.sa_handler = requestEnd;
    sigaction(SIGINT, &action, &m_Interrupt);
    sigaction(SIGTERM, &action, &m_Terminate);
  }
  ~EndSignals() {
    sigaction(SIGINT, &m_Interrupt, nullptr);
    sigaction(SIGTERM, &m_Terminate, nullptr);
    sem_destroy(&endRequested);
  }
  EndSignals(const EndSignals&) = delete;
  EndSignals& operator=(const EndSignals&) = delete;

  static void wait() {
    while (sem_wait(&endRequested) != 0 && errno == EINTR) {
    }
  }

 private:
  struct sigaction m_Interrupt {};
  struct sigaction m_Terminate {};
};

struct ServeWords {
  std::string address = "127.0.0.1";
  std::uint16_t port = 5988;
  std::size_t bodyLimit = http::ListenerOptions().bodyLimit;
  unsigned seconds = 30;
};

bool isLoopback(const std::string& address) {
  return address.starts_with("127.") || address == "::1";
}

void tellPlace(Session& session, const http::Listener& listener) {
  if (session.options().format == Format::Json) {
    printJson(session, "url", listener.url());
  } else {
    session.out() << "serving " << listener.url() << "; end with Ctrl-C\n";
  }
  session.out().flush();
}

ExitCode serve(Session& session, const ServeWords& words) {
  const http::CimServer server(session.broker(), session.classes(),
                               [&session](const ScopeReport& report) { session.keep(report); });
  http::ListenerOptions options;
  options.address = words.address;
  options.port = words.port;
  options.bodyLimit = words.bodyLimit;
  options.clientLimit = std::chrono::seconds(words.seconds);
  if (!isLoopback(words.address)) {
    session.err() << "tvxcim: warning: " << words.address
                  << " can be reached from other machines, and nobody is asked for a password\n";
  }
  const EndSignals signals;
  try {
    const http::Listener listener(server, options);
    tellPlace(session, listener);
    EndSignals::wait();
  } catch (const http::ListenError& error) {
    throw CommandError(ExitCode::Usage, std::string(error.what()) + "; see --address and --port");
  }
  return ExitCode::Ok;
}

}  // namespace

void addServeCommand(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<ServeWords>();
  CLI::App* command = app.add_subcommand("serve", "answer CIM-XML clients over HTTP until Ctrl-C");
  command->add_option("--port", words->port, "port, 0 for any free one (5988)");
  command->add_option("--address", words->address,
                      "address to listen on (127.0.0.1: this machine alone)");
  command->add_option("--max-body", words->bodyLimit, "largest message in bytes (67108864)");
  command->add_option("--timeout", words->seconds, "seconds a client may take for a message (30)")
      ->check(CLI::Range(1u, 3600u));
  choose(command, "serve", [words](Session& session) { return serve(session, *words); });
}

}  // namespace tvx::host
