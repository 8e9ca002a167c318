// The runtime's own small log, apart from the product log: operation traces and conversion warnings.
//
// It is configured by $CIMPLE_HOME/.cimplerc (a line such as "LOG_LEVEL = DBG") and written to
// $CIMPLE_HOME/.cimple/messages. Without the variable, the file or a valid level it stays closed for the life of
// the process, and nothing is created on disk.
#pragma once

#include "runtime/base/Assert.h"

#include <atomic>

namespace cimple
{

enum Runtime_Log_Level : int
{
    LOG_FATAL = 0,
    LOG_ERR = 1,
    LOG_WARN = 2,
    LOG_INFO = 3,
    LOG_DBG = 4,
};

class Runtime_Log
{
public:
    /// Writes when the log is open and `level` is at or below the log's level. Never fails and never throws.
    static void write(int level, const char* file, int line, const char* format, ...)
        __attribute__((format(printf, 4, 5)));

    /// Sets the level by its name, in any case; -1 for an unknown name.
    static int set_level(const char* name);

    /// The process-wide switch that RUNTIME_LOG tests before it formats; on at start. Returns 0, or -1 when
    /// the switch stands so already.
    static int set_enabled(bool enabled);
    static bool enabled() { return _enabled.load(std::memory_order_relaxed); }

private:
    static inline std::atomic<bool> _enabled{true};
};

} // namespace cimple

/// An expression of type void.
#define RUNTIME_LOG(level, ...) RUNTIME_LOG_AT(level, ::cimple::base_name(__FILE__), __LINE__, __VA_ARGS__)

/// The same for a place other than that of the call.
#define RUNTIME_LOG_AT(level, file, line, ...)                                                                         \
    (::cimple::Runtime_Log::enabled() ? ::cimple::Runtime_Log::write(level, file, line, __VA_ARGS__)                   \
                                      : static_cast<void>(0))
