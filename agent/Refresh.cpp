// The refresh: who starts it, and the thread that rebuilds device data and maps.
#include "agent/ProviderAgent.h"
#include "foundation/Log.h"

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
    return {m_AdapterDataReadyMutex, m_AdapterDataReadyCond, m_bIsAdapterDataReady, m_bAdapterDataBuilding};
}

RefreshStage ProviderAgent::adapterMaps()
{
    return {m_AdapterMapsReadyMutex, m_AdapterMapsReadyCond, m_bAdapterMapsReady, m_bAdapterMapsBuilding};
}

RefreshStage ProviderAgent::sanMaps()
{
    return {m_SANMapsReadyMutex, m_SANMapsReadyCond, m_bSANMapsReady, m_bSANMapsBuilding};
}

int ProviderAgent::BuildCimpleInfo()
{
    TVR_LOG(TVR_INFO, " Entering BuildCimpleInfo()");
    if (!m_bLoaded)
        TVR_LOG(TVR_DBG, "Tavrin Provider dependent library load has failed..do nothing is the only option");

    Auto_Mutex lock(m_ThreadMutex);
    if (!isTimeOut() && !m_bAdapterRefreshPending && !m_bSANRefreshPending)
        return TVR_LOG(TVR_DBG, "PERF: ---No timeout BuildCimpleInfo END---"), 0;
    if (m_bDiagnosticsRunning)
        return TVR_LOG(TVR_DBG, "Diagnostics is running.. Skip the internal refresh till it ends"), 0;
    if (m_bThreadRunning)
        return TVR_LOG(TVR_DBG, "DataFetch_Handler thread already running-BuildCimpleInfo"), 0;
    if (m_bFinished)
        return 0;
    m_bThreadRunning = true;
    if (!(m_lastLoadTime == Datetime()))
    {
        TVR_LOG(TVR_DBG, "PERF: Clearing the previous thread...with join");
        void* value = nullptr;
        Thread::join(m_dataFetchThread, value);
    }
    if (!m_bSANRefreshPending)
        m_bAdapterRefreshPending = true;
    // The new thread ends its run under m_ThreadMutex, so its handle is stored by then.
    m_bThreadJoinable = Thread::create_joinable(m_dataFetchThread, &ProviderAgent::DataFetch_Handler, this) == 0;
    TVR_LOG(TVR_DBG, "PERF: ---Created DataFetch_Handler thread -- BuildCimpleInfo END---");
    return 0;
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
        return TVR_LOG(TVR_DBG, "PERF: Refresh Not yet required"), false;
    return TVR_LOG(TVR_DBG, "PERF: TimeOut"), true;
}

void* ProviderAgent::DataFetch_Handler(void* arg)
{
    TVR_LOG(TVR_DBG, "PERF: DataFetch_Handler Thread BEGIN");
    if (auto* agent = static_cast<ProviderAgent*>(arg))
        agent->refresh();
    TVR_LOG(TVR_DBG, "PERF: DataFetch_Handler Thread END");
    return nullptr;
}

void ProviderAgent::refresh()
{
    if (m_bAdapterRefresh || m_bAdapterRefreshPending)
        adapterStage();
    if (m_bSANRefresh || m_bSANRefreshPending)
        sanStage();

    Auto_Mutex lock(m_ThreadMutex);
    m_bThreadRunning = false;
    m_lastLoadTime = Datetime::now();
}

void ProviderAgent::adapterStage()
{
    TVR_LOG(TVR_DBG, "PERF: Building Adapter Data...");
    {
        Auto_Mutex lock(m_AdapterDataReadyMutex);
        m_bAdapterRefreshPending = false;
        m_bIsAdapterDataReady = false;
        m_bAdapterMapsReady = false;
        m_bAdapterDataBuilding = true;
        if (m_bLoaded)
        {
            Auto_Mutex dataLock(m_DataMutex);
            m_pData->buildAdapterData();
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
            updateAdapterMaps();
        }
        adapterMaps().complete();
    }
}

void ProviderAgent::sanStage()
{
    Auto_Mutex adapterDataLock(m_AdapterDataReadyMutex);
    m_bSANRefreshPending = false;
    m_bSANMapsReady = false;
    adapterData().waitIfNotReady();
    if (m_bLoaded)
    {
        Auto_Mutex dataLock(m_DataMutex);
        TVR_LOG(TVR_DBG, "PERF: Building SAN Data...");
        m_pData->buildSANData();
    }
    Auto_Mutex adapterMapsLock(m_AdapterMapsReadyMutex);
    adapterMaps().waitIfNotReady();
    Auto_Mutex sanMapsLock(m_SANMapsReadyMutex);
    m_bSANMapsBuilding = true;
    if (m_bLoaded)
    {
        Auto_Mutex dataLock(m_DataMutex);
        TVR_LOG(TVR_DBG, "PERF: Updating SAN Maps...");
        updateSANMaps();
    }
    sanMaps().complete();
}

} // namespace cimple
