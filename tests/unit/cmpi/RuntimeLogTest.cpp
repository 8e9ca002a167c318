#include "runtime/RuntimeLog.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <iterator>
#include <string>

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
