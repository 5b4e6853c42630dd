#include "logs/TVXHBA_RecordLog_Provider.h"

#include <cstring>

#include "agent/RecordLogs.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

namespace {

/// What the dump file keeps of a path.
constexpr std::size_t LONGEST_TRACE_PATH = 255;

bool isDriverLog(ProviderAgent& agent, const TVXHBA_RecordLog* log) {
  return log && !log->InstanceID.is_null() &&
         log->InstanceID.value.equal(driverLogInstanceID(agent).c_str());
}

/// The map's entry of a log, or null with a message.
TVXHBA_RecordLog* knownLog(ProviderAgent& agent, const TVXHBA_RecordLog* log) {
  TVXHBA_RecordLog* entry = nullptr;
  if (log && !log->InstanceID.is_null())
    entry = findRecordLog(agent, log->InstanceID.value.c_str());
  if (!entry) TVX_LOG(TVX_ERR, "Invalid instance of Record Log");
  return entry;
}

// --- Parameters ----------------------------------------------------------------------------------

bool writesFile(std::uint16_t mode) {
  return mode == TVX_LOG_MODE_FILE || mode == TVX_LOG_MODE_BOTH;
}

/// True if the dump file can hold the path, which is one line of it.
bool canBeKept(const char* path) {
  return *path != '\0' && std::strlen(path) <= LONGEST_TRACE_PATH &&
         std::strpbrk(path, "\r\n") == nullptr;
}

/// Makes `path` the log file. Whoever chooses a file wants all lines in it, so that the
/// first-failure log is over.
bool setTracePath(ProviderAgent& agent, const char* path) {
  if (!canBeKept(path) || agent.m_FileLogger.validateAndSetPath(path, false) != 0) return false;
  getLogger().clearDefaultLog();
  return true;
}

/// Writes the logger's configuration out and applies what was written.
void keepConfiguration() {
  CLogger& logger = getLogger();
  if (logger.writeDump()) logger.loadConfig();
}

void refreshParameters(ProviderAgent& agent, TVXHBA_RecordLog& entry) {
  const std::string path = agent.m_FileLogger.path();
  TVX_LOG(TVX_DBG, "Setting path as %s", path.c_str());
  if (!path.empty()) entry.TracePath.set(path.c_str());
  entry.LogLevel.set(getLogger().level());
  entry.LogMode.set(getLogger().mode());
}

/// False, with a message, if a parameter is refused; then nothing was changed.
bool takeParameters(ProviderAgent& agent, std::uint16_t level, std::uint16_t mode,
                    const char* path) {
  if (level < TVX_CRIT || level > TVX_DBG) {
    TVX_LOG(TVX_ERR, "Log level provided is out of range");
    return false;
  }
  if (mode < TVX_LOG_MODE_MEMORY || mode > TVX_LOG_MODE_BOTH) {
    TVX_LOG(TVX_ERR, "Log mode provided is out of range");
    return false;
  }
  if (writesFile(mode) && !setTracePath(agent, path)) {
    TVX_LOG(TVX_ERR, "Setting the trace path failed");
    return false;
  }
  TVX_LOG(TVX_CRIT, "Changing the record log parameters %d-%d-%s", level, mode, path);
  getLogger().setLevel(level);
  getLogger().setMode(mode);
  return true;
}

// --- States --------------------------------------------------------------------------------------

void setState(TVXHBA_RecordLog& entry, std::uint16_t state, std::uint16_t status) {
  entry.RequestedState.set(state);
  entry.EnabledState.set(state);
  entry.OperationalStatus.set({status});
}

void setRecordCount(TVXHBA_RecordLog& entry, std::size_t count) {
  entry.CurrentNumberOfRecords.set(count);
}

void enable(ProviderAgent& agent, TVXHBA_RecordLog& entry, bool isDriver) {
  if (agent.m_FileLogger.path() == tvxFfdcLogPath())
    TVX_LOG(TVX_ERR,
            "The tracepath has not been set yet. Until the tracepath is set, FFDC will be used to "
            "log messages.");
  else
    getLogger().enable();
  setState(entry, LOG_ENABLED, LOG_OK);
  if (isDriver) {
    agent.m_DeviceLogBuffer.clear();
    agent.readDriverLog();
    setRecordCount(entry, agent.m_DeviceLogBuffer.lines().size());
    return;
  }
  TVX_LOG(TVX_WARN, "FC Record Logs enabled");
  keepConfiguration();
}

void disable(ProviderAgent& agent, TVXHBA_RecordLog& entry, bool isDriver) {
  TVX_LOG(TVX_WARN, "Logs disabled");
  getLogger().disable();
  setState(entry, LOG_DISABLED, LOG_STOPPED);
  if (isDriver)
    agent.m_DeviceLogBuffer.clear();
  else
    keepConfiguration();
}

/// False, with a message, for a state that can't be asked for.
bool changeState(ProviderAgent& agent, TVXHBA_RecordLog& entry, std::uint16_t state) {
  const bool isDriver = isDriverLog(agent, &entry);
  if (isDriver) TVX_LOG(TVX_DBG, "Instance of FC Driver Record Log");
  switch (state) {
    case LOG_ENABLED:
      enable(agent, entry, isDriver);
      return true;
    case LOG_DISABLED:
      disable(agent, entry, isDriver);
      return true;
    default:
      TVX_LOG(TVX_ERR, "Invalid input");
      return false;
  }
}

void clearLog(ProviderAgent& agent, TVXHBA_RecordLog& entry) {
  if (isDriverLog(agent, &entry)) {
    agent.m_DeviceLogBuffer.clear();
    setRecordCount(entry, 0);
    return;
  }
  getLogger().clearAll();
  TVX_LOG(TVX_WARN, "Cleared all the logs");
  // The file tells of it, the records do not.
  agent.m_CIMLogger.clear();
}

}  // namespace

