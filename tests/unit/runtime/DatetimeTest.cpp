#include "runtime/values/Datetime.h"
#include "runtime/base/Time.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <cstdlib>
#include <ctime>
#include <string>

using namespace cimple;

namespace
{

/// Runs a test in a time zone of its own, given by rule so that no zone database is needed.
class Time_Zone
{
public:
    explicit Time_Zone(const char* rule)
    {
        const char* former = std::getenv("TZ");
        _had = former != nullptr;
        _former = former ? former : "";
        setenv("TZ", rule, 1);
        tzset();
    }
    ~Time_Zone()
    {
        if (_had)
            setenv("TZ", _former.c_str(), 1);
        else
            unsetenv("TZ");
        tzset();
    }

private:
    bool _had;
    std::string _former;
};

constexpr const char* central_europe = "CET-1CEST,M3.5.0,M10.5.0/3";

Datetime parsed(const char* text)
{
    Datetime value;
    EXPECT_TRUE(value.parse(text)) << text;
    return value;
}

RC_GTEST_PROP(DatetimeProperty, IntervalTextGoesBothWays, ())
{
    const auto usec = *rc::gen::inRange<std::uint64_t>(0, 100'000'000 * Datetime::day);
    const Datetime value = Datetime::interval(usec);
    RC_ASSERT(value.text().size() == 25u);
    RC_ASSERT(parsed(value.text().c_str()) == value);
}

RC_GTEST_PROP(DatetimeProperty, TimestampTextGoesBothWays, ())
{
    const Time_Zone zone("CET-1"); // no daylight saving: no hour stands twice in local time
    const auto usec = *rc::gen::inRange<std::int64_t>(-60'000'000'000'000'000, 250'000'000'000'000'000);
    const auto utc = *rc::gen::inRange(-999, 1000);
    const Datetime value = Datetime::timestamp(static_cast<std::uint64_t>(usec), utc);
    RC_ASSERT(value.text().size() == 25u);
    RC_ASSERT(parsed(value.text().c_str()) == value);
}

/// A text that was printed is read again, and printed as it was.
void check_text(const Datetime& value)
{
    const String text = value.text();
    RC_ASSERT(text.size() == 25u);
    Datetime again;
    RC_ASSERT(again.parse(text.c_str()));
    RC_ASSERT(again.is_timestamp() == value.is_timestamp());
    RC_ASSERT(again.text() == text);

    // The pretty form has separators between the digits before the point.
    const std::string pretty = value.pretty().c_str();
    const std::size_t point = pretty.find('.');
    std::string plain = pretty.substr(0, point);
    std::erase_if(plain, [](char c) { return c < '0' || c > '9'; });
    RC_ASSERT(plain + pretty.substr(point) == text.c_str());
}

RC_GTEST_PROP(DatetimeProperty, EveryValueHasATextThatIsRead, (std::uint64_t usec, std::int32_t utc, bool timestamp))
{
    const Time_Zone zone(*rc::gen::element(central_europe, "UTC0", "XXX-14", "YYY12"));
    const auto scaled = usec >> *rc::gen::inRange(0, 64); // of every magnitude
    const auto either = *rc::gen::arbitrary<bool>() ? scaled : ~scaled;
    Datetime value;
    value.set(either, utc, timestamp);
    check_text(value);
}

RC_GTEST_PROP(DatetimeProperty, EveryTextOfDigitsIsReadAndPrinted, ())
{
    const Time_Zone zone(*rc::gen::element(central_europe, "UTC0"));
    std::string text = *rc::gen::container<std::string>(25, rc::gen::inRange('0', static_cast<char>('9' + 1)));
    text[14] = '.';
    text[21] = *rc::gen::element('+', '-', ':');
    if (text[21] == ':')
        text.replace(22, 3, "000");
    Datetime value;
    RC_ASSERT(value.parse(text.c_str()));
    check_text(value);
}

TEST(Datetime, IntervalsCountTheWholeSpan)
{
    const Datetime value = parsed("00000002030405.000006:000");
    EXPECT_EQ(value.usec(), 2 * Datetime::day + 3 * Datetime::hour + 4 * Datetime::minute + 5 * Datetime::second + 6);
    EXPECT_FALSE(value.is_timestamp());
    EXPECT_EQ(value.utc(), 0);
    EXPECT_EQ(value.pretty(), "00000002 03 04 05.000006:000");
    // Fields are not bounded to a day, an hour, a minute.
    EXPECT_EQ(parsed("00000000990000.000000:000").usec(), 99 * Datetime::hour);
}

TEST(Datetime, TimestampsAreLocalAndKeepTheirOffset)
{
    const Time_Zone zone(central_europe);
    const Datetime winter = parsed("20240115120000.000007-060");
    EXPECT_EQ(winter.usec(), 1705316400'000007u); // 11:00 UTC: the offset in the text does not shift it
    EXPECT_EQ(winter.utc(), -60);
    EXPECT_TRUE(winter.is_timestamp());
    EXPECT_EQ(winter.text(), "20240115120000.000007-060");
    EXPECT_EQ(winter.pretty(), "2024/01/15 12:00:00.000007-060");

    const Datetime summer = parsed("20240715120000.000000+120");
    EXPECT_EQ(summer.usec(), 1721037600'000000u); // 10:00 UTC
    EXPECT_EQ(summer.text(), "20240715120000.000000+120");
}

TEST(Datetime, ARefusedTextKeepsTheValue)
{
    const char* refused[] = {
        "",
        "0000000203040.0000006:000",
        "00000002030405.000006:00",   // 24 characters
        "00000002030405.000006:0000", // 26 characters
        "00000002030405.000006:001",
        "00000002030405.000006:0x0",
        "0000000203040x.000006:000",
        "00000002030405,000006:000",
        "00000002030405.-00006:000",
        "20240115120000.000000*060",
        "20240115120000.000000+06x",
        "2024011512000 .000000+060",
        "+0240115120000.000000+060",
        "2024-115120000.000000+060",
    };
    Datetime value = Datetime::interval(5);
    EXPECT_FALSE(value.parse(nullptr));
    for (const char* text : refused)
        EXPECT_FALSE(value.parse(text)) << text;
    EXPECT_EQ(value, Datetime::interval(5));
}

TEST(Datetime, CopiesShareUntilOneChanges)
{
    Datetime a = Datetime::timestamp(1, 2);
    Datetime b(a);
    b.set(3, 4, false);
    EXPECT_EQ(a, Datetime::timestamp(1, 2));
    EXPECT_EQ(b.usec(), 3u);
    b = a;
    EXPECT_EQ(b, a);
    a.clear();
    EXPECT_EQ(a, Datetime());
    EXPECT_EQ(a.text(), "00000000000000.000000:000");
    EXPECT_EQ(b, Datetime::timestamp(1, 2));
}

TEST(Datetime, EqualityLooksAtAllThreeFields)
{
    EXPECT_FALSE(Datetime::timestamp(1, 0) == Datetime::interval(1));
    EXPECT_FALSE(Datetime::timestamp(1, 0) == Datetime::timestamp(1, 60));
    EXPECT_FALSE(Datetime::timestamp(1, 0) == Datetime::timestamp(2, 0));
}

TEST(Datetime, WhatTheDigitsCannotTellReadsAsTheNearest)
{
    const Time_Zone zone("UTC0");
    constexpr auto lowest = static_cast<std::uint64_t>(INT64_MIN);
    const struct
    {
        Datetime value;
        const char* text;
    } rows[] = {
        {Datetime::timestamp(0, INT32_MIN), "19700101000000.000000-999"},
        {Datetime::timestamp(0, 1000), "19700101000000.000000+999"},
        {Datetime::timestamp(static_cast<std::uint64_t>(-1), 0), "19691231235959.999999+000"},
        {Datetime::timestamp(INT64_MAX, 0), "99991231235959.999999+000"},
        {Datetime::timestamp(lowest, 0), "00000101000000.000000+000"},
        {Datetime::timestamp(lowest + 1, 0), "00000101000000.000000+000"},
        {Datetime::interval(UINT64_MAX), "99999999235959.999999:000"},
        {Datetime::interval(100'000'000 * Datetime::day), "99999999235959.999999:000"},
        {parsed("99999999259359.999999:000"), "99999999235959.999999:000"},
        {parsed("99999931235959.999999+000"), "99991231235959.999999+000"},
        {parsed("00000001000000.000000+000"), "00000101000000.000000+000"},
        {parsed("20241301000000.000000+000"), "20250101000000.000000+000"},
    };
    for (const auto& row : rows)
    {
        EXPECT_EQ(row.value.text(), row.text);
        EXPECT_EQ(parsed(row.text).text(), row.text);
    }
    EXPECT_EQ(Datetime::timestamp(lowest, -1000).pretty(), "0000/01/01 00:00:00.000000-999");
}

bool fixed_now(std::uint64_t& usec, std::int32_t& utc_offset)
{
    usec = 42;
    utc_offset = -300;
    return true;
}

bool broken_now(std::uint64_t&, std::int32_t&)
{
    return false;
}

std::uint64_t slept = 0;

void count_sleep(std::uint64_t usec)
{
    slept += usec;
}

TEST(Time, GoesThroughTheInstalledSource)
{
    const Time_Source fixed{fixed_now, count_sleep};
    const Time_Source broken{broken_now, count_sleep};
    const Time_Source* system = set_time_source(&fixed);
    EXPECT_EQ(Datetime::now(), Datetime::timestamp(42, -300));
    EXPECT_EQ(Time::now(), 42u);
    Time::sleep(1'000'000'000);
    EXPECT_EQ(slept, 1'000'000'000u);

    EXPECT_EQ(set_time_source(&broken), &fixed);
    EXPECT_EQ(Datetime::now(), Datetime());
    EXPECT_EQ(Time::now(), 0u);
    EXPECT_EQ(set_time_source(nullptr), &broken);
    EXPECT_EQ(&time_source(), system);
}

TEST(Time, TheSystemSourceIsTheLocalClock)
{
    const Time_Zone zone("XXX-5:30");
    const auto before = static_cast<std::uint64_t>(std::time(nullptr)) * Datetime::second;
    const Datetime now = Datetime::now();
    EXPECT_GE(now.usec() + Datetime::second, before);
    EXPECT_LT(now.usec(), before + Datetime::minute);
    EXPECT_EQ(now.utc(), 330);

    const std::uint64_t start = Time::now();
    Time::sleep(2000);
    EXPECT_GE(Time::now() - start, 2000u);
}

} // namespace
