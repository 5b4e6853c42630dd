#include "logs/Driver_Log_Providers.h"

#include "agent/RecordLogs.h"
#include "logs/Log_Delivery.h"
#include "logs/Try_Make.h"

namespace cimrt {

namespace {

constexpr const char* ENTRY_NOT_CREATED = "Could not create TVXHBA_FCDriverLogEntry";
constexpr const char* ENTRY_REFUSED = "Insert Failed : m_TVXHBA_FCDriverLogEntry_map";
constexpr const char* TIE_NOT_CREATED =
    "Could not create TVXHBA_DriverRecordLogManagesRecord instance";

Ref<TVXHBA_FCDriverLogEntry> makeEntry(std::size_t index, const std::string& line,
                                       const TVXHBA_RecordLog* log) {
  Ref<TVXHBA_FCDriverLogEntry> entry = makeInstance<TVXHBA_FCDriverLogEntry>();
  entry->RecordID.set(formatText("%zu", index).c_str());
  entry->InstanceID.set(formatText("TVX:HBA FC Driver Record:%zu", index).c_str());
  entry->RecordData.set(line.c_str());
  entry->RecordFormat.set("[string record]");
  nameLog(*entry.get(), log);
  return entry;
}

/// Clones of the records; nothing if they could not be made.
Log_Instances copyEntries(ProviderAgent& agent) {
  if (CreateFCDriverLogEntryClass(agent) != 0) {
    TVX_LOG(TVX_CRIT, " Creation of CreateFCDriverLogEntryClass failed");
    return Log_Instances::failed();
  }
  Log_Instances made;
  const auto& entries = agent.m_TVXHBA_FCDriverLogEntry_map;
  for (std::size_t i = 0; i < entries.size(); i++)
    made.add(Ref<Instance>(clone(static_cast<const Instance*>(entries[i]))));
  return made;
}

/// The log tied to each record.
Log_Instances tieEntries(ProviderAgent& agent) {
  const TVXHBA_RecordLog* log = findRecordLog(agent, driverLogInstanceID(agent));
  if (!log) {
    TVX_LOG(TVX_CRIT, "%s", TIE_NOT_CREATED);
    return Log_Instances::failed();
  }
  if (CreateFCDriverLogEntryClass(agent) != 0) return Log_Instances::failed();
  Log_Instances made;
  const auto& entries = agent.m_TVXHBA_FCDriverLogEntry_map;
  for (std::size_t i = 0; i < entries.size(); i++) {
    Ref<TVXHBA_DriverRecordLogManagesRecord> tie = tryMake(TIE_NOT_CREATED, [&] {
      return makeAssociation<TVXHBA_DriverRecordLogManagesRecord>(log, entries[i]);
    });
    if (!tie) return Log_Instances::failed();
    TVX_LOG(TVX_DBG, "TVXHBA_DriverRecordLogManagesRecord returned instance %zu", i);
    made.add(Ref<Instance>(tie.release()));
  }
  return made;
}

}  // namespace

std::int32_t CreateFCDriverLogEntryClass(ProviderAgent& agent) {
  TVX_LOG(TVX_DBG, "************Inside CreateFCDriverLogEntryClass ");
  const TVXHBA_RecordLog* log = findRecordLog(agent, driverLogInstanceID(agent));
  auto& entries = agent.m_TVXHBA_FCDriverLogEntry_map;
  entries.clear();
  const std::vector<std::string>& lines = agent.m_DeviceLogBuffer.lines();
  for (std::size_t i = 0; i < lines.size(); i++) {
    Ref<TVXHBA_FCDriverLogEntry> entry =
        tryMake(ENTRY_NOT_CREATED, [&] { return makeEntry(i, lines[i], log); });
    if (!entry || !insertInto(entries, std::move(entry), ENTRY_REFUSED)) return DRIVER_LOG_FAILED;
    TVX_LOG(TVX_DBG, "TVXHBA_LogEntry returned instance %zu", i);
  }
  TVX_LOG(TVX_DBG, "CreateFCDriverLogEntryClass Successful");
  return 0;
}

std::int32_t TVXHBA_FCDriverLogEntry_Provider::enum_instances(const TVXHBA_FCDriverLogEntry*,
                                                              const Instance_Handler& handler) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  if (!logsAreServed(agent, "TVXHBA_FCDriverLogEntry")) return ENUM_INSTANCES_OK;
  Log_Instances made = underDataLock(agent, [&] { return copyEntries(agent); });
  if (!made.isComplete()) return ENUM_INSTANCES_OK;
  made.deliver(handler);
  TVX_LOG(TVX_DBG, "TVXHBA_FCDriverLogEntry_Provider::enum_instances()");
  return ENUM_INSTANCES_OK;
}

std::int32_t TVXHBA_DriverRecordLogManagesRecord_Provider::enum_instances(
    const TVXHBA_DriverRecordLogManagesRecord*, const Instance_Handler& handler) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  TVX_LOG(TVX_DBG, "Enter -- TVXHBA_DriverRecordLogManagesRecord");
  TVX_LOG(TVX_DBG, "Entering TVXHBA_DriverRecordLogManagesRecord::enum_instances");
  underDataLock(agent, [&] { return tieEntries(agent); }).deliver(handler);
  return ENUM_INSTANCES_OK;
}

}  // namespace cimrt
