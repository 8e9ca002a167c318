#include "broker/web/Api.h"

#include "broker/http/Memory.h"
#include "broker/web/Asking.h"

#include <memory>

namespace web
{

using namespace broker;
using http::Entrance;

namespace
{

struct RouteRow
{
    const char* method;
    const char* path;
    Entrance entrance;
    std::string (*answer)(const Question& question);
};

constexpr RouteRow routes[] = {
    {"GET", "/api/session", Entrance::reader, session},
    {"GET", "/api/host", Entrance::reader, host},
    {"GET", "/api/ports", Entrance::reader, ports},
    {"GET", "/api/classes", Entrance::reader, classes},
    {"GET", "/api/classes/*", Entrance::reader, classOrInstances},
    {"GET", "/api/instance", Entrance::reader, instance},
    {"GET", "/api/associations", Entrance::reader, associations},
    {"GET", "/api/logs", Entrance::reader, logs},
    {"GET", "/api/logs/*", Entrance::reader, logEntries},
    {"GET", "/api/diagnostics", Entrance::reader, diagnostics},
    {"GET", "/api/methods", Entrance::reader, methods},
    {"POST", "/api/call", Entrance::changer, call},
};

std::string restOf(const std::string& pattern, const std::string& path)
{
    return pattern.ends_with('*') ? path.substr(pattern.size() - 1) : std::string();
}

void respond(const RouteRow& row, State& state, const httplib::Request& request, httplib::Response& response,
             const http::Caller& caller)
{
    response.set_header("Cache-Control", "no-store");
    std::string text;
    try
    {
        text = row.answer({state, request, caller, restOf(row.path, request.path)});
    }
    catch (...)
    {
        ToldFailure failure = tellCurrentException();
        response.status = failure.status;
        text = std::move(failure.json);
    }
    response.set_content(std::move(text), "application/json");
}

} // namespace

http::Site apiSite(Broker& broker, const std::string& nameSpace, const Facts& facts)
{
    const auto state = std::make_shared<State>(broker, nameSpace, facts);
    http::Site site;
    for (const RouteRow& row : routes)
        site.push_back(
            {row.method, row.path, row.entrance,
             [&row, state](const httplib::Request& request, httplib::Response& response, const http::Caller& caller)
             { respond(row, *state, request, response, caller); }});
    return site;
}

const ClassInfo& classNamed(const State& state, const std::string& name)
{
    const ClassInfo* info = state.broker.classes().find(name);
    if (!info)
        throw NothingThere("there is no class '" + name + "'");
    return *info;
}

std::string nameSpaceOf(const State& state, const std::string& className, const std::string& asked)
{
    if (!asked.empty())
        return asked;
    const std::vector<std::string> known = state.broker.nameSpacesOf(className);
    if (known.empty() || std::ranges::find(known, lowerCase(state.nameSpace)) != known.end())
        return state.nameSpace;
    return known.front();
}

std::vector<Object> instancesOf(const State& state, const std::string& className)
{
    const Reply reply = state.broker.enumerateInstances(nameSpaceOf(state, className), className);
    if (reply.status == CMPI_RC_ERR_INVALID_CLASS)
        return {};
    return checked(reply).objects;
}

std::vector<Object> instancesOf(const State& state, const std::string& className, std::vector<std::string>& failures)
{
    try
    {
        return instancesOf(state, className);
    }
    catch (const CimError& error)
    {
        failures.push_back(failureText(className, error));
        return {};
    }
}

std::string session(const Question& question)
{
    Query(question.request.params, {});
    const http::Caller& caller = question.caller;
    return jsonText({{"user", orNull(caller.user)},
                     {"mayChange", caller.mayChange},
                     {"token", orNull(caller.token)},
                     {"whyNot", orNull(caller.whyNot)},
                     {"version", question.state.facts.version},
                     {"simulated", question.state.facts.simulated}});
}

} // namespace web
