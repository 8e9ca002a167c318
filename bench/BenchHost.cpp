#include "bench/BenchHost.h"

#include "simulator/Control.h"
#include "tests/module/HostNames.h"

#include <cstdlib>
#include <dlfcn.h>
#include <filesystem>
#include <stdexcept>
#include <thread>

namespace bench
{

namespace
{

namespace fs = std::filesystem;

std::string scenario(HostSize size)
{
    return R"({"generate": {"seed": 1, "adapters": )" + std::to_string(size.adapters) +
           R"(, "portsPerAdapter": 1, "targetsPerPort": )" + std::to_string(size.targetsPerPort) +
           R"(, "unitsPerTarget": )" + std::to_string(size.unitsPerTarget) + "}}";
}

std::size_t threads()
{
    const fs::directory_iterator all("/proc/self/task");
    return static_cast<std::size_t>(std::distance(begin(all), end(all)));
}

} // namespace

BenchHost::BenchHost(HostSize size, Logging logging) : _host(scenario(size))
{
    module_test::setHostNames({}); // no name server is asked
    if (size.cards != 0)
    {
        _host.options.module = TVR_LARGE_MODULE_FILE;
        setenv("TVR_BENCH_CARDS", std::to_string(size.cards).c_str(), 1);
    }
    const std::string logFile = (_host.root() / "provider.log").string();
    _host.write("/etc/tavrin_fc_provider.dmp", logging == Logging::off ? "0,5,1\n" : "2,5,1\n" + logFile);
    // One stage at a time: adapters are refreshed alone, and the SAN when one of its classes is asked for.
    _host.write("/etc/tavrin_fc_provider.conf", "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n");
}

void BenchHost::reload()
{
    awaitEndOfRefresh();
    _host.unload();
    _host.broker();
}

void BenchHost::load(const std::string& className)
{
    if (const broker::Outcome loaded = broker().loadProvider(className, {broker::Kind::instance}); !loaded.ok())
        throw std::runtime_error(className + ": " + loaded.message);
}

std::vector<broker::Object> BenchHost::enumerate(const std::string& className)
{
    broker::Reply reply = broker().enumerateInstances(benchNamespace, className);
    if (!reply.ok())
        throw std::runtime_error(className + ": " + reply.message);
    return std::move(reply.objects);
}

void BenchHost::awaitEndOfRefresh()
{
    while (threads() > 1)
        std::this_thread::yield();
}

std::uint64_t BenchHost::nanosecondsInLibraries()
{
    static const auto read = []
    {
        void* simulator = dlopen(TVR_SIMULATOR_FOLDER "/libtvrsim.so", RTLD_NOW | RTLD_NOLOAD);
        return reinterpret_cast<decltype(&tvrsim_nanoseconds)>(dlsym(simulator, "tvrsim_nanoseconds"));
    }();
    return read();
}

} // namespace bench
