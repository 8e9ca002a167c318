#include "runtime/log/RuntimeLog.h"

#include "runtime/base/Immortal.h"
#include "runtime/base/RegularFile.h"
#include "runtime/base/TextLines.h"
#include "runtime/log/LogLine.h"
#include "runtime/values/Datetime.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <iterator>
#include <limits.h>
#include <mutex>
#include <optional>
#include <string_view>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>

namespace cimple
{

namespace
{

constexpr const char* level_names[] = {"FATAL", "ERR", "WARN", "INFO", "DBG"};
constexpr std::size_t config_size = 16 * 1024; // what is read of a file of a few lines
constexpr std::size_t config_line_size = 1024;

/// Opens once, on the first message, and stays open until the library or the process ends.
struct Log_State
{
    std::mutex mutex;
    std::once_flag started;
    std::atomic<int> level{LOG_FATAL};
    std::atomic<bool> open{false};
    std::atomic<pid_t> opener{0};
    File_Descriptor messages; // both behind the mutex
    File_Descriptor lock_file;
};

/// Outlives the threads, which may log while the process ends.
Log_State& state()
{
    static Immortal<Log_State> storage;
    return *storage;
}

int level_of(std::string_view name)
{
    for (std::size_t i = 0; i < std::size(level_names); ++i)
        if (name.size() == std::strlen(level_names[i]) && strncasecmp(level_names[i], name.data(), name.size()) == 0)
            return static_cast<int>(i);
    return -1;
}

/// Value of a "LOG_LEVEL = value" line; nothing for any other line.
std::optional<std::string_view> level_value(std::string_view line)
{
    constexpr std::string_view key = "LOG_LEVEL";
    if (!line.starts_with(key))
        return std::nullopt;
    line = trim(line.substr(key.size()));
    if (!line.starts_with('='))
        return std::nullopt;
    return trim(line.substr(1));
}

/// The level that the configuration asks for, or -1 when it is missing, silent or names none.
int configured_level(const char* home)
{
    char path[PATH_MAX];
    const int size = std::snprintf(path, sizeof path, "%s/%src", home, ".cimple");
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof path)
        return -1;
    const File_Descriptor file = open_regular(path, O_RDONLY);
    char content[config_size];
    const ssize_t count = file ? read_up_to(file.get(), content, sizeof content) : -1;
    if (count < 0)
        return -1;

    int level = -1;
    Line_Reader lines({content, static_cast<std::size_t>(count)});
    while (const auto line = lines.next(config_line_size))
        if (const auto value = level_value(*line))
            level = level_of(*value);
    return level;
}

/// A file in the log's folder, never through a link that someone else put there.
File_Descriptor open_in(int folder, const char* name, int flags, mode_t mode)
{
    return open_regular(name, flags | O_WRONLY | O_CREAT | O_NOFOLLOW, mode, folder);
}

/// Both or none.
bool open_files(Log_State& log, const char* home)
{
    char path[PATH_MAX];
    const int size = std::snprintf(path, sizeof path, "%s/%s", home, ".cimple");
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof path)
        return false;
    mkdir(path, 0777); // an existing one is fine, and a failure shows in the next line
    const File_Descriptor folder(open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder)
        return false;
    File_Descriptor lock_file = open_in(folder.get(), "messages.lock", 0, 0600);
    File_Descriptor messages = lock_file ? open_in(folder.get(), "messages", O_APPEND, 0644) : File_Descriptor();
    if (!messages)
        return false;
    log.lock_file = std::move(lock_file);
    log.messages = std::move(messages);
    return true;
}

void start(Log_State& log)
{
    const std::lock_guard guard(log.mutex);
    const char* home = secure_getenv("CIMPLE_HOME");
    if (!home)
        return;
    const int level = configured_level(home);
    if (level < 0 || !open_files(log, home))
        return;
    log.level = level;
    log.opener = getpid();
    log.open = true;
}

/// Gives back the log's files. What is logged from then on is dropped. A forked child leaves the files to its parent,
/// and their mutex alone: another thread may have held it at the fork.
void close_files(Log_State& log)
{
    if (log.opener != getpid())
        return;
    const std::lock_guard guard(log.mutex);
    log.open = false;
    log.messages = File_Descriptor();
    log.lock_file = File_Descriptor();
}

struct Log_End
{
    ~Log_End() { close_files(state()); }
};

/// Made before the module's other objects and so destroyed after them: their ends are logged, too.
[[gnu::init_priority(200)]] Log_End log_end;

/// Locks or unlocks the whole lock file.
void lock_between_processes(int file, short type)
{
    struct flock lock = {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    while (fcntl(file, F_SETLKW, &lock) == -1 && errno == EINTR)
    {}
}

/// The current time to the second.
class Time_Text
{
public:
    Time_Text() : _size(Datetime::pretty_now(_text)) {}
    std::string_view view() const
    {
        const std::string_view whole(_text, _size);
        return whole.substr(0, whole.find('.'));
    }

private:
    char _text[Datetime::text_room];
    std::size_t _size;
};

/// Writes a line with the lock file held: several broker processes may share one log.
void write_line(const Log_State& log, int level, const char* file, int line, const char* message)
{
    lock_between_processes(log.lock_file.get(), F_WRLCK);
    {
        Log_Line text(log.messages.get());
        text.append(Time_Text().view());
        text.appendf(" %s: %s(%d): ", level_names[level], file, line);
        if (!text.append_message(message))
            text.append("\n");
    }
    lock_between_processes(log.lock_file.get(), F_UNLCK);
}

} // namespace

void Runtime_Log::write(int level, const char* file, int line, const char* format, ...)
{
    Log_State& log = state();
    std::call_once(log.started, start, std::ref(log));
    if (!log.open.load(std::memory_order_acquire) || level < LOG_FATAL || level > LOG_DBG || level > log.level)
        return;

    std::va_list args;
    va_start(args, format);
    const Log_Message message(format, args);
    va_end(args);
    const std::lock_guard guard(log.mutex);
    if (log.messages)
        write_line(log, level, file, line, message.text());
}

int Runtime_Log::set_level(const char* name)
{
    const int level = level_of(name);
    if (level < 0)
        return -1;
    state().level = level;
    return 0;
}

int Runtime_Log::set_enabled(bool enabled)
{
    return _enabled.exchange(enabled) == enabled ? -1 : 0;
}

} // namespace cimple
