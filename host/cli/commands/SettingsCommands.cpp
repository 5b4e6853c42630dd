// `settings`: the settings of the provider's cache.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <charconv>
#include <memory>

#include "cli/Output.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Table.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

constexpr const char* configSettingClass = "TVXHBA_ProviderConfigSetting";

struct SettingWords {
  std::string name;
  std::string value;
};

std::string rangeWords(const Instance& setting) {
  return fmt::format("{} to {}", setting.property("lowRange").display(),
                     setting.property("highRange").display());
}

nlohmann::ordered_json settingJson(const Instance& setting) {
  return {{"name", setting.text("paramname")},
          {"value", setting.property("current").asUnsigned()},
          {"low", setting.property("lowRange").asUnsigned()},
          {"high", setting.property("highRange").asUnsigned()},
          {"default", setting.property("def").asUnsigned()},
          {"description", setting.text("Description")}};
}

ExitCode printSettings(Session& session) {
  const std::vector<Instance> settings = instancesOf(session, configSettingClass);
  if (session.options().format == Format::Json) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const Instance& setting : settings) {
      list.push_back(settingJson(setting));
    }
    printJson(session, "settings", std::move(list));
    return ExitCode::Ok;
  }
  if (settings.empty()) {
    session.out() << "no settings; is there an adapter? 'tvxcim ports' shows them\n";
    return ExitCode::Ok;
  }
  Table table({"Name", "Value", "Range", "Default", "Description"});
  for (const Instance& setting : settings) {
    table.add({setting.text("paramname"), setting.property("current").display(),
               rangeWords(setting), setting.property("def").display(),
               setting.text("Description")});
  }
  session.out() << table.text();
  return ExitCode::Ok;
}

Instance findSetting(Session& session, const std::string& name) {
  std::string known;
  for (Instance& each : instancesOf(session, configSettingClass)) {
    if (each.text("paramname") == name) {
      return std::move(each);
    }
    known += (known.empty() ? "" : ", ") + each.text("paramname");
  }
  throw CommandError(ExitCode::NotFound, fmt::format("there is no setting '{}'; there are: {}",
                                                     name, known.empty() ? "none" : known));
}

std::uint32_t valueOf(const SettingWords& words) {
  std::uint32_t value = 0;
  const char* const end = words.value.data() + words.value.size();
  const auto [stop, error] = std::from_chars(words.value.data(), end, value);
  if (error != std::errc() || stop != end) {
    throw CommandError(
        ExitCode::BadArgument,
        fmt::format("'{}' is no value of {}: a number is needed", words.value, words.name));
  }
  return value;
}

ExitCode changeSetting(Session& session, const SettingWords& words) {
  const Instance setting = findSetting(session, words.name);
  Request request;
  request.operation = Operation::ModifyInstance;
  request.path = setting.path;
  request.instance.properties.set("InstanceID", Value::string(setting.text("InstanceID")));
  request.instance.properties.set("current", Value::number(CMPI_uint32, valueOf(words)));
  request.properties = {"current"};
  const Reply reply = session.run(request, true);
  if (reply.status.rc == CMPI_RC_ERR_INVALID_PARAMETER) {
    throw CommandError(ExitCode::BadArgument,
                       fmt::format("{} is out of range for {}, which goes from {}", words.value,
                                   words.name, rangeWords(setting)),
                       reply.status.rc);
  }
  if (!reply.status.ok()) {
    session.fail(reply.status, "setting " + words.name);
  }
  return printSettings(session);
}

}  // namespace

void addSettingsCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<SettingWords>();
  CLI::App* settings = app.add_subcommand("settings", "settings of the provider's cache");
  CLI::Option* name = settings->add_option("NAME", words->name, "setting to change");
  CLI::Option* value = settings->add_option("VALUE", words->value, "its new value");
  name->needs(value);
  choose(settings, "settings", [words](Session& session) {
    return words->name.empty() ? printSettings(session) : changeSetting(session, *words);
  });
}

}  // namespace tvx::host
