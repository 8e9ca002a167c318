#include "agent/ProviderAgent.h"

#include "agent/ModelStages.h"
#include "agent/SignalTrace.h"
#include "device/Bindings.h"
#include "device/Loader.h"
#include "foundation/FilePaths.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"
#include "runtime/Thread_Context.h"

#include <csignal>
#include <exception>
#include <unistd.h>

namespace cimple
{

// --- singleton -----------------------------------------------------------------------------------------

namespace
{

Mutex singletonMutex;
std::atomic<ProviderAgent*> singleton{nullptr};
std::int32_t references = 0;

} // namespace

/// Ends an agent that is still alive when the library is closed or the process exits: brokers do not always call as
/// many cleanups as they made providers. The object itself stays, for threads that may still be inside it.
class AgentEnd
{
public:
    /// The threads that are joined at the end still need their contexts: the key of these must outlive this object.
    AgentEnd() { Thread_Context::top(); }
    ~AgentEnd()
    {
        if (ProviderAgent* agent = singleton.load())
        {
            agent->finish();
            agent->m_config.save();
        }
    }
};

namespace
{

AgentEnd agentEnd; // after the singleton's mutex, so that it is destroyed before it

} // namespace

ProviderAgent* ProviderAgent::instance()
{
    if (ProviderAgent* agent = singleton.load())
        return agent;
    Auto_Mutex lock(singletonMutex);
    if (!singleton.load())
        singleton = new ProviderAgent();
    return singleton.load();
}

void ProviderAgent::addRef()
{
    Auto_Mutex lock(singletonMutex);
    TVR_LOG(TVR_DBG, "ProviderAgent::addRef[%d]", references);
    references++;
}

void ProviderAgent::releaseRef()
{
    Auto_Mutex lock(singletonMutex);
    TVR_LOG(TVR_DBG, "ProviderAgent::releaseRef[%d]", references);
    if (--references == 0)
    {
        delete singleton.load();
        singleton = nullptr;
    }
}

// --- start ---------------------------------------------------------------------------------------------

ProviderAgent::ProviderAgent()
{
    try
    {
        start();
        m_bLoaded = true;
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Tavrin CIM Provider load failure");
        m_bLoaded = false;
    }
}

void ProviderAgent::start()
{
    m_config.load(filePath(FilePath::ProviderConfig).c_str());
    struct sigaction unattached;
    fillSignalAction(unattached);
    startLogging(m_fileLogger);
    readSettings();
    if (getOSInformation(m_osName, m_osExtendedInfo) != 0)
        TVR_LOG(TVR_ERR, "getOSInformation() failed");

    TVR_LOG(TVR_DBG, "Initializing RM API ");
    if (loadAllLibraries() == 1)
        TVR_LOG(TVR_ERR, "Error : In Loading Library ");
    resolveAllEntries();
    m_pMethodWrapper = std::make_unique<TVR_MethodWrapper>();
    m_pData = std::make_unique<Data>();
    TVR_LOG(TVR_INFO, "Tavrin Provider v%d.%d.%d-%d Loaded[%d]", providerVersion[0], providerVersion[1],
            providerVersion[2], providerVersion[3], getpid());
}

void ProviderAgent::readSettings()
{
    m_cacheTimeout = static_cast<std::uint32_t>(m_config.getCacheTimeout());
    m_bAdapterRefresh = m_config.getRefreshAdapterData();
    m_bSANRefresh = m_config.getRefreshSANData();
}

// --- end -----------------------------------------------------------------------------------------------

ProviderAgent::~ProviderAgent()
{
    finish();
}

void ProviderAgent::finish()
{
    if (m_bFinished.exchange(true))
        return;
    try
    {
        TVR_LOG(TVR_DBG, "Entering dtor ~ProviderAgent()");
        joinThreads();
        deleteData();
        HBA_FreeLibrary();
        ClearMaps();
        if (!TVR_Logger::instance().isFfdcMode())
            m_fileLogger.stop();
        TVR_LOG(TVR_INFO, "Tavrin Provider Unloaded");
        unloadAllLibraries();
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Error in ProviderAgent unload. Just continue");
    }
}

void ProviderAgent::joinThreads()
{
    void* value = nullptr;
    if (m_bDportThreadRunning)
    {
        m_bDportThreadEnd = true;
        Thread::join(m_dportThread, value);
        m_bDportThreadRunning = false;
    }

    m_ThreadMutex.lock();
    m_bLoaded = false;
    const bool running = m_bThreadRunning;
    const bool joinable = m_bThreadJoinable;
    m_bThreadJoinable = false;
    m_ThreadMutex.unlock();
    if (running)
        TVR_LOG(TVR_DBG, "PERF: Clearing the previous thread...with join");
    if (joinable)
        Thread::join(m_dataFetchThread, value);
}

void ProviderAgent::deleteData()
{
    TVR_LOG(TVR_DBG, "Deleting Data pointer");
    Auto_Mutex adapterDataLock(m_AdapterDataReadyMutex);
    if (m_bAdapterDataBuilding)
    {
        TVR_LOG(TVR_DBG, "PERF: Waiting for m_bIsAdapterDataReady");
        m_AdapterDataReadyCond.wait(m_AdapterDataReadyMutex);
        TVR_LOG(TVR_DBG, "PERF: Woken up from wait for m_bIsAdapterDataReady");
    }
    Auto_Mutex adapterMapsLock(m_AdapterMapsReadyMutex);
    if (m_bAdapterMapsBuilding)
        m_AdapterMapsReadyCond.wait(m_AdapterMapsReadyMutex);
    Auto_Mutex dataLock(m_DataMutex);
    m_pData.reset();
    TVR_LOG(TVR_DBG, "MethodWrapper");
    m_pMethodWrapper.reset();
}

// --- clearing ------------------------------------------------------------------------------------------

void ProviderAgent::ClearMaps()
{
    TVR_LOG(TVR_DBG, "Entered ClearMaps()");
    {
        Auto_Mutex lock(m_AdapterMapsReadyMutex);
        clearAdapterMaps();
    }
    {
        Auto_Mutex lock(m_SANMapsReadyMutex);
        clearSANMaps();
    }
    TVR_LOG(TVR_DBG, "Exiting ClearMaps()");
}

std::uint32_t ProviderAgent::updateAdapterMaps()
{
    return modelStages.updateAdapterMaps(*this);
}

std::uint32_t ProviderAgent::updateSANMaps()
{
    return modelStages.updateSANMaps(*this);
}

} // namespace cimple
