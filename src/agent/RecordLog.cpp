// The names of the record logs, and the provider's own: the log, what can be done with it, and who
// writes it.
#include "agent/Associations.h"
#include "agent/MapSteps.h"
#include "agent/Map_Insert.h"
#include "agent/RecordLogs.h"
#include "agent/RegisteredProfiles.h"
#include "agent/SoftwareIdentities.h"

namespace cimrt {

namespace {

/// The log as the steps below hand it on.
struct Log_Build {
  Host_Build& host;
  TVXHBA_RecordLog* log = nullptr;
  TVXHBA_EnabledRecordLogCapabilities* capabilities = nullptr;
};

/// `Name` of the first computer system; empty while there is none.
const char* systemName(ProviderAgent& agent) {
  auto& systems = agent.m_CIM_ComputerSystem_map;
  if (systems.size() == 0 || systems[0]->Name.is_null()) return "";
  return systems[0]->Name.value.c_str();
}

/// States by whether anything is logged at all.
void setLogState(TVXHBA_RecordLog& log, bool enabled) {
  log.RequestedState.set(enabled ? LOG_ENABLED : LOG_NO_CHANGE);
  log.EnabledState.set(enabled ? LOG_ENABLED : LOG_DISABLED);
  log.LogState.set(4);
  log.OverwritePolicy.set(2);
  log.OperationalStatus.set({LOG_OK});
  log.HealthState.set(5);
}

Ref<TVXHBA_RecordLog> describeLog(const Host_Build& host) {
  constexpr const char* NAME = "Record logs for Torvex CIM Provider";
  const CLogger& logger = getLogger();
  Ref<TVXHBA_RecordLog> log = makeInstance<TVXHBA_RecordLog>();
  log->InstanceID.set(providerLogInstanceID(host.agent).c_str());
  log->MaxNumberOfRecords.set(TVX_CIMLogger::DEFAULT_CAPACITY);
  log->CurrentNumberOfRecords.set(0);
  setLogState(*log.get(), logger.isEnabled());
  log->Name.set(NAME);
  log->ElementName.set(NAME);
  if (const std::string path = host.agent.m_FileLogger.path(); !path.empty())
    log->TracePath.set(path.c_str());
  log->LogLevel.set(logger.level());
  log->LogMode.set(logger.mode());
  return log;
}

std::int32_t buildLog(Log_Build& build) {
  build.log = insertInto(build.host.agent.m_TVXHBA_RecordLog_map, describeLog(build.host),
                         "Insert Failed : m_TVXHBA_TVXHBA_RecordLog_map");
  return build.log ? 0 : MAP_BUILD_FAILED;
}

std::int32_t conformLog(Log_Build& build) {
  constexpr const char* PROFILE = "Record Log";
  ProviderAgent& agent = build.host.agent;
  const TVXHBA_RegisteredProfile* profile =
      createRegisteredProfile(agent, PROFILE, ORGANIZATION_DMTF, "1.0.1");
  createComputerSystemConformsToProfile(agent, profile);
  if (!findRegisteredProfile(agent, "Profile Registration")) {
    TVX_LOG(TVX_CRIT, "Missing Profile Registration Profile instance");
    return MAP_BUILD_FAILED;
  }
  createRecordLogConformsToProfile(
      agent,
      formatText("%s conformant to %s profile", build.log->ElementName.value.c_str(), PROFILE),
      profile, build.log);
  return 0;
}

std::int32_t buildCapabilities(Log_Build& build) {
  ProviderAgent& agent = build.host.agent;
  Ref<TVXHBA_EnabledRecordLogCapabilities> made =
      makeInstance<TVXHBA_EnabledRecordLogCapabilities>();
  made->InstanceID.set("TVXHBA provider log capabilities");
  made->ElementNameEditSupported.set(false);
  made->RequestedStatesSupported.set({2, 3});
  made->LogParamsSupported.set({2, 3});
  build.capabilities =
      insertInto(agent.m_TVXHBA_EnabledRecordLogCapabilities_map, std::move(made),
                 "Insert Failed : m_TVXHBA_TVXHBA_EnabledRecordLogCapabilities_map");
  if (!build.capabilities) return MAP_BUILD_FAILED;
  createAssociation(agent, Association_Kind::RECORD_LOG_CAPABILITIES,
                    formatText("%s : Logging capabilities", build.log->InstanceID.value.c_str()),
                    build.log, build.capabilities);
  return 0;
}

std::int32_t tieLogToProvider(Log_Build& build) {
  ProviderAgent& agent = build.host.agent;
  const TVXHBA_SoftwareIdentity* identity =
      findByText(agent.m_TVXHBA_SoftwareIdentity_map, &TVXHBA_SoftwareIdentity::InstanceID,
                 providerIdentityInstanceID());
  if (!identity) {
    TVX_LOG(TVX_CRIT, "Missing Provider Software Identity");
    return MAP_BUILD_FAILED;
  }
  createAssociation(agent, Association_Kind::PROVIDER_USE_OF_LOG,
                    formatText("%s uses log : %s", identity->ElementName.value.c_str(),
                               build.log->InstanceID.value.c_str()),
                    build.log, identity);
  return 0;
}

constexpr Build_Step<Log_Build> LOG_STEPS[] = {
    buildLog,
    conformLog,
    buildCapabilities,
    tieLogToProvider,
};

}  // namespace

std::string providerLogInstanceID(ProviderAgent& agent) {
  return formatText("TVXHBA:ProviderLog:%s", systemName(agent));
}

std::string driverLogInstanceID(ProviderAgent& agent) {
  return formatText("TVX: FC Driver Record Log:%s", systemName(agent));
}

TVXHBA_RecordLog* findRecordLog(ProviderAgent& agent, const std::string& instanceID) {
  return findByText(agent.m_TVXHBA_RecordLog_map, &TVXHBA_RecordLog::InstanceID, instanceID);
}

std::int32_t buildRecordLog(Host_Build& host) {
  Log_Build build{host};
  return runSteps(LOG_STEPS, build);
}

}  // namespace cimrt
