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

/// Whether the program has calls of an entry point: only these are looked up.
enum Use : bool
{
    notCalled = false,
    called = true,
};

/// What a call answers, by which a failure is told.
enum class Answer : std::uint8_t
{
    status, ///< 0 is success
    handle, ///< 0 is none
    value,  ///< a count, a pointer or nothing: it tells no failure
};

struct EntryPoint
{
    const char* name;
    Family family;
    Absent absent = absentError;
    Use use = notCalled;
    Answer answer = Answer::status;
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
    {"LRM_ChangeWWN", Family::rmDual, absentError, called},
    {"LRM_DeleteDumpFiles", Family::rmDual, absentError, called},
    {"LRM_DiagBeacon", Family::rmDual, absentError, called},
    {"LRM_DiagBeaconState", Family::rmDual, absentError, called},
    {"LRM_DiagCancelDiagnostic", Family::rmDual, absentError, called},
    {"LRM_DiagDPortTest", Family::rmDual, absentError, called},
    {"LRM_DiagEchoTest", Family::rmDual},
    {"LRM_DiagEchoTestV2", Family::rmDual, absentError, called},
    {"LRM_DiagGetLoadListParams", Family::rmDual, absentError, called},
    {"LRM_DiagGetResults", Family::rmDual, absentError, called},
    {"LRM_DiagGetResultsDPort", Family::rmDual, absentError, called},
    {"LRM_DiagGetWakeupParams", Family::rmDual},
    {"LRM_DiagLoopBackTest", Family::rmDual},
    {"LRM_DiagLoopBackTestV2", Family::rmDual},
    {"LRM_DiagLoopBackTestV3", Family::rmDual, absentError, called},
    {"LRM_DiagMDIOSelfTest", Family::rmDual},
    {"LRM_DiagPciLoopBackTest", Family::rmDual},
    {"LRM_DiagPciLoopBackTestV2", Family::rmDual, absentError, called},
    {"LRM_DiagReadPCIRegistersV2", Family::rmDual, absentError, called},
    {"LRM_DiagRunPOST", Family::rmDual, absentError, called},
    {"LRM_DiagRunTDR", Family::rmDual},
    {"LRM_DiagSetNVP", Family::rmDual},
    {"LRM_DownloadFirmware", Family::rmDual, absentError, called},
    {"LRM_ExitLib", Family::rmDual},
    {"LRM_GenerateCoreDump", Family::rmDual, absentError, called},
    {"LRM_GenerateDump", Family::rmDual, absentError, called},
    {"LRM_GenerateEfdDump", Family::rmDual, absentError, called},
    {"LRM_GetAdapterPersonalityInfo", Family::rmDual},
    {"LRM_GetAdapterPortConfig", Family::rmDual},
    {"LRM_GetChannelMgmtCNAInfo", Family::rmDual},
    {"LRM_GetChannelMgmtPortInfo", Family::rmDual},
    {"LRM_GetDriverParams", Family::rmDual, absentError, called},
    {"LRM_GetDriverParamsGlobal", Family::rmDual, absentError, called},
    {"LRM_GetDriverType", Family::rmDual, absentError, called},
    {"LRM_GetDumpDirectoryA", Family::rmDual, absentError, called},
    {"LRM_GetDumpFileNames", Family::rmDual, absentError, called},
    {"LRM_GetDumpRetentionCount", Family::rmDual, absentError, called},
    {"LRM_GetFcpTargetMapping", Family::rmDual, absentError, called},
    {"LRM_GetHBAAttributes", Family::rmDual, absentError, called},
    {"LRM_GetHBAFeature", Family::rmDual, absentError, called},
    {"LRM_GetHBAFeatureList", Family::rmDual, absentError, called},
    {"LRM_GetLunAttributes", Family::rmDual},
    {"LRM_GetLunList", Family::rmDual, absentError, called},
    {"LRM_GetOASLunList", Family::rmDual, absentError, called},
    {"LRM_GetPortAttributes", Family::rmDual, absentError, called},
    {"LRM_GetPortState", Family::rmDual},
    {"LRM_GetPortStatistics", Family::rmDual, absentError, called},
    {"LRM_GetQoS", Family::rmDual, absentError, called},
    {"LRM_GetServerAttributes", Family::rmDual, absentError, called},
    {"LRM_GetSffData", Family::rmDual, absentError, called},
    {"LRM_GetVMFromVPort", Family::rmDual, absentError, called},
    {"LRM_GetVMInfo", Family::rmDual},
    {"LRM_GetVPD", Family::rmDual, absentError, called},
    {"LRM_GetVPDV2", Family::rmDual},
    {"LRM_GetVirtualFunctionList", Family::rmDual},
    {"LRM_GetVirtualFunctionProperties", Family::rmDual},
    {"LRM_GetWWNCapability", Family::rmDual, absentError, called},
    {"LRM_Get_BE_EventLogConfigDataAll", Family::rmDual, absentError, called},
    {"LRM_Ini_GetNetworkProperties", Family::rmDual},
    {"LRM_Ini_SetNetworkProperties", Family::rmDual},
    {"LRM_InitLib", Family::rmDual, absentError, called},
    {"LRM_ListProfiles", Family::rmDual},
    {"LRM_ListVM", Family::rmDual},
    {"LRM_Ping", Family::rmDual},
    {"LRM_ReadWWN", Family::rmDual, absentError, called},
    {"LRM_RegisterForAdapterPortEvents", Family::rmDual},
    {"LRM_ResetHBA", Family::rmDual, absentError, called},
    {"LRM_RestoreWWN", Family::rmDual, absentError, called},
    {"LRM_RetrieveFATDump", Family::rmDual, absentError, called},
    {"LRM_RetrieveFATDump2", Family::rmDual, absentError, called},
    {"LRM_ScsiInquiry", Family::rmDual, absentError, called},
    {"LRM_ScsiReadCapacity", Family::rmDual},
    {"LRM_SetAdapterAttribute", Family::rmDual, absentError, called},
    {"LRM_SetAdapterPortConfig", Family::rmDual},
    {"LRM_SetAdapterPortConfigDefaults", Family::rmDual},
    {"LRM_SetAriFuncs", Family::rmDual},
    {"LRM_SetBootBiosState", Family::rmDual, absentError, called},
    {"LRM_SetChannelMgmtCNAInfo", Family::rmDual},
    {"LRM_SetChannelMgmtPortInfo", Family::rmDual},
    {"LRM_SetDebugTraces", Family::rmDual, absentError, called},
    {"LRM_SetDriverParam", Family::rmDual, absentError, called},
    {"LRM_SetDumpDirectory", Family::rmDual, absentError, called},
    {"LRM_SetDumpRetentionCount", Family::rmDual, absentError, called},
    {"LRM_SetNetbootParams", Family::rmDual},
    {"LRM_SetOASLunState", Family::rmDual, absentError, called},
    {"LRM_SetPhyPortSpeedSettings", Family::rmDual},
    {"LRM_SetPortEnabled", Family::rmDual, absentError, called},
    {"LRM_SetQoS", Family::rmDual},
    {"LRM_Set_BE_DefaultLoggingConfig", Family::rmDual},
    {"LRM_Set_BE_EventLogConfigDataModule", Family::rmDual, absentError, called},
    {"LRM_Set_BE_EventLogTraceLevel", Family::rmDual, absentError, called},
    {"LRM_UnRegisterForAdapterPortEvents", Family::rmDual},
    {"LRM_VPAutoGenCreate", Family::rmDual},
    {"LRM_VPCreate", Family::rmDual},
    {"LRM_VPDelete", Family::rmDual},
    {"LRM_VPGetAttributes", Family::rmDual, absentError, called},
    {"LRM_VPList", Family::rmDual, absentError, called},
    {"LRM_VPListTargets", Family::rmDual, absentError, called},
    {"LRM_VpScsiInquiry", Family::rmDual, absentError, called},
    {"LRM_VpScsiReadCapacity", Family::rmDual, absentError, called},
    {"LRM_VpScsiReportLUNs", Family::rmDual, absentError, called},
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
    {"RM_GetAttributeValue", Family::rmOnly, absentZero, called, Answer::value},
    {"RM_GetLocalHBAInfo", Family::rmOnly, absentError, called},
    {"RM_GetLocalHBAInfoV3", Family::rmOnly},
    {"RM_GetLocalHBAInfoV4", Family::rmOnly},
    {"RM_GetNextVpdEntry", Family::rmOnly, absentZero},
    {"RM_GetNumberOfLocalAdapters", Family::rmOnly, absentZero, called, Answer::value},
    {"RM_GetVersion", Family::rmOnly, absentError, called},
    {"RM_ImportHBAFileA", Family::rmOnly, absentError, called},
    {"RM_IsLocalHBA", Family::rmOnly, absentError, called},
    {"RM_ListDeadNicPorts", Family::rmOnly},
    {"RM_MiliVersion", Family::rmOnly, absentError, called},
    {"RM_StatusString", Family::rmOnly, absentError, called},
    {"RM_ValidateWwn", Family::rmOnly, absentError, called},
    {"RM_VerifyFirmwareA", Family::rmOnly, absentError, called},
    {"TvrGetBoardNumber", Family::rmOnly, absentMinusOne},
    {"HBA_CloseAdapter", Family::hbaApi, absentNothing, called, Answer::value},
    {"HBA_FreeLibrary", Family::hbaApi, absentError, called},
    {"HBA_GetAdapterAttributes", Family::hbaApi, absentError, called},
    {"HBA_GetAdapterName", Family::hbaApi, absentError, called},
    {"HBA_GetAdapterPortAttributes", Family::hbaApi, absentError, called},
    {"HBA_GetFcpTargetMapping", Family::hbaApi, absentError, called},
    {"HBA_GetNumberOfAdapters", Family::hbaApi, absentZero, called, Answer::value},
    {"HBA_LoadLibrary", Family::hbaApi, absentError, called},
    {"HBA_OpenAdapter", Family::hbaApi, absentError, called, Answer::handle},
    {"HBA_RefreshInformation", Family::hbaApi, absentNothing, called, Answer::value},
    {"HBA_RegisterForAdapterPortEvents", Family::hbaApi},
    {"HBA_RemoveCallback", Family::hbaApi},
    {"HBA_SendReadCapacity", Family::hbaApi, absentError, called},
    {"HBA_SendScsiInquiry", Family::hbaApi, absentError, called},
    {"CPQFC_CloseAdapter", Family::vendorClose, absentNothing, called, Answer::value},
    {"CPQFC_FreeLibrary", Family::vendorQos},
    {"CPQFC_GetNumberOfAdapters", Family::vendorQos, absentError, called, Answer::value},
    {"CPQFC_LoadLibrary", Family::vendorQos},
    {"CPQFC_OpenAdapter", Family::vendorQos, absentError, called, Answer::handle},
    {"CPQFC_QoSGetConfig", Family::vendorQos, absentError, called},
    {"CPQFC_QoSGetGlobalFlag", Family::vendorQos, absentError, called},
    {"CPQFC_QoSSetConfig", Family::vendorQos, absentError, called},
    {"CPQFC_QoSSetGlobalFlag", Family::vendorQos, absentError, called},
});

/// Row of an entry point; a name that is not in the table, or whose row says that nobody calls it, does not compile.
consteval std::size_t entryRow(std::string_view name)
{
    for (std::size_t row = 0; row < entryPoints.size(); ++row)
        if (entryPoints[row].use == called && name.compare(entryPoints[row].name) == 0)
            return row;
    throw "no such entry point";
}

} // namespace cimple
