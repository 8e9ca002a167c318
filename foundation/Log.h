// The product log: one process-wide dispatcher and its sinks. Every message of the module goes through TVR_LOG.
#pragma once

#include "foundation/FilePaths.h"
#include "runtime/threads/Thread.h"

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <string>

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

/// Sets of levels are bits: one for all levels of 0 and below, one for each of 1 to 5, one for all above.
constexpr unsigned levelBit(int level)
{
    return 1u << std::clamp<int>(level, TVR_INVALID, TVR_DBG + 1);
}
constexpr unsigned levelsUpTo(int level)
{
    return 2 * levelBit(level) - 1;
}
inline constexpr unsigned allLevels = levelsUpTo(TVR_DBG + 1);

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
    /// The levels of which it takes messages in its present state. The logger asks after each of the calls above but
    /// logMessage(); a sink that comes to take more at another time says so with TVR_Logger::sinkChanged().
    virtual unsigned takes() const { return allLevels; }

private:
    friend class TVR_Logger;
    TVR_LoggerInterface* _next = nullptr; ///< in the logger's list
};

template <class T> class Immortal;
class TVR_FileLogger;
class TVR_SysLogger;

/// All operations may be called from any thread; none but log() from within a sink.
class TVR_Logger
{
public:
    /// Made on first use, never destroyed.
    static TVR_Logger& instance();

    /// True if some sink would take a message of the level now; while logging is disabled, if the system log's would.
    bool wants(int level) const;

    /// Formats once and hands the text to the sinks, to the system log's alone while logging is disabled; what none
    /// would take is not formatted. `line` is the source line, by address. Keeps errno, throws nothing and needs no
    /// memory: without it a message of more than 1,023 bytes is cut. What a sink logs is dropped.
    void log(const char* file, const unsigned* line, int level, const char* format, ...)
        __attribute__((format(printf, 5, 6)));

    /// The sink stays its owner's. False if it is registered already. Needs no memory.
    bool addSink(TVR_LoggerInterface* sink);
    /// False if it is not registered. After the return no call is inside the sink.
    bool removeSink(TVR_LoggerInterface* sink);
    /// Asks the sinks anew what they take.
    void sinkChanged();

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

    /// Stops the sinks and goes back to the state of a logger that was never used; the sinks stay registered.
    void finish();

    // --- the data file, which keeps the parameters across reloads of the module (LogDataFile.cpp)

    bool dataFileAccessible();
    /// Applies what the file says. On any fault mode and level stay as they are.
    void readDataFile();
    /// False on a fault: the file stays as it is.
    bool writeDataFile();

private:
    friend class Immortal<TVR_Logger>;
    TVR_Logger() = default;

    /// While logging is disabled, the system log's sink hears alone.
    bool isForSystemLog() const { return _enabled == 0 && _sysLogger.load(); }
    // The mutex is held.
    TVR_LoggerInterface** findSink(TVR_LoggerInterface* sink); ///< the link to it, or the list's end
    TVR_FileLogger* fileSink() const;                          ///< the first
    void askSinks();

    void resolveDataPath();
    /// The path of the data file, chosen at first need.
    std::string dataPath();
    std::string dataText();

    std::atomic<std::int32_t> _mode{0};
    std::atomic<std::int32_t> _level{0};
    std::atomic<std::int32_t> _enabled{0};
    std::atomic<bool> _ffdcMode{false};
    std::atomic<bool> _dataPathResolved{false};
    std::atomic<FilePath> _dataFile{FilePath::LogData};
    std::atomic<TVR_SysLogger*> _sysLogger{nullptr};
    std::atomic<unsigned> _taken{0}; ///< levels that some sink takes
    TVR_LoggerInterface* _sinks = nullptr;
    Mutex _mutex; ///< guards _sinks and serialises the calls into them
};

/// Brings logging up once the sinks exist: applies the data file, or without a readable one falls back to an
/// errors-only log of first failures. Non-zero if that cannot be opened either.
int startLogging(TVR_FileLogger& fileSink);
/// Takes logging down at the very end, before the sinks go: files are closed, and a later start in the same process
/// finds everything as the first one did. What is logged afterwards reaches nobody.
void finishLogging();

/// Address of a temporary that lives to the end of the full expression.
inline const unsigned* lineAddress(const unsigned& line)
{
    return &line;
}

} // namespace cimple

/// An expression of type void. What no sink takes costs a look at the level: the arguments are not evaluated.
#define TVR_LOG(level, ...)                                                                                            \
    (::cimple::TVR_Logger::instance().wants(level)                                                                     \
         ? ::cimple::TVR_Logger::instance().log(__FILE_NAME__, ::cimple::lineAddress(__LINE__), level, __VA_ARGS__)    \
         : static_cast<void>(0))
