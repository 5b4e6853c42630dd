// What a run leaves behind: its job, its records, and what ties them to the rest.
#include <set>

#include "Diagnostics_Fixture.h"
#include "Refused_Calls.h"
#include "common/TVX_Clock.h"

namespace cimrt::test {
namespace {

using Texts = std::vector<std::string>;

constexpr const char* REPLACE_CARD =
    "Suggested Actions a) Try latest released software and firmware b) Try putting this card in a "
    "different host c) Replace Card";
constexpr const char* REPLACE_CABLES =
    "Suggested Actions a) Verify and replace cable(s) if faulty b) Verify and replace "
    "transceiver(s) if faulty c) Replace external PHY if card has an external PHY component d) "
    "Replace Card";
constexpr const char* VERIFY_SAN =
    "Suggested Actions a) Verify end devices b) Verify switch configuration c) Verify and replace "
    "cable(s) if faultyd) Verify and replace transceiver(s) if faulty e) Replace Card f) Replace "
    "Switch";

/// What both records of a test that counts cycles tell.
const std::set<std::string> RESULT_PROPERTIES = {
    "InstanceID",  "Description",   "ElementName",        "RecordType",        "ServiceName",
    "RecordData",  "RecordFormat",  "ManagedElementName", "CreationTimeStamp", "LoopsFailed",
    "LoopsPassed", "TimeToExecute", "CompletedCycles"};

const Meta_Class* unmakeable = nullptr;
Instance* makeAllButOne(const Meta_Class* metaClass) {
  return metaClass == unmakeable ? nullptr : create(metaClass, true);
}

class Records : public Diagnostics_Test {
 protected:
  void SetUp() override {
    Diagnostics_Test::SetUp();
    build();
    result.cyclesCompleted = 100;
    result.errorCount = 3;
    result.totalTime = 17;
  }
  Diagnostic_Outcome outcome(const char* name, bool failed = false, bool overridden = false) {
    return {
        name,         "the text", "the job", &result, failed ? COMPLETION_FAILED : COMPLETION_OK,
        controller(), overridden};
  }
  TVXHBA_DiagnosticsLog* logOf(const char* name) {
    return entryOf(agent->m_TVXHBA_DiagnosticsLog_map, &TVXHBA_DiagnosticsLog::InstanceID, name);
  }

