// `tags flag`, `tags get` and `tags set`.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <filesystem>
#include <memory>
#include <optional>

#include "cli/Firmware.h"
#include "cli/Output.h"
#include "cli/ServiceCalls.h"
#include "cli/Session.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* tagService = "TVXHBA_FCTagService";

struct TagWords {
  std::string port;
  std::optional<std::uint32_t> flag;
  std::string file;
};

struct TagResult {
  std::uint64_t result;
  const char* text;
};

/// What the results of this service mean; other services use some of the numbers otherwise.
constexpr TagResult tagResults[] = {
    {1, "the tagging library refused, or is not in the process; --preload opens one"},
    {5, "the file cannot be looked at"},
    {4097, "the name leads out of the folder of the tables, or is empty"},
    {4107, "there is no such file"},
    {32767, "no tags are set"},
    {32768, "the tagging library knows no adapters"},
    {32968, "the tagging library does not open the adapter of this port"},
};

std::string tagWords(std::uint64_t result) {
  for (const TagResult& row : tagResults) {
    if (row.result == result) {
      return row.text;
    }
  }
  return resultWords(result);
}

ExitCode tell(Session& session, const ServicePort& on, std::uint64_t result,
              const std::string& done, nlohmann::ordered_json further) {
  return tellOutcome(session, "tags", on.wwpn, result, result == 0 ? done : tagWords(result),
                     result == 0 ? std::move(further) : nlohmann::ordered_json::object());
}

ExitCode runFlag(Session& session, const TagWords& words) {
  const ServicePort on = findServicePort(session, tagService, words.port);
  if (words.flag) {
    const Reply reply = callOnPort(session, on, "SetGlobalFlag",
                                   {{"State", Value::number(CMPI_uint32, *words.flag)}});
    return tell(session, on, resultNumber(reply), fmt::format("the flag is now {}", *words.flag),
                {{"flag", *words.flag}});
  }
  const Reply reply = callOnPort(session, on, "GetGlobalFlag");
  const std::uint64_t flag = outputNumber(reply, "State", 0);
  return tell(session, on, resultNumber(reply), fmt::format("the flag is {}", flag),
              {{"flag", flag}});
}

/// Where the provider puts a table of that name.
std::filesystem::path tablePath(Session& session, const ServicePort& on, const std::string& name) {
  for (const Instance& each : instancesOf(session, "TVXHBA_DumpData")) {
    if (each.text("ElementName") == on.port.text("DeviceID") &&
        !each.text("DumpDirectory").empty()) {
      return std::filesystem::path(each.text("DumpDirectory")) / name;
    }
  }
  const char* const root = std::getenv("TVX_ROOT");
  return std::filesystem::path(std::string(root == nullptr ? "" : root) + "/tmp") / name;
}

ExitCode runGet(Session& session, const TagWords& words) {
  if (isRemote(words.file)) {
    throw CommandError(
        ExitCode::BadArgument,
        "a table goes to a file in the port's dump folder; give its name, not a URI");
  }
  const ServicePort on = findServicePort(session, tagService, words.port);
  const std::uint64_t result =
      resultNumber(callOnPort(session, on, "GetConfigTable", {{"URI", Value::string(words.file)}}));
  const std::filesystem::path path = tablePath(session, on, words.file);
  // The provider answers 0 for a file that it could not write, too.
  std::error_code error;
  if (result == 0 && !std::filesystem::exists(path, error)) {
    throw CommandError(ExitCode::File,
                       fmt::format("the table could not be written to '{}'; the port's dump folder "
                                   "must be there, 'tvxcim dump list' shows it",
                                   path.string()));
  }
  return tell(session, on, result, fmt::format("the table is in {}", path.string()),
              {{"file", path.string()}});
}

ExitCode runSet(Session& session, const TagWords& words) {
  const ServicePort on = findServicePort(session, tagService, words.port);
  const std::string uri = isRemote(words.file) ? words.file : localPath(words.file);
  const Reply reply = callOnPort(session, on, "SetConfigTable", {{"URI", Value::string(uri)}});
  return tell(session, on, resultNumber(reply),
              "the table was handed over; a document that is none shows in the provider's log", {});
}

}  // namespace

void addTagCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<TagWords>();
  CLI::App* tags = app.add_subcommand("tags", "frame tagging of a port's adapter");
  tags->require_subcommand(1);
  CLI::App* flag = tags->add_subcommand("flag", "show the global flag, or set it");
  CLI::App* get = tags->add_subcommand("get", "write the table of tags to a file");
  CLI::App* set = tags->add_subcommand("set", "set the table of tags from a file");
  for (CLI::App* command : {flag, get, set}) {
    command->add_option("PORT", words->port, portWords)->required();
  }
  flag->add_option("VALUE", words->flag, "the flag's new value");
  get->add_option("NAME", words->file, "name of the file in the port's dump folder")->required();
  set->add_option("FILE-OR-URI", words->file, "local file, or URI that the provider fetches")
      ->required();
  choose(flag, "tags flag", [words](Session& session) { return runFlag(session, *words); });
  choose(get, "tags get", [words](Session& session) { return runGet(session, *words); });
  choose(set, "tags set", [words](Session& session) { return runSet(session, *words); });
}

}  // namespace tvx::host
