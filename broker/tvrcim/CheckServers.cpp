#include "broker/tvrcim/CheckServers.h"

#include "broker/tvrcim/ChildProcess.h"
#include "broker/tvrcim/Environment.h"

#include <algorithm>
#include <array>
#include <exception>
#include <sstream>
#include <system_error>

namespace tvrcim
{

namespace
{

constexpr const char* subjectOfAll = "CIM servers";
constexpr const char* script = "tavrin-fc-register: ";

/// How a line of the script begins, behind the name of the server.
struct StatusRow
{
    std::string_view begin;
    State state;
    const char* remedy;
};

constexpr std::array<StatusRow, 4> statuses{{
    {"registered, with other classes", State::warning, "run tavrin-fc-register"},
    {"registered", State::ok, ""},
    {"not registered", State::missing, "run tavrin-fc-register"},
    {"does not answer", State::warning, "start the server"},
}};

Finding ofServer(const std::string& server, const std::string& text)
{
    const auto* row = std::ranges::find_if(statuses, [&](const StatusRow& r) { return text.starts_with(r.begin); });
    const bool isKnown = row != statuses.end();
    Finding finding{isKnown ? row->state : State::note, server, text, isKnown ? row->remedy : ""};
    finding.facts["server"] = server;
    return finding;
}

/// What keeps the script from telling how servers stand.
Finding ofScript(const std::string& text)
{
    if (text.starts_with("no CIM server found"))
        return {State::warning, subjectOfAll, text,
                "install one, and run tavrin-fc-register; 'tvrcim serve' answers clients without"};
    return {State::warning, subjectOfAll, text, "install the package tavrin-fc-provider"};
}

Findings findingsOf(const std::string& output)
{
    Findings findings;
    std::istringstream lines(output);
    for (std::string line; std::getline(lines, line);)
    {
        const std::size_t colon = line.find(": ");
        if (line.starts_with(script))
            findings.push_back(ofScript(line.substr(std::string_view(script).size())));
        else if (colon != line.npos)
            findings.push_back(ofServer(line.substr(0, colon), line.substr(colon + 2)));
    }
    return findings;
}

} // namespace

Findings checkServers()
try
{
    const ProgramEnd end = runProgram({findRegisterScript(), "status"});
    Findings findings = findingsOf(end.out + end.err);
    if (findings.empty())
        findings.push_back({State::wrong, subjectOfAll, "tavrin-fc-register told nothing",
                            "run 'tavrin-fc-register status', and see what it says"});
    return findings;
}
catch (const std::system_error& error)
{
    if (error.code() == std::errc::no_such_file_or_directory)
        return {{State::warning, subjectOfAll, "tavrin-fc-register, which knows them, is not installed",
                 "install the package tavrin-fc-provider"}};
    return {{State::wrong, subjectOfAll, error.what()}};
}
catch (const std::exception& error)
{
    return {{State::wrong, subjectOfAll, error.what()}};
}

} // namespace tvrcim
