#include "agent/ProviderConfigSettings.h"

#include "agent/Map_Insert.h"

namespace cimrt {

namespace {

struct Setting_Row {
  const char* name;
  const char* description;
  std::uint32_t low;
  std::uint32_t high;
  std::uint32_t def;
  std::uint32_t (*current)(TvxConfigFile& settings);  ///< reads under the settings' own mutex
};

// In the order of Setting_Index.
constexpr Setting_Row SETTINGS[] = {
    {"cachetimeout",
     "This setting defines the timeout value of Torvex CIM Provider's internal cache", 5, 30, 10,
     [](TvxConfigFile& settings) { return settings.getCacheTimeout(); }},
    {"adapterrefresh",
     "This setting represents the Adapter data refresh setting value of Torvex CIM Provider's "
     "internal cache",
     0, 1, 0,
     [](TvxConfigFile& settings) -> std::uint32_t { return settings.getAdapterRefresh() ? 1 : 0; }},
    {"sanrefresh",
     "This setting represents the SAN data refresh setting value of Torvex CIM Provider's internal "
     "cache",
     0, 1, 1,
     [](TvxConfigFile& settings) -> std::uint32_t { return settings.getSANRefresh() ? 1 : 0; }},
};

Ref<TVXHBA_ProviderConfigSetting> makeSetting(const Setting_Row& row, TvxConfigFile& settings) {
  auto setting = makeInstance<TVXHBA_ProviderConfigSetting>();
  setting->InstanceID.set(formatText("Torvex HBA Provider:%s", row.name).c_str());
  setting->Description.set(row.description);
  setting->paramname.set(row.name);
  setting->lowRange.set(row.low);
  setting->highRange.set(row.high);
  setting->def.set(row.def);
  setting->current.set(row.current(settings));
  return setting;
}

}  // namespace

std::int32_t buildProviderConfigSettings(Host_Build& host) {
  ProviderAgent& agent = host.agent;
  for (const Setting_Row& row : SETTINGS)
    if (!insertInto(agent.m_TVXHBA_ProviderConfigSetting_map, makeSetting(row, agent.m_ConfigFile),
                    "Insert Failed : m_TVXHBA_ProviderConfigSetting_map"))
      return MAP_BUILD_FAILED;
  return 0;
}

}  // namespace cimrt
