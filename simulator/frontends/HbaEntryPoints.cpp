// The HBA API: in libHBAAPI.so.2, in the fallback RM library, and behind the vendor library's table.
#include "simulator/frontends/FrontEnd.h"

using namespace tvrsim;

extern "C"
{

    TVRSIM_EXPORT HBA_UINT32 HBA_GetVersion()
    {
        constexpr HBA_UINT32 version = 2;
        return static_cast<HBA_UINT32>(callOf(__func__).status([] { return version; }));
    }

    TVRSIM_EXPORT HBA_STATUS HBA_LoadLibrary()
    {
        Call call = callOf(__func__);
        return call.status([&] { return call.host().loadLibrary(); });
    }

    TVRSIM_EXPORT HBA_STATUS HBA_FreeLibrary()
    {
        Call call = callOf(__func__);
        return call.status([&] { return call.host().freeLibrary(); });
    }

    TVRSIM_EXPORT HBA_UINT32 HBA_GetNumberOfAdapters()
    {
        Call call = callOf(__func__);
        if (call.isHostile(Hostile::hugeCount))
            return 0xFFFF'FFFF;
        return call.fails() ? 0 : call.host().adapterCount();
    }

    TVRSIM_EXPORT HBA_STATUS HBA_GetAdapterName(HBA_UINT32 index, char* name)
    {
        constexpr std::size_t room = 256;
        Call call = callOf(__func__,
                           [index]
                           {
                               std::string subject;
                               tvrsim_simulation()->host.adapterName(index, subject);
                               return subject;
                           });
        return call.text(name, room, [&](std::string& text) { return call.host().adapterName(index, text); });
    }

    TVRSIM_EXPORT HBA_HANDLE HBA_OpenAdapter(char* name)
    {
        Call call = callOf(__func__, [name] { return std::string(name ? name : ""); });
        if (!name || call.fails() || call.isHostile(Hostile::zeroHandle))
            return 0;
        return call.host().openAdapter(name);
    }

    TVRSIM_EXPORT void HBA_CloseAdapter(HBA_HANDLE handle)
    {
        Call call = callOf(__func__, adapter(handle));
        if (!call.fails())
            call.host().closeAdapter(handle);
    }

    TVRSIM_EXPORT void HBA_RefreshInformation(HBA_HANDLE handle)
    {
        Call call = callOf(__func__, adapter(handle));
        if (!call.fails())
            call.host().refreshInformation(handle);
    }

    TVRSIM_EXPORT HBA_STATUS HBA_GetAdapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES* attributes)
    {
        Call call = callOf(__func__, adapter(handle));
        return call.record(attributes, [&](auto& record) { return call.host().adapterAttributes(handle, record); });
    }

    TVRSIM_EXPORT HBA_STATUS HBA_GetAdapterPortAttributes(HBA_HANDLE handle, HBA_UINT32 port,
                                                          HBA_PORTATTRIBUTES* attributes)
    {
        Call call = callOf(__func__, adapter(handle));
        return call.record(attributes, [&](auto& record) { return call.host().portAttributes(handle, port, record); });
    }

    TVRSIM_EXPORT HBA_STATUS HBA_GetFcpTargetMapping(HBA_HANDLE handle, HBA_FCPTARGETMAPPING* mapping)
    {
        Call call = callOf(__func__, adapter(handle));
        return call.list(mapping, &HBA_FCPTARGETMAPPING::NumberOfEntries,
                         [&](auto& entries) { return call.host().targetMapping(handle, entries); });
    }

    TVRSIM_EXPORT HBA_STATUS HBA_SendScsiInquiry(HBA_HANDLE handle, HBA_WWN target, HBA_UINT64 lun, HBA_UINT8 evpd,
                                                 HBA_UINT32 page, void* response, HBA_UINT32 responseSize, void* sense,
                                                 HBA_UINT32 senseSize)
    {
        Call call = callOf(__func__, adapter(handle));
        return call.scsi(response, responseSize, sense, senseSize,
                         [&](ScsiReply& reply)
                         { return call.host().scsi(handle, fromHba(target), lun, inquiryCommand(evpd, page), reply); });
    }

    TVRSIM_EXPORT HBA_STATUS HBA_SendReadCapacity(HBA_HANDLE handle, HBA_WWN target, HBA_UINT64 lun, void* response,
                                                  HBA_UINT32 responseSize, void* sense, HBA_UINT32 senseSize)
    {
        Call call = callOf(__func__, adapter(handle));
        return call.scsi(
            response, responseSize, sense, senseSize,
            [&](ScsiReply& reply)
            { return call.host().scsi(handle, fromHba(target), lun, {ScsiOperation::readCapacity}, reply); });
    }

} // extern "C"
