#include "broker/host/LogEntries.h"

#include "broker/health/Health.h"
#include "broker/host/ReadableText.h"

#include <algorithm>
#include <array>

namespace broker
{

namespace
{

/// A timestamp in digits ("20261122183000.123456+000") as people write it.
std::string timeText(const std::string& digits)
{
    constexpr std::size_t withFraction = 21;
    if (digits.size() < withFraction)
        return oneLine(digits);
    return oneLine(digits.substr(0, 4) + "-" + digits.substr(4, 2) + "-" + digits.substr(6, 2) + " " +
                   digits.substr(8, 2) + ":" + digits.substr(10, 2) + ":" + digits.substr(12, 9));
}

/// What the class calls its times is a datetime in some servers' eyes and a text in others'.
std::string stampOf(const Object& entry)
{
    const Value& value = entry.get("CreationTimeStamp");
    if (value.isNull())
        return {};
    return value.type() == CMPI_dateTime ? value.asDateTime().text() : textOf(entry, "CreationTimeStamp");
}

LogLine providerLine(const Object& entry)
{
    static constexpr std::array<const char*, 4> levels = {"", "critical", "warning", "error"};
    const std::string level = textOf(entry, "LogLevel");
    const bool isKnown = level == "1" || level == "2" || level == "3";
    std::string text = textOf(entry, "RecordData");
    if (text.starts_with('[')) // its end may have been cut
        text = text.substr(1, text.size() - 1 - text.ends_with(']'));
    if (text.ends_with('\n'))
        text.pop_back();
    return {creationTime(entry), isKnown ? levels[level[0] - '0'] : oneLine(level), oneLine(text)};
}

/// The line of the system log has a time of its own.
LogLine driverLine(const Object& entry)
{
    return {{}, {}, oneLine(textOf(entry, "RecordData"))};
}

} // namespace

std::string creationTime(const Object& entry)
{
    return timeText(stampOf(entry));
}

const LogKind providerLogKind{.id = "provider",
                              .name = "Provider log",
                              .idPrefix = "TVRHBA:ProviderLog:",
                              .absence = "the provider shows no log",
                              .entryClass = "TVRHBA_LogEntry",
                              .newestFirst = false,
                              .line = providerLine};

const LogKind driverLogKind{.id = "driver",
                            .name = "Driver log",
                            .idPrefix = "TVR: FC Driver Record Log:",
                            .absence = "there is no driver log, as there is no FC adapter",
                            .entryClass = "TVRHBA_FCDriverLogEntry",
                            .newestFirst = true,
                            .line = driverLine};

bool isLogOf(const LogKind& kind, const Object& log)
{
    return textOf(log, "InstanceID").starts_with(kind.idPrefix);
}

void sortEntries(const LogKind& kind, std::vector<Object>& entries)
{
    if (kind.newestFirst)
        std::ranges::reverse(entries);
    else // a ring: the oldest stands behind the newest
        std::ranges::stable_sort(entries, {}, stampOf);
}

} // namespace broker
