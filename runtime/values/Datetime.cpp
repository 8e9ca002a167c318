#include "runtime/values/Datetime.h"

#include "runtime/base/Memory.h"
#include "runtime/base/Time.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <new>
#include <utility>

namespace cimple
{
namespace
{

constexpr std::size_t text_size = 25;
constexpr std::size_t point_index = 14;
constexpr std::size_t kind_index = 21; ///< ':' interval, '+' or '-' timestamp

/// Reads a fixed field of decimal digits; negative if another character stands in it.
int field(const char* text, std::size_t first, std::size_t count)
{
    int value = 0;
    for (std::size_t i = first; i < first + count; ++i)
    {
        if (text[i] < '0' || text[i] > '9')
            return -1;
        value = value * 10 + (text[i] - '0');
    }
    return value;
}

struct Parsed
{
    std::uint64_t usec;
    std::int32_t utc;
    bool timestamp;
};

bool parse_interval(const char* text, Parsed& out)
{
    const int days = field(text, 0, 8);
    const int hours = field(text, 8, 2);
    const int minutes = field(text, 10, 2);
    const int seconds = field(text, 12, 2);
    const int micros = field(text, 15, 6);
    if (days < 0 || hours < 0 || minutes < 0 || seconds < 0 || micros < 0 || field(text, 22, 3) != 0)
        return false;
    const auto count = [](int n, std::uint64_t unit) { return static_cast<std::uint64_t>(n) * unit; };
    out.usec = count(days, Datetime::day) + count(hours, Datetime::hour) + count(minutes, Datetime::minute) +
               count(seconds, Datetime::second) + count(micros, 1);
    out.utc = 0;
    out.timestamp = false;
    return true;
}

bool parse_timestamp(const char* text, Parsed& out)
{
    const int year = field(text, 0, 4);
    const int month = field(text, 4, 2);
    const int micros = field(text, 15, 6);
    const int offset = field(text, 22, 3);
    std::tm time{};
    time.tm_year = year - 1900;
    time.tm_mon = month - 1;
    time.tm_mday = field(text, 6, 2);
    time.tm_hour = field(text, 8, 2);
    time.tm_min = field(text, 10, 2);
    time.tm_sec = field(text, 12, 2);
    time.tm_isdst = -1; // unknown: decided by the local rules
    if (year < 0 || month < 0 || time.tm_mday < 0 || time.tm_hour < 0 || time.tm_min < 0 || time.tm_sec < 0 ||
        micros < 0 || offset < 0)
        return false;
    time.tm_wday = -1; // a failed mktime leaves it so; -1 alone may be a second of 1969
    const auto seconds = static_cast<std::uint64_t>(std::mktime(&time));
    if (time.tm_wday < 0)
        return false;
    out.usec = seconds * Datetime::second + static_cast<std::uint64_t>(micros);
    out.utc = text[kind_index] == '-' ? -offset : offset;
    out.timestamp = true;
    return true;
}

bool parse_text(const char* text, Parsed& out)
{
    if (!text || ::strnlen(text, text_size + 1) != text_size || text[point_index] != '.')
        return false;
    switch (text[kind_index])
    {
    case ':':
        return parse_interval(text, out);
    case '+':
    case '-':
        return parse_timestamp(text, out);
    default:
        return false;
    }
}

/// The text has eight digits for the days of an interval, four for a year and three for an offset: what lies outside
/// is written as the nearest that they can tell.
constexpr std::uint64_t max_interval = 100'000'000 * Datetime::day - 1;
constexpr int max_year = 9999;
constexpr std::int32_t max_offset = 999;

/// The texts are put into the caller's buffer; the result is their size.
std::size_t interval_text(char (&out)[Datetime::text_room], std::uint64_t usec, const char* format)
{
    usec = std::min(usec, max_interval);
    const int size = std::snprintf(
        out, sizeof out, format, static_cast<unsigned>(usec / Datetime::day),
        static_cast<unsigned>(usec / Datetime::hour % 24), static_cast<unsigned>(usec / Datetime::minute % 60),
        static_cast<unsigned>(usec / Datetime::second % 60), static_cast<unsigned>(usec % Datetime::second));
    return static_cast<std::size_t>(size);
}

struct Local_Time
{
    int year, month, day, hour, minute, second, micros;
};

Local_Time local_time(std::int64_t usec)
{
    constexpr auto unit = static_cast<std::int64_t>(Datetime::second);
    constexpr Local_Time first = {0, 1, 1, 0, 0, 0, 0};
    constexpr Local_Time last = {max_year, 12, 31, 23, 59, 59, unit - 1};
    const auto micros = static_cast<int>((usec % unit + unit) % unit);
    const std::time_t seconds = usec / unit - (usec % unit < 0 ? 1 : 0);
    std::tm time{};
    const bool known = localtime_r(&seconds, &time) != nullptr;
    const int year = time.tm_year + 1900;
    if (!known || year < first.year || year > last.year)
        return seconds < 0 ? first : last;
    return {year, time.tm_mon + 1, time.tm_mday, time.tm_hour, time.tm_min, time.tm_sec, micros};
}

std::size_t timestamp_text(char (&out)[Datetime::text_room], std::uint64_t usec, std::int32_t utc, const char* format)
{
    const Local_Time time = local_time(static_cast<std::int64_t>(usec));
    const std::int32_t offset = std::clamp(utc, -max_offset, max_offset);
    const int size = std::snprintf(out, sizeof out, format, time.year, time.month, time.day, time.hour, time.minute,
                                   time.second, time.micros, offset < 0 ? '-' : '+', std::abs(offset));
    return static_cast<std::size_t>(size);
}

std::size_t pretty_text(char (&out)[Datetime::text_room], std::uint64_t usec, std::int32_t utc, bool timestamp)
{
    return timestamp ? timestamp_text(out, usec, utc, "%04d/%02d/%02d %02d:%02d:%02d.%06d%c%03d")
                     : interval_text(out, usec, "%08u %02u %02u %02u.%06u:000");
}

} // namespace

constinit Datetime::Rep Datetime::_zero = {2, 0, 0, 0};

void Datetime::free(Rep* rep) noexcept
{
    rep->~Rep();
    deallocate(rep);
}

Datetime& Datetime::operator=(const Datetime& other) noexcept
{
    release(std::exchange(_rep, share(other._rep)));
    return *this;
}

Datetime Datetime::interval(std::uint64_t usec)
{
    Datetime result;
    result.set(usec, 0, false);
    return result;
}

Datetime Datetime::timestamp(std::uint64_t usec, std::int32_t utc)
{
    Datetime result;
    result.set(usec, utc, true);
    return result;
}

Datetime Datetime::now()
{
    std::uint64_t usec = 0;
    std::int32_t utc = 0;
    return time_source().now(usec, utc) ? timestamp(usec, utc) : Datetime();
}

std::uint64_t Datetime::usec() const
{
    return _rep->usec;
}

std::int32_t Datetime::utc() const
{
    return _rep->utc;
}

bool Datetime::is_timestamp() const
{
    return _rep->timestamp != 0;
}

void Datetime::set(std::uint64_t usec, std::int32_t utc, bool timestamp)
{
    if (_rep->refs.load(std::memory_order_acquire) != 1)
        release(std::exchange(_rep, new (allocate(sizeof(Rep))) Rep{1, 0, 0, 0}));
    _rep->usec = usec;
    _rep->utc = utc;
    _rep->timestamp = timestamp ? 1 : 0;
}

void Datetime::clear()
{
    release(std::exchange(_rep, &_zero));
}

bool Datetime::parse(const char* text)
{
    Parsed parsed;
    if (!parse_text(text, parsed))
        return false;
    set(parsed.usec, parsed.utc, parsed.timestamp);
    return true;
}

String Datetime::text() const
{
    char text[text_room];
    const std::size_t size = is_timestamp() ? timestamp_text(text, usec(), utc(), "%04d%02d%02d%02d%02d%02d.%06d%c%03d")
                                            : interval_text(text, usec(), "%08u%02u%02u%02u.%06u:000");
    return String(text, size);
}

String Datetime::pretty() const
{
    char text[text_room];
    return String(text, pretty_text(text, usec(), utc(), is_timestamp()));
}

std::size_t Datetime::pretty_now(char (&out)[text_room])
{
    std::uint64_t usec = 0;
    std::int32_t utc = 0;
    return time_source().now(usec, utc) ? pretty_text(out, usec, utc, true) : pretty_text(out, 0, 0, false);
}

bool operator==(const Datetime& a, const Datetime& b)
{
    return a.usec() == b.usec() && a.utc() == b.utc() && a.is_timestamp() == b.is_timestamp();
}

} // namespace cimple