  RM_DiagResult result{};
};

// --- Records

TEST_F(Records, ServiceRecordHoldsTheResult) {
  TVX_Diagnostics(*agent).CreateDiagnosticServiceRecord(outcome(PING_TEST, true));
  const TVXHBA_DiagnosticServiceRecord& record = lastServiceRecord();
  EXPECT_EQ(textOf(record.InstanceID), "the job:Service Record");
  EXPECT_EQ(textOf(record.Description), "This class holds the results(service) of the test");
  EXPECT_EQ(textOf(record.ElementName), std::string(PING_TEST) + " Service Record");
  EXPECT_EQ(numberOf(record.RecordType), 2);
  EXPECT_EQ(textOf(record.ServiceName), PING_TEST);
  EXPECT_EQ(textOf(record.ManagedElementName), textOf(controller()->ElementName));
  EXPECT_TRUE(record.CreationTimeStamp.value.equal(tvxNowDatetime()));
  EXPECT_EQ(textOf(record.RecordData), "the text") << "no suggested action here";
  EXPECT_EQ(textOf(record.RecordFormat), "");
  EXPECT_EQ(log.level("CreateDiagnosticServiceRecord"), TVX_DBG);
  EXPECT_EQ(log.level("PortController : 10000000000000A1"), TVX_DBG);
  EXPECT_TRUE(record.__name_space == "root/torvex");
  EXPECT_EQ(filledIn(&record), RESULT_PROPERTIES);
}

TEST_F(Records, CompletionRecordHoldsTheResultAndItsState) {
  TVX_Diagnostics(*agent).CreateDiagnosticCompletionRecord(outcome(PING_TEST));
  const TVXHBA_DiagnosticCompletionRecord& record = lastCompletionRecord();
  EXPECT_EQ(textOf(record.InstanceID), "the job");
  EXPECT_EQ(textOf(record.Description), "This class holds the result of the test");
  EXPECT_EQ(textOf(record.ElementName), std::string(PING_TEST) + " Completion Record");
  EXPECT_EQ(numberOf(record.RecordType), 2);
  EXPECT_EQ(textOf(record.ServiceName), PING_TEST);
  EXPECT_EQ(textOf(record.ManagedElementName), textOf(controller()->ElementName));
  EXPECT_TRUE(record.CreationTimeStamp.value.equal(tvxNowDatetime()));
  EXPECT_EQ(textOf(record.RecordData), "the text");
  EXPECT_EQ(textOf(record.RecordFormat), "");
  EXPECT_EQ(numberOf(record.CompletionState), 2);
  EXPECT_EQ(log.level("CreateDiagnosticCompletionRecord"), TVX_DBG);
  EXPECT_EQ(log.level("PortController : 10000000000000A1"), TVX_DBG);
  EXPECT_TRUE(record.__name_space == "root/torvex");
  std::set<std::string> properties = RESULT_PROPERTIES;
  properties.insert("CompletionState");
  EXPECT_EQ(filledIn(&record), properties);
}

TEST_F(Records, CountsComeFromTestsThatHaveThem) {
  const struct {
    const char* name;
    bool counts;
  } rows[] = {{BEACON_TEST, false},
              {ECHO_TEST, true},
              {EXTERNAL_LOOPBACK_TEST, true},
              {HOST_LOOPBACK_TEST, true},
              {INTERNAL_LOOPBACK_TEST, true},
              {PING_TEST, true},
              {STATUS_TEST, false},
              {RESET_TEST, false},
              {SELF_TEST, true}};
  TVX_Diagnostics diagnostics(*agent);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    diagnostics.CreateDiagnosticServiceRecord(outcome(row.name));
    diagnostics.CreateDiagnosticCompletionRecord(outcome(row.name));
    const auto& service = lastServiceRecord();
    const auto& completion = lastCompletionRecord();
    EXPECT_EQ(numberOf(service.LoopsFailed), row.counts ? 3 : 0) << row.name;
    EXPECT_EQ(numberOf(service.LoopsPassed), row.counts ? 97 : 0) << row.name;
    EXPECT_EQ(numberOf(service.CompletedCycles), row.counts ? 100 : -1) << row.name;
    EXPECT_EQ(numberOf(service.TimeToExecute), row.counts ? 17 : -1) << row.name;
    EXPECT_EQ(numberOf(completion.LoopsFailed), row.counts ? 3 : 0) << row.name;
    EXPECT_EQ(numberOf(completion.LoopsPassed), row.counts ? 97 : 0) << row.name;
    EXPECT_EQ(numberOf(completion.CompletedCycles), row.counts ? 100 : -1) << row.name;
    EXPECT_EQ(numberOf(completion.TimeToExecute), row.counts ? 17 : -1) << row.name;
  }
}

TEST_F(Records, WithoutAResultTheCountsAreZero) {
  Diagnostic_Outcome none = outcome(SELF_TEST);
  none.result = nullptr;
  TVX_Diagnostics(*agent).CreateDiagnosticServiceRecord(none);
  EXPECT_EQ(numberOf(lastServiceRecord().LoopsPassed), 0);
  EXPECT_TRUE(lastServiceRecord().CompletedCycles.is_null());
}

TEST_F(Records, FailuresSuggestWhatToDo) {
  const struct {
    const char* name;
    const char* action;
  } rows[] = {{BEACON_TEST, REPLACE_CARD},
              {STATUS_TEST, REPLACE_CARD},
              {RESET_TEST, REPLACE_CARD},
              {HOST_LOOPBACK_TEST, REPLACE_CARD},
              {INTERNAL_LOOPBACK_TEST, REPLACE_CARD},
              {SELF_TEST, REPLACE_CARD},
              {EXTERNAL_LOOPBACK_TEST, REPLACE_CABLES},
              {PING_TEST, VERIFY_SAN},
              {ECHO_TEST, VERIFY_SAN},
              {"another", VERIFY_SAN}};
  TVX_Diagnostics diagnostics(*agent);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    diagnostics.CreateDiagnosticCompletionRecord(outcome(row.name, true));
    EXPECT_EQ(textOf(lastCompletionRecord().RecordData), std::string("the text : ") + row.action);
    EXPECT_EQ(numberOf(lastCompletionRecord().CompletionState), 5);
  }
}

