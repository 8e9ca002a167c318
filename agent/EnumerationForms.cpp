#include "agent/EnumerationForms.h"

#include "foundation/Log.h"

namespace cimple
{

int loadProvider()
{
    if (!ProviderAgent::instance()->m_bLoaded)
        return LOAD_FAILED;
    ProviderAgent::addRef();
    return 0;
}

int unloadProvider(const char* providerName)
{
    TVR_LOG(TVR_DBG, "%s::unload()", providerName);
    ProviderAgent::releaseRef();
    return 0;
}

namespace
{

/// Clones the cached instances into `local`; false if one was refused. The caller holds m_DataMutex.
bool copyMap(const Instance_Map& cached, Instance_Map& local)
{
    for (std::size_t i = 0;; i++)
    {
        Ref<> copied(cached.clone_at(i));
        if (!copied)
            return true;
        if (local.insert(copied.get()) == -1)
            return TVR_LOG(TVR_CRIT, "Insert failed for %zu", i), false;
        copied.release();
    }
}

/// Copies a map once its stage is complete; what is then sent to the broker holds no lock.
bool copyWhenReady(ProviderAgent& agent, const RefreshStage& stage, const Instance_Map& cached, Instance_Map& local)
{
    Auto_Mutex stageLock(stage.mutex);
    stage.waitIfNotReady();
    Auto_Mutex dataLock(agent.m_DataMutex);
    return copyMap(cached, local);
}

void deliver(const Instance_Map& local, const char* providerName, Instance_Handler handler, void* client)
{
    local.for_each(handler, client);
    TVR_LOG(TVR_DBG, "%s::enum_instances()", providerName);
}

bool copyAfterLiveRefresh(ProviderAgent& agent, Mutex& classMutex, LiveRefresh refresh, const Instance_Map& cached,
                          Instance_Map& local)
{
    Auto_Mutex adapterDataLock(agent.m_AdapterDataReadyMutex);
    agent.adapterData().waitIfNotReady();
    Auto_Mutex adapterMapsLock(agent.m_AdapterMapsReadyMutex);
    agent.adapterMaps().waitIfNotReady();
    Auto_Mutex dataLock(agent.m_DataMutex);
    {
        Auto_Mutex classLock(classMutex);
        refresh(agent);
    }
    return copyMap(cached, local);
}

} // namespace

int enumeratePlain(Instance_Map InstanceCache::*map, const char* providerName, Instance_Handler handler, void* client)
{
    try
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        agent.BuildCimpleInfo();
        Instance_Map local((agent.*map).meta_class);
        if (copyWhenReady(agent, agent.adapterMaps(), agent.*map, local))
            deliver(local, providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in CIM Provider Enumeration - do nothing");
    }
    return 0;
}

int enumerateSan(Instance_Map InstanceCache::*map, const char* providerName, Instance_Handler handler, void* client)
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
        Instance_Map local((agent.*map).meta_class);
        if (copyWhenReady(agent, agent.sanMaps(), agent.*map, local))
            deliver(local, providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in SAN CIM Provider Enumeration - do nothing");
    }
    return 0;
}

int enumerateActive(Instance_Map InstanceCache::*map, const char* providerName, Mutex& classMutex, LiveRefresh refresh,
                    Instance_Handler handler, void* client)
{
    try
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        if (!agent.m_bLoaded)
            return TVR_LOG(TVR_DBG, "RM Init failed for %s", providerName), 0;
        agent.BuildCimpleInfo();
        Instance_Map local((agent.*map).meta_class);
        if (copyAfterLiveRefresh(agent, classMutex, refresh, agent.*map, local))
            deliver(local, providerName, handler, client);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Exception in Active CIM Provider Enumeration - do nothing");
    }
    return 0;
}

MethodGuard::Ready::Ready(ProviderAgent& agent)
{
    agent.BuildCimpleInfo();
    {
        Auto_Mutex lock(agent.m_AdapterDataReadyMutex);
        if (!agent.m_bIsAdapterDataReady)
        {
            TVR_LOG(TVR_DBG, "PERF: Waiting for m_AdapterDataReadyMutex");
            agent.adapterData().waitIfNotReady();
            TVR_LOG(TVR_DBG, "PERF: Woken up from wait for m_AdapterDataReadyMutex");
        }
    }
    {
        Auto_Mutex lock(agent.m_AdapterMapsReadyMutex);
        if (!agent.m_bAdapterMapsReady)
        {
            TVR_LOG(TVR_DBG, "PERF: Waiting for m_AdapterMapsReadyMutex");
            agent.adapterMaps().waitIfNotReady();
            TVR_LOG(TVR_DBG, "PERF: Woken up from wait for m_AdapterMapsReadyMutex");
        }
    }
}

MethodGuard::MethodGuard(ProviderAgent& agent) : _ready(agent), _dataLock(agent.m_DataMutex) {}

} // namespace cimple
