// The stubs: one object for each entry point whose signature is known. The signature is that of the
// library's own prototype. Included by TVX_Runtime_Loader.h alone.
#pragma once

#include "access/TVX_Runtime_Loader.h"

namespace cimrt {

inline constexpr TVX_Stub<"LRM_InitLib", decltype(::LRM_InitLib)> LRM_InitLib{};
inline constexpr TVX_Stub<"LRM_ExitLib", decltype(::LRM_ExitLib)> LRM_ExitLib{};
inline constexpr TVX_Stub<"LRM_SetDebugTraces", decltype(::LRM_SetDebugTraces)>
    LRM_SetDebugTraces{};
inline constexpr TVX_Stub<"LRM_GetServerAttributes", decltype(::LRM_GetServerAttributes)>
    LRM_GetServerAttributes{};
inline constexpr TVX_Stub<"LRM_GetHBAAttributes", decltype(::LRM_GetHBAAttributes)>
    LRM_GetHBAAttributes{};
inline constexpr TVX_Stub<"LRM_GetPortAttributes", decltype(::LRM_GetPortAttributes)>
    LRM_GetPortAttributes{};
inline constexpr TVX_Stub<"LRM_GetPortStatistics", decltype(::LRM_GetPortStatistics)>
    LRM_GetPortStatistics{};
inline constexpr TVX_Stub<"LRM_GetDriverType", decltype(::LRM_GetDriverType)> LRM_GetDriverType{};
inline constexpr TVX_Stub<"LRM_GetHBAFeature", decltype(::LRM_GetHBAFeature)> LRM_GetHBAFeature{};
inline constexpr TVX_Stub<"LRM_GetHBAFeatureList", decltype(::LRM_GetHBAFeatureList)>
    LRM_GetHBAFeatureList{};
inline constexpr TVX_Stub<"LRM_SetAdapterAttribute", decltype(::LRM_SetAdapterAttribute)>
    LRM_SetAdapterAttribute{};
inline constexpr TVX_Stub<"LRM_SetPortEnabled", decltype(::LRM_SetPortEnabled)>
    LRM_SetPortEnabled{};
inline constexpr TVX_Stub<"LRM_ResetHBA", decltype(::LRM_ResetHBA)> LRM_ResetHBA{};
inline constexpr TVX_Stub<"LRM_SetBootBiosState", decltype(::LRM_SetBootBiosState)>
    LRM_SetBootBiosState{};
inline constexpr TVX_Stub<"LRM_GetQoS", decltype(::LRM_GetQoS)> LRM_GetQoS{};
inline constexpr TVX_Stub<"LRM_GetFcpTargetMapping", decltype(::LRM_GetFcpTargetMapping)>
    LRM_GetFcpTargetMapping{};
inline constexpr TVX_Stub<"LRM_GetLunList", decltype(::LRM_GetLunList)> LRM_GetLunList{};
inline constexpr TVX_Stub<"LRM_GetLunAttributes", decltype(::LRM_GetLunAttributes)>
    LRM_GetLunAttributes{};
inline constexpr TVX_Stub<"LRM_ScsiInquiry", decltype(::LRM_ScsiInquiry)> LRM_ScsiInquiry{};
inline constexpr TVX_Stub<"LRM_ScsiReadCapacity", decltype(::LRM_ScsiReadCapacity)>
    LRM_ScsiReadCapacity{};
inline constexpr TVX_Stub<"LRM_SetOASLunState", decltype(::LRM_SetOASLunState)>
    LRM_SetOASLunState{};
inline constexpr TVX_Stub<"LRM_GetOASLunList", decltype(::LRM_GetOASLunList)> LRM_GetOASLunList{};
inline constexpr TVX_Stub<"LRM_GetDriverParams", decltype(::LRM_GetDriverParams)>
    LRM_GetDriverParams{};
inline constexpr TVX_Stub<"LRM_GetDriverParamsGlobal", decltype(::LRM_GetDriverParamsGlobal)>
    LRM_GetDriverParamsGlobal{};
inline constexpr TVX_Stub<"LRM_SetDriverParam", decltype(::LRM_SetDriverParam)>
    LRM_SetDriverParam{};
inline constexpr TVX_Stub<"LRM_ChangeWWN", decltype(::LRM_ChangeWWN)> LRM_ChangeWWN{};
inline constexpr TVX_Stub<"LRM_RestoreWWN", decltype(::LRM_RestoreWWN)> LRM_RestoreWWN{};
inline constexpr TVX_Stub<"LRM_ReadWWN", decltype(::LRM_ReadWWN)> LRM_ReadWWN{};
inline constexpr TVX_Stub<"LRM_GetWWNCapability", decltype(::LRM_GetWWNCapability)>
    LRM_GetWWNCapability{};
inline constexpr TVX_Stub<"LRM_DownloadFirmware", decltype(::LRM_DownloadFirmware)>
    LRM_DownloadFirmware{};
inline constexpr TVX_Stub<"LRM_GetVPD", decltype(::LRM_GetVPD)> LRM_GetVPD{};
inline constexpr TVX_Stub<"LRM_GetVPDV2", decltype(::LRM_GetVPDV2)> LRM_GetVPDV2{};
inline constexpr TVX_Stub<"LRM_GetSffData", decltype(::LRM_GetSffData)> LRM_GetSffData{};
inline constexpr TVX_Stub<"LRM_VPList", decltype(::LRM_VPList)> LRM_VPList{};
inline constexpr TVX_Stub<"LRM_VPGetAttributes", decltype(::LRM_VPGetAttributes)>
    LRM_VPGetAttributes{};
inline constexpr TVX_Stub<"LRM_GenerateDump", decltype(::LRM_GenerateDump)> LRM_GenerateDump{};
inline constexpr TVX_Stub<"LRM_GenerateEfdDump", decltype(::LRM_GenerateEfdDump)>
    LRM_GenerateEfdDump{};
inline constexpr TVX_Stub<"LRM_GenerateCoreDump", decltype(::LRM_GenerateCoreDump)>
    LRM_GenerateCoreDump{};
inline constexpr TVX_Stub<"LRM_GetDumpDirectoryA", decltype(::LRM_GetDumpDirectoryA)>
    LRM_GetDumpDirectoryA{};
inline constexpr TVX_Stub<"LRM_SetDumpDirectory", decltype(::LRM_SetDumpDirectory)>
    LRM_SetDumpDirectory{};
inline constexpr TVX_Stub<"LRM_GetDumpFileNames", decltype(::LRM_GetDumpFileNames)>
    LRM_GetDumpFileNames{};
inline constexpr TVX_Stub<"LRM_DeleteDumpFiles", decltype(::LRM_DeleteDumpFiles)>
    LRM_DeleteDumpFiles{};
inline constexpr TVX_Stub<"LRM_GetDumpRetentionCount", decltype(::LRM_GetDumpRetentionCount)>
    LRM_GetDumpRetentionCount{};
inline constexpr TVX_Stub<"LRM_SetDumpRetentionCount", decltype(::LRM_SetDumpRetentionCount)>
    LRM_SetDumpRetentionCount{};
inline constexpr TVX_Stub<"LRM_RetrieveFATDump", decltype(::LRM_RetrieveFATDump)>
    LRM_RetrieveFATDump{};
inline constexpr TVX_Stub<"LRM_RetrieveFATDump2", decltype(::LRM_RetrieveFATDump2)>
    LRM_RetrieveFATDump2{};
inline constexpr TVX_Stub<"LRM_Get_BE_EventLogConfigDataAll",
                          decltype(::LRM_Get_BE_EventLogConfigDataAll)>
    LRM_Get_BE_EventLogConfigDataAll{};
inline constexpr TVX_Stub<"LRM_Set_BE_EventLogConfigDataModule",
                          decltype(::LRM_Set_BE_EventLogConfigDataModule)>
    LRM_Set_BE_EventLogConfigDataModule{};
inline constexpr TVX_Stub<"LRM_Set_BE_EventLogTraceLevel",
                          decltype(::LRM_Set_BE_EventLogTraceLevel)>
    LRM_Set_BE_EventLogTraceLevel{};
inline constexpr TVX_Stub<"LRM_Set_BE_DefaultLoggingConfig",
                          decltype(::LRM_Set_BE_DefaultLoggingConfig)>
    LRM_Set_BE_DefaultLoggingConfig{};
inline constexpr TVX_Stub<"LRM_DiagBeacon", decltype(::LRM_DiagBeacon)> LRM_DiagBeacon{};
inline constexpr TVX_Stub<"LRM_DiagBeaconState", decltype(::LRM_DiagBeaconState)>
    LRM_DiagBeaconState{};
inline constexpr TVX_Stub<"LRM_DiagCancelDiagnostic", decltype(::LRM_DiagCancelDiagnostic)>
    LRM_DiagCancelDiagnostic{};
inline constexpr TVX_Stub<"LRM_DiagGetResults", decltype(::LRM_DiagGetResults)>
    LRM_DiagGetResults{};
inline constexpr TVX_Stub<"LRM_DiagRunPOST", decltype(::LRM_DiagRunPOST)> LRM_DiagRunPOST{};
inline constexpr TVX_Stub<"LRM_DiagEchoTestV2", decltype(::LRM_DiagEchoTestV2)>
    LRM_DiagEchoTestV2{};
inline constexpr TVX_Stub<"LRM_DiagLoopBackTestV3", decltype(::LRM_DiagLoopBackTestV3)>
    LRM_DiagLoopBackTestV3{};
inline constexpr TVX_Stub<"LRM_DiagPciLoopBackTestV2", decltype(::LRM_DiagPciLoopBackTestV2)>
    LRM_DiagPciLoopBackTestV2{};
inline constexpr TVX_Stub<"LRM_DiagGetLoadListParams", decltype(::LRM_DiagGetLoadListParams)>
    LRM_DiagGetLoadListParams{};
inline constexpr TVX_Stub<"LRM_DiagReadPCIRegistersV2", decltype(::LRM_DiagReadPCIRegistersV2)>
    LRM_DiagReadPCIRegistersV2{};
inline constexpr TVX_Stub<"RM_GetAttributeValue", decltype(::RM_GetAttributeValue)>
    RM_GetAttributeValue{};
inline constexpr TVX_Stub<"RM_GetNumberOfLocalAdapters", decltype(::RM_GetNumberOfLocalAdapters)>
    RM_GetNumberOfLocalAdapters{};
inline constexpr TVX_Stub<"RM_GetLocalHBAInfo", decltype(::RM_GetLocalHBAInfo)>
    RM_GetLocalHBAInfo{};
inline constexpr TVX_Stub<"RM_GetNextVpdEntry", decltype(::RM_GetNextVpdEntry)>
    RM_GetNextVpdEntry{};
inline constexpr TVX_Stub<"RM_GetVersion", decltype(::RM_GetVersion)> RM_GetVersion{};
inline constexpr TVX_Stub<"RM_MiliVersion", decltype(::RM_MiliVersion)> RM_MiliVersion{};
inline constexpr TVX_Stub<"RM_StatusString", decltype(::RM_StatusString)> RM_StatusString{};
inline constexpr TVX_Stub<"RM_IsLocalHBA", decltype(::RM_IsLocalHBA)> RM_IsLocalHBA{};
inline constexpr TVX_Stub<"RM_ValidateWwn", decltype(::RM_ValidateWwn)> RM_ValidateWwn{};
inline constexpr TVX_Stub<"RM_ImportHBAFileA", decltype(::RM_ImportHBAFileA)> RM_ImportHBAFileA{};
inline constexpr TVX_Stub<"RM_VerifyFirmwareA", decltype(::RM_VerifyFirmwareA)>
    RM_VerifyFirmwareA{};
inline constexpr TVX_Stub<"CPQFC_GetNumberOfAdapters", decltype(::CPQFC_GetNumberOfAdapters)>
    CPQFC_GetNumberOfAdapters{};
inline constexpr TVX_Stub<"CPQFC_OpenAdapter", decltype(::CPQFC_OpenAdapter)> CPQFC_OpenAdapter{};
inline constexpr TVX_Stub<"CPQFC_CloseAdapter", decltype(::CPQFC_CloseAdapter)>
    CPQFC_CloseAdapter{};
inline constexpr TVX_Stub<"CPQFC_LoadLibrary", decltype(::CPQFC_LoadLibrary)> CPQFC_LoadLibrary{};
inline constexpr TVX_Stub<"CPQFC_FreeLibrary", decltype(::CPQFC_FreeLibrary)> CPQFC_FreeLibrary{};
inline constexpr TVX_Stub<"CPQFC_QoSGetGlobalFlag", decltype(::CPQFC_QoSGetGlobalFlag)>
    CPQFC_QoSGetGlobalFlag{};
inline constexpr TVX_Stub<"CPQFC_QoSSetGlobalFlag", decltype(::CPQFC_QoSSetGlobalFlag)>
    CPQFC_QoSSetGlobalFlag{};
inline constexpr TVX_Stub<"CPQFC_QoSGetConfig", decltype(::CPQFC_QoSGetConfig)>
    CPQFC_QoSGetConfig{};
inline constexpr TVX_Stub<"CPQFC_QoSSetConfig", decltype(::CPQFC_QoSSetConfig)>
    CPQFC_QoSSetConfig{};
inline constexpr TVX_Stub<"HBA_LoadLibrary", decltype(::HBA_LoadLibrary)> HBA_LoadLibrary{};
inline constexpr TVX_Stub<"HBA_GetNumberOfAdapters", decltype(::HBA_GetNumberOfAdapters)>
    HBA_GetNumberOfAdapters{};
inline constexpr TVX_Stub<"HBA_GetAdapterName", decltype(::HBA_GetAdapterName)>
    HBA_GetAdapterName{};
inline constexpr TVX_Stub<"HBA_OpenAdapter", decltype(::HBA_OpenAdapter)> HBA_OpenAdapter{};
inline constexpr TVX_Stub<"HBA_CloseAdapter", decltype(::HBA_CloseAdapter)> HBA_CloseAdapter{};
inline constexpr TVX_Stub<"HBA_GetAdapterAttributes", decltype(::HBA_GetAdapterAttributes)>
    HBA_GetAdapterAttributes{};
inline constexpr TVX_Stub<"HBA_GetAdapterPortAttributes", decltype(::HBA_GetAdapterPortAttributes)>
    HBA_GetAdapterPortAttributes{};
inline constexpr TVX_Stub<"HBA_RefreshInformation", decltype(::HBA_RefreshInformation)>
    HBA_RefreshInformation{};
inline constexpr TVX_Stub<"HBA_GetFcpTargetMapping", decltype(::HBA_GetFcpTargetMapping)>
    HBA_GetFcpTargetMapping{};
inline constexpr TVX_Stub<"HBA_SendScsiInquiry", decltype(::HBA_SendScsiInquiry)>
    HBA_SendScsiInquiry{};
inline constexpr TVX_Stub<"HBA_SendReadCapacity", decltype(::HBA_SendReadCapacity)>
    HBA_SendReadCapacity{};
inline constexpr TVX_Stub<"HBA_RegisterForAdapterPortEvents",
                          decltype(::HBA_RegisterForAdapterPortEvents)>
    HBA_RegisterForAdapterPortEvents{};
inline constexpr TVX_Stub<"HBA_RemoveCallback", decltype(::HBA_RemoveCallback)>
    HBA_RemoveCallback{};

}  // namespace cimrt
