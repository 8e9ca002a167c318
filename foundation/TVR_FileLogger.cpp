#include "foundation/TVR_FileLogger.h"

#include "runtime/log/LogLine.h"
#include "runtime/values/Datetime.h"

#include <pthread.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>

namespace cimple
{

namespace
{

const char* levelText(int level)
{
    static constexpr const char* texts[] = {"TVR_INVALID", "TVR_CRIT", "TVR_WARN", "TVR_ERR", "TVR_INFO", "TVR_DBG"};
    return texts[std::max<int>(level, TVR_INVALID)];
}

/// True for a path that may be opened for writing: not there yet, or there with the owner's write bit.
bool isWritableOrAbsent(const char* path)
{
    struct stat status;
    if (stat(path, &status) != 0)
        return errno == ENOENT;
    return (status.st_mode & S_IWUSR) != 0;
}

} // namespace

TVR_FileLogger::TVR_FileLogger()
{
    TVR_Logger::instance().addSink(this);
}

TVR_FileLogger::~TVR_FileLogger()
{
    TVR_Logger::instance().removeSink(this);
}

int TVR_FileLogger::validateAndSetPath(const char* path, bool errorsOnly)
{
    const int status = setPath(path, errorsOnly);
    TVR_Logger::instance().sinkChanged();
    return status;
}

int TVR_FileLogger::setPath(const char* path, bool errorsOnly)
{
    if (!path || !isWritableOrAbsent(path))
        return -1;
    File_Descriptor file = openForWriting(path, WriteMode::Append);
    if (!file)
        return -1;
    Auto_Mutex lock(_mutex);
    _file = std::move(file);
    _path = path;
    _errorsOnly = errorsOnly;
    return 0;
}

String TVR_FileLogger::getPath() const
{
    Auto_Mutex lock(_mutex);
    return _path;
}

unsigned TVR_FileLogger::takes() const
{
    Auto_Mutex lock(_mutex);
    return levels();
}

unsigned TVR_FileLogger::levels() const
{
    if (!_file || !modeWritesFile(TVR_Logger::instance().getMode()))
        return 0;
    return _errorsOnly ? levelBit(TVR_CRIT) | levelBit(TVR_ERR) : levelsUpTo(TVR_DBG);
}

void TVR_FileLogger::logMessage(int level, const char* file, unsigned line, const char* message)
{
    Auto_Mutex lock(_mutex);
    if ((levels() & levelBit(level)) == 0)
        return;
    char time[Datetime::text_room];
    Datetime::pretty_now(time);
    Log_Line text(_file.get());
    // The letter after %u is text: readers of the log know it so.
    text.appendf("[threadid =%ul] [%s] [", static_cast<unsigned>(pthread_self()), time);
    text.append(file);
    text.appendf(":%u][%s] ", line, levelText(level));
    text.append_message(message);
    text.append("\n");
}

void TVR_FileLogger::start()
{
    if (!modeWritesFile(TVR_Logger::instance().getMode()))
        return;
    Auto_Mutex lock(_mutex);
    reopen();
}

void TVR_FileLogger::stop()
{
    Auto_Mutex lock(_mutex);
    if (!_file)
        return;
    _file = File_Descriptor();
    _path.clear();
}

void TVR_FileLogger::clearLog()
{
    Auto_Mutex lock(_mutex);
    _file = File_Descriptor();
    if (!_path.empty())
        openForWriting(_path.c_str(), WriteMode::Truncate);
    reopen();
}

void TVR_FileLogger::reopen()
{
    _file = File_Descriptor();
    if (!_path.empty())
        _file = openForWriting(_path.c_str(), WriteMode::Append);
}

} // namespace cimple
