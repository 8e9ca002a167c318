// The module's settings and logs as the files of this machine say them.
#pragma once

#include "broker/tvrcim/Findings.h"

namespace tvrcim
{

/// Reads them, and asks what the user of this process may write.
Findings checkFiles();

} // namespace tvrcim
