// Methods of the services for boot code and dumps, and the instances of the dump classes.
#include <algorithm>

#include "../logs/Failing_New.h"
#include "Service_Test.h"
#include "agent/ProductSteps.h"
#include "services/TVXHBA_BootBIOSService_Provider.h"
#include "services/TVXHBA_DumpData_Provider.h"
#include "services/TVXHBA_DumpService_Provider.h"
#include "services/TVX_Dump.h"

namespace cimrt::test {
namespace {

// --- Boot code -----------------------------------------------------------------------------------

class Boot_Service : public Service_Test {
 protected:
  const TVXHBA_BootBIOSService* service() { return agent->m_TVXHBA_BootBIOSService_map[0]; }
  std::uint32_t enable(const TVXHBA_FCPort* target) {
    EXPECT_EQ(provider.EnableBootBIOS(service(), target, result), 0);
    return result.value;
  }
  std::uint32_t disable(const TVXHBA_FCPort* target) {
    EXPECT_EQ(provider.DisableBootBIOS(service(), target, result), 0);
    return result.value;
  }
  std::int64_t status(const TVXHBA_FCPort* target) {
    Property<std::uint32_t> state{};
    state.null = 1;
    EXPECT_EQ(provider.GetBootBIOSStatus(service(), target, state, result), 0);
    return numberOf(state);
  }
  TVXHBA_BootBIOSService_Provider provider;
};

TEST_F(Boot_Service, SwitchesTheBootCodeAndTellsItsState) {
  build(R"("boot_code_enabled": false)");
  EXPECT_EQ(status(port()), 0);
  EXPECT_EQ(enable(port()), 0u);
  EXPECT_EQ(status(port()), 1);
  EXPECT_EQ(disable(port()), 0u);
  EXPECT_EQ(status(port()), 0);
  for (const char* text :
       {"TVXHBA_BootBIOSService_Provider::EnableBootBIOS()",
        "TVXHBA_BootBIOSService_Provider::DisableBootBIOS()",
        "TVXHBA_BootBIOSService_Provider::GetBootBIOSStatus",
        "Entering TVXHBA_BootBIOSService_Provider::EnableBootBIOS(): tvxcimSetBootBiosState",
        "TVXHBA_BootBIOSService_Provider::GetBootBIOSStatus O.K."})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
  EXPECT_EQ(log.level("TVXHBA_BootBIOSService_Provider::tvxcimSetBootBiosState o.k."), TVX_INFO);
  EXPECT_EQ(log.count(" updateAdapterMaps: Entry"), 0u);
}

TEST_F(Boot_Service, TellsFailuresOfTheLibrary) {
  build();
  addFault(R"({"call": "LRM_SetBootBiosState", "status": 64})");
  addFault(R"({"call": "LRM_GetHBAAttributes", "status": 64})");
  EXPECT_EQ(enable(port()), 40064u);
  EXPECT_EQ(log.level("TVXHBA_BootBIOSService_Provider::tvxcimSetBootBiosState failed"), TVX_ERR);
  EXPECT_EQ(status(port()), -1);
  EXPECT_EQ(result.value, 40001u);
  EXPECT_EQ(log.level("TVXHBA_BootBIOSService_Provider::tvxcimGetBootBiosState failed"), TVX_ERR);
}

TEST_F(Boot_Service, RefusesStrangers) {
  build();
  const auto unknown = stranger<TVXHBA_BootBIOSService>();
  provider.EnableBootBIOS(unknown.get(), port(), result);
  EXPECT_EQ(result.value, 33068u);
  EXPECT_EQ(log.level("Invalid instance of Boot BIOS Service"), TVX_ERR);
  EXPECT_EQ(enable(nullptr), 32968u);
  EXPECT_EQ(disable(nullptr), 32968u);
  EXPECT_EQ(status(nullptr), -1);
  EXPECT_EQ(result.value, 32968u);
  for (const char* text :
       {"TVXHBA_BootBIOSService_Provider EnableBootBIOS invald fc port ...return",
        "TVXHBA_BootBIOSService_Provider DisableBootBIOS invald fc port ...return",
        "TVXHBA_BootBIOSService_Provider GetBootBIOS invald fc port ...return"})
    EXPECT_EQ(log.level(text), TVX_ERR) << text;
  EXPECT_EQ(enable(pathTo("10000000000000FF").get()), 32968u);
  EXPECT_EQ(log.level("TVXHBA_BootBIOSService_Provider invald fc port ...return"), TVX_ERR);
  port()->DeviceID.set("123");
  EXPECT_EQ(enable(port()), 32968u);
  EXPECT_EQ(log.level("TVXHBA_BootBIOSService_Provider::str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("LRM_SetBootBiosState", nullptr), 0u);
}

TEST_F(Boot_Service, TakesATargetOfAnyClassByItsDeviceId) {
  build(R"("boot_code_enabled": false)");
  const Instance* controller = agent->m_TVXHBA_PortController_map[0];
  EXPECT_EQ(enable(reinterpret_cast<const TVXHBA_FCPort*>(controller)), 0u);
  EXPECT_EQ(status(port()), 1);
  const Instance* card = agent->m_TVXHBA_Card_map[0];  // has no such property
  EXPECT_EQ(enable(reinterpret_cast<const TVXHBA_FCPort*>(card)), 32968u);
}

// --- Instances of the dump classes ---------------------------------------------------------------

class Dump_Classes : public Service_Test {
 protected:
  TVXHBA_DumpData* data(std::size_t i = 0) { return agent->m_TVXHBA_DumpData_map[i]; }
};

TEST_F(Dump_Classes, AreBuiltForEveryPortController) {
  build(R"("dumps": {"directory": "/var/dumps", "retention": 7})");
  const CIM_ComputerSystem* system = agent->m_CIM_ComputerSystem_map[0];
  ASSERT_EQ(agent->m_TVXHBA_DumpService_map.size(), 1u);
  const TVXHBA_DumpService* service = agent->m_TVXHBA_DumpService_map[0];
  EXPECT_EQ(textOf(service->SystemCreationClassName), textOf(system->CreationClassName));
  EXPECT_EQ(textOf(service->SystemName), textOf(system->Name));
  EXPECT_EQ(textOf(service->Name), "TVXHBA_DumpService");
  EXPECT_EQ(textOf(service->CreationClassName), "TVXHBA_DumpService");
  ASSERT_EQ(agent->m_TVXHBA_HostedDumpService_map.size(), 1u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_HostedDumpService_map[0], system, service));
  ASSERT_EQ(agent->m_TVXHBA_DumpServiceAffectsElement_map.size(), 2u);
  const TVXHBA_PortController* controller = agent->m_TVXHBA_PortController_map[1];
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_DumpServiceAffectsElement_map[1], controller, service));
  ASSERT_EQ(agent->m_TVXHBA_DumpData_map.size(), 2u);
  EXPECT_EQ(textOf(data()->InstanceID), "TVXHBA_DumpData::10000000000000A1");
  EXPECT_EQ(textOf(data()->ElementName), PORT);
  EXPECT_EQ(textOf(data()->DumpDirectory), "/var/dumps");
  EXPECT_EQ(numberOf(data()->RetentionCount), 7);
  ASSERT_EQ(agent->m_TVXHBA_ElementDumpData_map.size(), 2u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_ElementDumpData_map[1], controller, data(1)));
  EXPECT_EQ(numberOf(agent->m_TVXHBA_ElementDumpData_map[1]->IsCurrent), 1);
}

