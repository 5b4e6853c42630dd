// Life of the object, the maps, and the version that a port tells.
#include "diagnostics/TVX_Diagnostics.h"

#include <span>

#include "access/TVX_AttributeReader.h"
#include "access/TVX_MethodWrapper.h"
#include "agent/Clear_Map.h"
#include "common/CLogger.h"

namespace cimrt {

namespace {

constexpr Clear_Map CLASSES[] = {
    clearMap<&Agent_Maps::m_TVXHBA_FCHBADiagnosticTest_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBADiagnosticServiceCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagElementCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_AvailableDiagnosticService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HelpService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ServiceAffectsElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ServiceAvailableToElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_UseOfLog_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagnosticsLog_map>,
    clearMap<&Agent_Maps::m_TVXHBA_JobSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagElementSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagHostedService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBADiagnosticSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagElementSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagnosticIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_JobElementSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagServiceConformsToProfile_map>,
};

constexpr Clear_Map RECORDS[] = {
    clearMap<&Agent_Maps::m_TVXHBA_LogManagesRecord_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RecordAppliesToElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagnosticCompletionRecord_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagnosticServiceRecord_map>,
    clearMap<&Agent_Maps::m_TVXHBA_CorrespondingSettingDataRecord_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DiagnosticSettingDataRecord_map>,
};

constexpr Clear_Map JOBS[] = {
    clearMap<&Agent_Maps::m_TVXHBA_ConcreteJob_map>,
    clearMap<&Agent_Maps::m_TVXHBA_OwningJobElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_AffectedJobElement_map>,
};

std::span<const Clear_Map> mapsOf(int scope) {
  switch (static_cast<Diagnostic_Scope>(scope)) {
    case Diagnostic_Scope::CLASSES:
      return CLASSES;
    case Diagnostic_Scope::RECORDS:
      return RECORDS;
    case Diagnostic_Scope::JOBS:
      return JOBS;
  }
  return {};
}

/// Room that the library is told for the attributes of an adapter, in bytes.
constexpr std::uint32_t HBA_ATTRIBUTES_ROOM = 2048;

}  // namespace

TVX_Diagnostics::TVX_Diagnostics(ProviderAgent& agent) : m_Agent(agent) {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::Constructor");
}

TVX_Diagnostics::~TVX_Diagnostics() {
  TVX_LOG(TVX_DBG, "TVX_Diagnostics::Destructor");
}

std::int32_t TVX_Diagnostics::ClearDiagnosticClassMaps(int scope) {
  for (const Clear_Map clear : mapsOf(scope)) clear(m_Agent);
  return 0;
}

std::int32_t TVX_Diagnostics::GetDiagnosticVersion(const char* deviceID, std::uint32_t* version) {
  if (!version) {
    TVX_LOG(TVX_DBG, "Invalid Argument");
    return DIAGNOSTICS_VERSION_REFUSED;
  }
  char hbaName[TVX_HBA_NAME_LENGTH + 1] = {};
  HBA_WWN wwpn{};
  if (TVX_MethodWrapper::Id2HBAName(hbaName, deviceID) != RM_OK ||
      TVX_MethodWrapper::str2HBAName(&wwpn, hbaName) != RM_OK) {
    TVX_LOG(TVX_ERR, "TVXHBA_DiagTestFunc::Id2HBAName failed");
    return DIAGNOSTICS_VERSION_REFUSED;
  }
  const TVX_Block block = allocateAttributeBlock(HBA_ATTRIBUTES_ROOM);
  std::uint32_t size = HBA_ATTRIBUTES_ROOM;
  const RM_STATUS status =
      block ? LRM_GetHBAAttributes(wwpn, block.get(), &size) : RM_ERROR_NO_MEMORY;
  if (status != RM_OK) {
    TVX_LOG(TVX_ERR, "ERROR: GetDiagnosticVersion:RM_GetHBAAttributes call failed (%d)", status);
    return 0;
  }
  readNumberAttribute(block.get(), RM_HA_DIAG_VERSION, "DiagVersion", *version);
  return 0;
}

}  // namespace cimrt
