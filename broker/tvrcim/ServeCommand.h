// The tool as a CIM server for one host.
#pragma once

#include "broker/tvrcim/Commands.h"

namespace tvrcim
{

/// Says where it listens, and answers until SIGINT.
void serve(Session& session, const Command& command);

} // namespace tvrcim
