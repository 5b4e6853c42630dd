#include "diagnostics/TVXHBA_DiagnosticsLog_Provider.h"

#include "agent/Service_Call.h"
#include "diagnostics/DiagnosticTable.h"
#include "runtime/Typed_Instance.h"

namespace cimrt {

namespace {

constexpr std::uint32_t RESULT_OK = 0;
constexpr std::uint32_t RESULT_FAILED = 4;
constexpr std::uint32_t RESULT_INVALID = 5;

// --- What belongs to a log, by the name of its test

bool isOf(const TVXHBA_LogManagesRecord& entry, const String& name) {
  const auto* log = typed<TVXHBA_DiagnosticsLog>(entry.Log);
  return log && log->InstanceID.value.equal(name);
}

template <class Record>
bool isServiceOf(const Instance* instance, const String& name) {
  const auto* record = typed<Record>(instance);
  return record && record->ServiceName.value.equal(name);
}

bool isOf(const TVXHBA_RecordAppliesToElement& entry, const String& name) {
  return isServiceOf<TVXHBA_DiagnosticServiceRecord>(entry.Antecedent, name) ||
         isServiceOf<TVXHBA_DiagnosticCompletionRecord>(entry.Antecedent, name) ||
         isServiceOf<TVXHBA_DiagnosticSettingDataRecord>(entry.Antecedent, name);
}

bool isOf(const TVXHBA_DiagnosticCompletionRecord& record, const String& name) {
  return record.ServiceName.value.equal(name);
}

bool isOf(const TVXHBA_DiagnosticServiceRecord& record, const String& name) {
  return record.ServiceName.value.equal(name);
}

// --- Clearing

/// Copies the entries that `isKept` wants into an empty map, the last one first. False if that
/// refuses one.
template <class T, class Kept>
bool copyBackwards(const Instance_Map<T>& from, Instance_Map<T>& to, Kept isKept) {
  for (std::size_t i = from.size(); i-- > 0;) {
    if (!isKept(*from[i])) continue;
    Ref<T> copy(clone(from[i]));
    if (to.insert(copy.get()) == Instance_Map_Base::npos) return false;
    copy.release();
  }
  return true;
}

/// Drops what belongs to the log. Copying twice backwards leaves the others in their order. A map
/// that can't be copied stays as it is.
template <auto MAP>
bool dropFrom(ProviderAgent& agent, const String& name) {
  auto& map = agent.*MAP;
  std::remove_reference_t<decltype(map)> kept;
  if (!copyBackwards(map, kept, [&](const auto& entry) { return !isOf(entry, name); }))
    return false;
  map.clear();
  return copyBackwards(kept, map, [](const auto&) { return true; });
}

struct Clear_Step {
  bool (*drop)(ProviderAgent& agent, const String& name);
  const char* failure;
};

constexpr Clear_Step STEPS[] = {
    {dropFrom<&Agent_Maps::m_TVXHBA_LogManagesRecord_map>,
     "Insert Failed : temp_TVXHBA_LogManagesRecord_map"},
    {dropFrom<&Agent_Maps::m_TVXHBA_RecordAppliesToElement_map>,
     "Insert Failed : TVXHBA_RecordAppliesToElement_map"},
    {dropFrom<&Agent_Maps::m_TVXHBA_DiagnosticCompletionRecord_map>,
     "Insert Failed : temp_TVXHBA_DiagnosticCompletionRecord_map"},
    {dropFrom<&Agent_Maps::m_TVXHBA_DiagnosticServiceRecord_map>,
     "Insert Failed : temp_TVXHBA_DiagnosticServiceRecord_map"},
};

std::uint32_t clearRecords(ProviderAgent& agent, const String& name) {
  for (const Clear_Step& step : STEPS) {
    if (step.drop(agent, name)) continue;
    TVX_LOG(TVX_CRIT, "%s", step.failure);
    return RESULT_FAILED;
  }
  TVX_LOG(TVX_DBG, "Exiting the TVXHBA CDM Clear log");
  return RESULT_OK;
}

}  // namespace

std::int32_t TVXHBA_DiagnosticsLog_Provider::ClearLog(const TVXHBA_DiagnosticsLog* log,
                                                      Property<std::uint32_t>& return_value) {
  Service_Call call;
  if (call.agent.m_TVXHBA_DiagnosticsLog_map.find(log) == Instance_Map_Base::npos) {
    TVX_LOG(TVX_DBG, "Invalid instance of Diagnostic Log");
    return_value.set(RESULT_INVALID);
    return INVOKE_METHOD_OK;
  }
  const String& name = log->InstanceID.value;
  return_value.set(findDiagnosticTest(name.c_str()) ? clearRecords(call.agent, name) : RESULT_OK);
  TVX_LOG(TVX_DBG, "Exiting TVXHBA_DiagnosticsLog_Provider::ClearLog");
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
