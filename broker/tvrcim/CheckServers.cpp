#include "broker/tvrcim/CheckServers.h"

#include "broker/tvrcim/ChildProcess.h"
#include "broker/tvrcim/Environment.h"

#include <algorithm>
#include <array>
#include <exception>
#include <sstream>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace tvrcim
{

using broker::Json;

namespace
{

constexpr const char* subjectOfAll = "CIM servers";
constexpr const char* absent = "-"; ///< in a column

/// A server as the script tells it: a line of columns with tabs between them.
struct Server
{
    std::string name, tools, process, registered, module;
};

std::vector<Server> serversOf(const std::string& output)
{
    std::vector<Server> servers;
    std::istringstream lines(output);
    for (std::string line; std::getline(lines, line);)
    {
        std::istringstream columns(line);
        Server server;
        for (std::string* column : {&server.name, &server.tools, &server.process, &server.registered, &server.module})
            std::getline(columns, *column, '\t');
        if (!server.module.empty())
            servers.push_back(std::move(server));
    }
    return servers;
}

/// What a word of the column "registered" means.
struct Registered
{
    std::string_view word;
    State state;
    const char* text;
    const char* remedy;
};

constexpr std::array<Registered, 5> registrations{{
    {"registered", State::ok, "registered", ""},
    {"outdated", State::warning, "registered, with other classes than are installed", "run tavrin-fc-register"},
    {"foreign", State::ok, "registered, but not by tavrin-fc-register", ""},
    {"no", State::missing, "not registered", "run tavrin-fc-register"},
    {"unknown", State::warning, "does not tell whether the module is registered", "start the server"},
}};

Finding findingOf(const Server& server)
{
    const auto* row =
        std::ranges::find_if(registrations, [&](const Registered& r) { return server.registered == r.word; });
    const bool isKnown = row != registrations.end();
    Finding finding{.state = isKnown ? row->state : State::note, .subject = server.name};
    finding.text = (isKnown ? row->text : server.registered) + std::string(", ") + server.process;
    finding.remedy = isKnown ? row->remedy : "";
    if (server.module != absent)
        finding.text += ", module " + server.module;
    else if (finding.state == State::ok)
    {
        finding.state = State::wrong;
        finding.text += ", and has no module in its folders of providers";
        finding.remedy = "run tavrin-fc-register remove, and then tavrin-fc-register";
    }
    finding.facts = {{"tools", server.tools},
                     {"process", server.process},
                     {"registered", server.registered},
                     {"module", server.module == absent ? Json() : Json(server.module)}};
    return finding;
}

Findings findingsOf(const std::vector<Server>& servers)
{
    Findings findings;
    std::string names;
    for (const Server& server : servers)
    {
        names += (names.empty() ? "" : ", ") + server.name;
        if (server.tools != absent)
            findings.push_back(findingOf(server));
    }
    if (findings.empty())
        findings.push_back({State::warning, subjectOfAll, "none is here, or has its tools in PATH: " + names,
                            "install one, and run tavrin-fc-register; 'tvrcim serve' answers clients without"});
    return findings;
}

} // namespace

Findings checkServers()
try
{
    const ProgramEnd end = runProgram({findRegisterScript(), "--status"});
    const std::vector<Server> servers = serversOf(end.out);
    if (servers.empty())
        return {{State::wrong, subjectOfAll, "tavrin-fc-register tells nothing: " + end.err,
                 "run 'tavrin-fc-register status', and see what it says"}};
    return findingsOf(servers);
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
