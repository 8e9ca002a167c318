#include "agent/RefreshSteps.h"

#include "agent/SharedEnds.h"

namespace cimple
{

namespace
{

HostContext& hostOf(HostContext& context)
{
    return context;
}
template <class Context> HostContext& hostOf(Context& context)
{
    return context.host;
}

template <class Context> std::uint32_t runContained(const Step<Context>& step, Context& context)
{
    if (!step.exception.text)
        return step.run(context);
    try
    {
        return step.run(context);
    }
    catch (...)
    {
        note_missing_memory();
        if (step.cleared)
            clearGroup(hostOf(context).agent, *step.cleared);
        step.exception.log();
        return BUILD_DONE;
    }
}

template <class Context> std::uint32_t walk(std::span<const Step<Context>> steps, Context& context)
{
    for (const Step<Context>& step : steps)
    {
        const std::uint32_t status = step.run ? runContained(step, context) : BUILD_DONE;
        if (status == BUILD_NO_INSTANCE && std::is_same_v<Context, PortContext>)
            return status;
        if (status != BUILD_DONE || !step.run)
            step.failure.log(status);
        if (status != BUILD_DONE && step.onFailure == OnFailure::Stop)
            return BUILD_FAILED;
    }
    return BUILD_DONE;
}

std::uint32_t buildPorts(AdapterContext& on)
{
    for (unsigned index = 0; index < on.adapter.getPortCount(); index++)
    {
        TVR_LOG(TVR_DBG, "Creating classes for port %d.", static_cast<int>(index));
        PortContext context{on.host, on, index, dynamic_cast<FCPort&>(*on.adapter.getPort(index))};
        if (walk(on.host.steps.port, context) == BUILD_FAILED)
            return BUILD_FAILED;
    }
    return BUILD_DONE;
}

std::uint32_t buildAdapter(AdapterContext& context)
{
    const std::uint32_t status = walk(context.host.steps.adapter, context);
    return status == BUILD_DONE ? buildPorts(context) : status;
}

/// What a host with FC cards has.
std::uint32_t buildCards(HostContext& host)
{
    if (host.agent.m_pData->dataValid)
        return walk(host.steps.cards, host);
    TVR_LOG(TVR_DBG, "No FC card found");
    return BUILD_DONE;
}

/// Whatever is thrown ends the adapters alone; a failure stops the refresh.
constexpr HostStep cards[] = {
    {buildCards, OnFailure::Stop, {}, {TVR_DBG, "Unknown Exception in FC card discovery"}},
};

} // namespace

std::uint32_t buildAdapters(HostContext& host)
{
    const std::vector<Adapter*>& adapters = host.agent.m_pData->adapters;
    for (unsigned index = 0; index < adapters.size(); index++)
    {
        Adapter& adapter = *adapters[index];
        if (adapter.adapterType != Adapter::fibreChannel)
        {
            TVR_LOG(TVR_DBG, "Skippping Non FC Adapter [%s]", adapter.getName().c_str());
            continue;
        }
        auto& fcAdapter = dynamic_cast<FCAdapter&>(adapter);
        TVR_LOG(TVR_DBG, "%s", fcAdapter.getName().c_str());
        AdapterContext context(host, index, fcAdapter);
        if (buildAdapter(context) != BUILD_DONE)
            return BUILD_FAILED;
    }
    return BUILD_DONE;
}

std::uint32_t buildAdapterMaps(ProviderAgent& agent, const RefreshSteps& steps)
{
    TVR_LOG(TVR_DBG, " updateAdapterMaps: Entry");
    agent.clearAdapterMaps();
    const SharedEnds ends;
    HostContext host(agent, steps);
    for (const std::span<const HostStep> list : {steps.host, std::span<const HostStep>(cards), steps.closing})
        if (const std::uint32_t status = walk(list, host); status != BUILD_DONE)
            return status;
    TVR_LOG(TVR_DBG, "PERF: updateAdapterMaps: cleanExit");
    return BUILD_DONE;
}

std::uint32_t buildSANMaps(ProviderAgent& agent, const RefreshSteps& steps)
try
{
    TVR_LOG(TVR_DBG, "PERF: updateSANMaps: Entry");
    agent.clearSANMaps();
    const SharedEnds ends;
    HostContext host = HostContext::ofCache(agent, steps);
    const std::uint32_t status = walk(steps.san, host);
    if (status == BUILD_DONE)
        TVR_LOG(TVR_DBG, "PERF: updateSANMaps: cleanExit");
    return status;
}
catch (...)
{
    note_missing_memory();
    return failed({TVR_ERR, "Error updating SAN maps"});
}

} // namespace cimple
