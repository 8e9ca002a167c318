// Functions of the RM library whose names begin with LRM_ in the local and with RM_ in the fallback library. The file
// is compiled once for each, with TVRSIM_DUAL_PREFIX as the beginning.
#include "simulator/frontends/FrontEnd.h"

using namespace tvrsim;

#define TVRSIM_JOIN_(prefix, name) prefix##name
#define TVRSIM_JOIN(prefix, name) TVRSIM_JOIN_(prefix, name)
/// The exported name of a function.
#define DUAL(name) TVRSIM_JOIN(TVRSIM_DUAL_PREFIX, name)

namespace
{

/// Gives `use` what the library keeps of a port's dumps.
template <class Use> RM_STATUS readDumps(Call& call, const HBA_WWN& wwpn, Use use)
{
    DumpFiles dumps;
    const RM_STATUS status = call.host().dumps(fromHba(wwpn), dumps);
    use(dumps);
    return status;
}

} // namespace

extern "C"
{

    // The declarations tie each signature to that of the RM library's header.
    TVRSIM_EXPORT RM_InitLib_t DUAL(InitLib);
    TVRSIM_EXPORT RM_ExitLib_t DUAL(ExitLib);
    TVRSIM_EXPORT RM_SetDebugTraces_t DUAL(SetDebugTraces);
    TVRSIM_EXPORT RM_GetHBAAttributes_t DUAL(GetHBAAttributes);
    TVRSIM_EXPORT RM_GetPortAttributes_t DUAL(GetPortAttributes);
    TVRSIM_EXPORT RM_GetPortStatistics_t DUAL(GetPortStatistics);
    TVRSIM_EXPORT RM_GetServerAttributes_t DUAL(GetServerAttributes);
    TVRSIM_EXPORT RM_GetDriverParams_t DUAL(GetDriverParams);
    TVRSIM_EXPORT RM_GetDriverParamsGlobal_t DUAL(GetDriverParamsGlobal);
    TVRSIM_EXPORT RM_SetDriverParam_t DUAL(SetDriverParam);
    TVRSIM_EXPORT RM_GetDriverType_t DUAL(GetDriverType);
    TVRSIM_EXPORT RM_GetHBAFeature_t DUAL(GetHBAFeature);
    TVRSIM_EXPORT RM_GetHBAFeatureList_t DUAL(GetHBAFeatureList);
    TVRSIM_EXPORT RM_GetQoS_t DUAL(GetQoS);
    TVRSIM_EXPORT RM_DiagBeacon_t DUAL(DiagBeacon);
    TVRSIM_EXPORT RM_DiagBeaconState_t DUAL(DiagBeaconState);
    TVRSIM_EXPORT RM_DiagGetLoadListParams_t DUAL(DiagGetLoadListParams);
    TVRSIM_EXPORT RM_GetSffData_t DUAL(GetSffData);
    TVRSIM_EXPORT RM_DiagReadPCIRegistersV2_t DUAL(DiagReadPCIRegistersV2);
    TVRSIM_EXPORT RM_GetVPD_t DUAL(GetVPD);
    TVRSIM_EXPORT RM_GetLunList_t DUAL(GetLunList);
    TVRSIM_EXPORT RM_GetOASLunList_t DUAL(GetOASLunList);
    TVRSIM_EXPORT RM_SetOASLunState_t DUAL(SetOASLunState);
    TVRSIM_EXPORT RM_ScsiInquiry_t DUAL(ScsiInquiry);
    TVRSIM_EXPORT RM_VPList_t DUAL(VPList);
    TVRSIM_EXPORT RM_VPGetAttributes_t DUAL(VPGetAttributes);
    TVRSIM_EXPORT RM_VPListTargets_t DUAL(VPListTargets);
    TVRSIM_EXPORT RM_VpScsiReportLUNs_t DUAL(VpScsiReportLUNs);
    TVRSIM_EXPORT RM_VpScsiInquiry_t DUAL(VpScsiInquiry);
    TVRSIM_EXPORT RM_VpScsiReadCapacity_t DUAL(VpScsiReadCapacity);
    TVRSIM_EXPORT RM_GetVMFromVPort_t DUAL(GetVMFromVPort);
    TVRSIM_EXPORT RM_GetWWNCapability_t DUAL(GetWWNCapability);
    TVRSIM_EXPORT RM_ChangeWWN_t DUAL(ChangeWWN);
    TVRSIM_EXPORT RM_RestoreWWN_t DUAL(RestoreWWN);
    TVRSIM_EXPORT RM_ReadWWN_t DUAL(ReadWWN);
    TVRSIM_EXPORT RM_SetBootBiosState_t DUAL(SetBootBiosState);
    TVRSIM_EXPORT RM_DownloadFirmware_t DUAL(DownloadFirmware);
    TVRSIM_EXPORT RM_ResetHBA_t DUAL(ResetHBA);
    TVRSIM_EXPORT RM_SetPortEnabled_t DUAL(SetPortEnabled);
    TVRSIM_EXPORT RM_SetAdapterAttribute_t DUAL(SetAdapterAttribute);
    TVRSIM_EXPORT RM_DiagEchoTestV2_t DUAL(DiagEchoTestV2);
    TVRSIM_EXPORT RM_DiagLoopBackTestV3_t DUAL(DiagLoopBackTestV3);
    TVRSIM_EXPORT RM_DiagPciLoopBackTestV2_t DUAL(DiagPciLoopBackTestV2);
    TVRSIM_EXPORT RM_DiagRunPOST_t DUAL(DiagRunPOST);
    TVRSIM_EXPORT RM_DiagGetResults_t DUAL(DiagGetResults);
    TVRSIM_EXPORT RM_DiagCancelDiagnostic_t DUAL(DiagCancelDiagnostic);
    TVRSIM_EXPORT RM_DiagDPortTest_t DUAL(DiagDPortTest);
    TVRSIM_EXPORT RM_DiagGetResultsDPort_t DUAL(DiagGetResultsDPort);
    TVRSIM_EXPORT RM_GetFcpTargetMapping_t DUAL(GetFcpTargetMapping);
    TVRSIM_EXPORT RM_DeleteDumpFiles_t DUAL(DeleteDumpFiles);
    TVRSIM_EXPORT RM_GenerateCoreDump_t DUAL(GenerateCoreDump);
    TVRSIM_EXPORT RM_GenerateDump_t DUAL(GenerateDump);
    TVRSIM_EXPORT RM_GenerateEfdDump_t DUAL(GenerateEfdDump);
    TVRSIM_EXPORT RM_GetDumpDirectoryA_t DUAL(GetDumpDirectoryA);
    TVRSIM_EXPORT RM_GetDumpFileNames_t DUAL(GetDumpFileNames);
    TVRSIM_EXPORT RM_GetDumpRetentionCount_t DUAL(GetDumpRetentionCount);
    TVRSIM_EXPORT RM_Get_BE_EventLogConfigDataAll_t DUAL(Get_BE_EventLogConfigDataAll);
    TVRSIM_EXPORT RM_RetrieveFATDump_t DUAL(RetrieveFATDump);
    TVRSIM_EXPORT RM_RetrieveFATDump2_t DUAL(RetrieveFATDump2);
    TVRSIM_EXPORT RM_SetDumpDirectory_t DUAL(SetDumpDirectory);
    TVRSIM_EXPORT RM_SetDumpRetentionCount_t DUAL(SetDumpRetentionCount);
    TVRSIM_EXPORT RM_Set_BE_EventLogConfigDataModule_t DUAL(Set_BE_EventLogConfigDataModule);
    TVRSIM_EXPORT RM_Set_BE_EventLogTraceLevel_t DUAL(Set_BE_EventLogTraceLevel);

    RM_STATUS DUAL(InitLib)()
    {
        Call call = callOf(__func__);
        return call.status(
            [&]
            {
                loadTaggingLibrary(call.host());
                return RM_OK;
            });
    }

    RM_STATUS DUAL(ExitLib)()
    {
        return callOf(__func__).status([] { return RM_OK; });
    }

    RM_STATUS DUAL(SetDebugTraces)(std::uint32_t)
    {
        return callOf(__func__).status([] { return RM_OK; });
    }

    RM_STATUS DUAL(GetHBAAttributes)(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.attributes(buffer, size,
                               [&](auto& list) { return call.host().hbaAttributes(fromHba(wwpn), list); });
    }

    RM_STATUS DUAL(GetPortAttributes)(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.attributes(buffer, size,
                               [&](auto& list) { return call.host().portAttributes(fromHba(wwpn), list); });
    }

    RM_STATUS DUAL(GetPortStatistics)(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.attributes(buffer, size,
                               [&](auto& list) { return call.host().portStatistics(fromHba(wwpn), list); });
    }

    RM_STATUS DUAL(GetServerAttributes)(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.attributes(buffer, size,
                               [&](auto& list) { return call.host().serverAttributes(fromHba(wwpn), list); });
    }

    RM_STATUS DUAL(GetDriverParams)(HBA_WWN wwpn, RM_DriverParamList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(list, &RM_DriverParamList::count,
                         [&](auto& entries) { return call.host().driverParameters(fromHba(wwpn), entries); });
    }

    RM_STATUS DUAL(GetDriverParamsGlobal)(RM_DriverParamList* list)
    {
        Call call = callOf(__func__);
        return call.list(list, &RM_DriverParamList::count,
                         [&](auto& entries) { return call.host().globalDriverParameters(entries); });
    }

    RM_STATUS DUAL(SetDriverParam)(HBA_WWN wwpn, const char* text, std::uint32_t control)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&]
                           { return text ? call.host().setDriverParameter(fromHba(wwpn), text, control) : RM_ERROR; });
    }

    RM_STATUS DUAL(GetDriverType)(HBA_WWN wwpn, std::uint32_t* driverType)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(driverType, [&](std::uint32_t& out) { return call.host().driverType(fromHba(wwpn), out); });
    }

    RM_STATUS DUAL(GetHBAFeature)(HBA_WWN wwpn, std::uint32_t tag, std::uint32_t* value)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(value, [&](std::uint32_t& out) { return call.host().feature(fromHba(wwpn), tag, out); });
    }

    RM_STATUS DUAL(GetHBAFeatureList)(HBA_WWN wwpn, RM_FeatureList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(list, &RM_FeatureList::count,
                         [&](auto& entries) { return call.host().features(fromHba(wwpn), entries); });
    }

    RM_STATUS DUAL(GetQoS)(HBA_WWN wwpn, RM_QosInfo* info)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(info, [&](auto& record) { return call.host().qos(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(DiagBeacon)(HBA_WWN wwpn, std::uint32_t state)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().setBeacon(fromHba(wwpn), state); });
    }

    RM_STATUS DUAL(DiagBeaconState)(HBA_WWN wwpn, std::uint32_t* state)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(state, [&](std::uint32_t& out) { return call.host().beacon(fromHba(wwpn), out); });
    }

    RM_STATUS DUAL(DiagGetLoadListParams)(HBA_WWN wwpn, RM_FlashList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(list, [&](auto& record) { return call.host().flash(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(GetSffData)(HBA_WWN wwpn, RM_SffData* data)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(data, [&](auto& record) { return call.host().transceiver(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(DiagReadPCIRegistersV2)(HBA_WWN wwpn, RM_PciRegisters* registers)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(registers, [&](auto& record) { return call.host().pciRegisters(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(GetVPD)(HBA_WWN wwpn, RM_VpdArea* area)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(area, [&](auto& record) { return call.host().vpd(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(GetLunList)(HBA_WWN wwpn, HBA_WWN target, RM_LunList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(list, &RM_LunList::count,
                         [&](auto& entries) { return call.host().luns(fromHba(wwpn), fromHba(target), entries); });
    }

    RM_STATUS DUAL(GetOASLunList)(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, std::uint32_t option,
                                  RM_OASLunList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(
            list, &RM_OASLunList::count,
            [&](auto& entries)
            { return call.host().priorityLanes(fromHba(wwpn), fromHba(vport), fromHba(target), option, entries); });
    }

    RM_STATUS DUAL(SetOASLunState)(HBA_WWN wwpn, HBA_WWN target, HBA_WWN vport, std::int32_t lun, std::uint32_t state,
                                   std::uint32_t option)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status(
            [&] {
                return call.host().setPriorityLane(fromHba(wwpn), fromHba(vport), fromHba(target), lun, state, option);
            });
    }

    RM_STATUS DUAL(ScsiInquiry)(HBA_WWN wwpn, HBA_WWN target, HBA_UINT64 lun, std::uint8_t evpd, std::uint32_t page,
                                void* response, std::uint32_t responseSize, void* sense, std::uint32_t senseSize)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.scsi(
            response, responseSize, sense, senseSize,
            [&](ScsiReply& reply)
            { return call.host().scsi(fromHba(wwpn), fromHba(target), lun, inquiryCommand(evpd, page), reply); });
    }

    RM_STATUS DUAL(VPList)(HBA_WWN wwpn, RM_VPortList* list)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(list, &RM_VPortList::count,
                         [&](auto& entries) { return call.host().vports(fromHba(wwpn), entries); });
    }

    RM_STATUS DUAL(VPGetAttributes)(HBA_WWN wwpn, HBA_WWN vport, RM_VPortAttributes* attributes)
    {
        Call call = callOf(__func__, port(vport));
        return call.record(attributes, [&](auto& record)
                           { return call.host().vportAttributes(fromHba(wwpn), fromHba(vport), record); });
    }

    RM_STATUS DUAL(VPListTargets)(HBA_WWN wwpn, HBA_WWN vport, RM_VPortTargetList* list)
    {
        Call call = callOf(__func__, port(vport));
        return call.list(list, &RM_VPortTargetList::count,
                         [&](auto& entries)
                         { return call.host().vportTargets(fromHba(wwpn), fromHba(vport), entries); });
    }

    RM_STATUS DUAL(VpScsiReportLUNs)(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, void* response,
                                     std::uint32_t responseSize, void* sense, std::uint32_t senseSize)
    {
        Call call = callOf(__func__, port(vport));
        return call.scsi(response, responseSize, sense, senseSize,
                         [&](ScsiReply& reply)
                         {
                             return call.host().vportScsi(fromHba(wwpn), fromHba(vport), fromHba(target), 0,
                                                          {ScsiOperation::reportLuns}, reply);
                         });
    }

    RM_STATUS DUAL(VpScsiInquiry)(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, HBA_UINT64 lun, std::uint8_t evpd,
                                  std::uint32_t page, void* response, std::uint32_t responseSize, void* sense,
                                  std::uint32_t senseSize)
    {
        Call call = callOf(__func__, port(vport));
        return call.scsi(response, responseSize, sense, senseSize,
                         [&](ScsiReply& reply)
                         {
                             return call.host().vportScsi(fromHba(wwpn), fromHba(vport), fromHba(target), lun,
                                                          inquiryCommand(evpd, page), reply);
                         });
    }

    RM_STATUS DUAL(VpScsiReadCapacity)(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, HBA_UINT64 lun, void* response,
                                       std::uint32_t responseSize, void* sense, std::uint32_t senseSize)
    {
        Call call = callOf(__func__, port(vport));
        return call.scsi(response, responseSize, sense, senseSize,
                         [&](ScsiReply& reply)
                         {
                             return call.host().vportScsi(fromHba(wwpn), fromHba(vport), fromHba(target), lun,
                                                          {ScsiOperation::readCapacity}, reply);
                         });
    }

    RM_STATUS DUAL(GetVMFromVPort)(HBA_WWN wwpn, HBA_WWN vport, RM_VirtualMachine* machine)
    {
        Call call = callOf(__func__, port(vport));
        return call.record(machine, [&](auto& record)
                           { return call.host().vportMachine(fromHba(wwpn), fromHba(vport), record); });
    }

    RM_STATUS DUAL(GetWWNCapability)(HBA_WWN wwpn, std::uint32_t* capability)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(capability,
                           [&](std::uint32_t& out) { return call.host().nameCapability(fromHba(wwpn), out); });
    }

    RM_STATUS DUAL(ChangeWWN)(HBA_WWN wwpn, HBA_WWN newWwpn, HBA_WWN newWwnn, std::uint32_t type,
                              std::uint32_t* activation)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(
            activation,
            [&](std::uint32_t& out) {
                return call.host().changeNames(fromHba(wwpn), {fromHba(newWwpn), fromHba(newWwnn)}, type, out);
            });
    }

    RM_STATUS DUAL(RestoreWWN)(HBA_WWN wwpn, std::uint32_t type, std::uint32_t* activation)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(activation,
                           [&](std::uint32_t& out) { return call.host().restoreNames(fromHba(wwpn), type, out); });
    }

    RM_STATUS DUAL(ReadWWN)(HBA_WWN wwpn, std::uint32_t type, RM_WwnNames* names)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(names, [&](auto& record) { return call.host().readNames(fromHba(wwpn), type, record); });
    }

    RM_STATUS DUAL(SetBootBiosState)(HBA_WWN wwpn, std::uint32_t enabled)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().setBootCode(fromHba(wwpn), enabled != 0); });
    }

    RM_STATUS DUAL(DownloadFirmware)(HBA_WWN wwpn, const char* file, std::uint32_t)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().downloadFirmware(fromHba(wwpn), file); });
    }

    RM_STATUS DUAL(ResetHBA)(HBA_WWN wwpn, std::uint32_t)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().resetAdapter(fromHba(wwpn)); });
    }

    RM_STATUS DUAL(SetPortEnabled)(HBA_WWN wwpn, std::uint32_t enabled, std::uint32_t* dynamic)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(dynamic,
                           [&](std::uint32_t& out) { return call.host().setPortEnabled(fromHba(wwpn), enabled, out); });
    }

    RM_STATUS DUAL(SetAdapterAttribute)(HBA_WWN wwpn, std::uint32_t id, const void* value, std::uint32_t length)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().setPortAttribute(fromHba(wwpn), id, value, length); });
    }

    // Diagnostics.

    RM_STATUS DUAL(DiagEchoTestV2)(HBA_WWN wwpn, HBA_WWN target, std::uint32_t cycles, std::uint32_t haltOnError,
                                   std::uint32_t* handle, std::uint32_t, const char* pattern)
    {
        Call call = callOf(__func__, port(wwpn));
        return startTest(call, wwpn, &Diagnostics::echo, {cycles, haltOnError != 0, pattern, fromHba(target)}, handle);
    }

    RM_STATUS DUAL(DiagLoopBackTestV3)(HBA_WWN wwpn, std::uint32_t type, std::uint32_t cycles,
                                       std::uint32_t haltOnError, std::uint32_t* handle, std::uint32_t,
                                       const char* pattern)
    {
        Call call = callOf(__func__, port(wwpn));
        const TestOf test =
            type == RM_LOOPBACK_EXTERNAL ? &Diagnostics::externalLoopback : &Diagnostics::internalLoopback;
        return startTest(call, wwpn, type > RM_LOOPBACK_INTERNAL ? nullptr : test, {cycles, haltOnError != 0, pattern},
                         handle);
    }

    RM_STATUS DUAL(DiagPciLoopBackTestV2)(HBA_WWN wwpn, std::uint32_t cycles, std::uint32_t haltOnError,
                                          std::uint32_t* handle, std::uint32_t, const char* pattern)
    {
        Call call = callOf(__func__, port(wwpn));
        return startTest(call, wwpn, &Diagnostics::hostLoopback, {cycles, haltOnError != 0, pattern}, handle);
    }

    RM_STATUS DUAL(DiagRunPOST)(HBA_WWN wwpn, std::uint32_t* handle)
    {
        Call call = callOf(__func__, port(wwpn));
        return startTest(call, wwpn, &Diagnostics::self, {}, handle);
    }

    RM_STATUS DUAL(DiagDPortTest)(HBA_WWN wwpn, std::uint32_t, std::uint32_t* handle)
    {
        Call call = callOf(__func__, port(wwpn));
        return startTest(call, wwpn, &Diagnostics::dport, {}, handle);
    }

    RM_STATUS DUAL(DiagGetResults)(HBA_WWN wwpn, std::uint32_t handle, RM_DiagResults* results)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(
            results, [&](auto& record) { return call.host().testResults(fromHba(wwpn), handle, record); },
            RM_ERROR_TEST_RUNNING);
    }

    RM_STATUS DUAL(DiagGetResultsDPort)(HBA_WWN wwpn, std::uint32_t handle, RM_DPortResults* results)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(
            results, [&](auto& record) { return call.host().linkTestResults(fromHba(wwpn), handle, record); },
            RM_ERROR_TEST_RUNNING);
    }

    RM_STATUS DUAL(DiagCancelDiagnostic)(HBA_WWN wwpn, std::uint32_t handle)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().cancelTest(fromHba(wwpn), handle); });
    }

    RM_STATUS DUAL(GetFcpTargetMapping)(HBA_WWN wwpn, RM_FcpTargetMapping* mapping)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(mapping, &RM_FcpTargetMapping::count,
                         [&](auto& entries) { return call.host().fcpTargets(fromHba(wwpn), entries); });
    }

    // --- dumps, and the trace of the firmware

    RM_STATUS DUAL(GenerateDump)(std::uint32_t, std::uint32_t, HBA_WWN wwpn)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().generateDump(fromHba(wwpn), ".dmp"); });
    }

    RM_STATUS DUAL(GenerateEfdDump)(HBA_WWN wwpn, std::int32_t, std::uint32_t)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().generateDump(fromHba(wwpn), ".efd"); });
    }

    RM_STATUS DUAL(GenerateCoreDump)(HBA_WWN wwpn, const char* options)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return options ? call.host().generateDump(fromHba(wwpn), ".core") : RM_ERROR; });
    }

    RM_STATUS DUAL(RetrieveFATDump)()
    {
        Call call = callOf(__func__);
        return call.status([&] { return call.host().generateDumps(".fat"); });
    }

    RM_STATUS DUAL(RetrieveFATDump2)(HBA_WWN wwpn)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().generateDump(fromHba(wwpn), ".fat"); });
    }

    RM_STATUS DUAL(GetDumpDirectoryA)(HBA_WWN wwpn, char* buffer, std::uint32_t size)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.text(buffer, size,
                         [&](auto& text)
                         { return readDumps(call, wwpn, [&](DumpFiles& dumps) { text = dumps.directory; }); });
    }

    RM_STATUS DUAL(SetDumpDirectory)(HBA_WWN wwpn, const char* directory)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&]
                           { return directory ? call.host().setDumpDirectory(fromHba(wwpn), directory) : RM_ERROR; });
    }

    RM_STATUS DUAL(GetDumpRetentionCount)(HBA_WWN wwpn, std::uint32_t* count)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(count, [&](std::uint32_t& out)
                           { return readDumps(call, wwpn, [&](DumpFiles& dumps) { out = dumps.retentionCount; }); });
    }

    RM_STATUS DUAL(SetDumpRetentionCount)(HBA_WWN wwpn, std::uint32_t count)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().setDumpRetention(fromHba(wwpn), count); });
    }

    RM_STATUS DUAL(GetDumpFileNames)(HBA_WWN wwpn, RM_DumpFileNames* names)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.list(
            names, &RM_DumpFileNames::count,
            [&](auto& entries)
            {
                return readDumps(call, wwpn,
                                 [&](DumpFiles& dumps)
                                 {
                                     for (const std::string& file : dumps.files)
                                         setText(entries.emplace_back().name, file);
                                 });
            },
            RM_ERROR_BUFFER_TOO_SMALL);
    }

    RM_STATUS DUAL(DeleteDumpFiles)(HBA_WWN wwpn)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().deleteDumps(fromHba(wwpn)); });
    }

    RM_STATUS DUAL(Set_BE_EventLogTraceLevel)(HBA_WWN wwpn, std::uint32_t level, std::uint8_t byte0, std::uint8_t byte1,
                                              std::uint8_t byte2, std::uint8_t byte3)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status(
            [&] {
                return call.host().setTraceLevel(fromHba(wwpn), {level, {byte0, byte1, byte2, byte3}});
            });
    }

    RM_STATUS DUAL(Get_BE_EventLogConfigDataAll)(HBA_WWN wwpn, RM_EventLogConfig* config)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(config, [&](auto& record) { return call.host().eventLogConfig(fromHba(wwpn), record); });
    }

    RM_STATUS DUAL(Set_BE_EventLogConfigDataModule)(HBA_WWN wwpn, const RM_EventLogModule* module)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return module ? call.host().setEventLogModule(fromHba(wwpn), *module) : RM_ERROR; });
    }

} // extern "C"
