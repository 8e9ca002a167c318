#include "model/FCPortProvider.h"

#include "agent/MethodCall.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

namespace
{

constexpr MethodEnd invalid = {0, MODIFY_INSTANCE_INVALID_PARAMETER};

constexpr ServiceTexts texts = {
    .noPlainName = {TVR_ERR, "TVRHBA_FCPort_Provider::Id2HBAName failed"},
    .noWwn = {TVR_ERR, "TVRHBA_FCPort_Provider::::str2HBAName failed"},
    .ofName = {0, MODIFY_INSTANCE_FAILED},
};

/// The value that the client wants, which ends the change if the beacon has no such state.
std::uint16_t wantedState(const TVRHBA_FCPort& instance, const TVRHBA_FCPort& model)
{
    constexpr std::uint16_t on = 2;
    constexpr std::uint16_t off = 3;
    if (model.LocationIndicator.null)
        MethodCall::end({}, invalid);
    const std::uint16_t wanted = instance.LocationIndicator.value;
    TVR_LOG(TVR_DBG, "Input BeaconState : %d", wanted);
    if (wanted != on && wanted != off)
        MethodCall::end({TVR_DBG, "Invalid LocationIndicator, Valid values are '2' or '3'"}, invalid);
    return wanted;
}

} // namespace

int modifyFCPort(const TVRHBA_FCPort* instance, const TVRHBA_FCPort* model)
{
    MethodCall call({});
    if (!instance || !model)
        MethodCall::end({TVR_DBG, "TVRHBA_FCPort_Provider::modify_instance invalid parameter"}, invalid);
    const auto ports = mapOf<TVRHBA_FCPort>(call.agent());
    TVRHBA_FCPort* port = ports.withKeysOf(instance);
    if (!port && ports.size() != 0)
        MethodCall::end({TVR_DBG, "Invalid instance of TVRHBA_FCPort Data"}, invalid);
    const std::uint16_t wanted = wantedState(*instance, *model);
    const HBA_WWN wwpn = call.wwpn(instance->DeviceID.value, texts);
    if (TVR_MethodWrapper::SetBeaconState(wwpn, wanted) != 0 || !port)
        return MODIFY_INSTANCE_FAILED;
    port->LocationIndicator.set(wanted);
    TVR_LOG(TVR_DBG, "Beacon state modified successfully");
    return 0;
}

} // namespace cimple
