// Faults: rows that say which calls of a function go wrong, and how.
#pragma once

#include "simulator/EntryPoints.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tvrsim
{

/// One row. Exactly one of the effects is set.
struct Fault
{
    bool operator==(const Fault&) const = default;

    std::string function;                    ///< the exported name
    std::string subject;                     ///< adapter name or WWPN that the call must concern; empty for any
    std::uint64_t from = 1, to = UINT64_MAX; ///< calls that the row hits, counted from 1 since it was added

    std::optional<std::int32_t> status; ///< returned at once; a function without a status returns its empty value
    std::optional<std::chrono::milliseconds> delay; ///< before the call does its work
    std::string gate;                               ///< the call waits until the gate of this name is opened
    std::optional<std::size_t> truncate;            ///< bytes of the output that are written
    std::optional<Hostile> hostile;
};

/// What the rows do to one call. Delays add up, every gate is passed, of the rest the first row counts.
struct Effects
{
    std::chrono::milliseconds delay{0};
    std::vector<std::string> gates;
    std::optional<std::int32_t> status;
    std::optional<std::size_t> truncate;
    std::optional<Hostile> hostile;
    std::chrono::steady_clock::time_point begun; ///< when the call came, or its last wait ended
};

/// The rows in force. Safe for use from many threads.
class Faults
{
public:
    void add(const Fault& fault);
    void clear();

    /// Counts a call against the rows of its function and returns their effects. `subject` is asked at most once,
    /// and with no lock held: what the call concerns.
    Effects meet(std::string_view function, const std::function<std::string()>& subject);

private:
    struct Row
    {
        Fault fault;
        std::uint64_t calls = 0;
    };

    bool concerns(std::string_view function) const;

    mutable std::mutex _mutex;
    std::vector<Row> _rows;
};

/// Number of calls of each function.
class CallCounts
{
public:
    void add(std::string_view function);
    std::uint64_t of(std::string_view function) const;
    void reset();

private:
    mutable std::mutex _mutex;
    std::map<std::string, std::uint64_t, std::less<>> _counts;
};

} // namespace tvrsim
