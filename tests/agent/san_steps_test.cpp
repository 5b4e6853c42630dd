// How the build of the SAN maps ends early, and each step's failure when its map refuses the
// instance.
#include "San_Test.h"
#include "agent/Map_Insert.h"
#include "agent/SanBuild.h"

namespace cimrt::test {
namespace {

constexpr const char* NO_INITIATOR =
    "Could not find TVXHBA_SCSIProtocolEndpoint Initiator instance.";
constexpr const char* ERROR = "Error updating SAN maps";
constexpr const char* CLEAN_EXIT = "PERF: updateSANMaps: cleanExit";

class San_Steps : public San_Maps {
 protected:
  /// Runs steps of the unit at `index` again, which then meet their own entries in the maps.
  std::int32_t again(ProviderAgent& agent, std::size_t index,
                     std::initializer_list<Build_Step<San_Unit_Build>> steps) {
    San_Build san{agent, agent.m_CIM_ComputerSystem_map[0]};
    auto& port = dynamic_cast<FCPort&>(*agent.m_pData->m_Ports.at(0));
    San_Port_Build portBuild{san, port, agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map[0]};
    const Target& target = *port.getTarget(static_cast<int>(index));
    San_Unit_Build unit{portBuild, target, index, unitTexts(port.m_Name, target)};
    unit.endpoint = agent.m_TVXHBA_SCSIProtocolEndpoint_map[index];
    for (const Build_Step<San_Unit_Build> step : steps)
      if (const std::int32_t result = step(unit); result != 0) return result;
    return 0;
  }
};

// --- The walk ------------------------------------------------------------------------------------

constexpr const char* TWO_PORTS = R"({"cards": [{"serial_number": "A", "ports": [
  {"wwpn": "1000000000000001", "targets": [{"wwpn": "5000000000000001", "luns": {"count": 2}}]},
  {"wwpn": "1000000000000002", "targets": [{"wwpn": "5000000000000002", "luns": {"count": 3}}]}
  ]}]})";

TEST_F(San_Steps, PortWithoutInitiatorEndpointEndsTheBuildWithWhatThereIs) {
  ProviderAgent& agent = build(TWO_PORTS);
  ASSERT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 5u);
  agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map[1]->Name.set("another");
  log.clear();
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level(NO_INITIATOR), TVX_ERR);
  EXPECT_EQ(log.count(CLEAN_EXIT), 0u);
  EXPECT_EQ(log.count("Set content: 1000000000000001|5000000000000001"), 0u);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 2u);
  Delivered delivered;
  agent.enumSANInstances(agent.m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map,
                         delivered.handler());
  EXPECT_EQ(delivered.size(), 2u) << "what stands for the ports before it is served";
  agent.m_TVXHBA_SCSIProtocolInitiatorEndpoint_map.clear();
  EXPECT_EQ(rebuildSAN(agent), 0x8001);
  EXPECT_EQ(log.count(NO_INITIATOR), 2u);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 0u);
}

TEST_F(San_Steps, RefreshServesTheUnitsOfThePortsBeforeOneThatTheAdapterMapsLack) {
  // Two ports on one adapter cannot both be in the adapter maps: those end before the second. What
  // lies behind the adapter is told of either.
  ProviderAgent& agent = buildHost(R"({"cards": [{"serial_number": "A", "adapter_per": "card",
    "ports": [
      {"wwpn": "1000000000000001", "targets": [{"wwpn": "5000000000000001", "luns": {"count": 2}}]},
      {"wwpn": "1000000000000002"}]}]})");
  EXPECT_EQ(agent.m_pData->m_Ports.at(1)->getNumberOfTargets(), 2u);
  EXPECT_EQ(log.level(NO_INITIATOR), TVX_ERR);
  EXPECT_EQ(log.count(CLEAN_EXIT), 0u);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  Delivered delivered;
  agent.enumSANInstances(agent.m_TVXHBA_SCSIProtocolEndpoint_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 2u);
  log.clear();
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  const std::vector<std::string> lines = {
      "Creating classes for port 0.", "Creating classes for target 0 of 2.",
      "Creating classes for target 1 of 2.", "Creating classes for port 1.", NO_INITIATOR};
  EXPECT_EQ(log.only(lines), lines);
}

