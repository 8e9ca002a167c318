#include "broker/tvrcim/LogCommand.h"

#include "broker/tvrcim/Progress.h"
#include "broker/tvrcim/Replies.h"
#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
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
    const char* idPrefix;
    const char* absence;
    const char* entryClass;
    /// Has it show what there is.
    void (*switchOn)(Session& session, const Object& log);
    std::string (*line)(const Object& entry);
    bool newestFirst;     ///< in the order of its instances
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
        if (textOf(log, "InstanceID").starts_with(row.idPrefix))
            return log;
    throw CimError({CMPI_RC_ERR_NOT_FOUND, row.absence});
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

/// "2026-11-22 18:30:00.123456  error     text"
std::string providerLine(const Object& entry)
{
    static constexpr std::array<const char*, 4> levels = {"", "critical", "warning", "error"};
    const std::string time = textOf(entry, "CreationTimeStamp"); // "20261122183000.123456+000"
    std::string shown = time;
    if (time.size() >= 21)
        shown = time.substr(0, 4) + "-" + time.substr(4, 2) + "-" + time.substr(6, 2) + " " + time.substr(8, 2) + ":" +
                time.substr(10, 2) + ":" + time.substr(12, 9);
    const std::string level = textOf(entry, "LogLevel");
    const bool isKnown = level == "1" || level == "2" || level == "3";
    std::string text = textOf(entry, "RecordData");
    if (text.starts_with('[')) // its end may have been cut
        text = text.substr(1, text.size() - 1 - text.ends_with(']'));
    if (text.ends_with('\n'))
        text.pop_back();
    return shown + "  " + padded(isKnown ? levels[level[0] - '0'] : level, 8) + "  " + oneLine(text);
}

const LogRow providerLog = {.idPrefix = "TVRHBA:ProviderLog:",
                            .absence = "the provider shows no log",
                            .entryClass = "TVRHBA_LogEntry",
                            .switchOn = switchProviderLogOn,
                            .line = providerLine,
                            .newestFirst = false,
                            .readWhenEnabled = false};

const LogRow driverLog = {.idPrefix = "TVR: FC Driver Record Log:",
                          .absence = "there is no driver log, as there is no FC adapter",
                          .entryClass = "TVRHBA_FCDriverLogEntry",
                          .switchOn = [](Session& session, const Object& log) { enable(session, log.path); },
                          .line = [](const Object& entry) { return oneLine(textOf(entry, "RecordData")); },
                          .newestFirst = true,
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
    std::vector<Object> entries = checked(session.broker.enumerateInstances(session.nameSpace, row.entryClass)).objects;
    if (row.newestFirst)
        std::ranges::reverse(entries);
    else // a ring: the oldest stands behind the newest
        std::ranges::stable_sort(entries, {}, [](const Object& entry) { return textOf(entry, "CreationTimeStamp"); });
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
            session.out << (session.format == Format::json ? jsonText(toJson(entry)) : row.line(entry)) << '\n';
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