TEST_F(Records, LongTextsAreCut) {
  Diagnostic_Outcome longOne = outcome(SELF_TEST);
  longOne.text = std::string(2000, 'x');
  TVX_Diagnostics(*agent).CreateDiagnosticCompletionRecord(longOne);
  EXPECT_EQ(textOf(lastCompletionRecord().RecordData), std::string(1023, 'x'));
  longOne.jobID = "another";
  longOne.text = std::string(1000, 'y');
  longOne.completionState = COMPLETION_FAILED;
  TVX_Diagnostics(*agent).CreateDiagnosticCompletionRecord(longOne);
  EXPECT_EQ(textOf(lastCompletionRecord().RecordData),
            std::string(1000, 'y') + (std::string(" : ") + REPLACE_CARD).substr(0, 23));
}

TEST_F(Records, RecordsAreTiedToTheirLogAndTheirPort) {
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.CreateDiagnosticServiceRecord(outcome(PING_TEST));
  diagnostics.CreateDiagnosticCompletionRecord(outcome(PING_TEST));
  auto& managed = agent->m_TVXHBA_LogManagesRecord_map;
  ASSERT_EQ(managed.size(), 2u);
  EXPECT_TRUE(tiesClones(managed[0], logOf(PING_TEST), &lastServiceRecord()));
  EXPECT_TRUE(tiesClones(managed[1], logOf(PING_TEST), &lastCompletionRecord()));
  auto& applies = agent->m_TVXHBA_RecordAppliesToElement_map;
  ASSERT_EQ(applies.size(), 2u);
  EXPECT_TRUE(tiesClones(applies[0], &lastServiceRecord(), controller()));
  EXPECT_TRUE(tiesClones(applies[1], &lastCompletionRecord(), controller()));
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_CorrespondingSettingDataRecord_map.size(), 0u);
}

TEST_F(Records, SettingsOfARunHaveARecordOfTheirOwn) {
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.CreateDiagnosticServiceRecord(outcome(PING_TEST, false, true));
  diagnostics.CreateDiagnosticCompletionRecord(outcome(PING_TEST, false, true));
  ASSERT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 1u);
  const TVXHBA_DiagnosticSettingDataRecord& record =
      *agent->m_TVXHBA_DiagnosticSettingDataRecord_map[0];
  EXPECT_EQ(textOf(record.InstanceID), "the job:SettingData Record");
  EXPECT_EQ(textOf(record.Caption), "the job");
  EXPECT_EQ(textOf(record.Description), "This class holds the overrided setting data of the test");
  EXPECT_EQ(textOf(record.ElementName), std::string(PING_TEST) + " SettingData Record");
  EXPECT_EQ(textOf(record.ServiceName), PING_TEST);
  EXPECT_EQ(textOf(record.ManagedElementName), textOf(controller()->ElementName));
  EXPECT_TRUE(record.CreationTimeStamp.value.equal(tvxNowDatetime()));
  EXPECT_EQ(record.Settings, nullptr) << "the request puts them in";
  EXPECT_TRUE(record.__name_space == "root/torvex");
  EXPECT_EQ(filledIn(&record),
            (std::set<std::string>{"InstanceID", "Caption", "Description", "ElementName",
                                   "ServiceName", "ManagedElementName", "CreationTimeStamp"}));
  auto& corresponding = agent->m_TVXHBA_CorrespondingSettingDataRecord_map;
  ASSERT_EQ(corresponding.size(), 2u);
  EXPECT_TRUE(tiesClones(corresponding[0], &lastServiceRecord(), &record));
  EXPECT_TRUE(tiesClones(corresponding[1], &lastCompletionRecord(), &record));
  ASSERT_EQ(agent->m_TVXHBA_LogManagesRecord_map.size(), 3u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_LogManagesRecord_map[1], logOf(PING_TEST), &record));
  ASSERT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 3u);
  EXPECT_TRUE(tiesClones(agent->m_TVXHBA_RecordAppliesToElement_map[1], &record, controller()));
}

