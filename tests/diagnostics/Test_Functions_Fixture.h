// A host on which the test functions are run, and what their runs must have left.
#pragma once

#include "Diagnostics_Fixture.h"

namespace cimrt::test {

using Texts = std::vector<std::string>;

/// Every fault makes the library answer a status to one entry point.
inline std::string failing(const char* call, int status, const char* more = "") {
  return std::string(R"({"call": ")") + call + R"(", "status": )" + std::to_string(status) + more +
         "}";
}

class Test_Functions : public Diagnostics_Test {
 protected:
  void aimAt(const char* target) {
    settings(ECHO_TEST)->TargetDevice.set(target);
    settings(PING_TEST)->TargetDevice.set(target);
  }
  std::size_t records() {
    return agent->m_TVXHBA_DiagnosticServiceRecord_map.size() +
           agent->m_TVXHBA_DiagnosticCompletionRecord_map.size();
  }
  /// A run that made neither job nor record.
  void expectNothingLeft(const Ran& ran) {
    EXPECT_FALSE(ran.job);
    EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
    EXPECT_EQ(records(), 0u);
  }
  void expectJob(const Ran& ran, int state, const std::string& text) {
    ASSERT_TRUE(ran.job) << text;
    EXPECT_EQ(numberOf(ran.job->JobState), state) << text;
    EXPECT_EQ(textOf(lastServiceRecord().RecordData), text);
    EXPECT_EQ(textOf(lastCompletionRecord().RecordData).substr(0, text.size()), text);
    EXPECT_EQ(numberOf(lastCompletionRecord().CompletionState), state == 7 ? 2 : 5) << text;
  }
};

inline constexpr int GOOD = 7;
inline constexpr int BAD = 10;

}  // namespace cimrt::test
