// Every entry point of the libraries that are opened at run time: the one table that bindings and tests read.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace cimple
{

/// How the name of an entry point is looked up; libraries in device/Loader.h.
enum class Family : std::uint8_t
{
    rmDual,      ///< LRM_ name in the local RM library; LRM_ then RM_ name in the fallback library
    lrmOnly,     ///< LRM_ name in both
    rmOnly,      ///< RM_ name in both
    hbaApi,      ///< in the HBA API library, or as `vendorClose` if that is missing
    vendorQos,   ///< in the global scope of the process
    vendorClose, ///< in the fallback RM library, or in the global scope beside the local one
};

/// What a call returns while its entry point is absent.
enum Absent : std::int8_t
{
    absentError = 1, ///< generic failure
    absentZero = 0,  ///< nothing there: a count of 0, a null pointer
    absentMinusOne = -1,
    absentNothing = 127, ///< the function returns nothing
};

struct EntryPoint
{
    const char* name;
    Family family;
    Absent absent = absentError;
};

inline constexpr auto entryPoints = std::to_array<EntryPoint>({
    {"LRM_CNA_FCOE_GetFCFConnectList", Family::rmDual, absentZero},
    {"LRM_CNA_FCOE_GetFIPParams", Family::rmDual, absentZero},
    {"LRM_CNA_FCOE_GetFcfList", Family::rmDual},
    {"LRM_CNA_FCOE_SetFCFConnectList", Family::rmDual, absentZero},
    {"LRM_CNA_FCOE_SetFIPParams", Family::rmDual, absentZero},
    {"LRM_CNA_GetCEE_Params", Family::rmDual},
    {"LRM_CNA_GetPGPriorityBitmaps", Family::rmDual},
    {"LRM_CNA_GetTLV", Family::rmDual},
    {"LRM_CNA_SetDcbxPortVars", Family::rmDual},
    {"LRM_CNA_SetLldp", Family::rmDual},
    {"LRM_CNA_SetPFC", Family::rmDual},
    {"LRM_CNA_SetPGBandwidth", Family::rmDual},
    {"LRM_CNA_SetPGPriorityBitmaps", Family::rmDual},
    {"LRM_CNA_SetPGPriorityBitmapsExt", Family::rmDual},
    {"LRM_CNA_SetPGSetting", Family::rmDual},
    {"LRM_CNA_SetTLV", Family::rmDual},
    {"LRM_ChangeAdapterPersonality", Family::rmDual},
    {"LRM_ChangeWWN", Family::rmDual},
    {"LRM_DeleteDumpFiles", Family::rmDual},
    {"LRM_DiagBeacon", Family::rmDual},
    {"LRM_DiagBeaconState", Family::rmDual},
    {"LRM_DiagCancelDiagnostic", Family::rmDual},
    {"LRM_DiagDPortTest", Family::rmDual},
    {"LRM_DiagEchoTest", Family::rmDual},
    {"LRM_DiagEchoTestV2", Family::rmDual},
    {"LRM_DiagGetLoadListParams", Family::rmDual},
    {"LRM_DiagGetResults", Family::rmDual},
    {"LRM_DiagGetResultsDPort", Family::rmDual},
    {"LRM_DiagGetWakeupParams", Family::rmDual},
    {"LRM_DiagLoopBackTest", Family::rmDual},
    {"LRM_DiagLoopBackTestV2", Family::rmDual},
    {"LRM_DiagLoopBackTestV3", Family::rmDual},
    {"LRM_DiagMDIOSelfTest", Family::rmDual},
    {"LRM_DiagPciLoopBackTest", Family::rmDual},
    {"LRM_DiagPciLoopBackTestV2", Family::rmDual},
    {"LRM_DiagReadPCIRegistersV2", Family::rmDual},
    {"LRM_DiagRunPOST", Family::rmDual},
    {"LRM_DiagRunTDR", Family::rmDual},
    {"LRM_DiagSetNVP", Family::rmDual},
    {"LRM_DownloadFirmware", Family::rmDual},
    {"LRM_ExitLib", Family::rmDual},
    {"LRM_GenerateCoreDump", Family::rmDual},
    {"LRM_GenerateDump", Family::rmDual},
    {"LRM_GenerateEfdDump", Family::rmDual},
    {"LRM_GetAdapterPersonalityInfo", Family::rmDual},
    {"LRM_GetAdapterPortConfig", Family::rmDual},
    {"LRM_GetChannelMgmtCNAInfo", Family::rmDual},
    {"LRM_GetChannelMgmtPortInfo", Family::rmDual},
    {"LRM_GetDriverParams", Family::rmDual},
    {"LRM_GetDriverParamsGlobal", Family::rmDual},
    {"LRM_GetDriverType", Family::rmDual},
    {"LRM_GetDumpDirectoryA", Family::rmDual},
    {"LRM_GetDumpFileNames", Family::rmDual},
    {"LRM_GetDumpRetentionCount", Family::rmDual},
    {"LRM_GetFcpTargetMapping", Family::rmDual},
    {"LRM_GetHBAAttributes", Family::rmDual},
    {"LRM_GetHBAFeature", Family::rmDual},
    {"LRM_GetHBAFeatureList", Family::rmDual},
    {"LRM_GetLunAttributes", Family::rmDual},
    {"LRM_GetLunList", Family::rmDual},
    {"LRM_GetOASLunList", Family::rmDual},
    {"LRM_GetPortAttributes", Family::rmDual},
    {"LRM_GetPortState", Family::rmDual},
    {"LRM_GetPortStatistics", Family::rmDual},
    {"LRM_GetQoS", Family::rmDual},
    {"LRM_GetServerAttributes", Family::rmDual},
    {"LRM_GetSffData", Family::rmDual},
    {"LRM_GetVMFromVPort", Family::rmDual},
    {"LRM_GetVMInfo", Family::rmDual},
    {"LRM_GetVPD", Family::rmDual},
    {"LRM_GetVPDV2", Family::rmDual},
    {"LRM_GetVirtualFunctionList", Family::rmDual},
    {"LRM_GetVirtualFunctionProperties", Family::rmDual},
    {"LRM_GetWWNCapability", Family::rmDual},
    {"LRM_Get_BE_EventLogConfigDataAll", Family::rmDual},
    {"LRM_Ini_GetNetworkProperties", Family::rmDual},
    {"LRM_Ini_SetNetworkProperties", Family::rmDual},
    {"LRM_InitLib", Family::rmDual},
    {"LRM_ListProfiles", Family::rmDual},
    {"LRM_ListVM", Family::rmDual},
    {"LRM_Ping", Family::rmDual},
    {"LRM_ReadWWN", Family::rmDual},
    {"LRM_RegisterForAdapterPortEvents", Family::rmDual},
    {"LRM_ResetHBA", Family::rmDual},
    {"LRM_RestoreWWN", Family::rmDual},
    {"LRM_RetrieveFATDump", Family::rmDual},
    {"LRM_RetrieveFATDump2", Family::rmDual},
    {"LRM_ScsiInquiry", Family::rmDual},
    {"LRM_ScsiReadCapacity", Family::rmDual},
    {"LRM_SetAdapterAttribute", Family::rmDual},
    {"LRM_SetAdapterPortConfig", Family::rmDual},
    {"LRM_SetAdapterPortConfigDefaults", Family::rmDual},
    {"LRM_SetAriFuncs", Family::rmDual},
    {"LRM_SetBootBiosState", Family::rmDual},
    {"LRM_SetChannelMgmtCNAInfo", Family::rmDual},
    {"LRM_SetChannelMgmtPortInfo", Family::rmDual},
    {"LRM_SetDebugTraces", Family::rmDual},
    {"LRM_SetDriverParam", Family::rmDual},
    {"LRM_SetDumpDirectory", Family::rmDual},
    {"LRM_SetDumpRetentionCount", Family::rmDual},
    {"LRM_SetNetbootParams", Family::rmDual},
    {"LRM_SetOASLunState", Family::rmDual},
    {"LRM_SetPhyPortSpeedSettings", Family::rmDual},
    {"LRM_SetPortEnabled", Family::rmDual},
    {"LRM_SetQoS", Family::rmDual},
    {"LRM_Set_BE_DefaultLoggingConfig", Family::rmDual},
    {"LRM_Set_BE_EventLogConfigDataModule", Family::rmDual},
    {"LRM_Set_BE_EventLogTraceLevel", Family::rmDual},
    {"LRM_UnRegisterForAdapterPortEvents", Family::rmDual},
    {"LRM_VPAutoGenCreate", Family::rmDual},
    {"LRM_VPCreate", Family::rmDual},
    {"LRM_VPDelete", Family::rmDual},
    {"LRM_VPGetAttributes", Family::rmDual},
    {"LRM_VPList", Family::rmDual},
    {"LRM_VPListTargets", Family::rmDual},
    {"LRM_VpScsiInquiry", Family::rmDual},
    {"LRM_VpScsiReadCapacity", Family::rmDual},
    {"LRM_VpScsiReportLUNs", Family::rmDual},
    {"LRM_iSCSI_AddBootTarget", Family::rmDual},
    {"LRM_iSCSI_AddSendTargetPortal", Family::rmDual},
    {"LRM_iSCSI_AddTarget", Family::rmDual},
    {"LRM_iSCSI_AddiSNSServer", Family::rmDual},
    {"LRM_iSCSI_GetInitiatorProperties", Family::rmDual},
    {"LRM_iSCSI_GetLunProperties", Family::rmDual},
    {"LRM_iSCSI_GetLuns", Family::rmDual},
    {"LRM_iSCSI_GetPortStatistics", Family::rmDual},
    {"LRM_iSCSI_GetSendTargetPortalProperties", Family::rmDual},
    {"LRM_iSCSI_GetSessionInfo", Family::rmDual},
    {"LRM_iSCSI_GetSessions", Family::rmDual},
    {"LRM_iSCSI_GetTargetLoginAuthProperties", Family::rmDual},
    {"LRM_iSCSI_GetTargets", Family::rmDual},
    {"LRM_iSCSI_GetiSNSServers", Family::rmDual},
    {"LRM_iSCSI_RemoveSendTargetPortal", Family::rmDual},
    {"LRM_iSCSI_RemoveTarget", Family::rmDual},
    {"LRM_iSCSI_RemoveiSNSServer", Family::rmDual},
    {"LRM_iSCSI_SetBootSession", Family::rmDual},
    {"LRM_iSCSI_SetInitiatorProperties", Family::rmDual},
    {"LRM_iSCSI_SetSendTargetPortalProperties", Family::rmDual},
    {"LRM_iSCSI_SetTargetLoginAuthProperties", Family::rmDual},
    {"LRM_iSCSI_SetTargetProperties", Family::rmDual},
    {"LRM_iSCSI_SetiSNSState", Family::rmDual},
    {"LRM_iSCSI_TargetLogin", Family::rmDual},
    {"LRM_iSCSI_TargetLogout", Family::rmDual},
    {"LRM_Ini_AddARPTableEntry", Family::lrmOnly},
    {"LRM_Ini_AddRouteTableEntry", Family::lrmOnly},
    {"LRM_Ini_DeleteARPTableEntry", Family::lrmOnly},
    {"LRM_Ini_DeleteRouteTableEntry", Family::lrmOnly},
    {"LRM_Ini_GetARPTable", Family::lrmOnly},
    {"LRM_Ini_GetRouteTable", Family::lrmOnly},
    {"RM_GetAdapterType", Family::rmOnly},
    {"RM_GetAllLocalHBAInstances", Family::rmOnly},
    {"RM_GetAttributeValue", Family::rmOnly, absentZero},
    {"RM_GetLocalHBAInfo", Family::rmOnly},
    {"RM_GetLocalHBAInfoV3", Family::rmOnly},
    {"RM_GetLocalHBAInfoV4", Family::rmOnly},
    {"RM_GetNextVpdEntry", Family::rmOnly, absentZero},
    {"RM_GetNumberOfLocalAdapters", Family::rmOnly, absentZero},
    {"RM_GetVersion", Family::rmOnly},
    {"RM_ImportHBAFileA", Family::rmOnly},
    {"RM_IsLocalHBA", Family::rmOnly},
    {"RM_ListDeadNicPorts", Family::rmOnly},
    {"RM_MiliVersion", Family::rmOnly},
    {"RM_StatusString", Family::rmOnly},
    {"RM_ValidateWwn", Family::rmOnly},
    {"RM_VerifyFirmwareA", Family::rmOnly},
    {"TvrGetBoardNumber", Family::rmOnly, absentMinusOne},
    {"HBA_CloseAdapter", Family::hbaApi, absentNothing},
    {"HBA_FreeLibrary", Family::hbaApi},
    {"HBA_GetAdapterAttributes", Family::hbaApi},
    {"HBA_GetAdapterName", Family::hbaApi},
    {"HBA_GetAdapterPortAttributes", Family::hbaApi},
    {"HBA_GetFcpTargetMapping", Family::hbaApi},
    {"HBA_GetNumberOfAdapters", Family::hbaApi, absentZero},
    {"HBA_LoadLibrary", Family::hbaApi},
    {"HBA_OpenAdapter", Family::hbaApi},
    {"HBA_RefreshInformation", Family::hbaApi, absentNothing},
    {"HBA_RegisterForAdapterPortEvents", Family::hbaApi},
    {"HBA_RemoveCallback", Family::hbaApi},
    {"HBA_SendReadCapacity", Family::hbaApi},
    {"HBA_SendScsiInquiry", Family::hbaApi},
    {"CPQFC_CloseAdapter", Family::vendorClose, absentNothing},
    {"CPQFC_FreeLibrary", Family::vendorQos},
    {"CPQFC_GetNumberOfAdapters", Family::vendorQos},
    {"CPQFC_LoadLibrary", Family::vendorQos},
    {"CPQFC_OpenAdapter", Family::vendorQos},
    {"CPQFC_QoSGetConfig", Family::vendorQos},
    {"CPQFC_QoSGetGlobalFlag", Family::vendorQos},
    {"CPQFC_QoSSetConfig", Family::vendorQos},
    {"CPQFC_QoSSetGlobalFlag", Family::vendorQos},
});

/// Row of an entry point; a name that is not in the table does not compile.
consteval std::size_t entryRow(std::string_view name)
{
    for (std::size_t row = 0; row < entryPoints.size(); ++row)
        if (name.compare(entryPoints[row].name) == 0)
            return row;
    throw "no such entry point";
}

} // namespace cimple
