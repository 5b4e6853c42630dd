// Optimized access storage: units found by the scan, made, deleted and switched off.
#include "../agent/Agent_Fixture.h"
#include "../agent/Instance_Checks.h"
#include "../agent/Lock_Witness.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Map_Insert.h"
#include "agent/ProductSteps.h"
#include "common/TVX_Memory.h"
#include "services/TVXHBA_DriverParams_Provider.h"
#include "services/TVXHBA_FCHBADriverParamService_Provider.h"
#include "services/TVX_OAS.h"
#include "tvxsim/tvxsim.h"

namespace cimrt::test {
namespace {

constexpr const char* PORT = "10000000000000A1";
constexpr const char* TARGET = "50060E801049CF51";
constexpr const char* OTHER_TARGET = "50060E801049CF52";

std::string hostWith(const std::string& members) {
  return R"({"cards": [{"serial_number": "SN1", "ports": [{"wwpn": "10000000000000A1",
      "driver_params": [{"name": "depth", "current": 1}], "targets": [
        {"wwpn": "50060E801049CF51", "luns": {"count": 2}}])" +
         (members.empty() ? "" : ", " + members) + "}]}]}";
}

constexpr const char* MARKED = R"("oas": [
    {"target": "50060E801049CF51", "lun": 0, "option": "config", "state": 1},
    {"target": "50060E801049CF51", "lun": 200, "option": "config", "state": 200},
    {"target": "50060E801049CF51", "lun": 3, "option": "driver", "state": 0}])";

std::string unitID(const char* option, int lun, const char* target = TARGET,
                   const char* port = PORT) {
  return std::string("TVX:OAS:") + option + ":" + port + ":" + target + ":" + std::to_string(lun);
}

void* noMemory(std::size_t) {
  return nullptr;
}

std::vector<std::size_t> sizes;
void* notedMemory(std::size_t size) {
  sizes.push_back(size);
  return std::calloc(1, size);
}

class Optimized_Access : public Agent_Test {
 protected:
  ProviderAgent& build(const std::string& members = {}) {
    agent = &builtAgent(hostWith(members));
    return *agent;
  }
  TVXHBA_DriverParams* unit(const std::string& id) {
    return entryOf(agent->m_TVXHBA_DriverParams_map, &TVXHBA_DriverParams::InstanceID, id);
  }
  std::int64_t capability() { return numberOf(agent->m_TVXHBA_Chip_map[0]->OASCapability); }
  std::int32_t create(const std::string& id) {
    const Ref<TVXHBA_DriverParams> instance(TVXHBA_DriverParams::create());
    instance->InstanceID.set(id.c_str());
    return TVXHBA_DriverParams_Provider().create_instance(instance.get());
  }
  std::int32_t remove(const std::string& id) {
    const Ref<TVXHBA_DriverParams> instance(TVXHBA_DriverParams::create(false));
    instance->InstanceID.set(id.c_str());
    return TVXHBA_DriverParams_Provider().delete_instance(instance.get());
  }
  /// Units that the library lists behind the target.
  std::vector<int> listed(std::uint32_t option, const char* target = TARGET) {
    TVX_Block block;
    if (TVX_MethodWrapper::GetOASLunList(PORT, PORT, target, option, &block) != 0) return {-1};
    const auto* list = reinterpret_cast<const RM_OASLunList*>(block.get());
    const RM_OASLunEntry* entries = list->entry;
    std::vector<int> luns;
    for (std::uint32_t i = 0; i < list->count; i++) luns.push_back(entries[i].lun);
    return luns;
  }
  std::uint32_t disableAll(const char* port = PORT, const char* target = TARGET,
                           const TVXHBA_FCHBADriverParamService* service = nullptr) {
    Property<String> initiator{String(), 1};
    Property<String> remote{String(), 1};
    if (port) initiator.set(port);
    if (target) remote.set(target);
    if (!service) service = agent->m_TVXHBA_FCHBADriverParamService_map[0];
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(TVXHBA_FCHBADriverParamService_Provider().DisableAllOASLuns(service, initiator,
                                                                          remote, result),
              0);
    EXPECT_FALSE(result.is_null());
    return result.value;
  }
  ProviderAgent* agent = nullptr;
};

// --- Names

TEST(Oas_Names, FieldsSitAtTheirPlaces) {
  const Oas_Fields fields = cutOasInstanceID("TVX:OAS:Driver:10000000000000A1:50060E801049CF51:17");
  EXPECT_EQ(fields.option, "Driver");
  EXPECT_EQ(fields.initiator, "10000000000000A1");
  EXPECT_EQ(fields.target, "50060E801049CF51");
  EXPECT_EQ(fields.lun, "17");
  EXPECT_TRUE(fields.complete);
}

