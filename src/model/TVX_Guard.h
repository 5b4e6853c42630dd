// Deletion of parts of the device tree.
#pragma once

#include "common/CLogger.h"

namespace cimrt {

/// Deletes a part whose destructor may throw, sets its pointer to null, and logs `failure` if it
/// did throw.
template <class Part>
void freePart(Part*& part, const char* failure) {
  try {
    delete part;
  } catch (...) {
    TVX_LOG(TVX_DBG, "%s", failure);
  }
  part = nullptr;
}

}  // namespace cimrt
