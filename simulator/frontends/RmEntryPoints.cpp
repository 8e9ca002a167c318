// Functions of the RM library whose names begin with RM_ in both libraries.
#include "simulator/frontends/FrontEnd.h"

using namespace tvrsim;

extern "C"
{

    TVRSIM_EXPORT RM_GetAttributeValue_t RM_GetAttributeValue;
    TVRSIM_EXPORT RM_GetVersion_t RM_GetVersion;
    TVRSIM_EXPORT RM_MiliVersion_t RM_MiliVersion;
    TVRSIM_EXPORT RM_StatusString_t RM_StatusString;
    TVRSIM_EXPORT RM_IsLocalHBA_t RM_IsLocalHBA;
    TVRSIM_EXPORT RM_GetNumberOfLocalAdapters_t RM_GetNumberOfLocalAdapters;
    TVRSIM_EXPORT RM_GetLocalHBAInfo_t RM_GetLocalHBAInfo;
    TVRSIM_EXPORT RM_ValidateWwn_t RM_ValidateWwn;
    TVRSIM_EXPORT RM_ImportHBAFileA_t RM_ImportHBAFileA;
    TVRSIM_EXPORT RM_VerifyFirmwareA_t RM_VerifyFirmwareA;

    const void* RM_GetAttributeValue(const void* buffer, std::uint32_t id, std::uint32_t* length, RM_STATUS* status)
    {
        const void* found = nullptr;
        Call call = callOf(__func__);
        const RM_STATUS result = call.status(
            [&]() -> RM_STATUS
            {
                if (!buffer)
                    return RM_ERROR;
                const std::span value = findAttribute({static_cast<const std::byte*>(buffer), usedBytes(buffer)}, id);
                if (!value.data())
                    return RM_ERROR;
                found = value.data();
                if (length)
                    *length =
                        call.isHostile(Hostile::hugeLength) ? 0xFFFF'FFFF : static_cast<std::uint32_t>(value.size());
                return RM_OK;
            });
        if (status)
            *status = result;
        return found;
    }

    RM_STATUS RM_GetVersion(char* buffer, std::uint32_t size)
    {
        Call call = callOf(__func__);
        return call.text(buffer, size, [&](std::string& text) { return call.host().libraryVersion(text); });
    }

    RM_STATUS RM_MiliVersion(char* buffer, std::uint32_t size)
    {
        Call call = callOf(__func__);
        return call.text(buffer, size, [&](std::string& text) { return call.host().miliVersion(text); });
    }

    RM_STATUS RM_StatusString(RM_STATUS status, char* buffer, std::uint32_t size)
    {
        Call call = callOf(__func__);
        return call.text(buffer, size, [&](std::string& text) { return call.host().statusText(status, text); });
    }

    RM_STATUS RM_IsLocalHBA(HBA_WWN wwpn, std::uint32_t* isLocal)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.record(isLocal, [&](std::uint32_t& out) { return call.host().isLocal(fromHba(wwpn), out); });
    }

    std::uint32_t RM_GetNumberOfLocalAdapters()
    {
        Call call = callOf(__func__);
        if (call.isHostile(Hostile::hugeCount))
            return 0xFFFF'FFFF;
        return call.fails() ? 0 : call.host().localPortCount();
    }

    RM_STATUS RM_GetLocalHBAInfo(std::uint32_t index, RM_LocalHBAInfo* info)
    {
        Call call = callOf(__func__);
        return call.record(info, [&](auto& record) { return call.host().localPort(index, record); });
    }

    RM_STATUS RM_ValidateWwn(HBA_WWN wwn)
    {
        Call call = callOf(__func__, port(wwn));
        return call.status([&] { return call.host().validateName(fromHba(wwn)); });
    }

    RM_STATUS RM_ImportHBAFileA(const char* file)
    {
        Call call = callOf(__func__);
        return call.status([&] { return call.host().importFile(file); });
    }

    RM_STATUS RM_VerifyFirmwareA(std::uint32_t, std::uint32_t, HBA_WWN wwpn, const char* file)
    {
        Call call = callOf(__func__, port(wwpn));
        return call.status([&] { return call.host().verifyFirmware(fromHba(wwpn), file); });
    }

} // extern "C"
