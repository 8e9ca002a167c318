// Emptying the maps that the refresh rebuilds: those of the adapters, and those of the SAN.
#include "agent/ClassCatalog.h"
#include "agent/LogText.h"
#include "agent/ProviderAgent.h"

namespace cimple
{

namespace
{

/// A group that the adapter refresh empties, with what the log says before and after.
struct Clearing
{
    MapGroup group;
    LogText before = {};
    LogText after = {};
};

constexpr Clearing adapterClearing[] = {
    {MapGroup::Adapter},
    {MapGroup::Dump},
    {MapGroup::RecordLog, {TVR_DBG, "Clearing Record Log maps"}},
    {MapGroup::SoftwareUpdate, {TVR_DBG, "Clearing SoftwareUpdate maps"}},
    {MapGroup::SoftwareUpdateAssociations, {TVR_DBG, "Clearing Software Update maps"}},
    {MapGroup::DriverLog},
    {MapGroup::PortVirtualization},
    {MapGroup::Diagnostics, {TVR_DBG, "Clearing TVR CDM maps"}, {TVR_DBG, "Done with Clearing CDM maps"}},
};

} // namespace

void ProviderAgent::clearAdapterMaps()
{
    TVR_LOG(TVR_DBG, "PERF: Entered clearAdapterMaps()");
    try
    {
        for (const Clearing& row : adapterClearing)
        {
            row.before.log();
            clearGroup(*this, row.group);
            row.after.log();
        }
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Error in clearAdapterMaps()");
    }
    TVR_LOG(TVR_DBG, "Exiting clearAdapterMaps()");
}

void ProviderAgent::clearSANMaps()
{
    TVR_LOG(TVR_DBG, "PERF: Entered clearSANMaps()");
    try
    {
        clearGroup(*this, MapGroup::San);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Error in clearSANMaps()");
    }
    TVR_LOG(TVR_DBG, "Exiting clearSANMaps()");
}

} // namespace cimple
