#include "logs/DriverLog.h"

#include "agent/DriverIdentity.h"
#include "agent/MethodCall.h"
#include "agent/Reading.h"
#include "agent/RecordLogs.h"
#include "agent/RefreshContext.h"
#include "foundation/ClientText.h"
#include "foundation/FilePaths.h"
#include "logs/NewestLines.h"
#include "schema/TVRHBA_EnabledRecordLogCapabilities.h"
#include "schema/TVRHBA_ProviderUseOfLog.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

#include <optional>
#include <vector>

namespace cimple
{

// --- the log -------------------------------------------------------------------------------------------

namespace
{

Ref<TVRHBA_RecordLog> makeLog(const HostContext& host)
{
    const String id = driverLogId(host.system->Name.value);
    const bool logs = TVR_Logger::instance().isEnabled();
    Ref<TVRHBA_RecordLog> log = fresh<TVRHBA_RecordLog>();
    log->InstanceID.set(id);
    log->ElementName.set(id);
    log->Name.set("Driver logs for Tavrin FC Provider");
    log->MaxNumberOfRecords.set(200);
    log->CurrentNumberOfRecords.set(0);
    log->LogState.set(4);
    log->OverwritePolicy.set(2);
    log->OperationalStatus.set(logs ? Array<std::uint16_t>{2} : Array<std::uint16_t>{10, 2});
    log->RequestedState.set(2);
    log->EnabledState.set(3); // until it has been read
    log->HealthState.set(5);
    return log;
}

Ref<TVRHBA_EnabledRecordLogCapabilities> makeCapabilities()
{
    Ref<TVRHBA_EnabledRecordLogCapabilities> capabilities = fresh<TVRHBA_EnabledRecordLogCapabilities>();
    capabilities->InstanceID.set("TVR:FC Driver Record Log Capabilities");
    capabilities->RequestedStatesSupported.set({2, 3, 11});
    capabilities->ElementNameEditSupported.set(false);
    capabilities->MaxElementNameLen.set(0);
    return capabilities;
}

const FCAdapter* firstFCAdapter(const ProviderAgent& agent)
{
    for (const Adapter* adapter : agent.m_pData->adapters)
    {
        if (const auto* fcAdapter = dynamic_cast<const FCAdapter*>(adapter))
            return fcAdapter;
        TVR_LOG(TVR_DBG, "Skippping Adapter [%s] since it is not an FC Adapter", adapter->getName().c_str());
    }
    return nullptr;
}

std::uint32_t createLog(HostContext& host, const FCAdapter& adapter)
{
    const Ref<TVRHBA_RecordLog> madeLog = unlessOutOfMemory([&] { return makeLog(host); });
    if (!madeLog)
        return failed({TVR_DBG, "Failed to allocate memory to create TVRHBA_RecordLog"});
    const TVRHBA_RecordLog* log =
        mapOf<TVRHBA_RecordLog>(host.agent).insert(madeLog, "Insert Failed : m_TVRHBA_RecordLog_map");
    if (!log)
        return BUILD_FAILED;
    const Ref<TVRHBA_EnabledRecordLogCapabilities> capabilities = unlessOutOfMemory(makeCapabilities);
    if (!capabilities)
        return failed({TVR_DBG, "Failed to allocate memory to create TVRHBA_EnabledRecordLogCapabilities"});
    if (!secondMapOf<TVRHBA_EnabledRecordLogCapabilities>(host.agent)
             .insert(capabilities, "Insert Failed : m_TVRHBA_EnabledRecordLogCapabilities_map"))
        return BUILD_FAILED;
    const FCAdapterAttributes* attributes = adapter.getAttributes();
    const TVRHBA_SoftwareIdentity* driver = attributes ? findDriverIdentity(host.agent, *attributes) : nullptr;
    if (driver)
        associateUseOfLog(secondMapOf<TVRHBA_ProviderUseOfLog>(host.agent), log, driver);
    else
        TVR_LOG(TVR_DBG, "Missing Provider Software Identity");
    return BUILD_DONE;
}

} // namespace

std::uint32_t createFCDriverLogClasses(HostContext& host)
{
    TVR_LOG(TVR_DBG, "Enter CreateFCDriverLogClasses");
    const FCAdapter* adapter = firstFCAdapter(host.agent);
    if (const std::uint32_t status = adapter ? createLog(host, *adapter) : BUILD_DONE; status != BUILD_DONE)
        return status;
    TVR_LOG(TVR_DBG, "Exit CreateFCDriverLogClasses");
    return BUILD_DONE;
}

// --- reading -------------------------------------------------------------------------------------------

void ReadDriverLogEvents(DeviceEventBuffer& buffer, const char* keyword)
{
    TVR_LOG(TVR_DBG, "Reading Events for %s", keyword);
    newestLinesWith(filePath(FilePath::SystemLog).c_str(), keyword,
                    [&](std::string_view line) { return buffer.add(clientText(line)) == 0; });
    TVR_LOG(TVR_DBG, "Finished reading Events for %s", keyword);
}

void readDriverLog(ProviderAgent& agent)
{
    ReadDriverLogEvents(agent.m_deviceEvents, "tvfc");
    TVR_LOG(TVR_DBG, "Logging of FC Driver Log Ends");
}

// --- records -------------------------------------------------------------------------------------------

namespace
{

Ref<TVRHBA_FCDriverLogEntry> makeEntry(const TVRHBA_RecordLog* log, std::size_t index, const String& text)
{
    const String name = log ? log->ElementName.value : String();
    Ref<TVRHBA_FCDriverLogEntry> entry = fresh<TVRHBA_FCDriverLogEntry>();
    entry->InstanceID.set(formatText("TVR:HBA FC Driver Record:%zu", index));
    entry->RecordID.set(formatText("%zu", index));
    entry->RecordData.set(text);
    entry->LogInstanceID.set(log ? log->InstanceID.value : String());
    entry->LogName.set(name);
    entry->ElementName.set(name);
    entry->RecordFormat.set("[string record]");
    return entry;
}

/// Fills the map of the entries anew from the buffer.
std::uint32_t CreateFCDriverLogEntryClass(ProviderAgent& agent)
{
    TVR_LOG(TVR_DBG, "************Inside CreateFCDriverLogEntryClass ");
    const TVRHBA_RecordLog* log = findRecordLog(agent, driverLogId(agent));
    const TypedMap<TVRHBA_FCDriverLogEntry> entries = mapOf<TVRHBA_FCDriverLogEntry>(agent);
    entries.clear();
    const std::vector<String>& texts = agent.m_deviceEvents.strings();
    for (std::size_t index = 0; index < texts.size(); index++)
    {
        const Ref<TVRHBA_FCDriverLogEntry> entry =
            unlessOutOfMemory([&] { return makeEntry(log, index, texts[index]); });
        if (!entry)
            return failed("Could not create TVRHBA_FCDriverLogEntry", BUILD_NO_INSTANCE);
        TVR_LOG(TVR_DBG, "TVRHBA_LogEntry returned instance %zu", index);
        if (!entries.insert(entry, {TVR_DBG, "Insert Failed : m_TVRHBA_FCDriverLogEntry_map"}))
            return BUILD_NO_INSTANCE;
    }
    TVR_LOG(TVR_DBG, "CreateFCDriverLogEntryClass Successful");
    return BUILD_DONE;
}

bool isInitialised(const ProviderAgent& agent, const char* source)
{
    if (!agent.m_bLoaded)
        TVR_LOG(TVR_DBG, "RM Init failed for %s", source);
    return agent.m_bLoaded;
}

using Manages = TVRHBA_DriverRecordLogManagesRecord;

/// One for each entry in the map. Throws where memory runs out.
std::vector<Ref<Manages>> makeAssociations(ProviderAgent& agent)
{
    const TVRHBA_RecordLog* log = findRecordLog(agent, driverLogId(agent));
    const SharedEnds ends;
    std::vector<Ref<Manages>> made;
    const TypedMap<TVRHBA_FCDriverLogEntry> entries = mapOf<TVRHBA_FCDriverLogEntry>(agent);
    for (std::size_t index = 0; log && index < entries.size(); index++)
    {
        Ref<Manages> association = fresh<Manages>();
        association->Log = shared_end(log).release();
        association->Record = shared_end(entries.at(index)).release();
        made.push_back(std::move(association));
        TVR_LOG(TVR_DBG, "TVRHBA_DriverRecordLogManagesRecord returned instance %zu", index);
    }
    return made;
}

} // namespace

int enumerateDriverLogEntries(Instance_Handler handler, void* client, const Selection& selection)
{
    constexpr const char* provider = "TVRHBA_FCDriverLogEntry_Provider";
    ProviderAgent& agent = *ProviderAgent::instance();
    if (!isInitialised(agent, provider))
        return 0;
    TVR_LOG(TVR_DBG, "TVRHBA_FCDriverLogEntry_Provider::enum_instances()");
    Reading reading(agent.m_TVRHBA_FCDriverLogEntry_map, selection);
    const bool isCopied = unlessOutOfMemory(
        [&]
        {
            const MethodGuard guard(agent);
            if (CreateFCDriverLogEntryClass(agent) != BUILD_DONE)
                return false;
            reading.copy(agent.adapterMaps());
            return true;
        });
    if (isCopied)
        reading.deliver(provider, handler, client);
    else
    {
        TVR_LOG(TVR_CRIT, " Creation of CreateFCDriverLogEntryClass failed");
        Reading::cutShort(handler, client);
    }
    return 0;
}

int enumerateDriverRecordLogManagesRecord(Instance_Handler handler, void* client)
{
    ProviderAgent& agent = *ProviderAgent::instance();
    if (!isInitialised(agent, "TVRHBA_DriverRecordLogManagesRecord_Provider"))
        return 0;
    TVR_LOG(TVR_DBG, "Enter -- TVRHBA_DriverRecordLogManagesRecord");
    bool isComplete = false;
    auto made = unlessOutOfMemory(
        [&]
        {
            const MethodGuard guard(agent);
            TVR_LOG(TVR_DBG, "Entering TVRHBA_DriverRecordLogManagesRecord::enum_instances");
            isComplete = CreateFCDriverLogEntryClass(agent) == BUILD_DONE;
            if (!isComplete)
                TVR_LOG(TVR_DBG, " Creation of CreateFCDriverLogEntryClass failed");
            return std::optional(makeAssociations(agent));
        });
    if (!made)
        TVR_LOG(TVR_DBG, "Could not create TVRHBA_DriverRecordLogManagesRecord instance");
    else
        for (Ref<Manages>& one : *made)
            handler(one.release(), 0, client);
    if (!made || !isComplete)
        Reading::cutShort(handler, client);
    TVR_LOG(TVR_DBG, "Exit -- TVRHBA_DriverRecordLogManagesRecord");
    return 0;
}

} // namespace cimple
