// Several clients at once through the library, over several lives.
#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "tvxsim/tvxsim.h"

namespace tvx::test {
namespace {

using Readers = Provider_Test;

TEST_F(Readers, OfDifferentClassesAreServedWhileTheCacheIsBuilt) {
  for (int life = 0; life < 2; life++) {
    load();
    std::atomic<int> wrong{0};
    std::vector<std::thread> clients;
    for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card", "TVXHBA_StorageVolume"})
      clients.emplace_back([this, name, &wrong] {
        for (int read = 0; read < 4; read++)
          if (broker->enumerateInstances(name).status.rc != CMPI_RC_OK) wrong++;
      });
    for (std::thread& client : clients) client.join();
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
    unload();
  }
}

/// A port with `count` volumes behind it.
std::string volumes(int count) {
  return R"({"cards": [{"model": "TVX1", "serial_number": "SN1", "ports": [
    {"wwpn": "10:00:02:54:56:0C:30:01", "targets": [{"wwpn": "50:0C:0F:F1:2A:00:10:01",
     "luns": {"count": )" +
         std::to_string(count) + "}}]}]}]}";
}

void awaitCalls(const char* entryPoint, unsigned long count) {
  while (tvxsim_calls(entryPoint, nullptr) < count)
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
}

TEST_F(Readers, OfAnAdapterClassWaitForTheScanToEnd) {
  const unsigned long units = 30;
  useScenario(volumes(30));
  addFault(R"({"call": "HBA_SendReadCapacity", "delay_ms": 2})");
  load();
  std::thread first([&] { EXPECT_EQ(instances("TVXHBA_StorageVolume").size(), units); });
  awaitCalls("HBA_SendReadCapacity", 2);
  for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card"}) {
    EXPECT_EQ(instances(name).size(), 1u) << name;
    EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), units) << name;
  }
  first.join();
}

}  // namespace
}  // namespace tvx::test
