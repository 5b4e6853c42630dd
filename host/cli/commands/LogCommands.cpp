// `log`, `driverlog`: the provider's record log and the driver's lines of the system log.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <charconv>
#include <filesystem>
#include <memory>
#include <optional>

#include "cli/Output.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Table.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* logClass = "TVXHBA_RecordLog";
constexpr const char* providerLogPrefix = "TVXHBA:ProviderLog:";
constexpr const char* driverLogPrefix = "TVX: FC Driver Record Log:";
/// The log file until a path is set; only first failures are written to it.
constexpr const char* firstFailureFile = "torvex_fc_provider_ffdc.log";

constexpr std::uint16_t enabledState = 2;
constexpr std::uint16_t disabledState = 3;
constexpr std::uint64_t allLevels = 5;

/// A number that people know by a name.
struct NamedNumber {
  std::uint64_t number;
  const char* name;
};

constexpr NamedNumber levels[] = {{1, "crit"}, {2, "warn"}, {3, "err"}, {4, "info"}, {5, "dbg"}};
constexpr NamedNumber modes[] = {{0, "off"}, {1, "memory"}, {2, "file"}, {3, "none"}, {4, "both"}};
constexpr std::uint64_t modeOff = 0;
constexpr std::uint64_t modeMemory = 1;
constexpr std::uint64_t modeFile = 2;
constexpr std::uint64_t modeBoth = 4;

template <std::size_t N>
std::string nameOf(const NamedNumber (&names)[N], std::uint64_t number) {
  for (const NamedNumber& each : names) {
    if (each.number == number) {
      return each.name;
    }
  }
  return std::to_string(number);
}

/// Reads a name or its number, from `lowest` on.
template <std::size_t N>
std::uint64_t numberOf(const NamedNumber (&names)[N], const std::string& words,
                       std::uint64_t lowest, const char* what) {
  std::string known;
  for (const NamedNumber& each : names) {
    if (each.number < lowest) {
      continue;
    }
    if (words == each.name || words == std::to_string(each.number)) {
      return each.number;
    }
    known += fmt::format("{}{} ({})", known.empty() ? "" : ", ", each.name, each.number);
  }
  throw CommandError(ExitCode::BadArgument,
                     fmt::format("there is no log {} '{}'; take one of: {}", what, words, known));
}

// ---- The logs ----

Instance logOf(Session& session, const char* prefix, const char* what) {
  for (Instance& each : instancesOf(session, logClass)) {
    if (each.text("InstanceID").starts_with(prefix)) {
      return std::move(each);
    }
  }
  throw CommandError(
      ExitCode::NotFound,
      fmt::format("there is no {}; is there an adapter? 'tvxcim ports' shows them", what));
}

Instance providerLog(Session& session) {
  return logOf(session, providerLogPrefix, "provider log");
}

Instance driverLog(Session& session) {
  return logOf(session, driverLogPrefix, "driver log");
}

std::uint64_t numberIn(const Instance& log, const char* property) {
  const Value* value = log.properties.find(property);
  return value == nullptr || value->isNull() ? 0 : value->asUnsigned();
}

bool isEnabled(const Instance& log) {
  return numberIn(log, "EnabledState") == enabledState;
}

bool writesFirstFailures(const Instance& log) {
  return log.text("TracePath").ends_with(firstFailureFile);
}

/// Calls a method of a log; `what` is what was wanted.
void act(Session& session, const Instance& log, const char* method, NamedValues arguments,
         const std::string& what) {
  const std::uint64_t result =
      resultNumber(callMethod(session, log.path, method, std::move(arguments)));
  if (result != 0) {
    throw CommandError(
        ExitCode::MethodResult,
        fmt::format("the provider did not {}: {} answered {}", what, method, result));
  }
}

void changeState(Session& session, const Instance& log, std::uint16_t state) {
  act(session, log, "RequestStateChange", {{"RequestedState", Value::number(CMPI_uint16, state)}},
      state == enabledState ? "enable the log" : "disable the log");
}

