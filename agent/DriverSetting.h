// Driver parameters in the cache: one with what it is a setting of.
#pragma once

#include "agent/ProviderAgent.h"
#include "runtime/meta/Instance.h"

#include <string_view>

namespace cimple
{

class TVRHBA_DriverParams;
class TVRHBA_FCPort;
class TVRHBA_VirtualFCPort;

/// Fills the flags of an association with a parameter that has this value for its default.
template <class SettingData>
auto settingFlags(const Property<std::uint32_t>& current, const Property<std::uint32_t>& def)
{
    return [isDefault = current.value == def.value](SettingData& of)
    {
        of.IsDefault.set(isDefault ? 1 : 2);
        of.IsCurrent.set(1);
    };
}

/// How a parameter's `deviceID` writes the name of its port.
String settingDeviceId(std::string_view wwpn);

/// Puts a parameter in its map, as a setting of the service and of the port or virtual port that it is for; the other
/// one of these is null. Null if the map refuses it.
TVRHBA_DriverParams* insertDriverSetting(ProviderAgent& agent, const Ref<TVRHBA_DriverParams>& made,
                                         const TVRHBA_FCPort* port, const TVRHBA_VirtualFCPort* virtualPort);

// --- priority lanes

/// Who sends what goes by a lane. The port is null where there is none.
struct LaneInitiator
{
    const TVRHBA_FCPort* port = nullptr;               ///< or the one that carries the virtual port
    const TVRHBA_VirtualFCPort* virtualPort = nullptr; ///< null for the port itself

    explicit operator bool() const { return port != nullptr; }
    /// Names for the library's calls: that of the port, and that of the virtual port or null.
    const char* portName() const;
    const char* virtualName() const;
};

/// A port of the host of this DeviceID.
LaneInitiator findLanePort(ProviderAgent& agent, std::string_view wwpn);
/// One of the host's virtual ports.
LaneInitiator findLaneVirtualPort(ProviderAgent& agent, std::string_view wwpn);
/// Either.
LaneInitiator findLaneInitiator(ProviderAgent& agent, std::string_view wwpn);

/// Puts the parameter that stands for a lane in the maps, and notes its path. Null if it is there.
TVRHBA_DriverParams* insertLane(ProviderAgent& agent, const LaneInitiator& initiator, const Lane& lane);
/// Removes the lanes whose names begin so, with their associations; false if one was no setting of the service.
bool removeLanes(ProviderAgent& agent, std::string_view namePrefix);
bool removeLane(ProviderAgent& agent, const Lane& lane);

} // namespace cimple
