// The functions for frame tagging: in libtvrsim_tagging.so, and the closing of an adapter in the fallback RM library.
#include "simulator/frontends/FrontEnd.h"

using namespace tvrsim;

namespace
{

/// The subject of a call for an adapter that is open for tagging.
Call::Subject tagAdapter(std::uint32_t handle)
{
    return [handle] { return tvrsim_simulation()->host.tagAdapterOf(handle); };
}

} // namespace

extern "C"
{

    // The declarations tie each signature to that of the library's header.
    TVRSIM_EXPORT CPQFC_GetNumberOfAdapters_t CPQFC_GetNumberOfAdapters;
    TVRSIM_EXPORT CPQFC_OpenAdapter_t CPQFC_OpenAdapter;
    TVRSIM_EXPORT CPQFC_CloseAdapter_t CPQFC_CloseAdapter;
    TVRSIM_EXPORT CPQFC_QoSGetConfig_t CPQFC_QoSGetConfig;
    TVRSIM_EXPORT CPQFC_QoSSetConfig_t CPQFC_QoSSetConfig;
    TVRSIM_EXPORT CPQFC_QoSGetGlobalFlag_t CPQFC_QoSGetGlobalFlag;
    TVRSIM_EXPORT CPQFC_QoSSetGlobalFlag_t CPQFC_QoSSetGlobalFlag;

    std::uint32_t CPQFC_GetNumberOfAdapters()
    {
        Call call = callOf(__func__);
        if (call.isHostile(Hostile::hugeCount))
            return 0xFFFF'FFFF;
        return call.fails() ? 0 : call.host().tagAdapterCount();
    }

    RM_STATUS CPQFC_OpenAdapter(const char* name, std::uint32_t* handle)
    {
        Call call = callOf(__func__, [name] { return std::string(name ? name : ""); });
        return call.record(name ? handle : nullptr,
                           [&](std::uint32_t& out) { return call.host().openTagAdapter(name, out); });
    }

    void CPQFC_CloseAdapter(std::uint32_t handle)
    {
        Call call = callOf(__func__, tagAdapter(handle));
        if (!call.fails())
            call.host().closeTagAdapter(handle);
    }

    RM_STATUS CPQFC_QoSGetConfig(std::uint32_t handle, CPQFC_QosTable* table)
    {
        Call call = callOf(__func__, tagAdapter(handle));
        const bool asksForTheNumber = !call.fails() && table && table->count == 0;
        const RM_STATUS status = call.list(table, &CPQFC_QosTable::count,
                                           [&](auto& entries) { return call.host().tagTable(handle, entries); });
        return asksForTheNumber && status == RM_ERROR_MORE_DATA ? RM_STATUS{RM_OK} : status;
    }

    RM_STATUS CPQFC_QoSSetConfig(std::uint32_t handle, const CPQFC_QosTable* table)
    {
        Call call = callOf(__func__, tagAdapter(handle));
        return call.status(
            [&]
            {
                return table ? call.host().setTagTable(handle, {table->entry, table->entry + table->count})
                             : RM_STATUS{HBA_STATUS_ERROR_ARG};
            });
    }

    RM_STATUS CPQFC_QoSGetGlobalFlag(std::uint32_t handle, std::uint32_t* state)
    {
        Call call = callOf(__func__, tagAdapter(handle));
        return call.record(state, [&](std::uint32_t& out) { return call.host().tagging(handle, out); });
    }

    RM_STATUS CPQFC_QoSSetGlobalFlag(std::uint32_t handle, std::uint32_t state)
    {
        Call call = callOf(__func__, tagAdapter(handle));
        return call.status([&] { return call.host().setTagging(handle, state); });
    }

} // extern "C"
