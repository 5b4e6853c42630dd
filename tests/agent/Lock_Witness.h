// Whether a step of a request runs with the agent's data lock held.
#pragma once

#include <string>
#include <utility>

#include "agent/Ranked_Mutex.h"
#include "common/CLogger.h"

namespace cimrt::test {

/// Looks when a text is logged, on the thread that logs it. Debug builds alone book their locks.
class Lock_Witness : public TVX_LoggerInterface {
 public:
  explicit Lock_Witness(std::string text) : m_Text(std::move(text)) {
    getLogger().registerInterface(this);
  }
  ~Lock_Witness() override { getLogger().unregisterInterface(this); }
  Lock_Witness(const Lock_Witness&) = delete;
  Lock_Witness& operator=(const Lock_Witness&) = delete;

  void log(int, const char*, const unsigned*, const char* text) override {
    if (!text || m_Text != text) return;
    wasHeld = !may_take_lock(Lock_Rank::DATA, false);
    classWasFree = may_take_lock(Lock_Rank::CLASS_STATIC, false);
  }
  void open() override {}
  void close() override {}
  void clear() override {}

  bool wasHeld = false;
  bool classWasFree = false;  ///< the lock of an active class

 private:
  std::string m_Text;
};

}  // namespace cimrt::test
