// What a client changes of the provider itself: the settings of the cache.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_ProviderConfigSetting.h"

namespace cimple
{

/// Gives a setting the `current` of `instance`, at once; the settings file gets it when the agent ends. `model` is not
/// null in `current` where the client names it. The published ranges are not consulted: the settings have limits of
/// their own. A Provider_Status.
int modifySetting(const TVRHBA_ProviderConfigSetting* instance, const TVRHBA_ProviderConfigSetting* model);

template <class Form> struct Extended<TVRHBA_ProviderConfigSetting, Form> : Form
{
    int modify_instance(const Instance* instance, const Instance* model)
    {
        return modifySetting(static_cast<const TVRHBA_ProviderConfigSetting*>(instance),
                             static_cast<const TVRHBA_ProviderConfigSetting*>(model));
    }
};

} // namespace cimple
