// Loading of the module, and the client's operations on it.
#include "bench/BenchHost.h"
#include "bench/Beside.h"
#include "bench/HostAndFloor.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_ProductPhysicalComponent.h"

#include <dlfcn.h>
#include <stdexcept>
#include <sys/wait.h>
#include <unistd.h>

using namespace bench;

namespace
{

// --- loading --------------------------------------------------------------------------------------------

/// In a child process: the module stays mapped where it was opened once.
double nanosecondsToOpen(const char* file)
{
    int ends[2];
    if (dlopen(file, RTLD_NOW | RTLD_NOLOAD) || pipe(ends) != 0)
        throw std::runtime_error(std::string(file) + " is open already, or no pipe is to be had");
    const pid_t child = fork();
    if (child == 0)
    {
        void* library = nullptr;
        const double took = nanosecondsOf([&] { library = dlopen(file, RTLD_NOW | RTLD_LOCAL); });
        const bool told = library && write(ends[1], &took, sizeof took) == sizeof took;
        _exit(told ? 0 : 1);
    }
    close(ends[1]);
    double took = 0;
    const bool heard = child > 0 && read(ends[0], &took, sizeof took) == sizeof took;
    close(ends[0]);
    if (child > 0)
        waitpid(child, nullptr, 0);
    if (!heard)
        throw std::runtime_error(std::string(file) + " cannot be opened");
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
void runOperation(benchmark::State& state, HostSize size, const cimple::Meta_Class& floorClass, Objects objects,
                  Operation operation)
{
    HostAndFloor both(size, floorClass, objects);
    const auto answer = operation(both.host(), both.known());
    const auto floorAnswer = operation(both.floor(), both.known());
    if (!answer.ok() || !floorAnswer.ok())
        return state.SkipWithError(("refused: " + answer.message + floorAnswer.message).c_str());
    if (!sameAnswer(answer, floorAnswer))
        return state.SkipWithError("the floor answers something else");
    runBeside(
        state, [&] { benchmark::DoNotOptimize(operation(both.host(), both.known())); },
        [&] { benchmark::DoNotOptimize(operation(both.floor(), both.known())); });
}

HostSize hostOf(const benchmark::State& state)
{
    return {.adapters = static_cast<std::uint32_t>(state.range(0))};
}

HostSize largeHostOf(const benchmark::State& state)
{
    return {.cards = static_cast<std::uint32_t>(state.range(0))};
}

void EnumerateCards(benchmark::State& state)
{
    runOperation(state, hostOf(state), cimple::TVRHBA_Card::static_meta_class, cardsOf,
                 [](broker::Broker& broker, const auto&)
                 { return broker.enumerateInstances(benchNamespace, cardClass); });
}

void EnumerateCardNames(benchmark::State& state)
{
    runOperation(state, hostOf(state), cimple::TVRHBA_Card::static_meta_class, cardsOf,
                 [](broker::Broker& broker, const auto&)
                 { return broker.enumerateInstanceNames(benchNamespace, cardClass); });
}

/// The first card. The floor makes it at once, the module looks through its cards.
void GetCard(benchmark::State& state)
{
    runOperation(state, hostOf(state), cimple::TVRHBA_Card::static_meta_class, cardsOf,
                 [](broker::Broker& broker, const auto& known) { return broker.getInstance(known.front().path); });
}

void EnumerateAssociations(benchmark::State& state)
{
    runOperation(
        state, hostOf(state), cimple::TVRHBA_ProductPhysicalComponent::static_meta_class,
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
        state, hostOf(state), cimple::TVRHBA_ProductPhysicalComponent::static_meta_class,
        [&](BenchHost& host)
        {
            product = productsOf(host).front().path;
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

/// One of many cards, and the way from it to its product: what grows with the size is the search.
void GetCardOfMany(benchmark::State& state)
{
    runOperation(state, largeHostOf(state), cimple::TVRHBA_Card::static_meta_class, lastCardOf,
                 [](broker::Broker& broker, const auto& known) { return broker.getInstance(known.front().path); });
}

void AssociatorNamesOfCardOfMany(benchmark::State& state)
{
    broker::Path card;
    runOperation(
        state, largeHostOf(state), cimple::TVRHBA_ProductPhysicalComponent::static_meta_class,
        [&](BenchHost& host)
        {
            card = lastCardOf(host).front().path;
            return productsOf(host);
        },
        [&](broker::Broker& broker, const auto&)
        { return broker.associatorNames(card, {.assocClass = associationClass}); });
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
BENCHMARK(GetCardOfMany)->UseManualTime()->Arg(128)->Arg(1024)->Arg(16384);
BENCHMARK(AssociatorNamesOfCardOfMany)->UseManualTime()->Arg(128)->Arg(1024)->Arg(16384);

} // namespace