TEST(Oas_Names, EveryShorterNameIsIncomplete) {
  const std::string whole = "TVX:OAS:Config:10000000000000A1:50060E801049CF51:1";
  EXPECT_TRUE(cutOasInstanceID(whole).complete);
  for (std::size_t size = 0; size < whole.size(); size++)
    EXPECT_FALSE(cutOasInstanceID(whole.substr(0, size)).complete) << size;
}

TEST(Oas_Names, MalformedNamesAreIncomplete) {
  for (const char* id : {"TVX:OAS-Driver:10000000000000A1:50060E801049CF51:1",
                         "TVX:OAS:Driver-10000000000000A1:50060E801049CF51:1",
                         "TVX:OAS:Driver:10000000000000A1-50060E801049CF51:1",
                         "TVX:OAS:Driver:10000000000000A1:50060E801049CF51-1",
                         "TVX:OAS:Driver:10000000000000A1:50060E801049CF51:1x",
                         "TVX:OAS:Driver:10000000000000A1:50060E801049CF51:-1",
                         "TVX:OAS:Driver:10000000000000A1:50060E801049CF51: 1",
                         "TVX:OAS:Driver:10000000000000A1:50060E801049CF51:1234567890123456789"})
    EXPECT_FALSE(cutOasInstanceID(id).complete) << id;
}

// --- Scan

TEST_F(Optimized_Access, ScanMakesAnInstanceOfEveryListedUnit) {
  build(MARKED);
  const struct {
    std::string id;
    int state;
    int option;
  } rows[] = {
      {unitID("Config", 0), 1, 1}, {unitID("Config", 200), 200, 1}, {unitID("Driver", 3), 0, 0}};
  ASSERT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 4u);
  for (const auto& row : rows) {
    const TVXHBA_DriverParams* entry = unit(row.id);
    ASSERT_TRUE(entry) << row.id;
    EXPECT_EQ(textOf(entry->paramname), "OAS");
    EXPECT_EQ(textOf(entry->ElementName), "TVX:OAS");
    EXPECT_EQ(textOf(entry->ConfigurationName), "Optimized Access Storage");
    EXPECT_EQ(numberOf(entry->current), row.state);
    EXPECT_EQ(numberOf(entry->Option), row.option);
    EXPECT_TRUE(entry->__name_space == "root/torvex");
    EXPECT_EQ(log.level("OAS Buffer InstanceId: " + row.id), TVX_DBG);
    bool tied = false;
    auto& ties = agent->m_TVXHBA_DriverServiceElementSettingData_map;
    for (std::size_t i = 0; i < ties.size(); i++)
      tied = tied || tiesClones(ties[i], agent->m_TVXHBA_FCHBADriverParamService_map[0], entry);
    EXPECT_TRUE(tied) << row.id;
  }
  EXPECT_EQ(capability(), 1);
  EXPECT_EQ(log.count("Created FC OAS Driver Params"), 3u);
  EXPECT_EQ(log.level("Created FC OAS Driver Params"), TVX_DBG);
  EXPECT_EQ(log.count("TVXUCNA_DriverElementSettingData::create() SUCCESFUL"), 3u);
  EXPECT_EQ(log.level("TVXUCNA_DriverElementSettingData::create() SUCCESFUL"), TVX_DBG);
  for (const char* text : {"FCP Lun: 200", "OAS Lun: 200", "OAS State: 200"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Optimized_Access, ConfigurationIsReadBeforeTheDriverOncePerRemotePort) {
  build(MARKED);
  const std::vector<std::string> steps = {"Set content: 10000000000000A1|50060E801049CF51",
                                          "Found the FCPort Instance: 10000000000000A1",
                                          "SerialNumber + Sub-AdapterID: SN1",
                                          "Chip Tag: SN1",
                                          "OAS Buffer InstanceId: " + unitID("Config", 0),
                                          "OAS Buffer InstanceId: " + unitID("Config", 200),
                                          "OAS Buffer InstanceId: " + unitID("Driver", 3)};
  EXPECT_EQ(log.only(steps), steps);
  EXPECT_EQ(log.count("Exit GetOASLunList"), 2u);
  EXPECT_EQ(log.level("Exit GetOASLunList"), TVX_DBG);
}

TEST_F(Optimized_Access, HostWithoutMarkedUnitsSupportsThemAllTheSame) {
  build();
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 1u);
  EXPECT_EQ(capability(), 1);
}