TEST_F(San_Steps, PartialMapsAreServedAndTheNextRefreshRepairsThem) {
  useScenario(unitsBehindOnePort(R"([{"first": 0, "count": 3}, {"first": 1}, {"first": 9}])"));
  ProviderAgent& agent = rebuild();
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_SCSIProtocolEndpoint_map"), TVX_CRIT);
  EXPECT_EQ(log.count(CLEAN_EXIT), 0u);
  EXPECT_EQ(log.count("No entries in the set"), 0u);
  EXPECT_TRUE(agent.m_bIsSANMapsReady);
  Delivered delivered;
  agent.enumSANInstances(agent.m_TVXHBA_StorageVolume_map, delivered.handler());
  EXPECT_EQ(delivered.size(), 3u);  // up to the unit that stands in the mapping twice
  EXPECT_EQ(log.count("Set content: 10000254560C3001|500C0FF12A001001"), 0u);
  EXPECT_EQ(rebuildSAN(agent), 0x8001);
  const std::vector<std::size_t> sizes = sizesOf(agent);
  EXPECT_EQ(std::vector(sizes.begin(), sizes.begin() + 5), std::vector<std::size_t>(5, 3));
  useScenario(unitsBehindOnePort(R"({"count": 4})"));
  refresh(agent);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 4u);
}

TEST_F(San_Steps, AdapterOfAnotherTypeIsSkipped) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  Adapter& adapter = *agent.m_pData->m_Adapters[0];
  adapter.m_Type = 2;
  EXPECT_EQ(rebuildSAN(agent), 0);
  EXPECT_EQ(
      log.level("Skippping Adapter [" + adapter.getName() + "] since it is not an FC Adapter"),
      TVX_DBG);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 0u);
  EXPECT_EQ(log.level("No entries in the set"), TVX_WARN);
}

TEST_F(San_Steps, CountBeyondTheAdaptersEndsTheBuild) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  agent.m_pData->m_AdapterCount++;
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  agent.m_pData->m_AdapterCount--;
  EXPECT_EQ(log.level(ERROR), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 2u);
}

TEST_F(San_Steps, AdapterThatIsNoFCAdapterEndsTheBuild) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  agent.m_pData->m_Adapters.push_back(new Odd_Adapter);
  agent.m_pData->m_AdapterCount++;
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level(ERROR), TVX_ERR);
}

/// A port of no kind that the builders know.
class Odd_Port : public Port {
 public:
  explicit Odd_Port(Adapter* adapter) : Port(adapter) {}
  PortAttributes* getAttributes() override { return nullptr; }
  PortStatistics* refreshStatistics() override { return nullptr; }
  Adapter* getAdapter() override { return m_pAdapter; }
  void rescanTargets(Adapter*) override {}
  std::vector<Target*>& getTargets() override { return m_Targets; }
  Target* getTarget(int) override { return nullptr; }
  std::size_t getNumberOfTargets() override { return 0; }
};

TEST_F(San_Steps, PortThatIsNoFCPortEndsTheBuild) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  Adapter* const adapter = agent.m_pData->m_Adapters[0];
  adapter->m_Ports.push_back(new Odd_Port(adapter));
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level(ERROR), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_StorageVolume_map.size(), 2u);
}

TEST_F(San_Steps, UnitsNeedAComputerSystem) {
  ProviderAgent& agent = buildUnits(R"({"count": 2})");
  agent.m_CIM_ComputerSystem_map.clear();
  EXPECT_EQ(rebuildSAN(agent), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level(ERROR), TVX_ERR);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 0u);
}

// --- Refused inserts -----------------------------------------------------------------------------

TEST_F(San_Steps, RefusedEndpointsEndTheBuildWithTheirTexts) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  log.clear();
  EXPECT_EQ(again(agent, 0, {buildTargetEndpoint}), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_SCSIProtocolEndpoint_map"), TVX_CRIT);
  EXPECT_EQ(again(agent, 0, {hostTargetEndpoint}), MAP_BUILD_FAILED);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_LocalHostedAccessPoint_map"), TVX_CRIT);
  EXPECT_EQ(agent.m_TVXHBA_SCSIProtocolEndpoint_map.size(), 1u);
}

