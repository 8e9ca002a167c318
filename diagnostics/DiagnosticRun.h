// The diagnostic tests: a client runs one.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_FCHBADiagnosticTest.h"

namespace cimple
{

std::span<const MethodRow> diagnosticTestMethods();

template <class Form> struct Extended<TVRHBA_FCHBADiagnosticTest, Form> : Form
{
    static std::span<const MethodRow> methods() { return diagnosticTestMethods(); }
};

} // namespace cimple
