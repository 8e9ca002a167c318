// Loading of the module, and the client's operations on it.
#include "bench/BenchHost.h"
#include "bench/Beside.h"
#include "bench/FloorModule.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_ProductPhysicalComponent.h"

#include <dlfcn.h>
#include <stdexcept>

using namespace bench;

namespace
{

// --- loading --------------------------------------------------------------------------------------------

double nanosecondsToOpen(const char* file)
{
    void* library = nullptr;
    const double took = nanosecondsOf([&] { library = dlopen(file, RTLD_NOW | RTLD_LOCAL); });
    if (!library)
        throw std::runtime_error(dlerror());
    dlclose(library);
    if (dlopen(file, RTLD_NOW | RTLD_NOLOAD))
        throw std::runtime_error(std::string(file) + " stays loaded");
    return took;
}

/// Floor: a library with the same dependencies and nothing in it.
void OpenModule(benchmark::State& state)
{
    Row row(state);
    for (auto _ : state)
        row.add(nanosecondsToOpen(TVR_MODULE_FILE), nanosecondsToOpen(TVR_EMPTY_FILE));
}
BENCHMARK(OpenModule)->UseManualTime()->Iterations(200);

/// The first factory call starts the agent.
void FirstFactory(benchmark::State& state)
{
    BenchHost host({.adapters = 2});
    Row row(state);
    for (auto _ : state)
    {
        host.reload();
        addBesideLibraries(row, [&] { host.load(smallClass); });
    }
}
BENCHMARK(FirstFactory)->UseManualTime()->Iterations(100);

/// Those of other classes join it. Floor: the same call of a provider that needs no start.
void FurtherFactory(benchmark::State& state)
{
    BenchHost host({.adapters = 2});
    Row row(state);
    for (auto _ : state)
    {
        host.reload();
        host.load(smallClass);
        broker::Options options;
        options.image =
            std::make_shared<FloorModule>(cimple::TVRHBA_Card::static_meta_class, std::vector<broker::Object>());
        broker::Broker floor(options);
        row.add(nanosecondsOf([&] { host.load("TVRHBA_Card"); }),
                nanosecondsOf([&] { floor.loadProvider("TVRHBA_Card", {broker::Kind::instance}); }));
    }
}
BENCHMARK(FurtherFactory)->UseManualTime()->Iterations(100);

// --- operations -----------------------------------------------------------------------------------------

bool sameAnswer(const broker::Reply& a, const broker::Reply& b)
{
    return a.objects == b.objects;
}

bool sameAnswer(const broker::NamesReply& a, const broker::NamesReply& b)
{
    return a.paths == b.paths;
}

/// Runs an operation on a host with that many adapters, beside the same operation of a floor that serves one class
/// and has the constants of the module's answers. Both must answer the same.
///
/// `objects(broker)` is what the floor knows; `operation(broker, objects)` is measured.
template <class Objects, class Operation>
void runOperation(benchmark::State& state, const cimple::Meta_Class& floorClass, Objects objects, Operation operation)
{
    BenchHost host({.adapters = static_cast<std::uint32_t>(state.range(0))});
    const std::vector<broker::Object> known = objects(host);
    BenchHost::awaitEndOfRefresh();
    broker::Options options;
    options.image = std::make_shared<FloorModule>(floorClass, known, host.broker().servedClasses());
    broker::Broker floor(options);

    const auto answer = operation(host.broker(), known);
    const auto floorAnswer = operation(floor, known);
    if (!answer.ok() || !floorAnswer.ok())
        return state.SkipWithError(("refused: " + answer.message + floorAnswer.message).c_str());
    if (!sameAnswer(answer, floorAnswer))
        return state.SkipWithError("the floor answers something else");
    runBeside(
        state, [&] { benchmark::DoNotOptimize(operation(host.broker(), known)); },
        [&] { benchmark::DoNotOptimize(operation(floor, known)); });
}

constexpr const char* cardClass = "TVRHBA_Card";
constexpr const char* associationClass = "TVRHBA_ProductPhysicalComponent";

std::vector<broker::Object> cards(BenchHost& host)
{
    return host.enumerate(cardClass);
}

void EnumerateCards(benchmark::State& state)
{
    runOperation(state, cimple::TVRHBA_Card::static_meta_class, cards,
                 [](broker::Broker& broker, const auto&)
                 { return broker.enumerateInstances(benchNamespace, cardClass); });
}

void EnumerateCardNames(benchmark::State& state)
{
    runOperation(state, cimple::TVRHBA_Card::static_meta_class, cards,
                 [](broker::Broker& broker, const auto&)
                 { return broker.enumerateInstanceNames(benchNamespace, cardClass); });
}

/// The first card. The floor makes it at once, the module looks through its cards.
void GetCard(benchmark::State& state)
{
    runOperation(state, cimple::TVRHBA_Card::static_meta_class, cards,
                 [](broker::Broker& broker, const auto& known) { return broker.getInstance(known.front().path); });
}

void EnumerateAssociations(benchmark::State& state)
{
    runOperation(
        state, cimple::TVRHBA_ProductPhysicalComponent::static_meta_class,
        [](BenchHost& host) { return host.enumerate(associationClass); },
        [](broker::Broker& broker, const auto&)
        { return broker.enumerateInstances(benchNamespace, associationClass); });
}

/// From a product to its cards, by one association class. The floor has the answer at hand; the module looks through
/// the associations, and asks the broker for the card, which asks the module's provider of cards.
template <class Operation> void runAssociators(benchmark::State& state, Operation operation)
{
    broker::Path product;
    runOperation(
        state, cimple::TVRHBA_ProductPhysicalComponent::static_meta_class,
        [&](BenchHost& host)
        {
            product = host.enumerate("TVRHBA_Product").front().path;
            return host.broker().associators(product, {.assocClass = associationClass}).objects;
        },
        [&](broker::Broker& broker, const auto&) { return operation(broker, product); });
}

void AssociatorsOfProduct(benchmark::State& state)
{
    runAssociators(state, [](broker::Broker& broker, const broker::Path& product)
                   { return broker.associators(product, {.assocClass = associationClass}); });
}

void AssociatorNamesOfProduct(benchmark::State& state)
{
    runAssociators(state, [](broker::Broker& broker, const broker::Path& product)
                   { return broker.associatorNames(product, {.assocClass = associationClass}); });
}

void onHostsOfSizes(benchmark::internal::Benchmark* benchmark)
{
    benchmark->UseManualTime()->Arg(2)->Arg(16)->Arg(64);
}
BENCHMARK(EnumerateCards)->Apply(onHostsOfSizes);
BENCHMARK(EnumerateCardNames)->Apply(onHostsOfSizes);
BENCHMARK(GetCard)->Apply(onHostsOfSizes);
BENCHMARK(EnumerateAssociations)->Apply(onHostsOfSizes);
BENCHMARK(AssociatorsOfProduct)->Apply(onHostsOfSizes);
BENCHMARK(AssociatorNamesOfProduct)->Apply(onHostsOfSizes);

} // namespace
