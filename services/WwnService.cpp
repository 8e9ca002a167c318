#include "services/WwnService.h"

#include "agent/MethodCall.h"
#include "schema/TVRHBA_FCPort.h"
#include "services/WwnCalls.h"

#include <string_view>

namespace cimple
{

namespace
{

using Service = TVRHBA_FCHBAWWNService;

constexpr LogText noPort = {TVR_ERR, "TVRHBA_FCHBAWWNService_Provider invald port ...return"};

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of HBA WWN Management Service"},
    .noTarget = noPort,
    .unknownTarget = noPort,
    .noPlainName = {TVR_ERR, "TVRHBA_FCHBAWWNService_Provider::Id2HBAName failed"},
    .noWwn = {TVR_ERR, "TVRHBA_FCHBAWWNService_Provider::str2HBAName failed"},
};

// By the type.

constexpr LogText changeTypes[] = {
    {TVR_DBG, "Writing Volatile World Wide Name."},
    {TVR_DBG, "Writing Non-Volatile World Wide Name."},
};
constexpr LogText restoreTypes[] = {
    {TVR_DBG, "Restoring Factory Default World Wide Name..."},
    {TVR_DBG, "Restoring Non-volatile World Wide Name..."},
};
constexpr LogText readTypes[] = {
    {TVR_DBG, "Reading Volatile WWNs."},        {TVR_DBG, "Reading Non-Volatile WWNs."},
    {TVR_DBG, "Reading Factory Default WWNs."}, {TVR_DBG, "Reading current WWNs."},
    {TVR_DBG, "Reading configured WWNs."},
};

/// The type, if it is one of those that have a text. No type at all is logged as -1.
std::uint32_t knownType(const Property<std::uint16_t>& type, std::span<const LogText> known, const LogText& unknown)
{
    if (!type.null && type.value < known.size())
    {
        known[type.value].log();
        return type.value;
    }
    unknown.log(type.null ? static_cast<std::uint32_t>(-1) : type.value);
    MethodCall::end({}, texts.ofName);
}

/// A status in the room of the out parameter; all ones for one that has no room there.
std::uint16_t operationStatus(RM_STATUS status)
{
    constexpr std::uint16_t most = 0xFFFF;
    return status < 0 || status > most ? most : static_cast<std::uint16_t>(status);
}

/// The name that a client sent: 16 digits, which may stand in quotes. What follows them is not cut away.
HBA_WWN newName(MethodCall& call, const Property<String>& name, const LogText& missing)
{
    if (name.null || name.value.empty())
        MethodCall::end(missing, texts.ofName);
    std::string_view digits = name.value.c_str();
    if (digits.starts_with('"'))
        digits.remove_prefix(1);
    if (digits.ends_with('"'))
        digits.remove_suffix(1);
    constexpr std::size_t digitsOfName = 16;
    if (digits.size() > digitsOfName)
        MethodCall::end(texts.noWwn, texts.ofName);
    return call.wwpn(name.value, texts);
}

std::uint32_t changeWWN(const Instance* reference, TVRHBA_FCHBAWWNService_ChangeWWN_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering ChangeWWN"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    const HBA_WWN newWwpn = newName(call, parameters.NewWWPN, {TVR_ERR, "New WWPN has a null pointer"});
    const HBA_WWN newWwnn = newName(call, parameters.NewWWNN, {TVR_ERR, "New WWNN has a null pointer"});
    const std::uint32_t type =
        knownType(parameters.Type, changeTypes, {TVR_ERR, "ChangeWWN: Type %d not recognized..."});
    std::uint16_t duplicate = 0;
    const RM_STATUS status = ChangeWWN(wwpn, newWwpn, newWwnn, type, &duplicate);
    parameters.WWNOperationStatus.set(duplicate);
    if (status != RM_OK)
        return static_cast<std::uint32_t>(status);
    TVR_LOG(TVR_INFO, "ChangeWWN operation completed. Please restart the CIMOM to use Tavrin CIM provider");
    call.refreshAfterwards();
    return 0;
}

std::uint32_t readWWN(const Instance* reference, TVRHBA_FCHBAWWNService_ReadWWN_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering ReadWWN"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    const std::uint32_t type = knownType(parameters.Type, readTypes, {TVR_ERR, "ReadWWN: Type %d not recognized..."});
    std::string wwpnText;
    std::string wwnnText;
    const RM_STATUS status = ReadWWN(wwpn, type, &wwpnText, &wwnnText);
    if (!wwpnText.empty())
    {
        parameters.WWPN.set(wwpnText.c_str());
        parameters.WWNN.set(wwnnText.c_str());
    }
    parameters.WWNOperationStatus.set(operationStatus(status));
    return static_cast<std::uint32_t>(status);
}

std::uint32_t restoreWWN(const Instance* reference, TVRHBA_FCHBAWWNService_RestoreWWN_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering RestoreWWN"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    const std::uint32_t type =
        knownType(parameters.Type, restoreTypes, {TVR_ERR, "RestoreWWN: Type %d not recognized..."});
    const RM_STATUS status = RestoreWWN(wwpn, type);
    parameters.WWNOperationStatus.set(operationStatus(status));
    if (status == RM_OK)
        call.refreshAfterwards();
    return static_cast<std::uint32_t>(status);
}

std::uint32_t getWWNCapability(const Instance* reference, TVRHBA_FCHBAWWNService_GetWWNCapability_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering GetWWNCapability"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    std::uint32_t capability = 0;
    const RM_STATUS status = GetWWNCapability(wwpn, &capability);
    if (status == RM_OK)
        parameters.WWNCapability.set(capability);
    return static_cast<std::uint32_t>(status);
}

} // namespace

std::span<const MethodRow> wwnServiceMethods()
{
    return methodTable<Service, &changeWWN, &restoreWWN, &readWWN, &getWWNCapability>;
}

} // namespace cimple
