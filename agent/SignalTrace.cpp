#include "agent/SignalTrace.h"

#include <cstdlib>
#include <execinfo.h>
#include <syslog.h>

namespace cimple
{

namespace
{

constexpr int maxFrames = 16;

void traceSignal(int, siginfo_t*, void*)
{
    syslog(LOG_INFO, "Signal in CIM Provider");
    syslog(LOG_INFO, "Back Trace Execution Path:");
    void* frames[maxFrames];
    const int count = backtrace(frames, maxFrames);
    char** symbols = backtrace_symbols(frames, count);
    for (int i = 0; symbols && i < count; i++)
        syslog(LOG_INFO, "Trace message [bt] %s", symbols[i]);
    exit(1);
}

} // namespace

void fillSignalAction(struct sigaction& action)
{
    action = {};
    action.sa_sigaction = &traceSignal;
    action.sa_flags = SA_SIGINFO;
    sigemptyset(&action.sa_mask);
}

} // namespace cimple
