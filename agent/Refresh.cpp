// The refresh: who starts it, and the thread that rebuilds device data and maps.
#include "agent/ProviderAgent.h"
#include "agent/RefreshRecord.h"
#include "agent/RefreshSteps.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"
#include "runtime/log/Shielded.h"

namespace cimple
{

void RefreshStage::waitIfNotReady() const
{
    if (!ready)
        cond.wait(mutex);
}

void RefreshStage::complete() const
{
    ready = true;
    building = false;
    cond.broadcast();
}

RefreshStage ProviderAgent::adapterData()
{
    return {m_AdapterDataReadyMutex, m_AdapterDataReadyCond, m_bIsAdapterDataReady, m_bAdapterDataBuilding,
            m_bAdapterMapsIncomplete};
}

RefreshStage ProviderAgent::adapterMaps()
{
    return {m_AdapterMapsReadyMutex, m_AdapterMapsReadyCond, m_bAdapterMapsReady, m_bAdapterMapsBuilding,
            m_bAdapterMapsIncomplete};
}

RefreshStage ProviderAgent::sanMaps()
{
    return {m_SANMapsReadyMutex, m_SANMapsReadyCond, m_bSANMapsReady, m_bSANMapsBuilding, m_bSANMapsIncomplete};
}

int ProviderAgent::BuildCimpleInfo()
{
    TVR_LOG(TVR_INFO, " Entering BuildCimpleInfo()");
    if (!m_bLoaded)
        TVR_LOG(TVR_DBG, "Tavrin Provider dependent library load has failed..do nothing is the only option");

    Auto_Mutex lock(m_ThreadMutex);
    if (!isTimeOut() && !m_bAdapterRefreshPending && !m_bSANRefreshPending)
    {
        TVR_LOG(TVR_DBG, "PERF: ---No timeout BuildCimpleInfo END---");
        return 0;
    }
    if (m_diagnosticsRunning > 0)
    {
        TVR_LOG(TVR_DBG, "Diagnostics is running.. Skip the internal refresh till it ends");
        return 0;
    }
    if (m_bThreadRunning)
    {
        TVR_LOG(TVR_DBG, "DataFetch_Handler thread already running-BuildCimpleInfo");
        return 0;
    }
    if (m_bFinished)
        return 0;
    m_bThreadRunning = true;
    refreshRecord.begin();
    if (m_bThreadJoinable)
    {
        TVR_LOG(TVR_DBG, "PERF: Clearing the previous thread...with join");
        void* value = nullptr;
        Thread::join(m_dataFetchThread, value);
        m_bThreadJoinable = false;
    }
    if (!m_bSANRefreshPending)
        m_bAdapterRefreshPending = true;
    takeDownIncomplete();
    // The new thread ends its run under m_ThreadMutex, so its handle is stored by then.
    const int error = Thread::create_joinable(m_dataFetchThread, &ProviderAgent::DataFetch_Handler, this);
    if (error != 0)
    {
        giveUpRefresh(error);
        return 0;
    }
    m_bThreadJoinable = true;
    TVR_LOG(TVR_DBG, "PERF: ---Created DataFetch_Handler thread -- BuildCimpleInfo END---");
    return 0;
}

/// Readers wait for the stages that are built anew because the last refresh left something out, or could not start.
void ProviderAgent::takeDownIncomplete()
{
    if (m_bAdapterMapsIncomplete)
    {
        m_bAdapterRefreshPending = true;
        for (const RefreshStage& stage : {adapterData(), adapterMaps()})
        {
            Auto_Mutex lock(stage.mutex);
            stage.ready = false;
        }
    }
    if (m_bSANMapsIncomplete)
    {
        m_bSANRefreshPending = true;
        Auto_Mutex lock(m_SANMapsReadyMutex);
        m_bSANMapsReady = false;
    }
}

/// Readers go on with what the maps hold. What is pending stays so: the next request tries again.
void ProviderAgent::giveUpRefresh(int error)
{
    TVR_LOG(TVR_ERR, "Could not create the DataFetch_Handler thread, error %d", error);
    m_bThreadRunning = false;
    refreshRecord.giveUp();
    for (const RefreshStage& stage : {adapterData(), adapterMaps(), sanMaps()})
    {
        Auto_Mutex lock(stage.mutex);
        if (stage.ready)
            continue;
        stage.incomplete = true;
        stage.complete();
    }
}

bool ProviderAgent::isTimeOut()
{
    TVR_LOG(TVR_DBG, "Checking if TimeOut...");
    const Datetime now = Datetime::now();
    TVR_LOG(TVR_DBG, "loadedtime = %s; currenttime = %s; cache timeout = %d", m_lastLoadTime.pretty().c_str(),
            now.pretty().c_str(), static_cast<int>(m_cacheTimeout.load()));

    // A clock that stepped backwards wraps to a huge age and counts as timed out.
    const std::uint64_t elapsed = now.usec() - m_lastLoadTime.usec();
    const std::uint32_t limit = m_cacheTimeout * static_cast<std::uint32_t>(Datetime::minute);
    if (elapsed >> 32 == 0 && static_cast<std::uint32_t>(elapsed) < limit)
    {
        TVR_LOG(TVR_DBG, "PERF: Refresh Not yet required");
        return false;
    }
    TVR_LOG(TVR_DBG, "PERF: TimeOut");
    return true;
}

void* ProviderAgent::DataFetch_Handler(void* arg)
{
    TVR_LOG(TVR_DBG, "PERF: DataFetch_Handler Thread BEGIN");
    if (auto* agent = static_cast<ProviderAgent*>(arg))
        agent->refresh();
    TVR_LOG(TVR_DBG, "PERF: DataFetch_Handler Thread END");
    return nullptr;
}

namespace
{

/// One stage of the refresh. What is thrown ends a part of it alone: the readers that wait are woken all the same.
class StageRun
{
public:
    template <class Work> void contain(const char* part, Work work)
    {
        _thrown |= !shielded(
            false, [&] { return work(), true; },
            [&](const char* what) { TVR_LOG(TVR_ERR, "Exception in the refresh of %s: %s", part, what); });
    }
    /// Whether all that the host has was built.
    bool isWhole() const { return !_thrown && left_out_for_memory == _leftOutBefore; }

private:
    const unsigned _leftOutBefore = left_out_for_memory;
    bool _thrown = false;
};

} // namespace

/// A reader of the fabric that came after its stage was passed found this thread running, and may be the last to come.
bool ProviderAgent::isFabricAwaited() const
{
    return m_bSANRefreshPending && !m_bSANMapsReady;
}

void ProviderAgent::refresh()
{
    if (m_bAdapterRefresh || m_bAdapterRefreshPending)
        adapterStage();
    if (m_bSANRefresh || m_bSANRefreshPending)
        sanStage();

    m_ThreadMutex.lock();
    while (isFabricAwaited())
    {
        m_ThreadMutex.unlock();
        sanStage();
        m_ThreadMutex.lock();
    }
    m_bThreadRunning = false;
    StageRun().contain("the time of the load", [&] { m_lastLoadTime = Datetime::now(); });
    refreshRecord.end();
    m_ThreadMutex.unlock();
}

/// A server may let one up-call through at a time. A reader that holds this channel, and waits in an up-call of its own
/// for a class whose maps are down, waits for this thread: so the broker is asked only while all maps that were ever
/// complete still answer. Otherwise the former answers stand. (SAN maps that were never complete have no instance that
/// an association could lead to.)
void ProviderAgent::askPlatform()
{
    const bool mapsAnswer = m_bAdapterMapsReady && (m_bSANMapsReady || !m_bSANMapsBuilt);
    if (!m_bLoaded || (m_bPlatformAsked && !mapsAnswer))
        return;
    m_bPlatformAsked = true;
    StageRun().contain("the platform", [&] { refreshSteps.askPlatform(*this); });
}

void ProviderAgent::adapterStage()
{
    TVR_LOG(TVR_DBG, "PERF: Building Adapter Data...");
    askPlatform();
    StageRun run;
    {
        Auto_Mutex lock(m_AdapterDataReadyMutex);
        m_bAdapterRefreshPending = false;
        m_bIsAdapterDataReady = false;
        m_bAdapterMapsReady = false;
        m_bAdapterDataBuilding = true;
        if (m_bLoaded)
        {
            Auto_Mutex dataLock(m_DataMutex);
            run.contain("the adapter data", [&] { m_pData->buildAdapterData(); });
        }
        adapterData().complete();
    }
    {
        Auto_Mutex lock(m_SANMapsReadyMutex);
        m_bSANMapsReady = false;
    }
    {
        Auto_Mutex lock(m_AdapterMapsReadyMutex);
        m_bAdapterMapsBuilding = true;
        if (m_bLoaded)
        {
            TVR_LOG(TVR_DBG, "PERF: Updating Adapter Maps...");
            Auto_Mutex dataLock(m_DataMutex);
            run.contain("the adapter maps", [&] { updateAdapterMaps(); });
        }
        m_bAdapterMapsIncomplete = !m_bLoaded || !run.isWhole();
        if (!run.isWhole())
            m_bAdapterRefreshPending = true; // the next request tries again
        adapterMaps().complete();
    }
}

void ProviderAgent::sanStage()
{
    Auto_Mutex adapterDataLock(m_AdapterDataReadyMutex);
    m_bSANRefreshPending = false;
    m_bSANMapsReady = false;
    StageRun run;
    adapterData().waitIfNotReady();
    if (m_bLoaded)
    {
        Auto_Mutex dataLock(m_DataMutex);
        TVR_LOG(TVR_DBG, "PERF: Building SAN Data...");
        run.contain("the SAN data", [&] { m_pData->buildSANData(); });
    }
    Auto_Mutex adapterMapsLock(m_AdapterMapsReadyMutex);
    adapterMaps().waitIfNotReady();
    Auto_Mutex sanMapsLock(m_SANMapsReadyMutex);
    m_bSANMapsBuilding = true;
    if (m_bLoaded)
    {
        Auto_Mutex dataLock(m_DataMutex);
        TVR_LOG(TVR_DBG, "PERF: Updating SAN Maps...");
        run.contain("the SAN maps", [&] { updateSANMaps(); });
    }
    // The ports that the SAN hangs on may be missing too.
    m_bSANMapsIncomplete = !m_bLoaded || !run.isWhole() || m_bAdapterMapsIncomplete;
    m_bSANRefreshPending = !run.isWhole(); // who asked meanwhile gets what was built
    sanMaps().complete();
    m_bSANMapsBuilt = true;
}

} // namespace cimple
