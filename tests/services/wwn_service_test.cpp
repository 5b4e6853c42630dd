// Methods of the service for world wide names.
#include <chrono>
#include <thread>

#include "Service_Test.h"
#include "services/TVXHBA_FCHBAWWNService_Provider.h"

namespace cimrt::test {
namespace {

/// What a sleep of the provider's own does in a test that looks into it.
void (*duringSleep)() = nullptr;

class Wwn_Service : public Service_Test {
 protected:
  void SetUp() override {
    Service_Test::SetUp();
    duringSleep = nullptr;
    tvxSetSleep([](std::uint64_t) {
      if (duringSleep) duringSleep();
    });
    operation.null = wwpn.null = wwnn.null = capability.null = 1;
    type.set(std::uint16_t{1});
    newWWPN.set("1000000000000B01");
    newWWNN.set("2000000000000B01");
  }
  const TVXHBA_FCHBAWWNService* service() { return agent->m_TVXHBA_FCHBAWWNService_map[0]; }

  // A change starts a refresh, which takes the maps down: what follows looks into them again.
  std::uint32_t change(const TVXHBA_FCPort* target) {
    EXPECT_EQ(provider.ChangeWWN(service(), target, newWWPN, newWWNN, type, operation, result), 0);
    awaitIdle(*agent);
    return result.value;
  }
  std::uint32_t restore(const TVXHBA_FCPort* target) {
    EXPECT_EQ(provider.RestoreWWN(service(), target, type, operation, result), 0);
    awaitIdle(*agent);
    return result.value;
  }
  std::uint32_t read(std::uint16_t kind) {
    type.set(kind);
    EXPECT_EQ(provider.ReadWWN(service(), port(), type, wwpn, wwnn, operation, result), 0);
    return result.value;
  }

