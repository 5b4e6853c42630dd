#include "services/TVXHBA_DumpData_Provider.h"

#include "access/TVX_MethodWrapper.h"
#include "services/Service_Checks.h"
#include "services/TVX_Dump.h"

namespace cimrt {

namespace {

constexpr const char* OWNER = "TVXHBA_DumpData_Provider::modify_instance";

/// A directory may be told, but no other than the one there is.
std::int32_t checkDirectory(const TVXHBA_DumpData& model, const TVXHBA_DumpData& stored) {
  const Property<String>& wanted = model.DumpDirectory;
  if (wanted.is_null() || wanted.value.empty()) return MODIFY_INSTANCE_OK;
  if (!stored.DumpDirectory.is_null() && wanted.value.equal(stored.DumpDirectory.value.c_str())) {
    TVX_LOG(TVX_DBG, " For Non VMWARE");
    return MODIFY_INSTANCE_OK;
  }
  TVX_LOG(TVX_DBG, "tvxcimSetDumpDirectory is not supported");
  return MODIFY_INSTANCE_UNSUPPORTED;
}

std::int32_t changeRetention(const TVXHBA_DumpData& model, const TVXHBA_DumpData& stored,
                             const HBA_WWN& wwpn) {
  const Property<std::uint32_t>& wanted = model.RetentionCount;
  if (wanted.is_null() || wanted.value == stored.RetentionCount.value) return MODIFY_INSTANCE_OK;
  if (TVX_MethodWrapper::tvxcimSetRetentionCount(wwpn, wanted.value) != RM_OK) {
    TVX_LOG(TVX_ERR, "TVX_MethodWrapper::tvxcimSetRetentionCount failed");
    return MODIFY_INSTANCE_FAILED;
  }
  TVX_LOG(TVX_DBG, "TVX_MethodWrapper::tvxcimSetRetentionCount succeded");
  return MODIFY_INSTANCE_OK;
}

/// One half of the rebuild; a failure is only logged.
void rebuildStep(std::int32_t (*step)(ProviderAgent&), const char* failure, ProviderAgent& agent) {
  const std::int32_t status = step(agent);
  if (status == 0) return;
  TVX_LOG(TVX_ERR, "%s", failure);
  TVX_LOG(TVX_ERR, "tvxstatus = %d", status);
}

std::int32_t changeSettings(ProviderAgent& agent, const TVXHBA_DumpData& model,
                            const TVXHBA_DumpData& instance) {
  HBA_WWN wwpn{};
  if (!convertPortName(OWNER, instance.ElementName, wwpn)) return MODIFY_INSTANCE_FAILED;
  const Instance* found = agent.m_TVXHBA_DumpData_map.lookup(&instance);
  if (!found) return MODIFY_INSTANCE_FAILED;
  TVX_LOG(TVX_DBG, "found the key match for instance.");
  const auto& stored = static_cast<const TVXHBA_DumpData&>(*found);
  std::int32_t status = checkDirectory(model, stored);
  if (status == MODIFY_INSTANCE_OK) status = changeRetention(model, stored, wwpn);
  if (status != MODIFY_INSTANCE_OK) return status;
  rebuildStep(FC_ClearDumpClasses, "FC_ClearDumpClasses failed", agent);
  rebuildStep(FC_CreateDumpClasses, "FC_CreateDumpClasses failed", agent);
  return MODIFY_INSTANCE_OK;
}

}  // namespace

std::int32_t TVXHBA_DumpData_Provider::modify_instance(const TVXHBA_DumpData* model,
                                                       const TVXHBA_DumpData* instance) {
  TVX_LOG(TVX_DBG, "TVXHBA_DumpData_Provider::modify_instance()");
  Service_Call call;
  if (!model || !instance) {
    TVX_LOG(TVX_ERR, "TVXHBA_DumpData_Provider::modify_instance invalid parameter");
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  if (call.agent.m_TVXHBA_DumpData_map.find(instance) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_ERR, "Invalid instance of TVXHBA_DumpData_Provider Data");
    return MODIFY_INSTANCE_FAILED;
  }
  return changeSettings(call.agent, *model, *instance);
}

}  // namespace cimrt
