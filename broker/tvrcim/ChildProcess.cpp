#include "broker/tvrcim/ChildProcess.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <stdexcept>
#include <system_error>

#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace tvrcim
{

namespace
{

[[noreturn]] void fail(const std::string& what, int error)
{
    throw std::system_error(error, std::generic_category(), what);
}

/// A file without a name. Unlike a pipe it takes a text of any size, whether anybody reads it or not.
class MemoryFile
{
public:
    explicit MemoryFile(const char* name) : _file(memfd_create(name, MFD_CLOEXEC))
    {
        if (_file < 0)
            fail("cannot make a file in memory", errno);
    }
    ~MemoryFile() { close(_file); }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    int descriptor() const { return _file; }
    /// The text, to be read from its beginning.
    void put(const std::string& text)
    {
        for (std::size_t at = 0; at < text.size();)
        {
            const ssize_t written = write(_file, text.data() + at, text.size() - at);
            if (written < 0 && errno != EINTR)
                fail("cannot write to memory", errno);
            at += written > 0 ? static_cast<std::size_t>(written) : 0;
        }
        lseek(_file, 0, SEEK_SET);
    }
    std::string text() const
    {
        std::string text;
        std::array<char, 65536> buffer{};
        for (off_t at = 0;;)
        {
            const ssize_t size = pread(_file, buffer.data(), buffer.size(), at);
            if (size < 0 && errno == EINTR)
                continue;
            if (size <= 0)
                return text;
            text.append(buffer.data(), static_cast<std::size_t>(size));
            at += size;
        }
    }

private:
    int _file;
};

/// What becomes of the files and signals of a new process.
class SpawnSettings
{
public:
    SpawnSettings()
    {
        posix_spawn_file_actions_init(&_actions);
        posix_spawnattr_init(&_attributes);
        sigset_t none;
        sigemptyset(&none);
        posix_spawnattr_setsigmask(&_attributes, &none); // the tool blocks signals, its child is to end by them
        posix_spawnattr_setflags(&_attributes, POSIX_SPAWN_SETSIGMASK);
    }
    ~SpawnSettings()
    {
        posix_spawnattr_destroy(&_attributes);
        posix_spawn_file_actions_destroy(&_actions);
    }
    SpawnSettings(const SpawnSettings&) = delete;
    SpawnSettings& operator=(const SpawnSettings&) = delete;

    void redirect(int descriptor, const MemoryFile& file)
    {
        posix_spawn_file_actions_adddup2(&_actions, file.descriptor(), descriptor);
    }
    pid_t start(const std::vector<std::string>& words) const
    {
        std::vector<char*> arguments;
        for (const std::string& word : words)
            arguments.push_back(const_cast<char*>(word.c_str()));
        arguments.push_back(nullptr);
        pid_t process = 0;
        const int error = posix_spawnp(&process, arguments[0], &_actions, &_attributes, arguments.data(), environ);
        if (error != 0)
            fail("cannot run " + words[0], error);
        return process;
    }

private:
    posix_spawn_file_actions_t _actions{};
    posix_spawnattr_t _attributes{};
};

int endOf(pid_t process, const std::string& name)
{
    int status = 0;
    while (waitpid(process, &status, 0) < 0)
        if (errno != EINTR)
            fail("cannot wait for " + name, errno);
    return status;
}

} // namespace

ProgramEnd runProgram(const std::vector<std::string>& words, const std::string& input)
{
    MemoryFile in("input");
    const MemoryFile out("output");
    const MemoryFile errors("errors");
    in.put(input);
    SpawnSettings settings;
    settings.redirect(STDIN_FILENO, in);
    settings.redirect(STDOUT_FILENO, out);
    settings.redirect(STDERR_FILENO, errors);
    const int status = endOf(settings.start(words), words[0]);
    if (WIFSIGNALED(status))
        throw std::runtime_error(words[0] + " was ended by signal " + std::to_string(WTERMSIG(status)));
    return {WEXITSTATUS(status), out.text(), errors.text()};
}

} // namespace tvrcim
