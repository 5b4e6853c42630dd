// `wwn show`, `wwn set` and `wwn restore`.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <cctype>
#include <memory>

#include "cli/Output.h"
#include "cli/Ports.h"
#include "cli/ServiceCalls.h"
#include "cli/Session.h"
#include "cli/Table.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* wwnService = "TVXHBA_FCHBAWWNService";
constexpr std::uint64_t noStatus = 65535;

struct WwnWords {
  std::string port;
  std::string wwpn;
  std::string wwnn;
  bool isVolatile = false;
  bool nonVolatile = false;
};

// ---- What a status means ----

struct StatusText {
  std::uint64_t status;
  const char* text;
};

constexpr StatusText activationTexts[] = {
    {1, "active already"},
    {5, "volatile, active after a reboot"},
    {6, "active after a reboot"},
    {7, "volatile, active after a reset of the adapter"},
    {8, "active after a reset of the adapter"},
    {noStatus, "active"},
};

std::string activationWords(std::uint64_t status) {
  for (const StatusText& row : activationTexts) {
    if (row.status == status) {
      return row.text;
    }
  }
  return fmt::format("status {}", status);
}

// ---- Showing ----

struct Kind {
  std::uint64_t type;
  const char* name;
};

constexpr Kind kinds[] = {
    {3, "current"}, {4, "configured"}, {0, "volatile"}, {1, "non-volatile"}, {2, "factory"}};

struct NamesRow {
  const char* kind;
  std::uint64_t result = 0;
  std::uint64_t status = 0;
  std::string wwpn;
  std::string wwnn;
};

/// What there is to say of one kind beside its names.
std::string noteOf(const NamesRow& row) {
  constexpr std::uint64_t doNotExist = 9;
  constexpr std::uint64_t currentIsVolatile = 3;
  if (row.result != 0) {
    return resultWords(row.result);
  }
  switch (row.status) {
    case doNotExist:
      return "none";
    case currentIsVolatile:
      return "volatile";
    case currentIsVolatile + 1:
      return "non-volatile";
    case noStatus:
      return "";
    default:
      return activationWords(row.status);
  }
}

NamesRow readNames(Session& session, const ServicePort& on, const Kind& kind) {
  constexpr std::uint64_t doNotExist = 9;
  const Reply reply =
      callOnPort(session, on, "ReadWWN", {{"Type", Value::number(CMPI_uint16, kind.type)}});
  NamesRow row{
      kind.name, resultNumber(reply), outputNumber(reply, "WWNOperationStatus", noStatus), {}, {}};
  if (row.result == 0 && row.status != doNotExist) {
    row.wwpn = outputText(reply, "WWPN");
    row.wwnn = outputText(reply, "WWNN");
  }
  return row;
}

struct CapabilityBit {
  std::uint64_t mask;
  const char* name;
};

constexpr CapabilityBit capabilityBits[] = {{4, "non-volatile"},
                                            {8, "volatile"},
                                            {0x1000, "reboot needed"},
                                            {0x2000, "reset needed"},
                                            {0x8000, "read only"}};

std::vector<std::string> capabilityWords(std::uint64_t capability) {
  std::vector<std::string> words;
  for (const CapabilityBit& bit : capabilityBits) {
    if ((capability & bit.mask) != 0) {
      words.emplace_back(bit.name);
    }
  }
  return words;
}

ExitCode showNames(Session& session, const WwnWords& words) {
  const ServicePort on = findServicePort(session, wwnService, words.port);
  const Reply reply = callOnPort(session, on, "GetWWNCapability");
  const std::vector<std::string> changeable =
      capabilityWords(outputNumber(reply, "WWNCapability", 0));
  nlohmann::ordered_json names = nlohmann::ordered_json::array();
  Table table({"NAMES", "WWPN", "WWNN", "NOTE"});
  for (const Kind& kind : kinds) {
    const NamesRow row = readNames(session, on, kind);
    names.push_back({{"kind", row.kind},
                     {"wwpn", row.wwpn},
                     {"wwnn", row.wwnn},
                     {"result", row.result},
                     {"status", row.status},
                     {"note", noteOf(row)}});
    table.add({row.kind, row.wwpn.empty() ? "-" : row.wwpn, row.wwnn.empty() ? "-" : row.wwnn,
               noteOf(row)});
  }
  if (session.options().format == Format::Json) {
    printJson(session, "wwns",
              {{"wwpn", on.wwpn}, {"changeable", changeable}, {"names", std::move(names)}});
  } else {
    session.out() << table.text()
                  << fmt::format("can change: {}\n",
                                 changeable.empty()
                                     ? "nothing"
                                     : fmt::format("{}", fmt::join(changeable, ", ")));
  }
  return ExitCode::Ok;
}

