// The parts of a port that are about management: names, firmware, parameters, dumps and so on.
#include <cstdio>

#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

const std::map<std::string, std::uint32_t> activations = {
    {"at once", 0}, {"reset", 1}, {"reboot", 2}};

Activation read_activation(const Json_Reader& reader, Activation fallback) {
  const std::uint32_t value =
      reader.choice("activation", static_cast<std::uint32_t>(fallback), activations);
  if (value > 2) reader.fail("activation", "must be \"at once\", \"reset\" or \"reboot\"");
  return static_cast<Activation>(value);
}

Counter read_counter(const Json_Reader& counters, const std::string& key) {
  const nlohmann::json& value = counters.raw(key);
  Counter counter;
  if (const auto number = json_unsigned(value)) {
    counter.start = *number;
  } else if (value == "unsupported") {
    counter.start = UINT64_MAX;
  } else if (value.is_array()) {
    for (const nlohmann::json& element : value) {
      const auto number_of_read = json_unsigned(element);
      if (!number_of_read) counters.fail(key, "must hold numbers");
      counter.script.push_back(*number_of_read);
    }
    if (counter.script.empty()) counters.fail(key, "must not be empty");
  } else {
    const Json_Reader object = *counters.object(key);
    counter.start = object.number<std::uint64_t>("start", 0);
    counter.per_second = object.number<std::uint64_t>("per_second", 0);
    object.finish();
  }
  return counter;
}

// Traffic that runs while the link is up; error counters stand still.
std::map<std::uint32_t, Counter> made_counters(bool link_up) {
  std::map<std::uint32_t, Counter> counters;
  for (const Attribute_Row& row : statistic_rows()) counters[row.id] = {};
  counters[0x401] = {.start = 86400, .per_second = 1, .script = {}};
  counters[0x416] = {.start = 2, .per_second = 0, .script = {}};
  counters[0x40D] = {.start = 1, .per_second = 0, .script = {}};
  if (!link_up) return counters;
  counters[0x402] = {.start = 1200340, .per_second = 850, .script = {}};
  counters[0x403] = {.start = 15, .per_second = 0, .script = {}};
  counters[0x404] = {.start = 2400680, .per_second = 1700, .script = {}};
  counters[0x405] = {.start = 2400120, .per_second = 1690, .script = {}};
  counters[0x406] = {.start = 9602720, .per_second = 6800, .script = {}};
  counters[0x407] = {.start = 9600480, .per_second = 6760, .script = {}};
  counters[0x408] = {.start = 4916592640, .per_second = 3481600, .script = {}};
  counters[0x409] = {.start = 4915445760, .per_second = 3461120, .script = {}};
  counters[0x417] = {.start = 4, .per_second = 0, .script = {}};
  counters[0x418] = {.start = 12, .per_second = 0, .script = {}};
  return counters;
}

void read_statistics(const Json_Reader& reader, Port& port) {
  port.counters = made_counters(link_is_up(port));
  const std::optional<Json_Reader> statistics = reader.object("statistics");
  if (!statistics) return;
  for (const auto& member : reader.raw("statistics").items()) {
    const auto id = attribute_number(statistic_rows(), member.key());
    if (!id) statistics->fail(member.key(), "is not a counter that is known here");
    if (member.value().is_null()) {
      port.counters.erase(*id);
    } else {
      port.counters[*id] = read_counter(*statistics, member.key());
    }
  }
}

void read_wwns(const Json_Reader& reader, Port& port) {
  Wwn_Store& store = port.wwns;
  store.factory = store.non_volatile = port.names;
  store.capability = 0x200C;
  const std::optional<Json_Reader> wwns = reader.object("wwn_management");
  if (!wwns) return;
  store.factory.port = wwns->wwn("factory_wwpn", store.factory.port);
  store.factory.node = wwns->wwn("factory_wwnn", store.factory.node);
  store.activation = read_activation(*wwns, store.activation);
  if (store.activation == Activation::Reboot) store.capability = 0x100C;
  store.capability = wwns->number<std::uint32_t>("capability", store.capability);
  store.busy_calls = store.busy_left = wwns->number<std::uint32_t>("busy_calls", 0);
  wwns->finish();
}

