// What of all that the provider needs is on this machine.
#pragma once

#include "broker/tvrcim/CommandLine.h"
#include "broker/tvrcim/SignalEnd.h"

#include <ostream>

namespace tvrcim
{

/// Looks at libraries, module, adapters, settings, logs and CIM servers, prints what it finds and what to do, and
/// returns 0 or exitIncomplete. Unlike the other commands it takes a module that cannot be opened for an answer.
int checkHost(const Settings& settings, SignalEnd& signals, std::ostream& out, bool colour);

} // namespace tvrcim
