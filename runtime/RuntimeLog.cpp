#include "runtime/RuntimeLog.h"

#include "runtime/Buffer.h"
#include "runtime/Datetime.h"
#include "runtime/Meta.h"

#include <cctype>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <iterator>
#include <limits.h>
#include <mutex>
#include <sys/stat.h>
#include <unistd.h>

namespace cimple
{

namespace
{

constexpr const char* level_names[] = {"FATAL", "ERR", "WARN", "INFO", "DBG"};
constexpr std::size_t config_line_size = 1024;

/// Opens once, on the first message, and stays open to the end of the process.
struct Log_State
{
    std::mutex mutex;
    std::once_flag started;
    std::atomic<int> level{LOG_FATAL};
    std::atomic<bool> open{false};
    std::FILE* stream = nullptr; // both behind the mutex
    int lock_file = -1;
};

/// Never destroyed: threads may log while the process ends. Not on the heap, where an unmapped library would leave it.
Log_State& state()
{
    union Storage
    {
        Log_State state;
        Storage() : state() {}
        ~Storage() {}
    };
    static Storage storage;
    return storage.state;
}

int level_of(const char* name)
{
    for (std::size_t i = 0; i < std::size(level_names); ++i)
        if (eqi(level_names[i], name))
            return static_cast<int>(i);
    return -1;
}

char* skip_space(char* text)
{
    while (std::isspace(static_cast<unsigned char>(*text)))
        ++text;
    return text;
}

void strip_trailing_space(char* text)
{
    std::size_t size = std::strlen(text);
    while (size && std::isspace(static_cast<unsigned char>(text[size - 1])))
        text[--size] = '\0';
}

/// Value of a "LOG_LEVEL = value" line; null for any other line.
const char* level_value(char* line)
{
    constexpr char key[] = "LOG_LEVEL";
    constexpr std::size_t key_size = sizeof key - 1;
    strip_trailing_space(line);
    if (*line == '#' || std::strncmp(line, key, key_size) != 0)
        return nullptr;
    char* rest = skip_space(line + key_size);
    return *rest == '=' ? skip_space(rest + 1) : nullptr;
}

/// The level that the configuration asks for, or -1 when it is missing, silent or names none.
int configured_level(const char* home)
{
    char path[PATH_MAX];
    const int size = std::snprintf(path, sizeof path, "%s/%src", home, ".cimple");
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof path)
        return -1;
    std::FILE* file = std::fopen(path, "re");
    if (!file)
        return -1;

    int level = -1;
    char line[config_line_size];
    while (std::fgets(line, sizeof line, file))
    {
        if (const char* value = level_value(line))
            level = level_of(value);
    }
    std::fclose(file);
    return level;
}

/// A file in the log's directory, never through a link that someone else put there.
int open_in(int directory, const char* name, int flags, mode_t mode)
{
    return openat(directory, name, flags | O_WRONLY | O_CREAT | O_NOFOLLOW | O_CLOEXEC, mode);
}

bool open_files(Log_State& log, const char* home)
{
    char path[PATH_MAX];
    const int size = std::snprintf(path, sizeof path, "%s/%s", home, ".cimple");
    if (size < 0 || static_cast<std::size_t>(size) >= sizeof path)
        return false;
    mkdir(path, 0777); // an existing one is fine, and a failure shows in the next line
    const int directory = open(path, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (directory < 0)
        return false;

    log.lock_file = open_in(directory, "messages.lock", 0, 0600);
    const int messages = log.lock_file < 0 ? -1 : open_in(directory, "messages", O_APPEND, 0644);
    close(directory);
    log.stream = messages < 0 ? nullptr : fdopen(messages, "a");
    return log.stream != nullptr;
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
    log.open = true;
}

/// Locks or unlocks the whole lock file: several broker processes may share one log.
void lock_between_processes(int file, short type)
{
    struct flock lock = {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    while (fcntl(file, F_SETLKW, &lock) == -1 && errno == EINTR)
    {}
}

/// The time to the second.
String time_text()
{
    String text = Datetime::now().pretty();
    const char* point = std::strchr(text.c_str(), '.');
    return point ? String(text.c_str(), static_cast<std::size_t>(point - text.c_str())) : text;
}

} // namespace

void Runtime_Log::write(int level, const char* file, int line, const char* format, ...)
{
    Log_State& log = state();
    std::call_once(log.started, start, std::ref(log));
    if (!log.open.load(std::memory_order_acquire) || level < LOG_FATAL || level > LOG_DBG || level > log.level)
        return;

    const std::lock_guard guard(log.mutex);
    Buffer text;
    text.appendf("%s %s: %s(%d): ", time_text().c_str(), level_names[level], file, line);
    std::va_list args;
    va_start(args, format);
    text.vappendf(format, args);
    va_end(args);
    if (text.data()[text.size() - 1] != '\n')
        text.append('\n');

    lock_between_processes(log.lock_file, F_WRLCK);
    std::fwrite(text.data(), 1, text.size(), log.stream);
    std::fflush(log.stream);
    lock_between_processes(log.lock_file, F_UNLCK);
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
