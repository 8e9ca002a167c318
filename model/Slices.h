// The steps of the refresh that belong to other slices of the model, in the order in which they are called. A step
// whose slice is not built yet inserts nothing and succeeds. Each returns a BuildStatus.
#pragma once

#include "agent/ModelStages.h"
#include "agent/ProviderAgent.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"
#include "model/PhysicalModel.h"

namespace cimple
{

// --- services of the host, started before the adapters
std::uint32_t createSoftwareInstallationService(ProviderAgent& agent);
std::uint32_t createWWNService(ProviderAgent& agent);
std::uint32_t createFCTagService(ProviderAgent& agent);
std::uint32_t createBootBIOSService(ProviderAgent& agent);
std::uint32_t createDriverParamService(ProviderAgent& agent);
std::uint32_t createDriverIdentity(ProviderAgent& agent);

// --- of each port
/// What the port chain stands on.
struct PortParts
{
    unsigned adapterIndex;
    unsigned portIndex;
    FCAdapter& adapter;
    FCPort& port;
    TVRHBA_Product* product;
    TVRHBA_LogicalPortGroup* group;
    TVRHBA_Card* card;
    TVRHBA_Chip* chip;
    ChipKind chipKind;
    TVRHBA_PhysicalConnector* connector;
};
std::uint32_t updateFRU(ProviderAgent& agent, const FCAdapter& adapter, const FCPort& port, TVRHBA_Card* card);
std::uint32_t CreateVPD(ProviderAgent& agent, unsigned adapterIndex, unsigned portIndex, const FCPort& port);
std::uint32_t createPortInstances(ProviderAgent& agent, const PortParts& parts);
std::uint32_t createPortSoftwareIdentities(ProviderAgent& agent, const PortParts& parts);
std::uint32_t createServiceAffects(ProviderAgent& agent, const PortParts& parts);

// --- after the adapters
std::uint32_t createDriverParamInstances(ProviderAgent& agent);
std::uint32_t CreateFCDriverLogClasses(ProviderAgent& agent);
std::uint32_t FC_CreateDumpClasses(ProviderAgent& agent);
std::uint32_t CreatePortVirtualizationClasses(ProviderAgent& agent);
std::uint32_t CreateFCHBADiagnosticClassFeature(ProviderAgent& agent);
std::uint32_t updateFRUInstances(ProviderAgent& agent);
std::uint32_t createProviderRecordLog(ProviderAgent& agent);

// --- clearing
void clearDriverLogMaps(ProviderAgent& agent);
void clearPortVirtualizationMaps(ProviderAgent& agent);
/// Group 0: the diagnostic features. Records and jobs outlive a refresh.
std::uint32_t ClearDiagnosticClassMaps(ProviderAgent& agent, int group);

// --- the SAN half
std::uint32_t updateSANMaps(ProviderAgent& agent);

} // namespace cimple
