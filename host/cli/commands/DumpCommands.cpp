// `dump create`, `dump list`, `dump delete` and `dump keep`.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <memory>

#include "cli/Output.h"
#include "cli/Ports.h"
#include "cli/ServiceCalls.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* dumpService = "TVXHBA_DumpService";
constexpr const char* settingsClass = "TVXHBA_DumpData";
constexpr std::uint32_t fewestKept = 1;
constexpr std::uint32_t mostKept = 20;

struct DumpWords {
  std::string port;
  std::uint32_t count = 0;
};

ExitCode runDumpMethod(Session& session, const DumpWords& words, const char* method,
                       const char* done) {
  const ServicePort on = findServicePort(session, dumpService, words.port);
  const std::uint64_t result = resultNumber(callOnPort(session, on, method));
  return tellOutcome(session, "dump", on.wwpn, result, result == 0 ? done : resultWords(result));
}

/// The settings of a port's dumps. Throws CommandError (NotFound).
Instance settingsOf(Session& session, const Instance& port) {
  for (Instance& each : instancesOf(session, settingsClass)) {
    if (each.text("ElementName") == port.text("DeviceID")) {
      return std::move(each);
    }
  }
  throw CommandError(ExitCode::NotFound, "the provider has no dump settings of this port");
}

ExitCode listDumps(Session& session, const DumpWords& words) {
  const ServicePort on = findServicePort(session, dumpService, words.port);
  const Reply reply = callOnPort(session, on, "GetDumpFileNames");
  if (const std::uint64_t result = resultNumber(reply); result != 0) {
    return tellOutcome(session, "dumps", on.wwpn, result, resultWords(result));
  }
  const Instance settings = settingsOf(session, on.port);
  const Value* const files = reply.outputs.find("DumpFiles");
  const std::vector<std::string> names =
      files == nullptr || files->isNull() ? std::vector<std::string>() : files->asTextList();
  if (session.options().format == Format::Json) {
    printJson(session, "dumps",
              {{"wwpn", on.wwpn},
               {"directory", settings.text("DumpDirectory")},
               {"keep", settings.property("RetentionCount").asUnsigned()},
               {"files", names}});
    return ExitCode::Ok;
  }
  for (const std::string& name : names) {
    session.out() << settings.text("DumpDirectory") << '/' << name << '\n';
  }
  if (names.empty()) {
    session.out() << on.wwpn << ": no dumps\n";
  }
  return ExitCode::Ok;
}

ExitCode keepDumps(Session& session, const DumpWords& words) {
  const Instance port = findPort(session, words.port);
  const Instance settings = settingsOf(session, port);
  Request request;
  request.operation = Operation::ModifyInstance;
  request.path = settings.path;
  request.instance.properties.set("InstanceID", Value::string(settings.text("InstanceID")));
  request.instance.properties.set("ElementName", Value::string(settings.text("ElementName")));
  request.instance.properties.set("RetentionCount", Value::number(CMPI_uint32, words.count));
  request.properties = {"RetentionCount"};
  session.run(request);
  return tellOutcome(session, "dump", wwnText(port.text("DeviceID")), 0,
                     fmt::format("at most {} dumps are kept", words.count),
                     {{"keep", words.count}});
}

}  // namespace

void addDumpCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<DumpWords>();
  CLI::App* dump = app.add_subcommand("dump", "dumps of a port's adapter");
  dump->require_subcommand(1);
  CLI::App* create = dump->add_subcommand("create", "write a dump");
  CLI::App* list = dump->add_subcommand("list", "list the dump files");
  CLI::App* remove = dump->add_subcommand("delete", "remove the dump files");
  CLI::App* keep = dump->add_subcommand("keep", "set how many dumps are kept");
  for (CLI::App* command : {create, list, remove, keep}) {
    command->add_option("PORT", words->port, portWords)->required();
  }
  keep->add_option("N", words->count, "number of dumps")
      ->required()
      ->check(CLI::Range(fewestKept, mostKept));
  choose(create, "dump create", [words](Session& session) {
    return runDumpMethod(session, *words, "GenerateDump", "a dump was written");
  });
  choose(list, "dump list", [words](Session& session) { return listDumps(session, *words); });
  choose(remove, "dump delete", [words](Session& session) {
    return runDumpMethod(session, *words, "DeleteDump", "the dumps were removed");
  });
  choose(keep, "dump keep", [words](Session& session) { return keepDumps(session, *words); });
}

}  // namespace tvx::host