// ---- Changing ----

/// Sixteen digits of a name in any usual spelling. Throws CommandError (BadArgument).
std::string digitsOf(const std::string& words) {
  std::string digits;
  for (const char c : words) {
    if (c != ':' && c != '-') {
      digits += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    }
  }
  if (digits.size() != 16 || digits.find_first_not_of("0123456789ABCDEF") != std::string::npos) {
    throw CommandError(ExitCode::BadArgument,
                       fmt::format("'{}' is no World Wide Name: 16 hexadecimal digits are needed, "
                                   "with or without colons",
                                   words));
  }
  return digits;
}

ExitCode setNames(Session& session, const WwnWords& words) {
  const std::string wwpn = digitsOf(words.wwpn);
  const std::string wwnn = digitsOf(words.wwnn);
  const ServicePort on = findServicePort(session, wwnService, words.port);
  const Reply reply =
      callOnPort(session, on, "ChangeWWN",
                 {{"NewWWPN", Value::string(wwpn)},
                  {"NewWWNN", Value::string(wwnn)},
                  {"Type", Value::number(CMPI_uint16, words.isVolatile ? 0U : 1U)}});
  const std::uint64_t result = resultNumber(reply);
  const std::uint64_t status = outputNumber(reply, "WWNOperationStatus", noStatus);
  const std::string said = result == 0 ? fmt::format("new names {} {}: {}", wwnText(wwpn),
                                                     wwnText(wwnn), activationWords(status))
                                       : resultWords(result);
  return tellOutcome(session, "change", on.wwpn, result, said, {{"status", status}});
}

/// A failed restore shows in its status alone.
ExitCode restoreNames(Session& session, const WwnWords& words) {
  const ServicePort on = findServicePort(session, wwnService, words.port);
  const Reply reply =
      callOnPort(session, on, "RestoreWWN",
                 {{"Type", Value::number(CMPI_uint16, words.nonVolatile ? 1U : 0U)}});
  const std::uint64_t result = resultNumber(reply);
  const std::uint64_t status = outputNumber(reply, "WWNOperationStatus", noStatus);
  const bool failed = result == 0 && status == noStatus;
  const std::string what = words.nonVolatile ? "non-volatile names" : "factory names";
  std::string said = resultWords(result);
  if (failed) {
    said = "the names were not restored";
  } else if (result == 0) {
    said = fmt::format("{}: {}", what, activationWords(status));
  }
  const ExitCode code =
      tellOutcome(session, "restore", on.wwpn, result, said, {{"status", status}});
  return failed ? ExitCode::MethodResult : code;
}

}  // namespace

void addWwnCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<WwnWords>();
  CLI::App* wwn = app.add_subcommand("wwn", "World Wide Names of a port");
  wwn->require_subcommand(1);
  CLI::App* show = wwn->add_subcommand("show", "names of every kind, and what can be changed");
  show->add_option("PORT", words->port, portWords)->required();
  choose(show, "wwn show", [words](Session& session) { return showNames(session, *words); });
  CLI::App* set = wwn->add_subcommand("set", "give a port new names");
  set->add_option("PORT", words->port, portWords)->required();
  set->add_option("WWPN", words->wwpn, "its new port name")->required();
  set->add_option("WWNN", words->wwnn, "its new node name")->required();
  set->add_flag("--volatile", words->isVolatile, "until the machine or the adapter is off");
  choose(set, "wwn set", [words](Session& session) { return setNames(session, *words); });
  CLI::App* restore = wwn->add_subcommand("restore", "go back to the names of the factory");
  restore->add_option("PORT", words->port, portWords)->required();
  restore->add_flag("--non-volatile", words->nonVolatile, "to the non-volatile names instead");
  choose(restore, "wwn restore",
         [words](Session& session) { return restoreNames(session, *words); });
}

}  // namespace tvx::host