TEST_F(Dump_Classes, StepsAreLogged) {
  build();
  refresh(*agent);
  const std::vector<std::string> texts = {"Calling FC_CreateDumpClasses",
                                          "Entered FC_CreateDumpClasses",
                                          "TVX_Dump::tvxcimGetDumpDirectory Succesful",
                                          "Calling TVX_Dump::tvxcimGetRetentionCount",
                                          "returned tvxcimGetRetentionCount call from wrapper",
                                          "FC_CreateDumpClasses succesful"};
  std::vector<std::string> wanted = texts;
  wanted.insert(wanted.begin() + 5, texts.begin() + 2, texts.begin() + 5);
  EXPECT_EQ(log.only(texts), wanted);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Dump_Classes, WhatCannotBeReadIsEmptyOrZero) {
  build();
  addFault(R"({"call": "LRM_GetDumpDirectoryA", "status": 3})");
  addFault(R"({"call": "LRM_GetDumpRetentionCount", "status": 3})");
  refresh(*agent);
  EXPECT_EQ(textOf(data()->DumpDirectory), "");
  EXPECT_EQ(numberOf(data()->RetentionCount), 0);
  EXPECT_EQ(log.level("TVX_Dump::tvxcimGetDumpDirectory failed"), TVX_INFO);
  EXPECT_EQ(log.level("TVX_Dump::tvxcimGetRetentionCount failed"), TVX_ERR);
}

