#include "logs/TVXHBA_ProviderConfigSetting_Provider.h"

#include "agent/ProviderConfigSettings.h"

namespace cimrt {

namespace {

/// How one setting is changed.
struct Setting_Change {
  int (TvxConfigFile::*store)(std::uint32_t value);  ///< 0, or nonzero for a value out of range
  void (*apply)(ProviderAgent& agent, std::uint32_t value);
  const char* refused;
  const char* changed;
};

// In the order of Setting_Index.
constexpr Setting_Change CHANGES[] = {
    {&TvxConfigFile::setCacheTimeout,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_CacheTimeout = value; },
     "The value provided for cache time-out is out of range",
     "Cache time-out is modified successfully"},
    {&TvxConfigFile::setAdapterRefresh,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_bAdapterRefreshSetting = value != 0; },
     "The value provided for adapter refresh out is out of range",
     "Adapter refresh is modified successfully"},
    {&TvxConfigFile::setSANRefresh,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_bSANRefreshSetting = value != 0; },
     "The value provided for SAN refresh out is out of range",
     "SAN refresh is modified successfully"},
};

std::int32_t change(ProviderAgent& agent, std::size_t index, std::uint32_t value) {
  const Setting_Change& setting = CHANGES[index];
  if ((agent.m_ConfigFile.*setting.store)(value) != 0) {
    TVX_LOG(TVX_ERR, "%s", setting.refused);
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  setting.apply(agent, value);
  TVX_LOG(TVX_WARN, "%s", setting.changed);
  agent.m_TVXHBA_ProviderConfigSetting_map[index]->current.set(value);
  return MODIFY_INSTANCE_OK;
}

}  // namespace

std::int32_t TVXHBA_ProviderConfigSetting_Provider::modify_instance(
    const TVXHBA_ProviderConfigSetting* model, const TVXHBA_ProviderConfigSetting* instance) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  TVX_LOG(TVX_DBG, "TVXHBA_ProviderConfigSetting_Provider::modify_instance()");
  agent.awaitAdapterMaps();
  Ranked_Lock data(agent.m_DataMutex);
  if (!model || !instance) {
    TVX_LOG(TVX_ERR, "TVXHBA_ProviderConfigSetting_Provider::modify_instance invalid parameter");
    return MODIFY_INSTANCE_INVALID_PARAMETER;
  }
  const std::size_t index = agent.m_TVXHBA_ProviderConfigSetting_map.find(instance);
  if (index >= std::size(CHANGES) || model->current.is_null()) {
    TVX_LOG(TVX_ERR, "Instance does not exist");
    return MODIFY_INSTANCE_FAILED;
  }
  return change(agent, index, instance->current.value);
}

}  // namespace cimrt
