#include "foundation/Log.h"

#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <memory>

namespace cimple
{

namespace
{

/// A formatted message of any length; short ones need no memory. One that finds no memory is cut.
class Message
{
public:
    Message(const char* format, va_list args)
    {
        va_list again;
        va_copy(again, args);
        const int size = std::vsnprintf(_short, sizeof _short, format, args);
        if (size < 0)
            _short[0] = '\0';
        else if (static_cast<std::size_t>(size) >= sizeof _short)
            formatLong(static_cast<std::size_t>(size), format, again);
        va_end(again);
    }
    const char* text() const { return _long ? _long.get() : _short; }

private:
    void formatLong(std::size_t size, const char* format, va_list args)
    {
        _long.reset(new (std::nothrow) char[size + 1]);
        if (_long)
            std::vsnprintf(_long.get(), size + 1, format, args);
    }

    char _short[1024];
    std::unique_ptr<char[]> _long;
};

/// Set while the thread is inside the sinks.
thread_local bool dispatching = false;

class Dispatching
{
public:
    Dispatching() { dispatching = true; }
    ~Dispatching() { dispatching = false; }
    Dispatching(const Dispatching&) = delete;
    Dispatching& operator=(const Dispatching&) = delete;
};

} // namespace

TVR_Logger& TVR_Logger::instance()
{
    // Never destroyed, since code logs to the last; nothing is left on the heap when the library is unmapped.
    union Storage
    {
        TVR_Logger logger;
        Storage() : logger() {}
        ~Storage() {}
    };
    static Storage storage;
    return storage.logger;
}

void TVR_Logger::log(const char* file, const unsigned* line, int level, const char* format, ...)
{
    if (dispatching)
        return;
    const int error = errno;
    va_list args;
    va_start(args, format);
    const Message message(format, args);
    va_end(args);
    if (_enabled == 0 && _sysLogger.load())
    {
        TVR_SysLogger::write(level, message.text());
    }
    else
    {
        Auto_Mutex lock(_mutex);
        const Dispatching mark;
        for (TVR_LoggerInterface* sink : _sinks)
            sink->logMessage(level, file, *line, message.text());
    }
    errno = error;
}

bool TVR_Logger::addSink(TVR_LoggerInterface* sink)
{
    Auto_Mutex lock(_mutex);
    if (std::find(_sinks.begin(), _sinks.end(), sink) != _sinks.end())
        return false;
    _sinks.push_back(sink);
    if (auto* sysLogger = dynamic_cast<TVR_SysLogger*>(sink))
        _sysLogger = sysLogger;
    return true;
}

bool TVR_Logger::removeSink(TVR_LoggerInterface* sink)
{
    Auto_Mutex lock(_mutex);
    const auto found = std::find(_sinks.begin(), _sinks.end(), sink);
    if (found == _sinks.end())
        return false;
    if (dynamic_cast<TVR_SysLogger*>(sink) == _sysLogger)
        _sysLogger = nullptr;
    _sinks.erase(found);
    if (_sinks.empty())
        _sinks.shrink_to_fit();
    return true;
}

void TVR_Logger::setMode(int mode)
{
    Auto_Mutex lock(_mutex);
    const Dispatching mark;
    _mode = mode;
    for (TVR_LoggerInterface* sink : _sinks)
        mode != 0 ? sink->start() : sink->stop();
}

void TVR_Logger::setLevel(int level)
{
    if (level > TVR_INVALID && level <= TVR_DBG)
        _level = level;
}

void TVR_Logger::clearAll()
{
    Auto_Mutex lock(_mutex);
    const Dispatching mark;
    for (TVR_LoggerInterface* sink : _sinks)
        sink->clearLog();
}

TVR_FileLogger* TVR_Logger::fileSink() const
{
    for (TVR_LoggerInterface* sink : _sinks)
        if (auto* fileLogger = dynamic_cast<TVR_FileLogger*>(sink))
            return fileLogger;
    return nullptr;
}

int startLogging(TVR_FileLogger& fileSink)
{
    TVR_Logger& logger = TVR_Logger::instance();
    logger.readDataFile();
    if (logger.dataFileAccessible())
    {
        TVR_LOG(TVR_CRIT, " Continuing logs in Tavrin log provider. ");
        return 0;
    }
    TVR_LOG(TVR_CRIT, " Please see the default log: %s", "/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log");
    logger.setFfdcMode();
    logger.enable();
    logger.setMode(2);
    const int status = fileSink.validateAndSetPath(filePath(FilePath::FfdcLog).c_str(), true);
    if (status != 0)
        TVR_LOG(TVR_ERR, "validateAndSetPath() failed");
    return status;
}

} // namespace cimple
