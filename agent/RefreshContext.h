// What the steps of a refresh hand down to each other: the hardware in hand, and the instances made so far for it.
#pragma once

#include "agent/ProviderAgent.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"
#include "device/Vpd.h"
#include "schema/CIM_Chassis.h"
#include "schema/CIM_ComputerSystem.h"

#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimple
{

class TVRHBA_BootBIOSService;
class TVRHBA_Card;
class TVRHBA_Chip;
class TVRHBA_FCHBADriverParamService;
class TVRHBA_FCHBAWWNService;
class TVRHBA_FCPort;
class TVRHBA_FCTagService;
class TVRHBA_LogicalPortGroup;
class TVRHBA_PhysicalConnector;
class TVRHBA_PortController;
class TVRHBA_Product;
class TVRHBA_RegisteredProfile;
class TVRHBA_SCSIProtocolInitiatorEndpoint;
class TVRHBA_SoftwareIdentity;
class TVRHBA_SoftwareInstallationService;

/// The profiles that this refresh has registered.
class RegisteredProfiles
{
public:
    /// Null if it is not registered.
    TVRHBA_RegisteredProfile* find(std::string_view name) const;
    /// `name` stays the caller's, for as long as the refresh.
    void add(std::string_view name, TVRHBA_RegisteredProfile* profile);

private:
    std::vector<std::pair<std::string_view, TVRHBA_RegisteredProfile*>> _profiles;
};

struct RefreshSteps;

/// Of the host. All pointers are to instances in the cache, null before their step.
struct HostContext
{
    explicit HostContext(ProviderAgent& agent);
    HostContext(ProviderAgent& agent, const RefreshSteps& steps) : agent(agent), steps(steps) {}
    /// Of maps that stand: with what other steps than those of the adapter maps need of them.
    static HostContext ofCache(ProviderAgent& agent, const RefreshSteps& steps);

    ProviderAgent& agent;
    const RefreshSteps& steps;
    CIM_ComputerSystem* system = nullptr;
    Ref<CIM_Chassis> chassis; ///< the platform's, or a share of the one in the map
    RegisteredProfiles profiles;
    TVRHBA_SoftwareIdentity* providerIdentity = nullptr;
    TVRHBA_SoftwareIdentity* driverIdentity = nullptr;
    TVRHBA_SoftwareInstallationService* installationService = nullptr;
    TVRHBA_FCHBAWWNService* wwnService = nullptr;
    TVRHBA_FCTagService* tagService = nullptr;
    TVRHBA_BootBIOSService* bootService = nullptr;
    TVRHBA_FCHBADriverParamService* parameterService = nullptr;
    /// The local and the remote port, "WWPN|WWPN", of all paths to logical units that a refresh of the SAN has found.
    std::set<std::string> remotePorts;
};

/// Of an adapter.
struct AdapterContext
{
    /// Throws std::runtime_error if the adapter has no attributes.
    AdapterContext(HostContext& host, unsigned index, FCAdapter& adapter);

    HostContext& host;
    unsigned index; ///< among all adapters, of whatever type
    FCAdapter& adapter;
    const FCAdapterAttributes& attributes;
    TVRHBA_Product* product = nullptr;
    TVRHBA_LogicalPortGroup* group = nullptr;
    TVRHBA_Card* card = nullptr;
    bool cardIsNew = false; ///< made for this adapter, and not for another on the same card
};

/// What tells the versions of a chip apart.
enum class ChipKind
{
    E200 = 1,       ///< device id 0xE200
    SubAdapter = 2, ///< one of several on a card
    Other = 3,
};

/// Of a port.
struct PortContext
{
    HostContext& host;
    AdapterContext& on;
    unsigned index; ///< in its adapter
    FCPort& port;
    TVRHBA_Chip* chip = nullptr;
    ChipKind chipKind = ChipKind::Other;
    TVRHBA_PhysicalConnector* connector = nullptr;
    TVRHBA_FCPort* fcPort = nullptr;
    TVRHBA_PortController* controller = nullptr;
    TVRHBA_SCSIProtocolInitiatorEndpoint* endpoint = nullptr;
    std::vector<VpdField> vpd = {}; ///< none if the library does not give them
};

} // namespace cimple
