// Diagnostic tests of ports, for people.
#pragma once

#include "broker/tvrcim/Commands.h"

namespace tvrcim
{

/// Runs the test that the command names on its port, waits for its end and reports it; without a test, lists the tests
/// and what each port can run. Throws TestFailure for a test that did not pass, MethodRefusal for one that did not run,
/// and Interruption for one that was cancelled by SIGINT.
void diagnose(Session& session, const Command& command);

} // namespace tvrcim
