#include "agent/RefreshContext.h"

#include "agent/RefreshSteps.h"

#include <algorithm>
#include <stdexcept>

namespace cimple
{

namespace
{

const FCAdapterAttributes& attributesOf(const FCAdapter& adapter)
{
    const auto* attributes = dynamic_cast<const FCAdapterAttributes*>(adapter.getAttributes());
    if (!attributes)
        throw std::runtime_error("FC adapter without attributes");
    return *attributes;
}

} // namespace

TVRHBA_RegisteredProfile* RegisteredProfiles::find(std::string_view name) const
{
    const auto place = std::ranges::find(_profiles, name, &decltype(_profiles)::value_type::first);
    return place == _profiles.end() ? nullptr : place->second;
}

void RegisteredProfiles::add(std::string_view name, TVRHBA_RegisteredProfile* profile)
{
    _profiles.emplace_back(name, profile);
}

HostContext::HostContext(ProviderAgent& agent) : HostContext(agent, refreshSteps) {}

HostContext HostContext::ofCache(ProviderAgent& agent, const RefreshSteps& steps)
{
    HostContext host(agent, steps);
    host.system = mapOf<CIM_ComputerSystem>(agent).first();
    return host;
}

AdapterContext::AdapterContext(HostContext& host, unsigned index, FCAdapter& adapter)
    : host(host), index(index), adapter(adapter), attributes(attributesOf(adapter))
{}

} // namespace cimple
