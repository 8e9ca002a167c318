#include "runtime/log/RuntimeLog.h"
#include "tests/support/NoMemory.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <dlfcn.h>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <iostream>
#include <iterator>
#include <string>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

namespace cimple
{
namespace
{

namespace fs = std::filesystem;
using testing::MatchesRegex;

/// The log opens once in a process, so each case writes in a process of its own, and the test reads what it left.
struct Runtime_Log_Test : testing::Test
{
    fs::path home;

    void SetUp() override
    {
        GTEST_FLAG_SET(death_test_style, "threadsafe");
        // The child of a threadsafe death test runs this again: it must find the same place.
        const char* given = std::getenv("RUNTIME_LOG_TEST_HOME");
        if (given)
        {
            home = given;
            return;
        }
        char pattern[] = "/tmp/runtime_log_XXXXXX";
        home = mkdtemp(pattern);
        setenv("RUNTIME_LOG_TEST_HOME", home.c_str(), 1);
        owner = true;
    }
    void TearDown() override
    {
        if (!owner)
            return;
        unsetenv("RUNTIME_LOG_TEST_HOME");
        fs::remove_all(home);
    }

    void configure(const char* text) { std::ofstream(home / ".cimplerc") << text; }
    std::string messages() const
    {
        std::ifstream file(home / ".cimple/messages");
        return {std::istreambuf_iterator<char>(file), {}};
    }
    [[noreturn]] void write_and_exit() const
    {
        setenv("CIMPLE_HOME", home.c_str(), 1);
        RUNTIME_LOG(LOG_FATAL, "fatal %d\n", 1);
        RUNTIME_LOG(LOG_WARN, "warn");
        RUNTIME_LOG(LOG_DBG, "debug");
        std::exit(0);
    }
    void write_in_child() { EXPECT_EXIT(write_and_exit(), testing::ExitedWithCode(0), ""); }

