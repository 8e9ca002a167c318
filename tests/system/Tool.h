// The tool as a process.
#pragma once

#include "tests/support/Command.h"

#include <string>
#include <sys/types.h>
#include <vector>

namespace system_test
{

/// Runs the tool with arguments as a shell would read them, in an environment that assignments may change.
Answer tvrcim(const std::string& arguments, const std::string& environment = "");

/// The tool at work, with its output in a pipe that holds a page.
class Running
{
public:
    explicit Running(std::vector<const char*> words);
    ~Running();
    Running(const Running&) = delete;
    Running& operator=(const Running&) = delete;

    pid_t process() const { return _process; }
    /// KiB of memory that it has now.
    long memory() const;
    bool awaitOutput() const;
    std::string readLine() const;
    /// Its exit code after the signal; -1 when that killed it.
    int endBy(int signal);
    /// Its exit code when nobody reads any more.
    int closeOutput();
    /// Its exit code after all of its output.
    int readAll();

private:
    int exitCode();

    pid_t _process;
    int _output;
};

} // namespace system_test
