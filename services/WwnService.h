// World Wide Names: a client changes, restores and reads those of a port.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_FCHBAWWNService.h"

namespace cimple
{

std::span<const MethodRow> wwnServiceMethods();

template <class Form> struct Extended<TVRHBA_FCHBAWWNService, Form> : Form
{
    static std::span<const MethodRow> methods() { return wwnServiceMethods(); }
};

} // namespace cimple
