#include "broker/metrics/Collector.h"

#include "broker/metrics/HostFamilies.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <malloc.h>
#include <set>

namespace metrics
{

using namespace broker;
using namespace std::chrono_literals;

namespace
{

constexpr auto counter = prometheus::MetricType::Counter;
constexpr auto gauge = prometheus::MetricType::Gauge;

constexpr FamilyName up{"tavrin_fc_up", gauge, "Whether the provider answered all that it was asked last."};
constexpr FamilyName toolInfo{"tavrin_fc_tool_info", gauge, "The tool that answers."};
constexpr FamilyName cards{"tavrin_fc_cards", gauge, "Cards of the host."};
constexpr FamilyName targets{"tavrin_fc_port_targets", gauge, "Target ports that the port, or virtual port, sees."};
constexpr FamilyName units{"tavrin_fc_port_units", gauge, "Logical units that the port, or virtual port, sees."};
constexpr FamilyName valuesAge{"tavrin_fc_values_age_seconds", gauge,
                               "Time since the oldest of what is told of the host was read."};
constexpr FamilyName librariesLoaded{"tavrin_fc_libraries_loaded", gauge,
                                     "Whether the libraries of the hardware are in use."};
constexpr FamilyName cacheAge{"tavrin_fc_cache_age_seconds", gauge, "Time since the cache was refreshed."};
constexpr FamilyName cacheTimeout{"tavrin_fc_cache_timeout_seconds", gauge,
                                  "Age from which on a request refreshes the cache."};
constexpr FamilyName cacheIncomplete{"tavrin_fc_cache_incomplete", gauge,
                                     "Whether another refresh is due, since the last one left something out or a "
                                     "client changed something."};
constexpr FamilyName refreshes{"tavrin_fc_refreshes_total", counter, "Refreshes of the cache."};
constexpr FamilyName refreshLength{"tavrin_fc_refresh_duration_seconds", gauge, "What the last refresh took."};
constexpr FamilyName callFailures{"tavrin_fc_library_call_failures_total", counter,
                                  "Calls of the libraries that failed, by entry point."};

double seconds(std::uint64_t microseconds)
{
    return static_cast<double>(microseconds) / 1e6;
}

void tell(Series& series, const Observation& module)
{
    series.add(librariesLoaded, {}, module.loaded);
    series.add(cacheIncomplete, {}, module.refresh_pending);
    series.add(refreshes, {}, static_cast<double>(module.refreshes));
    if (module.loaded)
        series.add(cacheTimeout, {}, seconds(module.cache_timeout));
    if (module.refreshes > 0)
    {
        series.add(cacheAge, {}, seconds(module.cache_age));
        series.add(refreshLength, {}, seconds(module.refresh_length));
    }
    for (const auto& [entryPoint, count] : module.callFailures)
        series.add(callFailures, {{"function", entryPoint}}, static_cast<double>(count));
}

constexpr std::string_view cardClass = "TVRHBA_Card";
constexpr std::string_view portClass = "TVRHBA_FCPort";
constexpr const char* settingClass = "TVRHBA_ProviderConfigSetting";

/// Each unit of a target has an endpoint, named after the initiator, the target and the unit.
constexpr const char* endpointClasses[] = {"TVRHBA_SCSIProtocolEndpoint", "TVRHBA_VirtualSCSIProtocolTargetEndpoint"};

} // namespace

Collector::Collector(Broker& broker, std::string nameSpace, std::chrono::milliseconds shares,
                     std::chrono::milliseconds patience)
    : _broker(broker), _nameSpace(std::move(nameSpace)), _shares(shares), _patience(patience),
      _host(hostSources().size())
{}

std::optional<Families> Collector::collect()
{
    if (_turn.try_acquire_for(_patience))
    {
        const auto release = [this](void*) { _turn.release(); };
        const std::unique_ptr<void, decltype(release)> turn(this, release);
        if (!_collected || Clock::now() - *_collected >= _shares)
        {
            share(everything());
            _collected = Clock::now();
        }
    }
    const std::shared_ptr<const Known> host = known();
    if (!host)
        return std::nullopt;
    Series series;
    series.add(toolInfo, {{"version", TVRCIM_VERSION}}, 1);
    if (const auto module = observe(_broker))
        tell(series, *module);
    if (host->oldest)
        series.add(valuesAge, {}, std::chrono::duration<double>(Clock::now() - *host->oldest).count());
    Families families = series.families();
    families.insert(families.end(), host->families.begin(), host->families.end());
    return families;
}

std::shared_ptr<const Collector::Known> Collector::known()
{
    const std::lock_guard lock(_knownMutex);
    return _known;
}

void Collector::share(Known known)
{
    auto shared = std::make_shared<const Known>(std::move(known));
    const std::lock_guard lock(_knownMutex);
    _known.swap(shared);
}

/// What was never read is left out: to monitoring a 0 would be a loss of what it knows from before.
Collector::Known Collector::everything()
{
    readHost();
    Series series;
    series.add(up, {}, !_failed);
    if (_cards)
        series.add(cards, {}, static_cast<double>(*_cards));
    if (_reaches)
        for (const std::string& port : _ports)
            _reaches->try_emplace(port);
    for (const auto& [port, reach] : _reaches.value_or(Reaches()))
    {
        series.add(targets, {{"port", port}}, static_cast<double>(reach.targets));
        series.add(units, {{"port", port}}, static_cast<double>(reach.units));
    }
    Known all{series.families(), std::nullopt};
    for (const ClassReading& reading : _host)
    {
        all.families.insert(all.families.end(), reading.families.begin(), reading.families.end());
        if (reading.time)
            all.oldest = std::min(*reading.time, all.oldest.value_or(*reading.time));
    }
    return all;
}

/// One class after the other for as long as that is allowed. The next time goes on where this one ended.
void Collector::readHost()
{
    for (std::size_t read = 0; read < _host.size(); ++read)
    {
        if (!mayAsk())
            return;
        _failed = _failed && read > 0;
        readClass(_next);
        _next = (_next + 1) % _host.size();
    }
    readFabric();
}

void Collector::readClass(std::size_t place)
{
    const SourceRow& source = hostSources()[place];
    const Reply reply = _broker.enumerateInstances(_nameSpace, source.className);
    if (!reply.ok())
    {
        _failed = true;
        return; // what was read before stands
    }
    Series series;
    read(series, source, reply.objects);
    _host[place] = {series.families(), Clock::now()};
    if (source.className == cardClass)
        _cards = reply.objects.size();
    if (source.className != portClass)
        return;
    _ports.clear();
    for (const Object& port : reply.objects)
        _ports.push_back(labelText(source.labels(port).front().second));
}

/// Only after a refresh: there may be thousands of units, and nobody reads them live.
void Collector::readFabric()
{
    const auto before = observeSettled(_broker);
    if (!mayAsk() || (before && before->refreshes == _fabricRead))
        return;
    std::optional<Reaches> counted;
    if (isFabricCached())
    {
        counted = countUnits();
        malloc_trim(0); // what thousands of names took
        _failed = _failed || !counted;
        if (!counted)
            return; // what was counted before stands
    }
    _reaches = std::move(counted);
    _fabricRead = before ? std::optional(before->refreshes) : std::nullopt;
}

/// Whether a refresh reads the fabric, or only who asks for it has it read.
bool Collector::isFabricCached()
{
    const Reply setting = _broker.getInstance(
        {_nameSpace, settingClass, {{"InstanceID", Value::string("Tavrin HBA Provider:sanrefresh")}}});
    return !setting.ok() || setting.objects.empty() || unsignedOf(setting.objects.front(), "current") != 0;
}

/// Nothing where an enumeration fails, though it may have begun well.
std::optional<Collector::Reaches> Collector::countUnits()
{
    Reaches reaches;
    std::set<std::string, std::less<>> seen; // initiators with their targets
    const auto count = [&](Path&& endpoint)
    {
        const Value* name = endpoint.key("Name");
        const std::string text = name ? valueText(*name) : std::string();
        const std::size_t initiator = text.find(':');
        const std::size_t target = text.rfind(':');
        if (initiator == text.npos || target == initiator)
            return true;
        Reach& reach = reaches[labelText(text.substr(0, initiator))];
        ++reach.units;
        if (seen.insert(text.substr(0, target)).second)
            ++reach.targets;
        return true;
    };
    for (const char* className : endpointClasses)
        if (!_broker.enumerateInstanceNames(_nameSpace, className, {count, true}).ok())
            return std::nullopt;
    return reaches;
}

/// Behind a refresh that may leave the cache incomplete, of which the end alone tells. What is read while it lasts
/// would wait for it as well.
bool Collector::mayAsk()
{
    const auto module = observeSettled(_broker);
    if (!module || module->refreshes == 0)
        return true;
    return !module->refresh_running && (!module->refresh_pending || module->cache_age >= module->cache_timeout);
}

} // namespace metrics
