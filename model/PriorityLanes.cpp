#include "model/PriorityLanes.h"

#include "agent/Build.h"
#include "agent/DriverSetting.h"
#include "device/TVR_MethodWrapper.h"
#include "model/SanModel.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_DriverParams.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_VPortHostedDependency.h"
#include "schema/TVRHBA_VirtualFCPort.h"
#include "schema/TVRHBA_VirtualSCSIProtocolTargetEndpoint.h"

#include <algorithm>
#include <iterator>
#include <map>
#include <string_view>

namespace cimple
{

namespace
{

constexpr const char* chipTagDescription = "SerialNumber + Sub-AdapterID";
constexpr std::size_t wwnDigits = 16;
constexpr RM_LaneOption options[] = {RM_LANE_DRIVER, RM_LANE_CONFIG};

/// The units of a path, by the running driver.
using UnitsOfPaths = std::map<LanePath, std::vector<RM_OASLun>>;

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

// --- what the library lists ------------------------------------------------------------------------------------

bool hasLane(const RM_OASLun& unit)
{
    return unit.laneState == 1;
}

bool haveAllLanes(const std::vector<RM_OASLun>& units)
{
    return !units.empty() && std::ranges::all_of(units, hasLane);
}

RM_STATUS readUnits(const LaneInitiator& from, const std::string& target, std::uint32_t option,
                    std::vector<RM_OASLun>& units)
{
    return TVR_MethodWrapper::GetOASLunList(from.portName(), target.c_str(), from.virtualName(), option, &units);
}

/// The lane of all units is one as long as each of them is; the number that stands for it names no single unit.
void addLanes(std::set<Lane>& lanes, const LanePath& path, std::uint32_t option, const std::vector<RM_OASLun>& units,
              const std::set<Lane>& former)
{
    for (const RM_OASLun& unit : units)
        if (hasLane(unit) && unit.osLun != allUnits && unit.osLun <= maxLaneUnit)
            lanes.insert({path, option, unit.osLun});
    const Lane all{path, option, allUnits};
    if (former.contains(all) && haveAllLanes(units))
        lanes.insert(all);
}

void addFormer(std::set<Lane>& lanes, const LanePath& path, std::uint32_t option, const std::set<Lane>& former)
{
    lanes.insert(former.lower_bound({path, option, 0}), former.upper_bound({path, option, maxLaneUnit}));
}

/// All lanes that there are. What `known` has is not read again.
std::set<Lane> lanesNow(ProviderAgent& agent, const std::set<Lane>& former, const UnitsOfPaths& known)
{
    std::set<Lane> lanes;
    for (const LanePath& path : agent.m_lanePaths)
    {
        const LaneInitiator from = findLaneInitiator(agent, path.initiator);
        if (!from)
            continue;
        for (const RM_LaneOption option : options)
        {
            const auto place = option == RM_LANE_DRIVER ? known.find(path) : known.end();
            std::vector<RM_OASLun> units;
            if (place != known.end())
                addLanes(lanes, path, option, place->second, former);
            else if (readUnits(from, path.target, option, units) == RM_OK)
                addLanes(lanes, path, option, units, former);
            else
                addFormer(lanes, path, option, former);
        }
    }
    return lanes;
}

void insertLanes(ProviderAgent& agent, const std::set<Lane>& lanes)
{
    for (const Lane& lane : lanes)
        insertLane(agent, findLaneInitiator(agent, lane.path.initiator), lane);
}

// --- with the fabric -------------------------------------------------------------------------------------------

void logRefusal(RM_STATUS status)
{
    if (status == RM_ERROR_NOT_SUPPORTED)
        TVR_LOG(TVR_WARN, "GetOASLunList failed. Unsupported Hardware");
    else if (status == RM_ERROR_FIRMWARE_LACKS)
        TVR_LOG(TVR_WARN, "GetOASLunList failed.");
}

/// Of a pair "WWPN|WWPN" of a port and a remote one. Those whose adapter has lanes join `found`.
void scanPair(HostContext& host, const std::string& pair, UnitsOfPaths& found)
{
    TVR_LOG(TVR_DBG, "Set content: %s", pair.c_str());
    const LanePath path{pair.substr(0, wwnDigits), pair.substr(wwnDigits + 1)};
    const LaneInitiator from = findLanePort(host.agent, path.initiator);
    if (!from)
        return;
    TVR_LOG(TVR_DBG, "Found the FCPort Instance: %s", path.initiator.c_str());
    const String tag = valueDescribedAs(*from.port, chipTagDescription);
    TVR_LOG(TVR_DBG, "SerialNumber + Sub-AdapterID: %s", tag.c_str());
    TVR_LOG(TVR_DBG, "Chip Tag: %s", tag.c_str());
    std::vector<RM_OASLun> units;
    const RM_STATUS status = readUnits(from, path.target, RM_LANE_DRIVER, units);
    if (status != RM_OK)
        return logRefusal(status);
    found.emplace(path, std::move(units));
    TVRHBA_Chip* chip =
        mapOf<TVRHBA_Chip>(host.agent).findFirst([&](const auto& known) { return known.Tag.value == tag; });
    if (chip)
        chip->PrioLaneCapability.set(1);
}

/// The virtual ports on ports that have lanes.
std::set<std::string_view> virtualPortsWithLanes(ProviderAgent& agent, const UnitsOfPaths& found)
{
    std::set<std::string_view> ports, virtualPorts;
    for (const auto& [path, units] : found)
        ports.insert(path.initiator);
    const auto hosted = mapOf<TVRHBA_VPortHostedDependency>(agent);
    for (std::size_t i = 0; const TVRHBA_VPortHostedDependency* one = hosted.at(i); i++)
        if (ports.contains(static_cast<const TVRHBA_FCPort*>(one->Antecedent)->DeviceID.value.view()))
            virtualPorts.insert(static_cast<const TVRHBA_VirtualFCPort*>(one->Dependent)->DeviceID.value.view());
    return virtualPorts;
}

/// From virtual ports to the targets of their units.
void addVirtualPaths(ProviderAgent& agent, const UnitsOfPaths& found, std::set<LanePath>& paths)
{
    const std::set<std::string_view> virtualPorts = virtualPortsWithLanes(agent, found);
    const auto endpoints = mapOf<TVRHBA_VirtualSCSIProtocolTargetEndpoint>(agent);
    for (std::size_t i = 0; const auto* endpoint = endpoints.at(i); i++)
    {
        const std::string_view name = endpoint->Name.value.view(); // WWPN:WWPN:unit
        if (virtualPorts.contains(name.substr(0, wwnDigits)))
            paths.insert({std::string(name.substr(0, wwnDigits)), std::string(name.substr(wwnDigits + 1, wwnDigits))});
    }
}

void replaceLanes(ProviderAgent& agent, const UnitsOfPaths& found)
{
    const std::set<Lane> former = priorityLanes(agent);
    std::set<LanePath> paths;
    for (const auto& [path, units] : found)
        paths.insert(path);
    addVirtualPaths(agent, found, paths);
    for (const Lane& lane : former)
        paths.insert(lane.path);
    agent.m_lanePaths = std::move(paths);
    const std::set<Lane> now = lanesNow(agent, former, found);
    for (const Lane& lane : former)
        if (!now.contains(lane))
            removeLane(agent, lane);
    std::set<Lane> added;
    std::ranges::set_difference(now, former, std::inserter(added, added.end()));
    insertLanes(agent, added);
}

} // namespace

std::uint32_t scanPriorityLanes(HostContext& host)
{
    if (host.remotePorts.empty())
        TVR_LOG(TVR_WARN, "No entries in the set");
    UnitsOfPaths found;
    for (const std::string& pair : host.remotePorts)
        scanPair(host, pair, found);
    replaceLanes(host.agent, found);
    return BUILD_DONE;
}

std::uint32_t createPriorityLanes(HostContext& host)
{
    restorePriorityLanes(host.agent, {});
    return BUILD_DONE;
}

std::set<Lane> priorityLanes(ProviderAgent& agent)
{
    std::set<Lane> lanes;
    const auto map = mapOf<TVRHBA_DriverParams>(agent);
    for (std::size_t i = 0; const TVRHBA_DriverParams* parameter = map.at(i); i++)
        if (auto lane = parseLane(parameter->InstanceID.value.view()))
            lanes.insert(std::move(*lane));
    return lanes;
}

void restorePriorityLanes(ProviderAgent& agent, const std::set<Lane>& former)
{
    insertLanes(agent, lanesNow(agent, former, {}));
}

void refreshPriorityLane(ProviderAgent& agent, const Lane& lane)
{
    const LaneInitiator from = findLaneInitiator(agent, lane.path.initiator);
    std::vector<RM_OASLun> units;
    if (!from || readUnits(from, lane.path.target, lane.option, units) != RM_OK)
        return;
    std::set<Lane> lanes;
    addLanes(lanes, lane.path, lane.option, units, {lane});
    if (!lanes.contains(lane))
        removeLane(agent, lane);
}

} // namespace cimple
