// Collects what monitoring is told, asking the host no more often than it may be asked.
#pragma once

#include "broker/core/Observation.h"
#include "broker/metrics/Series.h"

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <semaphore>
#include <string>
#include <vector>

namespace metrics
{

class Collector
{
public:
    Collector(broker::Broker& broker, std::string nameSpace,
              std::chrono::milliseconds shares = std::chrono::seconds(1));

    /// Those who ask at once, or one that time after the other, share one collection. It reads the provider's cache,
    /// and has it refreshed only where it is older than its timeout. While a cache stays incomplete each read would
    /// refresh it: then the values stand that were read before.
    /// Null where another collection takes longer than 5 seconds.
    std::shared_ptr<const Families> collect();

private:
    using Clock = std::chrono::steady_clock;

    /// What a port sees.
    struct Reach
    {
        std::uint64_t targets = 0;
        std::uint64_t units = 0;
    };
    using Reaches = std::map<std::string, Reach, std::less<>>;

    Families everything();
    void readHost();
    void readClass(std::size_t place);
    void readFabric();
    bool mayAsk();

    broker::Broker& _broker;
    const std::string _nameSpace;
    const std::chrono::milliseconds _shares;

    /// Whoever has it uses all below. No timed mutex, since the thread sanitizer does not see how the standard library
    /// locks one.
    std::binary_semaphore _turn{1};
    Clock::time_point _collected;
    std::shared_ptr<const Families> _shared;

    std::vector<Series> _host; ///< what was read last of each class
    std::size_t _next = 0;     ///< class to read next
    std::size_t _cards = 0;
    std::vector<std::string> _ports;
    Reaches _reaches;                         ///< by port
    std::optional<std::uint64_t> _fabricRead; ///< the number of refreshes before that
    bool _failed = false;
};

} // namespace metrics
