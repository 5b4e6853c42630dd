#include "state/Scenario_Parts.h"

namespace tvx::sim {
namespace {

const std::map<std::string, std::uint32_t> device_types = {
    {"disk", 0},         {"tape", 1},           {"printer", 2}, {"processor", 3},
    {"worm", 4},         {"cdrom", 5},          {"scanner", 6}, {"optical", 7},
    {"changer", 8},      {"communications", 9}, {"array", 12},  {"enclosure", 13},
    {"simple disk", 14}, {"card reader", 15},   {"bridge", 16}, {"object", 17}};

// A registered extended name of the target's own, ending in the unit's number.
Bytes made_identifier(const Target& target) {
  Bytes identifier = {0x60, 0x02, 0x54, 0x56};
  identifier.insert(identifier.end(), target.names.port.begin(), target.names.port.end());
  identifier.resize(16);
  return identifier;
}

void read_identifier(const Json_Reader& reader, Lun_Group& group, const Target& target) {
  group.identifier = made_identifier(target);
  group.identifier[15] = static_cast<std::uint8_t>(group.first);
  const std::optional<Json_Reader> identifier = reader.object("identifier");
  if (!identifier) return;
  group.identifier_type = identifier->number<std::uint8_t>("type", 3);
  group.identifier_code = identifier->number<std::uint8_t>("code_set", 1);
  if (identifier->has("hex")) group.identifier = identifier->bytes("hex");
  group.identifier.resize(identifier->number<std::uint8_t>(
      "length", static_cast<std::uint8_t>(group.identifier.size())));
  identifier->finish();
}

void read_pages(const Json_Reader& reader, Lun_Group& group) {
  const std::optional<Json_Reader> pages = reader.object("pages");
  if (!pages) return;
  for (const auto& member : reader.raw("pages").items()) {
    const std::optional<std::uint64_t> code =
        member.key() == "standard" ? standard_page : json_unsigned(nlohmann::json(member.key()));
    if (!code || *code > standard_page) pages->fail(member.key(), "is not a page number");
    group.pages[static_cast<std::uint32_t>(*code)] = pages->bytes(member.key());
  }
}

Lun_Group read_group(const Json_Reader& reader, const Target& target) {
  Lun_Group group;
  group.first = reader.number<std::uint32_t>("first", 0);
  group.count = reader.number<std::uint32_t>("count", 1);
  if (group.first + group.count > 0x1000000) reader.fail("count", "goes past unit 16777215");
  group.type = static_cast<std::uint8_t>(reader.choice("type", 0, device_types) & 0x1F);
  group.vendor = reader.text("vendor", "ACMESTOR");
  group.model = reader.text("model", group.type == 1 ? "ULTRIUM-TD8" : "ARRAY 7200");
  group.revision = reader.text("revision", "0410");
  group.serial = reader.text("serial", "AS" + std::to_string(7200 + target.fc_id % 100));
  group.block_size = reader.number<std::uint32_t>("block_size", 512);
  group.blocks = reader.number<std::uint64_t>("blocks", group.type == 0 ? 209715200 : 0);
  group.os_device = reader.text("os_device", {});
  read_identifier(reader, group, target);
  read_pages(reader, group);
  reader.finish();
  return group;
}

// The target at `position` of those that one element makes; their names and addresses count up.
Target read_target(const Json_Reader& reader, std::uint32_t position) {
  Target target;
  if (!reader.has("wwpn")) reader.fail("wwpn", "is missing");
  target.names.port = wwn_from_number(wwn_number(reader.wwn("wwpn", {})) + position);
  target.names.node = reader.wwn("wwnn", target.names.port);
  target.fc_id = reader.number<std::uint32_t>("fc_id", 0x010000) + position;
  if (reader.raw("luns").is_object()) {
    target.groups.push_back(read_group(*reader.object("luns"), target));
  } else {
    for (const Json_Reader& group : reader.objects("luns")) {
      target.groups.push_back(read_group(group, target));
    }
  }
  return target;
}

}  // namespace

std::vector<Target> read_targets(const Json_Reader& port_reader) {
  std::vector<Target> targets;
  for (const Json_Reader& element : port_reader.objects("targets")) {
    const auto count = element.number<std::uint16_t>("count", 1);
    if (count == 0) element.fail("count", "counts from 1");
    for (std::uint32_t i = 0; i < count; ++i) targets.push_back(read_target(element, i));
    element.finish();
  }
  return targets;
}

}  // namespace tvx::sim
