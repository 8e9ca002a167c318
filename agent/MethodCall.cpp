#include "agent/MethodCall.h"

#include "device/Loader.h"

namespace cimple
{

namespace
{

/// `name` is that of the stage's mutex in the log.
void awaitStage(const RefreshStage& stage, const char* name)
{
    Auto_Mutex lock(stage.mutex);
    if (stage.ready)
        return;
    TVR_LOG(TVR_DBG, "PERF: Waiting for %s", name);
    stage.waitIfNotReady();
    TVR_LOG(TVR_DBG, "PERF: Woken up from wait for %s", name);
}

} // namespace

MethodGuard::Ready::Ready(ProviderAgent& agent)
{
    agent.BuildCimpleInfo();
    awaitStage(agent.adapterData(), "m_AdapterDataReadyMutex");
    awaitStage(agent.adapterMaps(), "m_AdapterMapsReadyMutex");
}

MethodGuard::MethodGuard(ProviderAgent& agent) : _ready(agent), _dataLock(agent.m_DataMutex)
{
    if (!agent.hasEnded())
        resolveAbsentEntries(); // a library may have come since the start
}

MethodCall::MethodCall(const LogText& entry) : _agent(enter(entry)), _guard(_agent)
{
    endIfAgentHas();
}

ProviderAgent& MethodCall::enter(const LogText& entry)
{
    entry.log();
    return *ProviderAgent::instance();
}

void MethodCall::endIfAgentHas() const
{
    if (_agent.hasEnded())
        end({}, {methodFailed});
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
