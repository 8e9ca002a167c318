#include "services/DriverParameterCalls.h"

#include "agent/LaneName.h"
#include "device/Bindings.h"
#include "device/TVR_MethodWrapper.h"
#include "foundation/Log.h"
#include "foundation/Text.h"

#include <cstdio>

namespace cimple
{

namespace
{

RM_STATUS refused(const char* why)
{
    TVR_LOG(TVR_ERR, "%s", why);
    return RM_ERROR;
}

} // namespace

RM_STATUS tvrcimSetDriverParam(const String& deviceId, const HBA_WWN& wwpn, std::uint8_t cw1, std::uint8_t cw2,
                               const char* name, const char* value)
{
    if (cw1 > 1)
        return refused("INVALID CW1");
    if (cw2 > 1)
        return refused("INVALID CW2");
    if (!name)
        return refused("Null pointer assignment in argument pDriverParam");
    if (!value)
        return refused("Null pointer assignment in argument pVal");
    TVR_LOG(TVR_DBG, "tvrcimSetDriverParam Parameters ::");
    TVR_LOG(TVR_DBG, "CW1=%d CW2=%d pDriverParam=%s pVal=%s, deviceID=%s", cw1, cw2, name, value, deviceId.c_str());
    const std::uint32_t control = cw1 * RM_PARAM_GLOBAL | cw2 * RM_PARAM_PERMANENT;
    char text[256] = {};
    if (std::snprintf(text, sizeof text, "%s=%s", name, value) >= static_cast<int>(sizeof text))
        return refused("The driver parameter's text is too long"); // cut, it would be another value
    TVR_LOG(TVR_DBG, "pParamStr:[%s], Ccw:[%d]", text, static_cast<int>(control));
    TVR_LOG(TVR_DBG, "Calling RM_SetDriverParam");
    const RM_STATUS status = LRM_SetDriverParam(wwpn, text, control);
    if (status != RM_OK)
        TVR_LOG(TVR_DBG, "RM_SetDriverParam fails with status : %d", status);
    return status;
}

RM_STATUS SetOASLunState(const char* initiator, const char* target, const char* lun, const char* virtualPort,
                         std::uint32_t state, std::uint32_t option)
{
    constexpr std::int32_t everyUnit = -1; // in the library's words
    std::int32_t number = parseDecimal(lun);
    HBA_WWN wwpn{}, targetName{}, virtualName{};
    if (TVR_MethodWrapper::idToWwn(&wwpn, initiator) != 0 || TVR_MethodWrapper::idToWwn(&targetName, target) != 0 ||
        (virtualPort && TVR_MethodWrapper::idToWwn(&virtualName, virtualPort) != 0))
        return RM_ERROR;
    TVR_LOG(TVR_DBG, "Enter TVR_MethodWrapper:SetOASLunState Input OASState: %d, Lun no: %d, option: %d",
            static_cast<int>(state), number, static_cast<int>(option));
    if (number == static_cast<std::int32_t>(allUnits))
    {
        number = everyUnit;
        TVR_LOG(TVR_DBG, "Lun for all: %d", number);
    }
    const RM_STATUS status = LRM_SetOASLunState(wwpn, targetName, virtualName, number, state, option);
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, " Operation failure. PrioLane State has not been set");
        TVR_MethodWrapper::logStatus(status);
    }
    TVR_LOG(TVR_DBG, "Exit SetOASLunState");
    return status;
}

} // namespace cimple
