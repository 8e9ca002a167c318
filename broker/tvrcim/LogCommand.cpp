#include "broker/tvrcim/LogCommand.h"

#include "broker/host/LogEntries.h"
#include "broker/tvrcim/Progress.h"
#include "broker/tvrcim/Replies.h"
#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <csignal>

#include <poll.h>
#include <unistd.h>

namespace tvrcim
{

using namespace broker;

namespace
{

constexpr int followInterval = 1000; // milliseconds

/// One of the two logs.
struct LogRow
{
    const LogKind& kind;
    /// Has it show what there is.
    void (*switchOn)(Session& session, const Object& log);
    bool readWhenEnabled; ///< what comes later is seen when it is enabled again
};

void call(Session& session, const Path& log, const std::string& method, const std::vector<Property>& in)
{
    const std::uint64_t value = checked(session.broker.invokeMethod(log, method, in)).returnValue.asUnsigned();
    if (value != 0)
        throw MethodRefusal(method + " returned " + std::to_string(value));
}

void enable(Session& session, const Path& log)
{
    call(session, log, "RequestStateChange", {{"RequestedState", Value::uint16(2)}});
}

Object recordLog(Session& session, const LogRow& row)
{
    const Progress progress(session.progress, "log");
    const Reply logs = checked(session.broker.enumerateInstances(session.nameSpace, "TVRHBA_RecordLog"));
    for (const Object& log : logs.objects)
        if (isLogOf(row.kind, log))
            return log;
    throw CimError({CMPI_RC_ERR_NOT_FOUND, row.kind.absence});
}

// --- the two logs

/// Has the log kept in memory, beside its file if that is in use. Then the provider starts anew, so that what it says
/// of its start and of the hardware is kept as well.
void switchProviderLogOn(Session& session, const Object& log)
{
    const std::uint64_t level = numberOf(log, "LogLevel"); // 0 where nobody ever set it
    const std::uint64_t mode = numberOf(log, "LogMode");
    const std::string path = textOf(log, "TracePath");
    const bool isInMemory = mode == 1 || mode == 4;
    const bool isEnabled = numberOf(log, "EnabledState") == 2;
    const bool writesFile = mode == 2 && !path.empty();
    if (!isInMemory)
        call(session, log.path, "SetLogParams",
             {{"LogLevel", Value::uint16(level ? static_cast<std::uint16_t>(level) : 5)},
              {"LogMode", Value::uint16(writesFile ? 4 : 1)},
              {"TracePath", Value::string(path)}});
    if (!isEnabled)
        enable(session, log.path);
    if (!isInMemory || !isEnabled)
        session.broker.cleanup("", false);
    session.broker.enumerateInstances(session.nameSpace, "TVRHBA_StorageVolume"); // reads the fabric
}

const LogRow providerLog = {.kind = providerLogKind, .switchOn = switchProviderLogOn, .readWhenEnabled = false};

const LogRow driverLog = {.kind = driverLogKind,
                          .switchOn = [](Session& session, const Object& log) { enable(session, log.path); },
                          .readWhenEnabled = true};

// --- entries

/// What tells an entry from others.
std::string keyOf(const Object& entry)
{
    return textOf(entry, "CreationTimeStamp") + " " + textOf(entry, "RecordData");
}

/// The oldest first.
std::vector<Object> entriesOf(Session& session, const LogRow& row, unsigned level)
{
    std::vector<Object> entries =
        checked(session.broker.enumerateInstances(session.nameSpace, row.kind.entryClass)).objects;
    sortEntries(row.kind, entries);
    if (level != 0)
        std::erase_if(entries, [&](const Object& entry) { return textOf(entry, "LogLevel") > std::to_string(level); });
    return entries;
}

/// How many entries at the head of `now` were the last of `before`.
std::size_t knownOf(const std::vector<std::string>& before, const std::vector<std::string>& now)
{
    std::size_t known = std::min(before.size(), now.size());
    while (!std::equal(before.end() - static_cast<std::ptrdiff_t>(known), before.end(), now.begin()))
        known--;
    return known;
}

/// "2026-11-22 18:30:00.123456  error     text", or the text alone where it tells no time.
std::string lineText(const LogLine& line)
{
    return line.time.empty() ? line.text : line.time + "  " + padded(line.severity, 8) + "  " + line.text;
}

/// False when nobody reads the output any more.
bool waitForMore()
{
    pollfd output{STDOUT_FILENO, 0, 0}; // its end is told unasked
    return poll(&output, 1, followInterval) <= 0;
}

void print(Session& session, const LogRow& row, const std::vector<Object>& entries, bool follow)
{
    if (session.format != Format::table && !(session.format == Format::json && follow))
        printObjects(session.out, session.format, session.broker.classes(), entries, std::nullopt);
    else
        for (const Object& entry : entries)
            session.out << (session.format == Format::json ? jsonText(toJson(entry)) : lineText(row.kind.line(entry)))
                        << '\n';
    session.out.flush();
}

} // namespace

void showLog(Session& session, const Command& command)
{
    const LogRow& row = command.driver ? driverLog : providerLog;
    if (command.follow)
        std::signal(SIGPIPE, SIG_IGN); // when nobody reads any more, the module is unloaded first
    const Object log = recordLog(session, row);
    {
        const Progress progress(session.progress, "log");
        row.switchOn(session, log);
    }
    std::vector<std::string> shown;
    for (bool first = true; first || (command.follow && session.out && waitForMore()); first = false)
    {
        if (!first && row.readWhenEnabled)
            enable(session, log.path);
        std::vector<Object> entries = entriesOf(session, row, command.level);
        std::vector<std::string> keys;
        std::ranges::transform(entries, std::back_inserter(keys), keyOf);
        const std::size_t known = knownOf(shown, keys);
        entries.erase(entries.begin(), entries.begin() + static_cast<std::ptrdiff_t>(known));
        if (first || !entries.empty())
            print(session, row, entries, command.follow);
        shown = std::move(keys);
    }
}

} // namespace tvrcim
