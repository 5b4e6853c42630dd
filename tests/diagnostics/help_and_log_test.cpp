// The two small methods: help on a test, and clearing its log.
#include "Diagnostics_Fixture.h"
#include "Refused_Calls.h"
#include "runtime/Typed_Instance.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;

// --- Help

struct Help {
  std::int64_t result;
  std::string text;
};

class Get_Help : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
    service = Ref<TVXHBA_HelpService>(
        clone(entryOf(agent->m_TVXHBA_HelpService_map, &TVXHBA_HelpService::Name, PING_TEST)));
    document.set(PING_TEST);
    format.set(1);
    delivery.set(1);
  }
  Help ask() {
    TVXHBA_HelpService_Provider provider;
    Property<String> text{String(), 1};
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(provider.GetHelp(service.get(), document, format, delivery, text, result),
              INVOKE_METHOD_OK);
    return {numberOf(result), textOf(text)};
  }

  Ref<TVXHBA_HelpService> service;
  Property<String> document{String(), 1};
  Property<std::uint16_t> format{0, 1};
  Property<std::uint16_t> delivery{0, 1};
};

TEST_F(Get_Help, GivesTheDescriptionOfATest) {
  const Help help = ask();
  EXPECT_EQ(help.result, 0);
  EXPECT_EQ(help.text, "Test verifies the existence and accessibility of devices on the SAN");
}

TEST_F(Get_Help, ReadsNamesWithoutRegardToCase) {
  document.set("tvx:fchba PING test");
  EXPECT_EQ(ask().result, 0);
}

TEST_F(Get_Help, OfTheFirstServiceWithThatNameInAnyCase) {
  service->Name.set("TVX:FCHBA ping test");
  service->DocumentsAvailable.set({"another"});
  agent->m_TVXHBA_HelpService_map.insert(clone(service.get()));
  const Help help = ask();
  EXPECT_EQ(help.result, 0);
  EXPECT_EQ(help.text, "Test verifies the existence and accessibility of devices on the SAN");
}

TEST_F(Get_Help, WithoutADescriptionIsEmpty) {
  entryOf(agent->m_TVXHBA_HelpService_map, &TVXHBA_HelpService::Name, PING_TEST)
      ->DocumentDescriptions.set(std::initializer_list<String>{});
  const Help help = ask();
  EXPECT_EQ(help.result, 0);
  EXPECT_EQ(help.text, "");
}

TEST_F(Get_Help, DocumentsOfOtherServicesAreNotItsOwn) {
  document.set(ECHO_TEST);
  EXPECT_EQ(ask().result, 4);
  document.set("no such document");
  EXPECT_EQ(ask().result, 4);
  EXPECT_EQ(ask().text, "(null)");
  delivery.set(2);
  EXPECT_EQ(ask().result, 4) << "the document is looked for first";
}

TEST_F(Get_Help, OnlyTextIsDelivered) {
  const char* text = "Unsupported Delivery options, Use '1' for proper support";
  delivery.set(2);
  EXPECT_EQ(ask().result, 5);
  EXPECT_EQ(log.level(text), TVX_DBG);
  delivery.set(1);
  format.set(2);
  EXPECT_EQ(ask().result, 5);
  EXPECT_EQ(log.count(text), 2u);
}

TEST_F(Get_Help, EveryArgumentMustBeThere) {
  const char* text = "Invalid Requested Document";
  for (std::uint8_t* null : {&document.null, &format.null, &delivery.null}) {
    *null = 1;
    EXPECT_EQ(ask().result, 5);
    *null = 0;
  }
  EXPECT_EQ(log.count(text), 3u);
  EXPECT_EQ(log.level(text), TVX_DBG);
}

TEST_F(Get_Help, ServiceMustBeKnown) {
  service->Name.set("another");
  EXPECT_EQ(ask().result, 5);
  agent->m_TVXHBA_HelpService_map.clear();
  EXPECT_EQ(ask().result, 5);
  EXPECT_EQ(log.count("Invalid instance of Help Service"), 2u);
  EXPECT_EQ(log.level("Invalid instance of Help Service"), TVX_DBG);
}

// --- Logs

