// tvrcim: the provider module in a process of its own, for demos, tests and diagnosis.
#include "broker/tvrcim/CheckCommand.h"
#include "broker/tvrcim/CheckLibraries.h"
#include "broker/tvrcim/CommandLine.h"
#include "broker/tvrcim/Environment.h"

#include <csignal>
#include <cstdlib>
#include <exception>
#include <iostream>
#include <new>
#include <optional>
#include <string_view>
#include <system_error>

#include <unistd.h>

namespace
{

using namespace tvrcim;

int report(const std::string& text, int exitCode)
{
    std::cerr << "tvrcim: " << text << '\n';
    return exitCode;
}

/// Others show what the module declares.
bool asksTheHost(const Command& command)
{
    return command.name != "classes" && command.name != "class" && command.name != "methods";
}

/// A terminal that shows colours, and nobody asked for none (no-color.org).
bool wantsColour()
{
    const char* refusal = std::getenv("NO_COLOR");
    const char* terminal = std::getenv("TERM");
    return isatty(STDOUT_FILENO) && !(refusal && *refusal) && terminal && std::string_view(terminal) != "dumb";
}

/// Runs the command and tells why it failed, where it did.
int runAndReport(Session& session, const Command& command, SignalEnd& signals)
{
    try
    {
        runCommand(session, command);
        return 0;
    }
    catch (const CimError& error)
    {
        signals.passIfNone(); // a signal unloads the module under the command
        return report(error.what(), exitCimError);
    }
    catch (const MethodRefusal& error)
    {
        return report(error.what(), exitRefusal);
    }
    catch (const TestFailure& error)
    {
        return report(error.what(), exitTestFailed);
    }
    catch (const Interruption& error)
    {
        constexpr int endedBySignal = 128;
        return report(error.what(), endedBySignal + SIGINT);
    }
    catch (const UsageError& error)
    {
        return report(error.what(), exitUsage);
    }
}

/// Where the tool shows that it is at work: people see it, and who reads the output does not.
void showWork(Session& session)
{
    if (session.format == Format::json)
        return;
    (isatty(STDERR_FILENO) ? session.progress : session.steps) = &std::cerr;
}

/// Sets up the host, runs the command, then unloads the module and tells what it did wrong on the way.
int run(const Settings& settings)
{
    SignalEnd signals;
    if (settings.command.name == "check")
        return checkHost(settings, signals, std::cout, wantsColour());
    std::optional<FileRoot> files;
    if (!settings.hardware)
    {
        files.emplace(signals);
        startSimulator(settings.scenario);
    }
    else if (asksTheHost(settings.command))
    {
        if (const Libraries libraries; !libraries.anyFound())
            return report(libraries.absence(), exitIncomplete);
    }
    const std::string module = settings.module.empty() ? findModule() : settings.module;
    broker::Broker broker(
        {.module = module, .registration = findRegistration(module), .personality = settings.personality});
    const UnloadedBySignal entrusted(signals, broker);
    if (!settings.platform.empty())
        broker::loadPlatformFile(broker.store(), broker.classes(), settings.platform);
    Session session{broker, settings.nameSpace, settings.format, std::cout, !settings.hardware, wantsColour()};
    session.signals = &signals;
    showWork(session);
    int exitCode = runAndReport(session, settings.command, signals);
    broker.unload();
    for (const broker::Violation& violation : broker.violations())
    {
        std::cerr << "tvrcim: violation: " << violation.text << '\n';
        exitCode = exitViolation;
    }
    return exitCode;
}

/// Whether a later start may do better.
bool mayPass(const std::exception& error)
{
    const auto* ofSystem = dynamic_cast<const std::system_error*>(&error); // a thread that cannot be started
    return dynamic_cast<const Unavailable*>(&error) || dynamic_cast<const std::bad_alloc*>(&error) ||
           (ofSystem && ofSystem->code() == std::errc::resource_unavailable_try_again);
}

int parseAndRun(int argc, char** argv)
{
    const CommandLine line = parseCommandLine(argc, argv);
    if (!line.proceed)
        return line.exitCode;
    try
    {
        return run(line.settings);
    }
    catch (const std::exception& error)
    {
        return report(error.what(), mayPass(error) ? exitUnavailable : exitUsage);
    }
}

} // namespace

int main(int argc, char** argv)
{
    const int exitCode = parseAndRun(argc, argv);
    if (std::cout.flush())
        return exitCode;
    std::cerr << "tvrcim: not all of the output could be written\n";
    return exitCode == 0 ? exitOutputLost : exitCode;
}
