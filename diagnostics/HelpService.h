// The help of the diagnostic tests: a client reads what a test does.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_HelpService.h"

namespace cimple
{

std::span<const MethodRow> helpServiceMethods();

template <class Form> struct Extended<TVRHBA_HelpService, Form> : Form
{
    static std::span<const MethodRow> methods() { return helpServiceMethods(); }
};

} // namespace cimple
