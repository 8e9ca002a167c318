// A host with the module, and a floor beside it: a provider that has the constants of the module's answers.
#pragma once

#include "bench/BenchHost.h"
#include "bench/FloorModule.h"

#include <optional>

namespace bench
{

class HostAndFloor
{
public:
    /// `objects(host)` is what the floor knows; it serves one class.
    template <class Objects>
    HostAndFloor(HostSize size, const cimple::Meta_Class& floorClass, Objects objects)
        : _host(size), _known(objects(_host))
    {
        BenchHost::awaitEndOfRefresh();
        broker::Options options;
        options.image = std::make_shared<FloorModule>(floorClass, _known, _host.broker().servedClasses());
        _floor.emplace(options);
    }

    broker::Broker& host() { return _host.broker(); }
    broker::Broker& floor() { return *_floor; }
    const std::vector<broker::Object>& known() const { return _known; }

private:
    BenchHost _host;
    std::vector<broker::Object> _known;
    std::optional<broker::Broker> _floor;
};

// --- what is measured of it -------------------------------------------------------------------------------

inline constexpr const char* cardClass = "TVRHBA_Card";
inline constexpr const char* associationClass = "TVRHBA_ProductPhysicalComponent";

inline std::vector<broker::Object> cardsOf(BenchHost& host)
{
    return host.enumerate(cardClass);
}

inline std::vector<broker::Object> lastCardOf(BenchHost& host)
{
    return {host.enumerate(cardClass).back()};
}

inline std::vector<broker::Object> productsOf(BenchHost& host)
{
    return host.enumerate("TVRHBA_Product");
}

} // namespace bench
