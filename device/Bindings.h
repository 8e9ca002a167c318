// The entry points that the program calls, each as a function object of the entry point's own name and signature.
//
//     RM_STATUS status = LRM_GetHBAAttributes(wwpn, buffer, &size);
//
// They are objects, not functions, so that they stand beside the declarations of <hbaapi.h>. A call whose entry
// point is absent returns the value that device/EntryPoints.h gives it.
#pragma once

#include "device/CallFailures.h"
#include "device/EntryPoints.h"
#include "device/Loader.h"
#include "device/RmApi.h"

#include <type_traits>

namespace cimple
{

template <std::size_t Row, class Signature> class Binding;

template <std::size_t Row, class Result, class... Args> class Binding<Row, Result(Args...)>
{
    static constexpr Absent absent = entryPoints[Row].absent;
    static_assert(std::is_void_v<Result> == (absent == absentNothing));
    static_assert(!std::is_pointer_v<Result> || absent == absentZero);
    static_assert(std::is_integral_v<Result> || entryPoints[Row].answer == Answer::value);

public:
    Result operator()(Args... args) const
    {
        if (void* entry = resolveEntry(Row))
            return counted<Row>([&] { return reinterpret_cast<Result (*)(Args...)>(entry)(args...); });
        if constexpr (std::is_pointer_v<Result>)
            return nullptr;
        else if constexpr (!std::is_void_v<Result>)
            return static_cast<Result>(absent);
    }
};

inline constexpr Binding<entryRow("HBA_CloseAdapter"), decltype(::HBA_CloseAdapter)> HBA_CloseAdapter;
inline constexpr Binding<entryRow("HBA_FreeLibrary"), decltype(::HBA_FreeLibrary)> HBA_FreeLibrary;
inline constexpr Binding<entryRow("HBA_GetAdapterAttributes"), decltype(::HBA_GetAdapterAttributes)>
    HBA_GetAdapterAttributes;
inline constexpr Binding<entryRow("HBA_GetAdapterName"), decltype(::HBA_GetAdapterName)> HBA_GetAdapterName;
inline constexpr Binding<entryRow("HBA_GetAdapterPortAttributes"), decltype(::HBA_GetAdapterPortAttributes)>
    HBA_GetAdapterPortAttributes;
inline constexpr Binding<entryRow("HBA_GetFcpTargetMapping"), decltype(::HBA_GetFcpTargetMapping)>
    HBA_GetFcpTargetMapping;
inline constexpr Binding<entryRow("HBA_GetNumberOfAdapters"), decltype(::HBA_GetNumberOfAdapters)>
    HBA_GetNumberOfAdapters;
inline constexpr Binding<entryRow("HBA_LoadLibrary"), decltype(::HBA_LoadLibrary)> HBA_LoadLibrary;
inline constexpr Binding<entryRow("HBA_OpenAdapter"), decltype(::HBA_OpenAdapter)> HBA_OpenAdapter;
inline constexpr Binding<entryRow("HBA_RefreshInformation"), decltype(::HBA_RefreshInformation)> HBA_RefreshInformation;
inline constexpr Binding<entryRow("HBA_SendReadCapacity"), decltype(::HBA_SendReadCapacity)> HBA_SendReadCapacity;
inline constexpr Binding<entryRow("HBA_SendScsiInquiry"), decltype(::HBA_SendScsiInquiry)> HBA_SendScsiInquiry;

inline constexpr Binding<entryRow("LRM_ChangeWWN"), RM_ChangeWWN_t> LRM_ChangeWWN;
inline constexpr Binding<entryRow("LRM_DiagBeacon"), RM_DiagBeacon_t> LRM_DiagBeacon;
inline constexpr Binding<entryRow("LRM_DiagBeaconState"), RM_DiagBeaconState_t> LRM_DiagBeaconState;
inline constexpr Binding<entryRow("LRM_DiagGetLoadListParams"), RM_DiagGetLoadListParams_t> LRM_DiagGetLoadListParams;
inline constexpr Binding<entryRow("LRM_DiagReadPCIRegistersV2"), RM_DiagReadPCIRegistersV2_t>
    LRM_DiagReadPCIRegistersV2;
inline constexpr Binding<entryRow("LRM_DownloadFirmware"), RM_DownloadFirmware_t> LRM_DownloadFirmware;
inline constexpr Binding<entryRow("LRM_GetDriverParams"), RM_GetDriverParams_t> LRM_GetDriverParams;
inline constexpr Binding<entryRow("LRM_GetDriverParamsGlobal"), RM_GetDriverParamsGlobal_t> LRM_GetDriverParamsGlobal;
inline constexpr Binding<entryRow("LRM_GetDriverType"), RM_GetDriverType_t> LRM_GetDriverType;
inline constexpr Binding<entryRow("LRM_GetHBAAttributes"), RM_GetHBAAttributes_t> LRM_GetHBAAttributes;
inline constexpr Binding<entryRow("LRM_GetHBAFeature"), RM_GetHBAFeature_t> LRM_GetHBAFeature;
inline constexpr Binding<entryRow("LRM_GetHBAFeatureList"), RM_GetHBAFeatureList_t> LRM_GetHBAFeatureList;
inline constexpr Binding<entryRow("LRM_GetLunList"), RM_GetLunList_t> LRM_GetLunList;
inline constexpr Binding<entryRow("LRM_GetOASLunList"), RM_GetOASLunList_t> LRM_GetOASLunList;
inline constexpr Binding<entryRow("LRM_GetPortAttributes"), RM_GetPortAttributes_t> LRM_GetPortAttributes;
inline constexpr Binding<entryRow("LRM_GetPortStatistics"), RM_GetPortStatistics_t> LRM_GetPortStatistics;
inline constexpr Binding<entryRow("LRM_GetQoS"), RM_GetQoS_t> LRM_GetQoS;
inline constexpr Binding<entryRow("LRM_GetServerAttributes"), RM_GetServerAttributes_t> LRM_GetServerAttributes;
inline constexpr Binding<entryRow("LRM_GetSffData"), RM_GetSffData_t> LRM_GetSffData;
inline constexpr Binding<entryRow("LRM_GetVMFromVPort"), RM_GetVMFromVPort_t> LRM_GetVMFromVPort;
inline constexpr Binding<entryRow("LRM_GetVPD"), RM_GetVPD_t> LRM_GetVPD;
inline constexpr Binding<entryRow("LRM_GetWWNCapability"), RM_GetWWNCapability_t> LRM_GetWWNCapability;
inline constexpr Binding<entryRow("LRM_InitLib"), RM_InitLib_t> LRM_InitLib;
inline constexpr Binding<entryRow("LRM_ReadWWN"), RM_ReadWWN_t> LRM_ReadWWN;
inline constexpr Binding<entryRow("LRM_ResetHBA"), RM_ResetHBA_t> LRM_ResetHBA;
inline constexpr Binding<entryRow("LRM_RestoreWWN"), RM_RestoreWWN_t> LRM_RestoreWWN;
inline constexpr Binding<entryRow("LRM_ScsiInquiry"), RM_ScsiInquiry_t> LRM_ScsiInquiry;
inline constexpr Binding<entryRow("LRM_SetAdapterAttribute"), RM_SetAdapterAttribute_t> LRM_SetAdapterAttribute;
inline constexpr Binding<entryRow("LRM_SetBootBiosState"), RM_SetBootBiosState_t> LRM_SetBootBiosState;
inline constexpr Binding<entryRow("LRM_SetDebugTraces"), RM_SetDebugTraces_t> LRM_SetDebugTraces;
inline constexpr Binding<entryRow("LRM_SetDriverParam"), RM_SetDriverParam_t> LRM_SetDriverParam;
inline constexpr Binding<entryRow("LRM_SetOASLunState"), RM_SetOASLunState_t> LRM_SetOASLunState;
inline constexpr Binding<entryRow("LRM_SetPortEnabled"), RM_SetPortEnabled_t> LRM_SetPortEnabled;
inline constexpr Binding<entryRow("LRM_VPGetAttributes"), RM_VPGetAttributes_t> LRM_VPGetAttributes;
inline constexpr Binding<entryRow("LRM_VPList"), RM_VPList_t> LRM_VPList;
inline constexpr Binding<entryRow("LRM_VPListTargets"), RM_VPListTargets_t> LRM_VPListTargets;
inline constexpr Binding<entryRow("LRM_VpScsiInquiry"), RM_VpScsiInquiry_t> LRM_VpScsiInquiry;
inline constexpr Binding<entryRow("LRM_VpScsiReadCapacity"), RM_VpScsiReadCapacity_t> LRM_VpScsiReadCapacity;
inline constexpr Binding<entryRow("LRM_VpScsiReportLUNs"), RM_VpScsiReportLUNs_t> LRM_VpScsiReportLUNs;

inline constexpr Binding<entryRow("LRM_DiagCancelDiagnostic"), RM_DiagCancelDiagnostic_t> LRM_DiagCancelDiagnostic;
inline constexpr Binding<entryRow("LRM_DiagDPortTest"), RM_DiagDPortTest_t> LRM_DiagDPortTest;
inline constexpr Binding<entryRow("LRM_DiagEchoTestV2"), RM_DiagEchoTestV2_t> LRM_DiagEchoTestV2;
inline constexpr Binding<entryRow("LRM_DiagGetResults"), RM_DiagGetResults_t> LRM_DiagGetResults;
inline constexpr Binding<entryRow("LRM_DiagGetResultsDPort"), RM_DiagGetResultsDPort_t> LRM_DiagGetResultsDPort;
inline constexpr Binding<entryRow("LRM_DiagLoopBackTestV3"), RM_DiagLoopBackTestV3_t> LRM_DiagLoopBackTestV3;
inline constexpr Binding<entryRow("LRM_DiagPciLoopBackTestV2"), RM_DiagPciLoopBackTestV2_t> LRM_DiagPciLoopBackTestV2;
inline constexpr Binding<entryRow("LRM_DiagRunPOST"), RM_DiagRunPOST_t> LRM_DiagRunPOST;
inline constexpr Binding<entryRow("LRM_GetFcpTargetMapping"), RM_GetFcpTargetMapping_t> LRM_GetFcpTargetMapping;

// Dumps.
inline constexpr Binding<entryRow("LRM_DeleteDumpFiles"), RM_DeleteDumpFiles_t> LRM_DeleteDumpFiles;
inline constexpr Binding<entryRow("LRM_GenerateCoreDump"), RM_GenerateCoreDump_t> LRM_GenerateCoreDump;
inline constexpr Binding<entryRow("LRM_GenerateDump"), RM_GenerateDump_t> LRM_GenerateDump;
inline constexpr Binding<entryRow("LRM_GenerateEfdDump"), RM_GenerateEfdDump_t> LRM_GenerateEfdDump;
inline constexpr Binding<entryRow("LRM_GetDumpDirectoryA"), RM_GetDumpDirectoryA_t> LRM_GetDumpDirectoryA;
inline constexpr Binding<entryRow("LRM_GetDumpFileNames"), RM_GetDumpFileNames_t> LRM_GetDumpFileNames;
inline constexpr Binding<entryRow("LRM_GetDumpRetentionCount"), RM_GetDumpRetentionCount_t> LRM_GetDumpRetentionCount;
inline constexpr Binding<entryRow("LRM_Get_BE_EventLogConfigDataAll"), RM_Get_BE_EventLogConfigDataAll_t>
    LRM_Get_BE_EventLogConfigDataAll;
inline constexpr Binding<entryRow("LRM_RetrieveFATDump"), RM_RetrieveFATDump_t> LRM_RetrieveFATDump;
inline constexpr Binding<entryRow("LRM_RetrieveFATDump2"), RM_RetrieveFATDump2_t> LRM_RetrieveFATDump2;
inline constexpr Binding<entryRow("LRM_SetDumpDirectory"), RM_SetDumpDirectory_t> LRM_SetDumpDirectory;
inline constexpr Binding<entryRow("LRM_SetDumpRetentionCount"), RM_SetDumpRetentionCount_t> LRM_SetDumpRetentionCount;
inline constexpr Binding<entryRow("LRM_Set_BE_EventLogConfigDataModule"), RM_Set_BE_EventLogConfigDataModule_t>
    LRM_Set_BE_EventLogConfigDataModule;
inline constexpr Binding<entryRow("LRM_Set_BE_EventLogTraceLevel"), RM_Set_BE_EventLogTraceLevel_t>
    LRM_Set_BE_EventLogTraceLevel;

inline constexpr Binding<entryRow("RM_GetAttributeValue"), RM_GetAttributeValue_t> RM_GetAttributeValue;
inline constexpr Binding<entryRow("RM_GetLocalHBAInfo"), RM_GetLocalHBAInfo_t> RM_GetLocalHBAInfo;
inline constexpr Binding<entryRow("RM_GetNumberOfLocalAdapters"), RM_GetNumberOfLocalAdapters_t>
    RM_GetNumberOfLocalAdapters;
inline constexpr Binding<entryRow("RM_GetVersion"), RM_GetVersion_t> RM_GetVersion;
inline constexpr Binding<entryRow("RM_ImportHBAFileA"), RM_ImportHBAFileA_t> RM_ImportHBAFileA;
inline constexpr Binding<entryRow("RM_IsLocalHBA"), RM_IsLocalHBA_t> RM_IsLocalHBA;
inline constexpr Binding<entryRow("RM_MiliVersion"), RM_MiliVersion_t> RM_MiliVersion;
inline constexpr Binding<entryRow("RM_StatusString"), RM_StatusString_t> RM_StatusString;
inline constexpr Binding<entryRow("RM_ValidateWwn"), RM_ValidateWwn_t> RM_ValidateWwn;
inline constexpr Binding<entryRow("RM_VerifyFirmwareA"), RM_VerifyFirmwareA_t> RM_VerifyFirmwareA;

inline constexpr Binding<entryRow("CPQFC_CloseAdapter"), CPQFC_CloseAdapter_t> CPQFC_CloseAdapter;
inline constexpr Binding<entryRow("CPQFC_GetNumberOfAdapters"), CPQFC_GetNumberOfAdapters_t> CPQFC_GetNumberOfAdapters;
inline constexpr Binding<entryRow("CPQFC_OpenAdapter"), CPQFC_OpenAdapter_t> CPQFC_OpenAdapter;
inline constexpr Binding<entryRow("CPQFC_QoSGetConfig"), CPQFC_QoSGetConfig_t> CPQFC_QoSGetConfig;
inline constexpr Binding<entryRow("CPQFC_QoSGetGlobalFlag"), CPQFC_QoSGetGlobalFlag_t> CPQFC_QoSGetGlobalFlag;
inline constexpr Binding<entryRow("CPQFC_QoSSetConfig"), CPQFC_QoSSetConfig_t> CPQFC_QoSSetConfig;
inline constexpr Binding<entryRow("CPQFC_QoSSetGlobalFlag"), CPQFC_QoSSetGlobalFlag_t> CPQFC_QoSSetGlobalFlag;

} // namespace cimple
