#include "services/DriverParameterService.h"

#include "agent/DriverSetting.h"
#include "agent/MethodCall.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_SCSIProtocolEndpoint.h"
#include "schema/TVRHBA_VirtualSCSIProtocolTargetEndpoint.h"
#include "services/DriverParameterCalls.h"

#include <string>

namespace cimple
{

namespace
{

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of HBA Driver Parameter Service"},
    .noTarget = {TVR_ERR, "TVRHBA_FCHBADriverParamService_Provider invald fc port ...return"},
    .unknownTarget = {TVR_ERR, "TVRHBA_FCHBADriverParamService_Provider invald fc port ...return"},
    .noPlainName = {TVR_DBG, "TVRHBA_FCHBADriverParamService_Provider::Id2HBAName failed"},
    .noWwn = {TVR_DBG, "TVRHBA_FCHBADriverParamService_Provider::str2HBAName failed"},
};

/// A flag that the client did not send is not set.
std::uint8_t flag(const Property<std::uint8_t>& property)
{
    return property.null ? 0 : property.value;
}

const char* textOrNull(const Property<String>& property)
{
    return property.null ? nullptr : property.value.c_str();
}

std::string textOf(const Property<String>& property)
{
    return property.null ? std::string() : property.value.c_str();
}

/// Whether endpoints are called after the path, in front of the unit.
template <class Endpoint> bool leadsTo(ProviderAgent& agent, const LanePath& path)
{
    const std::string prefix = path.initiator + ":" + path.target + ":";
    return mapOf<Endpoint>(agent).findFirst([&](const Endpoint& known)
                                            { return known.Name.value.view().starts_with(prefix); }) != nullptr;
}

/// A fabric that has not been built tells of no target: then it is for the library to know it.
bool isTargetKnown(ProviderAgent& agent, const LaneInitiator& initiator, const LanePath& path)
{
    if (!isPlainWwpn(path.target))
        return false;
    if (agent.m_lanePaths.contains(path))
        return true;
    if (initiator.virtualPort)
        return leadsTo<TVRHBA_VirtualSCSIProtocolTargetEndpoint>(agent, path);
    return !agent.m_bSANMapsReady || leadsTo<TVRHBA_SCSIProtocolEndpoint>(agent, path);
}

} // namespace

std::uint32_t setDriverParameter(const Instance* reference,
                                 TVRHBA_FCHBADriverParamService_SetDriverParameter_method& parameters)
{
    MethodCall call({TVR_DBG, "TVRHBA_FCHBADriverParamService_Provider::SetDriverParameter()"});
    call.self<TVRHBA_FCHBADriverParamService>(reference, texts);
    const String& deviceId = call.target(parameters.Target, texts).DeviceID.value;
    const HBA_WWN wwpn = call.wwpn(deviceId, texts);
    const RM_STATUS status = tvrcimSetDriverParam(deviceId, wwpn, flag(parameters.bGlobal), flag(parameters.bPermanent),
                                                  textOrNull(parameters.strParam), textOrNull(parameters.strValue));
    if (status != RM_OK)
        TVR_LOG(TVR_ERR, "tvrcimSetDriverParam failed with status : %d", status);
    else
        TVR_LOG(TVR_INFO, "tvrcimSetDriverParam succeeded");
    return static_cast<std::uint32_t>(status);
}

std::uint32_t disableAllPrioLaneLuns(const Instance* reference,
                                     TVRHBA_FCHBADriverParamService_DisableAllPrioLaneLuns_method& parameters)
{
    MethodCall call({TVR_DBG, "TVRHBA_FCHBADriverParamService_Provider::DisableAllPrioLaneLuns()"});
    ProviderAgent& agent = call.agent();
    call.self<TVRHBA_FCHBADriverParamService>(reference, texts);
    const LanePath path{textOf(parameters.InitiatorWWPN), textOf(parameters.TargetWWPN)};
    const LaneInitiator initiator = findLaneInitiator(agent, path.initiator);
    if (!initiator || !isTargetKnown(agent, initiator, path))
        MethodCall::end({TVR_ERR, "Invalid Initiator fc port or Target device"}, texts.ofTarget);
    const std::uint16_t option = parameters.Option.value;
    TVR_LOG(TVR_DBG, "Option: %d.", option);
    if (parameters.Option.null || option > RM_LANE_CONFIG)
        MethodCall::end({}, texts.ofName);
    if (const RM_STATUS status =
            SetOASLunState(initiator.portName(), path.target.c_str(), "256", initiator.virtualName(), 0, option);
        status != RM_OK)
        MethodCall::end({TVR_ERR, "Disable PriorityLaneLunStates failed"}, {static_cast<std::uint32_t>(status)});
    const String prefix = laneNamePrefix(path, option);
    TVR_LOG(TVR_DBG, "Final ParseStr: %s", prefix.c_str());
    if (!removeLanes(agent, prefix.view()))
        TVR_LOG(TVR_ERR, "Invalid associations ");
    TVR_LOG(TVR_DBG, "DisableAllPrioLaneLuns Succeeded");
    return 0;
}

} // namespace cimple
