// The target mapping, which both libraries tell in the same records.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "rmapi/snia_hba.h"
#include "state/Fault.h"
#include "state/World.h"

namespace tvx::sim {

/// Writes a row for every logical unit that the ports (indices in World::ports) see, in the order
/// of ports, targets and units, as many as the count of the mapping allows, and puts the number of
/// all into the count. False when there was not room for all.
bool write_mapping(const World& world, std::span<const std::size_t> ports,
                   HBA_FCPTARGETMAPPING& mapping, const Fault_Effect& effect);

/// How many units the port shows before this one; names devices of the operating system.
std::uint64_t unit_ordinal(const Port& port, const Target& target, std::uint64_t lun);

}  // namespace tvx::sim
