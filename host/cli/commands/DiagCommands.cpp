// `diag`: the diagnostic tests of the ports, run and read.
#include <fmt/format.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <chrono>
#include <memory>
#include <set>

#include "cli/Arguments.h"
#include "cli/Output.h"
#include "cli/Ports.h"
#include "cli/Progress.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Table.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* testClass = "TVXHBA_FCHBADiagnosticTest";
constexpr const char* testSettingClass = "TVXHBA_FCHBADiagnosticSettingData";
constexpr const char* jobSettingClass = "TVXHBA_JobSettingData";
constexpr const char* completionClass = "TVXHBA_DiagnosticCompletionRecord";
constexpr const char* jobClass = "TVXHBA_ConcreteJob";
constexpr std::uint64_t completedWell = 2;
constexpr std::uint64_t jobCompleted = 7;

struct DiagWords {
  std::string test;
  std::string port;
  std::vector<std::string> settings;
  bool deleteJob = false;
};

// ---- Tests

/// "external-loopback" for "TVX:FCHBA External Loopback Test"; other names as they are.
std::string shortName(const std::string& name) {
  const std::string head = "TVX:FCHBA ";
  const std::string tail = " Test";
  if (!name.starts_with(head) || !name.ends_with(tail)) {
    return name;
  }
  std::string word = name.substr(head.size(), name.size() - head.size() - tail.size());
  for (char& c : word) {
    c = c == ' ' ? '-' : static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  }
  return word;
}

Instance findTest(Session& session, const std::string& words) {
  std::vector<std::string> known;
  for (Instance& test : instancesOf(session, testClass)) {
    const std::string name = test.text("Name");
    if (sameName(name, words) || sameName(shortName(name), words)) {
      return std::move(test);
    }
    known.push_back(shortName(name));
  }
  throw CommandError(
      ExitCode::NotFound,
      known.empty()
          ? "there are no tests; is there an adapter? 'tvxcim ports' shows them"
          : fmt::format("there is no test '{}'; the tests are {}", words, fmt::join(known, ", ")));
}

/// The text of an instance of another class that belongs to the test of that name.
std::string textOf(const std::vector<Instance>& instances, const char* key, const std::string& name,
                   const char* property) {
  for (const Instance& each : instances) {
    if (each.text(key) == name) {
      const Value& value = each.property(property);
      return value.isArray() && !value.isNull()
                 ? fmt::format("{}", fmt::join(value.asTextList(), " "))
                 : value.display();
    }
  }
  return {};
}

ExitCode listTests(Session& session) {
  const auto helps = instancesOf(session, "TVXHBA_HelpService");
  const auto identities = instancesOf(session, "TVXHBA_DiagnosticIdentity");
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  Table table({"Test", "Name", "Version", "Description"});
  for (const Instance& test : instancesOf(session, testClass)) {
    const std::string name = test.text("Name");
    const std::string version = textOf(identities, "Name", name, "VersionString");
    const std::string description = textOf(helps, "Name", name, "DocumentDescriptions");
    list.push_back({{"test", shortName(name)},
                    {"name", name},
                    {"version", version},
                    {"description", description}});
    table.add({shortName(name), name, version, description});
  }
  if (session.options().format == Format::Json) {
    printJson(session, "tests", std::move(list));
  } else if (table.rows() == 0) {
    session.out() << "no tests; is there an adapter? 'tvxcim ports' shows them\n";
  } else {
    session.out() << table.text();
  }
  return ExitCode::Ok;
}

// ---- Results

/// A test passed if its record says so in state and in words: a beacon that failed after its first
/// round is marked as done.
bool passed(const Instance& record) {
  const Value& state = record.property("CompletionState");
  return !state.isNull() && state.asUnsigned() == completedWell &&
         record.text("RecordData").find("Resulted with Failure") == std::string::npos;
}

nlohmann::ordered_json recordJson(const Instance& record) {
  nlohmann::ordered_json json = {{"job", record.text("InstanceID")},
                                 {"test", shortName(record.text("ServiceName"))},
                                 {"element", record.text("ManagedElementName")},
                                 {"passed", passed(record)},
                                 {"time", record.text("CreationTimeStamp")},
                                 {"text", record.text("RecordData")}};
  for (const char* count : {"LoopsPassed", "LoopsFailed", "CompletedCycles", "TimeToExecute"}) {
    // Tests that run no cycles leave some of them out.
    const Value* const value = record.properties.find(count);
    const bool isTold = value != nullptr && !value->isNull();
    json[count] = isTold ? nlohmann::ordered_json(value->asUnsigned()) : nlohmann::ordered_json();
  }
  return json;
}

