#include "state/Persist.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <nlohmann/json.hpp>

#include "state/Fault.h"

namespace tvx::sim {
namespace {

using nlohmann::json;

constexpr std::array changing_calls = {
    "RM_ChangeWWN",        "RM_DeleteDumpFiles", "RM_DiagBeacon",       "RM_DownloadFirmware",
    "RM_GenerateCoreDump", "RM_GenerateDump",    "RM_GenerateEfdDump",  "RM_ResetHBA",
    "RM_RestoreWWN",       "RM_RetrieveFATDump", "RM_RetrieveFATDump2", "RM_SetAdapterAttribute",
    "RM_SetBootBiosState", "RM_SetDriverParam",  "RM_SetDumpDirectory", "RM_SetDumpRetentionCount",
    "RM_SetOASLunState",   "RM_SetPortEnabled",  "CPQFC_QoSSetConfig",  "CPQFC_QoSSetGlobalFlag"};

// The attributes that calls can change.
constexpr std::array<std::uint32_t, 4> kept_card_values = {0x210, 0x214, 0x222, 0x24F};
constexpr std::uint32_t fec_state = 0x360;

json names_json(const std::optional<Wwn_Pair>& names) {
  if (!names) return nullptr;
  return {{"wwpn", format_wwn(names->port)}, {"wwnn", format_wwn(names->node)}};
}

Wwn wwn_of(const json& text) {
  const std::optional<Wwn> name = parse_wwn(text.get<std::string>());
  if (!name) throw std::runtime_error("holds a malformed name");
  return *name;
}

std::optional<Wwn_Pair> names_of(const json& value) {
  if (value.is_null()) return std::nullopt;
  return Wwn_Pair{wwn_of(value.at("wwpn")), wwn_of(value.at("wwnn"))};
}

json parameters_json(const std::vector<Driver_Parameter>& parameters) {
  json values = json::object();
  for (const Driver_Parameter& parameter : parameters) values[parameter.name] = parameter.current;
  return values;
}

void restore_parameters(const json& values, std::vector<Driver_Parameter>& parameters) {
  for (Driver_Parameter& parameter : parameters) {
    parameter.current = values.value(parameter.name, parameter.current);
  }
}

json values_json(const Port& port) {
  json values = json::object();
  for (const std::uint32_t id : kept_card_values) {
    const auto found = port.card_values.find(id);
    if (found != port.card_values.end()) values[std::to_string(id)] = found->second;
  }
  return values;
}

json oas_json(const Port& port) {
  json list = json::array();
  for (const Oas_Entry& entry : port.oas) {
    list.push_back({{"target", format_wwn(entry.target)},
                    {"lun", entry.lun},
                    {"option", entry.option},
                    {"state", entry.state}});
  }
  return list;
}

json qos_json(const Qos_Store& qos) {
  json entries = json::array();
  for (const Qos_Entry& entry : qos.entries) {
    entries.push_back({{"source", format_wwn(entry.source)},
                       {"target", format_wwn(entry.target)},
                       {"tag", entry.tag}});
  }
  return {{"flag", qos.flag}, {"entries", entries}};
}

void restore_qos(const json& object, Qos_Store& qos) {
  qos.flag = object.at("flag").get<std::uint32_t>();
  qos.entries.clear();
  for (const json& entry : object.at("entries")) {
    qos.entries.push_back({wwn_of(entry.at("source")), wwn_of(entry.at("target")),
                           entry.at("tag").get<std::uint8_t>()});
  }
}

json port_json(const Port& port) {
  json object = {{"current", names_json(port.names)},
                 {"non_volatile", names_json(port.wwns.non_volatile)},
                 {"volatile", names_json(port.wwns.temporary)},
                 {"pending", names_json(port.wwns.pending)},
                 {"pending_is_volatile", port.wwns.pending_is_volatile},
                 {"current_is_volatile", port.wwns.current_is_volatile},
                 {"state", port.state},
                 {"beacon", port.beacon},
                 {"card_values", values_json(port)},
                 {"driver_params", parameters_json(port.driver_params)},
                 {"oas", oas_json(port)},
                 {"qos", qos_json(port.qos)}};
  object["firmware"] = port.firmware.pending ? json(*port.firmware.pending) : json(nullptr);
  object["running_firmware"] = port.firmware.running;
  const auto fec = port.values.find(fec_state);
  object["fec"] = fec == port.values.end() ? json(nullptr) : json(fec->second);
  object["dumps"] = {{"directory", port.dumps.directory},
                     {"retention", port.dumps.retention},
                     {"files", port.dumps.files},
                     {"made", port.dumps.made}};
  return object;
}

void restore_names(const json& object, Port& port) {
  port.names = names_of(object.at("current")).value_or(port.names);
  port.wwns.non_volatile = names_of(object.at("non_volatile")).value_or(port.wwns.non_volatile);
  port.wwns.temporary = names_of(object.at("volatile"));
  port.wwns.pending = names_of(object.at("pending"));
  port.wwns.pending_is_volatile = object.at("pending_is_volatile").get<bool>();
  port.wwns.current_is_volatile = object.at("current_is_volatile").get<bool>();
}

void restore_values(const json& object, Port& port) {
  for (const auto& value : object.at("card_values").items()) {
    const auto id = static_cast<std::uint32_t>(std::stoul(value.key()));
    port.card_values.insert_or_assign(id, value.value().get<Bytes>());
  }
  if (!object.at("fec").is_null()) {
    port.values.insert_or_assign(fec_state, object.at("fec").get<Bytes>());
  }
  port.firmware.running = object.value("running_firmware", std::string());
  if (!object.at("firmware").is_null()) {
    port.firmware.pending = object.at("firmware").get<std::string>();
  }
}

void restore_lists(const json& object, Port& port) {
  const json& dumps = object.at("dumps");
  port.dumps.directory = dumps.at("directory").get<std::string>();
  port.dumps.retention = dumps.at("retention").get<std::uint32_t>();
  port.dumps.files = dumps.at("files").get<std::vector<std::string>>();
  port.dumps.made = dumps.at("made").get<std::uint32_t>();
  port.oas.clear();
  for (const json& entry : object.at("oas")) {
    port.oas.push_back({wwn_of(entry.at("target")), entry.at("lun").get<std::uint64_t>(),
                        entry.at("option").get<std::uint32_t>(),
                        entry.at("state").get<std::uint8_t>()});
  }
}

void restore_port(const json& object, Port& port) {
  restore_names(object, port);
  restore_values(object, port);
  restore_lists(object, port);
  restore_qos(object.at("qos"), port.qos);
  port.state = object.at("state").get<std::uint32_t>();
  port.beacon = object.at("beacon").get<std::uint32_t>();
  restore_parameters(object.at("driver_params"), port.driver_params);
  activate(port, Activation::Reboot);
}

// Ports are told apart by the names that never change.
std::string port_key(const Port& port) {
  return format_wwn(port.wwns.factory.port);
}

json world_json(const World& world) {
  json ports = json::object();
  for (const Port& port : world.ports) ports[port_key(port)] = port_json(port);
  return {{"ports", ports}, {"global_driver_params", parameters_json(world.global_params)}};
}

std::string system_error(const char* what) {
  return std::string(what) + ": " + strerror(errno);
}

// The file's content; empty when there is none.
std::string read_own_file(const std::string& path, std::string& error) {
  const int file = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
  if (file < 0) {
    if (errno != ENOENT) error = system_error("cannot be opened");
    return {};
  }
  struct stat info {};
  std::string text;
  if (fstat(file, &info) != 0 || info.st_uid != geteuid() || (info.st_mode & 022) != 0) {
    error = "is not a file of this user alone";
  } else {
    char chunk[4096];
    ssize_t got = 0;
    while ((got = read(file, chunk, sizeof chunk)) > 0)
      text.append(chunk, static_cast<size_t>(got));
    if (got < 0) error = system_error("cannot be read");
  }
  close(file);
  return text;
}

bool write_all(int file, const std::string& text) {
  std::size_t done = 0;
  while (done < text.size()) {
    const ssize_t wrote = write(file, text.data() + done, text.size() - done);
    if (wrote < 0) return false;
    done += static_cast<std::size_t>(wrote);
  }
  return true;
}

}  // namespace

bool changes_state(std::string_view name) {
  return std::find(changing_calls.begin(), changing_calls.end(), entry_point(name)) !=
         changing_calls.end();
}

std::string save_state(const World& world, const std::string& path) {
  std::string temporary = path + ".XXXXXX";
  const int file = mkstemp(temporary.data());  // readable and writable by the owner alone
  if (file < 0) return system_error("cannot be written");
  const bool written = write_all(file, world_json(world).dump(1) + "\n");
  if (close(file) != 0 || !written || rename(temporary.c_str(), path.c_str()) != 0) {
    std::string error = system_error("cannot be written");
    unlink(temporary.c_str());
    return error;
  }
  return {};
}

std::string restore_state(World& world, const std::string& path) {
  std::string error;
  const std::string text = read_own_file(path, error);
  if (!error.empty() || text.empty()) return error;
  World restored = world;
  try {
    const json state = json::parse(text);
    for (Port& port : restored.ports) {
      const json& ports = state.at("ports");
      if (ports.contains(port_key(port))) restore_port(ports.at(port_key(port)), port);
    }
    restore_parameters(state.at("global_driver_params"), restored.global_params);
  } catch (const std::exception& problem) {
    return std::string("holds no state: ") + problem.what();
  }
  world = std::move(restored);
  return {};
}

}  // namespace tvx::sim
