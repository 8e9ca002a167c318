// The record logs: a client steers, clears, enables and disables them, and with them the module's own logging.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_RecordLog.h"

namespace cimple
{

std::span<const MethodRow> recordLogMethods();

template <class Form> struct Extended<TVRHBA_RecordLog, Form> : Form
{
    static std::span<const MethodRow> methods() { return recordLogMethods(); }
};

} // namespace cimple
