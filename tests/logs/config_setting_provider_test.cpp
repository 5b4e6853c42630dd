// Changing the settings of the cache.
#include <atomic>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "agent/ProviderConfigSettings.h"
#include "logs/TVXHBA_ProviderConfigSetting_Provider.h"

namespace cimrt::test {
namespace {

class Config_Setting : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    useScenario(singlePortCards(1));
  }
  void begin() {
    agent = &startAgent();
    refresh(*agent);
    log.clear();
  }

  /// What a client asks for: `current` of the setting of that name.
  static Ref<TVXHBA_ProviderConfigSetting> request(const std::string& name, std::uint32_t value) {
    Ref<TVXHBA_ProviderConfigSetting> made(TVXHBA_ProviderConfigSetting::create());
    made->__name_space = "root/torvex";
    made->InstanceID.set(("Torvex HBA Provider:" + name).c_str());
    made->current.set(value);
    return made;
  }
  static std::int32_t modify(const std::string& name, std::uint32_t value) {
    const auto instance = request(name, value);
    return TVXHBA_ProviderConfigSetting_Provider().modify_instance(instance.get(), instance.get());
  }
  std::int64_t current(std::size_t index) {
    return numberOf(agent->m_TVXHBA_ProviderConfigSetting_map[index]->current);
  }
  void expectDefaults() {
    EXPECT_EQ(agent->m_CacheTimeout, 10u);
    EXPECT_FALSE(agent->m_bAdapterRefreshSetting);
    EXPECT_TRUE(agent->m_bSANRefreshSetting);
    EXPECT_EQ(agent->m_ConfigFile.getCacheTimeout(), 10u);
    EXPECT_FALSE(agent->m_ConfigFile.getAdapterRefresh());
    EXPECT_TRUE(agent->m_ConfigFile.getSANRefresh());
    EXPECT_EQ(current(0), 10);
    EXPECT_EQ(current(1), 0);
    EXPECT_EQ(current(2), 1);
  }

  ProviderAgent* agent = nullptr;
};

TEST_F(Config_Setting, CacheTimeoutTakesOneToThirtyMinutes) {
  begin();
  // The lowest that is shown is 5, the lowest that is taken is 1.
  for (const std::uint32_t minutes : {30u, 3u, 1u, 5u}) {
    log.clear();
    EXPECT_EQ(modify("cachetimeout", minutes), MODIFY_INSTANCE_OK) << minutes;
    EXPECT_EQ(log.level("Cache time-out is modified successfully"), TVX_WARN);
    EXPECT_EQ(agent->m_CacheTimeout, minutes);
    EXPECT_EQ(agent->m_ConfigFile.getCacheTimeout(), minutes);
    EXPECT_EQ(current(SETTING_CACHE_TIMEOUT), minutes);
  }
  EXPECT_EQ(log.level("TVXHBA_ProviderConfigSetting_Provider::modify_instance()"), TVX_DBG);
}

TEST_F(Config_Setting, RefreshSettingsAreSwitches) {
  begin();
  EXPECT_EQ(modify("adapterrefresh", 1), MODIFY_INSTANCE_OK);
  EXPECT_EQ(log.level("Adapter refresh is modified successfully"), TVX_WARN);
  EXPECT_TRUE(agent->m_bAdapterRefreshSetting);
  EXPECT_TRUE(agent->m_ConfigFile.getAdapterRefresh());
  EXPECT_EQ(current(SETTING_ADAPTER_REFRESH), 1);
  EXPECT_EQ(modify("sanrefresh", 0), MODIFY_INSTANCE_OK);
  EXPECT_EQ(log.level("SAN refresh is modified successfully"), TVX_WARN);
  EXPECT_FALSE(agent->m_bSANRefreshSetting);
  EXPECT_FALSE(agent->m_ConfigFile.getSANRefresh());
  EXPECT_EQ(current(SETTING_SAN_REFRESH), 0);
  EXPECT_EQ(modify("adapterrefresh", 0), MODIFY_INSTANCE_OK);
  EXPECT_FALSE(agent->m_bAdapterRefreshSetting);
}

TEST_F(Config_Setting, ValuesOutOfRangeChangeNothing) {
  begin();
  struct Refused {
    const char* name;
    std::uint32_t value;
    const char* text;
  };
  for (const Refused& each : {
           Refused{"cachetimeout", 0, "The value provided for cache time-out is out of range"},
           Refused{"cachetimeout", 31, "The value provided for cache time-out is out of range"},
           Refused{"cachetimeout", 4294967295u,
                   "The value provided for cache time-out is out of range"},
           Refused{"adapterrefresh", 2,
                   "The value provided for adapter refresh out is out of range"},
           Refused{"sanrefresh", 2, "The value provided for SAN refresh out is out of range"},
       }) {
    log.clear();
    EXPECT_EQ(modify(each.name, each.value), MODIFY_INSTANCE_INVALID_PARAMETER) << each.name;
    EXPECT_EQ(log.level(each.text), TVX_ERR);
    expectDefaults();
  }
}

