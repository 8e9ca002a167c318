#include "services/DumpClasses.h"

#include "agent/Build.h"
#include "agent/ClassCatalog.h"
#include "device/TVR_MethodWrapper.h"
#include "foundation/ClientText.h"
#include "schema/TVRHBA_DumpData.h"
#include "schema/TVRHBA_DumpService.h"
#include "schema/TVRHBA_DumpServiceAffectsElement.h"
#include "schema/TVRHBA_ElementDumpData.h"
#include "schema/TVRHBA_HostedDumpService.h"
#include "schema/TVRHBA_PortController.h"
#include "services/DumpCalls.h"

#include <string>

namespace cimple
{

namespace
{

constexpr std::uint32_t noInstance = 40008;

/// Ends the making of the classes.
struct GivenUp
{
    std::uint32_t status;
};

/// Puts an instance that `fill` has filled in its map.
template <class Record, class Fill>
const Record* add(InstanceCache& cache, Fill fill, const LogText& notMade, const LogText& refused)
{
    Ref<Record> made = unlessOutOfMemory(
        [&]
        {
            Ref<Record> record = fresh<Record>();
            fill(*record);
            return record;
        });
    if (!made)
        throw GivenUp{failed(notMade, BuildStatus{noInstance})};
    const Record* kept = mapOf<Record>(cache).insert(std::move(made), refused);
    return kept ? kept : throw GivenUp{BUILD_FAILED};
}

const TVRHBA_DumpService* addService(InstanceCache& cache, const CIM_ComputerSystem& system)
{
    const auto* service = add<TVRHBA_DumpService>(
        cache,
        [&](TVRHBA_DumpService& made)
        {
            setSystem(made, system);
            made.CreationClassName.set(className<TVRHBA_DumpService>());
            made.Name.set(className<TVRHBA_DumpService>());
        },
        "Failed to create TVRHBA_DumpService", "Insert Failed : m_TVRHBA_DumpService_map");
    add<TVRHBA_HostedDumpService>(
        cache,
        [&](TVRHBA_HostedDumpService& made)
        {
            made.Antecedent = shared_end(&system).release();
            made.Dependent = shared_end(service).release();
        },
        "Failed to create TVRHBA_HostedDumpService", "Insert Failed : m_TVRHBA_HostedDumpService_map");
    return service;
}

void affect(InstanceCache& cache, const TVRHBA_DumpService* service, const TVRHBA_PortController* controller)
{
    constexpr std::uint16_t manages = 5; // CIM_ServiceAffectsElement.ElementEffects
    add<TVRHBA_DumpServiceAffectsElement>(
        cache,
        [&](TVRHBA_DumpServiceAffectsElement& made)
        {
            made.AffectedElement = shared_end(controller).release();
            made.AffectingElement = shared_end(service).release();
            made.ElementEffects.set({manages});
        },
        "Failed to create TVRHBA_DumpServiceAffectsElement", "Insert Failed : m_TVRHBA_DumpServiceAffectsElement_map");
}

HBA_WWN adapterName(const TVRHBA_PortController& controller)
{
    char name[TVR_MethodWrapper::hbaNameLength + 1];
    HBA_WWN wwpn;
    if (TVR_MethodWrapper::Id2HBAName(name, controller.DeviceID.value.c_str()) != 0)
        throw GivenUp{failed({TVR_ERR, "TVR_Dump::Id2HBAName failed"})};
    if (TVR_MethodWrapper::str2HBAName(&wwpn, name) != 0)
        throw GivenUp{failed({TVR_ERR, "TVR_Dump::str2HBAName failed"})};
    return wwpn;
}

/// Empty if the library does not tell.
std::string dumpDirectory(const HBA_WWN& wwpn)
{
    std::string directory;
    if (tvrcimGetDumpDirectory(wwpn, &directory) == RM_OK)
        TVR_LOG(TVR_DBG, "TVR_Dump::tvrcimGetDumpDirectory Succesful");
    else
        TVR_LOG(TVR_INFO, "TVR_Dump::tvrcimGetDumpDirectory failed");
    return directory;
}

/// 0 if the library does not tell.
std::uint32_t retentionCount(const HBA_WWN& wwpn)
{
    std::uint32_t count = 0;
    TVR_LOG(TVR_DBG, "Calling TVR_Dump::tvrcimGetRetentionCount");
    const RM_STATUS status = tvrcimGetRetentionCount(wwpn, &count);
    TVR_LOG(TVR_DBG, "returned tvrcimGetRetentionCount call from wrapper");
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "TVR_Dump::tvrcimGetRetentionCount Succesful");
    else
        TVR_LOG(TVR_ERR, "TVR_Dump::tvrcimGetRetentionCount failed");
    return count;
}

void addData(InstanceCache& cache, const TVRHBA_PortController* controller)
{
    const HBA_WWN wwpn = adapterName(*controller);
    const std::string directory = dumpDirectory(wwpn);
    const std::uint32_t count = retentionCount(wwpn);
    const String& id = controller->DeviceID.value;
    const auto* data = add<TVRHBA_DumpData>(
        cache,
        [&](TVRHBA_DumpData& made)
        {
            made.InstanceID.set(joinTexts({"TVRHBA_DumpData::", id.view()}));
            made.ElementName.set(id);
            made.RetentionCount.set(count);
            made.DumpDirectory.set(clientText(directory));
        },
        "Failed to create TVRHBA_DumpData for fc port", "Insert Failed : m_TVRHBA_DumpData_map");
    constexpr std::uint16_t isDefault = 1; // CIM_ElementSettingData.IsDefault
    add<TVRHBA_ElementDumpData>(
        cache,
        [&](TVRHBA_ElementDumpData& made)
        {
            made.SettingData = shared_end(data).release();
            made.ManagedElement = shared_end(controller).release();
            made.IsDefault.set(isDefault);
        },
        "Failed to create TVRHBA_ElementDumpData for fc port", "Insert Failed : m_TVRHBA_ElementDumpData_map");
}

} // namespace

std::uint32_t FC_CreateDumpClasses(InstanceCache& cache)
{
    TVR_LOG(TVR_DBG, "Entered FC_CreateDumpClasses");
    const CIM_ComputerSystem* system = mapOf<CIM_ComputerSystem>(cache).first();
    if (!system)
        return failed("Failed to create TVRHBA_DumpService", BuildStatus{noInstance});
    try
    {
        const TVRHBA_DumpService* service = addService(cache, *system);
        const auto controllers = mapOf<TVRHBA_PortController>(cache);
        for (std::size_t i = 0; const TVRHBA_PortController* controller = controllers.at(i); i++)
        {
            affect(cache, service, controller);
            addData(cache, controller);
        }
    }
    catch (const GivenUp& end)
    {
        return end.status;
    }
    return BUILD_DONE;
}

std::uint32_t FC_ClearDumpClasses(InstanceCache& cache)
{
    TVR_LOG(TVR_DBG, "Entered FC_ClearDumpClasses");
    clearGroup(cache, MapGroup::Dump);
    return BUILD_DONE;
}

std::uint32_t createDumpClasses(HostContext& host)
{
    const std::uint32_t status = FC_CreateDumpClasses(host.agent);
    if (status == BUILD_DONE)
        TVR_LOG(TVR_DBG, "FC_CreateDumpClasses succesful");
    return status;
}

} // namespace cimple
