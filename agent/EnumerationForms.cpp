#include "agent/EnumerationForms.h"

#include "agent/Reading.h"

#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <exception>

namespace cimple
{

int loadProvider()
{
    return ProviderAgent::join() ? 0 : LOAD_FAILED;
}

int unloadProvider(const char* providerName)
{
    TVR_LOG(TVR_DBG, "%s::unload()", providerName);
    ProviderAgent::releaseRef();
    return 0;
}

namespace
{

/// Copies once the stage of the map is complete.
void copyWhenReady(ProviderAgent& agent, const RefreshStage& stage, Reading& reading)
{
    Auto_Mutex stageLock(stage.mutex);
    stage.waitIfNotReady();
    Auto_Mutex dataLock(agent.m_DataMutex);
    reading.copy(stage);
}

/// The same for the SAN maps. An adapter refresh may have taken them down since they were asked for, and does not build
/// them unasked: then they are asked for again.
void copyFabricWhenReady(ProviderAgent& agent, Reading& reading)
{
    const RefreshStage stage = agent.sanMaps();
    for (;;)
    {
        Auto_Mutex stageLock(stage.mutex);
        if (stage.ready || agent.m_bSANRefresh || agent.m_bSANRefreshPending)
        {
            stage.waitIfNotReady();
            Auto_Mutex dataLock(agent.m_DataMutex);
            return reading.copy(stage);
        }
        agent.m_bSANRefreshPending = true;
        stageLock.unlock();
        agent.BuildCimpleInfo();
    }
}

/// While it lives, what goes missing for want of memory leaves the maps marked as incomplete, and a refresh due.
class WatchMemory
{
public:
    explicit WatchMemory(ProviderAgent& agent) : _agent(agent) {}
    ~WatchMemory()
    {
        if (left_out_for_memory == _leftOutBefore && std::uncaught_exceptions() == _exceptions)
            return;
        _agent.m_bAdapterMapsIncomplete = true;
        _agent.m_bAdapterRefreshPending = true;
    }
    WatchMemory(const WatchMemory&) = delete;
    WatchMemory& operator=(const WatchMemory&) = delete;

private:
    ProviderAgent& _agent;
    const unsigned _leftOutBefore = left_out_for_memory;
    const int _exceptions = std::uncaught_exceptions();
};

void copyAfterLiveRefresh(ProviderAgent& agent, Mutex& classMutex, LiveRefresh refresh, const Selection& selection,
                          Reading& reading)
{
    Auto_Mutex adapterDataLock(agent.m_AdapterDataReadyMutex);
    agent.adapterData().waitIfNotReady();
    Auto_Mutex adapterMapsLock(agent.m_AdapterMapsReadyMutex);
    agent.adapterMaps().waitIfNotReady();
    Auto_Mutex dataLock(agent.m_DataMutex);
    {
        Auto_Mutex classLock(classMutex);
        const WatchMemory watch(agent);
        refresh(agent, selection);
    }
    reading.copy(agent.adapterMaps());
}

} // namespace

int enumeratePlain(Instance_Map InstanceCache::*map, Instance_Map InstanceCache::*second, const char* providerName,
                   Instance_Handler handler, void* client, const Selection& selection)
{
    try
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        agent.BuildCimpleInfo();
        Reading reading(agent.*map, selection, second ? &(agent.*second) : nullptr);
        copyWhenReady(agent, agent.adapterMaps(), reading);
        reading.deliver(providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in CIM Provider Enumeration - do nothing");
        Reading::cutShort(handler, client);
    }
    return 0;
}

int enumerateSan(Instance_Map InstanceCache::*map, const char* providerName, Instance_Handler handler, void* client,
                 const Selection& selection)
{
    try
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        {
            Auto_Mutex lock(agent.m_SANMapsReadyMutex);
            if (!agent.m_bSANMapsReady)
                agent.m_bSANRefreshPending = true;
        }
        agent.BuildCimpleInfo();
        Reading reading(agent.*map, selection);
        copyFabricWhenReady(agent, reading);
        reading.deliver(providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in SAN CIM Provider Enumeration - do nothing");
        Reading::cutShort(handler, client);
    }
    return 0;
}

int enumerateActive(Instance_Map InstanceCache::*map, const char* providerName, Mutex& classMutex, LiveRefresh refresh,
                    Instance_Handler handler, void* client, const Selection& selection)
{
    try
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        if (!agent.m_bLoaded)
        {
            TVR_LOG(TVR_DBG, "RM Init failed for %s", providerName);
            return 0;
        }
        agent.BuildCimpleInfo();
        Reading reading(agent.*map, selection);
        copyAfterLiveRefresh(agent, classMutex, refresh, selection, reading);
        reading.deliver(providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in Active CIM Provider Enumeration - do nothing");
        Reading::cutShort(handler, client);
    }
    return 0;
}

} // namespace cimple