// ---- Printing ----

/// "2026-11-21 06:35:12" of a CIM timestamp; other texts as they stand.
std::string timeWords(const std::string& cim) {
  const bool isStamp =
      cim.size() == 25 && cim[14] == '.' &&
      std::all_of(cim.begin(), cim.begin() + 14, [](char c) { return c >= '0' && c <= '9'; });
  if (!isStamp) {
    return cim;
  }
  return fmt::format("{}-{}-{} {}:{}:{}", cim.substr(0, 4), cim.substr(4, 2), cim.substr(6, 2),
                     cim.substr(8, 2), cim.substr(10, 2), cim.substr(12, 2));
}

nlohmann::ordered_json logJson(const Instance& log) {
  nlohmann::ordered_json json = {{"name", log.text("Name")}, {"enabled", isEnabled(log)}};
  if (!log.text("LogMode").empty()) {
    json["level"] = numberIn(log, "LogLevel");
    json["mode"] = nameOf(modes, numberIn(log, "LogMode"));
    json["path"] = log.text("TracePath");
    json["firstFailuresOnly"] = writesFirstFailures(log);
  }
  return json;
}

nlohmann::ordered_json recordJson(const Instance& record) {
  nlohmann::ordered_json json = {{"id", record.text("RecordID")},
                                 {"text", record.text("RecordData")}};
  if (!record.text("CreationTimeStamp").empty()) {
    json["time"] = record.text("CreationTimeStamp");
    json["level"] = record.text("LogLevel");
  }
  return json;
}

/// Level and mode as the log is set, and where its file is.
void printSettings(Session& session, const Instance& log) {
  const std::uint64_t level = numberIn(log, "LogLevel");
  session.out() << fmt::format(
      "state  {}\nlevel  {}\nmode   {}\npath   {}{}\n", isEnabled(log) ? "enabled" : "disabled",
      level == 0 ? "not set" : nameOf(levels, level), nameOf(modes, numberIn(log, "LogMode")),
      log.text("TracePath"), writesFirstFailures(log) ? " (first failures only)" : "");
}

/// The log as it is now, after a change.
ExitCode printLog(Session& session) {
  const Instance log = providerLog(session);
  if (session.options().format == Format::Json) {
    printJson(session, "log", logJson(log));
  } else {
    printSettings(session, log);
  }
  return ExitCode::Ok;
}

struct ShowWords {
  std::optional<std::size_t> last;
};

/// The records that are to be shown: all, or the last few.
std::vector<Instance> chosenRecords(std::vector<Instance> records, const ShowWords& words,
                                    bool newestFirst) {
  const std::size_t count = std::min(words.last.value_or(records.size()), records.size());
  const std::size_t spare = records.size() - count;
  const auto begin = records.begin() + static_cast<std::ptrdiff_t>(newestFirst ? 0 : spare);
  return {begin, begin + static_cast<std::ptrdiff_t>(count)};
}

void printRecords(Session& session, const Instance& log, const std::vector<Instance>& records) {
  nlohmann::ordered_json json = logJson(log);
  nlohmann::ordered_json& list = json["records"] = nlohmann::ordered_json::array();
  for (const Instance& record : records) {
    list.push_back(recordJson(record));
  }
  printJson(session, "log", std::move(json));
}

// ---- log ----

ExitCode showLog(Session& session, const ShowWords& words) {
  const Instance log = providerLog(session);
  const std::vector<Instance> records =
      chosenRecords(instancesOf(session, "TVXHBA_LogEntry"), words, false);
  if (session.options().format == Format::Json) {
    printRecords(session, log, records);
    return ExitCode::Ok;
  }
  printSettings(session, log);
  if (records.empty()) {
    session.out() << "no records in memory\n";
    return ExitCode::Ok;
  }
  Table table({"Record", "Time", "Level", "Text"});
  for (const Instance& record : records) {
    std::uint64_t level = 0;
    const std::string number = record.text("LogLevel");
    std::from_chars(number.data(), number.data() + number.size(), level);
    table.add({record.text("RecordID"), timeWords(record.text("CreationTimeStamp")),
               nameOf(levels, level), record.text("RecordData")});
  }
  session.out() << "\n" << table.text();
  return ExitCode::Ok;
}

