// The command line: global options and one subcommand.
#pragma once

#include "broker/tvrcim/Commands.h"

#include <string>

namespace tvrcim
{

struct Settings
{
    std::string module;
    std::string scenario;
    std::string platform;
    std::string nameSpace = "root/tavrin";
    Format format = Format::table;
    bool hardware = false;
    broker::Personality personality = broker::strict;
    Command command;
};

/// What to do after reading the command line: go on with the settings, or exit with a code after a text was printed.
struct CommandLine
{
    Settings settings;
    bool proceed = true;
    int exitCode = 0;
};

inline constexpr int exitCimError = 1;
inline constexpr int exitUsage = 2;
inline constexpr int exitViolation = 3;
inline constexpr int exitRefusal = 4; ///< of a method, by its return value
inline constexpr int exitTestFailed = 5;
inline constexpr int exitOutputLost = 6;  ///< of a command that went well otherwise
inline constexpr int exitIncomplete = 7;  ///< something that the provider needs is missing
inline constexpr int exitUnavailable = 8; ///< an address to listen on, or memory: a later start may have it

/// Help goes to standard output, errors to standard error with exit code 2.
CommandLine parseCommandLine(int argc, const char* const* argv);

} // namespace tvrcim
