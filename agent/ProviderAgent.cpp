#include "agent/ProviderAgent.h"

#include "agent/RefreshSteps.h"
#include "agent/SignalTrace.h"
#include "device/Bindings.h"
#include "device/Loader.h"
#include "foundation/FilePaths.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"
#include "runtime/base/Immortal.h"
#include "runtime/log/Shielded.h"
#include "runtime/threads/Thread_Context.h"

#include <cerrno>
#include <csignal>
#include <exception>
#include <new>
#include <string>
#include <unistd.h>
#include <utility>

namespace cimple
{

// --- singleton -----------------------------------------------------------------------------------------

namespace
{

Immortal<Mutex> singletonMutex;
std::atomic<ProviderAgent*> singleton{nullptr};
std::int32_t references = 0;
std::int32_t failedLoads = 0; ///< since the agent was made

} // namespace

/// Ends an agent that is still alive when the process exits: brokers do not always call as many cleanups as they made
/// providers. The object itself stays, for threads that may still be inside it. The module's image is never unmapped
/// before, so that this does not run inside dlclose, under the loader's lock, which a refresh may need to end.
class AgentEnd
{
public:
    /// The threads that are joined at the end still need their contexts: the key of these must outlive this object.
    AgentEnd() { Thread_Context::top(); }
    ~AgentEnd()
    {
        if (ProviderAgent* agent = singleton.load())
            agent->finish();
    }
};

namespace
{

AgentEnd agentEnd;

} // namespace

ProviderAgent* ProviderAgent::instance()
{
    if (ProviderAgent* agent = singleton.load())
        return agent;
    Auto_Mutex lock(*singletonMutex);
    return makeLocked();
}

ProviderAgent* ProviderAgent::makeLocked()
{
    if (!singleton.load())
        singleton = new ProviderAgent();
    return singleton.load();
}

void ProviderAgent::addRef()
{
    Auto_Mutex lock(*singletonMutex);
    addRefLocked();
}

void ProviderAgent::addRefLocked()
{
    TVR_LOG(TVR_DBG, "ProviderAgent::addRef[%d]", references);
    references++;
}

bool ProviderAgent::join()
{
    Auto_Mutex lock(*singletonMutex);
    const bool loaded = shielded(
        false, [] { return makeLocked()->m_bLoaded.load(); },
        [](const char*) { TVR_LOG(TVR_ERR, "Tavrin CIM Provider load failure"); });
    if (loaded)
        addRefLocked();
    else
        failedLoads++;
    return loaded;
}

void ProviderAgent::releaseRef()
{
    Auto_Mutex lock(*singletonMutex);
    TVR_LOG(TVR_DBG, "ProviderAgent::releaseRef[%d]", references);
    releaseRefLocked();
}

void ProviderAgent::releaseRefLocked()
{
    if (--references + failedLoads != 0)
        return;
    ProviderAgent* agent = singleton.load();
    // A thread of the agent, here at the end of an up-call into the module, cannot wait for its own end.
    if (agent && (agent->m_process != getpid() || agent->isOnRefreshThread()))
        return;
    delete agent;
    singleton = nullptr;
    references = 0;
    failedLoads = 0;
}

ProviderAgent::Readiness ProviderAgent::readiness()
{
    return {m_bLoaded, m_bAdapterRefreshPending || m_bSANRefreshPending, m_cacheTimeout};
}

// --- start ---------------------------------------------------------------------------------------------

ProviderAgent::ProviderAgent() : m_process(getpid())
{
    m_bAdapterRefreshPending = true;
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
    std::string libraryVersion;
    TVR_MethodWrapper::GetLibraryVersion(&libraryVersion); // for its log line
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
    m_bAdapterRefreshPending = false;
    m_bSANRefreshPending = false;
    m_cacheTimeout = 0;
}

void ProviderAgent::finish()
{
    if (getpid() != m_process || m_bFinished.exchange(true))
        return;
    try
    {
        TVR_LOG(TVR_DBG, "Entering dtor ~ProviderAgent()");
        const bool joined = joinThreads();
        m_config.save(); // while a failure can still be logged
        if (!joined)
            return m_pMethodWrapper.reset(); // the locks of the thread that ends the process are its own
        deleteData();
        // Who comes now gets nothing, rather than a part of it.
        Auto_Mutex adapterMapsLock(m_AdapterMapsReadyMutex);
        Auto_Mutex sanMapsLock(m_SANMapsReadyMutex);
        Auto_Mutex dataLock(m_DataMutex);
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
    finishLogging();
}

bool ProviderAgent::isOnRefreshThread()
{
    Auto_Mutex lock(m_ThreadMutex);
    return m_bThreadRunning && Thread::self() == m_dataFetchThread;
}

/// False on one of the threads themselves, where a library of the hardware or the resolver called exit(), and on one
/// that holds the data, for which the others may wait.
bool ProviderAgent::joinThreads()
{
    const bool waitedFor = m_DataMutex.isMine();
    const bool dportEnded = endDportThread();

    m_ThreadMutex.lock();
    m_bLoaded = false;
    const bool running = m_bThreadRunning;
    const bool joinable = m_bThreadJoinable;
    m_bThreadJoinable = false;
    m_ThreadMutex.unlock();
    if (running)
        TVR_LOG(TVR_DBG, "PERF: Clearing the previous thread...with join");
    void* value = nullptr;
    const bool mayJoin = !(waitedFor && running);
    const bool refreshEnded = !joinable || (mayJoin && Thread::join(m_dataFetchThread, value) == 0);
    return !waitedFor && dportEnded && refreshEnded;
}

// --- the thread of the D-Port test

namespace
{

thread_local bool onDportThread = false;

struct DportStart
{
    Thread::Proc proc;
    void* arg;
};

void* runDport(void* arg)
{
    const std::unique_ptr<DportStart> start(static_cast<DportStart*>(arg));
    onDportThread = true;
    return start->proc(start->arg);
}

} // namespace

int ProviderAgent::startDportThread(Thread::Proc proc, void* arg)
{
    std::unique_ptr<DportStart> start(new (std::nothrow) DportStart{proc, arg});
    if (!start)
        return ENOMEM;
    Auto_Mutex lock(m_DportThreadMutex);
    if (m_bDportThreadRunning)
        TVR_LOG(TVR_DBG, "DPortTest:Joining the thread created for DPORTStatus");
    joinDportThread();
    if (m_bDportThreadEnd)
        return ECANCELED;
    const int error = Thread::create_joinable(m_dportThread, &runDport, start.get());
    if (error == 0)
        static_cast<void>(start.release()); // the thread's from now on
    m_bDportThreadRunning = error == 0;
    return error;
}

/// The caller holds m_DportThreadMutex.
void ProviderAgent::joinDportThread()
{
    void* value = nullptr;
    if (std::exchange(m_bDportThreadRunning, false))
        Thread::join(m_dportThread, value);
}

/// False on the thread itself, and on that of the refresh or one that holds the data, which the other may wait for.
bool ProviderAgent::endDportThread()
{
    m_bDportThreadEnd = true;
    if (onDportThread || isOnRefreshThread() || m_DataMutex.isMine())
        return false;
    Auto_Mutex lock(m_DportThreadMutex); // a method may be waiting for the same end
    joinDportThread();
    return true;
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
    clearAdapterMaps();
    clearSANMaps();
    TVR_LOG(TVR_DBG, "Exiting ClearMaps()");
}

std::uint32_t ProviderAgent::updateAdapterMaps()
{
    return buildAdapterMaps(*this);
}

std::uint32_t ProviderAgent::updateSANMaps()
{
    return buildSANMaps(*this);
}

} // namespace cimple
