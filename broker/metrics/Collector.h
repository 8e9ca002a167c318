// Collects what monitoring is told, asking the host no more often than it may be asked.
#pragma once

#include "broker/core/Observation.h"
#include "broker/metrics/Series.h"

#include <chrono>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <semaphore>
#include <string>
#include <vector>

namespace metrics
{

class Collector
{
public:
    Collector(broker::Broker& broker, std::string nameSpace, std::chrono::milliseconds shares = std::chrono::seconds(1),
              std::chrono::milliseconds patience = std::chrono::seconds(5));

    /// What was read of the host, and how the module is now. Those who ask at once, or one that time after the other,
    /// share one reading. It reads the provider's cache, and has it refreshed only where it is older than its timeout.
    /// While a cache stays incomplete each read would refresh it: then the values stand that were read before, as they
    /// do where another reading takes longer than the patience. Nothing where there are none yet.
    std::optional<Families> collect();

private:
    using Clock = std::chrono::steady_clock;

    /// What is told of the host until it is read again.
    struct Known
    {
        Families families;
        std::optional<Clock::time_point> oldest; ///< time of the oldest of the readings; nothing where there is none
    };

    /// What was read last of a class, and when all of it was.
    struct ClassReading
    {
        Families families;
        std::optional<Clock::time_point> time;
    };

    /// What a port sees.
    struct Reach
    {
        std::uint64_t targets = 0;
        std::uint64_t units = 0;
    };
    using Reaches = std::map<std::string, Reach, std::less<>>;

    std::shared_ptr<const Known> known();
    void share(Known known);
    Known everything();
    void readHost();
    void readClass(std::size_t place);
    void readFabric();
    bool isFabricCached();
    std::optional<Reaches> countUnits();
    bool mayAsk();

    broker::Broker& _broker;
    const std::string _nameSpace;
    const std::chrono::milliseconds _shares;
    const std::chrono::milliseconds _patience;

    std::mutex _knownMutex;
    std::shared_ptr<const Known> _known; ///< null before the first reading

    /// Whoever has it uses all below. No timed mutex, since the thread sanitizer does not see how the standard library
    /// locks one.
    std::binary_semaphore _turn{1};
    std::optional<Clock::time_point> _collected;

    std::vector<ClassReading> _host;
    std::size_t _next = 0; ///< class to read next
    std::optional<std::size_t> _cards;
    std::vector<std::string> _ports;
    std::optional<Reaches> _reaches;          ///< by port
    std::optional<std::uint64_t> _fabricRead; ///< the number of refreshes before that
    bool _failed = false;
};

} // namespace metrics
