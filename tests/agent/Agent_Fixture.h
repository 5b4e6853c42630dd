// An agent over the simulated libraries, with a root folder of its own, a clock that the test turns
// and a record of what was logged.
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <mutex>
#include <string>
#include <vector>

#include "agent/ProviderAgent.h"
#include "common/CLogger.h"

namespace cimrt::test {

/// One logged message.
struct Logged {
  int level;
  std::string text;
};

/// Back end that keeps every message.
class Log_Record : public TVX_LoggerInterface {
 public:
  void log(int level, const char* file, const unsigned* line, const char* text) override;
  void open() override {}
  void close() override {}
  void clear() override;

  std::vector<Logged> all() const;
  std::size_t count(const std::string& text) const;
  /// Level of the first message with that text, or -1.
  int level(const std::string& text) const;
  /// The messages among `texts`, in the order in which they came.
  std::vector<std::string> only(const std::vector<std::string>& texts) const;

 private:
  mutable std::mutex m_Mutex;
  std::vector<Logged> m_Messages;
};

/// Base of the agent's tests. Each test has its own root folder and starts with no agent; clock,
/// sleep and allocator are the system's own again after it.
class Agent_Test : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  /// Makes the simulated host of a scenario text; the default scenario without one.
  void useScenario(const std::string& json = {});
  void addFault(const std::string& json);
  /// The agent, with a reference that `TearDown` gives back.
  ProviderAgent& startAgent();
  /// The agent of a scenario's host, with its adapter maps ready.
  ProviderAgent& builtAgent(const std::string& json);
  /// Gives the reference back now: the agent is gone afterwards.
  void stopAgent();
  /// Runs refreshes until the adapter maps are ready, and waits for the thread to end.
  void refresh(ProviderAgent& agent);
  /// Waits until no refresh thread runs, and the last one has logged its end.
  void awaitIdle(ProviderAgent& agent);
  /// Writes a file under the root folder.
  void writeFile(const std::string& path, const std::string& text);

  static void turnClock(std::uint64_t usec);

  Log_Record log;
  std::filesystem::path root;

 private:
  bool m_bReferenced = false;
};

/// Instances that a handler got. Owns them.
class Delivered {
 public:
  Delivered() = default;
  ~Delivered();
  Delivered(const Delivered&) = delete;
  Delivered& operator=(const Delivered&) = delete;

  Instance_Handler handler();
  std::size_t size() const { return m_Instances.size(); }
  template <class T>
  const T* at(std::size_t i) const {
    return static_cast<const T*>(m_Instances.at(i));
  }
  /// After so many instances the handler wants no more.
  std::size_t limit = static_cast<std::size_t>(-1);
  /// What the handler does before it keeps an instance; what it throws ends the delivery.
  void (*probe)() = nullptr;

 private:
  static bool take(Instance* instance, std::int32_t status, void* data);
  std::vector<Instance*> m_Instances;
};

/// Takes the lock on another thread and gives it back: true. Hangs, and so fails the test, if the
/// lock is held for good.
bool isFree(Ranked_Mutex& mutex);

/// A scenario of `cards` cards of one port each, in JSON.
std::string singlePortCards(int cards);

}  // namespace cimrt::test