TEST_F(Optimized_Access, UnsupportedHardwareIsToldByTheChip) {
  build(R"("oas_supported": false)");
  EXPECT_EQ(capability(), 0);
  EXPECT_EQ(log.count("GetOASLunList failed. Unsupported Hardware"), 2u);
  EXPECT_EQ(log.level("GetOASLunList failed. Unsupported Hardware"), TVX_WARN);
  EXPECT_EQ(log.level("RM_GetOASLunList error."), TVX_ERR);
}

TEST_F(Optimized_Access, StatusOfUnsupportedHardwareIsToldByTheChipToo) {
  useScenario(hostWith(MARKED));
  addFault(R"({"call": "LRM_GetOASLunList", "status": 251})");
  ProviderAgent& ready = startAgent();
  refresh(ready);
  agent = &ready;
  EXPECT_EQ(log.count("GetOASLunList failed. Unsupported Hardware"), 2u);
  EXPECT_EQ(capability(), 0);
}

TEST_F(Optimized_Access, LastAnswerDecidesWhatTheChipTells) {
  useScenario(hostWith(MARKED));
  addFault(R"({"call": "LRM_GetOASLunList", "status": 251, "nth": 1})");
  ProviderAgent& ready = startAgent();
  refresh(ready);
  agent = &ready;
  EXPECT_EQ(log.count("GetOASLunList failed. Unsupported Hardware"), 1u);
  EXPECT_EQ(capability(), 1);
  EXPECT_TRUE(unit(unitID("Driver", 3)));
  EXPECT_FALSE(unit(unitID("Config", 0)));
}

TEST_F(Optimized_Access, OtherFailuresSayNothingOfTheHardware) {
  useScenario(hostWith(MARKED));
  addFault(R"({"call": "LRM_GetOASLunList", "status": 148})");
  ProviderAgent& ready = startAgent();
  refresh(ready);
  agent = &ready;
  EXPECT_EQ(capability(), 1);
  EXPECT_EQ(log.count("GetOASLunList failed."), 2u);
  EXPECT_EQ(log.level("GetOASLunList failed."), TVX_WARN);
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 1u);
}

TEST_F(Optimized_Access, ChipThatIsNotThereIsNotNeededForTheList) {
  build(MARKED);
  agent->m_TVXHBA_DriverParams_map.clear();
  agent->m_TVXHBA_Chip_map[0]->OASCapability.set(0);
  readOptimizedAccess(*agent, PORT, TARGET, nullptr);
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 3u);
  EXPECT_EQ(capability(), 0);
}

TEST_F(Optimized_Access, UnitThatTheMapRefusesEndsItsList) {
  build(MARKED);
  log.clear();
  TVX_Block block;
  ASSERT_EQ(TVX_MethodWrapper::GetOASLunList(PORT, PORT, TARGET, 1, &block), 0);
  EXPECT_EQ(createOasUnits(*agent, PORT, TARGET, Oas_Option::CONFIGURATION,
                           *reinterpret_cast<const RM_OASLunList*>(block.get())),
            32769);
  EXPECT_EQ(log.count("Insert Failed : m_TVXHBA_DriverParams_map"), 1u);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverParams_map"), TVX_CRIT);
}

TEST_F(Optimized_Access, TieThatIsThereAlreadyIsRefusedAndTheUnitsStay) {
  build(MARKED);
  agent->m_TVXHBA_DriverParams_map.clear();
  log.clear();
  readOptimizedAccess(*agent, PORT, TARGET, nullptr);
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 3u);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map"), TVX_CRIT);
}

TEST_F(Optimized_Access, WithoutTheServiceUnitsStandAlone) {
  build(MARKED);
  agent->clearAdapterMaps();
  readOptimizedAccess(*agent, PORT, TARGET, nullptr);
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 3u);
  EXPECT_EQ(agent->m_TVXHBA_DriverServiceElementSettingData_map.size(), 0u);
}

// --- Library

TEST_F(Optimized_Access, ListIsReadAgainWithTheRoomThatItNeeds) {
  build(MARKED);
  tvxsim_forget_calls();
  EXPECT_EQ(listed(1), (std::vector<int>{0, 200}));
  EXPECT_EQ(tvxsim_calls("LRM_GetOASLunList", PORT), 2u);
  EXPECT_EQ(listed(0), std::vector<int>{3});
  EXPECT_EQ(tvxsim_calls("LRM_GetOASLunList", PORT), 3u);
  addFault(R"({"call": "LRM_GetOASLunList", "status": 191, "returned_size": 2, "nth": 1})");
  EXPECT_EQ(listed(1), (std::vector<int>{0, 200}));
}

