// The settings of the jobs, which all tests share.
#include "common/CLogger.h"
#include "diagnostics/TVX_Diagnostics.h"
#include "runtime/Typed_Instance.h"

namespace cimrt {

TVXHBA_JobSettingData* TVX_Diagnostics::getDefaultTVXHBA_JobSettingDataInstance(const char*) {
  auto& map = m_Agent.m_TVXHBA_JobSettingData_map;
  return map.size() != 0 ? map[0] : nullptr;
}

TVXHBA_JobSettingData* TVX_Diagnostics::getTVXHBA_JobSettingDataInstance(const Instance* given,
                                                                         const char* testName) {
  TVXHBA_JobSettingData* settings = getDefaultTVXHBA_JobSettingDataInstance(testName);
  const auto* wanted = typed<TVXHBA_JobSettingData>(given);
  if (!wanted) return nullptr;
  if (settings && !wanted->InstanceID.value.equal(settings->InstanceID.value)) return nullptr;
  TVX_LOG(TVX_DBG, "Using the overrided values if valid, else default settings values are used");
  if (wanted->DeleteOnCompletion.is_null()) {
    TVX_LOG(TVX_DBG,
            "Missing DeleteOnCompletion parameter, Valid values are 1 or 0. Using the default "
            "value");
    return settings;
  }
  if (settings) settings->DeleteOnCompletion = wanted->DeleteOnCompletion;
  return settings;
}

}  // namespace cimrt
