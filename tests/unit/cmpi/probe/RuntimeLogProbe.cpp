// A library with a runtime log of its own.
#include "runtime/log/RuntimeLog.h"

extern "C" __attribute__((visibility("default"))) void logAMessage()
{
    RUNTIME_LOG(cimple::LOG_FATAL, "from the probe");
}