TEST_F(Records, WithoutAManagedElementTheyAreTheAdapters) {
  TVX_Diagnostics diagnostics(*agent);
  Diagnostic_Outcome none = outcome(PING_TEST, false, true);
  none.element = nullptr;
  diagnostics.CreateDiagnosticServiceRecord(none);
  diagnostics.CreateDiagnosticCompletionRecord(none);
  EXPECT_EQ(log.count("Invalid managed element"), 2u);
  EXPECT_EQ(log.level("Invalid managed element"), TVX_DBG);
  EXPECT_EQ(textOf(lastServiceRecord().ManagedElementName), "TVXHBA_Adapter");
  EXPECT_EQ(textOf(lastCompletionRecord().ManagedElementName), "TVXHBA_Adapter");
  EXPECT_EQ(textOf(agent->m_TVXHBA_DiagnosticSettingDataRecord_map[0]->ManagedElementName),
            "TVXHBA_Adapter");
  EXPECT_EQ(agent->m_TVXHBA_LogManagesRecord_map.size(), 3u);
  EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 0u);
}

TEST_F(Records, ComeInTheirOrder) {
  Texts came;
  const Refused_Calls watch({}, [&](const Instance& instance) {
    came.emplace_back(instance.meta_class->name);
    return false;
  });
  ASSERT_EQ(run(HOST_LOOPBACK_TEST, givenFor(HOST_LOOPBACK_TEST).get()).result, 0);
  EXPECT_EQ(came,
            (Texts{"TVXHBA_ConcreteJob", "TVXHBA_OwningJobElement", "TVXHBA_AffectedJobElement",
                   "TVXHBA_DiagnosticServiceRecord", "TVXHBA_LogManagesRecord",
                   "TVXHBA_DiagnosticSettingDataRecord", "TVXHBA_CorrespondingSettingDataRecord",
                   "TVXHBA_LogManagesRecord", "TVXHBA_RecordAppliesToElement",
                   "TVXHBA_RecordAppliesToElement", "TVXHBA_DiagnosticCompletionRecord",
                   "TVXHBA_LogManagesRecord", "TVXHBA_CorrespondingSettingDataRecord",
                   "TVXHBA_RecordAppliesToElement"}));
}

// --- Failures. Each ends its function; what was inserted by then stays.

struct Failure {
  const Meta_Class* part;
  bool completion;  // which of the two operations
  const char* text;
  std::size_t managed;  // ties to the log that are there afterwards
  std::size_t applies;
};

TEST_F(Records, RecordsAndTiesThatCantBeMadeAreTold) {
  const Failure rows[] = {
      {&TVXHBA_DiagnosticServiceRecord::static_meta_class, false,
       "Failed to create DiagnosticServiceRecord", 0, 0},
      {&TVXHBA_LogManagesRecord::static_meta_class, false,
       "Failed to create TVXHBA_LogManagesRecord", 0, 0},
      {&TVXHBA_DiagnosticSettingDataRecord::static_meta_class, false,
       "Failed to create TVXHBA_DiagnosticSettingDataRecord", 1, 0},
      {&TVXHBA_CorrespondingSettingDataRecord::static_meta_class, false,
       "Failed to create TVXHBA_CorrespondingSettingDataRecord", 1, 0},
      {&TVXHBA_RecordAppliesToElement::static_meta_class, false,
       "Failed to create TVXHBA_DiagnosticCompletionRecord", 2, 0},
      {&TVXHBA_DiagnosticCompletionRecord::static_meta_class, true,
       "Failed to create TVXHBA_DiagnosticCompletionRecord", 0, 0},
      {&TVXHBA_LogManagesRecord::static_meta_class, true,
       "Failed to create TVXHBA_LogManagesRecord", 0, 0},
      {&TVXHBA_CorrespondingSettingDataRecord::static_meta_class, true,
       "Failed to create TVXHBA_CorrespondingSettingDataRecord", 1, 0},
      {&TVXHBA_RecordAppliesToElement::static_meta_class, true,
       "Failed to create TVXHBA_RecordAppliesToElement", 1, 0},
  };
  TVX_Diagnostics diagnostics(*agent);
  setDiagnosticFactory(makeAllButOne);
  for (const Failure& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    log.clear();
    unmakeable = row.part;
    if (row.completion)
      diagnostics.CreateDiagnosticCompletionRecord(outcome(PING_TEST, false, true));
    else
      diagnostics.CreateDiagnosticServiceRecord(outcome(PING_TEST, false, true));
    EXPECT_EQ(log.count(row.text), 1u) << row.text << row.completion;
    EXPECT_EQ(log.level(row.text), TVX_DBG) << row.text;
    EXPECT_EQ(agent->m_TVXHBA_LogManagesRecord_map.size(), row.managed) << row.text;
    EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), row.applies) << row.text;
  }
}