TEST_F(Config_Setting, WhatIsNotAskedForIsNotChanged) {
  begin();
  const auto instance = request("cachetimeout", 20);
  const auto model = request("cachetimeout", 20);
  model->current.null = 1;
  EXPECT_EQ(TVXHBA_ProviderConfigSetting_Provider().modify_instance(model.get(), instance.get()),
            MODIFY_INSTANCE_FAILED);
  EXPECT_EQ(log.level("Instance does not exist"), TVX_ERR);
  expectDefaults();
}

TEST_F(Config_Setting, AnUnknownSettingDoesNotExist) {
  begin();
  EXPECT_EQ(modify("nosuch", 1), MODIFY_INSTANCE_FAILED);
  EXPECT_EQ(log.level("Instance does not exist"), TVX_ERR);
  expectDefaults();
}

TEST_F(Config_Setting, NullArgumentsAreInvalid) {
  begin();
  const auto instance = request("cachetimeout", 20);
  TVXHBA_ProviderConfigSetting_Provider provider;
  EXPECT_EQ(provider.modify_instance(nullptr, instance.get()), MODIFY_INSTANCE_INVALID_PARAMETER);
  EXPECT_EQ(provider.modify_instance(instance.get(), nullptr), MODIFY_INSTANCE_INVALID_PARAMETER);
  EXPECT_EQ(log.count("TVXHBA_ProviderConfigSetting_Provider::modify_instance invalid parameter"),
            2u);
  EXPECT_EQ(log.level("TVXHBA_ProviderConfigSetting_Provider::modify_instance invalid parameter"),
            TVX_ERR);
  expectDefaults();
}

TEST_F(Config_Setting, AChangeSurvivesARefreshAndTheFileIsWrittenAtUnload) {
  begin();
  ASSERT_EQ(modify("cachetimeout", 7), MODIFY_INSTANCE_OK);
  EXPECT_FALSE(std::filesystem::exists(root / "etc/torvex_fc_provider.conf"))
      << "the change itself writes nothing";
  refresh(*agent);
  EXPECT_EQ(current(SETTING_CACHE_TIMEOUT), 7);
  EXPECT_EQ(agent->m_CacheTimeout, 7u);
  stopAgent();
  std::ostringstream text;
  text << std::ifstream(root / "etc/torvex_fc_provider.conf").rdbuf();
  EXPECT_NE(text.str().find("\nTVX_PROVIDER_CACHE_TIMEOUT = 7\n"), std::string::npos);
}

TEST_F(Config_Setting, ACacheTimeoutHoldsForTheCacheThatStands) {
  begin();
  agent->m_bSANRefreshSetting = false;
  const auto runs = [this] { return log.count("PERF: DataFetch_Handler Thread END"); };
  turnClock(6 * 60'000'000ull);
  agent->BuildCimrtInfo();
  awaitIdle(*agent);
  EXPECT_EQ(runs(), 0u) << "six of ten minutes";
  // The change asks for a refresh by the timeout of before, and so starts none.
  ASSERT_EQ(modify("cachetimeout", 6), MODIFY_INSTANCE_OK);
  EXPECT_EQ(runs(), 0u);
  agent->BuildCimrtInfo();
  awaitIdle(*agent);
  EXPECT_EQ(runs(), 1u);
}

TEST_F(Config_Setting, AChangeDuringARefreshWaitsAndThenHolds) {
  begin();
  // The refresh stands still where the device tree is about to be built.
  std::atomic<bool> held{false};
  std::atomic<bool> release{false};
  std::thread holder([&] {
    Ranked_Lock data(agent->m_DataMutex);
    held = true;
    while (!release) std::this_thread::yield();
  });
  while (!held) std::this_thread::yield();
  agent->m_bAdapterRefreshPending = true;
  agent->BuildCimrtInfo();
  while (!agent->m_bIsAdapterDataBuilding) std::this_thread::yield();
  std::atomic<bool> done{false};
  std::thread client([&] {
    EXPECT_EQ(modify("cachetimeout", 12), MODIFY_INSTANCE_OK);
    EXPECT_TRUE(agent->m_bIsAdapterMapsReady);
    done = true;
  });
  while (log.count("TVXHBA_ProviderConfigSetting_Provider::modify_instance()") == 0)
    std::this_thread::yield();
  EXPECT_FALSE(done);
  EXPECT_EQ(agent->m_CacheTimeout, 10u);
  release = true;
  holder.join();
  client.join();
  awaitIdle(*agent);
  EXPECT_EQ(current(SETTING_CACHE_TIMEOUT), 12);
  EXPECT_EQ(agent->m_CacheTimeout, 12u);
}

}  // namespace
}  // namespace cimrt::test
