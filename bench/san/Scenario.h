// The simulated hosts that are measured.
#pragma once

#include <cstddef>
#include <string>

namespace tvx::bench {

/// A host of one port, behind which ten remote ports have `units` logical units of one SCSI device
/// type together. `units` is a multiple of ten.
std::string manyUnits(std::size_t units, unsigned deviceType);

}  // namespace tvx::bench
