#include "services/BootBiosService.h"

#include "agent/MethodCall.h"
#include "schema/TVRHBA_FCPort.h"
#include "services/BootBiosCalls.h"

namespace cimple
{

namespace
{

using Service = TVRHBA_BootBIOSService;

/// The texts of a service whose methods differ in that for a wrong port.
consteval ServiceTexts textsWith(LogText noPort)
{
    return {
        .wrongService = {TVR_ERR, "Invalid instance of Boot BIOS Service"},
        .noTarget = noPort,
        .unknownTarget = noPort,
        .noPlainName = {TVR_ERR, "TVRHBA_BootBIOSService_Provider::Id2HBAName failed"},
        .noWwn = {TVR_ERR, "TVRHBA_BootBIOSService_Provider::str2HBAName failed"},
    };
}

constexpr ServiceTexts setTexts = textsWith({TVR_ERR, "TVRHBA_BootBIOSService_Provider invald fc port ...return"});
constexpr ServiceTexts getTexts =
    textsWith({TVR_ERR, "TVRHBA_BootBIOSService_Provider GetBootBIOS invald fc port ...return"});

std::uint32_t setState(const Instance* reference, const TVRHBA_FCPort* target, const LogText& entry,
                       const char* control)
{
    MethodCall call(entry);
    const HBA_WWN wwpn = call.portOf<Service>(reference, target, setTexts);
    const std::uint32_t status = tvrcimSetBootBiosState(wwpn, control);
    if (status != 0)
        TVR_LOG(TVR_ERR, "TVRHBA_BootBIOSService_Provider::tvrcimSetBootBiosState failed");
    else
        TVR_LOG(TVR_INFO, "TVRHBA_BootBIOSService_Provider::tvrcimSetBootBiosState O.K.");
    return status;
}

std::uint32_t enable(const Instance* reference, TVRHBA_BootBIOSService_EnableBootBIOS_method& parameters)
{
    return setState(reference, parameters.Target, {TVR_DBG, "TVRHBA_BootBIOSService_Provider::EnableBootBIOS()"}, "E");
}

std::uint32_t disable(const Instance* reference, TVRHBA_BootBIOSService_DisableBootBIOS_method& parameters)
{
    return setState(reference, parameters.Target, {TVR_DBG, "TVRHBA_BootBIOSService_Provider::DisableBootBIOS()"}, "D");
}

std::uint32_t getStatus(const Instance* reference, TVRHBA_BootBIOSService_GetBootBIOSStatus_method& parameters)
{
    MethodCall call({TVR_DBG, "TVRHBA_BootBIOSService_Provider::GetBootBIOSStatus"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, getTexts);
    std::uint32_t state = 0;
    const std::uint32_t status = tvrcimGetBootBiosState(wwpn, &state);
    if (status != 0)
    {
        TVR_LOG(TVR_ERR, "TVRHBA_BootBIOSService_Provider::tvrcimGetBootBiosState failed");
        return status;
    }
    TVR_LOG(TVR_INFO, "TVRHBA_BootBIOSService_Provider::tvrcimGetBootBiosState O.K.");
    parameters.nBootBIOSStatus.set(state);
    return status;
}

} // namespace

std::span<const MethodRow> bootBiosServiceMethods()
{
    return methodTable<Service, &enable, &disable, &getStatus>;
}

} // namespace cimple
