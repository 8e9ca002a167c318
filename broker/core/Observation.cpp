#include "broker/core/Observation.h"

#include <chrono>
#include <new>
#include <thread>

namespace broker
{

namespace
{

void takeFailures(void* client, const char* entryPoint, std::uint64_t failures)
{
    try
    {
        static_cast<Observation*>(client)->callFailures.emplace_back(entryPoint, failures);
    }
    catch (const std::bad_alloc&)
    {
        // The module is no place for an exception: the entry point is left out.
    }
}

} // namespace

std::optional<Observation> observe(Broker& broker)
{
    std::optional<Observation> found(std::in_place);
    found->version = TAVRIN_FC_OBSERVE_VERSION;
    bool told = false;
    broker.withFunction("tavrin_fc_observe",
                        [&](void* function)
                        {
                            auto* ask = reinterpret_cast<tavrin_fc_observe_t*>(function);
                            told = ask(&*found, takeFailures, &*found) == 0;
                        });
    if (!told)
        found.reset();
    return found;
}

std::optional<Observation> observeSettled(Broker& broker)
{
    using namespace std::chrono_literals;
    const auto end = std::chrono::steady_clock::now() + 2s;
    auto module = observe(broker);
    while (module && module->refresh_running && std::chrono::steady_clock::now() < end)
    {
        std::this_thread::sleep_for(5ms); // the module tells, and calls nobody
        module = observe(broker);
    }
    return module;
}

} // namespace broker
