// The entry points of the management libraries, described by one table.
#pragma once

#include <cstddef>
#include <string_view>

namespace cimrt {

/// How an entry point is looked up.
enum class TVX_Family {
  RM_TWO_NAMES,   ///< `LRM_x`, in the older library also `RM_x`
  LRM_ONLY,       ///< `LRM_x` in both libraries
  RM_ONE_NAME,    ///< `RM_x` in both libraries
  BOARD_NUMBER,   ///< as RM_ONE_NAME, with a name of its own
  SNIA,           ///< `HBA_x` of the SNIA library
  CPQFC,          ///< `CPQFC_x` of the tagging library
  CPQFC_FALLBACK  ///< the one of them that knows only the fallback step
};

/// What the stub returns when the entry point is not there.
enum class TVX_Missing { ONE, ZERO, MINUS_ONE, NOTHING };

/// One row of the table.
struct TVX_Entry_Point {
  std::string_view name;  ///< first name; empty for entry points whose name is not published
  TVX_Family family;
  TVX_Missing missing;
  /// The name tried second in the older library: without the leading letter in the two-name family.
  constexpr const char* secondName() const {
    return family == TVX_Family::RM_TWO_NAMES ? name.data() + 1 : name.data();
  }
};

namespace entry_points {

// Grouped as the libraries' own interface is; the order has no other meaning.
using enum TVX_Family;
using enum TVX_Missing;

inline constexpr TVX_Entry_Point TABLE[] = {
    // Core
    {"LRM_InitLib", RM_TWO_NAMES, ONE},
    {"LRM_ExitLib", RM_TWO_NAMES, ONE},
    {"LRM_SetDebugTraces", RM_TWO_NAMES, ONE},
    {"LRM_GetServerAttributes", RM_TWO_NAMES, ONE},
    {"LRM_GetHBAAttributes", RM_TWO_NAMES, ONE},
    {"LRM_GetPortAttributes", RM_TWO_NAMES, ONE},
    {"LRM_GetPortState", RM_TWO_NAMES, ONE},
    {"LRM_GetPortStatistics", RM_TWO_NAMES, ONE},
    {"LRM_GetDriverType", RM_TWO_NAMES, ONE},
    {"LRM_GetHBAFeature", RM_TWO_NAMES, ONE},
    {"LRM_GetHBAFeatureList", RM_TWO_NAMES, ONE},
    {"LRM_SetAdapterAttribute", RM_TWO_NAMES, ONE},
    {"LRM_SetPortEnabled", RM_TWO_NAMES, ONE},
    {"LRM_SetPhyPortSpeedSettings", RM_TWO_NAMES, ONE},
    {"LRM_ResetHBA", RM_TWO_NAMES, ONE},
    {"LRM_Ping", RM_TWO_NAMES, ONE},
    {"LRM_ListProfiles", RM_TWO_NAMES, ONE},
    // Port configuration and events
    {"LRM_SetAdapterPortConfig", RM_TWO_NAMES, ONE},
    {"LRM_GetAdapterPortConfig", RM_TWO_NAMES, ONE},
    {"LRM_SetAdapterPortConfigDefaults", RM_TWO_NAMES, ONE},
    {"LRM_GetAdapterPersonalityInfo", RM_TWO_NAMES, ONE},
    {"LRM_ChangeAdapterPersonality", RM_TWO_NAMES, ONE},
    {"LRM_RegisterForAdapterPortEvents", RM_TWO_NAMES, ONE},
    {"LRM_UnRegisterForAdapterPortEvents", RM_TWO_NAMES, ONE},
    {"LRM_SetChannelMgmtPortInfo", RM_TWO_NAMES, ONE},
    {"LRM_GetChannelMgmtPortInfo", RM_TWO_NAMES, ONE},
    {"LRM_SetChannelMgmtCNAInfo", RM_TWO_NAMES, ONE},
    {"LRM_GetChannelMgmtCNAInfo", RM_TWO_NAMES, ONE},
    {"LRM_GetVirtualFunctionList", RM_TWO_NAMES, ONE},
    {"LRM_GetVirtualFunctionProperties", RM_TWO_NAMES, ONE},
    {"LRM_SetNetbootParams", RM_TWO_NAMES, ONE},
    {"LRM_SetBootBiosState", RM_TWO_NAMES, ONE},
    {"LRM_GetQoS", RM_TWO_NAMES, ONE},
    {"LRM_SetQoS", RM_TWO_NAMES, ONE},
    // Logical units and targets
    {"LRM_GetFcpTargetMapping", RM_TWO_NAMES, ONE},
    {"LRM_GetLunList", RM_TWO_NAMES, ONE},
    {"LRM_GetLunAttributes", RM_TWO_NAMES, ONE},
    {"LRM_ScsiInquiry", RM_TWO_NAMES, ONE},
    {"LRM_ScsiReadCapacity", RM_TWO_NAMES, ONE},
    {"LRM_SetOASLunState", RM_TWO_NAMES, ONE},
    {"LRM_GetOASLunList", RM_TWO_NAMES, ONE},
    // Driver parameters
    {"LRM_GetDriverParams", RM_TWO_NAMES, ONE},
    {"LRM_GetDriverParamsGlobal", RM_TWO_NAMES, ONE},
    {"LRM_SetDriverParam", RM_TWO_NAMES, ONE},
    // World wide names
    {"LRM_ChangeWWN", RM_TWO_NAMES, ONE},
    {"LRM_RestoreWWN", RM_TWO_NAMES, ONE},
    {"LRM_ReadWWN", RM_TWO_NAMES, ONE},
    {"LRM_GetWWNCapability", RM_TWO_NAMES, ONE},
    // Firmware, vital product data
    {"LRM_DownloadFirmware", RM_TWO_NAMES, ONE},
    {"LRM_GetVPD", RM_TWO_NAMES, ONE},
    {"LRM_GetVPDV2", RM_TWO_NAMES, ONE},
    {"LRM_GetSffData", RM_TWO_NAMES, ONE},
    // Virtual ports
    {"LRM_VPCreate", RM_TWO_NAMES, ONE},
    {"LRM_VPAutoGenCreate", RM_TWO_NAMES, ONE},
    {"LRM_VPDelete", RM_TWO_NAMES, ONE},
    {"LRM_VPList", RM_TWO_NAMES, ONE},
    {"LRM_VPListTargets", RM_TWO_NAMES, ONE},
    {"LRM_VPGetAttributes", RM_TWO_NAMES, ONE},
    {"LRM_ListVM", RM_TWO_NAMES, ONE},
    {"LRM_GetVMInfo", RM_TWO_NAMES, ONE},
    {"LRM_GetVMFromVPort", RM_TWO_NAMES, ONE},
    // Dump
    {"LRM_GenerateDump", RM_TWO_NAMES, ONE},
    {"LRM_GenerateCoreDump", RM_TWO_NAMES, ONE},
    {"LRM_GenerateEfdDump", RM_TWO_NAMES, ONE},
    {"LRM_GetDumpDirectoryA", RM_TWO_NAMES, ONE},
    {"LRM_SetDumpDirectory", RM_TWO_NAMES, ONE},
    {"LRM_GetDumpFileNames", RM_TWO_NAMES, ONE},
    {"LRM_DeleteDumpFiles", RM_TWO_NAMES, ONE},
    {"LRM_GetDumpRetentionCount", RM_TWO_NAMES, ONE},
    {"LRM_SetDumpRetentionCount", RM_TWO_NAMES, ONE},
    {"LRM_RetrieveFATDump", RM_TWO_NAMES, ONE},
    {"LRM_RetrieveFATDump2", RM_TWO_NAMES, ONE},
    {"LRM_Get_BE_EventLogConfigDataAll", RM_TWO_NAMES, ONE},
    {"LRM_Set_BE_EventLogConfigDataModule", RM_TWO_NAMES, ONE},
    {"LRM_Set_BE_EventLogTraceLevel", RM_TWO_NAMES, ONE},
    {"LRM_Set_BE_DefaultLoggingConfig", RM_TWO_NAMES, ONE},
    // Diagnostics
    {"LRM_DiagBeacon", RM_TWO_NAMES, ONE},
    {"LRM_DiagBeaconState", RM_TWO_NAMES, ONE},
    {"LRM_DiagCancelDiagnostic", RM_TWO_NAMES, ONE},
    {"LRM_DiagEchoTest", RM_TWO_NAMES, ONE},
    {"LRM_DiagEchoTestV2", RM_TWO_NAMES, ONE},
    {"LRM_DiagGetLoadListParams", RM_TWO_NAMES, ONE},
    {"LRM_DiagGetResults", RM_TWO_NAMES, ONE},
    {"LRM_DiagGetWakeupParams", RM_TWO_NAMES, ONE},
    {"LRM_DiagLoopBackTest", RM_TWO_NAMES, ONE},
    {"LRM_DiagLoopBackTestV2", RM_TWO_NAMES, ONE},
    {"LRM_DiagLoopBackTestV3", RM_TWO_NAMES, ONE},
    {"LRM_DiagMDIOSelfTest", RM_TWO_NAMES, ONE},
    {"LRM_DiagPciLoopBackTest", RM_TWO_NAMES, ONE},
    {"LRM_DiagPciLoopBackTestV2", RM_TWO_NAMES, ONE},
    {"LRM_DiagReadPCIRegistersV2", RM_TWO_NAMES, ONE},
    {"LRM_DiagRunPOST", RM_TWO_NAMES, ONE},
    {"LRM_DiagRunTDR", RM_TWO_NAMES, ONE},
    {"LRM_DiagSetNVP", RM_TWO_NAMES, ONE},
    // Converged adapters
    {"LRM_CNA_GetCEE_Params", RM_TWO_NAMES, ONE},
    {"LRM_CNA_GetPGPriorityBitmaps", RM_TWO_NAMES, ONE},
    {"LRM_CNA_GetTLV", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetDcbxPortVars", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetLldp", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetPFC", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetPGBandwidth", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetPGPriorityBitmaps", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetPGPriorityBitmapsExt", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetPGSetting", RM_TWO_NAMES, ONE},
    {"LRM_CNA_SetTLV", RM_TWO_NAMES, ONE},
    {"LRM_CNA_FCOE_GetFCFConnectList", RM_TWO_NAMES, ZERO},
    {"LRM_CNA_FCOE_GetFIPParams", RM_TWO_NAMES, ZERO},
    {"LRM_CNA_FCOE_GetFcfList", RM_TWO_NAMES, ONE},
    {"LRM_CNA_FCOE_SetFCFConnectList", RM_TWO_NAMES, ZERO},
    {"LRM_CNA_FCOE_SetFIPParams", RM_TWO_NAMES, ZERO},
    // iSCSI and initiator network
    {"LRM_iSCSI_AddBootTarget", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_AddSendTargetPortal", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_AddTarget", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_AddiSNSServer", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetInitiatorProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetLunProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetLuns", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetPortStatistics", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetSendTargetPortalProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetSessionInfo", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetSessions", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetTargetLoginAuthProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetTargets", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_GetiSNSServers", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_RemoveSendTargetPortal", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_RemoveTarget", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_RemoveiSNSServer", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetBootSession", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetInitiatorProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetSendTargetPortalProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetTargetLoginAuthProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetTargetProperties", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_SetiSNSState", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_TargetLogin", RM_TWO_NAMES, ONE},
    {"LRM_iSCSI_TargetLogout", RM_TWO_NAMES, ONE},
    {"LRM_Ini_GetNetworkProperties", RM_TWO_NAMES, ONE},
    {"LRM_Ini_SetNetworkProperties", RM_TWO_NAMES, ONE},
    // Route and ARP tables, longer name only
    {"LRM_Ini_AddARPTableEntry", LRM_ONLY, ONE},
    {"LRM_Ini_AddRouteTableEntry", LRM_ONLY, ONE},
    {"LRM_Ini_DeleteARPTableEntry", LRM_ONLY, ONE},
    {"LRM_Ini_DeleteRouteTableEntry", LRM_ONLY, ONE},
    {"LRM_Ini_GetARPTable", LRM_ONLY, ONE},
    {"LRM_Ini_GetRouteTable", LRM_ONLY, ONE},
    // Shorter name only
    {"RM_GetAdapterType", RM_ONE_NAME, ONE},
    {"RM_GetAllLocalHBAInstances", RM_ONE_NAME, ONE},
    {"RM_GetAttributeValue", RM_ONE_NAME, ZERO},
    {"RM_GetLocalHBAInfo", RM_ONE_NAME, ONE},
    {"RM_GetLocalHBAInfoV3", RM_ONE_NAME, ONE},
    {"RM_GetLocalHBAInfoV4", RM_ONE_NAME, ONE},
    {"RM_GetNextVpdEntry", RM_ONE_NAME, ZERO},
    {"RM_GetNumberOfLocalAdapters", RM_ONE_NAME, ZERO},
    {"RM_GetVersion", RM_ONE_NAME, ONE},
    {"RM_ImportHBAFileA", RM_ONE_NAME, ONE},
    {"RM_IsLocalHBA", RM_ONE_NAME, ONE},
    {"RM_ListDeadNicPorts", RM_ONE_NAME, ONE},
    {"RM_MiliVersion", RM_ONE_NAME, ONE},
    {"RM_StatusString", RM_ONE_NAME, ONE},
    {"RM_ValidateWwn", RM_ONE_NAME, ONE},
    {"RM_VerifyFirmwareA", RM_ONE_NAME, ONE},
    // SNIA
    {"HBA_CloseAdapter", SNIA, NOTHING},
    {"HBA_GetAdapterAttributes", SNIA, ONE},
    {"HBA_GetAdapterName", SNIA, ONE},
    {"HBA_GetAdapterPortAttributes", SNIA, ONE},
    {"HBA_GetFcpTargetMapping", SNIA, ONE},
    {"HBA_GetNumberOfAdapters", SNIA, ZERO},
    {"HBA_LoadLibrary", SNIA, ONE},
    {"HBA_OpenAdapter", SNIA, ONE},
    {"HBA_RefreshInformation", SNIA, NOTHING},
    {"HBA_RegisterForAdapterPortEvents", SNIA, ONE},
    {"HBA_RemoveCallback", SNIA, ONE},
    {"HBA_SendReadCapacity", SNIA, ONE},
    {"HBA_SendScsiInquiry", SNIA, ONE},
    // Frame tagging
    {"CPQFC_LoadLibrary", CPQFC, ONE},
    {"CPQFC_FreeLibrary", CPQFC, ONE},
    {"CPQFC_GetNumberOfAdapters", CPQFC, ONE},
    {"CPQFC_OpenAdapter", CPQFC, ONE},
    {"CPQFC_CloseAdapter", CPQFC_FALLBACK, NOTHING},
    {"CPQFC_QoSGetConfig", CPQFC, ONE},
    {"CPQFC_QoSSetConfig", CPQFC, ONE},
    {"CPQFC_QoSGetGlobalFlag", CPQFC, ONE},
    {"CPQFC_QoSSetGlobalFlag", CPQFC, ONE},
    // Board number
    {"TvxGetBoardNumber", BOARD_NUMBER, MINUS_ONE},
    // Adapter licences and features on demand. The names are not published and nothing calls them:
    // the rows keep the table whole, and no stub can be made from them.
    {"", RM_TWO_NAMES, ONE},
    {"", RM_TWO_NAMES, ONE},
    {"", RM_TWO_NAMES, ONE},
    {"", RM_TWO_NAMES, ONE},
    {"", RM_TWO_NAMES, ONE},
    {"", RM_ONE_NAME, ONE},
};

inline constexpr std::size_t COUNT = sizeof(TABLE) / sizeof(TABLE[0]);

/// Index of a named row; `COUNT` if there is none.
constexpr std::size_t find(std::string_view name) {
  for (std::size_t i = 0; i < COUNT; ++i) {
    if (!name.empty() && TABLE[i].name == name) return i;
  }
  return COUNT;
}

}  // namespace entry_points

}  // namespace cimrt