TEST_F(Dump_Classes, ADirectoryWithoutEndIsBounded) {
  build(R"("dumps": {"directory": "/var/dumps"})");
  addFault(R"({"call": "LRM_GetDumpDirectoryA", "unterminated_texts": true})");
  refresh(*agent);
  EXPECT_EQ(textOf(data()->DumpDirectory), "/var/dumps" + std::string(246, 'x'));
}

TEST_F(Dump_Classes, ADirectoryLongerThanTheFieldIsNotRead) {
  build(R"("dumps": {"directory": "/)" + std::string(300, 'd') + "\"}");
  refresh(*agent);
  EXPECT_EQ(textOf(data()->DumpDirectory), "");
  EXPECT_EQ(log.level("TVX_Dump::tvxcimGetDumpDirectory failed"), TVX_INFO);
}

TEST_F(Dump_Classes, AFailedBuildIsToldAndTheRefreshGoesOn) {
  build();
  Host_Build host{*agent};
  log.clear();
  EXPECT_EQ(buildDumpClasses(host), 0);
  EXPECT_EQ(log.level("FC_CreateDumpClasses failed with status 32769"), TVX_ERR);
  EXPECT_EQ(log.level("FC_CreateDumpClasses succesful"), TVX_DBG);
}

TEST_F(Dump_Classes, ALackOfMemoryEndsTheBuild) {
  build();
  const auto expectFailure = [this](std::size_t size, int spare, const char* text) {
    FC_ClearDumpClasses(*agent);
    log.clear();
    {
      const Failing_New failing(size, spare);
      EXPECT_EQ(FC_CreateDumpClasses(*agent), 40008) << text;
    }
    EXPECT_EQ(log.level(text), TVX_CRIT) << text;
  };
  // Earlier instances of the same size are spared.
  const auto sizeOf = [](const Meta_Class& meta) { return static_cast<std::size_t>(meta.size); };
  const std::size_t sizes[] = {sizeOf(TVXHBA_DumpService::static_meta_class),
                               sizeOf(TVXHBA_HostedDumpService::static_meta_class),
                               sizeOf(TVXHBA_DumpServiceAffectsElement::static_meta_class),
                               sizeOf(TVXHBA_DumpData::static_meta_class),
                               sizeOf(TVXHBA_ElementDumpData::static_meta_class)};
  const char* const texts[] = {"Failed to create TVXHBA_DumpService",
                               "Failed to create TVXHBA_HostedDumpService",
                               "Failed to create TVXHBA_DumpServiceAffectsElement",
                               "Failed to create TVXHBA_DumpData for fc port",
                               "Failed to create TVXHBA_ElementDumpData for fc port"};
  for (std::size_t i = 0; i < std::size(sizes); i++) {
    const auto spare = std::count(sizes, sizes + i, sizes[i]);
    expectFailure(sizes[i], static_cast<int>(spare), texts[i]);
  }
}

TEST_F(Dump_Classes, WithoutPortControllersTheServiceStandsAlone) {
  build();
  agent->m_TVXHBA_PortController_map.clear();
  EXPECT_EQ(FC_ClearDumpClasses(*agent), 0);
  EXPECT_EQ(log.level("Entered FC_ClearDumpClasses"), TVX_DBG);
  EXPECT_EQ(agent->m_TVXHBA_DumpService_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_HostedDumpService_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_ElementDumpData_map.size(), 0u);
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 0);
  EXPECT_EQ(agent->m_TVXHBA_DumpService_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_HostedDumpService_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DumpServiceAffectsElement_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DumpData_map.size(), 0u);
}

TEST_F(Dump_Classes, AnInstanceThatIsThereAlreadyEndsTheBuild) {
  build();
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DumpService_map"), TVX_CRIT);
  agent->m_TVXHBA_DumpService_map.clear();
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_HostedDumpService_map"), TVX_CRIT);
  agent->m_TVXHBA_DumpService_map.clear();
  agent->m_TVXHBA_HostedDumpService_map.clear();
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DumpServiceAffectsElement_map"), TVX_CRIT);
  agent->m_TVXHBA_DumpService_map.clear();
  agent->m_TVXHBA_HostedDumpService_map.clear();
  agent->m_TVXHBA_DumpServiceAffectsElement_map.clear();
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_DumpData_map"), TVX_CRIT);
  agent->m_TVXHBA_DumpService_map.clear();
  agent->m_TVXHBA_HostedDumpService_map.clear();
  agent->m_TVXHBA_DumpServiceAffectsElement_map.clear();
  agent->m_TVXHBA_DumpData_map.clear();
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("Insert Failed : m_TVXHBA_ElementDumpData_map"), TVX_CRIT);
}

