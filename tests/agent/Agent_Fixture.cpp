#include "Agent_Fixture.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <fstream>
#include <thread>

#include "common/TVX_Clock.h"
#include "common/TVX_Memory.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {

namespace {

std::atomic<std::uint64_t> clockUsec{0};

std::uint64_t testClock() {
  return clockUsec;
}

constexpr std::uint64_t START_OF_TIME = 1'700'000'000'000'000;
constexpr std::uint64_t PAUSE = 3'600'000'000;

constexpr const char* RUN_BEGIN = "PERF: DataFetch_Handler Thread BEGIN";
constexpr const char* RUN_END = "PERF: DataFetch_Handler Thread END";

/// Each test starts later than all before it: the throttles of the live updates are the process's.
std::uint64_t nextStart() {
  static std::uint64_t start = START_OF_TIME;
  start += PAUSE;
  return std::max(start, clockUsec + PAUSE);
}

}  // namespace

void Log_Record::log(int level, const char*, const unsigned*, const char* text) {
  std::lock_guard lock(m_Mutex);
  m_Messages.push_back({level, text ? text : ""});
}

void Log_Record::clear() {
  std::lock_guard lock(m_Mutex);
  m_Messages.clear();
}

std::vector<Logged> Log_Record::all() const {
  std::lock_guard lock(m_Mutex);
  return m_Messages;
}

std::size_t Log_Record::count(const std::string& text) const {
  std::lock_guard lock(m_Mutex);
  return static_cast<std::size_t>(
      std::count_if(m_Messages.begin(), m_Messages.end(),
                    [&](const Logged& message) { return message.text == text; }));
}

int Log_Record::level(const std::string& text) const {
  std::lock_guard lock(m_Mutex);
  for (const Logged& message : m_Messages)
    if (message.text == text) return message.level;
  return -1;
}

std::vector<std::string> Log_Record::only(const std::vector<std::string>& texts) const {
  std::vector<std::string> found;
  for (const Logged& message : all())
    if (std::find(texts.begin(), texts.end(), message.text) != texts.end())
      found.push_back(message.text);
  return found;
}

void Agent_Test::SetUp() {
  std::string name = (std::filesystem::temp_directory_path() / "tvx_agent_XXXXXX").string();
  ASSERT_NE(mkdtemp(name.data()), nullptr);
  root = name;
  std::filesystem::create_directories(root / "etc");
  std::filesystem::create_directories(root / "opt/ibm/platform/log");
  setenv("TVX_ROOT", root.c_str(), 1);
  clockUsec = nextStart();
  tvxSetClock(testClock);
  getLogger().clearDefaultLog();
  getLogger().enable();
  getLogger().registerInterface(&log);
  useScenario();
}

void Agent_Test::TearDown() {
  tvxSetAllocator(nullptr);
  if (m_bReferenced) stopAgent();
  tvxSetSleep(nullptr);
  getLogger().dropInterfaces();
  tvxSetClock(nullptr);
  std::filesystem::remove_all(root);
}

void Agent_Test::useScenario(const std::string& json) {
  const int result = json.empty() ? tvxsim_load(nullptr) : tvxsim_load_text(json.c_str());
  ASSERT_EQ(result, 0) << tvxsim_last_error();
  tvxsim_forget_calls();
}

void Agent_Test::addFault(const std::string& json) {
  ASSERT_EQ(tvxsim_add_fault(json.c_str()), 0) << tvxsim_last_error();
}

ProviderAgent& Agent_Test::startAgent() {
  ProviderAgent* agent = ProviderAgent::getInstance();
  ProviderAgent::addRef();
  m_bReferenced = true;
  return *agent;
}

ProviderAgent& Agent_Test::builtAgent(const std::string& json) {
  useScenario(json);
  ProviderAgent& agent = startAgent();
  refresh(agent);
  return agent;
}

void Agent_Test::stopAgent() {
  m_bReferenced = false;
  ProviderAgent::releaseRef();
}

void Agent_Test::refresh(ProviderAgent& agent) {
  agent.m_bAdapterRefreshPending = true;
  agent.BuildCimrtInfo();
  awaitIdle(agent);
}

void Agent_Test::awaitIdle(ProviderAgent& agent) {
  const auto pause = [] { std::this_thread::sleep_for(std::chrono::milliseconds(1)); };
  const auto isRunning = [&agent] {
    Ranked_Lock lock(agent.m_ThreadMutex);
    return agent.m_bThreadRunning;
  };
  while (isRunning()) pause();
  // Its last word comes after that; a test that reads the log must not meet it later.
  constexpr int PATIENCE = 2000;
  for (int i = 0; i < PATIENCE && log.count(RUN_BEGIN) > log.count(RUN_END); i++) pause();
}

void Agent_Test::writeFile(const std::string& path, const std::string& text) {
  std::ofstream(root / path) << text;
}

void Agent_Test::turnClock(std::uint64_t usec) {
  clockUsec += usec;
}

Delivered::~Delivered() {
  for (Instance* instance : m_Instances) unref(instance);
}

Instance_Handler Delivered::handler() {
  return {take, this};
}

bool Delivered::take(Instance* instance, std::int32_t, void* data) {
  auto* self = static_cast<Delivered*>(data);
  Ref<Instance> owned(instance);
  if (self->probe) self->probe();
  if (instance) self->m_Instances.push_back(owned.release());
  return self->m_Instances.size() < self->limit;
}

bool isFree(Ranked_Mutex& mutex) {
  std::atomic<bool> taken{false};
  std::thread other([&] {
    Ranked_Lock lock(mutex);
    taken = true;
  });
  other.join();
  return taken;
}

std::string singlePortCards(int cards) {
  std::string json = R"({"cards": [)";
  for (int i = 0; i < cards; i++) {
    const std::string digit = std::to_string(i);
    if (i > 0) json += ",";
    json += R"({"model": "TVX1600)" + digit + R"(", "serial_number": "SN)" + digit +
            R"(", "ports": [{"wwpn": "10:00:00:00:00:00:00:0)" + digit +
            R"(", "wwnn": "20:00:00:00:00:00:00:0)" + digit + R"("}]})";
  }
  return json + "]}";
}

}  // namespace cimrt::test
