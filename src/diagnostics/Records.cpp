// The records of a run, and what ties them to the log, to the settings and to the port.
#include <cstdio>

#include "agent/Map_Insert.h"
#include "common/TVX_Clock.h"
#include "diagnostics/DiagnosticInstances.h"
#include "diagnostics/DiagnosticTable.h"
#include "diagnostics/TVX_Diagnostics.h"

namespace cimrt {

namespace {

/// Room for the text of a record, with its NUL.
constexpr std::size_t RECORD_DATA_SIZE = 1024;
/// `RecordType` of results.
constexpr std::uint16_t RECORD_TYPE_RESULTS = 2;

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

const char* suggestedAction(const std::string& testName) {
  const Diagnostic_Row* row = findDiagnosticTest(testName.c_str());
  if (!row || row->needsTarget()) return VERIFY_SAN;
  return row->number == Diagnostic_Test::EXTERNAL_LOOPBACK ? REPLACE_CABLES : REPLACE_CARD;
}

std::string completionText(const Diagnostic_Outcome& outcome) {
  char text[RECORD_DATA_SIZE] = {};
  if (outcome.completionState == COMPLETION_OK)
    std::snprintf(text, sizeof text, "%s", outcome.text.c_str());
  else
    std::snprintf(text, sizeof text, "%s : %s", outcome.text.c_str(),
                  suggestedAction(outcome.testName));
  return text;
}

/// The tests whose result counts cycles.
bool countsCycles(const std::string& testName) {
  const Diagnostic_Row* row = findDiagnosticTest(testName.c_str());
  return row && (row->sendsPattern() || row->number == Diagnostic_Test::SELF);
}

template <class Record>
void setCounts(Record& record, const Diagnostic_Outcome& outcome) {
  if (!outcome.result || !countsCycles(outcome.testName)) {
    record.LoopsFailed.set(0);
    record.LoopsPassed.set(0);
    return;
  }
  const RM_DiagResult& result = *outcome.result;
  record.LoopsFailed.set(result.errorCount);
  record.LoopsPassed.set(result.cyclesCompleted - result.errorCount);
  record.CompletedCycles.set(result.cyclesCompleted);
  record.TimeToExecute.set(result.totalTime);
}

/// What all three kinds of record have, with the words that tell them apart.
template <class Record>
void nameRecord(Record& record, const Diagnostic_Outcome& outcome, const char* description,
                const char* kind) {
  record.Description.set(description);
  record.ElementName.set(formatText("%s %s", outcome.testName.c_str(), kind).c_str());
  record.ServiceName.set(outcome.testName.c_str());
  if (outcome.element)
    record.ManagedElementName = outcome.element->ElementName;
  else
    record.ManagedElementName.set("TVXHBA_Adapter");
  record.CreationTimeStamp.set(tvxNowDatetime());
}

template <class Record>
void fillResultRecord(Record& record, const Diagnostic_Outcome& outcome, const std::string& text) {
  record.RecordType.set(RECORD_TYPE_RESULTS);
  record.RecordData.set(text.c_str());
  record.RecordFormat.set("");
  setCounts(record, outcome);
}

Ref<TVXHBA_DiagnosticServiceRecord> makeServiceRecord(const Diagnostic_Outcome& outcome) {
  auto record = makeDiagnostic<TVXHBA_DiagnosticServiceRecord>();
  if (!record) return record;
  record->InstanceID.set(formatText("%s:Service Record", outcome.jobID.c_str()).c_str());
  nameRecord(*record, outcome, "This class holds the results(service) of the test",
             "Service Record");
  fillResultRecord(*record, outcome, outcome.text);
  return record;
}

Ref<TVXHBA_DiagnosticCompletionRecord> makeCompletionRecord(const Diagnostic_Outcome& outcome) {
  auto record = makeDiagnostic<TVXHBA_DiagnosticCompletionRecord>();
  if (!record) return record;
  record->InstanceID.set(outcome.jobID.c_str());
  nameRecord(*record, outcome, "This class holds the result of the test", "Completion Record");
  fillResultRecord(*record, outcome, completionText(outcome));
  record->CompletionState.set(outcome.completionState);
  return record;
}

Ref<TVXHBA_DiagnosticSettingDataRecord> makeSettingRecord(const Diagnostic_Outcome& outcome) {
  auto record = makeDiagnostic<TVXHBA_DiagnosticSettingDataRecord>();
  if (!record) return record;
  record->InstanceID.set(formatText("%s:SettingData Record", outcome.jobID.c_str()).c_str());
  record->Caption.set(outcome.jobID.c_str());
  nameRecord(*record, outcome, "This class holds the overrided setting data of the test",
             "SettingData Record");
  return record;
}

// --- Associations. Each answers whether it was made.

bool tieToLog(ProviderAgent& agent, const Diagnostic_Outcome& outcome, const Instance* record) {
  const Instance* log = findByText(agent.m_TVXHBA_DiagnosticsLog_map,
                                   &TVXHBA_DiagnosticsLog::InstanceID, outcome.testName);
  return insertDiagnostic(agent.m_TVXHBA_LogManagesRecord_map,
                          makeDiagnosticAssociation<TVXHBA_LogManagesRecord>(log, record), TVX_DBG,
                          "Failed to create TVXHBA_LogManagesRecord",
                          "Insert Failed : TVXHBA_LogManagesRecord") != nullptr;
}

bool tieToSettings(ProviderAgent& agent, const Instance* record, const Instance* settingRecord) {
  return insertDiagnostic(agent.m_TVXHBA_CorrespondingSettingDataRecord_map,
                          makeDiagnosticAssociation<TVXHBA_CorrespondingSettingDataRecord>(
                              record, settingRecord),
                          TVX_DBG, "Failed to create TVXHBA_CorrespondingSettingDataRecord",
                          "Insert Failed : TVXHBA_CorrespondingSettingDataRecord") != nullptr;
}

bool tieToElement(ProviderAgent& agent, const Diagnostic_Outcome& outcome, const Instance* record,
                  const char* creationFailure) {
  return insertDiagnostic(
             agent.m_TVXHBA_RecordAppliesToElement_map,
             makeDiagnosticAssociation<TVXHBA_RecordAppliesToElement>(record, outcome.element),
             TVX_DBG, creationFailure, "Insert Failed : RecordAppliesToElement") != nullptr;
}

/// Makes the record of the settings, for a service record. Null if any of it failed.
const Instance* recordSettings(ProviderAgent& agent, const Diagnostic_Outcome& outcome,
                               const Instance* serviceRecord) {
  const Instance* record =
      insertDiagnostic(agent.m_TVXHBA_DiagnosticSettingDataRecord_map, makeSettingRecord(outcome),
                       TVX_DBG, "Failed to create TVXHBA_DiagnosticSettingDataRecord",
                       "Insert in TVXHBA_DiagnosticSettingDataRecord Failed");
  if (!record || !tieToSettings(agent, serviceRecord, record)) return nullptr;
  return tieToLog(agent, outcome, record) ? record : nullptr;
}

void logElement(const Diagnostic_Outcome& outcome) {
  TVX_LOG(TVX_DBG, "PortController : %s", outcome.element->DeviceID.value.c_str());
}

void logStart(const char* operation, const Diagnostic_Outcome& outcome) {
  TVX_LOG(TVX_DBG, "%s", operation);
  if (!outcome.element) TVX_LOG(TVX_DBG, "Invalid managed element");
}

}  // namespace

void TVX_Diagnostics::CreateDiagnosticServiceRecord(const Diagnostic_Outcome& outcome) {
  logStart("CreateDiagnosticServiceRecord", outcome);
  const Instance* record = insertDiagnostic(
      m_Agent.m_TVXHBA_DiagnosticServiceRecord_map, makeServiceRecord(outcome), TVX_DBG,
      "Failed to create DiagnosticServiceRecord", "Insert Failed, DiagnosticServiceRecord");
  if (!record || !tieToLog(m_Agent, outcome, record)) return;
  const Instance* settingRecord = nullptr;
  if (outcome.overridden) {
    settingRecord = recordSettings(m_Agent, outcome, record);
    if (!settingRecord) return;
  }
  if (!outcome.element) return;
  logElement(outcome);
  // The text names another class than the one that can't be made; clients know it so.
  if (!tieToElement(m_Agent, outcome, record, "Failed to create TVXHBA_DiagnosticCompletionRecord"))
    return;
  if (settingRecord)
    tieToElement(m_Agent, outcome, settingRecord, "Failed to create TVXHBA_RecordAppliesToElement");
}

void TVX_Diagnostics::CreateDiagnosticCompletionRecord(const Diagnostic_Outcome& outcome) {
  logStart("CreateDiagnosticCompletionRecord", outcome);
  Ref<TVXHBA_DiagnosticCompletionRecord> made = makeCompletionRecord(outcome);
  if (!made) {
    TVX_LOG(TVX_DBG, "Failed to create TVXHBA_DiagnosticCompletionRecord");
    return;
  }
  // A refused record is no end: its associations are made without it.
  const Instance* record =
      insertDiagnostic(m_Agent.m_TVXHBA_DiagnosticCompletionRecord_map, std::move(made), TVX_DBG,
                       "", "Insert in DiagnosticCompletionRecord Failed");
  if (!tieToLog(m_Agent, outcome, record)) return;
  if (outcome.overridden) {
    const Instance* settingRecord =
        findByText(m_Agent.m_TVXHBA_DiagnosticSettingDataRecord_map,
                   &TVXHBA_DiagnosticSettingDataRecord::Caption, outcome.jobID);
    if (!tieToSettings(m_Agent, record, settingRecord)) return;
  }
  if (!outcome.element) return;
  logElement(outcome);
  tieToElement(m_Agent, outcome, record, "Failed to create TVXHBA_RecordAppliesToElement");
}

}  // namespace cimrt
