// tvrcim: the provider module in a process of its own, for demos, tests and diagnosis.
#include "broker/tvrcim/CommandLine.h"
#include "broker/tvrcim/Environment.h"

#include <exception>
#include <iostream>
#include <optional>

namespace
{

using namespace tvrcim;

int report(const char* kind, const std::exception& error, int exitCode)
{
    std::cerr << "tvrcim: " << kind << error.what() << '\n';
    return exitCode;
}

/// Runs the command, then unloads the module, and tells what it did wrong on the way.
int run(const Settings& settings)
{
    std::optional<FileRoot> files;
    if (!settings.hardware)
    {
        files.emplace();
        startSimulator(settings.scenario);
    }
    broker::Broker broker({.module = settings.module.empty() ? findModule() : settings.module});
    if (!settings.platform.empty())
    {
        broker::loadPlatformFile(broker.store(), broker.classes(), settings.platform);
    }
    Session session{broker, settings.nameSpace, settings.format, std::cout};
    int exitCode = 0;
    try
    {
        runCommand(session, settings.command);
    }
    catch (const CimError& error)
    {
        exitCode = report("", error, exitCimError);
    }
    catch (const UsageError& error)
    {
        exitCode = report("", error, exitUsage);
    }
    std::cout.flush();
    broker.unload();
    for (const broker::Violation& violation : broker.violations())
    {
        std::cerr << "tvrcim: violation: " << violation.text << '\n';
        exitCode = exitViolation;
    }
    return exitCode;
}

} // namespace

int main(int argc, char** argv)
{
    const CommandLine line = parseCommandLine(argc, argv);
    if (!line.proceed)
    {
        return line.exitCode;
    }
    try
    {
        return run(line.settings);
    }
    catch (const std::exception& error)
    {
        return report("", error, exitUsage);
    }
}
