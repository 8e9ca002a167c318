#include "services/ProviderSettings.h"

#include "agent/MethodCall.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

namespace
{

constexpr MethodEnd invalid = {0, MODIFY_INSTANCE_INVALID_PARAMETER};
constexpr MethodEnd notThere = {0, MODIFY_INSTANCE_FAILED};

/// What becomes of a new value.
struct SettingAction
{
    int (TvrConfigFile::*store)(unsigned value); ///< not 0 for a value that it refuses
    void (*use)(ProviderAgent& agent, std::uint32_t value);
    LogText done;
    LogText refused;
};

/// In the order of the settings in their map.
constexpr SettingAction actions[] = {
    {&TvrConfigFile::setCacheTimeout,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_cacheTimeout = value; },
     {TVR_WARN, "Cache time-out is modified successfully"},
     {TVR_ERR, "The value provided for cache time-out is out of range"}},
    {&TvrConfigFile::setRefreshAdapterData,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_bAdapterRefresh = value != 0; },
     {TVR_WARN, "Adapter refresh is modified successfully"},
     {TVR_ERR, "The value provided for adapter refresh out is out of range"}},
    {&TvrConfigFile::setRefreshSANData,
     [](ProviderAgent& agent, std::uint32_t value) { agent.m_bSANRefresh = value != 0; },
     {TVR_WARN, "SAN refresh is modified successfully"},
     {TVR_ERR, "The value provided for SAN refresh out is out of range"}},
};

void apply(ProviderAgent& agent, const SettingAction& action, const Property<std::uint32_t>& wanted)
{
    if (wanted.null || (agent.m_config.*action.store)(wanted.value) != 0)
        MethodCall::end(action.refused, invalid);
    action.use(agent, wanted.value);
    action.done.log();
}

} // namespace

int modifySetting(const TVRHBA_ProviderConfigSetting* instance, const TVRHBA_ProviderConfigSetting* model)
{
    MethodCall call({TVR_DBG, "TVRHBA_ProviderConfigSetting_Provider::modify_instance()"});
    if (!instance || !model)
        MethodCall::end({TVR_ERR, "TVRHBA_ProviderConfigSetting_Provider::modify_instance invalid parameter"}, invalid);
    const auto settings = mapOf<TVRHBA_ProviderConfigSetting>(call.agent());
    TVRHBA_ProviderConfigSetting* setting = model->current.null ? nullptr : settings.withKeysOf(instance);
    if (!setting)
        MethodCall::end({TVR_ERR, "Instance does not exist"}, notThere);
    for (std::size_t i = 0; i < std::size(actions); i++)
        if (settings.at(i) == setting)
            apply(call.agent(), actions[i], instance->current);
    setting->current = instance->current;
    return 0;
}

} // namespace cimple
