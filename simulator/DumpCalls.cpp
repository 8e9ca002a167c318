// Dumps of the simulated host, and the trace of its firmware. The dump files are names: nothing is written.
#include "simulator/SimulatedHost.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <sys/time.h>

namespace tvrsim
{

namespace
{

/// "10000090FA942779_20240131_235959", in UTC.
std::string dumpName(const Port& port)
{
    timeval now{};
    gettimeofday(&now, nullptr);
    tm parts{};
    gmtime_r(&now.tv_sec, &parts);
    char time[32] = "";
    std::strftime(time, sizeof time, "_%Y%m%d_%H%M%S", &parts);
    std::string name = wwnText(port.wwpn);
    std::erase(name, ':');
    return name + time;
}

/// Dumps of one second are told apart by a number. The oldest goes where there is no more room.
void addDump(Port& port, const char* ending)
{
    std::vector<std::string>& files = port.dumps.files;
    const std::string name = dumpName(port);
    std::string file = name + ending;
    for (unsigned number = 2; std::ranges::find(files, file) != files.end(); ++number)
        file = name + "_" + std::to_string(number) + ending;
    files.push_back(file);
    while (files.size() > port.dumps.retentionCount)
        files.erase(files.begin());
}

/// A field that may be filled to the brim.
template <std::size_t Size> std::string_view textOf(const char (&field)[Size])
{
    return {field, strnlen(field, Size)};
}

} // namespace

template <class Use> RM_STATUS SimulatedHost::changeDumps(Wwn wwpn, Use use)
{
    return changePort(wwpn, [&](Adapter&, Port& port) -> RM_STATUS { return use(port.dumps); });
}

RM_STATUS SimulatedHost::generateDump(Wwn wwpn, const char* ending)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          addDump(port, ending);
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::generateDumps(const char* ending)
{
    std::lock_guard lock(_mutex);
    for (Adapter& adapter : _scenario.adapters)
        for (Port& port : adapter.ports)
            addDump(port, ending);
    return RM_OK;
}

RM_STATUS SimulatedHost::dumps(Wwn wwpn, DumpFiles& out)
{
    return changeDumps(wwpn,
                       [&](const DumpFiles& dumps)
                       {
                           out = dumps;
                           return RM_OK;
                       });
}

RM_STATUS SimulatedHost::setDumpDirectory(Wwn wwpn, std::string_view directory)
{
    return changeDumps(wwpn,
                       [&](DumpFiles& dumps)
                       {
                           if (!directory.starts_with('/') || directory.size() >= RM_DUMP_PATH_SIZE)
                               return RM_ERROR_DIRECTORY_NOT_OPENED;
                           dumps.directory = directory;
                           return RM_OK;
                       });
}

RM_STATUS SimulatedHost::setDumpRetention(Wwn wwpn, std::uint32_t count)
{
    return changeDumps(wwpn,
                       [&](DumpFiles& dumps)
                       {
                           if (count == 0)
                               return RM_ERROR;
                           dumps.retentionCount = count;
                           return RM_OK;
                       });
}

RM_STATUS SimulatedHost::deleteDumps(Wwn wwpn)
{
    return changeDumps(wwpn,
                       [&](DumpFiles& dumps)
                       {
                           dumps.files.clear();
                           return RM_OK;
                       });
}

RM_STATUS SimulatedHost::setTraceLevel(Wwn wwpn, const TraceLevel& level)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          port.traceLevel = level;
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::eventLogConfig(Wwn wwpn, RM_EventLogConfig& out)
{
    return changePort(wwpn,
                      [&](Adapter&, const Port& port)
                      {
                          out.room = RM_MAX_EVENT_LOG_MODULES;
                          out.count = static_cast<std::uint32_t>(port.tracedModules.size());
                          std::ranges::copy(port.tracedModules, out.entry);
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::setEventLogModule(Wwn wwpn, const RM_EventLogModule& module)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          const auto known =
                              std::ranges::find_if(port.tracedModules, [&](const RM_EventLogModule& candidate)
                                                   { return textOf(candidate.module) == textOf(module.module); });
                          if (known == port.tracedModules.end())
                              return RM_ERROR;
                          *known = module;
                          return RM_OK;
                      });
}

} // namespace tvrsim
