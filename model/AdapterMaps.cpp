#include "model/AdapterMaps.h"

#include "agent/ModelStages.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"
#include "foundation/Log.h"
#include "model/Build.h"
#include "model/ComputerSystem.h"
#include "model/PhysicalModel.h"
#include "model/Profiles.h"
#include "model/ProviderInstances.h"
#include "model/Slices.h"

namespace cimple
{

namespace
{

constexpr std::uint32_t fibreChannel = 1; // Adapter::adapterType

/// One pass of the refresh over the adapter maps.
class AdapterMapsBuild
{
public:
    explicit AdapterMapsBuild(ProviderAgent& agent) : _agent(agent) {}

    std::uint32_t run();

private:
    bool holdChassis();
    std::uint32_t createAdapterSide();
    std::uint32_t startServices();
    std::uint32_t createAdapters();
    std::uint32_t createAdapter(unsigned adapterIndex, FCAdapter& adapter);
    std::uint32_t createPort(PortParts& parts, bool cardIsNew);
    void createLogsAndDumps();
    void createDiagnostics();
    void updateFRUData();

    ProviderAgent& _agent;
    Ref<CIM_Chassis> _chassis; ///< found by up-call, or a share of the one in the map
};

std::uint32_t AdapterMapsBuild::run()
{
    TVR_LOG(TVR_DBG, " updateAdapterMaps: Entry");
    _agent.clearAdapterMaps();
    if (!createComputerSystem(_agent))
        return TVR_LOG(TVR_CRIT, "Could not create the Computer System Instance"), BUILD_FAILED;
    _chassis = findChassis();
    createProfiles(_agent);
    if (!_agent.m_pData)
        return TVR_LOG(TVR_CRIT, "Could not locate the data pointer - Serious issue"), BUILD_FAILED;
    if (!holdChassis())
        return TVR_LOG(TVR_CRIT, "Could not create the Chassis Instance"), BUILD_FAILED;

    if (!_agent.m_pData->dataValid)
        TVR_LOG(TVR_DBG, "No FC card found");
    else if (const std::uint32_t status = createAdapterSide(); status != BUILD_DONE)
        return status;

    createDiagnostics();
    updateFRUData();
    if (const std::uint32_t status = createProviderRecordLog(_agent); status != BUILD_DONE)
        return status;
    TVR_LOG(TVR_DBG, "Create the Diagnostic classes");
    TVR_LOG(TVR_DBG, "PERF: updateAdapterMaps: cleanExit");
    return BUILD_DONE;
}

bool AdapterMapsBuild::holdChassis()
{
    if (_chassis)
        return true;
    TVR_LOG(TVR_DBG, "up-call method to get the chassis is failed");
    _chassis = generateChassis();
    return insert(_agent.m_CIM_Chassis_map, _chassis, "Insert Failed : m_CIM_Chassis_map") != nullptr;
}

/// What a host with FC cards has. A failure stops the refresh; anything thrown ends the adapters alone.
std::uint32_t AdapterMapsBuild::createAdapterSide()
{
    try
    {
        if (createProviderSoftwareIdentity(_agent) != BUILD_DONE)
            return TVR_LOG(TVR_CRIT, "TVRHBA_SoftwareIdentity provider creation failed"), BUILD_FAILED;
        if (createProviderConfigSettings(_agent) != BUILD_DONE)
            return BUILD_FAILED;
        if (startServices() != BUILD_DONE)
            return BUILD_FAILED;
        if (createAdapters() != BUILD_DONE)
            return BUILD_FAILED;
        createDriverParamInstances(_agent);
        TVR_LOG(TVR_DBG, "Done with the Driver Parameter fetching");
        createLogsAndDumps();
    }
    catch (...)
    {
        TVR_LOG(TVR_DBG, "Unknown Exception in FC card discovery");
    }
    return BUILD_DONE;
}

std::uint32_t AdapterMapsBuild::startServices()
{
    constexpr std::uint32_t (*steps[])(ProviderAgent&) = {
        createSoftwareInstallationService, createWWNService,     createFCTagService, createBootBIOSService,
        createDriverParamService,          createDriverIdentity,
    };
    for (auto* step : steps)
        if (const std::uint32_t status = step(_agent); status != BUILD_DONE)
            return status;
    return BUILD_DONE;
}

std::uint32_t AdapterMapsBuild::createAdapters()
{
    const std::vector<Adapter*>& adapters = _agent.m_pData->adapters;
    for (unsigned index = 0; index < adapters.size(); index++)
    {
        Adapter& adapter = *adapters[index];
        if (adapter.adapterType != fibreChannel)
        {
            TVR_LOG(TVR_DBG, "Skippping Non FC Adapter [%s]", adapter.getName().c_str());
            continue;
        }
        auto& fcAdapter = dynamic_cast<FCAdapter&>(adapter);
        TVR_LOG(TVR_DBG, "%s", fcAdapter.getName().c_str());
        if (const std::uint32_t status = createAdapter(index, fcAdapter); status != BUILD_DONE)
            return status;
    }
    return BUILD_DONE;
}

std::uint32_t AdapterMapsBuild::createAdapter(unsigned adapterIndex, FCAdapter& adapter)
{
    TVRHBA_Product* product = nullptr;
    TVRHBA_LogicalPortGroup* group = nullptr;
    TVRHBA_Card* card = nullptr;
    bool cardIsNew = false;
    if (createPackageInstances(_agent, adapter, product, group) != BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "CreatePackageInstances failed"), BUILD_FAILED;
    if (createCardInstances(_agent, adapter, card, cardIsNew) != BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "CreateCardInstances failed"), BUILD_FAILED;

    for (unsigned portIndex = 0; portIndex < adapter.getPortCount(); portIndex++)
    {
        TVR_LOG(TVR_DBG, "Creating classes for port %d.", static_cast<int>(portIndex));
        auto& port = dynamic_cast<FCPort&>(*adapter.getPort(portIndex));
        PortParts parts{adapterIndex, portIndex, adapter,         port,   product, group,
                        card,         nullptr,   ChipKind::Other, nullptr};
        if (const std::uint32_t status = createPort(parts, cardIsNew); status != BUILD_DONE)
            return status;
    }
    return BUILD_DONE;
}

std::uint32_t AdapterMapsBuild::createPort(PortParts& parts, bool cardIsNew)
{
    if (updateFRU(_agent, parts.adapter, parts.port, parts.card) != BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "Update FRU related class failed"), BUILD_FAILED;
    if (cardIsNew)
    {
        // On the second port of a new card the cache refuses its associations, which ends the step and not the run.
        TVR_LOG(TVR_DBG, "Card is created. Creating the associations");
        createCardAssociations(_agent, parts.card,
                               {parts.product, findProviderSoftwareIdentity(_agent),
                                findProfile(_agent, "Physical Asset"), _chassis.get()});
    }

    const auto* installService =
        static_cast<TVRHBA_SoftwareInstallationService*>(_agent.m_TVRHBA_SoftwareInstallationService_map.at(0));
    if (createChipInstances(_agent, parts.adapter, parts.card, installService, parts.chip, parts.chipKind) !=
        BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "CreateChipInstances failed"), BUILD_FAILED;

    const std::uint32_t pciStatus = createPCIDeviceInstance(_agent, parts.adapterIndex, parts.portIndex, parts.port,
                                                            parts.adapter, findProfile(_agent, "PCI Device"));
    if (pciStatus == BUILD_NO_INSTANCE)
        return BUILD_DONE; // the next port may do better
    if (pciStatus != BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "CreatePCIDeviceInstance failed"), BUILD_FAILED;

    if (createPhysicalConnectorInstances(_agent, parts.adapter, parts.chip, parts.card, parts.product,
                                         parts.connector) != BUILD_DONE)
        return TVR_LOG(TVR_CRIT, "CreatePhysicalConnectorInstances failed"), BUILD_FAILED;
    if (createPortInstances(_agent, parts) != BUILD_DONE)
        return BUILD_FAILED;
    if (createPortSoftwareIdentities(_agent, parts) != BUILD_DONE)
        return BUILD_FAILED;
    return createServiceAffects(_agent, parts);
}

/// Each of these is logged and passed over.
void AdapterMapsBuild::createLogsAndDumps()
{
    TVR_LOG(TVR_DBG, "Calling FC_CreateDumpClasses");
    if (CreateFCDriverLogClasses(_agent) != BUILD_DONE)
        TVR_LOG(TVR_INFO, "Issue with FC Driver Log classes");
    if (const std::uint32_t status = FC_CreateDumpClasses(_agent); status != BUILD_DONE)
        TVR_LOG(TVR_ERR, "FC_CreateDumpClasses failed with status %d", static_cast<int>(status));
    if (const std::uint32_t status = CreatePortVirtualizationClasses(_agent); status != BUILD_DONE)
        TVR_LOG(TVR_ERR, "CreatePortVirtualizationClasses failed: %d", static_cast<int>(status));
}

void AdapterMapsBuild::createDiagnostics()
{
    try
    {
        ClearDiagnosticClassMaps(_agent, 0);
        if (CreateFCHBADiagnosticClassFeature(_agent) != BUILD_DONE)
            TVR_LOG(TVR_DBG, "FCHBA Diagnositcss either Not Supported/Failed to Create the feature");
    }
    catch (...)
    {
        ClearDiagnosticClassMaps(_agent, 0);
        TVR_LOG(TVR_DBG, "Exception in FCHBA Diagnostics feature class creation");
    }
}

void AdapterMapsBuild::updateFRUData()
{
    try
    {
        if (updateFRUInstances(_agent) != BUILD_DONE)
            TVR_LOG(TVR_DBG, "Failed to update FRU VPD data to cim_ Softwareidentity/PhysicalPackage instances");
    }
    catch (...)
    {
        TVR_LOG(TVR_DBG, "Exception occured during FRU update to cim_ Softwareidentity/PhysicalPackage instances");
    }
}

} // namespace

std::uint32_t buildAdapterMaps(ProviderAgent& agent)
{
    return AdapterMapsBuild(agent).run();
}

} // namespace cimple
