#include "state/Scenario.h"

#include <ctime>
#include <fstream>
#include <sstream>

#include "state/Default_Scenario.h"
#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

using nlohmann::json;

json parse_text(const std::string& text) {
  try {
    return json::parse(text, nullptr, true, /*ignore_comments=*/true);
  } catch (const json::parse_error& error) {
    throw Scenario_Error("", std::string("is not JSON: ") + error.what());
  }
}

// The value with everything of `base` that it does not say itself.
json with_defaults(const json& base, const json& value) {
  if (!base.is_object() || !value.is_object()) return value;
  json merged = base;
  for (const auto& member : value.items()) {
    json& slot = merged[member.key()];
    slot = slot.is_object() ? with_defaults(slot, member.value()) : member.value();
  }
  return merged;
}

json member_or_empty(const json& object, const char* key) {
  return object.is_object() && object.contains(key) ? object.at(key) : json::object();
}

// Spreads "defaults" over the cards and their ports, so that the readers meet whole objects.
void spread_defaults(json& scenario) {
  if (!scenario.is_object() || !scenario.contains("cards")) return;
  const json defaults = member_or_empty(scenario, "defaults");
  const json for_card = member_or_empty(defaults, "card");
  const json for_port = member_or_empty(defaults, "port");
  for (json& card : scenario.at("cards")) {
    card = with_defaults(for_card, card);
    if (!card.is_object() || !card.contains("ports")) continue;
    for (json& port : card.at("ports")) port = with_defaults(for_port, port);
  }
}

void read_defaults(const Json_Reader& scenario) {
  const std::optional<Json_Reader> defaults = scenario.object("defaults");
  if (!defaults) return;
  defaults->object("card");
  defaults->object("port");
  defaults->finish();
}

void read_library(const Json_Reader& scenario, Library_Texts& library) {
  library.mili_version = "5.2.18.4";
  // By the selectors of the management library and of the library below it.
  library.versions = {{0x66, "5.2.18.4"}, {0x68, "5.2.9.1"}};
  library.os_info = "Linux 6.1.0-18-amd64";
  const std::optional<Json_Reader> texts = scenario.object("library");
  if (!texts) return;
  library.os_info = texts->text("os_info", library.os_info);
  library.mili_version = texts->text("mili_version", library.mili_version);
  if (const std::optional<Json_Reader> versions = texts->object("versions")) {
    for (const auto& entry : texts->raw("versions").items()) {
      const auto selector = json_unsigned(json(entry.key()));
      if (!selector || *selector > UINT32_MAX) versions->fail(entry.key(), "must be a number");
      library.versions[static_cast<std::uint32_t>(*selector)] = versions->text(entry.key(), {});
    }
  }
  texts->finish();
}

void read_global_parameters(const Json_Reader& scenario, World& world) {
  world.global_params = made_parameters();
  if (!scenario.has("global_driver_params")) return;
  world.global_params.clear();
  for (const Json_Reader& item : scenario.objects("global_driver_params")) {
    world.global_params.push_back(read_parameter(item));
  }
}

}  // namespace

World parse_scenario(const std::string& text, const std::string& name) {
  json document = parse_text(text);
  spread_defaults(document);
  const Json_Reader scenario(document, "");
  World world;
  world.scenario = name;
  world.made_at = static_cast<std::int64_t>(std::time(nullptr));
  scenario.text("description", {});
  read_defaults(scenario);
  read_library(scenario, world.library);
  read_global_parameters(scenario, world);
  for (const Json_Reader& card : scenario.objects("cards")) read_card(card, world);
  for (const Json_Reader& fault : scenario.objects("faults")) {
    world.faults.push_back(read_fault(fault));
  }
  world.omitted_symbols = scenario.texts("omit_symbols");
  scenario.finish();
  return world;
}

World load_scenario(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  if (!file || !(text << file.rdbuf())) throw Scenario_Error("", "cannot be read");
  return parse_scenario(text.str(), path);
}

World default_scenario() {
  return parse_scenario(default_scenario_text, "built-in");
}

}  // namespace tvx::sim
