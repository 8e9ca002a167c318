// A program that runs as a process of its own, from its input to its end.
#pragma once

#include <string>
#include <vector>

namespace tvrcim
{

struct ProgramEnd
{
    int exitCode = 0;
    std::string out;
    std::string err;
};

/// Runs the words' first, which is looked for in PATH unless it has a folder. Throws std::system_error where it cannot
/// be run, with ENOENT where there is none, and std::runtime_error where a signal ended it.
ProgramEnd runProgram(const std::vector<std::string>& words, const std::string& input = {});

} // namespace tvrcim
