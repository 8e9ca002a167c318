// What a client waits for at the first look at the adapters and at the SAN. The floor is the time that the refresh
// spends inside the simulated libraries.
#include "bench/BenchHost.h"
#include "bench/Beside.h"

using namespace bench;

namespace
{

/// A class of the SAN maps that has no instances on a host of disks: its reader waits for the refresh and gets nothing.
constexpr const char* sanClass = "TVRHBA_TapeDrive";

/// Bytes that `work` leaves on the heap, for each of `count`.
template <class Work> std::string bytesEach(std::uint32_t count, const char* what, Work work)
{
    const std::size_t before = heapBytes();
    work();
    BenchHost::awaitEndOfRefresh();
    return std::to_string((heapBytes() - before) / count) + " bytes " + what;
}

template <Logging logging> void AdapterRefresh(benchmark::State& state)
{
    const auto adapters = static_cast<std::uint32_t>(state.range(0));
    BenchHost host({.adapters = adapters}, logging);
    Row row(state);
    for (auto _ : state)
    {
        host.reload();
        host.load(smallClass);
        addBesideLibraries(row, [&] { host.enumerate(smallClass); });
    }
    host.reload();
    host.load(smallClass);
    row.note(bytesEach(adapters, "an adapter", [&] { host.enumerate(smallClass); }));
}

/// Discovery of the units behind the ports of two adapters.
template <Logging logging> void SanRefresh(benchmark::State& state)
{
    constexpr std::uint32_t unitsPerTarget = 64;
    const auto units = static_cast<std::uint32_t>(state.range(0));
    BenchHost host({.adapters = 2, .targetsPerPort = units / unitsPerTarget / 2, .unitsPerTarget = unitsPerTarget},
                   logging);
    const auto refreshAdapters = [&]
    {
        host.reload();
        host.load(sanClass);
        host.enumerate(smallClass);
        BenchHost::awaitEndOfRefresh();
    };
    Row row(state);
    for (auto _ : state)
    {
        refreshAdapters();
        addBesideLibraries(row, [&] { host.enumerate(sanClass); });
    }
    refreshAdapters();
    row.note(bytesEach(units, "a unit", [&] { host.enumerate(sanClass); }));
}

void onAdapters(benchmark::internal::Benchmark* benchmark)
{
    benchmark->UseManualTime()->Iterations(40)->Arg(2)->Arg(16)->Arg(64);
}
BENCHMARK(AdapterRefresh<Logging::off>)->Apply(onAdapters);
BENCHMARK(AdapterRefresh<Logging::toFile>)->Apply(onAdapters);

void onUnits(benchmark::internal::Benchmark* benchmark)
{
    benchmark->UseManualTime()->Iterations(10)->Arg(128)->Arg(1024)->Arg(16384);
}
BENCHMARK(SanRefresh<Logging::off>)->Apply(onUnits);
BENCHMARK(SanRefresh<Logging::toFile>)->Apply(onUnits);

} // namespace