TEST_F(Optimized_Access, ListHasRoomForOneUnitAndThenForAll) {
  build(MARKED);
  sizes.clear();
  tvxSetAllocator(notedMemory);
  EXPECT_EQ(listed(1), (std::vector<int>{0, 200}));
  addFault(R"({"call": "LRM_GetOASLunList", "status": 191, "returned_size": 200, "nth": 1})");
  listed(0);
  EXPECT_EQ(sizes, (std::vector<std::size_t>{40, 36 + 40, 40, 199 * 36 + 40}));
}

TEST_F(Optimized_Access, EveryUnitOfAListIsTold) {
  build(MARKED);
  log.clear();
  EXPECT_EQ(listed(1), (std::vector<int>{0, 200}));
  const std::vector<std::string> lines = {"FCP Lun: 0",        "OAS Lun: 0",   "OAS State: 1",
                                          "FCP Lun: 200",      "OAS Lun: 200", "OAS State: 200",
                                          "Exit GetOASLunList"};
  EXPECT_EQ(log.only(lines), lines);
  for (const std::string& line : lines) EXPECT_EQ(log.level(line), TVX_DBG) << line;
}

TEST_F(Optimized_Access, ListThatStaysTooSmallIsAFailure) {
  build(MARKED);
  log.clear();
  addFault(R"({"call": "LRM_GetOASLunList", "status": 7, "returned_size": 2})");
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(PORT, PORT, TARGET, 1, &block), 7);
  EXPECT_FALSE(block);
  EXPECT_EQ(log.level("RM_GetOASLunList error."), TVX_ERR);
  const std::vector<Logged> lines = log.all();
  ASSERT_GE(lines.size(), 2u);
  EXPECT_EQ(lines[lines.size() - 2].text.substr(0, 12), "Status: <7>:");
  EXPECT_EQ(lines[lines.size() - 2].level, TVX_DBG);
  EXPECT_EQ(lines.back().text, "Exit GetOASLunList");
}

TEST_F(Optimized_Access, CountBeyondTheRoomIsCutToTheRoom) {
  build(R"("oas": [{"target": "50060E801049CF51", "lun": 9, "option": "driver"}])");
  addFault(R"({"call": "LRM_GetOASLunList", "returned_size": 4000000000})");
  EXPECT_EQ(listed(0), std::vector<int>{9});
}

TEST_F(Optimized_Access, CountThatNoTargetHasIsRefusedLikeMissingMemory) {
  build();
  addFault(R"({"call": "LRM_GetOASLunList", "status": 7, "returned_size": 4294967295})");
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(PORT, PORT, TARGET, 1, &block), 8);
  EXPECT_FALSE(block);
  EXPECT_EQ(log.level("Memory allocation failed."), TVX_DBG);
  tvxSetAllocator(noMemory);
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(PORT, PORT, TARGET, 1, &block), 8);
  EXPECT_EQ(log.count("Memory allocation failed."), 2u);
}

TEST_F(Optimized_Access, ListNeedsNamesAndAPlaceToGo) {
  build();
  TVX_Block block;
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(PORT, PORT, TARGET, 1, nullptr), 4);
  EXPECT_EQ(log.level("Invalid input pointer"), TVX_DBG);
  for (const auto& [initiator, port, target] :
       {std::tuple{"short", PORT, TARGET}, {PORT, "short", TARGET}, {PORT, PORT, "short"}})
    EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(initiator, port, target, 1, &block), 1);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(TVX_MethodWrapper::GetOASLunList(nullptr, PORT, TARGET, 1, &block), 1);
  EXPECT_EQ(log.level("Id2HBAName failed"), TVX_ERR);
}

TEST_F(Optimized_Access, StateOfAUnitIsSetByItsDecimalNumber) {
  build();
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState(PORT, PORT, TARGET, "010", 1, 0), 0);
  EXPECT_EQ(listed(0), std::vector<int>{10});
  EXPECT_EQ(log.level("Enter TVX_MethodWrapper:SetOASLunState Input OASState: 1, Lun no: 10, "
                      "option: 0"),
            TVX_DBG);
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState(PORT, PORT, TARGET, nullptr, 1, 0), 1);
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState("short", PORT, TARGET, "1", 1, 0), 1);
  EXPECT_EQ(log.level("str2HBAName failed"), TVX_ERR);
  log.clear();
  for (const auto& [initiator, port, target] :
       {std::tuple{PORT, "short", TARGET}, {PORT, PORT, "short"}}) {
    EXPECT_EQ(TVX_MethodWrapper::SetOASLunState(initiator, port, target, "1", 1, 0), 1);
  }
  EXPECT_EQ(log.count("str2HBAName failed"), 2u);
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState(nullptr, PORT, TARGET, "1", 1, 0), 1);
  EXPECT_EQ(log.level("Id2HBAName failed"), TVX_ERR);
  EXPECT_EQ(listed(0), std::vector<int>{10});
  EXPECT_EQ(TVX_MethodWrapper::SetOASLunState(PORT, PORT, TARGET, "1", 1, 5), 1);
  EXPECT_EQ(log.level(" Operation failure. OAS State has not been set"), TVX_ERR);
  EXPECT_EQ(log.all().back().text.substr(0, 12), "Status: <1>:");
  EXPECT_EQ(log.all().back().level, TVX_DBG);
}