    bool owner = false;
};

TEST_F(Runtime_Log_Test, writes_what_the_level_lets_pass)
{
    configure("# LOG_LEVEL = FATAL\n\nOTHER = x\nLOG_LEVEL = warn  \r\n");
    write_in_child();
    EXPECT_THAT(messages(), MatchesRegex("..../../.. ..:..:.. FATAL: RuntimeLogTest.cpp\\([0-9]+\\): fatal 1\n"
                                         "..../../.. ..:..:.. WARN: RuntimeLogTest.cpp\\([0-9]+\\): warn\n"));
    EXPECT_EQ(fs::status(home / ".cimple/messages.lock").permissions(), fs::perms(0600));
    write_in_child();
    const std::string both = messages();
    EXPECT_EQ(std::count(both.begin(), both.end(), '\n'), 4) << "appended";
}

TEST_F(Runtime_Log_Test, stays_closed_without_a_valid_level)
{
    write_in_child();
    EXPECT_FALSE(fs::exists(home / ".cimple")) << "no file";
    for (const char* text : {"LOG_LEVEL = TRACE\n", "LOG_LEVELS = DBG\n", "# LOG_LEVEL = DBG\n", " LOG_LEVEL = DBG\n"})
    {
        configure(text);
        write_in_child();
        EXPECT_FALSE(fs::exists(home / ".cimple")) << text;
    }
}

TEST_F(Runtime_Log_Test, follows_no_link_to_another_file)
{
    configure("LOG_LEVEL=DBG");
    fs::create_directory(home / ".cimple");
    std::error_code exists; // in the child
    fs::create_symlink(home / "target", home / ".cimple/messages", exists);
    write_in_child();
    EXPECT_FALSE(fs::exists(home / "target"));
}

/// Names of the open files below the log's home.
std::vector<std::string> open_files_below(const fs::path& home)
{
    std::vector<std::string> files;
    for (const auto& entry : fs::directory_iterator("/proc/self/fd"))
    {
        std::error_code gone; // the iterator's own
        const std::string file = fs::read_symlink(entry, gone).string();
        if (file.starts_with(home.string()))
            files.push_back(file);
    }
    return files;
}

TEST_F(Runtime_Log_Test, waits_for_nothing_that_is_no_file_and_keeps_nothing_open)
{
    for (const char* name : {".cimplerc", ".cimple", ".cimple/messages", ".cimple/messages.lock"})
        for (const bool pipe : {true, false})
        {
            if (owner)
            {
                fs::remove_all(home);
                fs::create_directories(home / ".cimple");
                configure("LOG_LEVEL = DBG\n");
                fs::remove_all(home / name);
                ASSERT_EQ(pipe ? mkfifo((home / name).c_str(), 0600) : mkdir((home / name).c_str(), 0700), 0);
            }
            if (!pipe && name == std::string(".cimple"))
                continue; // as it should be
            EXPECT_EXIT(
                {
                    // As if somebody listened: such a pipe opens, and holds the log once it is full.
                    const int reader = pipe ? open((home / name).c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC) : -1;
                    setenv("CIMPLE_HOME", home.c_str(), 1);
                    RUNTIME_LOG(LOG_FATAL, "message");
                    close(reader);
                    for (const std::string& file : open_files_below(home))
                        std::cerr << "left open: " << file << '\n';
                    std::exit(open_files_below(home).empty() ? 0 : 1);
                },
                testing::ExitedWithCode(0), "")
                << name << pipe;
        }
}

TEST_F(Runtime_Log_Test, reads_only_the_start_of_its_configuration)
{
    configure("LOG_LEVEL = FATAL\n");
    if (owner)
        fs::resize_file(home / ".cimplerc", 1 << 30);
    write_in_child();
    EXPECT_THAT(messages(), testing::EndsWith(": fatal 1\n"));
}

TEST_F(Runtime_Log_Test, keeps_a_line_a_line)
{
    configure("LOG_LEVEL = DBG\n");
    EXPECT_EXIT(
        {
            setenv("CIMPLE_HOME", home.c_str(), 1);
            RUNTIME_LOG(LOG_WARN, "%s", "a\nforged\x1b[2J");
            RUNTIME_LOG(LOG_WARN, "%s", "two\n\n");
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
    EXPECT_THAT(messages(), MatchesRegex("[^\n]+: a\\\\nforged\\\\x1b\\[2J\n[^\n]+: two\\\\n\n"));
}

TEST_F(Runtime_Log_Test, needs_no_memory)
{
    configure("LOG_LEVEL = DBG\n");
    EXPECT_EXIT(
        {
            setenv("CIMPLE_HOME", home.c_str(), 1);
            const std::string longer(3'000, 'x');
            {
                const test_support::NoMemory none;
                RUNTIME_LOG(LOG_WARN, "%d", 7);
                RUNTIME_LOG(LOG_WARN, "%s", longer.c_str());
            }
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
    EXPECT_THAT(messages(), testing::HasSubstr(": 7\n"));
    EXPECT_THAT(messages(), testing::EndsWith(": " + std::string(1'023, 'x') + "\n"));
}

TEST_F(Runtime_Log_Test, leaves_nothing_open_when_its_library_is_closed)
{
    configure("LOG_LEVEL = FATAL\n");
    EXPECT_EXIT(
        {
            setenv("CIMPLE_HOME", home.c_str(), 1);
            for (int i = 0; i < 3; ++i)
            {
                void* library = dlopen(RUNTIME_LOG_PROBE, RTLD_NOW | RTLD_LOCAL);
                reinterpret_cast<void (*)()>(dlsym(library, "logAMessage"))();
                if (open_files_below(home).size() != 2)
                    std::exit(1);
                dlclose(library);
                if (dlopen(RUNTIME_LOG_PROBE, RTLD_NOW | RTLD_NOLOAD) || !open_files_below(home).empty())
                    std::exit(2);
            }
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
    const std::string text = messages();
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 3);
}

TEST_F(Runtime_Log_Test, lets_children_end_that_were_forked_while_it_was_busy)
{
    configure("LOG_LEVEL = FATAL\n");
    EXPECT_EXIT(
        {
            setenv("CIMPLE_HOME", home.c_str(), 1);
            std::fflush(stdout); // or each child does it
            std::atomic<bool> done{false};
            std::thread busy(
                [&]
                {
                    while (!done)
                        RUNTIME_LOG(LOG_FATAL, "busy");
                });
            for (int i = 0; i < 100; ++i)
            {
                const pid_t child = fork();
                if (child == 0)
                {
                    alarm(20);
                    std::exit(0);
                }
                int status = 0;
                waitpid(child, &status, 0);
                if (status != 0)
                    std::_Exit(1);
            }
            done = true;
            busy.join();
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
}

TEST_F(Runtime_Log_Test, obeys_switch_and_level_names)
{
    EXPECT_EQ(Runtime_Log::set_enabled(true), -1);
    EXPECT_EQ(Runtime_Log::set_enabled(false), 0);
    EXPECT_FALSE(Runtime_Log::enabled());
    EXPECT_EQ(Runtime_Log::set_enabled(true), 0);
    EXPECT_EQ(Runtime_Log::set_level("verbose"), -1);
    EXPECT_EQ(Runtime_Log::set_level("Dbg"), 0);
}

} // namespace
} // namespace cimple