class Clear_Log : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
  }
  std::int64_t clear(const char* name) {
    Ref<TVXHBA_DiagnosticsLog> model(TVXHBA_DiagnosticsLog::create());
    model->InstanceID.set(name);
    TVXHBA_DiagnosticsLog_Provider provider;
    Property<std::uint32_t> result{0, 1};
    EXPECT_EQ(provider.ClearLog(model.get(), result), INVOKE_METHOD_OK);
    return numberOf(result);
  }
  template <class Map>
  Texts services(const Map& map) {
    Texts names;
    for (std::size_t i = 0; i < map.size(); i++) names.push_back(textOf(map[i]->ServiceName));
    return names;
  }
  template <class Record>
  Texts ids(const Instance_Map<Record>& map) {
    Texts names;
    for (std::size_t i = 0; i < map.size(); i++) names.push_back(textOf(map[i]->InstanceID));
    return names;
  }
};

TEST_F(Clear_Log, TakesTheResultsOfItsTestAndLeavesTheOthersInOrder) {
  const Ref<TVXHBA_FCHBADiagnosticSettingData> given = givenFor(PING_TEST);
  given->TargetDevice.set(TARGET);
  run(STATUS_TEST);
  run(PING_TEST, given.get());
  run(HOST_LOOPBACK_TEST);
  run(PING_TEST);
  run(STATUS_TEST);
  auto& services_ = agent->m_TVXHBA_DiagnosticServiceRecord_map;
  auto& completions = agent->m_TVXHBA_DiagnosticCompletionRecord_map;
  ASSERT_EQ(services_.size(), 5u);
  const std::size_t settingRecords = agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size();
  const std::size_t corresponding = agent->m_TVXHBA_CorrespondingSettingDataRecord_map.size();
  const auto withoutPing = [](Texts all) {
    all.erase(all.begin() + 3);
    all.erase(all.begin() + 1);
    return all;
  };
  const Texts kept = withoutPing(ids(completions));
  const Texts keptServices = withoutPing(ids(services_));
  EXPECT_EQ(clear(PING_TEST), 0);
  const Texts left = {STATUS_TEST, HOST_LOOPBACK_TEST, STATUS_TEST};
  EXPECT_EQ(services(services_), left);
  EXPECT_EQ(services(completions), left);
  EXPECT_EQ(ids(completions), kept) << "the very same, in their order";
  EXPECT_EQ(ids(services_), keptServices);
  EXPECT_EQ(agent->m_TVXHBA_LogManagesRecord_map.size(), 6u);
  EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 6u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), settingRecords);
  EXPECT_EQ(agent->m_TVXHBA_CorrespondingSettingDataRecord_map.size(), corresponding);
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 5u);
  EXPECT_EQ(log.only({"Exiting the TVXHBA CDM Clear log",
                      "Exiting TVXHBA_DiagnosticsLog_Provider::ClearLog"}),
            (Texts{"Exiting the TVXHBA CDM Clear log",
                   "Exiting TVXHBA_DiagnosticsLog_Provider::ClearLog"}));
  EXPECT_EQ(log.level("Exiting the TVXHBA CDM Clear log"), TVX_DBG);
}

TEST_F(Clear_Log, GoesThroughItsFourMapsTwiceBackwards) {
  run(STATUS_TEST);
  run(RESET_TEST);
  const std::string statusID =
      textOf(agent->m_TVXHBA_DiagnosticCompletionRecord_map[0]->InstanceID);
  run(STATUS_TEST);
  Texts inserted;
  const Refused_Calls watch({}, [&](const Instance& instance) {
    const auto* record = typed<TVXHBA_DiagnosticCompletionRecord>(&instance);
    const bool first = record && textOf(record->InstanceID) == statusID;
    inserted.push_back(instance.meta_class->name + std::string(first ? " 1" : ""));
    return false;
  });
  EXPECT_EQ(clear(RESET_TEST), 0);
  Texts expected(8, "TVXHBA_LogManagesRecord");
  expected.insert(expected.end(), 8, "TVXHBA_RecordAppliesToElement");
  const std::string record = "TVXHBA_DiagnosticCompletionRecord";
  expected.insert(expected.end(), {record, record + " 1", record + " 1", record});
  expected.insert(expected.end(), 4, "TVXHBA_DiagnosticServiceRecord");
  EXPECT_EQ(inserted, expected);
}