/// Makes the first instance of a class and no more.
std::size_t leftToMake = 0;
Instance* makeOnlyOne(const Meta_Class* metaClass) {
  if (metaClass == unmakeable && leftToMake-- == 0) return nullptr;
  return create(metaClass, true);
}

TEST_F(Records, SecondTiesThatCantBeMadeAreTold) {
  const struct {
    const Meta_Class* part;
    const char* text;
    std::size_t applies;
  } rows[] = {
      {&TVXHBA_LogManagesRecord::static_meta_class, "Failed to create TVXHBA_LogManagesRecord", 0},
      {&TVXHBA_RecordAppliesToElement::static_meta_class,
       "Failed to create TVXHBA_RecordAppliesToElement", 1}};
  TVX_Diagnostics diagnostics(*agent);
  setDiagnosticFactory(makeOnlyOne);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    log.clear();
    unmakeable = row.part;
    leftToMake = 1;
    diagnostics.CreateDiagnosticServiceRecord(outcome(PING_TEST, false, true));
    EXPECT_EQ(log.level(row.text), TVX_DBG) << row.text;
    EXPECT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 1u) << "it stays";
    EXPECT_EQ(agent->m_TVXHBA_CorrespondingSettingDataRecord_map.size(), 1u);
    EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), row.applies) << row.text;
  }
}

TEST_F(Records, SecondTiesThatAreRefusedAreTold) {
  const struct {
    const Meta_Class* part;
    const char* text;
  } rows[] = {
      {&TVXHBA_LogManagesRecord::static_meta_class, "Insert Failed : TVXHBA_LogManagesRecord"},
      {&TVXHBA_RecordAppliesToElement::static_meta_class,
       "Insert Failed : RecordAppliesToElement"}};
  TVX_Diagnostics diagnostics(*agent);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    log.clear();
    std::size_t seen = 0;
    const Refused_Calls refused({}, [&](const Instance& instance) {
      return instance.meta_class == row.part && ++seen == 2;
    });
    diagnostics.CreateDiagnosticServiceRecord(outcome(PING_TEST, false, true));
    EXPECT_EQ(log.count(row.text), 1u);
    EXPECT_EQ(log.level(row.text), TVX_DBG) << row.text;
  }
}

