// Priority lanes: units that an adapter serves before others. Which chips can do that is seen with the SAN.
#include "agent/Build.h"
#include "device/TVR_MethodWrapper.h"
#include "model/SanModel.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_FCPort.h"

namespace cimple
{

namespace
{

constexpr const char* chipTagDescription = "SerialNumber + Sub-AdapterID";
constexpr std::size_t wwnDigits = 16;

/// The value that a port has under a description; empty if there is none.
String valueDescribedAs(const TVRHBA_FCPort& port, const char* description)
{
    const Array<String>& descriptions = port.IdentifyingDescriptions.value;
    const Array<String>& values = port.OtherIdentifyingInfo.value;
    for (std::size_t i = 0; i < descriptions.size() && i < values.size(); i++)
        if (descriptions[i] == description)
            return values[i];
    return {};
}

void logRefusal(RM_STATUS status)
{
    if (status == RM_ERROR_NOT_SUPPORTED)
        TVR_LOG(TVR_WARN, "GetOASLunList failed. Unsupported Hardware");
    else if (status == RM_ERROR_FIRMWARE_LACKS)
        TVR_LOG(TVR_WARN, "GetOASLunList failed.");
}

/// Of a pair "WWPN|WWPN" of a port and a remote one.
void scanPair(HostContext& host, const std::string& pair)
{
    TVR_LOG(TVR_DBG, "Set content: %s", pair.c_str());
    const std::string wwpn = pair.substr(0, wwnDigits);
    const std::string remote = pair.substr(wwnDigits + 1);
    const TVRHBA_FCPort* port = mapOf<TVRHBA_FCPort>(host.agent)
                                    .findFirst([&](const auto& known) { return known.DeviceID.value == wwpn.c_str(); });
    if (!port)
        return;
    TVR_LOG(TVR_DBG, "Found the FCPort Instance: %s", wwpn.c_str());
    const String tag = valueDescribedAs(*port, chipTagDescription);
    TVR_LOG(TVR_DBG, "SerialNumber + Sub-AdapterID: %s", tag.c_str());
    TVR_LOG(TVR_DBG, "Chip Tag: %s", tag.c_str());
    std::vector<RM_OASLun> lanes;
    const RM_STATUS status =
        TVR_MethodWrapper::GetOASLunList(wwpn.c_str(), remote.c_str(), nullptr, RM_LANE_DRIVER, &lanes);
    if (status != RM_OK)
        return logRefusal(status);
    TVRHBA_Chip* chip =
        mapOf<TVRHBA_Chip>(host.agent).findFirst([&](const auto& known) { return known.Tag.value == tag; });
    if (chip)
        chip->PrioLaneCapability.set(1);
}

} // namespace

std::uint32_t scanPriorityLanes(HostContext& host)
{
    if (host.remotePorts.empty())
        TVR_LOG(TVR_WARN, "No entries in the set");
    for (const std::string& pair : host.remotePorts)
        scanPair(host, pair);
    return BUILD_DONE;
}

} // namespace cimple
