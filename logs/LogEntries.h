// The module's own log as records: they are made of what the log keeps in memory, when somebody asks for them.
#pragma once

#include "agent/ProviderExtension.h"
#include "runtime/adapter/Provider.h"
#include "schema/TVRHBA_LogEntry.h"
#include "schema/TVRHBA_RecordLogManagesRecord.h"

namespace cimple
{

int enumerateLogEntries(Instance_Handler handler, void* client, const Selection& selection);
/// The records that these refer to have names of their own: no entry answers to them.
int enumerateRecordLogManagesRecord(Instance_Handler handler, void* client);

template <class Form> struct Extended<TVRHBA_LogEntry, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection& selection)
    {
        return enumerateLogEntries(handler, client, selection);
    }
};

template <class Form> struct Extended<TVRHBA_RecordLogManagesRecord, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection&)
    {
        return enumerateRecordLogManagesRecord(handler, client);
    }
};

} // namespace cimple
