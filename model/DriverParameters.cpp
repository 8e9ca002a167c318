#include "model/DriverParameters.h"

#include "agent/Build.h"
#include "agent/DriverSetting.h"
#include "device/ForeignText.h"
#include "device/TVR_MethodWrapper.h"
#include "model/LiveRefresh.h"
#include "model/PortVirtualization.h"
#include "model/PriorityLanes.h"
#include "schema/TVRHBA_DriverParamGlobal.h"
#include "schema/TVRHBA_DriverParameterAffectsFCPort.h"
#include "schema/TVRHBA_DriverParams.h"
#include "schema/TVRHBA_DriverServiceElementSettingData.h"
#include "schema/TVRHBA_FCHBADriverParamService.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_GlobalDriverServiceElementSettingData.h"

#include <algorithm>
#include <vector>

namespace cimple
{

namespace
{

/// The parameters of one port that its map is to hold.
struct PortParameters
{
    const TVRHBA_FCPort* port;
    std::vector<Ref<TVRHBA_DriverParams>> parameters;
};

/// What both kinds of parameters have.
template <class Parameter> void fill(Parameter& made, std::uint32_t number, const RM_DriverParam& record)
{
    constexpr std::uint16_t changeablePersistent = 2;
    const String name(foreignText(record.name));
    const String help(foreignText(record.help));
    made.Caption.set("FC driver parameter");
    made.Description.set(help);
    made.ElementName.set(name);
    made.ChangeableType.set(changeablePersistent);
    made.paramno.set(number);
    made.paramname.set(name);
    made.lowRange.set(record.lowRange);
    made.highRange.set(record.highRange);
    made.current.set(record.current);
    made.exportFlag.set(record.exportFlag);
    made.dynamic.set(record.dynamic);
    made.help.set(help);
}

/// Makes an instance of each record by `make(number, record)`.
template <class Make> auto makeEach(const std::vector<RM_DriverParam>& records, Make make)
{
    std::vector<decltype(make(0, records[0]))> made;
    made.reserve(records.size());
    for (std::uint32_t number = 0; number < records.size(); number++)
    {
        TVR_LOG(TVR_DBG, "saving the values of driver parameter %d", static_cast<int>(number));
        made.push_back(make(number, records[number]));
    }
    return made;
}

/// What the map has of a port, without its priority lanes.
std::vector<Ref<TVRHBA_DriverParams>> presentOf(ProviderAgent& agent, const String& deviceId)
{
    std::vector<Ref<TVRHBA_DriverParams>> present;
    const TypedMap<TVRHBA_DriverParams> map = mapOf<TVRHBA_DriverParams>(agent);
    for (std::size_t i = 0; TVRHBA_DriverParams* entry = map.at(i); i++)
        if (entry->deviceID.value == deviceId && !parseLane(entry->InstanceID.value.view()))
        {
            ref(entry);
            present.emplace_back(entry);
        }
    return present;
}

PortParameters readPort(ProviderAgent& agent, const TVRHBA_FCPort& port)
{
    const String& id = port.DeviceID.value;
    const String deviceId = settingDeviceId(id.view());
    std::vector<RM_DriverParam> records;
    if (TVR_MethodWrapper::tvrcimGetDriverParam(id.c_str(), &records) != RM_OK)
        return {&port, presentOf(agent, deviceId)};
    return {&port, makeEach(records,
                            [&](std::uint32_t number, const RM_DriverParam& record)
                            {
                                Ref<TVRHBA_DriverParams> made = fresh<TVRHBA_DriverParams>();
                                made->InstanceID.set(formatText("%s:%s", id.c_str(), foreignText(record.name).c_str()));
                                fill(*made, number, record);
                                made->deviceID.set(deviceId);
                                made->def.set(record.def);
                                return made;
                            })};
}

void insert(ProviderAgent& agent, const TVRHBA_FCHBADriverParamService* service,
            const Ref<TVRHBA_DriverParamGlobal>& made)
{
    const TVRHBA_DriverParamGlobal* parameter =
        mapOf<TVRHBA_DriverParamGlobal>(agent).insert(made, "Insert Failed : m_TVRHBA_DriverParamGlobal_map");
    using OfService = TVRHBA_GlobalDriverServiceElementSettingData;
    if (parameter)
        join<OfService>(agent, &OfService::ManagedElement, service, &OfService::SettingData, parameter,
                        "Insert Failed : m_TVRHBA_GlobalDriverServiceElementSettingData_map",
                        settingFlags<OfService>(parameter->current, parameter->glbl));
}

/// Gives the parameters of one port their present values. False if they are no longer the same parameters.
bool updateParameters(ProviderAgent& agent, const TVRHBA_FCPort& port)
{
    std::vector<RM_DriverParam> records;
    if (TVR_MethodWrapper::tvrcimGetDriverParam(port.DeviceID.value.c_str(), &records) != RM_OK)
        return true;
    const std::vector<Ref<TVRHBA_DriverParams>> present = presentOf(agent, settingDeviceId(port.DeviceID.value.view()));
    const auto isOf = [](const Ref<TVRHBA_DriverParams>& parameter, const RM_DriverParam& record)
    { return parameter->paramname.value == String(foreignText(record.name)); };
    if (!std::ranges::equal(present, records, isOf))
        return false;
    for (std::uint32_t number = 0; number < records.size(); number++)
    {
        TVR_LOG(TVR_DBG, "saving the values of driver parameter %d", static_cast<int>(number));
        fill(*present[number], number, records[number]);
        present[number]->def.set(records[number].def);
    }
    return true;
}

/// The caller holds the data mutex. A port whose list the library does not give keeps what it has. Priority lanes go.
void rebuildDriverParameters(ProviderAgent& agent)
{
    const TypedMap<TVRHBA_FCPort> ports = mapOf<TVRHBA_FCPort>(agent);
    std::vector<PortParameters> all;
    for (std::size_t i = 0; const TVRHBA_FCPort* port = ports.at(i); i++)
        all.push_back(readPort(agent, *port));

    mapOf<TVRHBA_DriverParams>(agent).clear();
    mapOf<TVRHBA_DriverServiceElementSettingData>(agent).clear();
    mapOf<TVRHBA_DriverParameterAffectsFCPort>(agent).clear();
    for (const PortParameters& of : all)
        for (const Ref<TVRHBA_DriverParams>& parameter : of.parameters)
            insertDriverSetting(agent, parameter, of.port, nullptr);
    rebuildVirtualPortParameters(agent);
}

/// The same of those for all adapters.
void rebuildGlobalDriverParameters(ProviderAgent& agent)
{
    std::vector<RM_DriverParam> records;
    if (TVR_MethodWrapper::tvrcimGetDriverParam(nullptr, &records) != RM_OK)
        return;
    const auto parameters =
        makeEach(records,
                 [](std::uint32_t number, const RM_DriverParam& record)
                 {
                     Ref<TVRHBA_DriverParamGlobal> made = fresh<TVRHBA_DriverParamGlobal>();
                     made->InstanceID.set(formatText("Global:%s", foreignText(record.name).c_str()));
                     fill(*made, number, record);
                     made->glbl.set(record.def);
                     return made;
                 });
    mapOf<TVRHBA_DriverParamGlobal>(agent).clear();
    mapOf<TVRHBA_GlobalDriverServiceElementSettingData>(agent).clear();
    const auto* service = mapOf<TVRHBA_FCHBADriverParamService>(agent).first();
    for (const Ref<TVRHBA_DriverParamGlobal>& parameter : parameters)
        insert(agent, service, parameter);
}

} // namespace

/// A get reads the parameters of the one port, or the one lane, as the associators of a service get each of them.
template <> void liveRefresh<TVRHBA_DriverParams>(ProviderAgent& agent, const Selection& selection)
{
    const SharedEnds ends;
    const auto* wanted = selection.keys ? mapOf<TVRHBA_DriverParams>(agent).withKeysOf(selection.keys) : nullptr;
    if (const auto lane = wanted ? parseLane(wanted->InstanceID.value.view()) : std::nullopt)
        return refreshPriorityLane(agent, *lane);
    const auto* port = wanted ? mapOf<TVRHBA_FCPort>(agent).findFirst(
                                    [&](const TVRHBA_FCPort& known)
                                    { return settingDeviceId(known.DeviceID.value.view()) == wanted->deviceID.value; })
                              : nullptr;
    if (port && updateParameters(agent, *port))
        return;
    const std::set<Lane> lanes = priorityLanes(agent);
    rebuildDriverParameters(agent);
    restorePriorityLanes(agent, lanes);
}

template <> void liveRefresh<TVRHBA_DriverParamGlobal>(ProviderAgent& agent, const Selection&)
{
    const SharedEnds ends;
    rebuildGlobalDriverParameters(agent);
}

std::uint32_t createDriverParameters(HostContext& host)
{
    rebuildDriverParameters(host.agent);
    rebuildGlobalDriverParameters(host.agent);
    return BUILD_DONE;
}

} // namespace cimple
