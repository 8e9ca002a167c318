// A signal handler that leaves a back trace in the system log. It is kept ready and not attached: a provider must not
// change the signal handling of the server that loads it.
#pragma once

#include <csignal>

namespace cimple
{

/// Fills `action` with the handler, SA_SIGINFO and an empty mask.
void fillSignalAction(struct sigaction& action);

} // namespace cimple
