// What the module tells of itself beside CMPI.
#include "module/Observe.h"

#include "agent/ProviderAgent.h"
#include "agent/RefreshRecord.h"
#include "device/CallFailures.h"

using namespace cimple;

static_assert(sizeof(tavrin_fc_observation) == 48, "version 1, for which programs are built");

extern "C" __attribute__((visibility("default"))) int
tavrin_fc_observe(tavrin_fc_observation* observation, tavrin_fc_call_failures_t* failures, void* client)
{
    if (!observation || observation->version < TAVRIN_FC_OBSERVE_VERSION)
        return 1;
    const ProviderAgent::Readiness agent = ProviderAgent::readiness();
    const bool refreshed = refreshRecord.ended() > 0;
    *observation = {
        .version = TAVRIN_FC_OBSERVE_VERSION,
        .loaded = agent.loaded,
        .refresh_running = refreshRecord.running(),
        .refresh_pending = agent.refreshPending,
        .refreshes = refreshRecord.ended(),
        .cache_age = refreshed ? refreshRecord.age() : 0,
        .refresh_length = refreshRecord.length(),
        .cache_timeout = agent.cacheTimeout * static_cast<std::uint64_t>(Datetime::minute),
    };
    for (std::size_t row = 0; failures && row < entryPoints.size(); ++row)
        if (entryPoints[row].use == called && entryPoints[row].answer != Answer::value)
            failures(client, entryPoints[row].name, callFailures[row]);
    return 0;
}