void read_dumps(const Json_Reader& reader, Port& port) {
  port.dumps.directory = "/var/opt/torvex/dump";
  const std::optional<Json_Reader> dumps = reader.object("dumps");
  if (!dumps) return;
  port.dumps.directory = dumps->text("directory", port.dumps.directory);
  port.dumps.retention = dumps->number<std::uint32_t>("retention", port.dumps.retention);
  port.dumps.files = dumps->texts("files");
  dumps->finish();
}

void read_vports(const Json_Reader& reader, Port& port) {
  port.vports_supported = reader.flag("vports_supported", true);
  for (const Json_Reader& item : reader.objects("vports")) {
    Virtual_Port vport;
    vport.names.port = item.wwn("wwpn", wwn_from_number(wwn_number(port.names.port) +
                                                        (1ULL << 52) * (port.vports.size() + 1)));
    vport.names.node = item.wwn("wwnn", port.names.node);
    vport.fc_id = item.number<std::uint32_t>(
        "fc_id", port.fc_id + 1 + static_cast<std::uint32_t>(port.vports.size()));
    vport.name = item.text("name", "vport" + std::to_string(port.vports.size()));
    const auto count = item.number<std::uint16_t>("count", 1);
    item.finish();
    for (std::uint32_t i = 0; i < count; ++i) {
      port.vports.push_back(vport);
      vport.names.port = wwn_from_number(wwn_number(vport.names.port) + 1);
      ++vport.fc_id;
    }
  }
}

void read_oas(const Json_Reader& reader, Port& port) {
  port.oas_supported = reader.flag("oas_supported", true);
  for (const Json_Reader& item : reader.objects("oas")) {
    Oas_Entry entry;
    entry.target = item.wwn("target", {});
    entry.lun = item.number<std::uint64_t>("lun", 0);
    entry.option = item.choice("option", 1, {{"driver", 0}, {"config", 1}});
    entry.state = item.number<std::uint8_t>("state", 1);
    item.finish();
    port.oas.push_back(entry);
  }
}

void read_diagnostics(const Json_Reader& reader, Port& port) {
  for (const char* kind : {"post", "loopback", "pci", "echo"}) port.diagnostics[kind] = {};
  const std::optional<Json_Reader> diagnostics = reader.object("diagnostics");
  if (!diagnostics) return;
  for (auto& [kind, plan] : port.diagnostics) {
    const std::optional<Json_Reader> given = diagnostics->object(kind);
    if (!given) continue;
    plan.polls = given->number<std::uint32_t>("polls", plan.polls);
    plan.endless = given->flag("endless", false);
    plan.result = given->number<std::uint32_t>("result", 0);
    plan.final_state = given->number<std::uint32_t>("final_state", 6);
    plan.errors = given->number<std::uint32_t>("errors", plan.result != 0 ? 1 : 0);
    given->finish();
  }
  diagnostics->finish();
}

void read_qos(const Json_Reader& reader, Qos_Store& qos) {
  const std::optional<Json_Reader> given = reader.object("qos");
  if (!given) return;
  qos.flag = given->number<std::uint32_t>("flag", 0);
  for (const Json_Reader& item : given->objects("entries")) {
    qos.entries.push_back(
        {item.wwn("source", {}), item.wwn("target", {}), item.number<std::uint8_t>("tag", 0)});
    item.finish();
  }
  given->finish();
}

