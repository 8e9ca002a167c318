#include "tests/system/Tool.h"
#include "tests/support/Semaphores.h"

#include <gtest/gtest.h>

#include <csignal>
#include <fcntl.h>
#include <fstream>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>

namespace system_test
{

Answer tvrcim(const std::string& arguments, const std::string& environment)
{
    return runCommand(environment + TVR_TVRCIM + " " + arguments);
}

Running::Running(std::vector<const char*> words)
{
    words.insert(words.begin(), TVR_TVRCIM);
    words.push_back(nullptr);
    int ends[2];
    int started[2];
    EXPECT_EQ(pipe2(ends, O_CLOEXEC), 0);
    EXPECT_EQ(pipe2(started, O_CLOEXEC), 0); // ends where the tool begins
    fcntl(ends[1], F_SETPIPE_SZ, 4096);
    _process = fork();
    if (_process == 0)
    {
        test_support::forgetSemaphoresOf(getpid());
        dup2(ends[1], STDOUT_FILENO);
        execv(words[0], const_cast<char* const*>(words.data()));
        _exit(127);
    }
    close(ends[1]);
    close(started[1]);
    char none;
    EXPECT_EQ(read(started[0], &none, 1), 0);
    close(started[0]);
    _output = ends[0];
}

Running::~Running()
{
    close(_output);
    if (_process > 0)
    {
        kill(_process, SIGKILL);
        waitpid(_process, nullptr, 0);
    }
}

long Running::memory() const
{
    std::ifstream status("/proc/" + std::to_string(_process) + "/status");
    constexpr std::string_view row = "VmRSS:";
    for (std::string line; std::getline(status, line);)
        if (line.starts_with(row))
            return std::atol(line.c_str() + row.size());
    return 0;
}

bool Running::awaitOutput() const
{
    pollfd ready{_output, POLLIN, 0};
    return poll(&ready, 1, 60000) == 1;
}

std::string Running::readLine() const
{
    std::string line;
    for (char c = 0; awaitOutput() && read(_output, &c, 1) == 1 && c != '\n';)
        line += c;
    return line;
}

int Running::endBy(int signal)
{
    kill(_process, signal);
    return exitCode();
}

int Running::closeOutput()
{
    close(std::exchange(_output, -1));
    return exitCode();
}

int Running::readAll()
{
    char buffer[4096];
    while (read(_output, buffer, sizeof buffer) > 0)
        continue;
    return exitCode();
}

int Running::exitCode()
{
    int status = 0;
    waitpid(std::exchange(_process, -1), &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

} // namespace system_test
