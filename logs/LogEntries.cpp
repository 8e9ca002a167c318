#include "logs/LogEntries.h"

#include "agent/MethodCall.h"
#include "agent/Reading.h"
#include "agent/RecordLogs.h"
#include "foundation/ClientText.h"
#include "schema/TVRHBA_RecordLog.h"

#include <optional>
#include <vector>

namespace cimple
{

namespace
{

/// What an enumeration stands on: the log, if it is in the cache, and a copy of its records.
struct ProviderLog
{
    explicit ProviderLog(ProviderAgent& agent)
        : log(findRecordLog(agent, providerLogId(agent))), records(agent.m_cimLogger.entries())
    {
        TVR_LOG(TVR_DBG, "Log Size %zu", records.size());
    }

    const TVRHBA_RecordLog* log;
    std::vector<TVR_CIMLogEntry> records;
};

Ref<TVRHBA_LogEntry> makeEntry(const ProviderLog& of, std::size_t index, const String& id)
{
    const TVR_CIMLogEntry& record = of.records[index];
    const String name = of.log ? of.log->ElementName.value : String();
    Ref<TVRHBA_LogEntry> entry = fresh<TVRHBA_LogEntry>();
    entry->InstanceID.set(id);
    entry->RecordID.set(formatText("%zu", index));
    entry->CreationTimeStamp.set(record.timestamp);
    entry->RecordData.set(clientText(record.text));
    entry->LogLevel.set(formatText("%d", record.level));
    entry->LogInstanceID.set(of.log ? of.log->InstanceID.value : String());
    entry->LogName.set(name);
    entry->ElementName.set(name);
    entry->RecordFormat.set("[string fileName][uint32 lineNumber]:[string record]");
    return entry;
}

/// What `make` gives for each record, without those for which it gives none; nothing where memory runs out on the way.
template <class Made, class Make> std::optional<std::vector<Ref<Made>>> makeOfRecords(ProviderAgent& agent, Make make)
{
    try
    {
        const MethodGuard guard(agent);
        const SharedEnds ends;
        const ProviderLog of(agent);
        std::vector<Ref<Made>> made;
        made.reserve(of.records.size());
        for (std::size_t index = 0; index < of.records.size(); index++)
            if (Ref<Made> one = make(of, index))
                made.push_back(std::move(one));
        return made;
    }
    catch (const std::bad_alloc&)
    {
        TVR_LOG(TVR_CRIT, "Could not create TVRUCNA_LogEntry instance");
        return std::nullopt;
    }
}

/// Each goes to the handler when the data lock is free again: the server may call back from there.
template <class Made, class Make>
void enumerate(const LogText& entry, const char* source, Instance_Handler handler, void* client, Make make)
{
    ProviderAgent& agent = *ProviderAgent::instance();
    if (!agent.m_bLoaded)
        return TVR_LOG(TVR_DBG, "RM Init failed for %s", source);
    entry.log();
    auto made = makeOfRecords<Made>(agent, make);
    if (!made)
        return Reading::cutShort(handler, client);
    for (Ref<Made>& one : *made)
        handler(one.release(), 0, client);
    TVR_LOG(TVR_DBG, "TVRUCNA_LogEntry_Provider::enum_instances()");
}

} // namespace

int enumerateLogEntries(Instance_Handler handler, void* client, const Selection& selection)
{
    const auto* wanted = static_cast<const TVRHBA_LogEntry*>(selection.keys);
    enumerate<TVRHBA_LogEntry>({TVR_DBG, "Entering TVRHBA_LogEntry::enum_instances"}, "TVRHBA_LogEntry_Provider",
                               handler, client,
                               [&](const ProviderLog& of, std::size_t index) -> Ref<TVRHBA_LogEntry>
                               {
                                   const String id = formatText("TVRHBA:ProviderLog:%zu", index);
                                   if (wanted && wanted->InstanceID.value != id)
                                       return {};
                                   Ref<TVRHBA_LogEntry> made = makeEntry(of, index, id);
                                   TVR_LOG(TVR_DBG, "TVRHBA_LogEntry returned instance %zu", index);
                                   return made;
                               });
    return 0;
}

int enumerateRecordLogManagesRecord(Instance_Handler handler, void* client)
{
    using Manages = TVRHBA_RecordLogManagesRecord;
    enumerate<Manages>({TVR_DBG, "Entering TVRHBA_RecordLogManagesRecord::enum_instances"},
                       "TVRHBA_RecordLogManagesRecord_Provider", handler, client,
                       [](const ProviderLog& of, std::size_t index) -> Ref<Manages>
                       {
                           if (!of.log)
                               return {};
                           const String id = formatText("TVRHBA: FC Driver Record:%zu", index);
                           Ref<Manages> made = fresh<Manages>();
                           made->Log = shared_end(of.log).release();
                           made->Record = makeEntry(of, index, id).release();
                           TVR_LOG(TVR_DBG, "TVRHBA_RecordLogManagesRecord returned instance %zu", index);
                           return made;
                       });
    return 0;
}

} // namespace cimple
