#include "device/Data.h"

#include "device/Bindings.h"
#include "device/FCAdapter.h"
#include "device/FreePart.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <cstring>
#include <string_view>

namespace cimple
{

namespace
{

/// Room for a name, in bytes. The API gives a name at most 256, and its common library copies without a bound.
constexpr std::size_t nameRoom = 256;
constexpr std::size_t nameReserve = 4096;

/// The common library can report more adapters at each refresh; no host has more than this.
constexpr std::uint32_t maxAdapters = 4096;

/// Function types that are no Fibre Channel functions.
bool isOtherFunction(std::uint32_t type)
{
    return type >= 1 && type <= 3;
}

/// Network functions of converged cards, which the API lists beside the others.
bool isNetworkName(std::string_view name)
{
    return name.starts_with("Tavrin-O") || name.starts_with("Tavrin-N");
}

std::uint32_t adaptersReported()
try
{
    return HBA_GetNumberOfAdapters();
}
catch (...)
{
    note_missing_memory();
    TVR_LOG(TVR_ERR, "HBA_GetNumberOfAdapters failed");
    return 0;
}

} // namespace

Data::Data()
{
    HBA_LoadLibrary();
    resolveAbsentEntries();
    TVR_LOG(TVR_DBG, "Data Pointer Constructed.");
}

Data::~Data()
{
    freeAllData();
    TVR_LOG(TVR_DBG, "Data Pointer deleted.");
}

void Data::buildAdapterData()
{
    TVR_LOG(TVR_DBG, "buildAdapterData");
    freeAllData();
    TVR_LOG(TVR_DBG, "buildAdapterData - with hbaapi");
    const std::uint32_t reported = adaptersReported();
    TVR_LOG(TVR_DBG, "Number of Adapters detected = %u", reported);
    if (reported == 0)
    {
        TVR_LOG(TVR_CRIT, "HBAAPI reports that there are NO HBAs in the system.");
        return;
    }
    const std::uint32_t count = std::min(reported, maxAdapters);
    adapterCount = count;
    for (std::uint32_t number = 0; number < count; ++number)
        if (!keepAdapter(number))
            --adapterCount;
}

/// False if the adapter was skipped.
bool Data::keepAdapter(std::uint32_t number)
try
{
    char name[nameReserve] = {};
    if (const HBA_STATUS status = HBA_GetAdapterName(number, name); status != HBA_STATUS_OK)
    {
        TVR_LOG(TVR_WARN, "Error hbaStatus = %d, Skipping Adapter# %u", status, number);
        return false;
    }
    name[nameRoom - 1] = 0;
    if (isNetworkName(name))
        return false;
    TVR_LOG(TVR_DBG, "FC AdapterName : [%s]", name);
    auto adapter = std::make_unique<FCAdapter>(name, number);
    TVR_LOG(TVR_DBG, "Adapter Function type : %d", adapter->functionType);
    if (isOtherFunction(adapter->functionType))
        return false;
    adapters.reserve(adapters.size() + 1);
    ports.insert(ports.end(), adapter->ports.begin(), adapter->ports.end());
    adapters.push_back(adapter.release());
    dataValid = true;
    return true;
}
catch (...)
{
    note_missing_memory();
    TVR_LOG(TVR_ERR, "Catch ALL error during creating adapter..., Skipping Adapter# %d", number);
    return false;
}

void Data::buildSANData()
{
    TVR_LOG(TVR_DBG, "buildSANData");
    for (Adapter* adapter : adapters)
        try
        {
            TVR_LOG(TVR_DBG, "Target Scan from adapter: %s", adapter->name.c_str());
            adapter->rescanTargets();
        }
        catch (...)
        {
            note_missing_memory();
            TVR_LOG(TVR_ERR, "Issue with Target Rescan with Adapter- moving to the next adapter");
        }
}

void Data::freeAllData()
{
    TVR_LOG(TVR_DBG, "freeAllData: Entry");
    for (Adapter* adapter : adapters)
        freePart(TVR_ERR, "Error in freeAllData -- do nothing",
                 [&]
                 {
                     std::unique_ptr<Adapter> owned(adapter);
                     TVR_LOG(TVR_DBG, "Freeing adapter: %s", owned->name.c_str());
                 });
    adapters.clear();
    ports.clear();
    adapterCount = 0;
    dataValid = false;
    TVR_LOG(TVR_DBG, "freeAllData: cleanExit");
}

} // namespace cimple
