#include "broker/web/Body.h"

#include "broker/web/Failure.h"

#include <nlohmann/json.hpp>

#include <vector>

namespace web
{

using namespace broker;

Json parseBody(std::string_view text)
{
    std::vector<std::size_t> members; // of the objects that are open
    const auto watch = [&](int depth, Json::parse_event_t event, const Json&)
    {
        if (depth > deepestBody)
            throw ArgumentFailure("the body is nested too deeply");
        if (event == Json::parse_event_t::object_start)
            members.push_back(0);
        else if (event == Json::parse_event_t::object_end)
            members.pop_back();
        else if (event == Json::parse_event_t::key && ++members.back() > mostMembers)
            throw ArgumentFailure("an object of the body has too many members");
        return true;
    };
    Json json = Json::parse(text, watch, false);
    if (json.is_discarded())
        throw ArgumentFailure("the body is no JSON");
    return json;
}

} // namespace web
