// Values, instances and maps.
#include "bench/Beside.h"
#include "bench/Workloads.h"

#include <algorithm>
#include <numeric>

using namespace cimple;

namespace
{

constexpr int manyCalls = 1000; ///< of what takes some nanoseconds

/// Floor: the four key strings of two ports that differ in the last.
void KeyCompare(benchmark::State& state)
{
    const auto a = bench::makePort(1);
    const auto b = bench::makePort(2);
    const auto same = [](const auto& one, const auto& other)
    {
        bool equal = one.value == other.value;
        benchmark::DoNotOptimize(equal);
    };
    bench::runBeside(
        state, [&] { benchmark::DoNotOptimize(key_eq(a.get(), b.get())); },
        [&]
        {
            same(a->SystemCreationClassName, b->SystemCreationClassName);
            same(a->SystemName, b->SystemName);
            same(a->CreationClassName, b->CreationClassName);
            same(a->DeviceID, b->DeviceID);
        },
        manyCalls);
}
BENCHMARK(KeyCompare)->UseManualTime();

std::string memoryText(std::size_t bytes, std::size_t instances, const Meta_Class& mc)
{
    return std::to_string(bytes / instances) + " bytes an instance, its record " + std::to_string(mc.size);
}

/// One insert into a map of that many entries, and the removal of the new last one. Floor: a search for a 32-bit
/// number among as many, where a number stands for the keys of an instance.
void MapInsert(benchmark::State& state)
{
    const auto size = static_cast<std::size_t>(state.range(0));
    Instance_Map map(&TVRHBA_FCPort::static_meta_class);
    const std::size_t empty = bench::heapBytes();
    for (std::size_t i = 0; i < size; i++)
        map.insert(bench::makePort(i).release());
    const std::size_t filled = bench::heapBytes() - empty;
    std::vector<std::uint32_t> numbers(size);
    std::iota(numbers.begin(), numbers.end(), 0);
    Instance* extra = bench::makePort(size).release();
    state.SetLabel(memoryText(filled, size, TVRHBA_FCPort::static_meta_class));
    bench::runBeside(
        state,
        [&]
        {
            map.insert(extra);
            extra = map.remove_at(size);
        },
        [&] { benchmark::DoNotOptimize(std::find(numbers.begin(), numbers.end(), 0xFFFF'FFFF)); }, 10);
    unref(extra);
}
BENCHMARK(MapInsert)->UseManualTime()->Arg(128)->Arg(1024)->Arg(16384);

void CloneCard(benchmark::State& state)
{
    const auto card = bench::makeCard(1);
    const bench::CloneFloor floor(card.get());
    const std::size_t before = bench::heapBytes();
    std::vector<Ref<TVRHBA_Card>> clones;
    clones.reserve(manyCalls);
    for (int i = 0; i < manyCalls; i++)
        clones.emplace_back(clone_of(card.get()));
    state.SetLabel(memoryText(bench::heapBytes() - before, manyCalls, TVRHBA_Card::static_meta_class));
    bench::runBeside(
        state, [&] { unref(clone(card.get())); }, [&] { floor.run(); }, manyCalls);
}
BENCHMARK(CloneCard)->UseManualTime();

} // namespace