TEST_F(Dump_Classes, AControllerWithoutANameEndsTheBuild) {
  build();
  FC_ClearDumpClasses(*agent);
  agent->m_TVXHBA_PortController_map[0]->DeviceID.set("12");
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("TVX_Dump::str2HBAName failed"), TVX_ERR);
  EXPECT_EQ(agent->m_TVXHBA_DumpServiceAffectsElement_map.size(), 1u);
  EXPECT_EQ(agent->m_TVXHBA_DumpData_map.size(), 0u);
  FC_ClearDumpClasses(*agent);
  agent->m_TVXHBA_PortController_map[0]->DeviceID.null = 1;
  EXPECT_EQ(FC_CreateDumpClasses(*agent), 32769);
  EXPECT_EQ(log.level("TVX_Dump::Id2HBAName failed"), TVX_ERR);
}

// --- Methods of the dump service -----------------------------------------------------------------

class Dump_Service : public Service_Test {
 protected:
  const TVXHBA_DumpService* service() { return agent->m_TVXHBA_DumpService_map[0]; }
  std::uint32_t generate() {
    EXPECT_EQ(provider.GenerateDump(service(), port(), result), 0);
    return result.value;
  }
  std::uint32_t remove() {
    EXPECT_EQ(provider.DeleteDump(service(), port(), result), 0);
    return result.value;
  }
  std::vector<std::string> list() {
    Property<Array<String>> files{};
    files.null = 1;
    EXPECT_EQ(provider.GetDumpFileNames(service(), port(), files, result), 0);
    wasNull = files.is_null();
    return textsOf(files);
  }
  TVXHBA_DumpService_Provider provider;
  bool wasNull = false;
};

