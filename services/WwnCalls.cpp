#include "services/WwnCalls.h"

#include "agent/LogText.h"
#include "device/Bindings.h"
#include "device/TVR_MethodWrapper.h"
#include "foundation/Text.h"
#include "runtime/log/Shielded.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>
#include <vector>

namespace cimple
{

namespace
{

/// Local ports that are looked at, whatever number the library tells.
constexpr std::uint32_t maxLocalPorts = 4096;
/// Virtual ports of one of them: with more, none is compared.
constexpr std::uint32_t maxVPorts = 1023;

/// Calls in all while the adapter is busy.
constexpr std::uint16_t maxCalls = 300;

// --- what the log says when names were written

struct ActivationRow
{
    RM_WwnActivation code;
    LogText changed[2];
    LogText restored[3];
};

constexpr LogText restored = {TVR_WARN, "WWNs restored successfully"};
constexpr LogText needsReboot = {TVR_WARN, "Reboot required to activate the new setting"};
constexpr LogText needsReset = {TVR_WARN, "Reset required to activate the new setting"};
constexpr LogText resetHba = {TVR_WARN, "Reset the HBA to activate the new setting"};
constexpr LogText pleaseResetHba = {TVR_WARN, "Please reset the HBA to activate the new setting"};
constexpr LogText volatileUntil = {TVR_WARN,
                                   "Volatile names will be active until system power-down or HBA power-cycle"};

constexpr ActivationRow activations[] = {
    {RM_WWN_ACTIVE, {}, {{TVR_WARN, "WWNs already active. No Restore needed"}}},
    {RM_WWN_AT_REBOOT_VOLATILE_UNTIL, {needsReboot, volatileUntil}, {restored, needsReboot, volatileUntil}},
    {RM_WWN_AT_REBOOT, {needsReboot}, {restored, needsReboot}},
    {RM_WWN_AT_RESET_VOLATILE_UNTIL, {needsReset, volatileUntil}, {restored, resetHba, volatileUntil}},
    {RM_WWN_AT_RESET, {needsReset}, {restored, pleaseResetHba}},
};

template <std::size_t Lines> void logActivation(std::uint32_t code, LogText (ActivationRow::*lines)[Lines])
{
    for (const ActivationRow& row : activations)
        if (row.code == code)
            for (const LogText& line : row.*lines)
                line.log();
}

// --- calls that may have to be repeated

/// Repeats a call without a pause while the adapter is busy.
template <class Call> RM_STATUS whileBusy(const LogText& repeating, const Call& call)
{
    RM_STATUS status = call();
    if (status == RM_ERROR_BUSY)
        repeating.log();
    for (std::uint16_t calls = 1; status == RM_ERROR_BUSY && calls < maxCalls; ++calls)
        status = call();
    return status;
}

// --- names that are in use

constexpr std::uint16_t noDuplicate = 0;
constexpr std::uint16_t duplicateOfVPort = 1;

/// By the duplicate code. The search knows virtual ports by their WWPN alone.
constexpr LogText duplicateTexts[] = {
    {},
    {TVR_DBG, "ChangeWWN: Duplication of vport WWPN detected."},
    {TVR_DBG, "ChangeWWN: Duplication of vport WWNN detected."},
    {TVR_DBG, "ChangeWWN: Duplication of vport target WWPN detected."},
    {TVR_DBG, "ChangeWWN: Duplication of vport target WWNN detected."},
};

bool isSame(const HBA_WWN& a, const HBA_WWN& b)
{
    return std::memcmp(a.wwn, b.wwn, sizeof a.wwn) == 0;
}

/// Notes the port as seen. Without memory for that the list begins anew, and ports may be looked at twice.
bool isDuplicateEntryInWWPNList(std::vector<HBA_WWN>& seen, const HBA_WWN& wwpn)
{
    if (std::ranges::any_of(seen, [&](const HBA_WWN& known) { return isSame(known, wwpn); }))
        return true;
    try
    {
        seen.push_back(wwpn);
    }
    catch (const std::bad_alloc&)
    {
        TVR_LOG(TVR_DBG, "\nERROR: isDuplicateEntryInWWPNList: realloc failed");
        std::vector<HBA_WWN>().swap(seen);
    }
    return false;
}

/// An RM_VPortList with room for one virtual port more than are compared.
struct VPorts
{
    std::uint32_t count;
    RM_VPortEntry entry[maxVPorts + 1];
};
static_assert(offsetof(VPorts, entry) == offsetof(RM_VPortList, entry));

/// Whether a virtual port of the physical port has one of the names as its WWPN.
bool isNameOfVPort(const HBA_WWN& port, const HBA_WWN& newWwpn, const HBA_WWN& newWwnn)
{
    const auto ports = std::make_unique<VPorts>();
    std::uint32_t room = 1;
    const auto list = [&]
    {
        ports->count = room;
        return LRM_VPList(port, reinterpret_cast<RM_VPortList*>(ports.get()));
    };
    RM_STATUS status = list();
    if (status == RM_ERROR_MORE_DATA)
    {
        room = std::min(ports->count, maxVPorts + 1);
        status = list();
    }
    if (status != RM_OK || ports->count > maxVPorts)
        return false;
    return std::any_of(ports->entry, ports->entry + std::min(ports->count, room),
                       [&](const RM_VPortEntry& vport)
                       { return isSame(vport.wwpn, newWwpn) || isSame(vport.wwpn, newWwnn); });
}

/// The duplicate code of two names, among the virtual ports of all adapters of the host.
std::uint16_t findDuplicate(const HBA_WWN& newWwpn, const HBA_WWN& newWwnn)
{
    std::uint16_t found = noDuplicate;
    std::vector<HBA_WWN> seen;
    const std::uint32_t count = std::min(RM_GetNumberOfLocalAdapters(), maxLocalPorts);
    for (std::uint32_t index = 0; index < count; ++index)
    {
        RM_LocalHBAInfo port{};
        if (RM_GetLocalHBAInfo(index, &port) != RM_OK || isDuplicateEntryInWWPNList(seen, port.wwpn))
            continue;
        if (isNameOfVPort(port.wwpn, newWwpn, newWwnn))
            found = duplicateOfVPort;
    }
    return found;
}

bool isRefused(const HBA_WWN& name, const LogText& refused)
{
    if (RM_ValidateWwn(name) != RM_ERROR_INVALID_WWN)
        return false;
    refused.log();
    return true;
}

// --- what the log says of an adapter's capability

struct CapabilityRow
{
    RM_WwnCapability bit;
    LogText set;
    LogText clear;
};

constexpr CapabilityRow capabilityTexts[] = {
    {RM_WWN_READ_ONLY, {TVR_INFO, "Read Only mode: World Wide Name Management is not supported in this mode"}, {}},
    {RM_WWN_CAN_CHANGE_NON_VOLATILE,
     {TVR_DBG, "Can change Non-Volatile WWNs"},
     {TVR_DBG, "Cannot change Non-Volatile WWNs"}},
    {RM_WWN_CAN_CHANGE_VOLATILE, {TVR_DBG, "Can change Volatile WWNs"}, {TVR_DBG, "Cannot change Volatile WWNs"}},
    {RM_WWN_NEEDS_REBOOT, {TVR_INFO, "Activation requirement: Reboot"}, {}},
    {RM_WWN_NEEDS_RESET, {TVR_INFO, "Activation requirement: Reset HBA"}, {}},
};

// --- what the log says of names that were read

/// When configured names come into force.
enum class Moment
{
    any,
    reboot,
    reset,
};

struct ReadRow
{
    RM_WwnType type;
    RM_WwnKind kind;
    Moment moment;
    LogText text;
};

constexpr ReadRow readTexts[] = {
    {RM_WWN_TYPE_VOLATILE, RM_WWN_KIND_VOLATILE, Moment::any, {TVR_DBG, "Volatile WWNs are active"}},
    {RM_WWN_TYPE_VOLATILE, RM_WWN_KIND_NONE, Moment::any, {TVR_DBG, "Volatile WWNs DO NOT EXIST on this adapter"}},
    {RM_WWN_TYPE_VOLATILE,
     RM_WWN_KIND_NOT_SUPPORTED,
     Moment::any,
     {TVR_DBG, "Volatile WWNs are NOT SUPPORTED on this adapter"}},
    {RM_WWN_TYPE_NON_VOLATILE,
     RM_WWN_KIND_NON_VOLATILE,
     Moment::any,
     {TVR_INFO, "Non-Volatile WWNs read successfully"}},
    {RM_WWN_TYPE_FACTORY, RM_WWN_KIND_NON_VOLATILE, Moment::any, {TVR_INFO, "Factory Default WWNs read successfully"}},
    {RM_WWN_TYPE_CURRENT, RM_WWN_KIND_VOLATILE, Moment::any, {TVR_DBG, "Current WWNs: Volatile"}},
    {RM_WWN_TYPE_CURRENT, RM_WWN_KIND_NON_VOLATILE, Moment::any, {TVR_DBG, "Current WWNs: Non-Volatile"}},
    {RM_WWN_TYPE_CONFIGURED, RM_WWN_KIND_NONE, Moment::any, {TVR_DBG, "Configured WWNs DO NOT EXIST"}},
    {RM_WWN_TYPE_CONFIGURED,
     RM_WWN_KIND_VOLATILE,
     Moment::reboot,
     {TVR_DBG, "Configured WWNs: Volatile (Activation required: warm reboot)"}},
    {RM_WWN_TYPE_CONFIGURED,
     RM_WWN_KIND_VOLATILE,
     Moment::reset,
     {TVR_DBG, "Configured WWNs: Volatile (Activation required: adapter restart)"}},
    {RM_WWN_TYPE_CONFIGURED,
     RM_WWN_KIND_NON_VOLATILE,
     Moment::reboot,
     {TVR_DBG, "Configured WWNs: Non-Volatile (Activation required: warm reboot)"}},
    {RM_WWN_TYPE_CONFIGURED,
     RM_WWN_KIND_NON_VOLATILE,
     Moment::reset,
     {TVR_DBG, "Configured WWNs: Non-Volatile (Activation required: adapter restart)"}},
};

Moment momentOf(std::uint32_t activation)
{
    switch (activation)
    {
    case RM_WWN_AT_REBOOT_VOLATILE_UNTIL:
    case RM_WWN_AT_REBOOT:
        return Moment::reboot;
    case RM_WWN_AT_RESET_VOLATILE_UNTIL:
    case RM_WWN_AT_RESET:
        return Moment::reset;
    default:
        return Moment::any;
    }
}

void logRead(std::uint32_t type, const RM_WwnNames& names)
{
    for (const ReadRow& row : readTexts)
        if (row.type == type && row.kind == names.kind &&
            (row.moment == Moment::any || row.moment == momentOf(names.activation)))
            row.text.log();
}

std::string lowerCaseText(const HBA_WWN& wwn)
{
    return lowerCase(TVR_MethodWrapper::hbaNameToString(wwn));
}

} // namespace

RM_STATUS ChangeWWN(const HBA_WWN& wwpn, const HBA_WWN& newWwpn, const HBA_WWN& newWwnn, std::uint32_t type,
                    std::uint16_t* duplicate)
{
    *duplicate = noDuplicate;
    if (isRefused(newWwpn, {TVR_ERR, "The supplied 'New WWPN' is not valid"}) ||
        isRefused(newWwnn, {TVR_ERR, "The supplied 'New WWNN' is not valid"}))
        return wwnNotValid;
    *duplicate = findDuplicate(newWwpn, newWwnn);
    if (*duplicate != noDuplicate)
    {
        duplicateTexts[*duplicate].log();
        return RM_ERROR_DUPLICATE_WWN;
    }
    TVR_LOG(TVR_INFO, "ChangeWWN operation initiated");
    std::uint32_t activation = 0;
    const RM_STATUS status = shielded(
        RM_STATUS{RM_ERROR},
        [&]
        {
            return whileBusy({TVR_DBG, "Validating new WWNs..."},
                             [&] { return LRM_ChangeWWN(wwpn, newWwpn, newWwnn, type, &activation); });
        },
        [](const char*) { TVR_LOG(TVR_ERR, "Error in RM_ChangeWWN"); });
    if (status == RM_OK)
    {
        TVR_LOG(TVR_WARN, "New WWNs written successfully");
        logActivation(activation, &ActivationRow::changed);
        return status;
    }
    if (status == RM_ERROR_WWN_NOT_AVAILABLE)
        TVR_LOG(TVR_ERR, "WWN Management is not available on this HBA");
    else if (status == RM_ERROR_WWN_NOT_SUPPORTED)
        TVR_LOG(TVR_ERR, "WWN NOT SUPPORTED");
    TVR_LOG(TVR_ERR, "ChanngeWWN: RM_ChangeWWN call failed with error: %d", status);
    return status;
}

RM_STATUS RestoreWWN(const HBA_WWN& wwpn, std::uint32_t type)
{
    TVR_LOG(TVR_INFO, "RestoreWWN operation initiated.");
    std::uint32_t activation = 0;
    const RM_STATUS status = shielded(
        RM_STATUS{RM_ERROR},
        [&] {
            return whileBusy({TVR_DBG, "Restoring WWNs..."}, [&] { return LRM_RestoreWWN(wwpn, type, &activation); });
        },
        [](const char*) { TVR_LOG(TVR_ERR, "Error in RestoreWWN"); });
    if (status == RM_OK)
        logActivation(activation, &ActivationRow::restored);
    return status;
}

RM_STATUS ReadWWN(const HBA_WWN& wwpn, std::uint32_t type, std::string* wwpnText, std::string* wwnnText)
{
    RM_WwnNames names{};
    const RM_STATUS status = LRM_ReadWWN(wwpn, type, &names);
    if (status != RM_OK)
    {
        if (status == RM_ERROR_WWN_NOT_AVAILABLE)
            TVR_LOG(TVR_ERR, "WWN Management is NOT AVAILABLE on this adapter");
        else
            TVR_LOG(TVR_ERR, "ReadWWN: RM_ReadWWN call failed with error: %d", status);
        return status;
    }
    logRead(type, names);
    if (names.kind != RM_WWN_KIND_VOLATILE && names.kind != RM_WWN_KIND_NON_VOLATILE)
        return status;
    *wwpnText = lowerCaseText(names.wwpn);
    *wwnnText = lowerCaseText(names.wwnn);
    TVR_LOG(TVR_DBG, "WWPN: %s", wwpnText->c_str());
    TVR_LOG(TVR_DBG, "WWNN: %s", wwnnText->c_str());
    return status;
}

RM_STATUS GetWWNCapability(const HBA_WWN& wwpn, std::uint32_t* capability)
{
    std::uint32_t bits = 0;
    const RM_STATUS status = LRM_GetWWNCapability(wwpn, &bits);
    if (status != RM_OK)
    {
        if (status == RM_ERROR_WWN_NOT_AVAILABLE)
            TVR_LOG(TVR_ERR, "WWN Management is not available on this HBA");
        TVR_LOG(TVR_ERR, "GetWWNCapability: RM_ReadWWNCapability call failed with error: %d", status);
        return status;
    }
    for (const CapabilityRow& row : capabilityTexts)
        (bits & row.bit ? row.set : row.clear).log();
    *capability = bits;
    return status;
}

} // namespace cimple
