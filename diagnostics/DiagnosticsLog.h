// The logs of the diagnostic tests: a client clears one.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_DiagnosticsLog.h"

namespace cimple
{

std::span<const MethodRow> diagnosticsLogMethods();

template <class Form> struct Extended<TVRHBA_DiagnosticsLog, Form> : Form
{
    static std::span<const MethodRow> methods() { return diagnosticsLogMethods(); }
};

} // namespace cimple
