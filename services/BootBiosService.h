// Boot code: a client enables and disables that of an adapter, and asks for its state.
#pragma once

#include "agent/ProviderExtension.h"
#include "foundation/Log.h"
#include "schema/TVRHBA_BootBIOSService.h"

namespace cimple
{

std::span<const MethodRow> bootBiosServiceMethods();

template <class Form> struct Extended<TVRHBA_BootBIOSService, Form> : Form
{
    int load()
    {
        TVR_LOG(TVR_DBG, "TVRHBA_BootBIOSService_Provider::load()");
        return Form::load();
    }
    static std::span<const MethodRow> methods() { return bootBiosServiceMethods(); }
};

} // namespace cimple