  TVXHBA_FCHBAWWNService_Provider provider;
  Property<String> newWWPN{};
  Property<String> newWWNN{};
  Property<std::uint16_t> type{};
  Property<std::uint16_t> operation{};
  Property<String> wwpn{};
  Property<String> wwnn{};
  Property<std::uint32_t> capability{};
};

// --- Opening of every method

TEST_F(Wwn_Service, StrangersAreRefusedByEveryMethod) {
  build();
  const auto unknown = stranger<TVXHBA_FCHBAWWNService>();
  provider.ChangeWWN(unknown.get(), port(), newWWPN, newWWNN, type, operation, result);
  EXPECT_EQ(result.value, 33068u);
  EXPECT_EQ(operation.value, 65535);
  provider.RestoreWWN(unknown.get(), port(), type, operation, result);
  EXPECT_EQ(result.value, 33068u);
  provider.ReadWWN(unknown.get(), port(), type, wwpn, wwnn, operation, result);
  EXPECT_EQ(result.value, 33068u);
  provider.GetWWNCapability(unknown.get(), port(), capability, result);
  EXPECT_EQ(result.value, 33068u);
  EXPECT_EQ(log.count("Invalid instance of HBA WWN Management Service"), 4u);
  EXPECT_EQ(log.level("Invalid instance of HBA WWN Management Service"), TVX_ERR);
  for (const char* text : {"Entering ChangeWWN", "Entering RestoreWWN", "Entering ReadWWN",
                           "Entering GetWWNCapability"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Wwn_Service, AnEmptyServiceMapKnowsEveryService) {
  build();
  const auto unknown = stranger<TVXHBA_FCHBAWWNService>();
  agent->m_TVXHBA_FCHBAWWNService_map.clear();
  provider.GetWWNCapability(unknown.get(), port(), capability, result);
  EXPECT_EQ(result.value, 0u);
}

TEST_F(Wwn_Service, APortThatIsNotThereIsRefused) {
  build();
  const auto unknown = pathTo("10000000000000FF");
  const auto* controller = reinterpret_cast<const TVXHBA_FCPort*>(
      static_cast<const Instance*>(agent->m_TVXHBA_PortController_map[0]));
  for (const TVXHBA_FCPort* target :
       {static_cast<const TVXHBA_FCPort*>(nullptr),
        static_cast<const TVXHBA_FCPort*>(unknown.get()), controller}) {
    EXPECT_EQ(change(target), 32968u);
    EXPECT_EQ(restore(target), 32968u);
  }
  const char* text = "TVXHBA_FCHBAWWNService_Provider invald port ...return";
  EXPECT_EQ(log.count(text), 6u);
  EXPECT_EQ(log.level(text), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_ChangeWWN", nullptr), 0u);
}

TEST_F(Wwn_Service, ADeviceIdThatIsNoNameFailsAsAConversion) {
  build();
  port()->DeviceID.set("10000000");
  EXPECT_EQ(change(port()), 32968u);
  EXPECT_EQ(log.level("TVXHBA_FCHBAWWNService_Provider::str2HBAName failed"), TVX_ERR);
}

// --- Changing

TEST_F(Wwn_Service, AChangeIsWaitingForAReset) {
  build(R"("wwn_management": {"activation": "reset"})");
  type.set(std::uint16_t{0});
  EXPECT_EQ(change(port()), 0u);
  EXPECT_EQ(operation.value, 7);
  EXPECT_EQ(log.level("Writing Volatile World Wide Name."), TVX_DBG);
  EXPECT_EQ(log.level("ChangeWWN operation completed. Please restart the CIMOM to use Torvex CIM "
                      "provider"),
            TVX_INFO);
  EXPECT_EQ(read(4), 0u);
  EXPECT_EQ(operation.value, 7);
  EXPECT_EQ(textOf(wwpn), "10:00:00:00:00:00:0b:01");
  EXPECT_EQ(textOf(wwnn), "20:00:00:00:00:00:0b:01");
  EXPECT_EQ(read(3), 0u);
  EXPECT_EQ(operation.value, 4);
  EXPECT_EQ(textOf(wwpn), "10:00:00:00:00:00:00:a1");
}

TEST_F(Wwn_Service, AChangeRefreshesTheCache) {
  build(R"("wwn_management": {"activation": "at once"})");
  EXPECT_EQ(change(port()), 0u);
  EXPECT_EQ(operation.value, 8);
  EXPECT_EQ(log.level("Writing Non-Volatile World Wide Name."), TVX_DBG);
  awaitIdle(*agent);
  EXPECT_EQ(textOf(port()->DeviceID), "1000000000000B01");
}

TEST_F(Wwn_Service, ARefusedChangeRefreshesNothing) {
  build(R"("wwn_management": {"capability": 0})");
  EXPECT_EQ(change(port()), 40092u);
  EXPECT_FALSE(agent->m_bAdapterRefreshPending);
  EXPECT_EQ(log.count(" Entering BuildCimrtInfo()"), 1u);
}

TEST_F(Wwn_Service, AnEmptyNewNameIsRefused) {
  build();
  newWWPN.set("");
  EXPECT_EQ(change(port()), 32969u);
  EXPECT_EQ(log.level("New WWPN has a null pointer"), TVX_ERR);
  newWWPN.null = 1;
  EXPECT_EQ(change(port()), 32969u);
  newWWPN.set("1000000000000B01");
  newWWNN.set("");
  EXPECT_EQ(change(port()), 32969u);
  EXPECT_EQ(log.level("New WWNN has a null pointer"), TVX_ERR);
}

TEST_F(Wwn_Service, ANewNameThatIsNoNameFailsAsAConversion) {
  build();
  for (const char* name : {"1", "10000000000000", "1000000000000B0G", "10:00:00:00:00:00:0B:01"}) {
    newWWPN.set(name);
    EXPECT_EQ(change(port()), 32968u) << name;
  }
  newWWPN.set("1000000000000B01");
  newWWNN.set("2");
  EXPECT_EQ(change(port()), 32968u);
  EXPECT_EQ(log.count("TVXHBA_FCHBAWWNService_Provider::str2HBAName failed"), 5u);
}

TEST_F(Wwn_Service, AnUnknownTypeIsRefused) {
  build();
  type.set(std::uint16_t{2});
  EXPECT_EQ(change(port()), 32968u);
  EXPECT_EQ(log.level("ChangeWWN: Type 2 not recognized..."), TVX_ERR);
  EXPECT_EQ(restore(port()), 32968u);
  EXPECT_EQ(log.level("RestoreWWN: Type 2 not recognized..."), TVX_ERR);
  EXPECT_EQ(read(5), 32968u);
  EXPECT_EQ(log.level("ReadWWN: Type 5 not recognized..."), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_ReadWWN", nullptr), 0u);
}

TEST_F(Wwn_Service, ANewNameOfAVirtualPortOfAnyLocalPortIsADuplicate) {
  build(R"("vports": [{"wwpn": "1000000000000B01", "wwnn": "2000000000000C01"}])");
  EXPECT_EQ(change(port(1)), 91u);
  EXPECT_EQ(operation.value, 1);
  EXPECT_EQ(tvxsim_calls("LRM_ChangeWWN", nullptr), 0u);
  // A virtual port's node name is not looked at.
  newWWPN.set("2000000000000C01");
  EXPECT_EQ(change(port(1)), 0u);
}

TEST_F(Wwn_Service, MoreThan1023VirtualPortsCountAsNoDuplicate) {
  build(R"("vports": [{"wwpn": "1000000000000B01", "wwnn": "2000000000000C01", "count": 1023}])");
  EXPECT_EQ(change(port(1)), 91u);
  stopAgent();
  build(R"("vports": [{"wwpn": "1000000000000B01", "wwnn": "2000000000000C01", "count": 1024}])");
  EXPECT_EQ(change(port(1)), 0u);
}

TEST_F(Wwn_Service, TheNamesThatThePortHasGoToTheLibrary) {
  build();
  newWWPN.set(PORT);
  newWWNN.set("20000000000000A1");
  EXPECT_EQ(change(port()), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ChangeWWN", PORT), 1u);
}

TEST_F(Wwn_Service, ABusyAdapterIsWaitedFor) {
  build(R"("wwn_management": {"busy_calls": 5})");
  EXPECT_EQ(change(port()), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_ChangeWWN", PORT), 6u);
}

TEST_F(Wwn_Service, AnAdapterThatStaysBusyIsGivenUp) {
  build(R"("wwn_management": {"busy_calls": 100000})");
  EXPECT_EQ(change(port()), 40097u);
  EXPECT_EQ(tvxsim_calls("LRM_ChangeWWN", PORT), 301u);
}

/// Shared with the reader that comes in while the adapter is busy.
struct Reader {
  ProviderAgent* agent = nullptr;
  std::thread thread;
  std::atomic<bool> done{false};
  Delivered got;
  bool doneDuringCall = true;
};
Reader* reader = nullptr;

TEST_F(Wwn_Service, AReaderOfAnotherClassWaitsForTheEndOfALongCall) {
  build(R"("wwn_management": {"busy_calls": 1, "activation": "reset"})");
  Reader waiting;
  waiting.agent = agent;
  reader = &waiting;
  duringSleep = [] {
    reader->thread = std::thread([] {
      reader->agent->enumInstances(reader->agent->m_TVXHBA_Card_map, reader->got.handler());
      reader->done = true;
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    reader->doneDuringCall = reader->done;
  };
  EXPECT_EQ(change(port()), 0u);
  waiting.thread.join();
  EXPECT_FALSE(waiting.doneDuringCall);
  EXPECT_EQ(waiting.got.size(), 1u);
}

// --- Restoring

TEST_F(Wwn_Service, FactoryNamesAreRestored) {
  build(R"("wwn_management": {"activation": "at once", "factory_wwpn": "1000000000000F01",
                              "factory_wwnn": "2000000000000F01"})");
  type.set(std::uint16_t{0});
  EXPECT_EQ(restore(port()), 0u);
  EXPECT_EQ(operation.value, 8);
  EXPECT_EQ(log.level("Restoring Factory Default World Wide Name..."), TVX_INFO);
  awaitIdle(*agent);
  EXPECT_EQ(textOf(port()->DeviceID), "1000000000000F01");
  type.set(std::uint16_t{1});
  EXPECT_EQ(restore(port()), 0u);
  EXPECT_EQ(operation.value, 1);
  EXPECT_EQ(log.level("Restoring Non-volatile World Wide Name..."), TVX_INFO);
}

TEST_F(Wwn_Service, AFailedRestoreRefreshesTheCacheAllTheSame) {
  build(R"("wwn_management": {"capability": 0})");
  EXPECT_EQ(restore(port()), 0u);
  EXPECT_EQ(operation.value, 65535);
  awaitIdle(*agent);
  EXPECT_EQ(log.count(" Entering BuildCimrtInfo()"), 2u);
  EXPECT_EQ(log.count(" updateAdapterMaps: Entry"), 1u);
}

// --- Reading

TEST_F(Wwn_Service, EveryKindOfNamesIsRead) {
  build(R"("wwn_management": {"factory_wwpn": "1000000000000F01",
                              "factory_wwnn": "2000000000000F01"})");
  EXPECT_EQ(read(0), 0u);
  EXPECT_EQ(operation.value, 9);
  EXPECT_EQ(log.level("Reading Volatile WWNs."), TVX_DBG);
  EXPECT_EQ(read(1), 0u);
  EXPECT_EQ(textOf(wwpn), "10:00:00:00:00:00:00:a1");
  EXPECT_EQ(operation.value, 65535);
  EXPECT_EQ(log.level("Reading Non-Volatile WWNs."), TVX_DBG);
  EXPECT_EQ(read(2), 0u);
  EXPECT_EQ(textOf(wwpn), "10:00:00:00:00:00:0f:01");
  EXPECT_EQ(log.level("Reading Factory Default WWNs."), TVX_DBG);
  EXPECT_EQ(read(3), 0u);
  EXPECT_EQ(operation.value, 4);
  EXPECT_EQ(log.level("Reading current WWNs."), TVX_DBG);
  wwpn.null = wwnn.null = 1;
  EXPECT_EQ(read(4), 0u);
  EXPECT_EQ(operation.value, 9);
  EXPECT_TRUE(wwpn.is_null() && wwnn.is_null());
  EXPECT_EQ(log.level("Reading configured WWNs."), TVX_DBG);
  // Reading leaves the cache alone.
  EXPECT_EQ(log.count(" updateAdapterMaps: Entry"), 0u);
}

TEST_F(Wwn_Service, CapabilityIsTold) {
  build(R"("wwn_management": {"capability": 12})");
  provider.GetWWNCapability(service(), port(), capability, result);
  EXPECT_EQ(result.value, 0u);
  EXPECT_EQ(numberOf(capability), 12);
}

}  // namespace
}  // namespace cimrt::test
