// Many clients at once: tests run one after the other, and readers never see a half-made result.
#include <atomic>
#include <thread>
#include <vector>

#include "Diagnostics_Fixture.h"

namespace cimrt::test {
namespace {

using Diagnostic_Threads = Diagnostics_Test;

TEST_F(Diagnostic_Threads, TestsRunOneAtATimeWhileOthersReadAndClear) {
  build(hostWith(R"(, "diagnostics": {"post": {"result": 7}, "pci": {"result": 4}})"));
  constexpr int RUNS = 10;
  std::atomic<bool> done{false};
  const auto runAll = [&](const char* name, const char* text) {
    const Ref<TVXHBA_FCHBADiagnosticTest> model = [&] {
      Ranked_Lock lock(agent->m_DataMutex);
      return Ref<TVXHBA_FCHBADiagnosticTest>(clone(test(name)));
    }();
    const Ref<TVXHBA_PortController> element = [&] {
      Ranked_Lock lock(agent->m_DataMutex);
      return Ref<TVXHBA_PortController>(clone(controller()));
    }();
    for (int i = 0; i < RUNS; i++) {
      TVXHBA_FCHBADiagnosticTest_Provider provider;
      CIM_ConcreteJob* job = nullptr;
      Property<std::uint32_t> result{0, 1};
      Instance* object = element.get();
      provider.RunDiagnosticService(model.get(), static_cast<CIM_ManagedElement*>(object), nullptr,
                                    nullptr, job, result);
      EXPECT_EQ(numberOf(result), 0);
      EXPECT_NE(job, nullptr);
      unref(job);
    }
    Ranked_Lock lock(agent->m_DataMutex);
    auto& records = agent->m_TVXHBA_DiagnosticServiceRecord_map;
    for (std::size_t i = 0; i < records.size(); i++)
      if (textOf(records[i]->ServiceName) == name) {
        EXPECT_EQ(textOf(records[i]->RecordData), std::string(name) + text);
      }
  };
  std::vector<std::thread> threads;
  threads.emplace_back(runAll, SELF_TEST, " Resulted with Failure, Result - Mailbox Error");
  threads.emplace_back(runAll, HOST_LOOPBACK_TEST, " Resulted with Failure, Result - Timeout");
  threads.emplace_back(runAll, STATUS_TEST, " Resulted with Success");
  std::thread reader([&] {
    while (!done) {
      Delivered records;
      agent->enumInstances(agent->m_TVXHBA_DiagnosticCompletionRecord_map, records.handler());
      Ref<TVXHBA_DiagnosticsLog> model(TVXHBA_DiagnosticsLog::create());
      model->InstanceID.set(RESET_TEST);
      Property<std::uint32_t> result{0, 1};
      TVXHBA_DiagnosticsLog_Provider().ClearLog(model.get(), result);
    }
  });
  for (std::thread& thread : threads) thread.join();
  done = true;
  reader.join();
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 3u * RUNS) << "every job has its own number";
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 3u * RUNS);
}

}  // namespace
}  // namespace cimrt::test
