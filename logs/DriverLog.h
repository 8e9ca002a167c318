// The driver log: what the Fibre Channel kernel driver wrote to the system log, as records of a second record log.
#pragma once

#include "agent/ProviderExtension.h"
#include "runtime/adapter/Provider.h"
#include "schema/TVRHBA_DriverRecordLogManagesRecord.h"
#include "schema/TVRHBA_FCDriverLogEntry.h"

namespace cimple
{

class DeviceEventBuffer;
class ProviderAgent;
struct HostContext;

/// A step of the refresh: the log with its capabilities. Nothing is read before a client enables it.
std::uint32_t createFCDriverLogClasses(HostContext& host);

/// Adds the lines of the system log that contain the keyword, the newest first, until the buffer is full.
void ReadDriverLogEvents(DeviceEventBuffer& buffer, const char* keyword);
/// The same of the driver's lines, for the agent's buffer. The caller holds m_DataMutex.
void readDriverLog(ProviderAgent& agent);

int enumerateDriverLogEntries(Instance_Handler handler, void* client, const Selection& selection);
int enumerateDriverRecordLogManagesRecord(Instance_Handler handler, void* client);

template <class Form> struct Extended<TVRHBA_FCDriverLogEntry, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection& selection)
    {
        return enumerateDriverLogEntries(handler, client, selection);
    }
};

template <class Form> struct Extended<TVRHBA_DriverRecordLogManagesRecord, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection&)
    {
        return enumerateDriverRecordLogManagesRecord(handler, client);
    }
};

} // namespace cimple
