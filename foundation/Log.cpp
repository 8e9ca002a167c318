#include "foundation/Log.h"

#include "foundation/HostInformation.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"
#include "runtime/base/Immortal.h"
#include "runtime/log/LogLine.h"

#include <cerrno>
#include <cstdarg>
#include <utility>

namespace cimple
{

namespace
{

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
    static Immortal<TVR_Logger> logger; // code logs to the last
    return *logger;
}

bool TVR_Logger::wants(int level) const
{
    const unsigned taken = isForSystemLog() ? TVR_SysLogger::levels : _taken.load();
    return (taken & levelBit(level)) != 0;
}

void TVR_Logger::log(const char* file, const unsigned* line, int level, const char* format, ...)
{
    if (dispatching || !wants(level))
        return;
    const int error = errno;
    va_list args;
    va_start(args, format);
    const Log_Message message(format, args);
    va_end(args);
    if (isForSystemLog())
    {
        TVR_SysLogger::write(level, message.text());
    }
    else
    {
        Auto_Mutex lock(_mutex);
        const Dispatching mark;
        for (TVR_LoggerInterface* sink = _sinks; sink; sink = sink->_next)
            sink->logMessage(level, file, *line, message.text());
    }
    errno = error;
}

TVR_LoggerInterface** TVR_Logger::findSink(TVR_LoggerInterface* sink)
{
    TVR_LoggerInterface** link = &_sinks;
    while (*link && *link != sink)
        link = &(*link)->_next;
    return link;
}

bool TVR_Logger::addSink(TVR_LoggerInterface* sink)
{
    Auto_Mutex lock(_mutex);
    TVR_LoggerInterface** const link = findSink(sink);
    if (*link)
        return false;
    *link = sink;
    if (auto* sysLogger = dynamic_cast<TVR_SysLogger*>(sink))
        _sysLogger = sysLogger;
    askSinks();
    return true;
}

bool TVR_Logger::removeSink(TVR_LoggerInterface* sink)
{
    Auto_Mutex lock(_mutex);
    TVR_LoggerInterface** const link = findSink(sink);
    if (!*link)
        return false;
    if (dynamic_cast<TVR_SysLogger*>(sink) == _sysLogger)
        _sysLogger = nullptr;
    *link = std::exchange(sink->_next, nullptr);
    askSinks();
    return true;
}

void TVR_Logger::sinkChanged()
{
    Auto_Mutex lock(_mutex);
    askSinks();
}

void TVR_Logger::askSinks()
{
    unsigned taken = 0;
    for (const TVR_LoggerInterface* sink = _sinks; sink; sink = sink->_next)
        taken |= sink->takes();
    _taken = taken;
}

void TVR_Logger::setMode(int mode)
{
    Auto_Mutex lock(_mutex);
    const Dispatching mark;
    _mode = mode;
    for (TVR_LoggerInterface* sink = _sinks; sink; sink = sink->_next)
        mode != 0 ? sink->start() : sink->stop();
    askSinks();
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
    for (TVR_LoggerInterface* sink = _sinks; sink; sink = sink->_next)
        sink->clearLog();
    askSinks();
}

void TVR_Logger::finish()
{
    setMode(0);
    _level = 0;
    _enabled = 0;
    _ffdcMode = false;
    _dataPathResolved = false;
    _dataFile = FilePath::LogData;
}

TVR_FileLogger* TVR_Logger::fileSink() const
{
    for (TVR_LoggerInterface* sink = _sinks; sink; sink = sink->_next)
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

void finishLogging()
{
    TVR_Logger::instance().finish();
    forgetRootFileSystem();
}

} // namespace cimple
