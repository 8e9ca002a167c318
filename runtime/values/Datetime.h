// CIM datetime: a timestamp or an interval with microseconds.
#pragma once

#include "runtime/values/String.h"

#include <atomic>
#include <cstdint>

namespace cimple
{

/// A pointer to a counted representation; copies share, mutation copies. The default is the zero interval.
class Datetime
{
public:
    static constexpr std::uint64_t second = 1'000'000;
    static constexpr std::uint64_t minute = 60 * second;
    static constexpr std::uint64_t hour = 60 * minute;
    static constexpr std::uint64_t day = 24 * hour;

    Datetime() noexcept;
    Datetime(const Datetime& other) noexcept;
    ~Datetime();
    Datetime& operator=(const Datetime& other) noexcept;

    static Datetime interval(std::uint64_t usec);
    /// `usec` since the epoch, `utc` in minutes.
    static Datetime timestamp(std::uint64_t usec, std::int32_t utc);
    /// Current time with the local offset; the zero interval if the clock cannot be read.
    static Datetime now();

    std::uint64_t usec() const;
    std::int32_t utc() const; ///< minutes; stored, never applied to usec()
    bool is_timestamp() const;
    void set(std::uint64_t usec, std::int32_t utc, bool timestamp);
    void clear(); ///< back to the zero interval

    /// Reads the 25-character CIM text. Returns false and keeps the value for anything else. Fields that run over (99
    /// hours, month 13) count on into the next.
    bool parse(const char* text);
    /// The 25-character CIM text, which parse() takes; timestamps are printed in local time. Before 1970 `usec` counts
    /// below 0 in two's complement. Intervals, years and offsets beyond their digits read as the last that fit.
    String text() const;
    /// "2026/11/21 12:00:00.000000+060" or "00000001 02 03 04.000005:000".
    String pretty() const;
    /// Room for every text of a datetime, with its terminator.
    static constexpr std::size_t text_room = 128;
    /// The pretty text of the current time, for those that must do without the heap; its size.
    static std::size_t pretty_now(char (&out)[text_room]);

    struct Rep;

private:
    static Rep _zero; // shared by all fresh values; never counted, written or freed

    static Rep* share(Rep* rep) noexcept;
    static void release(Rep* rep) noexcept;
    static void free(Rep* rep) noexcept;

    Rep* _rep;
};

struct Datetime::Rep
{
    std::atomic<std::uint32_t> refs;
    std::uint64_t usec;
    std::int32_t utc;
    std::uint32_t timestamp; ///< 1 timestamp, 0 interval
};

inline Datetime::Rep* Datetime::share(Rep* rep) noexcept
{
    if (rep != &_zero)
        rep->refs.fetch_add(1, std::memory_order_relaxed);
    return rep;
}

inline void Datetime::release(Rep* rep) noexcept
{
    if (rep != &_zero && rep->refs.fetch_sub(1, std::memory_order_acq_rel) == 1)
        free(rep);
}

inline Datetime::Datetime() noexcept : _rep(&_zero) {}
inline Datetime::Datetime(const Datetime& other) noexcept : _rep(share(other._rep)) {}
inline Datetime::~Datetime()
{
    release(_rep);
}

/// Equal usec, utc and kind.
bool operator==(const Datetime& a, const Datetime& b);

} // namespace cimple