TEST_F(San_Steps, RefusedDevicesEndTheBuildWithTheirTexts) {
  ProviderAgent& agent = buildUnits(UNIT_OF_EACH_CLASS);
  const struct {
    Instance_Map_Base& devices;
    Instance_Map_Base& systemDevices;
    std::vector<std::string> texts;
  } rows[] = {
      {agent.m_TVXHBA_StorageVolume_map,
       agent.m_TVXHBA_StorageVolumeSystemDevice_map,
       {"m_TVXHBA_StorageVolume_map", "m_TVXHBA_StorageVolumeSystemDevice_map",
        "m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map"}},
      {agent.m_TVXHBA_TapeDrive_map,
       agent.m_TVXHBA_TapeDriveSystemDevice_map,
       {"m_TVXHBA_TapeDrive_map", "m_TVXHBA_TapeDriveSystemDevice_map",
        "m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map"}},
      {agent.m_TVXHBA_StorageExtent_map,
       agent.m_TVXHBA_StorageExtentSystemDevice_map,
       {"m_TVXHBA_StorageExtent_map", "m_TVXHBA_StorageExtentSystemDevice_map",
        "m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map"}},
      {agent.m_TVXHBA_SCSIArbitraryLogicalUnit_map,
       agent.m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map,
       {"m_TVXHBA_SCSIArbitraryLogicalUnit_map",
        "m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map",
        "m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map"}},
      {agent.m_TVXHBA_LogicalDisk_map,
       agent.m_TVXHBA_LogicalDiskSystemDevice_map,
       {"m_TVXHBA_LogicalDisk_map", "m_TVXHBA_LogicalDiskSystemDevice_map",
        "m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map"}},
  };
  for (std::size_t i = 0; i < std::size(rows); i++) {
    const auto& row = rows[i];
    log.clear();
    // With the maps before it emptied, the refusal comes from the next one.
    for (std::size_t emptied = 0; emptied < 3; emptied++) {
      if (emptied >= 1) row.devices.clear();
      if (emptied >= 2) row.systemDevices.clear();
      EXPECT_EQ(again(agent, i, {buildDevice}), MAP_BUILD_FAILED);
      const std::string failure = "Insert Failed : " + row.texts[emptied];
      EXPECT_EQ(log.level(failure), TVX_CRIT) << failure;
      EXPECT_EQ(log.count(failure), 1u) << failure;
    }
  }
}

// --- Remote ports --------------------------------------------------------------------------------

constexpr const char* ENTRY = "10000254560C3001|500C0FF12A001001";

TEST_F(San_Steps, RemotePortLeadsToTheChipOfItsPort) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  ASSERT_EQ(agent.m_TVXHBA_Chip_map.size(), 1u);
  TVXHBA_Chip* chip = agent.m_TVXHBA_Chip_map[0];
  log.clear();
  const Port_Target found = findPortTarget(agent, ENTRY);
  EXPECT_EQ(found.port, SAN_PORT);
  EXPECT_EQ(found.target, SAN_TARGET);
  EXPECT_EQ(found.chip, chip);
  const std::vector<std::string> lines = {
      std::string("Set content: ") + ENTRY, "Found the FCPort Instance: 10000254560C3001",
      "SerialNumber + Sub-AdapterID: " + text(chip->Tag), "Chip Tag: " + text(chip->Tag)};
  EXPECT_EQ(log.only(lines), lines);
  for (const std::string& line : lines) EXPECT_EQ(log.level(line), TVX_DBG) << line;
}