TEST_F(Records, RecordsAndTiesThatAreThereAlreadyAreTold) {
  const struct {
    void (*clearOthers)(ProviderAgent& agent);
    bool completion;
    const char* text;
  } rows[] = {
      {[](ProviderAgent&) {}, false, "Insert Failed, DiagnosticServiceRecord"},
      {[](ProviderAgent& a) { a.m_TVXHBA_DiagnosticServiceRecord_map.clear(); }, false,
       "Insert Failed : TVXHBA_LogManagesRecord"},
      {[](ProviderAgent& a) {
         a.m_TVXHBA_DiagnosticServiceRecord_map.clear();
         a.m_TVXHBA_LogManagesRecord_map.clear();
       },
       false, "Insert in TVXHBA_DiagnosticSettingDataRecord Failed"},
      {[](ProviderAgent& a) {
         a.m_TVXHBA_DiagnosticServiceRecord_map.clear();
         a.m_TVXHBA_LogManagesRecord_map.clear();
         a.m_TVXHBA_DiagnosticSettingDataRecord_map.clear();
       },
       false, "Insert Failed : TVXHBA_CorrespondingSettingDataRecord"},
      {[](ProviderAgent& a) {
         a.m_TVXHBA_DiagnosticServiceRecord_map.clear();
         a.m_TVXHBA_LogManagesRecord_map.clear();
         a.m_TVXHBA_DiagnosticSettingDataRecord_map.clear();
         a.m_TVXHBA_CorrespondingSettingDataRecord_map.clear();
       },
       false, "Insert Failed : RecordAppliesToElement"},
      {[](ProviderAgent&) {}, true, "Insert in DiagnosticCompletionRecord Failed"},
      {[](ProviderAgent& a) { a.m_TVXHBA_DiagnosticCompletionRecord_map.clear(); }, true,
       "Insert Failed : TVXHBA_LogManagesRecord"},
      {[](ProviderAgent& a) {
         a.m_TVXHBA_DiagnosticCompletionRecord_map.clear();
         a.m_TVXHBA_LogManagesRecord_map.clear();
       },
       true, "Insert Failed : TVXHBA_CorrespondingSettingDataRecord"},
      {[](ProviderAgent& a) {
         a.m_TVXHBA_DiagnosticCompletionRecord_map.clear();
         a.m_TVXHBA_LogManagesRecord_map.clear();
         a.m_TVXHBA_CorrespondingSettingDataRecord_map.clear();
       },
       true, "Insert Failed : RecordAppliesToElement"},
  };
  TVX_Diagnostics diagnostics(*agent);
  const Diagnostic_Outcome both = outcome(PING_TEST, false, true);
  for (const auto& row : rows) {
    diagnostics.ClearDiagnosticClassMaps(1);
    diagnostics.CreateDiagnosticServiceRecord(both);
    diagnostics.CreateDiagnosticCompletionRecord(both);
    row.clearOthers(*agent);
    log.clear();
    if (row.completion)
      diagnostics.CreateDiagnosticCompletionRecord(both);
    else
      diagnostics.CreateDiagnosticServiceRecord(both);
    EXPECT_EQ(log.count(row.text), 1u) << row.text << row.completion;
    EXPECT_EQ(log.level(row.text), TVX_DBG);
  }
}

TEST_F(Records, CompletionRecordThatIsRefusedLeavesTiesWithoutIt) {
  TVX_Diagnostics diagnostics(*agent);
  diagnostics.CreateDiagnosticCompletionRecord(outcome(PING_TEST));
  diagnostics.CreateDiagnosticCompletionRecord(outcome(PING_TEST));
  ASSERT_EQ(agent->m_TVXHBA_LogManagesRecord_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_LogManagesRecord_map[1]->Record, nullptr);
  ASSERT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_RecordAppliesToElement_map[1]->Antecedent, nullptr);
}

// --- Whole runs

TEST_F(Records, TwoRunsOfOneTestKeepTwoSetsOfRecords) {
  const Ran first = run(SELF_TEST);
  const Ran second = run(SELF_TEST);
  EXPECT_NE(textOf(first.job->InstanceID), textOf(second.job->InstanceID));
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 2u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 2u);
  EXPECT_EQ(textOf(lastCompletionRecord().InstanceID), textOf(second.job->InstanceID));
  EXPECT_EQ(textOf(lastServiceRecord().InstanceID),
            textOf(second.job->InstanceID) + ":Service Record");
}

TEST_F(Records, ResultsGoWithTheProvider) {
  run(HOST_LOOPBACK_TEST, givenFor(HOST_LOOPBACK_TEST).get());
  ASSERT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 1u);
  stopAgent();
  agent = nullptr;
  build();
  EXPECT_EQ(agent->m_TVXHBA_ConcreteJob_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticServiceRecord_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticCompletionRecord_map.size(), 0u);
  EXPECT_EQ(agent->m_TVXHBA_DiagnosticSettingDataRecord_map.size(), 0u);
}

TEST_F(Records, RunTakesTheCountsOfTheLibrary) {
  build(hostWith(R"(, "diagnostics": {"pci": {"polls": 2, "result": 5, "errors": 6}})"));
  run(HOST_LOOPBACK_TEST);
  EXPECT_EQ(numberOf(lastServiceRecord().LoopsFailed), 6);
  EXPECT_EQ(numberOf(lastServiceRecord().LoopsPassed), 94);
  EXPECT_EQ(numberOf(lastServiceRecord().CompletedCycles), 100);
  EXPECT_EQ(numberOf(lastServiceRecord().TimeToExecute), 3);
  EXPECT_EQ(textOf(lastCompletionRecord().RecordData),
            std::string(HOST_LOOPBACK_TEST) +
                " Resulted with Failure, Result - Transmit Error : " + REPLACE_CARD);
}

}  // namespace
}  // namespace cimrt::test
