// Several clients at once through the library, over several lives.
#include <atomic>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"

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

}  // namespace
}  // namespace tvx::test
