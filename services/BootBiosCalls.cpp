#include "services/BootBiosCalls.h"

#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "foundation/Log.h"

#include <cctype>

namespace cimple
{

namespace
{

constexpr std::uint32_t attributesRoom = 2048;
constexpr std::uint32_t failed = 1;
constexpr std::uint32_t nullControl = 4;

} // namespace

std::uint32_t tvrcimGetBootBiosState(const HBA_WWN& wwpn, std::uint32_t* state)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::tvrcimGetBootBiosState");
    if (!state)
    {
        TVR_LOG(TVR_DBG, "Null Pointer Assignment to argument biosState");
        return failed;
    }
    AttributeBlock block(attributesRoom);
    if (!block.allocated())
    {
        TVR_LOG(TVR_DBG, "ERROR: GetHBAAttributes: Unable to allocate buffer");
        return failed;
    }
    if (const RM_STATUS status = block.fetch(LRM_GetHBAAttributes, wwpn); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
        return failed;
    }
    return readAdapterNumber(block, RM_HA_BOOT_CODE_ENABLED, "_BootCodeEnabled", *state) == RM_OK ? 0 : failed;
}

std::uint32_t tvrcimSetBootBiosState(const HBA_WWN& wwpn, const char* control)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::tvrcimSetBootBiosState");
    if (!control)
    {
        TVR_LOG(TVR_ERR, "Null Pointer Assignment to argument CtrlWord");
        return nullControl;
    }
    TVR_LOG(TVR_DBG, "CtrlWord is %2c", *control);
    const int letter = std::tolower(static_cast<unsigned char>(*control));
    if (letter != 'e' && letter != 'd')
        return failed;
    const RM_STATUS status = LRM_SetBootBiosState(wwpn, letter == 'e');
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "BootBios State has been set");
    else
        TVR_LOG(TVR_ERR, "ERROR: RM_SetBootBiosState failure: %d", status);
    return static_cast<std::uint32_t>(status);
}

} // namespace cimple