TEST_F(Dump_Service, MakesListsAndRemovesDumps) {
  build();
  EXPECT_TRUE(list().empty());
  EXPECT_TRUE(wasNull);
  EXPECT_EQ(result.value, 0u);
  EXPECT_EQ(generate(), 0u);
  EXPECT_EQ(generate(), 0u);
  EXPECT_EQ(list(), (std::vector<std::string>{"10000000000000A1_000001.dmp",
                                              "10000000000000A1_000002.dmp"}));
  EXPECT_EQ(remove(), 0u);
  EXPECT_TRUE(list().empty());
  for (const char* text :
       {"Entering GenerateDump", "TVXHBA_DumpService::tvxcimDumpDiagnostic Succesful",
        "returning from TVXHBA_DumpService::GenerateDump", "Entering DeleteDump",
        "TVXHBA_DumpService::tvxcimDeleteDumpFiles Succesful",
        "returning from TVXHBA_DumpService::DeleteDump", "Entering GetDumpFileNames method",
        "Calling the Get Dump filenames method",
        "GetDumpFileNames Succesful, NumberOfFileEntries : 2",
        "Filenames = 10000000000000A1_000002.dmp", "Filename[1] = 10000000000000A1_000002.dmp"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Dump_Service, ListsNamesWithAUsualEndingOnly) {
  build(R"("dumps": {"files": ["a.fat", "core", "b.core", "c.efd", "d.txt", "e.dmp", "f.cee",
                               "g.bin", "h.DMP", "ore", "", "x", "dmp", "i.dmp.gz", "j.log"]})");
  EXPECT_EQ(list(), (std::vector<std::string>{"a.fat", "core", "b.core", "c.efd", "d.txt", "e.dmp",
                                              "f.cee", "g.bin"}));
  EXPECT_EQ(log.count("Filenames = j.log"), 1u);
  EXPECT_EQ(log.count("Filename[14] = j.log"), 0u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDumpFileNames", nullptr), 2u);
}

TEST_F(Dump_Service, FourNamesFitTheFirstRoom) {
  build(R"("dumps": {"files": ["1.dmp", "2.dmp", "3.dmp", "4.dmp"]})");
  EXPECT_EQ(list().size(), 4u);
  EXPECT_EQ(tvxsim_calls("LRM_GetDumpFileNames", nullptr), 1u);
}

TEST_F(Dump_Service, NamesWithoutEndAreBounded) {
  build(R"("dumps": {"files": [")" + std::string(300, 'n') + R"(", "b.dmp"]})");
  addFault(R"({"call": "LRM_GetDumpFileNames", "unterminated_texts": true})");
  list();
  EXPECT_EQ(result.value, 0u);
  EXPECT_EQ(log.count("Filenames = " + std::string(256, 'n')), 1u);
}

TEST_F(Dump_Service, ACountBeyondTheRoomIsNotReadBeyondIt) {
  build(R"("dumps": {"files": ["1.dmp"]})");
  addFault(R"({"call": "LRM_GetDumpFileNames", "returned_size": 4000000000})");
  EXPECT_EQ(list(), std::vector<std::string>{"1.dmp"});
  EXPECT_EQ(log.count("GetDumpFileNames Succesful, NumberOfFileEntries : 4"), 1u);
}

TEST_F(Dump_Service, ListsThatNoMemoryHoldsAreRefused) {
  build();
  addFault(R"({"call": "LRM_GetDumpFileNames", "status": 191, "returned_size": 4294967295})");
  EXPECT_TRUE(list().empty());
  EXPECT_EQ(result.value, 32968u);
  tvxSetAllocator([](std::size_t) -> void* { return nullptr; });
  EXPECT_TRUE(list().empty());
  EXPECT_EQ(result.value, 32968u);
}

TEST_F(Dump_Service, TellsFailuresOfTheLibrary) {
  build();
  addFault(R"({"call": ["LRM_GenerateDump", "LRM_DeleteDumpFiles", "LRM_GetDumpFileNames"],
               "status": 64})");
  EXPECT_EQ(generate(), 40064u);
  EXPECT_EQ(remove(), 40064u);
  EXPECT_TRUE(list().empty());
  EXPECT_EQ(result.value, 40064u);
  for (const char* text : {"TVXHBA_DumpService::tvxcimDumpDiagnostic failed",
                           "TVXHBA_DumpService::tvxcimDeleteDumpFiles failed",
                           "TVXHBA_DumpService::tvxcimGetDumpFileNames failed"})
    EXPECT_EQ(log.level(text), TVX_ERR) << text;
}

TEST_F(Dump_Service, RefusesStrangers) {
  build();
  Property<Array<String>> files{};
  const auto unknown = stranger<TVXHBA_DumpService>();
  provider.GenerateDump(unknown.get(), port(), result);
  EXPECT_EQ(result.value, 33068u);
  EXPECT_EQ(log.level("Invalid instance of TVXHBA_DumpService"), TVX_ERR);
  provider.DeleteDump(service(), nullptr, result);
  EXPECT_EQ(result.value, 32968u);
  provider.GetDumpFileNames(service(), pathTo("10000000000000FF").get(), files, result);
  EXPECT_EQ(result.value, 32968u);
  EXPECT_EQ(log.count("TVXHBA_DumpService invald port ...return"), 2u);
  EXPECT_EQ(log.level("TVXHBA_DumpService invald port ...return"), TVX_ERR);
  port()->DeviceID.set("ZZZZZZZZZZZZZZZZ");
  EXPECT_EQ(generate(), 32968u);
  EXPECT_EQ(log.level("TVXHBA_DumpService::str2HBAName failed"), TVX_ERR);
}

// --- Changing the settings -----------------------------------------------------------------------

class Dump_Data : public Service_Test {
 protected:
  void start() {
    build(R"("dumps": {"directory": "/var/dumps", "retention": 7})");
    wanted =
        Ref<TVXHBA_DumpData>(static_cast<TVXHBA_DumpData*>(clone(agent->m_TVXHBA_DumpData_map[0])));
  }
  std::int32_t modify() { return provider.modify_instance(wanted.get(), wanted.get()); }
  std::int64_t retention() { return numberOf(agent->m_TVXHBA_DumpData_map[0]->RetentionCount); }
  TVXHBA_DumpData_Provider provider;
  Ref<TVXHBA_DumpData> wanted;
};

