#include "model/Slices.h"

namespace cimple
{

std::uint32_t createSoftwareInstallationService(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t createWWNService(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t createFCTagService(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t createBootBIOSService(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t createDriverParamService(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t createDriverIdentity(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t updateFRU(ProviderAgent&, const FCAdapter&, const FCPort&, TVRHBA_Card*)
{
    return BUILD_DONE;
}

std::uint32_t CreateVPD(ProviderAgent&, unsigned, unsigned, const FCPort&)
{
    return BUILD_DONE;
}

std::uint32_t createPortInstances(ProviderAgent&, const PortParts&)
{
    return BUILD_DONE;
}

std::uint32_t createPortSoftwareIdentities(ProviderAgent&, const PortParts&)
{
    return BUILD_DONE;
}

std::uint32_t createServiceAffects(ProviderAgent&, const PortParts&)
{
    return BUILD_DONE;
}

std::uint32_t createDriverParamInstances(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t CreateFCDriverLogClasses(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t FC_CreateDumpClasses(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t CreatePortVirtualizationClasses(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t CreateFCHBADiagnosticClassFeature(ProviderAgent&)
{
    return BUILD_DONE;
}

std::uint32_t updateFRUInstances(ProviderAgent&)
{
    return BUILD_DONE;
}

void clearDriverLogMaps(ProviderAgent& agent)
{
    agent.m_TVRHBA_FCDriverLogEntry_map.clear();
    agent.m_TVRHBA_DriverRecordLogManagesRecord_map.clear();
    agent.m_TVRHBA_DriverEnabledRecordLogCapabilities_map.clear();
    agent.m_TVRHBA_DriverProviderUseOfLog_map.clear();
}

void clearPortVirtualizationMaps(ProviderAgent&) {}

std::uint32_t ClearDiagnosticClassMaps(ProviderAgent&, int)
{
    return BUILD_DONE;
}

std::uint32_t updateSANMaps(ProviderAgent&)
{
    return BUILD_DONE;
}

} // namespace cimple
