// The refresh of the module: which steps it has, in which order, and what a failure of each does.
#include "agent/RefreshSteps.h"

#include "diagnostics/DiagnosticFeature.h"
#include "logs/DriverLog.h"
#include "model/ComputerSystem.h"
#include "model/DriverParameters.h"
#include "model/PhysicalModel.h"
#include "model/PortModel.h"
#include "model/PortVirtualization.h"
#include "model/PriorityLanes.h"
#include "model/Profiles.h"
#include "model/ProviderInstances.h"
#include "model/SanModel.h"
#include "model/Services.h"
#include "model/SoftwareIdentities.h"
#include "model/VitalProductData.h"
#include "services/DumpClasses.h"

namespace cimple
{

namespace
{

constexpr OnFailure Stop = OnFailure::Stop;
constexpr OnFailure GoOn = OnFailure::GoOn;

std::uint32_t checkDeviceData(HostContext& host)
{
    return host.agent.m_pData ? BUILD_DONE : BUILD_FAILED;
}

constexpr HostStep hostSteps[] = {
    {createComputerSystem, Stop, "Could not create the Computer System Instance"},
    {takePlatformChassis, GoOn, {}},
    {createProfiles, GoOn, {}},
    {checkDeviceData, Stop, "Could not locate the data pointer - Serious issue"},
    {createChassis, Stop, "Could not create the Chassis Instance"},
};

constexpr HostStep cardSteps[] = {
    {createProviderSoftwareIdentity, Stop, "TVRHBA_SoftwareIdentity provider creation failed"},
    {createProviderConfigSettings, Stop, {}},
    {createSoftwareInstallationService, Stop, {}},
    {createWWNService, Stop, {}},
    {createFCTagService, Stop, {}},
    {createBootBIOSService, Stop, {}},
    {createDriverParameterService, Stop, {}},
    {createDriverSoftwareIdentities, Stop, {}},
    {createRemoteAccessPoint, Stop, {}},
    {buildAdapters, Stop, {}},
    {createDriverParameters, GoOn, {}},
    mark({TVR_DBG, "Done with the Driver Parameter fetching"}),
    mark({TVR_DBG, "Calling FC_CreateDumpClasses"}),
    {createFCDriverLogClasses, GoOn, {TVR_INFO, "Issue with FC Driver Log classes"}},
    {createDumpClasses,
     GoOn,
     {TVR_ERR, "FC_CreateDumpClasses failed with status %d"},
     {TVR_ERR, "Exception in FC_CreateDumpClasses"}},
    {createPortVirtualization,
     GoOn,
     {TVR_ERR, "CreatePortVirtualizationClasses failed: %d"},
     {TVR_ERR, "Exception in port virtualization class creation"},
     MapGroup::PortVirtualization},
    {createPriorityLanes, GoOn, {}},
};

constexpr AdapterStep adapterSteps[] = {
    {createPackageInstances, Stop, "CreatePackageInstances failed"},
    {createCardInstances, Stop, "CreateCardInstances failed"},
};

constexpr PortStep portSteps[] = {
    {readVitalProductData, GoOn, {}},
    {updateCardFru, Stop, "Update FRU related class failed"},
    {createCardAssociations, GoOn, {}},
    {createChipInstances, Stop, "CreateChipInstances failed"},
    {createPCIDeviceInstance, Stop, "CreatePCIDeviceInstance failed"},
    {createPhysicalConnectorInstances, Stop, "CreatePhysicalConnectorInstances failed"},
    {createFCPort, Stop, {}},
    {createFCPortStatistics, Stop, {}},
    {createSCSIProtocolController, Stop, {}},
    {createPortController, Stop, {}},
    {createTransceiver, Stop, {}},
    {createFlashImages, GoOn, {}},
    {createPortControllerAssociations, Stop, {}},
    {createInitiatorEndpoint, Stop, {}},
    {createPortSoftwareIdentities, Stop, {}},
    {createPortServiceAssociations, GoOn, {}},
    mark<PortContext>({TVR_DBG, "Ending of Software Installation Service"}),
};

constexpr HostStep closingSteps[] = {
    {createDiagnostics,
     GoOn,
     {TVR_DBG, "FCHBA Diagnositcss either Not Supported/Failed to Create the feature"},
     {TVR_DBG, "Exception in FCHBA Diagnostics feature class creation"},
     MapGroup::Diagnostics},
    {updateFruData,
     GoOn,
     {TVR_DBG, "Failed to update FRU VPD data to cim_ Softwareidentity/PhysicalPackage instances"},
     {TVR_DBG, "Exception occured during FRU update to cim_ Softwareidentity/PhysicalPackage instances"}},
    {createProviderRecordLog, Stop, {}},
    mark({TVR_DBG, "Create the Diagnostic classes"}),
};

constexpr HostStep sanSteps[] = {
    {createLogicalUnits, Stop, {}},
    {scanPriorityLanes, Stop, {}},
};

} // namespace

const RefreshSteps refreshSteps = {
    .askPlatform = askPlatform,
    .host = hostSteps,
    .cards = cardSteps,
    .adapter = adapterSteps,
    .port = portSteps,
    .closing = closingSteps,
    .san = sanSteps,
};

} // namespace cimple