// --- Creation

TEST_F(Optimized_Access, CreatedUnitIsMarkedInTheHardwareAndInTheMaps) {
  build();
  const std::string id = unitID("Config", 1);
  EXPECT_EQ(create(id), 0);
  EXPECT_EQ(listed(1), std::vector<int>{1});
  EXPECT_EQ(listed(0), std::vector<int>{});
  const TVXHBA_DriverParams* entry = unit(id);
  ASSERT_TRUE(entry);
  EXPECT_EQ(textOf(entry->paramname), "OAS");
  EXPECT_EQ(textOf(entry->ElementName), "TVX:OAS");
  EXPECT_EQ(textOf(entry->ConfigurationName), "Optimized Access Storage");
  EXPECT_EQ(numberOf(entry->current), 1);
  EXPECT_EQ(numberOf(entry->Option), 1);
  EXPECT_TRUE(entry->__name_space == "root/torvex");
  auto& service = agent->m_TVXHBA_DriverServiceElementSettingData_map;
  auto& port = agent->m_TVXHBA_DriverParameterAffectsFCPort_map;
  ASSERT_EQ(service.size(), 2u);
  ASSERT_EQ(port.size(), 1u);
  EXPECT_TRUE(tiesClones(service[1], agent->m_TVXHBA_FCHBADriverParamService_map[0], entry));
  EXPECT_TRUE(tiesClones(port[0], agent->m_TVXHBA_FCPort_map[0], entry));
  for (const auto* role :
       {&service[1]->IsDefault, &service[1]->IsCurrent, &service[1]->IsMinimum,
        &service[1]->IsMaximum, &service[1]->IsPending, &port[0]->IsDefault, &port[0]->IsCurrent,
        &port[0]->IsMinimum, &port[0]->IsMaximum, &port[0]->IsPending})
    EXPECT_EQ(numberOf(*role), 2);
  EXPECT_TRUE(service[1]->IsNext.is_null());
  const std::vector<std::string> steps = {
      "Input InstanceID: " + id,
      "OptionStr: Config",
      "Option: 1",
      "Enter TVX_MethodWrapper:SetOASLunState Input OASState: 1, Lun no: 1, option: 1",
      "TVXHBA_DriverServiceElementSettingData::create() SUCCESFUL",
      "TVXHBA_DriverParams_Provider::create_instance() Succesful"};
  EXPECT_EQ(log.only(steps), steps);
  for (const std::string& step : steps) EXPECT_EQ(log.level(step), TVX_DBG) << step;
}

TEST_F(Optimized_Access, OptionWordMayBeInAnyCase) {
  build();
  EXPECT_EQ(create(unitID("DRIVER", 4)), 0);
  EXPECT_EQ(create(unitID("config", 5)), 0);
  EXPECT_EQ(listed(0), std::vector<int>{4});
  EXPECT_EQ(listed(1), std::vector<int>{5});
  EXPECT_EQ(numberOf(unit(unitID("DRIVER", 4))->Option), 0);
}

