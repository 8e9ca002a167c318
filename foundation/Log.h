// The product log: one process-wide dispatcher and its sinks. Every message of the module goes through TVR_LOG.
#pragma once

#include "foundation/FilePaths.h"
#include "runtime/Thread.h"

#include <atomic>
#include <cstdint>
#include <string>
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

/// Which sinks work in a log mode. Mode 0 stops all; mode 3 is accepted and stored, and no sink reacts to it.
constexpr bool modeWritesFile(int mode)
{
    return mode == 2 || mode == 4;
}
constexpr bool modeWritesRing(int mode)
{
    return mode == 1 || mode == 4;
}

/// A destination of log messages. The logger calls it under its mutex, one call at a time; it must not log itself.
class TVR_LoggerInterface
{
public:
    virtual ~TVR_LoggerInterface() = default;
    virtual void logMessage(int level, const char* file, unsigned line, const char* message) = 0;
    virtual void start() = 0;    ///< a non-zero mode was set
    virtual void stop() = 0;     ///< mode 0 was set
    virtual void clearLog() = 0; ///< empty the log
};

class TVR_FileLogger;
class TVR_SysLogger;

/// All operations may be called from any thread; none but log() from within a sink.
class TVR_Logger
{
public:
    /// Made on first use, never destroyed.
    static TVR_Logger& instance();

    /// Formats once and hands the text to the sinks, to the system log's alone while logging is disabled. `line` is
    /// the source line, by address. Keeps errno. What a sink logs is dropped.
    void log(const char* file, const unsigned* line, int level, const char* format, ...)
        __attribute__((format(printf, 5, 6)));

    /// The sink stays its owner's. False if it is registered already.
    bool addSink(TVR_LoggerInterface* sink);
    /// False if it is not registered. After the return no call is inside the sink.
    bool removeSink(TVR_LoggerInterface* sink);

    /// Stores any mode, then starts the sinks, or stops them for mode 0.
    void setMode(int mode);
    int getMode() const { return _mode; }
    /// Takes 1 to 5 and ignores the rest. No sink filters by it: it is kept for clients.
    void setLevel(int level);
    int getLevel() const { return _level; }

    void enable() { _enabled = 1; }
    void disable() { _enabled = 0; }
    bool isEnabled() const { return _enabled != 0; }

    /// First-failure mode: log files that the data file names are opened for errors only.
    void setFfdcMode() { _ffdcMode = true; }
    void clearFfdcMode() { _ffdcMode = false; }
    bool isFfdcMode() const { return _ffdcMode; }

    /// Empties every sink.
    void clearAll();

    // --- the data file, which keeps the parameters across reloads of the module (LogDataFile.cpp)

    bool dataFileAccessible();
    /// Applies what the file says. On any fault mode and level stay as they are.
    void readDataFile();
    void writeDataFile();

private:
    TVR_Logger() = default;

    /// The first file sink; the mutex is held.
    TVR_FileLogger* fileSink() const;
    void resolveDataPath();
    /// The path of the data file, chosen at first need.
    std::string dataPath();

    std::atomic<std::int32_t> _mode{0};
    std::atomic<std::int32_t> _level{0};
    std::atomic<std::int32_t> _enabled{0};
    std::atomic<bool> _ffdcMode{false};
    std::atomic<bool> _dataPathResolved{false};
    std::atomic<FilePath> _dataFile{FilePath::LogData};
    std::atomic<TVR_SysLogger*> _sysLogger{nullptr};
    std::vector<TVR_LoggerInterface*> _sinks;
    Mutex _mutex; ///< guards _sinks and serialises the calls into them
};

/// Brings logging up once the sinks exist: applies the data file, or without a readable one falls back to an
/// errors-only log of first failures. Non-zero if that cannot be opened either.
int startLogging(TVR_FileLogger& fileSink);

/// Address of a temporary that lives to the end of the full expression.
inline const unsigned* lineAddress(const unsigned& line)
{
    return &line;
}

} // namespace cimple

/// An expression, so that a failure path reads `return TVR_LOG(TVR_ERR, "..."), status;`.
#define TVR_LOG(level, ...)                                                                                            \
    ::cimple::TVR_Logger::instance().log(__FILE_NAME__, ::cimple::lineAddress(__LINE__), level, __VA_ARGS__)
