// The tool's commands on a broker.
#pragma once

#include "broker/core/Broker.h"
#include "broker/tvrcim/Printing.h"

#include <cstdint>
#include <optional>
#include <ostream>
#include <stdexcept>
#include <string>
#include <vector>

namespace tvrcim
{

/// A wrong argument; the text names it.
class UsageError : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

using broker::CimError;

/// A method that was called and returned another number than 0.
class MethodRefusal : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// A diagnostic test that did not pass.
class TestFailure : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// Work that ended early, since a person asked for it by SIGINT.
class Interruption : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// What the command needs is not there now, and may be later.
class Unavailable : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// One command with its arguments; what a command does not use stays empty.
struct Command
{
    std::string name = {};
    std::string target = {}; ///< class name, path or port
    std::string method = {};
    std::vector<std::string> assignments = {}; ///< name=value
    broker::PropertyList properties = {};
    broker::AssociationFilter filter = {};
    bool names = false;
    bool all = false;
    std::string output = {}; ///< a file
    bool list = false;
    bool deletes = false;
    std::optional<std::uint32_t> keep = {};
    bool driver = false; ///< its log, not the provider's
    bool follow = false;
    unsigned level = 0; ///< the last that is shown; 0 for all
    std::string test = {};
    std::string listen = {};           ///< address:port
    std::vector<std::string> tls = {}; ///< files of a certificate and its key
    int patience = 10;                 ///< seconds
    std::string users = {};            ///< a file
};

class SignalEnd;

/// Where a command works and how it prints.
struct Session
{
    broker::Broker& broker;
    std::string nameSpace;
    Format format;
    std::ostream& out;
    bool simulated = true;            ///< no real adapter is behind it
    bool colour = false;              ///< what is wrong may be in colour
    std::ostream* progress = nullptr; ///< a terminal that shows what is at work
    std::ostream* steps = nullptr;    ///< where there is no terminal: gets long work line by line
    SignalEnd* signals = nullptr;     ///< of the process
};

/// Runs a command and prints its result. Throws UsageError or CimError, and MethodRefusal, TestFailure or
/// Interruption once that is printed.
void runCommand(Session& session, const Command& command);

} // namespace tvrcim
