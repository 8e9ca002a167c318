#include "agent/MethodCall.h"

#include "device/Loader.h"

namespace cimple
{

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

MethodGuard::MethodGuard(ProviderAgent& agent) : _ready(agent), _dataLock(agent.m_DataMutex)
{
    resolveAbsentEntries(); // a library may have come since the start
}

ProviderAgent& MethodCall::enter(const LogText& entry)
{
    entry.log();
    return *ProviderAgent::instance();
}

void MethodCall::end(const LogText& why, const MethodEnd& with)
{
    why.log();
    throw with;
}

HBA_WWN MethodCall::wwpn(const String& deviceId, const ServiceTexts& texts)
{
    char name[TVR_MethodWrapper::hbaNameLength + 1];
    HBA_WWN wwpn;
    if (TVR_MethodWrapper::Id2HBAName(name, deviceId.c_str()) != 0)
        end(texts.noPlainName, texts.ofName);
    if (TVR_MethodWrapper::str2HBAName(&wwpn, name) != 0)
        end(texts.noWwn, texts.ofName);
    return wwpn;
}

} // namespace cimple
