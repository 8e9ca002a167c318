// Where foreign code may throw and nobody above can catch.
#pragma once

#include "runtime/log/RuntimeLog.h"

#include <cxxabi.h>
#include <exception>

namespace cimple
{

/// Result of `work`, or `failure` where it throws; `report(const char*)` is told what. The end of the thread passes
/// through: it is caught by a reference with no object behind it, which a sanitizer would take for a fault.
template <class Result, class Work, class Report>
__attribute__((noinline, no_sanitize("null"))) Result shielded(Result failure, Work work, Report report)
{
    try
    {
        return work();
    }
    catch (const abi::__forced_unwind&)
    {
        throw;
    }
    catch (const std::exception& error)
    {
        report(error.what());
    }
    catch (...)
    {
        report("of an unknown kind");
    }
    return failure;
}

/// The same, told to the runtime log.
template <class Result, class Work> Result shielded(Result failure, Work work)
{
    return shielded(failure, work, [](const char* what) { RUNTIME_LOG(LOG_ERR, "exception: %s", what); });
}

} // namespace cimple
