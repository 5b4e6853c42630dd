// Several clients at once through the library, over several lives.
#include <dlfcn.h>

#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

#include "Provider_Fixture.h"
#include "broker/Objects.h"
#include "broker/Scope.h"
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

TEST_F(Readers, OfSANClassesOnAStaleCacheWaitForTheNewScan) {
  writeFile("etc/torvex_fc_provider.conf", "TVX_PROVIDER_REFRESH_SANDATA = FALSE\n");
  const unsigned long units = 20;
  useScenario(volumes(20));
  load();
  EXPECT_EQ(instances("TVXHBA_FCPort").size(),
            1u);  // the SAN is not read yet: stale from the start
  tvxsim_forget_calls();
  addFault(R"({"call": "HBA_SendReadCapacity", "delay_ms": 1})");
  std::vector<std::thread> clients;
  for (const char* name : {"TVXHBA_StorageVolume", "TVXHBA_SCSIProtocolEndpoint",
                           "TVXHBA_SCSIInitiatorTargetStorageVolumePath"})
    clients.emplace_back([this, name, units] {
      EXPECT_EQ(instances(name).size(), units) << name;
      EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), units) << name;
    });
  for (std::thread& client : clients) client.join();
  EXPECT_EQ(tvxsim_calls("HBA_SendReadCapacity", nullptr), units) << "one scan serves them all";
}

/// Calls every factory of the library once, by its long name.
std::vector<void*> callFactories(void* library, host::Core& core,
                                 const std::vector<std::string>& names) {
  using Factory = void* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  host::Scope scope(core, "factories");
  const host::ScopeGuard guard(scope);
  const CMPIContext* context = host::makeContext(core, {}, host::Origin::HandedOut);
  std::vector<void*> made;
  for (const std::string& name : names)
    for (const char* kind : {"Instance", "Association", "Method"})
      if (void* found = dlsym(library, (name + "_Provider_Create_" + kind + "MI").c_str()))
        made.push_back(reinterpret_cast<Factory>(found)(core.face(), context, nullptr));
  return made;
}

TEST_F(Readers, FactoriesRunOnSeveralThreadsAtOnce) {
  load();
  void* library = dlopen(TVX_PROVIDER_LIBRARY, RTLD_NOW | RTLD_LOCAL | RTLD_NOLOAD);
  ASSERT_NE(library, nullptr) << dlerror();
  host::Core& core = host::Core::of(broker->face());
  const std::vector<std::string> names = servedClasses();
  constexpr std::size_t THREADS = 3;
  std::vector<std::vector<void*>> made(THREADS);
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < THREADS; i++)
    threads.emplace_back([&, i] { made[i] = callFactories(library, core, names); });
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(made[0].size(), 404u);
  for (const std::vector<void*>& each : made) EXPECT_EQ(each, made[0]) << "one set for all";
  for (void* each : made[0]) EXPECT_NE(each, nullptr);

  // As many cleanups as factory calls: the last of each class lets its provider go.
  host::Scope scope(core, "cleanups");
  const host::ScopeGuard guard(scope);
  const CMPIContext* context = host::makeContext(core, {}, host::Origin::HandedOut);
  for (const std::vector<void*>& each : made)
    for (void* face : each) {
      auto* mi = static_cast<CMPIMethodMI*>(face);  // all kinds begin with the same head
      EXPECT_EQ(mi->ft->cleanup(mi, context, 0).rc, CMPI_RC_OK);
    }
  EXPECT_EQ(tvxsim_open_handles(), 0u);
  EXPECT_EQ(dlclose(library), 0);
}

TEST_F(Readers, AreNotLostWhenAServerThatTerminatesCleansUp) {
  load();
  std::atomic<bool> over{false};
  std::atomic<int> wrong{0};
  std::atomic<int> answered{0};
  std::vector<std::thread> clients;
  for (const char* name : {"TVXHBA_FCPort", "TVXHBA_Card", "TVXHBA_StorageVolume"})
    clients.emplace_back([&, name] {
      while (!over) {
        const host::Reply reply = broker->enumerateInstances(name);
        const int code = reply.status.rc;
        // A request that comes between the cleanup and the next factory call is refused.
        if (code != CMPI_RC_OK && code != CMPI_RC_ERR_FAILED) wrong++;
        if (reply.report.leaks()) wrong++;
        answered++;
      }
    });
  const std::vector<std::string> names = servedClasses();
  for (int round = 0; round < 10; round++) {
    for (const std::string& name : names)
      for (const auto kind : {host::InterfaceKind::Instance, host::InterfaceKind::Association,
                              host::InterfaceKind::Method})
        broker->cleanup(name, kind, true);
    std::this_thread::sleep_for(std::chrono::milliseconds(3));
  }
  over = true;
  for (std::thread& client : clients) client.join();
  EXPECT_EQ(wrong, 0);
  EXPECT_GT(answered, 3);
  EXPECT_EQ(instances("TVXHBA_FCPort").size(), 4u);
}

TEST_F(Readers, OfCountersHaveThemReadOncePerPortInTenSeconds) {
  useScenario(R"({"cards": [
    {"serial_number": "A", "ports": [{"wwpn": "10000000000000A1",
      "statistics": {"crc_errors": [1, 2, 3]}}]},
    {"serial_number": "B", "ports": [{"wwpn": "10000000000000A2"}]}]})");
  load();
  instances("TVXHBA_FCPort");
  tvxsim_forget_calls();
  addFault(R"({"call": "LRM_GetPortStatistics", "delay_ms": 5})");
  std::vector<std::thread> clients;
  for (int i = 0; i < 4; i++)
    clients.emplace_back([this] {
      for (int read = 0; read < 5; read++) {
        const host::Reply reply = broker->enumerateInstances("TVXHBA_FCPortStatistics");
        EXPECT_EQ(reply.status.rc, CMPI_RC_OK);
        ASSERT_EQ(reply.instances.size(), 2u);
        EXPECT_EQ(reply.instances[0].property("CRCErrors").asUnsigned(), 1u);
      }
    });
  for (std::thread& client : clients) client.join();
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", "10000000000000A1"), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_GetPortStatistics", "10000000000000A2"), 1u);
}

}  // namespace
}  // namespace tvx::test
