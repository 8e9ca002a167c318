#include "broker/core/Providers.h"

#include "broker/core/Core.h"
#include "broker/tables/BrokerTables.h"
#include "broker/tables/Handles.h"

#include <algorithm>
#include <iterator>

namespace broker
{

namespace
{

std::size_t indexOf(Kind kind)
{
    return static_cast<std::size_t>(kind);
}

std::string factoryName(const Provider& provider, Kind kind)
{
    return provider.factories + "_Create_" + kindName(kind) + "MI";
}

/// A server crashes at a null slot when the operation is asked for.
template <class... Slots> bool allSet(Slots... slots)
{
    return (... && (slots != nullptr));
}

bool tableIsComplete(const CMPIInstanceMIFT& ft)
{
    return allSet(ft.cleanup, ft.enumerateInstanceNames, ft.enumerateInstances, ft.getInstance, ft.createInstance,
                  ft.modifyInstance, ft.deleteInstance, ft.execQuery);
}

bool tableIsComplete(const CMPIAssociationMIFT& ft)
{
    return allSet(ft.cleanup, ft.associators, ft.associatorNames, ft.references, ft.referenceNames);
}

bool tableIsComplete(const CMPIMethodMIFT& ft)
{
    return allSet(ft.cleanup, ft.invokeMethod);
}

template <class MI> bool usable(const void* mi)
{
    const auto* ft = static_cast<const MI*>(mi)->ft;
    return ft && ft->ftVersion >= 100 && tableIsComplete(*ft);
}

bool usable(const void* mi, Kind kind)
{
    switch (kind)
    {
    case Kind::instance:
        return usable<CMPIInstanceMI>(mi);
    case Kind::association:
        return usable<CMPIAssociationMI>(mi);
    default:
        return usable<CMPIMethodMI>(mi);
    }
}

template <class MI> CMPIStatus cleanupCall(void* mi, const CMPIContext* context, bool terminating)
{
    auto* typed = static_cast<MI*>(mi);
    return typed->ft->cleanup(typed, context, terminating);
}

CMPIStatus cleanupCall(void* mi, Kind kind, const CMPIContext* context, bool terminating)
{
    switch (kind)
    {
    case Kind::instance:
        return cleanupCall<CMPIInstanceMI>(mi, context, terminating);
    case Kind::association:
        return cleanupCall<CMPIAssociationMI>(mi, context, terminating);
    default:
        return cleanupCall<CMPIMethodMI>(mi, context, terminating);
    }
}

} // namespace

const char* kindName(Kind kind)
{
    constexpr std::array names{"Instance", "Association", "Method"};
    return names[indexOf(kind)];
}

bool Provider::isRegisteredFor(std::string_view nameSpace) const
{
    return std::find(nameSpaces.begin(), nameSpaces.end(), canonicalNameSpace(nameSpace)) != nameSpaces.end();
}

ProviderTable::ProviderTable(Core& core) : _core(core)
{
    fillProviderBroker(_sharedBroker, core);
    if (!core.options.registration.empty())
        _registration = readRegistration(core.options.registration);
    for (const cimple::Registration* record = core.image->registrations(); record; record = record->next)
    {
        const ClassInfo* info = record->meta_class ? core.classes.find(record->meta_class->name) : nullptr;
        if (!info)
        {
            core.violation(std::string(record->provider_name) + " is registered for a class that no repository has");
            continue;
        }
        _providers.emplace(info->name, describe(*info));
        _names.push_back(info->name);
    }
    std::reverse(_names.begin(), _names.end()); // the list starts with what was linked last
}

std::unique_ptr<Provider> ProviderTable::describe(const ClassInfo& info)
{
    auto provider = std::make_unique<Provider>();
    provider->info = &info;
    provider->factories = info.name;
    std::vector<std::string> nameSpaces;
    if (_core.options.registration.empty())
    {
        nameSpaces = _core.options.moduleNamespaces;
    }
    else if (const auto registered = _registration.find(info.name); registered != _registration.end())
    {
        provider->factories = registered->second.provider;
        nameSpaces = registered->second.nameSpaces;
    }
    for (const std::string& nameSpace : nameSpaces)
    {
        provider->nameSpaces.push_back(canonicalNameSpace(nameSpace));
        _nameSpaces.insert(provider->nameSpaces.back());
    }
    fillProviderBroker(provider->ownBroker, _core);
    provider->broker = _core.options.personality.pointerForEach ? &provider->ownBroker.cmpi : &_sharedBroker.cmpi;
    return provider;
}

Provider* ProviderTable::find(std::string_view className)
{
    const auto it = _providers.find(className);
    return it == _providers.end() ? nullptr : it->second.get();
}

bool ProviderTable::serves(std::string_view className, Kind kind) const
{
    const auto it = _providers.find(className);
    return it != _providers.end() && _core.image->symbol(factoryName(*it->second, kind));
}

void* ProviderTable::load(Provider& provider, Kind kind, Outcome& outcome)
{
    const std::lock_guard lock(provider.mutex);
    if (_core.options.personality.loadKinds == LoadKinds::all)
    {
        for (const Kind other : allKinds)
            if (!provider.mi[indexOf(other)] && serves(provider.info->name, other) && !create(provider, other, outcome))
                return nullptr;
    }
    void* mi = provider.mi[indexOf(kind)];
    return mi ? mi : create(provider, kind, outcome);
}

void* ProviderTable::create(Provider& provider, Kind kind, Outcome& outcome)
{
    using Factory = void* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    const std::string name = factoryName(provider, kind);
    const auto factory = _core.image ? reinterpret_cast<Factory>(_core.image->symbol(name)) : nullptr;
    if (!factory)
    {
        outcome = {CMPI_RC_ERR_NOT_SUPPORTED, "the module has no " + name};
        return nullptr;
    }
    CallFrame frame(_core, provider.broker, name, {});
    CMPIStatus status{};
    void* mi = factory(provider.broker, frame.context, &status);
    if (!mi || status.rc != CMPI_RC_OK)
    {
        outcome = {CMPI_RC_ERR_FAILED, name + " made no provider"};
        return nullptr;
    }
    if (!usable(mi, kind))
    {
        _core.violation("the function table lacks slots of version 100");
        outcome = {CMPI_RC_ERR_FAILED, name + " made an incomplete provider"};
        return nullptr;
    }
    provider.mi[indexOf(kind)] = mi;
    provider.loadOrder[indexOf(kind)] = ++_loads;
    return mi;
}

CleanupAnswer ProviderTable::cleanupOne(Provider& provider, Kind kind, bool terminating)
{
    CallFrame frame(_core, provider.broker, "cleanup " + provider.info->name, {});
    void*& mi = provider.mi[indexOf(kind)];
    const CMPIStatus status = cleanupCall(mi, kind, frame.context, terminating);
    if (status.rc == CMPI_RC_OK || terminating)
        mi = nullptr;
    return {provider.info->name, kind, status.rc};
}

std::vector<CleanupAnswer> ProviderTable::cleanup(std::string_view className, bool terminating)
{
    std::vector<CleanupAnswer> answers;
    for (auto& [name, provider] : _providers)
    {
        if (!className.empty() && !sameName(name, className))
            continue;
        const std::lock_guard lock(provider->mutex);
        for (const Kind kind : allKinds)
            if (provider->mi[indexOf(kind)])
                answers.push_back(cleanupOne(*provider, kind, terminating));
    }
    return answers;
}

std::vector<CleanupAnswer> ProviderTable::shutdown()
{
    if (_core.options.personality.cleanupCalls == CleanupCalls::each)
        return cleanup({}, true);
    std::vector<CleanupAnswer> answers;
    for (const Kind kind : allKinds)
    {
        Provider* last = nullptr;
        for (auto& [name, provider] : _providers)
        {
            const bool later = !last || provider->loadOrder[indexOf(kind)] > last->loadOrder[indexOf(kind)];
            last = provider->mi[indexOf(kind)] && later ? provider.get() : last;
        }
        if (last)
            answers.push_back(cleanupOne(*last, kind, true));
    }
    for (auto& [name, provider] : _providers)
        provider->mi.fill(nullptr);
    return answers;
}

} // namespace broker