ExitCode printResults(Session& session) {
  const std::vector<Instance> records = instancesOf(session, completionClass);
  if (session.options().format == Format::Json) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const Instance& record : records) {
      list.push_back(recordJson(record));
    }
    printJson(session, "results", std::move(list));
    return ExitCode::Ok;
  }
  if (records.empty()) {
    session.out() << "no results; they last as long as the provider stays loaded\n";
    return ExitCode::Ok;
  }
  Table table({"Job", "Outcome", "Loops passed", "Loops failed", "Result"});
  for (const Instance& record : records) {
    table.add({record.text("InstanceID"), passed(record) ? "passed" : "failed",
               record.text("LoopsPassed"), record.text("LoopsFailed"), record.text("RecordData")});
  }
  session.out() << table.text();
  return ExitCode::Ok;
}

ExitCode clearResults(Session& session, const DiagWords& words) {
  const std::string wanted =
      words.test.empty() ? std::string() : findTest(session, words.test).text("Name");
  std::uint64_t cleared = 0;
  for (const Instance& log : instancesOf(session, "TVXHBA_DiagnosticsLog")) {
    if (!wanted.empty() && log.text("InstanceID") != wanted) {
      continue;
    }
    if (const std::uint64_t result = resultNumber(callMethod(session, log.path, "ClearLog", {}));
        result != 0) {
      throw CommandError(ExitCode::MethodResult,
                         fmt::format("the log of '{}' was not cleared: result {}",
                                     log.text("InstanceID"), result));
    }
    ++cleared;
  }
  if (session.options().format == Format::Json) {
    printJson(session, "cleared", cleared);
  } else {
    session.out() << fmt::format("{} log{} cleared\n", cleared, cleared == 1 ? "" : "s");
  }
  return ExitCode::Ok;
}

// ---- Running

Instance portController(Session& session, const std::string& words) {
  const std::string deviceId = findPort(session, words).text("DeviceID");
  for (Instance& controller : instancesOf(session, "TVXHBA_PortController")) {
    if (controller.text("DeviceID") == deviceId) {
      return std::move(controller);
    }
  }
  throw CommandError(ExitCode::NotFound,
                     fmt::format("there is no port controller for '{}'", words));
}

/// A pattern is typed as its digits; as a property it is their codes.
std::string settingWord(const std::string& word) {
  const std::size_t equals = word.find('=');
  if (equals == std::string::npos || !sameName(word.substr(0, equals), "BufferPattern")) {
    return word;
  }
  std::vector<int> codes;
  for (const char digit : word.substr(equals + 1)) {
    codes.push_back(static_cast<unsigned char>(digit));
  }
  return fmt::format("{}={}", word.substr(0, equals), fmt::join(codes, ","));
}

/// An embedded instance of a class with the InstanceID of the settings that it is put over.
Value settingsOf(Session& session, const char* className, const std::string& id,
                 const std::vector<std::string>& words) {
  std::vector<std::string> plain;
  std::transform(words.begin(), words.end(), std::back_inserter(plain), settingWord);
  Instance given;
  given.path.className = className;
  given.path.nameSpace = "root/torvex";
  given.path.keys.set("InstanceID", Value::string(id));
  given.properties =
      parseProperties(*session.requireClass(className), plain, session.classes(),
                      [&session](const std::string& text) { return session.resolve(text); });
  given.properties.set("InstanceID", Value::string(id));
  return Value::embedded(std::move(given));
}

NamedValues argumentsOf(Session& session, const DiagWords& words, const Instance& test,
                        const Instance& controller) {
  NamedValues arguments;
  arguments.set("ManagedElement", Value::reference(controller.path));
  if (!words.settings.empty()) {
    arguments.set("DiagnosticSettings",
                  settingsOf(session, testSettingClass, test.text("Name"), words.settings));
  }
  if (words.deleteJob) {
    const Instance shared = onlyInstanceOf(session, jobSettingClass);
    arguments.set("JobSettings", settingsOf(session, jobSettingClass, shared.text("InstanceID"),
                                            {"DeleteOnCompletion=true"}));
  }
  return arguments;
}

std::set<std::string> recordNames(Session& session) {
  std::set<std::string> names;
  for (const Instance& record : instancesOf(session, completionClass)) {
    names.insert(record.text("InstanceID"));
  }
  return names;
}

/// The record that was not there before; null if the run made none.
std::unique_ptr<Instance> newRecord(Session& session, const std::set<std::string>& before) {
  for (Instance& record : instancesOf(session, completionClass)) {
    if (!before.contains(record.text("InstanceID"))) {
      return std::make_unique<Instance>(std::move(record));
    }
  }
  return nullptr;
}

/// What a run left behind.
struct DiagOutcome {
  std::uint64_t result = 0;
  std::unique_ptr<Instance> job;     // null if there is none, or it is gone already
  std::unique_ptr<Instance> record;  // null if the run made none

