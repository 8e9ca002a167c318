// A command line as a process of its own: its output and its exit code.
#pragma once

#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <iterator>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

struct Answer
{
    int exitCode;
    std::string out;
    std::string err;
};

inline std::string textOf(const std::string& file)
{
    std::ifstream stream(file);
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// Runs what a shell would read; exit code -1 when a signal ended it.
inline Answer runCommand(const std::string& command)
{
    const std::string errors = testing::TempDir() + "command-" + std::to_string(getpid()) + ".err";
    FILE* pipe = popen((command + " 2>" + errors).c_str(), "r");
    EXPECT_TRUE(pipe);
    std::string out;
    char buffer[4096];
    while (std::size_t size = fread(buffer, 1, sizeof(buffer), pipe))
        out.append(buffer, size);
    const int status = pclose(pipe);
    const Answer run{WIFEXITED(status) ? WEXITSTATUS(status) : -1, out, textOf(errors)};
    std::remove(errors.c_str());
    return run;
}