ExitCode clearLog(Session& session) {
  act(session, providerLog(session), "ClearLog", {}, "clear the log");
  return printLog(session);
}

ExitCode enableLog(Session& session) {
  changeState(session, providerLog(session), enabledState);
  const Instance log = providerLog(session);
  if (writesFirstFailures(log) && session.options().format != Format::Json) {
    session.out() << "no path is set yet, so first failures alone are logged; "
                     "'tvxcim log path FILE' sets one\n";
  }
  return printLog(session);
}

ExitCode disableLog(Session& session) {
  changeState(session, providerLog(session), disabledState);
  return printLog(session);
}

/// What SetLogParams is to set.
struct LogParams {
  std::uint64_t level;
  std::uint64_t mode;
  std::string path;
};

/// As they are now, made good where the log was never configured.
LogParams presentParams(const Instance& log) {
  LogParams params{numberIn(log, "LogLevel"), numberIn(log, "LogMode"), log.text("TracePath")};
  params.level = params.level == 0 ? allLevels : params.level;
  params.mode = params.mode == modeOff ? modeMemory : params.mode;
  return params;
}

ExitCode setParams(Session& session, const Instance& log, const LogParams& params) {
  const bool toFile = params.mode == modeFile || params.mode == modeBoth;
  if (toFile && (params.path.empty() || params.path.ends_with(firstFailureFile))) {
    throw CommandError(ExitCode::BadArgument,
                       "the log has no file yet; 'tvxcim log path FILE' sets one");
  }
  act(session, log, "SetLogParams",
      {{"LogLevel", Value::number(CMPI_uint16, params.level)},
       {"LogMode", Value::number(CMPI_uint16, params.mode)},
       {"TracePath", Value::string(params.path)}},
      toFile ? fmt::format("take these parameters; can '{}' be written?", params.path)
             : std::string("take these parameters"));
  return printLog(session);
}

using LogWord = std::shared_ptr<std::optional<std::string>>;

ExitCode levelOfLog(Session& session, const LogWord& word) {
  if (!*word) {
    return printLog(session);
  }
  const std::uint64_t level = numberOf(levels, **word, 1, "level");
  const Instance log = providerLog(session);
  LogParams params = presentParams(log);
  params.level = level;
  return setParams(session, log, params);
}

ExitCode modeOfLog(Session& session, const LogWord& word) {
  if (!*word) {
    return printLog(session);
  }
  const std::uint64_t mode = numberOf(modes, **word, modeMemory, "mode");
  const Instance log = providerLog(session);
  LogParams params = presentParams(log);
  params.mode = mode;
  return setParams(session, log, params);
}

/// A log that had no file gets the mode that writes one.
ExitCode pathOfLog(Session& session, const LogWord& word) {
  if (!*word) {
    return printLog(session);
  }
  const Instance log = providerLog(session);
  LogParams params = presentParams(log);
  params.path = std::filesystem::absolute(**word).string();
  if (params.mode == modeMemory) {
    params.mode = modeBoth;
  } else if (params.mode != modeBoth) {
    params.mode = modeFile;
  }
  return setParams(session, log, params);
}

// ---- driverlog ----

