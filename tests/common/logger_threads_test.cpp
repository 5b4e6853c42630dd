#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "common/CLogger.h"
#include "common/TvxConfigFile.h"
#include "support/Temp_Root.h"

namespace {

using cimrt::getLogger;

TEST(Logger_Threads, LogWhileTheLoggerIsReconfigured) {
  const tvx::test::Temp_Root root;
  cimrt::TVX_FileLogger file;
  cimrt::TVX_CIMLogger records(16);
  getLogger().setMode(4);
  getLogger().enable();
  constexpr int ROUNDS = 200;
  std::vector<std::thread> threads;
  for (int t = 0; t < 3; ++t) {
    threads.emplace_back([] {
      for (int i = 0; i < ROUNDS; ++i) TVX_LOG(cimrt::TVX_ERR, "message %d", i);
    });
  }
  threads.emplace_back([&] {
    for (int i = 0; i < ROUNDS; ++i) {
      const std::string path = root.path(i % 2 != 0 ? "/tmp/a.log" : "/tmp/b.log");
      EXPECT_EQ(file.validateAndSetPath(path.c_str(), i % 3 == 0), 0);
      getLogger().setMode(i % 5);
      getLogger().setLevel(i % 7);
      i % 2 != 0 ? getLogger().enable() : getLogger().disable();
      if (i % 16 == 0) getLogger().clearAll();
    }
  });
  threads.emplace_back([&] {
    for (int i = 0; i < ROUNDS; ++i) {
      EXPECT_LE(records.records().size(), 16U);
      const cimrt::TVX_CIMLogger other(4);
      getLogger().loadConfig();
    }
  });
  for (std::thread& thread : threads) thread.join();
  getLogger().setMode(0);
}

TEST(Logger_Threads, SettingsAreReadWhileTheyChange) {
  cimrt::TvxConfigFile config;
  std::thread writer([&] {
    for (std::uint32_t i = 0; i < 1000; ++i) {
      config.setCacheTimeout(i % 40);
      config.setAdapterRefresh(i % 3);
      config.setSANRefresh(i % 3);
    }
  });
  for (int i = 0; i < 1000; ++i) {
    EXPECT_LE(config.getCacheTimeout(), 30U);
    static_cast<void>(config.getAdapterRefresh());
    static_cast<void>(config.getSANRefresh());
  }
  writer.join();
}

}  // namespace
