#include "logs/Log_Entry_Providers.h"

#include <vector>

#include "agent/RecordLogs.h"
#include "logs/Log_Delivery.h"
#include "logs/Try_Make.h"

namespace cimrt {

namespace {

/// One record by its place.
struct Numbered_Record {
  std::size_t index;
  const TVX_CIMLogger::Record& record;
};

Ref<TVXHBA_LogEntry> makeEntry(const Numbered_Record& numbered, const TVXHBA_RecordLog* log) {
  Ref<TVXHBA_LogEntry> entry = makeInstance<TVXHBA_LogEntry>();
  entry->RecordID.set(formatText("%zu", numbered.index).c_str());
  entry->InstanceID.set(formatText("TVXHBA:ProviderLog:%zu", numbered.index).c_str());
  entry->CreationTimeStamp.set(numbered.record.time);
  entry->RecordData.set(numbered.record.text);
  entry->LogLevel.set(formatText("%d", numbered.record.level).c_str());
  entry->RecordFormat.set("[string fileName][uint32 lineNumber]:[string record]");
  nameLog(*entry.get(), log);
  return entry;
}

/// Makes the instances of a class, one for each record, with the agent's data lock held.
template <class Make>
Log_Instances makeForRecords(ProviderAgent& agent, Make make) {
  const std::vector<TVX_CIMLogger::Record> records = agent.m_CIMLogger.records();
  const TVXHBA_RecordLog* log = findRecordLog(agent, providerLogInstanceID(agent));
  TVX_LOG(TVX_DBG, "Log Size %zu", records.size());
  Log_Instances made;
  for (std::size_t i = 0; i < records.size(); i++) {
    Ref<Instance> instance = tryMake("Could not create TVXUCNA_LogEntry instance", [&] {
      return Ref<Instance>(make(Numbered_Record{i, records[i]}, log).release());
    });
    if (!instance) return Log_Instances::failed();
    TVX_LOG(TVX_DBG, "TVXHBA_LogEntry returned instance %zu", i);
    made.add(std::move(instance));
  }
  return made;
}

/// The whole enumeration of a class.
template <class Make>
std::int32_t enumerate(const char* className, const Instance_Handler& handler, Make make) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  if (!logsAreServed(agent, className)) return ENUM_INSTANCES_OK;
  TVX_LOG(TVX_DBG, "Entering %s::enum_instances", className);
  Log_Instances made = underDataLock(agent, [&] { return makeForRecords(agent, make); });
  if (!made.isComplete()) return ENUM_INSTANCES_OK;
  made.deliver(handler);
  TVX_LOG(TVX_DBG, "TVXUCNA_LogEntry_Provider::enum_instances()");
  return ENUM_INSTANCES_OK;
}

}  // namespace

std::int32_t TVXHBA_LogEntry_Provider::enum_instances(const TVXHBA_LogEntry*,
                                                      const Instance_Handler& handler) {
  return enumerate("TVXHBA_LogEntry", handler, makeEntry);
}

std::int32_t TVXHBA_RecordLogManagesRecord_Provider::enum_instances(
    const TVXHBA_RecordLogManagesRecord*, const Instance_Handler& handler) {
  return enumerate("TVXHBA_RecordLogManagesRecord", handler,
                   [](const Numbered_Record& numbered, const TVXHBA_RecordLog* log) {
                     if (!log) return Ref<TVXHBA_RecordLogManagesRecord>();
                     const Ref<TVXHBA_LogEntry> entry = makeEntry(numbered, log);
                     return makeAssociation<TVXHBA_RecordLogManagesRecord>(log, entry.get());
                   });
}

}  // namespace cimrt
