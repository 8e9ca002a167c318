#include "broker/tvrcim/Graphviz.h"

#include "broker/tvrcim/ChildProcess.h"

#include <stdexcept>
#include <system_error>

namespace tvrcim
{

namespace
{

ProgramEnd runDot(const std::string& dot, const std::string& option)
try
{
    return runProgram({"dot", option}, dot);
}
catch (const std::system_error& error)
{
    if (error.code() == std::errc::no_such_file_or_directory)
        throw std::runtime_error("the program dot is not installed: pictures need graphviz (apt-get install graphviz)");
    throw;
}

} // namespace

std::string drawnByGraphviz(const std::string& dot, const std::string& format)
{
    ProgramEnd end = runDot(dot, "-T" + format);
    if (end.exitCode != 0 || end.out.empty())
        throw std::runtime_error("dot cannot draw the picture: " + end.err);
    return std::move(end.out);
}

} // namespace tvrcim
