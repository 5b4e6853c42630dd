// Names between the interface's form and the simulator's.
#pragma once

#include <cstring>

#include "rmapi/snia_hba.h"
#include "state/Wwn.h"

namespace tvx::sim {

inline Wwn to_wwn(const HBA_WWN& name) {
  Wwn result;
  std::memcpy(result.data(), name.wwn, result.size());
  return result;
}

inline HBA_WWN from_wwn(const Wwn& name) {
  HBA_WWN result;
  std::memcpy(result.wwn, name.data(), name.size());
  return result;
}

}  // namespace tvx::sim
