#include "services/TVXHBA_DriverParamGlobal_Provider.h"

#include "services/Active_Enumeration.h"
#include "services/TVX_DriverParams.h"

namespace cimrt {

std::int32_t TVXHBA_DriverParamGlobal_Provider::enum_instances(const TVXHBA_DriverParamGlobal*,
                                                               const Instance_Handler& handler) {
  return enumerateActive("TVXHBA_DriverParamGlobal", &Agent_Maps::m_TVXHBA_DriverParamGlobal_map,
                         handler, updateGlobalDriverParams);
}

}  // namespace cimrt
