// Provider of the settings of a port's dumps.
#pragma once

#include "generated/Records.h"

namespace cimrt {

class TVXHBA_DumpData_Provider {
 public:
  /// Changes how many dumps are kept; the directory can't be changed. The dump classes are built
  /// anew afterwards, also when nothing changed.
  /// @param model names the properties to change by not being null
  std::int32_t modify_instance(const TVXHBA_DumpData* model, const TVXHBA_DumpData* instance);
};

}  // namespace cimrt
