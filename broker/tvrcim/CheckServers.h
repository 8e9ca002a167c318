// The CIM servers of this machine.
#pragma once

#include "broker/tvrcim/Findings.h"

namespace tvrcim
{

/// Asks the script that registers the module in them.
Findings checkServers();

} // namespace tvrcim
