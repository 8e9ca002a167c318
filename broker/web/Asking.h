// What the answers of the JSON interface are made with.
#pragma once

#include "broker/core/Broker.h"
#include "broker/health/Health.h"
#include "broker/http/Site.h"
#include "broker/values/Json.h"
#include "broker/web/Api.h"
#include "broker/web/ErrorGrowth.h"
#include "broker/web/Failure.h"
#include "broker/web/InstanceTable.h"
#include "broker/web/Kept.h"
#include "broker/web/Query.h"

#include <nlohmann/json.hpp>

#include <optional>
#include <string>
#include <vector>

namespace web
{

struct Text
{
    std::string text;

    std::size_t bytes() const { return text.size(); }
};

/// The other ends of the associations of an instance.
struct Ends
{
    struct End
    {
        std::string association;
        std::string role;
        broker::Path path;
    };
    std::vector<End> list = {};
    std::size_t size = 0;

    std::size_t bytes() const { return size; }
};

/// One for all requests of a port.
struct State
{
    State(broker::Broker& served, std::string ownNameSpace, Facts ownFacts)
        : broker(served), nameSpace(std::move(ownNameSpace)), facts(std::move(ownFacts))
    {}

    broker::Broker& broker;
    std::string nameSpace;
    Facts facts;
    ErrorGrowth growth;
    Kept<Text> texts{{.number = 16, .bytes = 32 << 20}};
    Kept<InstanceTable> tables{{.number = 16, .bytes = 96 << 20}};
    Kept<Ends> ends{{.number = 16, .bytes = 32 << 20}};

    /// Behind a change nothing is true any more.
    void dropKept()
    {
        texts.drop();
        tables.drop();
        ends.drop();
    }
};

struct Question
{
    State& state;
    const httplib::Request& request;
    const http::Caller& caller;
    std::string rest = {}; ///< of the path, behind that of the route
};

inline broker::Json orNull(const std::string& text)
{
    return text.empty() ? broker::Json() : broker::Json(text);
}

template <class T> broker::Json orNull(const std::optional<T>& value)
{
    return value ? broker::Json(*value) : broker::Json();
}

constexpr std::chrono::seconds keptFor{10};
constexpr std::chrono::seconds liveFor{1}; ///< what is asked for again and again to see it change

/// Throws NothingThere.
const broker::ClassInfo& classNamed(const State& state, const std::string& name);
/// The namespace that was asked for, or the one of the port where the class is in it, or else one that it is in.
std::string nameSpaceOf(const State& state, const std::string& className, const std::string& asked = {});
/// A whole path of an instance. Throws ArgumentFailure with the name of what it was given as.
broker::Path pathNamed(const State& state, const char* name, const std::string& text);
/// What of the path a person tells the instance by.
std::string shortName(const broker::Path& path);
/// Throws CimError where the class cannot be enumerated, but answers nothing for one that is not served.
std::vector<broker::Object> instancesOf(const State& state, const std::string& className);
/// None of a class that cannot be enumerated, which is told: it does not hide the others.
std::vector<broker::Object> instancesOf(const State& state, const std::string& className,
                                        std::vector<std::string>& failures);

// --- answers: JSON as text

std::string session(const Question& question);
std::string host(const Question& question);
std::string ports(const Question& question);
std::string classes(const Question& question);
std::string classOrInstances(const Question& question);
std::string instance(const Question& question);
std::string associations(const Question& question);
std::string logs(const Question& question);
std::string logEntries(const Question& question);
std::string diagnostics(const Question& question);
std::string methods(const Question& question);
std::string call(const Question& question);

} // namespace web