TEST_F(San_Steps, RemotePortsLeadToTheChipsOfTheirOwnPorts) {
  ProviderAgent& agent = build(R"({"cards": [
    {"serial_number": "A", "ports": [{"wwpn": "1000000000000001"}]},
    {"serial_number": "B", "ports": [{"wwpn": "1000000000000002"}]}]})");
  ASSERT_EQ(agent.m_TVXHBA_Chip_map.size(), 2u);
  const struct {
    const char* port;
    std::size_t chip;
    std::vector<std::string> lines;  // the walk over the chips ends with the one that is found
  } rows[] = {{"1000000000000001", 0, {"Chip Tag: A"}},
              {"1000000000000002", 1, {"Chip Tag: A", "Chip Tag: B"}}};
  for (const auto& row : rows) {
    log.clear();
    EXPECT_EQ(findPortTarget(agent, row.port + std::string("|5000000000000001")).chip,
              agent.m_TVXHBA_Chip_map[row.chip]);
    EXPECT_EQ(log.only({"Found the FCPort Instance: 1000000000000001",
                        "Found the FCPort Instance: 1000000000000002"}),
              std::vector{std::string("Found the FCPort Instance: ") + row.port});
    EXPECT_EQ(log.only({"Chip Tag: A", "Chip Tag: B"}), row.lines);
  }
}

TEST_F(San_Steps, RemotePortOfNoPortTakesTheLastOne) {
  ProviderAgent& agent = build(TWO_CARDS);
  ASSERT_GE(agent.m_TVXHBA_Chip_map.size(), 2u);
  log.clear();
  EXPECT_EQ(findPortTarget(agent, "1111111111111111|500C0FF12A001001").chip,
            agent.m_TVXHBA_Chip_map[agent.m_TVXHBA_Chip_map.size() - 1]);
  EXPECT_EQ(log.count("Set content: 1111111111111111|500C0FF12A001001"), 1u);
  EXPECT_EQ(log.count("Found the FCPort Instance: 10000254560A7E21"), 0u)
      << "it was not looked for";
  agent.m_TVXHBA_FCPort_map.clear();
  EXPECT_EQ(findPortTarget(agent, ENTRY).chip, nullptr);
}

TEST_F(San_Steps, RemotePortMayHaveNoChip) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  agent.m_TVXHBA_Chip_map[0]->Tag.set("another");
  EXPECT_EQ(findPortTarget(agent, ENTRY).chip, nullptr);
  agent.m_TVXHBA_FCPort_map[0]->IdentifyingDescriptions.set({String("OS Device Name")});
  EXPECT_EQ(findPortTarget(agent, ENTRY).chip, nullptr);
  agent.m_TVXHBA_Chip_map[0]->Tag.set("");
  EXPECT_EQ(findPortTarget(agent, ENTRY).chip, nullptr) << "a port that names no chip has none";
}

TEST_F(San_Steps, LastPortOfAChipDecidesWhatTheChipTells) {
  const auto chipBehind = [this](const char* first, const char* second) {
    ProviderAgent& agent = buildHost(
        R"({"cards": [{"serial_number": "A", "ports": [
          {"wwpn": "1000000000000001", "oas_supported": )" +
        std::string(first) +
        R"(, "targets": [{"wwpn": "5000000000000001", "luns": {"count": 1}}]},
          {"wwpn": "1000000000000002", "oas_supported": )" +
        second + R"(, "targets": [{"wwpn": "5000000000000001", "luns": {"count": 1}}]}]}]})");
    EXPECT_EQ(agent.m_TVXHBA_Chip_map.size(), 1u);
    return agent.m_TVXHBA_Chip_map[0]->OASCapability.value;
  };
  EXPECT_EQ(chipBehind("false", "true"), 1);
  EXPECT_EQ(chipBehind("true", "false"), 0);
}

TEST_F(San_Steps, RemotePortsAreVisitedOnceAndForgotten) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  San_Build san{agent};
  san.portTargets = {ENTRY};
  log.clear();
  EXPECT_EQ(visitPortTargets(san), 0);
  EXPECT_TRUE(san.portTargets.empty());
  EXPECT_EQ(log.count("No entries in the set"), 0u);
  EXPECT_EQ(visitPortTargets(san), 0);
  EXPECT_EQ(log.count(std::string("Set content: ") + ENTRY), 1u);
  EXPECT_EQ(log.level("No entries in the set"), TVX_WARN);
}

TEST_F(San_Steps, EntryWithoutATargetIsTakenAsItIs) {
  ProviderAgent& agent = buildUnits(R"({"count": 1})");
  const Port_Target found = findPortTarget(agent, "1000");
  EXPECT_EQ(found.port, "1000");
  EXPECT_EQ(found.target, "");
}

}  // namespace
}  // namespace cimrt::test
