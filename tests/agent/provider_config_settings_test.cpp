// The three settings instances.
#include "Agent_Fixture.h"
#include "Instance_Checks.h"
#include "agent/ProviderConfigSettings.h"

namespace cimrt::test {
namespace {

class Provider_Config_Settings : public Agent_Test {};

struct Expected_Setting {
  const char* name;
  const char* description;
  int low, high, def, current;
};

void expectSettings(ProviderAgent& agent, const Expected_Setting (&expected)[3]) {
  auto& map = agent.m_TVXHBA_ProviderConfigSetting_map;
  ASSERT_EQ(map.size(), 3u);
  for (std::size_t i = 0; i < 3; i++) {
    SCOPED_TRACE(expected[i].name);
    EXPECT_EQ(textOf(map[i]->InstanceID), std::string("Torvex HBA Provider:") + expected[i].name);
    EXPECT_EQ(textOf(map[i]->paramname), expected[i].name);
    EXPECT_EQ(textOf(map[i]->Description), expected[i].description);
    EXPECT_EQ(numberOf(map[i]->lowRange), expected[i].low);
    EXPECT_EQ(numberOf(map[i]->highRange), expected[i].high);
    EXPECT_EQ(numberOf(map[i]->def), expected[i].def);
    EXPECT_EQ(numberOf(map[i]->current), expected[i].current);
    EXPECT_TRUE(map[i]->__name_space == "root/torvex");
  }
}

constexpr const char* TIMEOUT_TEXT =
    "This setting defines the timeout value of Torvex CIM Provider's internal cache";
constexpr const char* ADAPTER_TEXT =
    "This setting represents the Adapter data refresh setting value of Torvex CIM Provider's "
    "internal cache";
constexpr const char* SAN_TEXT =
    "This setting represents the SAN data refresh setting value of Torvex CIM Provider's internal "
    "cache";

TEST_F(Provider_Config_Settings, DefaultsOfTheSettingsFile) {
  ProviderAgent& agent = startAgent();
  Host_Build host{agent};
  EXPECT_EQ(buildProviderConfigSettings(host), 0);
  expectSettings(agent, {{"cachetimeout", TIMEOUT_TEXT, 5, 30, 10, 10},
                         {"adapterrefresh", ADAPTER_TEXT, 0, 1, 0, 0},
                         {"sanrefresh", SAN_TEXT, 0, 1, 1, 1}});
}

TEST_F(Provider_Config_Settings, ConfiguredValuesAreTheCurrentOnes) {
  writeFile("etc/torvex_fc_provider.conf",
            "TVX_PROVIDER_CACHE_TIMEOUT = 3\nTVX_PROVIDER_REFRESH_ADAPTERDATA = TRUE\n"
            "TVX_PROVIDER_REFRESH_SANDATA = FALSE\n");
  ProviderAgent& agent = startAgent();
  refresh(agent);
  expectSettings(agent, {{"cachetimeout", TIMEOUT_TEXT, 5, 30, 10, 3},
                         {"adapterrefresh", ADAPTER_TEXT, 0, 1, 0, 1},
                         {"sanrefresh", SAN_TEXT, 0, 1, 1, 0}});
}

TEST_F(Provider_Config_Settings, RefusedInsertFailsTheBuild) {
  ProviderAgent& agent = startAgent();
  Host_Build host{agent};
  EXPECT_EQ(buildProviderConfigSettings(host), 0);
  EXPECT_EQ(buildProviderConfigSettings(host), MAP_BUILD_FAILED);
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_ProviderConfigSetting_map"), 1u);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ProviderConfigSetting_map"), TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_ProviderConfigSetting_map.size(), 3u);
}

TEST_F(Provider_Config_Settings, PositionsAreThoseOfTheIndex) {
  ProviderAgent& agent = startAgent();
  Host_Build host{agent};
  buildProviderConfigSettings(host);
  auto& map = agent.m_TVXHBA_ProviderConfigSetting_map;
  EXPECT_EQ(textOf(map[SETTING_CACHE_TIMEOUT]->paramname), "cachetimeout");
  EXPECT_EQ(textOf(map[SETTING_ADAPTER_REFRESH]->paramname), "adapterrefresh");
  EXPECT_EQ(textOf(map[SETTING_SAN_REFRESH]->paramname), "sanrefresh");
}

}  // namespace
}  // namespace cimrt::test
