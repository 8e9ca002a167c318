#include "device/TargetMapping.h"

#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <cstddef>

namespace cimple
{

namespace
{

/// Bound for the room that a library may ask for: 20 MB of entries.
constexpr std::uint32_t maxEntries = 65536;

constexpr int maxTries = 3;

} // namespace

TargetMapping::TargetMapping(const HbaAdapter& adapter)
{
    const HBA_STATUS status = fetch(adapter);
    if (!_mapping)
        return;
    const std::uint32_t count = std::min(_mapping->NumberOfEntries, _room);
    if (count == 0)
        TVR_LOG(TVR_DBG, "HBA_GetFcpTargetMapping_t() found no target mappings");
    if (status == HBA_STATUS_OK)
        _entries = {_mapping->entry, count};
}

HBA_STATUS TargetMapping::fetch(const HbaAdapter& adapter)
{
    HBA_STATUS status = HBA_STATUS_ERROR;
    for (int i = 0; i < maxTries; ++i)
    {
        TVR_LOG(TVR_DBG, "To retry the HBA_GetFcpTargetMapping command");
        TVR_LOG(TVR_DBG, "Deleting the allocated memory");
        if (!allocate())
        {
            ++left_out_for_memory;
            TVR_LOG(TVR_CRIT, "Could not allocate memory..break ");
            return status;
        }
        status = HBA_GetFcpTargetMapping(adapter.handle(), _mapping.get());
        if (status == HBA_STATUS_OK)
        {
            TVR_LOG(TVR_DBG, "All Ok ...break ");
            break;
        }
        if (status == HBA_STATUS_ERROR_STALE_DATA)
        {
            HBA_RefreshInformation(adapter.handle());
            TVR_LOG(TVR_DBG, "Refresh and retry ... ");
        }
        else if (status == HBA_STATUS_ERROR_MORE_DATA)
        {
            _room = std::min(_mapping->NumberOfEntries, maxEntries);
            TVR_LOG(TVR_DBG, "Increasing the buffer to = %d", _room);
        }
        else
        {
            _mapping.reset();
            TVR_LOG(TVR_ERR, "Error hbaStatus=%d", status);
            return status;
        }
    }
    TVR_LOG(TVR_DBG, "Successful target info fetched");
    return status;
}

bool TargetMapping::allocate()
{
    _mapping.reset();
    const std::size_t size = offsetof(HBA_FCPTARGETMAPPING, entry) + std::size_t(_room) * sizeof(HBA_FCPSCSIENTRY);
    // Never below the record itself, whose one entry a library may touch.
    _mapping.reset(static_cast<HBA_FCPTARGETMAPPING*>(std::calloc(1, std::max(size, sizeof(HBA_FCPTARGETMAPPING)))));
    if (_mapping)
        _mapping->NumberOfEntries = _room;
    return _mapping != nullptr;
}

} // namespace cimple
