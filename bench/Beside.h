// An operation and its floor, measured in turn in one benchmark, and the table that comes of it.
#pragma once

#include "bench/HeapBytes.h"

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstddef>
#include <limits>
#include <string>

namespace bench
{

/// Nanoseconds that `work()` takes.
template <class Work> double nanosecondsOf(Work work)
{
    const auto start = std::chrono::steady_clock::now();
    work();
    const std::chrono::duration<double, std::nano> took = std::chrono::steady_clock::now() - start;
    return took.count();
}

/// What one row of the table says. The figures are those of the best round: other load on the machine makes rounds
/// longer, and nothing makes them shorter.
class Row
{
public:
    explicit Row(benchmark::State& state) : _state(state) {}
    /// Puts the figures into the state's counters.
    ~Row();
    Row(const Row&) = delete;
    Row& operator=(const Row&) = delete;

    /// One round of `calls` calls, in nanoseconds. The state must use manual time.
    void add(double operation, double floor, int calls = 1);
    /// A remark for the last column, such as a size in bytes.
    void note(const std::string& text) { _state.SetLabel(text); }

private:
    benchmark::State& _state;
    double _operation = std::numeric_limits<double>::max(), _floor = _operation;
};

/// Runs both in turn, `calls` at a time.
template <class Operation, class Floor>
void runBeside(benchmark::State& state, Operation operation, Floor floor, int calls = 1)
{
    const auto time = [calls](auto& work)
    {
        return nanosecondsOf(
            [&]
            {
                for (int i = 0; i < calls; i++)
                    work();
            });
    };
    Row row(state);
    for (auto _ : state)
    {
        const double took = time(operation);
        row.add(took, time(floor), calls);
    }
}

} // namespace bench