TEST_F(Clear_Log, LeavesTheTiesOfTheOthersInOrder) {
  run(STATUS_TEST);
  run(RESET_TEST);
  run(STATUS_TEST, nullptr, nullptr, PLUGGED_PORT);
  auto& applies = agent->m_TVXHBA_RecordAppliesToElement_map;
  auto& manages = agent->m_TVXHBA_LogManagesRecord_map;
  std::vector<Ref<Instance>> before;
  for (const std::size_t i : {0u, 1u, 4u, 5u}) {
    before.emplace_back(clone(static_cast<const Instance*>(applies[i])));
    before.emplace_back(clone(static_cast<const Instance*>(manages[i])));
  }
  EXPECT_EQ(clear(RESET_TEST), 0);
  ASSERT_EQ(applies.size(), 4u);
  ASSERT_EQ(manages.size(), 4u);
  for (std::size_t i = 0; i < 4; i++) {
    EXPECT_TRUE(identical(applies[i], before[2 * i].get()));
    EXPECT_TRUE(identical(manages[i], before[2 * i + 1].get()));
  }
}

TEST_F(Clear_Log, RecordsAddUpUntilTheirLogIsCleared) {
  TVXHBA_DiagnosticsLog& data =
      *entryOf(agent->m_TVXHBA_DiagnosticsLog_map, &TVXHBA_DiagnosticsLog::InstanceID, STATUS_TEST);
  TVX_Diagnostics diagnostics(*agent);
  constexpr std::size_t MORE_THAN_ITS_MAXIMUM = 201;
  for (std::size_t i = 0; i < MORE_THAN_ITS_MAXIMUM; i++)
    diagnostics.CreateDiagnosticServiceRecord(
        {STATUS_TEST, "done", std::to_string(i), nullptr, COMPLETION_OK, controller(), false});
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), MORE_THAN_ITS_MAXIMUM);
  EXPECT_EQ(numberOf(data.MaxNumberOfRecords), 200);
  EXPECT_EQ(numberOf(data.CurrentNumberOfRecords), 0);
  EXPECT_EQ(clear(STATUS_TEST), 0);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 0u);
  EXPECT_EQ(numberOf(data.CurrentNumberOfRecords), 0);
}

TEST_F(Clear_Log, UnknownLogIsRefused) {
  EXPECT_EQ(clear("no log"), 5);
  agent->m_TVXHBA_DiagnosticsLog_map.clear();
  EXPECT_EQ(clear(PING_TEST), 5);
  EXPECT_EQ(log.count("Invalid instance of Diagnostic Log"), 2u);
  EXPECT_EQ(log.level("Invalid instance of Diagnostic Log"), TVX_DBG);
}

TEST_F(Clear_Log, LogOfNoTestClearsNothing) {
  run(STATUS_TEST);
  Ref<TVXHBA_DiagnosticsLog> other(TVXHBA_DiagnosticsLog::create());
  other->__name_space = "root/torvex";
  other->InstanceID.set("another");
  agent->m_TVXHBA_DiagnosticsLog_map.insert(other.release());
  log.clear();
  EXPECT_EQ(clear("another"), 0);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 1u);
  EXPECT_EQ(log.count("Exiting the TVXHBA CDM Clear log"), 0u);
  EXPECT_EQ(log.level("Exiting TVXHBA_DiagnosticsLog_Provider::ClearLog"), TVX_DBG);
}

/// Gives the second entry the keys of the first, as only a change in place can.
template <class T>
void makeAlike(Instance_Map<T>& map) {
  copy_keys(map[1], map[0]);
  map.key_changed(1);
}

TEST_F(Clear_Log, EntriesThatCantBeKeptAreToldAndStay) {
  const struct {
    void (*spoil)(ProviderAgent& agent);
    const char* text;
  } rows[] = {
      {[](ProviderAgent& a) { makeAlike(a.m_TVXHBA_LogManagesRecord_map); },
       "Insert Failed : temp_TVXHBA_LogManagesRecord_map"},
      {[](ProviderAgent& a) { makeAlike(a.m_TVXHBA_RecordAppliesToElement_map); },
       "Insert Failed : TVXHBA_RecordAppliesToElement_map"},
      {[](ProviderAgent& a) { makeAlike(a.m_TVXHBA_DiagnosticCompletionRecord_map); },
       "Insert Failed : temp_TVXHBA_DiagnosticCompletionRecord_map"},
      {[](ProviderAgent& a) { makeAlike(a.m_TVXHBA_DiagnosticServiceRecord_map); },
       "Insert Failed : temp_TVXHBA_DiagnosticServiceRecord_map"},
  };
  TVX_Diagnostics diagnostics(*agent);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    run(STATUS_TEST);
    run(STATUS_TEST);
    row.spoil(*agent);
    EXPECT_EQ(clear(PING_TEST), 4) << row.text;
    EXPECT_EQ(log.level(row.text), TVX_CRIT) << row.text;
    EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 2u);
  }
}

}  // namespace
}  // namespace cimrt::test