std::int32_t TVXHBA_RecordLog_Provider::SetLogParams(const TVXHBA_RecordLog* log,
                                                     const Property<std::uint16_t>& level,
                                                     const Property<std::uint16_t>& mode,
                                                     const Property<String>& path,
                                                     Property<std::uint32_t>& result) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.awaitAdapterMaps();
  Ranked_Lock data(agent.m_DataMutex);
  if (isDriverLog(agent, log)) {
    TVX_LOG(TVX_CRIT, "SetLogParams is not supported for Driver Record Log Instance");
    return INVOKE_METHOD_UNSUPPORTED;
  }
  TVXHBA_RecordLog* entry = knownLog(agent, log);
  if (!entry) {
    result.set(LOG_UNKNOWN);
    return INVOKE_METHOD_OK;
  }
  if (!takeParameters(agent, level.is_null() ? 0 : level.value, mode.is_null() ? 0 : mode.value,
                      path.is_null() ? "" : path.value.c_str())) {
    result.set(LOG_INVALID_PARAMETER);
    return INVOKE_METHOD_OK;
  }
  refreshParameters(agent, *entry);
  keepConfiguration();
  result.set(0);
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_RecordLog_Provider::ClearLog(const TVXHBA_RecordLog* log,
                                                 Property<std::uint32_t>& result) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.awaitAdapterMaps();
  Ranked_Lock data(agent.m_DataMutex);
  TVXHBA_RecordLog* entry = knownLog(agent, log);
  result.set(entry ? 0 : LOG_UNKNOWN);
  if (entry) clearLog(agent, *entry);
  return INVOKE_METHOD_OK;
}

std::int32_t TVXHBA_RecordLog_Provider::RequestStateChange(const TVXHBA_RecordLog* log,
                                                           const Property<std::uint16_t>& state,
                                                           const CIM_ConcreteJob*,
                                                           const Property<Datetime>&,
                                                           Property<std::uint32_t>& result) {
  ProviderAgent& agent = *ProviderAgent::getInstance();
  agent.awaitAdapterMaps();
  Ranked_Lock data(agent.m_DataMutex);
  TVXHBA_RecordLog* entry = knownLog(agent, log);
  if (!entry) {
    result.set(LOG_UNKNOWN);
    return INVOKE_METHOD_OK;
  }
  const bool changed = changeState(agent, *entry, state.is_null() ? 0 : state.value);
  result.set(changed ? 0 : LOG_INVALID_PARAMETER);
  return INVOKE_METHOD_OK;
}

}  // namespace cimrt
