// The record log under many threads: what each test says holds in any build; under ThreadSanitizer
// it also shows that nothing is touched without its lock.
#include <atomic>
#include <cstdio>
#include <filesystem>
#include <map>
#include <thread>
#include <vector>

#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "agent/RecordLogs.h"
#include "logs/Driver_Log_Providers.h"
#include "logs/Log_Entry_Providers.h"
#include "logs/TVXHBA_RecordLog_Provider.h"

namespace cimrt::test {
namespace {

class Log_Threads : public Agent_Test {
 protected:
  void SetUp() override {
    Agent_Test::SetUp();
    std::filesystem::create_directories(root / "var/log");
    writeFile("etc/torvex_fc_provider.dmp", "1,3,1\n");
    useScenario(singlePortCards(1));
    agent = &startAgent();
    refresh(*agent);
    own.reset(clone(findRecordLog(*agent, providerLogInstanceID(*agent))));
    driver.reset(clone(findRecordLog(*agent, driverLogInstanceID(*agent))));
  }
  void TearDown() override {
    own.reset();
    driver.reset();
    getLogger().setMode(TVX_LOG_MODE_OFF);
    Agent_Test::TearDown();
  }

  /// Threads that log until `stop`.
  void startLogging(int count) {
    for (int i = 0; i < count; i++)
      threads.emplace_back([this, i] {
        for (int line = 0; !stop; line++) TVX_LOG(TVX_ERR, "line %d of thread %d", line, i);
      });
  }
  void finish() {
    stop = true;
    for (std::thread& thread : threads) thread.join();
    threads.clear();
    EXPECT_EQ(failures, 0);
  }
  /// Counts an answer that is not as it must be.
  void require(bool condition) {
    if (!condition) failures++;
  }
  void change(const TVXHBA_RecordLog& record, std::uint16_t state) {
    Property<std::uint16_t> requested{};
    requested.set(state);
    Property<std::uint32_t> result{};
    TVXHBA_RecordLog_Provider().RequestStateChange(&record, requested, nullptr,
                                                   Property<Datetime>{}, result);
    require(result.value == 0);
  }
  void setParams(std::uint16_t level, std::uint16_t mode, const std::string& path) {
    Property<std::uint16_t> levelValue{};
    levelValue.set(level);
    Property<std::uint16_t> modeValue{};
    modeValue.set(mode);
    Property<String> pathValue{};
    pathValue.set(path.c_str());
    Property<std::uint32_t> result{};
    TVXHBA_RecordLog_Provider().SetLogParams(own.get(), levelValue, modeValue, pathValue, result);
    require(result.value == 0);
  }

  ProviderAgent* agent = nullptr;
  Ref<TVXHBA_RecordLog> own;
  Ref<TVXHBA_RecordLog> driver;
  std::vector<std::thread> threads;
  std::atomic<bool> stop{false};
  std::atomic<int> failures{0};
};

TEST_F(Log_Threads, TheRingIsReadAndClearedWhileItTurns) {
  startLogging(2);
  while (agent->m_CIMLogger.lastIndex() < 1024) std::this_thread::yield();
  for (int round = 0; round < 4; round++) {
    Delivered entries;
    TVXHBA_LogEntry_Provider().enum_instances(nullptr, entries.handler());
    require(entries.size() <= 1024);
    for (std::size_t i = 0; i < entries.size(); i++) {
      const std::string text = textOf(entries.at<TVXHBA_LogEntry>(i)->RecordData);
      require(text.front() == '[' && text.back() == ']');
    }
    Property<std::uint32_t> result{};
    TVXHBA_RecordLog_Provider().ClearLog(own.get(), result);
    require(result.value == 0);
  }
  finish();
}

TEST_F(Log_Threads, TheRingKeepsTheNewestWholeRecordsOfEveryThread) {
  startLogging(4);
  while (agent->m_CIMLogger.lastIndex() < 3 * 1024) std::this_thread::yield();
  finish();
  const std::vector<TVX_CIMLogger::Record> records = agent->m_CIMLogger.records();
  ASSERT_EQ(records.size(), 1024u);
  // From the oldest to the newest each thread's lines follow each other without a gap.
  const auto oldest = static_cast<std::size_t>(agent->m_CIMLogger.lastIndex() + 1) % 1024;
  std::map<int, int> last;
  for (std::size_t i = 0; i < records.size(); i++) {
    int line = -1;
    int thread = -1;
    char end = 0;
    const char* text = records[(oldest + i) % 1024].text;
    ASSERT_EQ(std::sscanf(text, "[line %d of thread %d%c", &line, &thread, &end), 3) << text;
    EXPECT_EQ(end, ']') << text;
    if (last.count(thread) != 0) {
      EXPECT_EQ(line, last[thread] + 1) << text;
    }
    last[thread] = line;
  }
}

TEST_F(Log_Threads, TheLoggerIsSetWhileOthersLogThroughIt) {
  startLogging(2);
  for (int round = 0; round < 4; round++) {
    setParams(5, 4, (root / "var/log/one.log").string());
    change(*own.get(), 3);
    setParams(1, 1, "");
    change(*own.get(), 2);
    setParams(3, 2, (root / "var/log/two.log").string());
  }
  finish();
  EXPECT_EQ(getLogger().mode(), TVX_LOG_MODE_FILE);
  EXPECT_EQ(agent->m_FileLogger.path(), (root / "var/log/two.log").string());
}

TEST_F(Log_Threads, TheDriversLogIsReadWhileItIsSwitched) {
  writeFile("var/log/messages", "tvfc one\ntvfc two\n");
  for (int i = 0; i < 2; i++)
    threads.emplace_back([this] {
      while (!stop) {
        Delivered entries;
        TVXHBA_FCDriverLogEntry_Provider().enum_instances(nullptr, entries.handler());
        require(entries.size() == 0 || entries.size() == 2);
      }
    });
  for (int round = 0; round < 5; round++) {
    change(*driver.get(), 2);
    turnClock(11 * 60'000'000ull);
    agent->BuildCimrtInfo();
    change(*driver.get(), 3);
  }
  finish();
  awaitIdle(*agent);
}

}  // namespace
}  // namespace cimrt::test
