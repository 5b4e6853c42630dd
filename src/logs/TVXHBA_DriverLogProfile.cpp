#include "logs/TVXHBA_DriverLogProfile.h"

#include "agent/Associations.h"
#include "agent/ProductSteps.h"
#include "agent/RecordLogs.h"
#include "agent/SoftwareIdentities.h"
#include "logs/Try_Make.h"

namespace cimrt {

namespace {

Ref<TVXHBA_RecordLog> describeLog(ProviderAgent& agent) {
  Ref<TVXHBA_RecordLog> log = makeInstance<TVXHBA_RecordLog>();
  const std::string name = driverLogInstanceID(agent);
  log->InstanceID.set(name.c_str());
  log->ElementName.set(name.c_str());
  log->MaxNumberOfRecords.set(Device_Log_Buffer::CAPACITY);
  log->CurrentNumberOfRecords.set(0);
  log->LogState.set(4);
  log->OverwritePolicy.set(2);
  log->OperationalStatus.set({getLogger().isEnabled() ? LOG_OK : LOG_STOPPED});
  log->RequestedState.set(LOG_ENABLED);
  log->EnabledState.set(LOG_DISABLED);
  log->HealthState.set(5);
  log->Name.set("Driver logs for Torvex FC Provider");
  return log;
}

Ref<TVXHBA_EnabledRecordLogCapabilities> describeCapabilities() {
  constexpr std::uint16_t RESET = 11;
  auto capabilities = makeInstance<TVXHBA_EnabledRecordLogCapabilities>();
  capabilities->InstanceID.set("TVX:FC Driver Record Log Capabilities");
  capabilities->RequestedStatesSupported.set({LOG_ENABLED, LOG_DISABLED, RESET});
  capabilities->MaxElementNameLen.set(0);
  return capabilities;
}

/// The attributes of the first FC adapter, or null.
const FCAdapterAttributes* firstFCAdapter(const Data& data) {
  for (Adapter* adapter : data.m_Adapters) {
    const auto* attributes = dynamic_cast<const FCAdapterAttributes*>(adapter->getAttributes());
    if (adapter->m_Type == TVX_ADAPTER_TYPE_FC && attributes) return attributes;
    TVX_LOG(TVX_DBG, "Skippping Adapter [%s] since it is not an FC Adapter",
            adapter->getName().c_str());
  }
  return nullptr;
}

}  // namespace

TVXHBA_DriverLogProfile::TVXHBA_DriverLogProfile(ProviderAgent& agent) : m_Agent(agent) {
  TVX_LOG(TVX_DBG, "TVXHBA_DriverLogProfile constructor");
}

TVXHBA_DriverLogProfile::~TVXHBA_DriverLogProfile() {
  TVX_LOG(TVX_DBG, "TVXHBA_DriverLogProfile destructor");
}

TVXHBA_RecordLog* TVXHBA_DriverLogProfile::createLog() {
  Ref<TVXHBA_RecordLog> log = tryMake("Failed to allocate memory to create TVXHBA_RecordLog",
                                      [this] { return describeLog(m_Agent); });
  if (!log) return nullptr;
  return insertInto(m_Agent.m_TVXHBA_RecordLog_map, std::move(log),
                    "Insert Failed : m_TVXHBA_RecordLog_map");
}

bool TVXHBA_DriverLogProfile::createCapabilities() {
  Ref<TVXHBA_EnabledRecordLogCapabilities> made =
      tryMake("Failed to allocate memory to create TVXHBA_EnabledRecordLogCapabilities",
              describeCapabilities);
  if (!made) return false;
  return insertInto(m_Agent.m_TVXHBA_EnabledRecordLogCapabilities_map, std::move(made),
                    "Insert Failed : m_TVXHBA_EnabledRecordLogCapabilities_map") != nullptr;
}

bool TVXHBA_DriverLogProfile::tieToDriver(const TVXHBA_RecordLog* log,
                                          const FCAdapterAttributes& attributes) {
  const TVXHBA_SoftwareIdentity* driver =
      findByText(m_Agent.m_TVXHBA_SoftwareIdentity_map, &TVXHBA_SoftwareIdentity::InstanceID,
                 driverIdentityInstanceID(attributes));
  if (!driver) {
    TVX_LOG(TVX_CRIT, "Missing Provider Software Identity");
    return false;
  }
  const std::string text = formatText("%s uses log : %s", driver->ElementName.value.c_str(),
                                      log->InstanceID.value.c_str());
  return createAssociation(m_Agent, Association_Kind::PROVIDER_USE_OF_LOG, text, log, driver) !=
         nullptr;
}

std::int32_t TVXHBA_DriverLogProfile::createFor(const FCAdapterAttributes& attributes) {
  const TVXHBA_RecordLog* log = createLog();
  if (!log || !createCapabilities() || !tieToDriver(log, attributes)) return MAP_BUILD_FAILED;
  TVX_LOG(TVX_DBG, "Exit CreateFCDriverLogClasses");
  return 0;
}

std::int32_t TVXHBA_DriverLogProfile::CreateFCDriverLogClasses() {
  TVX_LOG(TVX_DBG, "Enter CreateFCDriverLogClasses");
  const FCAdapterAttributes* attributes = firstFCAdapter(*m_Agent.m_pData);
  return attributes ? createFor(*attributes) : 0;
}

std::int32_t buildDriverLog(Host_Build& host) {
  if (TVXHBA_DriverLogProfile(host.agent).CreateFCDriverLogClasses() != 0)
    TVX_LOG(TVX_INFO, "Issue with FC Driver Log classes");
  return 0;
}

}  // namespace cimrt
