#include "services/LaneInstances.h"

#include "agent/DriverSetting.h"
#include "agent/MethodCall.h"
#include "runtime/adapter/Provider.h"
#include "services/DriverParameterCalls.h"

#include <string>

namespace cimple
{

namespace
{

constexpr MethodEnd wrongInstance = {0, CREATE_INSTANCE_INVALID_PARAMETER};
constexpr MethodEnd duplicate = {0, CREATE_INSTANCE_DUPLICATE};
constexpr MethodEnd notCreated = {0, CREATE_INSTANCE_FAILED};
constexpr MethodEnd notThere = {0, DELETE_INSTANCE_NOT_FOUND};
constexpr MethodEnd notDeleted = {0, DELETE_INSTANCE_FAILED};

String nameOf(const TVRHBA_DriverParams& instance)
{
    return instance.InstanceID.null ? String() : instance.InstanceID.value;
}

/// Logs what is not there; nothing if it is neither.
LaneInitiator findInitiator(ProviderAgent& agent, std::string_view wwpn, const LogText& notVirtualEither)
{
    const LaneInitiator physical = findLanePort(agent, wwpn);
    if (physical)
        return physical;
    TVR_LOG(TVR_WARN, "Could not find the corresponding FC Port instance from initiator. Checking for virtual FC Port");
    const LaneInitiator carried = findLaneVirtualPort(agent, wwpn);
    if (!carried)
        notVirtualEither.log();
    return carried;
}

RM_STATUS setState(const LaneInitiator& initiator, const Lane& lane, std::uint32_t state)
{
    return SetOASLunState(initiator.portName(), lane.path.target.c_str(), std::to_string(lane.unit).c_str(),
                          initiator.virtualName(), state, lane.option);
}

void checkName(const String& name)
{
    if (name.view().find("PrioLane") == std::string_view::npos)
    {
        TVR_LOG(TVR_ERR, "InstanceID size = 0, PrioLane parameter not found in InstanceID: %s", name.c_str());
        MethodCall::end({}, wrongInstance);
    }
    TVR_LOG(TVR_DBG, "Input InstanceID: %s", name.c_str());
}

LaneInitiator initiatorOfNew(ProviderAgent& agent, std::string_view wwpn)
{
    const LaneInitiator initiator =
        findInitiator(agent, wwpn, {TVR_ERR, "Also could not find the virtual FC port instance from initiator."});
    if (!initiator)
        MethodCall::end({TVR_DBG, "Could not find the valid FC or Virtual FC instance"}, notCreated);
    return initiator;
}

Lane laneOfNew(const String& name)
{
    const auto option = laneOptionOf(splitLaneName(name.view()).option);
    if (!option)
        MethodCall::end({TVR_DBG, "TVRHBA_DriverParams_Provider:: Invalid option"}, wrongInstance);
    TVR_LOG(TVR_DBG, "Option: %d", static_cast<int>(*option));
    const auto lane = parseLane(name.view());
    if (!lane)
        MethodCall::end({TVR_ERR, "TVRHBA_DriverParams_Provider:: Invalid target or LUN"}, wrongInstance);
    return *lane;
}

/// The lane of all units goes with any one of them, and they with it.
bool removeWithOthers(ProviderAgent& agent, const Lane& lane)
{
    if (lane.unit == allUnits)
        return removeLanes(agent, laneNamePrefix(lane.path, lane.option).view());
    removeLane(agent, {lane.path, lane.option, allUnits});
    return removeLane(agent, lane);
}

} // namespace

int createLane(const TVRHBA_DriverParams* instance)
{
    MethodCall call({TVR_DBG, "TVRHBA_DriverParams_Provider::create_instance()"});
    ProviderAgent& agent = call.agent();
    if (!instance)
        MethodCall::end({TVR_ERR, "Invalid(NULL) TVRHBA_DriverParams_Provider instance passed"}, wrongInstance);
    const String name = nameOf(*instance);
    checkName(name);
    if (mapOf<TVRHBA_DriverParams>(agent).withKeysOf(instance))
        MethodCall::end({TVR_ERR, "TVRHBA_DriverParams_Provider::Duplicate instance found."}, duplicate);
    const LaneInitiator initiator = initiatorOfNew(agent, splitLaneName(name.view()).initiator);
    const Lane lane = laneOfNew(name);
    if (setState(initiator, lane, 1) != RM_OK || !insertLane(agent, initiator, lane))
        return CREATE_INSTANCE_FAILED;
    TVR_LOG(TVR_DBG, "TVRHBA_DriverServiceElementSettingData::create() Succesful");
    TVR_LOG(TVR_DBG, "TVRHBA_DriverParams_Provider::create_instance() Succesful");
    return 0;
}

int deleteLane(const TVRHBA_DriverParams* instance)
{
    MethodCall call({TVR_DBG, "TVRHBA_DriverParams_Provider::delete_instance()"});
    ProviderAgent& agent = call.agent();
    if (!instance)
        MethodCall::end({TVR_ERR, "Invalid TVRHBA_DriverParams_Provider instance passed"}, notDeleted);
    const String name = nameOf(*instance);
    if (!mapOf<TVRHBA_DriverParams>(agent).withKeysOf(instance))
    {
        TVR_LOG(TVR_ERR, "Instance Not found: %s ", name.c_str());
        MethodCall::end({}, notThere);
    }
    const LaneInitiator initiator =
        findInitiator(agent, splitLaneName(name.view()).initiator,
                      {TVR_ERR, "Also could not find the corresponding virtual FC port instance from initiator."});
    const auto lane = parseLane(name.view());
    if (!initiator || !lane)
        MethodCall::end({}, notDeleted);
    if (setState(initiator, *lane, 0) != RM_OK)
        MethodCall::end({TVR_ERR, "TVRHBA_DriverParams_Provider::SetOASLunState failed"}, notDeleted);
    if (!removeWithOthers(agent, *lane))
        TVR_LOG(TVR_DBG, "TVRHBA_DriverParams_Provider:: Invalid associations ");
    return 0;
}

} // namespace cimple
