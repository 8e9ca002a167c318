// A generated host with the module in it, for measurements from a client's side.
#pragma once

#include "bench/Beside.h"
#include "tests/module/Host.h"

#include <cstdint>

namespace bench
{

struct HostSize
{
    std::uint32_t adapters = 1;
    std::uint32_t targetsPerPort = 1;
    std::uint32_t unitsPerTarget = 1;
    /// Not 0: the module's model stands aside for one with so many cards (bench/LargeModel.cpp).
    std::uint32_t cards = 0;
};

/// Whether the module writes its log file.
enum class Logging
{
    off,
    toFile,
};

class BenchHost
{
public:
    explicit BenchHost(HostSize size, Logging logging = Logging::off);

    broker::Broker& broker() { return _host.broker(); }
    /// Unloads the module, so that the next use of the broker loads it again.
    void reload();
    /// Loads the class's provider; the agent starts with the first.
    void load(const std::string& className);
    /// Enumerates; throws when that fails.
    std::vector<broker::Object> enumerate(const std::string& className);
    /// Waits until the module's refresh thread is gone. Nothing else may start threads meanwhile.
    static void awaitEndOfRefresh();
    /// Time that was spent inside the simulated libraries since the process began.
    static std::uint64_t nanosecondsInLibraries();

private:
    module_test::Host _host;
};

/// Nanoseconds of `work` beside those of them that were spent in the simulated libraries.
template <class Work> void addBesideLibraries(Row& row, Work work)
{
    const std::uint64_t before = BenchHost::nanosecondsInLibraries();
    const double took = nanosecondsOf(work);
    row.add(took, static_cast<double>(BenchHost::nanosecondsInLibraries() - before));
}

/// A class that has one instance on every host and does not look at the hardware.
inline constexpr const char* smallClass = "TVRHBA_RecordLog";
inline constexpr const char* benchNamespace = "root/tavrin";

} // namespace bench
