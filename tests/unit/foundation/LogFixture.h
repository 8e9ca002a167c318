// What the tests of the log and of files share: a root of their own, and a sink that keeps what it is given.
#pragma once

#include "foundation/FilePaths.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sys/resource.h>
#include <sys/statvfs.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

namespace cimple
{

/// An empty tree that TVR_FILE_ROOT points to, removed at the end.
class TemporaryRoot
{
public:
    TemporaryRoot()
    {
        std::string name = (std::filesystem::temp_directory_path() / "tvr-found-XXXXXX").string();
        _path = mkdtemp(name.data());
        for (const char* folder : {"etc", "var/log", "proc", "opt/ibm/platform/log"})
            std::filesystem::create_directories(_path / folder);
        setenv("TVR_FILE_ROOT", _path.c_str(), 1);
    }
    ~TemporaryRoot()
    {
        unsetenv("TVR_FILE_ROOT");
        std::filesystem::remove_all(_path);
    }
    TemporaryRoot(const TemporaryRoot&) = delete;
    TemporaryRoot& operator=(const TemporaryRoot&) = delete;

    std::string operator/(const char* name) const { return (_path / name).string(); }

private:
    std::filesystem::path _path;
};

inline void writeFile(const std::string& path, const std::string& text)
{
    std::ofstream(path) << text;
}

inline std::string fileText(const std::string& path)
{
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), {}};
}

inline std::vector<std::string> namesIn(const std::string& folder)
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(folder))
        names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

/// Exit status of a forked child that runs the body and ends without the ends of static objects.
template <class Body> int inChild(Body body)
{
    const pid_t child = fork();
    if (child == 0)
        _exit(body());
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

/// As on a disk with room for so much of each file.
inline void limitFiles(rlim_t size)
{
    signal(SIGXFSZ, SIG_IGN);
    const rlimit limit{size, size};
    setrlimit(RLIMIT_FSIZE, &limit);
}

struct LogLine
{
    int level;
    std::string message;
    bool operator==(const LogLine&) const = default;
};

inline void PrintTo(const LogLine& line, std::ostream* out)
{
    *out << line.level << " \"" << line.message << '"';
}

/// Takes every message, whatever the mode.
class CapturingSink final : public TVR_LoggerInterface
{
public:
    CapturingSink() { TVR_Logger::instance().addSink(this); }
    ~CapturingSink() override { TVR_Logger::instance().removeSink(this); }

    void logMessage(int level, const char* file, unsigned line, const char* message) override
    {
        lines.push_back({level, message});
        lastFile = file;
        lastLine = line;
    }
    void start() override { ++starts; }
    void stop() override { ++stops; }
    void clearLog() override { ++clears; }

    /// What was logged at `level` or below since the last call.
    std::vector<LogLine> take(int level)
    {
        std::vector<LogLine> taken;
        for (LogLine& line : std::exchange(lines, {}))
            if (line.level <= level)
                taken.push_back(std::move(line));
        return taken;
    }

    std::vector<LogLine> lines;
    std::string lastFile;
    unsigned lastLine = 0;
    int starts = 0;
    int stops = 0;
    int clears = 0;
};

/// Root file systems for setStatvfs(), whatever the host's is.
template <unsigned long Flags> int mountedRoot(const char*, struct statvfs* status)
{
    *status = {};
    status->f_flag = Flags;
    return 0;
}
inline constexpr Statvfs writableRoot = mountedRoot<0>;
inline constexpr Statvfs readOnlyRoot = mountedRoot<ST_RDONLY>;

/// Brings the one logger of the process to a known state before and after each test.
class LogTest : public testing::Test
{
protected:
    LogTest() { reset(); }
    ~LogTest() override { reset(); }

    TemporaryRoot root;
    TVR_Logger& logger = TVR_Logger::instance();

private:
    void reset()
    {
        setStatvfs(writableRoot);
        logger.setMode(0);
        logger.setLevel(5);
        logger.disable();
        logger.clearFfdcMode();
    }
};

} // namespace cimple
