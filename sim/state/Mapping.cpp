#include "state/Mapping.h"

#include <cstring>

#include "state/Convert.h"
#include "state/Fields.h"

namespace tvx::sim {
namespace {

/// Writes rows until the room is used up, and counts all of them.
struct Row_Writer {
  HBA_FCPSCSIENTRY* rows;
  std::uint64_t room;
  std::uint64_t count = 0;
  const Fault_Effect& effect;

  void add(const Port& port, std::size_t target_index, const Lun_Group& group, std::uint64_t lun,
           std::uint64_t ordinal) {
    if (count++ >= room) return;
    const Target& target = port.targets[target_index];
    HBA_FCPSCSIENTRY row{};
    write_text(row.ScsiId.OSDeviceName, sizeof row.ScsiId.OSDeviceName,
               os_device_name(group, ordinal), effect);
    row.ScsiId.ScsiBusNumber = port.number;
    row.ScsiId.ScsiTargetNumber = static_cast<HBA_UINT32>(target_index);
    row.ScsiId.ScsiOSLun = static_cast<HBA_UINT32>(lun);
    row.FcpId.FcId = target.fc_id;
    row.FcpId.NodeWWN = from_wwn(target.names.node);
    row.FcpId.PortWWN = from_wwn(target.names.port);
    const auto bytes = lun_bytes(lun);
    std::memcpy(&row.FcpId.FcpLun, bytes.data(), bytes.size());
    // The caller's rows need not be aligned as the record would have them.
    std::memcpy(static_cast<void*>(rows + (count - 1)), &row, sizeof row);
  }
};

void add_port(Row_Writer& writer, const Port& port) {
  std::uint64_t ordinal = 0;
  for (std::size_t target = 0; target < port.targets.size(); ++target) {
    for (const Lun_Group& group : port.targets[target].groups) {
      for (std::uint32_t i = 0; i < group.count; ++i) {
        writer.add(port, target, group, group.first + i, ordinal++);
      }
    }
  }
}

}  // namespace

bool write_mapping(const World& world, std::span<const std::size_t> ports,
                   HBA_FCPTARGETMAPPING& mapping, const Fault_Effect& effect) {
  Row_Writer writer{.rows = mapping.entry, .room = mapping.NumberOfEntries, .effect = effect};
  for (const std::size_t index : ports) {
    if (link_is_up(world.ports[index])) add_port(writer, world.ports[index]);
  }
  mapping.NumberOfEntries = effect.returned_size.value_or(static_cast<std::uint32_t>(writer.count));
  return writer.count <= writer.room;
}

std::uint64_t unit_ordinal(const Port& port, const Target& target, std::uint64_t lun) {
  std::uint64_t ordinal = 0;
  for (const Target& other : port.targets) {
    for (const Lun_Group& group : other.groups) {
      if (&other == &target && group.contains(lun)) return ordinal + (lun - group.first);
      ordinal += group.count;
    }
  }
  return ordinal;
}

}  // namespace tvx::sim