/// Reads the system log by enabling the driver's log, and puts the logs back as they were: the two
/// share one switch.
ExitCode showDriverLog(Session& session, const ShowWords& words) {
  const bool wasOn = isEnabled(providerLog(session));
  const bool driverWasOn = isEnabled(driverLog(session));
  changeState(session, driverLog(session), enabledState);
  const Instance log = driverLog(session);
  const std::vector<Instance> lines =
      chosenRecords(instancesOf(session, "TVXHBA_FCDriverLogEntry"), words, true);
  if (!wasOn) {
    changeState(session, log, disabledState);
  } else if (!driverWasOn) {
    act(session, log, "ClearLog", {}, "clear the log");
  }
  if (session.options().format == Format::Json) {
    printRecords(session, log, lines);
    return ExitCode::Ok;
  }
  if (lines.empty()) {
    session.out() << "no lines of the driver in the system log\n";
    return ExitCode::Ok;
  }
  Table table({"Record", "Text"});
  for (const Instance& line : lines) {
    table.add({line.text("RecordID"), line.text("RecordData")});
  }
  session.out() << table.text();
  return ExitCode::Ok;
}

ExitCode printDriverLog(Session& session) {
  const Instance log = driverLog(session);
  const std::uint64_t records = numberIn(log, "CurrentNumberOfRecords");
  if (session.options().format == Format::Json) {
    nlohmann::ordered_json json = logJson(log);
    json["recordCount"] = records;
    printJson(session, "log", std::move(json));
  } else {
    session.out() << fmt::format("{}, {} records\n", isEnabled(log) ? "enabled" : "disabled",
                                 records);
  }
  return ExitCode::Ok;
}

ExitCode switchDriverLog(Session& session, std::uint16_t state) {
  changeState(session, driverLog(session), state);
  return printDriverLog(session);
}

ExitCode clearDriverLog(Session& session) {
  act(session, driverLog(session), "ClearLog", {}, "clear the log");
  return printDriverLog(session);
}

// ---- The command line ----

void addShow(CLI::App& log, const CommandChooser& choose, const char* name, const char* help,
             ExitCode (*show)(Session&, const ShowWords&)) {
  auto words = std::make_shared<ShowWords>();
  CLI::App* command = log.add_subcommand("show", help);
  command->add_option("--last", words->last, "only the newest N records")->type_name("N");
  choose(command, name, [words, show](Session& session) { return show(session, *words); });
}

/// A command that shows a setting, or changes it to the word that it is given.
void addSetting(CLI::App& log, const CommandChooser& choose, const char* name, const char* word,
                const char* help, ExitCode (*run)(Session&, const LogWord&)) {
  auto words = std::make_shared<std::optional<std::string>>();
  CLI::App* command = log.add_subcommand(name, help);
  command->add_option(word, *words);
  choose(command, fmt::format("log {}", name),
         [words, run](Session& session) { return run(session, words); });
}

}  // namespace

void addLogCommands(CLI::App& app, const CommandChooser& choose) {
  CLI::App* log = app.add_subcommand("log", "record log of the provider");
  log->require_subcommand(1);
  addShow(*log, choose, "log show", "how the log is set, and its records in memory", showLog);
  choose(log->add_subcommand("clear", "drop the records and empty the log file"), "log clear",
         clearLog);
  choose(log->add_subcommand("enable", "switch the log on"), "log enable", enableLog);
  choose(log->add_subcommand("disable", "switch the log off"), "log disable", disableLog);
  addSetting(*log, choose, "level", "LEVEL", "show or set the level: crit, warn, err, info, dbg",
             levelOfLog);
  addSetting(*log, choose, "mode", "MODE",
             "show or set where records go: memory, file, both, or none", modeOfLog);
  addSetting(*log, choose, "path", "FILE", "show or set the log file", pathOfLog);

  CLI::App* driver = app.add_subcommand("driverlog", "lines of the driver in the system log");
  driver->require_subcommand(1);
  addShow(*driver, choose, "driverlog show", "read the system log and show the driver's lines",
          showDriverLog);
  choose(driver->add_subcommand("enable", "read the system log"), "driverlog enable",
         [](Session& session) { return switchDriverLog(session, enabledState); });
  choose(driver->add_subcommand("disable", "forget the lines, and switch the provider's log off"),
         "driverlog disable",
         [](Session& session) { return switchDriverLog(session, disabledState); });
  choose(driver->add_subcommand("clear", "forget the lines"), "driverlog clear", clearDriverLog);
}

}  // namespace tvx::host
