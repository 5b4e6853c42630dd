#include "services/TVXHBA_FCPortStatistics_Provider.h"

#include "agent/LiveStatus.h"
#include "services/Active_Enumeration.h"

namespace cimrt {

std::int32_t TVXHBA_FCPortStatistics_Provider::enum_instances(const TVXHBA_FCPortStatistics*,
                                                              const Instance_Handler& handler) {
  return enumerateActive("TVXHBA_FCPortStatistics", &Agent_Maps::m_TVXHBA_FCPortStatistics_map,
                         handler, GetFCPortStats);
}

}  // namespace cimrt