TEST_F(Optimized_Access, CreationRefusesWhatNamesNoUnit) {
  build(MARKED);
  tvxsim_forget_calls();
  EXPECT_EQ(TVXHBA_DriverParams_Provider().create_instance(nullptr), 84);
  EXPECT_EQ(log.level("Invalid(NULL) TVXHBA_DriverParams_Provider instance passed"), TVX_ERR);
  EXPECT_EQ(create(unitID("Config", 0)), 80);
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::Duplicate instance found."), TVX_ERR);
  EXPECT_EQ(create(""), 82);
  EXPECT_EQ(log.level("InstanceID size = 0, OAS parameter not found in InstanceID: "), TVX_ERR);
  const Ref<TVXHBA_DriverParams> nameless(TVXHBA_DriverParams::create(false));
  EXPECT_EQ(TVXHBA_DriverParams_Provider().create_instance(nameless.get()), 82);
  log.clear();
  EXPECT_EQ(create("10000000000000A1:depth"), 80) << "what is there already is told first";
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::Duplicate instance found."), TVX_ERR);
  EXPECT_EQ(create("TVX:SAO:Driver"), 82);
  EXPECT_EQ(log.level("InstanceID size = 0, OAS parameter not found in InstanceID: TVX:SAO:Driver"),
            TVX_ERR);
  EXPECT_EQ(create(unitID("Neithe", 1)), 84);
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider:: Invalid option"), TVX_ERR);
  for (const char* id : {"OAS", "TVX:OAS:", "TVX:OAS:Drive"}) EXPECT_EQ(create(id), 84) << id;
  EXPECT_EQ(log.count("TVXHBA_DriverParams_Provider::SetOASLunState failed"), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_SetOASLunState", nullptr), 0u);
}

TEST_F(Optimized_Access, CreatedUnitIsFoundAgainByTheScanOfTheNextRefresh) {
  build();
  ASSERT_EQ(create(unitID("Driver", 1)), 0);
  turnClock(5'000'000);
  refresh(*agent);
  const TVXHBA_DriverParams* entry = unit(unitID("Driver", 1));
  ASSERT_TRUE(entry);
  EXPECT_EQ(numberOf(entry->current), 1);
  EXPECT_TRUE(unit("10000000000000A1:depth"));
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_DriverServiceElementSettingData_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_DriverParameterAffectsFCPort_map.size(), 0u);
}

#ifndef NDEBUG  // locks are only booked in debug builds
TEST_F(Optimized_Access, UnitsAreChangedUnderTheDataLock) {
  build();
  const auto stateText = [](int state) {
    return "Enter TVX_MethodWrapper:SetOASLunState Input OASState: " + std::to_string(state) +
           ", Lun no: 1, option: 0";
  };
  Lock_Witness creation(stateText(1));
  ASSERT_EQ(create(unitID("Driver", 1)), 0);
  EXPECT_TRUE(creation.wasHeld);
  {
    Lock_Witness deletion(stateText(0));
    ASSERT_EQ(remove(unitID("Driver", 1)), 0);
    EXPECT_TRUE(deletion.wasHeld);
  }
  ASSERT_EQ(create(unitID("Driver", 1)), 0);
  Lock_Witness method(stateText(0));
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_TRUE(method.wasHeld);
}
#endif

TEST_F(Optimized_Access, CreationRefusesShortAndMalformedNames) {
  build();
  const std::string whole = unitID("Driver", 7);
  for (std::size_t size = 14; size < whole.size(); size++) {
    log.clear();
    EXPECT_EQ(create(whole.substr(0, size)), 84) << size;
    EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::SetOASLunState failed"), TVX_ERR) << size;
  }
  EXPECT_EQ(create(whole + "x"), 84);
  EXPECT_EQ(create("TVX:OAS:Driver:10000000000000G1:50060E801049CF51:1"), 84);
  EXPECT_EQ(tvxsim_calls("LRM_SetOASLunState", nullptr), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 1u);
}

TEST_F(Optimized_Access, EveryChangeLooksFirstWhetherARefreshIsDue) {
  build();
  constexpr const char* FIRST_LINE = " Entering BuildCimrtInfo()";
  log.clear();
  ASSERT_EQ(create(unitID("Driver", 1)), 0);
  EXPECT_EQ(log.all().at(0).text, FIRST_LINE);
  log.clear();
  ASSERT_EQ(remove(unitID("Driver", 1)), 0);
  EXPECT_EQ(log.all().at(0).text, FIRST_LINE);
  log.clear();
  ASSERT_EQ(disableAll(), 0u);
  EXPECT_EQ(log.all().at(0).text, FIRST_LINE);
}

TEST_F(Optimized_Access, CreationFailsWithTheHardware) {
  build(R"("oas_supported": false)");
  EXPECT_EQ(create(unitID("Driver", 1)), 84);
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::SetOASLunState failed"), TVX_ERR);
  EXPECT_EQ(log.level(" Operation failure. OAS State has not been set"), TVX_ERR);
  EXPECT_FALSE(unit(unitID("Driver", 1)));
}

