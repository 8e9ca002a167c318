// What stands at a port: beacon, transceiver, flash memory, and its reset.
#include "device/TVR_MethodWrapper.h"

#include "device/Bindings.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <new>
#include <utility>

namespace cimple
{

namespace
{

constexpr std::uint32_t wrongArgument = 32968;

// Values of CIM_FCPort.LocationIndicator.
constexpr std::uint16_t unknown = 0;
constexpr std::uint16_t on = 2;
constexpr std::uint16_t off = 3;
constexpr std::uint16_t notSupported = 4;

const char* textOf(std::uint32_t state)
{
    switch (state)
    {
    case RM_BEACON_NOT_AVAILABLE:
        return "Not available";
    case RM_BEACON_OFF:
        return "Off";
    case RM_BEACON_ON:
        return "On";
    default:
        return "Unknown";
    }
}

/// Value for a status other than success.
std::uint16_t withoutState(RM_STATUS status)
{
    switch (status)
    {
    case RM_ERROR_NOT_SUPPORTED:
        TVR_LOG(TVR_DBG, "Beaconing not supported on host or adapter");
        return notSupported;
    case RM_ERROR_DIAGNOSTICS_NOT_AVAILABLE:
        TVR_LOG(TVR_DBG, "Diagnostics not available");
        return notSupported;
    default:
        TVR_LOG(TVR_DBG, "Unable to get the beacon state");
        return unknown;
    }
}

} // namespace

std::uint32_t TVR_MethodWrapper::GetBeaconState(const char* deviceId, std::uint16_t* value)
{
    if (!value)
    {
        TVR_LOG(TVR_DBG, "INVALID Parameter");
        return wrongArgument;
    }
    HBA_WWN wwpn;
    if (idToWwn(&wwpn, deviceId) != 0)
        return wrongArgument;
    std::uint32_t state = RM_BEACON_NOT_AVAILABLE;
    if (const RM_STATUS status = LRM_DiagBeaconState(wwpn, &state); status != RM_OK)
    {
        *value = withoutState(status);
        return 0;
    }
    TVR_LOG(TVR_DBG, "Beacon state = '%s'\n", textOf(state));
    if (state == RM_BEACON_ON)
        *value = on;
    else if (state == RM_BEACON_OFF)
        *value = off;
    return 0;
}

std::uint32_t TVR_MethodWrapper::SetBeaconState(const HBA_WWN& wwpn, std::uint16_t value)
{
    if (value != on && value != off)
        return wrongArgument;
    const std::uint32_t state = value == on ? RM_BEACON_ON : RM_BEACON_OFF;
    if (LRM_DiagBeacon(wwpn, state) == RM_OK)
        TVR_LOG(TVR_DBG, "Successfully set the beacon state");
    else
        TVR_LOG(TVR_DBG, "Failed to set the beacon state to %d ", state);
    return 0;
}

RM_STATUS TVR_MethodWrapper::tvrcimReset(const HBA_WWN& wwpn)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::tvrcimReset");
    const RM_STATUS status = LRM_ResetHBA(wwpn, 1);
    if (status == RM_OK)
        TVR_LOG(TVR_WARN, "WWN %s is reset", hbaNameToString(wwpn).c_str());
    else
        logStatus(status);
    return status;
}

RM_STATUS TVR_MethodWrapper::tvrcimGetDigitalDiagnosticsData(const char* deviceId, std::unique_ptr<RM_SffData>& data)
{
    HBA_WWN wwpn;
    if (idToWwn(&wwpn, deviceId) != 0)
        return RM_ERROR;
    std::unique_ptr<RM_SffData> buffer(new (std::nothrow) RM_SffData{});
    if (!buffer)
    {
        ++left_out_for_memory;
        TVR_LOG(TVR_DBG, "ERROR: tvrcimGetDigitalDiagnosticsData: Error - Unable to allocate buffer.");
        return RM_ERROR_NO_MEMORY;
    }
    const RM_STATUS status = LRM_GetSffData(wwpn, buffer.get());
    if (status == RM_OK)
        data = std::move(buffer);
    else
        TVR_LOG(TVR_DBG, "Unable to obtain transceiver data for this host bus adapter.");
    return status;
}

RM_STATUS TVR_MethodWrapper::GetFlashContents(const char* deviceId, std::vector<RM_FlashRegion>& regions)
{
    HBA_WWN wwpn;
    if (idToWwn(&wwpn, deviceId) != 0)
        return RM_ERROR;
    const std::unique_ptr<RM_FlashList> list(new (std::nothrow) RM_FlashList{});
    if (!list)
        ++left_out_for_memory;
    const RM_STATUS status = list ? LRM_DiagGetLoadListParams(wwpn, list.get()) : RM_STATUS{RM_ERROR_NO_MEMORY};
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "Failed to retrieve the flash contents. Exited with ErrorCode %d", status);
        return status;
    }
    // A count of 0 wraps around, and so is the most that a list has.
    const std::uint32_t count = std::min<std::uint32_t>(list->count - 1, RM_MAX_FLASH_REGIONS);
    regions.assign(list->entry, list->entry + count);
    return RM_OK;
}

} // namespace cimple
