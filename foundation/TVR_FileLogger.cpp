#include "foundation/TVR_FileLogger.h"

#include "foundation/FilePaths.h"
#include "foundation/LogDataFile.h"
#include "runtime/log/LogLine.h"
#include "runtime/values/Datetime.h"

#include <pthread.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <string_view>
#include <tuple>

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

/// Whether the text is the head of a line as logMessage() writes it.
bool beginsLikeALine(std::string_view text)
{
    constexpr std::string_view begin = "[threadid =";
    if (!text.starts_with(begin))
        return false;
    text.remove_prefix(begin.size());
    const std::size_t digits = std::min(text.find_first_not_of("0123456789"), text.size());
    return digits != 0 && text.substr(digits).starts_with("l] [");
}

/// Files that the module reads or keeps other things in, some of which may not be there yet.
constexpr FilePath otherFiles[] = {FilePath::ProviderConfig,  FilePath::WebLaunchConfig, FilePath::LogData,
                                   FilePath::LogDataFallback, FilePath::KernelVersion,   FilePath::OsDistribution,
                                   FilePath::SystemLog};

bool mayBeNamedByClient(const String& path)
{
    const auto isControl = [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; };
    const auto isPath = [&](FilePath file) { return isSameFile(path.c_str(), filePath(file).c_str()); };
    return path.view().starts_with('/') && std::ranges::none_of(path.view(), isControl) &&
           std::ranges::none_of(otherFiles, isPath);
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

int TVR_FileLogger::validateAndSetClientPath(const String& path)
{
    if (!fitsLogData(path.view()))
        return -1;
    const bool accepted =
        keepPath(path) || (mayBeNamedByClient(path) && setPath(path.c_str(), false, NamedBy::Client) == 0);
    TVR_Logger::instance().sinkChanged();
    return accepted ? 0 : -1;
}

bool TVR_FileLogger::keepPath(const String& path)
{
    Auto_Mutex lock(_mutex);
    if (!_file || path != _path)
        return false;
    _errorsOnly = false;
    return true;
}

int TVR_FileLogger::setPath(const char* path, bool errorsOnly, NamedBy namedBy)
{
    if (!path || !isWritableOrAbsent(path))
        return -1;
    const bool byClient = namedBy == NamedBy::Client;
    Appendable opened = openForAppending(path, byClient ? O_NOFOLLOW : 0);
    String accepted = path; // no memory for it: nothing has changed
    Auto_Mutex lock(_mutex);
    if (!opened.file)
        return -1;
    // Not under a path that was accepted before: a client may have named it, and others may since have put another
    // file under it. They may have done so before a start as well, but not where root alone leads the way.
    const bool mayBeForeign = !byClient && _path != path && opened.isRootsWay;
    const bool ours = isOurs(opened.file);
    if (!ours && !mayBeForeign && !isSame(opened.file, _file))
        return -1;
    _file = std::move(opened.file);
    _isOurs = ours;
    _path = std::move(accepted);
    _errorsOnly = errorsOnly;
    return 0;
}

/// The log that is open already, a file of this user that nobody has written to, or one that begins as a log does.
bool TVR_FileLogger::isOurs(const File_Descriptor& file) const
{
    struct stat status;
    if (fstat(file.get(), &status) != 0)
        return false;
    if (isSame(file, _file))
        return _isOurs;
    char head[64];
    const ssize_t size = pread(file.get(), head, sizeof head, 0);
    return status.st_uid == geteuid() && size >= 0 &&
           (size == 0 || beginsLikeALine({head, static_cast<std::size_t>(size)}));
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
    reopen();
    // One that may only be appended to is written on.
    if (_file && _isOurs)
        std::ignore = ftruncate(_file.get(), 0);
}

void TVR_FileLogger::reopen()
{
    File_Descriptor file;
    if (!_path.empty())
        file = openForAppending(_path.c_str()).file;
    const bool ours = file && isOurs(file);
    _file = ours || isSame(file, _file) ? std::move(file) : File_Descriptor();
    _isOurs = ours;
}

} // namespace cimple