  /// The method's result alone tells no more than that the test could be run.
  bool passed() const {
    return result == 0 && record != nullptr && host::passed(*record) &&
           (job == nullptr || job->text("JobState") == std::to_string(jobCompleted));
  }
};

/// The job that the reply names; null if it names none, or one that is not kept.
std::unique_ptr<Instance> namedJob(Session& session, const Reply& reply) {
  const Value* const named = reply.outputs.find("Job");
  if (named == nullptr || named->isNull()) {
    return nullptr;
  }
  for (Instance& job : instancesOf(session, jobClass)) {
    if (job.path.sameObject(named->asReference())) {
      return std::make_unique<Instance>(std::move(job));
    }
  }
  return nullptr;
}

nlohmann::ordered_json jobJson(const Instance& job) {
  return {{"id", job.text("InstanceID")},
          {"state", job.property("JobState").asUnsigned()},
          {"percent", job.property("PercentComplete").asUnsigned()}};
}

void printOutcome(Session& session, const Instance& test, const Instance& controller,
                  const DiagOutcome& outcome) {
  const Instance* const record = outcome.record.get();
  const nlohmann::ordered_json none;
  if (session.options().format == Format::Json) {
    printJson(session, "run",
              {{"test", shortName(test.text("Name"))},
               {"port", wwnText(controller.text("DeviceID"))},
               {"result", outcome.result},
               {"passed", outcome.passed()},
               {"job", outcome.job != nullptr ? jobJson(*outcome.job) : none},
               {"record", record != nullptr ? recordJson(*record) : none}});
    return;
  }
  if (record == nullptr) {
    session.out() << fmt::format("no result: the method answered {} and left no record\n",
                                 outcome.result);
    return;
  }
  session.out() << fmt::format("{}: {}\n", outcome.passed() ? "passed" : "failed",
                               record->text("RecordData"));
  if (record->has("CompletedCycles") && !record->property("CompletedCycles").isNull()) {
    session.out() << fmt::format("loops passed {}, failed {}; {} cycles in {} s\n",
                                 record->text("LoopsPassed"), record->text("LoopsFailed"),
                                 record->text("CompletedCycles"), record->text("TimeToExecute"));
  }
}

Reply runMethod(Session& session, const Instance& test, const Instance& controller,
                const NamedValues& arguments) {
  constexpr std::chrono::milliseconds step(1000);
  const Progress progress(
      session.err(),
      fmt::format("{} on {}", test.text("Name"), wwnText(controller.text("DeviceID"))), step,
      isatty(STDERR_FILENO) == 1);
  return callMethod(session, test.path, "RunDiagnosticService", arguments);
}

ExitCode runTest(Session& session, const DiagWords& words) {
  const Instance test = findTest(session, words.test);
  const Instance controller = portController(session, words.port);
  const NamedValues arguments = argumentsOf(session, words, test, controller);
  const std::set<std::string> before = recordNames(session);
  const Reply reply = runMethod(session, test, controller, arguments);
  const DiagOutcome outcome{resultNumber(reply), namedJob(session, reply),
                            newRecord(session, before)};
  printOutcome(session, test, controller, outcome);
  if (outcome.record == nullptr && outcome.result != 0) {
    return ExitCode::MethodResult;
  }
  return outcome.passed() ? ExitCode::Ok : ExitCode::TestFailed;
}

}  // namespace

void addDiagCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<DiagWords>();
  CLI::App* diag = app.add_subcommand("diag", "diagnostic tests of the ports");
  diag->require_subcommand(1);
  choose(diag->add_subcommand("list", "the tests there are"), "diag list", listTests);
  CLI::App* run = diag->add_subcommand("run", "run a test, and tell whether it passed");
  run->add_option("TEST", words->test, "name of the test, or the short form of 'diag list'")
      ->required();
  run->add_option("PORT", words->port, portWords)->required();
  run->add_option("--set", words->settings,
                  "Name=Value over the test's settings: LoopControlParameter, HaltOnError, "
                  "BufferSizes, BufferPattern, TargetDevice, LUN")
      ->expected(1)
      ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  run->add_flag("--delete-job", words->deleteJob, "do not keep the job, only its records");
  choose(run, "diag run", [words](Session& session) { return runTest(session, *words); });
  choose(diag->add_subcommand("results", "results of the tests that were run"), "diag results",
         printResults);
  CLI::App* clear = diag->add_subcommand("clear", "forget results");
  clear->add_option("TEST", words->test, "the results of this test alone");
  choose(clear, "diag clear", [words](Session& session) { return clearResults(session, *words); });
}

}  // namespace tvx::host
