// Which maps a refresh empties, and in which order.
#include <algorithm>
#include <array>
#include <cstdlib>
#include <iterator>

#include "agent/Clear_Map.h"
#include "agent/ProductSteps.h"
#include "agent/ProviderAgent.h"

namespace cimrt {

namespace {

/// Host, ports and controllers.
constexpr Clear_Map CORE[] = {
    clearMap<&Agent_Maps::m_CIM_ComputerSystem_map>,
    clearMap<&Agent_Maps::m_CIM_Chassis_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCPortStatistics_map>,
    clearMap<&Agent_Maps::m_TVXHBA_LogicalPortGroup_map>,
    clearMap<&Agent_Maps::m_TVXHBA_Transceiver_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PortController_map>,
    clearMap<&Agent_Maps::m_TVXHBA_Product_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RegisteredProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RemoteServiceAccessPoint_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SCSIProtocolController_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProviderConfigSetting_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PCIDevice_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PCIElementConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SystemDevice_map>,
};

/// Dump, vital product data and tagging.
constexpr Clear_Map DUMP_AND_TAGGING[] = {
    clearMap<&Agent_Maps::m_TVXHBA_DumpService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedDumpService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DumpServiceAffectsElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DumpData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ElementDumpData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_VitalProductData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ElementVPD_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCTagService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCTagServiceAffectsPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedFCTagService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCTagElementSoftwareIdentity_map>,
};

/// The driver's log. The log itself stands beside the provider's, in maps emptied further below.
constexpr Clear_Map DRIVER_LOG[] = {
    clearMap<&Agent_Maps::m_TVXHBA_RecordLog_driver_map>,
    clearMap<&Agent_Maps::m_TVXHBA_EnabledRecordLogCapabilities_driver_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProviderUseOfLog_driver_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCDriverLogEntry_map>,
};

/// Cards and what is on them.
constexpr Clear_Map PHYSICAL[] = {
    clearMap<&Agent_Maps::m_TVXHBA_Card_map>,
    clearMap<&Agent_Maps::m_TVXHBA_Chip_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PhysicalConnector_map>,
    clearMap<&Agent_Maps::m_TVXHBA_CardContainsChip_map>,
    clearMap<&Agent_Maps::m_TVXHBA_CardContainsConnector_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ConnectorDependsOnChip_map>,
    clearMap<&Agent_Maps::m_TVXHBA_CardConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ChassisContainsCard_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PHYConnectorRealizesPortController_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProviderElementSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProductPhysicalConnector_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCRealizes_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FirmwareElementSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_InstallServiceAffectsFirmwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FRUVitalProductData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FRUElementVPD_map>,
};

/// The record logs, and the initiator endpoints.
constexpr Clear_Map RECORD_LOG[] = {
    clearMap<&Agent_Maps::m_TVXHBA_RecordLog_map>,
    clearMap<&Agent_Maps::m_TVXHBA_EnabledRecordLogCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RecordLogCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProviderUseOfLog_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RecordLogConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SCSIProtocolInitiatorEndpoint_map>,
    clearMap<&Agent_Maps::m_TVXHBA_LocalHostedInitiatorAccessPoint_map>,
};

/// The services and what they set.
constexpr Clear_Map SERVICES[] = {
    clearMap<&Agent_Maps::m_TVXHBA_SoftwareInstallationService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SoftwareInstallationServiceCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBAWWNService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_BootBIOSService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBADriverParamService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DriverParamGlobal_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DriverParams_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DriverParameterAffectsFCPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_GlobalDriverServiceElementSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DriverServiceElementSettingData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCDriverServiceAffectsDriver_map>,
};

/// The associations of the adapter side.
constexpr Clear_Map ASSOCIATIONS[] = {
    clearMap<&Agent_Maps::m_TVXHBA_ComputerSystemConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCPortConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PortControllerConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SoftwareConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ControlledBy_map>,
    clearMap<&Agent_Maps::m_TVXHBA_DeviceSAPImplementation_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ElementStatisticalData_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ElementSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCPortSystemDevice_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedCollection_map>,
    clearMap<&Agent_Maps::m_TVXHBA_InstalledSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_MemberOfCollection_map>,
    clearMap<&Agent_Maps::m_TVXHBA_PortControllerSystemDevice_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProductElementComponent_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProductPhysicalComponent_map>,
    clearMap<&Agent_Maps::m_TVXHBA_TransceiverComponent_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProtocolControllerForPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ProviderSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_ElementFlashImageSoftwareIdentity_map>,
    clearMap<&Agent_Maps::m_TVXHBA_Realizes_map>,
    clearMap<&Agent_Maps::m_TVXHBA_RemoteHostedAccessPoint_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SAPAvailableForElement_map>,
    clearMap<&Agent_Maps::m_TVXHBA_SCSIProtocolControllerSystemDevice_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FlashImageSoftwareIdentity_map>,
};

/// The associations of the services.
constexpr Clear_Map SERVICE_ASSOCIATIONS[] = {
    clearMap<&Agent_Maps::m_TVXHBA_ElementCapabilities_map>,
    clearMap<&Agent_Maps::m_TVXHBA_InstallServiceAffectsChip_map>,
    clearMap<&Agent_Maps::m_TVXHBA_InstallServiceAffectsSystem_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedInstallationService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_InstallServiceConformsToProfile_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedBootBIOSService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_BootBIOSServiceAffectsSystem_map>,
    clearMap<&Agent_Maps::m_TVXHBA_BootBIOSServiceAffectsFCPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedFCHBAWWNService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBAWWNServiceAffectsSystem_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBAWWNServiceAffectsFCPort_map>,
    clearMap<&Agent_Maps::m_TVXHBA_HostedFCHBADriverParamService_map>,
    clearMap<&Agent_Maps::m_TVXHBA_FCHBADriverParamServiceAffectsFCPort_map>,
};

/// Names a map by its member pointer.
using San_Map = Instance_Map_Base& (*)(Agent_Maps& maps);

template <auto MEMBER>
Instance_Map_Base& anyMap(Agent_Maps& maps) {
  return maps.*MEMBER;
}

/// Targets and logical units.
constexpr San_Map SAN[] = {
    anyMap<&Agent_Maps::m_TVXHBA_SCSIProtocolEndpoint_map>,
    anyMap<&Agent_Maps::m_TVXHBA_LogicalDisk_map>,
    anyMap<&Agent_Maps::m_TVXHBA_StorageVolume_map>,
    anyMap<&Agent_Maps::m_TVXHBA_TapeDrive_map>,
    anyMap<&Agent_Maps::m_TVXHBA_StorageExtent_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIArbitraryLogicalUnit_map>,
    anyMap<&Agent_Maps::m_TVXHBA_LocalHostedAccessPoint_map>,
    anyMap<&Agent_Maps::m_TVXHBA_LogicalDiskSystemDevice_map>,
    anyMap<&Agent_Maps::m_TVXHBA_StorageVolumeSystemDevice_map>,
    anyMap<&Agent_Maps::m_TVXHBA_TapeDriveSystemDevice_map>,
    anyMap<&Agent_Maps::m_TVXHBA_StorageExtentSystemDevice_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIArbitraryLogicalUnitSystemDevice_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetLogicalDiskPath_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetStorageVolumePath_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetTapeDrivePath_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetStorageExtentPath_map>,
    anyMap<&Agent_Maps::m_TVXHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map>,
};

template <std::size_t N>
void clearGroup(Agent_Maps& maps, const Clear_Map (&group)[N]) {
  for (const Clear_Map clear : group) clear(maps);
}

/// Logical units whose instances go together.
constexpr std::size_t SLICE = 256;

/// Lets the allocator join the small blocks that were freed. It puts that off until a block of
/// this size is asked for; without it the next maps would be built in the holes of these, in no
/// order, and each refresh would take longer than the one before.
void joinFreedMemory() {
  constexpr std::size_t enough = std::size_t{64} << 10;
  void* volatile block = std::malloc(enough);
  std::free(block);
}

/// Takes the instances down unit by unit, as they were built. Those of one unit stand side by side
/// and share texts: map by map, all of the memory would have to be fetched once for each map. The
/// first unit of each class is left, so that the maps themselves run empty in their order.
void clearUnits(Agent_Maps& maps) {
  std::array<std::size_t, std::size(SAN)> sizes{};
  for (std::size_t i = 0; i < std::size(SAN); i++) sizes[i] = SAN[i](maps).size();
  const std::size_t slices = *std::max_element(sizes.begin(), sizes.end()) / SLICE;
  for (std::size_t left = slices; left-- > 0;) {
    for (std::size_t i = 0; i < std::size(SAN); i++)
      SAN[i](maps).shorten(std::max<std::size_t>(sizes[i] * left / slices, 1));
    joinFreedMemory();
  }
}

}  // namespace

void ProviderAgent::clearAdapterMaps() {
  TVX_LOG(TVX_DBG, "PERF: Entered clearAdapterMaps()");
  clearGroup(*this, CORE);
  clearGroup(*this, DUMP_AND_TAGGING);
  clearGroup(*this, DRIVER_LOG);
  ClearPortVirtualizationMaps(*this);
  clearGroup(*this, PHYSICAL);
  TVX_LOG(TVX_DBG, "Clearing Record Log maps");
  clearGroup(*this, RECORD_LOG);
  TVX_LOG(TVX_DBG, "Clearing SoftwareUpdate maps");
  clearGroup(*this, SERVICES);
  clearGroup(*this, ASSOCIATIONS);
  TVX_LOG(TVX_DBG, "Clearing Software Update maps");
  clearGroup(*this, SERVICE_ASSOCIATIONS);
  TVX_LOG(TVX_DBG, "Clearing TVX CDM maps");
  clearDiagnosticClasses(*this);
  TVX_LOG(TVX_DBG, "Done with Clearing CDM maps");
  TVX_LOG(TVX_DBG, "Exiting clearAdapterMaps()");
}

void ProviderAgent::clearSANMaps() {
  TVX_LOG(TVX_DBG, "PERF: Entered clearSANMaps()");
  try {
    clearUnits(*this);
    for (const San_Map map : SAN) map(*this).clear();
    TVX_LOG(TVX_DBG, "Exiting clearSANMaps()");
  } catch (...) {
    TVX_LOG(TVX_DBG, "Error in clearSANMaps()");
  }
}

}  // namespace cimrt