TEST_F(Dump_Data, RetentionCountIsChangedAndTheClassesAreBuiltAnew) {
  start();
  wanted->RetentionCount.set(std::uint32_t{20});
  EXPECT_EQ(modify(), 0);
  EXPECT_EQ(retention(), 20);
  const std::vector<std::string> texts = {"TVXHBA_DumpData_Provider::modify_instance()",
                                          "found the key match for instance.",
                                          " For Non VMWARE",
                                          "TVX_MethodWrapper::tvxcimSetRetentionCount succeded",
                                          "Entered FC_ClearDumpClasses",
                                          "Entered FC_CreateDumpClasses"};
  EXPECT_EQ(log.only(texts), texts);
  for (const std::string& text : texts) EXPECT_EQ(log.level(text), TVX_DBG) << text;
}

TEST_F(Dump_Data, UnchangedValuesBuildTheClassesAnewToo) {
  start();
  EXPECT_EQ(modify(), 0);
  EXPECT_EQ(tvxsim_calls("LRM_SetDumpRetentionCount", nullptr), 0u);
  EXPECT_EQ(log.count("Entered FC_CreateDumpClasses"), 1u);
}

TEST_F(Dump_Data, CountsOutsideTheBoundsAreRefusedAndNothingIsBuilt) {
  start();
  for (const std::uint32_t count : {0u, 21u}) {
    wanted->RetentionCount.set(count);
    EXPECT_EQ(modify(), 104);
  }
  EXPECT_EQ(retention(), 7);
  EXPECT_EQ(log.count("TVX_MethodWrapper::tvxcimSetRetentionCount failed"), 2u);
  EXPECT_EQ(log.level("TVX_MethodWrapper::tvxcimSetRetentionCount failed"), TVX_ERR);
  EXPECT_EQ(log.count("Entered FC_CreateDumpClasses"), 0u);
}

TEST_F(Dump_Data, TheDirectoryCannotBeChanged) {
  start();
  wanted->DumpDirectory.set("/elsewhere");
  wanted->RetentionCount.set(std::uint32_t{3});
  EXPECT_EQ(modify(), 101);
  EXPECT_EQ(log.level("tvxcimSetDumpDirectory is not supported"), TVX_DBG);
  EXPECT_EQ(retention(), 7);
  wanted->DumpDirectory.set("");
  EXPECT_EQ(modify(), 0);
  EXPECT_EQ(retention(), 3);
}

TEST_F(Dump_Data, WhatTheModelDoesNotNameStays) {
  start();
  const Ref<TVXHBA_DumpData> model(static_cast<TVXHBA_DumpData*>(clone(wanted.get())));
  model->RetentionCount.null = 1;
  model->DumpDirectory.null = 1;
  wanted->RetentionCount.set(std::uint32_t{3});
  EXPECT_EQ(provider.modify_instance(model.get(), wanted.get()), 0);
  EXPECT_EQ(retention(), 7);
  EXPECT_EQ(log.count(" For Non VMWARE"), 0u);
}

TEST_F(Dump_Data, WrongInstancesAreRefused) {
  start();
  EXPECT_EQ(provider.modify_instance(nullptr, wanted.get()), 102);
  EXPECT_EQ(provider.modify_instance(wanted.get(), nullptr), 102);
  EXPECT_EQ(log.count("TVXHBA_DumpData_Provider::modify_instance invalid parameter"), 2u);
  EXPECT_EQ(log.level("TVXHBA_DumpData_Provider::modify_instance invalid parameter"), TVX_ERR);
  wanted->ElementName.set("10");
  EXPECT_EQ(modify(), 104);
  EXPECT_EQ(log.level("TVXHBA_DumpData_Provider::modify_instance::str2HBAName failed"), TVX_ERR);
  wanted->ElementName.null = 1;
  EXPECT_EQ(modify(), 104);
  EXPECT_EQ(log.level("TVXHBA_DumpData_Provider::modify_instance::Id2HBAName failed"), TVX_ERR);
  wanted->InstanceID.set("TVXHBA_DumpData::nobody");
  EXPECT_EQ(modify(), 104);
  EXPECT_EQ(log.level("Invalid instance of TVXHBA_DumpData_Provider Data"), TVX_ERR);
}

TEST_F(Dump_Data, AFailedRebuildIsOnlyLogged) {
  start();
  agent->m_TVXHBA_PortController_map[0]->DeviceID.set("12");
  EXPECT_EQ(modify(), 0);
  EXPECT_EQ(log.level("FC_CreateDumpClasses failed"), TVX_ERR);
  EXPECT_EQ(log.level("tvxstatus = 32769"), TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test
