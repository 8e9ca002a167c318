#include "agent/DriverSetting.h"

#include "agent/Build.h"
#include "foundation/Text.h"
#include "schema/TVRHBA_DriverParamAffectsVirtualFCPort.h"
#include "schema/TVRHBA_DriverParameterAffectsFCPort.h"
#include "schema/TVRHBA_DriverParams.h"
#include "schema/TVRHBA_DriverServiceElementSettingData.h"
#include "schema/TVRHBA_FCHBADriverParamService.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_VPortHostedDependency.h"
#include "schema/TVRHBA_VirtualFCPort.h"

namespace cimple
{

namespace
{

Ref<TVRHBA_DriverParams> makeLane(const Lane& lane)
{
    constexpr std::uint16_t changeableTransient = 1, changeablePersistent = 2;
    Ref<TVRHBA_DriverParams> made = fresh<TVRHBA_DriverParams>();
    made->InstanceID.set(laneName(lane));
    made->Caption.set("TVR:PrioLane");
    made->Description.set("Priority Lane");
    made->ElementName.set("Priority Lane");
    made->ChangeableType.set(lane.option == RM_LANE_CONFIG ? changeablePersistent : changeableTransient);
    made->paramno.set(lane.unit);
    made->deviceID.set(settingDeviceId(lane.path.initiator));
    made->paramname.set("TVR:PrioLane");
    made->lowRange.set(0);
    made->highRange.set(1);
    made->def.set(0);
    made->current.set(1);
    made->exportFlag.set(1);
    made->dynamic.set(0);
    made->help.set("Priority Lane");
    made->Option.set(static_cast<std::uint16_t>(lane.option));
    return made;
}

} // namespace

String settingDeviceId(std::string_view wwpn)
{
    return lowerCase(wwpn);
}

TVRHBA_DriverParams* insertDriverSetting(ProviderAgent& agent, const Ref<TVRHBA_DriverParams>& made,
                                         const TVRHBA_FCPort* port, const TVRHBA_VirtualFCPort* virtualPort)
{
    TVRHBA_DriverParams* parameter =
        mapOf<TVRHBA_DriverParams>(agent).insert(made, "Insert Failed : m_TVRHBA_DriverParams_map");
    if (!parameter)
        return nullptr;
    using OfService = TVRHBA_DriverServiceElementSettingData;
    join<OfService>(agent, &OfService::ManagedElement, mapOf<TVRHBA_FCHBADriverParamService>(agent).first(),
                    &OfService::SettingData, parameter, "Insert Failed : m_TVRHBA_DriverServiceElementSettingData_map",
                    settingFlags<OfService>(parameter->current, parameter->def));
    using OfPort = TVRHBA_DriverParameterAffectsFCPort;
    join<OfPort>(agent, &OfPort::ManagedElement, port, &OfPort::SettingData, parameter,
                 "Insert Failed : m_TVRHBA_DriverParameterAffectsFCPort_map",
                 settingFlags<OfPort>(parameter->current, parameter->def));
    using OfVirtualPort = TVRHBA_DriverParamAffectsVirtualFCPort;
    join<OfVirtualPort>(agent, &OfVirtualPort::ManagedElement, virtualPort, &OfVirtualPort::SettingData, parameter,
                        "Insert Failed : m_TVRHBA_DriverParamAffectsVirtualFCPort_map",
                        settingFlags<OfVirtualPort>(parameter->current, parameter->def));
    return parameter;
}

// --- priority lanes --------------------------------------------------------------------------------------------

const char* LaneInitiator::portName() const
{
    return port->DeviceID.value.c_str();
}

const char* LaneInitiator::virtualName() const
{
    return virtualPort ? virtualPort->DeviceID.value.c_str() : nullptr;
}

LaneInitiator findLanePort(ProviderAgent& agent, std::string_view wwpn)
{
    return {
        mapOf<TVRHBA_FCPort>(agent).findFirst([&](const auto& known) { return known.DeviceID.value.view() == wwpn; })};
}

LaneInitiator findLaneVirtualPort(ProviderAgent& agent, std::string_view wwpn)
{
    const auto* found = mapOf<TVRHBA_VirtualFCPort>(agent).findFirst([&](const auto& known)
                                                                     { return known.DeviceID.value.view() == wwpn; });
    const auto* hosted = found ? mapOf<TVRHBA_VPortHostedDependency>(agent).findFirst(
                                     [&](const auto& known) { return key_eq(known.Dependent, found); })
                               : nullptr;
    return {hosted ? mapOf<TVRHBA_FCPort>(agent).withKeysOf(hosted->Antecedent) : nullptr, found};
}

LaneInitiator findLaneInitiator(ProviderAgent& agent, std::string_view wwpn)
{
    const LaneInitiator physical = findLanePort(agent, wwpn);
    return physical ? physical : findLaneVirtualPort(agent, wwpn);
}

TVRHBA_DriverParams* insertLane(ProviderAgent& agent, const LaneInitiator& initiator, const Lane& lane)
{
    agent.m_lanePaths.insert(lane.path);
    return insertDriverSetting(agent, makeLane(lane), initiator.virtualPort ? nullptr : initiator.port,
                               initiator.virtualPort);
}

bool removeLanes(ProviderAgent& agent, std::string_view namePrefix)
{
    const auto isMeant = [&](const CIM_SettingData& parameter)
    { return parameter.InstanceID.value.view().starts_with(namePrefix); };
    const auto isOfMeant = [&](const auto& association)
    { return association.SettingData && isMeant(*association.SettingData); };
    mapOf<TVRHBA_DriverParameterAffectsFCPort>(agent).removeIf(isOfMeant);
    mapOf<TVRHBA_DriverParamAffectsVirtualFCPort>(agent).removeIf(isOfMeant);
    const std::size_t settings = mapOf<TVRHBA_DriverServiceElementSettingData>(agent).removeIf(isOfMeant);
    return mapOf<TVRHBA_DriverParams>(agent).removeIf(isMeant) == settings;
}

bool removeLane(ProviderAgent& agent, const Lane& lane)
{
    return removeLanes(agent, laneName(lane).view()); // no name begins with another one
}

} // namespace cimple