void read_features(const Json_Reader& reader, Port& port) {
  port.features = {{201, 0}, {430, 1}};
  const std::optional<Json_Reader> features = reader.object("features");
  if (!features) return;
  for (const auto& member : reader.raw("features").items()) {
    const auto number = json_unsigned(nlohmann::json(member.key()));
    if (!number || *number > UINT32_MAX) features->fail(member.key(), "is not a feature number");
    port.features[static_cast<std::uint32_t>(*number)] =
        features->number<std::uint32_t>(member.key(), 0);
  }
}

void read_firmware(const Json_Reader& reader, Port& port) {
  const std::optional<Json_Reader> firmware = reader.object("firmware");
  if (!firmware) return;
  port.firmware.activation = read_activation(*firmware, Activation::Reset);
  firmware->finish();
}

}  // namespace

Driver_Parameter read_parameter(const Json_Reader& reader) {
  Driver_Parameter parameter;
  parameter.name = reader.text("name", {});
  if (parameter.name.empty()) reader.fail("name", "must not be empty");
  parameter.low = reader.number<std::uint32_t>("low", 0);
  parameter.high = reader.number<std::uint32_t>("high", 1);
  parameter.initial = reader.number<std::uint32_t>("default", parameter.low);
  parameter.current = reader.number<std::uint32_t>("current", parameter.initial);
  parameter.export_flag = reader.number<std::uint16_t>("export", 1);
  parameter.dynamic = reader.number<std::uint16_t>("dynamic", 0);
  parameter.help = reader.text("help", {});
  reader.finish();
  return parameter;
}

std::vector<Driver_Parameter> made_parameters() {
  return {
      {"trace_mask", 0, 0xFFFFFFFF, 0, 0, 1, 1, "Verbose logging bit mask"},
      {"unit_queue_depth", 1, 512, 30, 30, 1, 1, "Outstanding commands for each logical unit"},
      {"target_queue_depth", 10, 65535, 65535, 65535, 1, 1, "Outstanding commands for each target"},
      {"link_down_timeout", 0, 255, 30, 30, 1, 1, "Seconds to hold I/O after a device is lost"},
      {"device_loss_timeout", 0, 255, 30, 30, 1, 1, "Seconds until a lost device is forgotten"},
      {"port_topology", 0, 6, 0, 0, 1, 0, "Fibre Channel topology"},
      {"port_speed", 0, 32, 0, 0, 1, 0, "Link speed in Gbit/s, 0 negotiates"},
      {"fabric_registration", 0, 2, 1, 1, 1, 0, "Fabric device management registration"},
      {"virtual_ports", 0, 1, 1, 1, 1, 0, "N_Port ID virtualization"},
      {"class2_ack", 0, 1, 0, 0, 1, 0, "Use ACK0 for class 2"},
      {"interrupt_delay", 0, 63, 0, 0, 1, 0, "Milliseconds before an interrupt"},
      {"interrupt_count", 1, 255, 1, 1, 1, 0, "Completions before an interrupt"},
      {"loop_scan_down", 0, 1, 1, 1, 1, 0, "Scan loop addresses downwards"},
      {"max_units", 0, 65535, 255, 255, 1, 0, "Highest logical unit number"},
  };
}

void read_port_features(const Json_Reader& reader, Port& port) {
  read_statistics(reader, port);
  read_wwns(reader, port);
  read_firmware(reader, port);
  read_dumps(reader, port);
  read_vports(reader, port);
  read_oas(reader, port);
  read_diagnostics(reader, port);
  read_features(reader, port);
  read_qos(reader, port.qos);
  port.beacon = reader.choice("beacon", 2, {{"not available", 1}, {"off", 2}, {"on", 3}});
  port.enabled_state = port.state == 22 ? 2 : port.state;
  port.enable_needs_reset = reader.flag("enable_needs_reset", true);
  port.driver_params = made_parameters();
  if (reader.has("driver_params")) {
    port.driver_params.clear();
    for (const Json_Reader& item : reader.objects("driver_params")) {
      port.driver_params.push_back(read_parameter(item));
    }
  }
}

}  // namespace tvx::sim