TEST_F(Optimized_Access, UnitWithoutAnInstanceOfItsPortIsCreatedAllTheSame) {
  build();
  agent->m_TVXHBA_FCPort_map.clear();
  EXPECT_EQ(create(unitID("Driver", 1)), 0);
  EXPECT_EQ(log.level("Could not find the corresponding FC Port instance."), TVX_WARN);
  EXPECT_TRUE(unit(unitID("Driver", 1)));
  EXPECT_EQ(agent->m_TVXHBA_DriverParameterAffectsFCPort_map.size(), 0u);
}

TEST_F(Optimized_Access, TiesThatAreThereAlreadyFailTheCreation) {
  build();
  const std::string id = unitID("Driver", 1);
  EXPECT_EQ(create(id), 0);
  const Ref<TVXHBA_DriverParams> model(TVXHBA_DriverParams::create(false));
  model->InstanceID.set(id.c_str());
  agent->m_TVXHBA_DriverParams_map.delete_instance(model.get());
  EXPECT_EQ(create(id), 84);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverServiceElementSettingData_map"), TVX_CRIT);
  agent->m_TVXHBA_DriverParams_map.delete_instance(model.get());
  agent->m_TVXHBA_DriverServiceElementSettingData_map.clear();
  EXPECT_EQ(create(id), 84);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DriverParameterAffectsFCPort_map"), TVX_CRIT);
}

// --- Deletion

TEST_F(Optimized_Access, DeletedUnitIsGoneFromHardwareAndMaps) {
  build(MARKED);
  const std::string id = unitID("Driver", 1);
  ASSERT_EQ(create(id), 0);
  EXPECT_EQ(remove(id), 0);
  EXPECT_FALSE(unit(id));
  EXPECT_EQ(listed(0), std::vector<int>{3});
  EXPECT_EQ(agent->m_TVXHBA_DriverParameterAffectsFCPort_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DriverServiceElementSettingData_map.size(), 4u);
  EXPECT_EQ(log.level("Got the related Driver Element Setting Data"), TVX_DBG);
  EXPECT_EQ(log.level("Got the related LocalPort Element SettingData"), TVX_DBG);
  EXPECT_EQ(remove(unitID("Config", 200)), 0);
  EXPECT_EQ(listed(1), std::vector<int>{0});
}

TEST_F(Optimized_Access, AbsentUnitIsNotFound) {
  build();
  EXPECT_EQ(remove(unitID("Driver", 1)), 90);
  EXPECT_EQ(log.level("Instance Not found"), TVX_ERR);
  EXPECT_EQ(TVXHBA_DriverParams_Provider().delete_instance(nullptr), 90);
  EXPECT_EQ(log.level("Invalid TVXHBA_DriverParams_Provider instance passed"), TVX_ERR);
}

TEST_F(Optimized_Access, UnitThatTheHardwareKeepsStays) {
  build(MARKED);
  addFault(R"({"call": "LRM_SetOASLunState", "status": 148})");
  EXPECT_EQ(remove(unitID("Driver", 3)), 93);
  EXPECT_EQ(log.level("TVXHBA_DriverParams_Provider::SetOASLunState failed"), TVX_ERR);
  EXPECT_TRUE(unit(unitID("Driver", 3)));
  EXPECT_EQ(agent->m_TVXHBA_DriverServiceElementSettingData_map.size(), 4u);
}

TEST_F(Optimized_Access, ParameterThatIsNoUnitCannotBeDeleted) {
  build();
  EXPECT_EQ(remove("10000000000000A1:depth"), 93);
  EXPECT_TRUE(unit("10000000000000A1:depth"));
  EXPECT_EQ(tvxsim_calls("LRM_SetOASLunState", nullptr), 0u);
}

TEST_F(Optimized_Access, OfTiesSideBySideTheSecondStays) {
  build();
  ASSERT_EQ(create(unitID("Driver", 1)), 0);
  const TVXHBA_DriverParams* entry = unit(unitID("Driver", 1));
  auto& ties = agent->m_TVXHBA_DriverServiceElementSettingData_map;
  ties.insert(
      makeAssociation<TVXHBA_DriverServiceElementSettingData>(agent->m_TVXHBA_FCPort_map[0], entry)
          .release());
  ASSERT_EQ(ties.size(), 3u);
  EXPECT_TRUE(dropOasAssociations(*agent, *entry));
  EXPECT_EQ(ties.size(), 2u);
  EXPECT_TRUE(dropOasAssociations(*agent, *entry));
  EXPECT_EQ(ties.size(), 1u);
  EXPECT_EQ(log.count("Got the related Driver Element Setting Data"), 2u);
  auto& ports = agent->m_TVXHBA_DriverParameterAffectsFCPort_map;
  for (const Instance* other : {static_cast<const Instance*>(agent->m_TVXHBA_FCPort_map[0]),
                                static_cast<const Instance*>(agent->m_TVXHBA_Chip_map[0])})
    ports.insert(makeAssociation<TVXHBA_DriverParameterAffectsFCPort>(other, entry).release());
  ASSERT_EQ(ports.size(), 2u);
  EXPECT_TRUE(dropOasAssociations(*agent, *entry));
  EXPECT_EQ(ports.size(), 1u);
}

