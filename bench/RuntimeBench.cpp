// Values, instances and maps.
#include "bench/Workloads.h"

#include <benchmark/benchmark.h>

using namespace cimple;

namespace
{

/// Floor of KeyCompare: the four key strings of two ports that differ in the last.
void KeyStringsCompare(benchmark::State& state)
{
    const auto a = bench::makePort(1);
    const auto b = bench::makePort(2);
    for (auto _ : state)
    {
        bool equal = a->SystemCreationClassName.value == b->SystemCreationClassName.value;
        benchmark::DoNotOptimize(equal);
        equal = a->SystemName.value == b->SystemName.value;
        benchmark::DoNotOptimize(equal);
        equal = a->CreationClassName.value == b->CreationClassName.value;
        benchmark::DoNotOptimize(equal);
        equal = a->DeviceID.value == b->DeviceID.value;
        benchmark::DoNotOptimize(equal);
    }
}
BENCHMARK(KeyStringsCompare);

void KeyCompare(benchmark::State& state)
{
    const auto a = bench::makePort(1);
    const auto b = bench::makePort(2);
    for (auto _ : state)
        benchmark::DoNotOptimize(key_eq(a.get(), b.get()));
}
BENCHMARK(KeyCompare);

/// One insert into a map of that many entries, and the removal of the new last one.
void MapInsert(benchmark::State& state)
{
    Instance_Map map(&TVRHBA_FCPort::static_meta_class);
    const auto size = static_cast<std::size_t>(state.range(0));
    for (std::size_t i = 0; i < size; i++)
        map.insert(bench::makePort(i).release());
    Instance* extra = bench::makePort(size).release();
    for (auto _ : state)
    {
        map.insert(extra);
        extra = map.remove_at(size);
    }
    unref(extra);
}
BENCHMARK(MapInsert)->Arg(128)->Arg(1024)->Arg(16384);

void CloneCardFloor(benchmark::State& state)
{
    const auto card = bench::makeCard(1);
    const bench::CloneFloor floor(card.get());
    for (auto _ : state)
        floor.run();
}
BENCHMARK(CloneCardFloor);

void CloneCard(benchmark::State& state)
{
    const auto card = bench::makeCard(1);
    for (auto _ : state)
        unref(clone(card.get()));
}
BENCHMARK(CloneCard);

} // namespace
