// The product log: one process-wide dispatcher and its sinks. Every message of the module goes through TVR_LOG.
#pragma once

#include "runtime/Datetime.h"
#include "runtime/String.h"
#include "runtime/Thread.h"

#include <atomic>
#include <vector>

namespace cimple
{

/// Levels of TVR_Logger::log(). What each is for: docs/logging.md.
enum TVR_Level : int
{
    TVR_INVALID = 0,
    TVR_CRIT = 1,
    TVR_WARN = 2,
    TVR_ERR = 3,
    TVR_INFO = 4,
    TVR_DBG = 5,
};

/// A destination of log messages. Calls of logMessage() are serialised by the logger.
class TVR_LoggerInterface
{
public:
    virtual ~TVR_LoggerInterface() = default;
    virtual void logMessage(int level, const char* file, unsigned line, const char* message) = 0;
    virtual void start() = 0;    ///< a non-zero mode was set
    virtual void stop() = 0;     ///< mode 0 was set
    virtual void clearLog() = 0; ///< empty the log
};

class TVR_Logger
{
public:
    /// Made on first use, never destroyed.
    static TVR_Logger& instance();

    /// Formats once and hands the text to the sinks. `line` is the source line, by address.
    void log(const char* file, const unsigned* line, int level, const char* format, ...)
        __attribute__((format(printf, 5, 6)));

    // foundation/Log.h continues with sinks, modes and the data file: see the owner of this folder.
};

/// Address of a temporary that lives to the end of the full expression.
inline const unsigned* lineAddress(const unsigned& line)
{
    return &line;
}

} // namespace cimple

/// An expression, so that a failure path reads `return TVR_LOG(TVR_ERR, "..."), status;`.
#define TVR_LOG(level, ...)                                                                                            \
    ::cimple::TVR_Logger::instance().log(__FILE_NAME__, ::cimple::lineAddress(__LINE__), level, __VA_ARGS__)