// --- All of a target

TEST_F(Optimized_Access, DisablingAllTakesEverySecondUnitOfTheTarget) {
  build();
  for (const int lun : {1, 2, 3, 4, 5}) ASSERT_EQ(create(unitID("Driver", lun)), 0);
  ASSERT_EQ(create(unitID("Driver", 6, OTHER_TARGET)), 0);
  log.clear();
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(listed(0), (std::vector<int>{2, 4}));
  EXPECT_EQ(listed(0, OTHER_TARGET), std::vector<int>{6});
  EXPECT_FALSE(unit(unitID("Driver", 1)));
  EXPECT_TRUE(unit(unitID("Driver", 2)));
  EXPECT_EQ(agent->m_TVXHBA_DriverParameterAffectsFCPort_map.size(), 3u);
  const std::vector<std::string> ends = {
      "TVXHBA_FCHBADriverParamService_Provider::DisableAllOASLuns()",
      "DisableAllOASLuns Succeeded"};
  EXPECT_EQ(log.only(ends), ends);
  for (const std::string& text : ends) EXPECT_EQ(log.level(text), TVX_DBG);
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(listed(0), std::vector<int>{4});
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(listed(0), std::vector<int>{});
  EXPECT_EQ(agent->m_TVXHBA_DriverParams_map.size(), 2u);
}

TEST_F(Optimized_Access, DisablingAllSwitchesEachUnitWhereItIsMarked) {
  build(R"("oas": [{"target": "50060E801049CF51", "lun": 1, "option": "config"}])");
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(listed(1), std::vector<int>{});
  EXPECT_EQ(
      log.count("Enter TVX_MethodWrapper:SetOASLunState Input OASState: 0, Lun no: 1, option: 1"),
      1u);
}

TEST_F(Optimized_Access, UnitsThatStayDoNotStopTheWalkNorTheSuccess) {
  build(MARKED);
  addFault(R"({"call": "LRM_SetOASLunState", "lun": 0, "status": 148})");
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(log.level("Disable OASLunState failed"), TVX_ERR);
  EXPECT_TRUE(unit(unitID("Config", 0)));
  EXPECT_FALSE(unit(unitID("Config", 200)));
  EXPECT_EQ(log.count("DisableAllOASLuns Succeeded"), 1u);
}

TEST_F(Optimized_Access, EntryOfAMalformedNameIsPassedOver) {
  build();
  auto odd = makeInstance<TVXHBA_DriverParams>();
  odd->InstanceID.set("10000000000000A1:50060E801049CF51");
  odd->paramname.set("OAS");
  ASSERT_NE(agent->m_TVXHBA_DriverParams_map.insert(odd.release()), Instance_Map_Base::npos);
  EXPECT_EQ(disableAll(), 0u);
  EXPECT_EQ(log.count("Disable OASLunState failed"), 1u);
  EXPECT_EQ(tvxsim_calls("LRM_SetOASLunState", nullptr), 0u);
}

TEST_F(Optimized_Access, DisablingAllNeedsAKnownServiceAndPort) {
  build(MARKED);
  const Ref<TVXHBA_FCHBADriverParamService> other(TVXHBA_FCHBADriverParamService::create());
  other->Name.set("another");
  EXPECT_EQ(disableAll(PORT, TARGET, other.get()), 33068u);
  EXPECT_EQ(log.level("Invalid instance of HBA Driver Parameter Service"), TVX_ERR);
  EXPECT_EQ(disableAll(nullptr, TARGET), 32968u);
  EXPECT_EQ(disableAll(PORT, nullptr), 32968u);
  EXPECT_EQ(disableAll("", TARGET), 32968u);
  EXPECT_EQ(disableAll(PORT, ""), 32968u);
  EXPECT_EQ(log.count("Invalid Initiator fc port or Target device"), 4u);
  EXPECT_EQ(log.level("Invalid Initiator fc port or Target device"), TVX_ERR);
  EXPECT_EQ(disableAll("10000000000000FF"), 32968u);
  EXPECT_EQ(log.level("Invald fc port."), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetOASLunState", nullptr), 0u);
}

}  // namespace
}  // namespace cimrt::test
