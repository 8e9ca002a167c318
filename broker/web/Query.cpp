#include "broker/web/Query.h"

#include "broker/web/Failure.h"

#include <algorithm>
#include <charconv>

namespace web
{

Query::Query(const httplib::Params& params, std::initializer_list<const char*> known) : _params(params)
{
    for (const auto& [name, value] : params)
    {
        if (std::ranges::none_of(known, [&, &own = name](const char* wanted) { return own == wanted; }))
            throw ArgumentFailure("there is no parameter '" + name + "'");
        if (params.count(name) > 1)
            throw ArgumentFailure(name + ": it stands twice");
    }
}

std::string Query::text(const char* name) const
{
    const auto found = _params.find(name);
    return found == _params.end() ? std::string() : found->second;
}

std::string Query::required(const char* name) const
{
    std::string value = text(name);
    if (value.empty())
        throw ArgumentFailure(std::string(name) + ": it is missing");
    return value;
}

std::size_t Query::number(const char* name, std::size_t otherwise, std::size_t largest) const
{
    if (!_params.contains(name))
        return otherwise;
    const std::string value = text(name);
    std::size_t number = 0;
    const char* end = value.data() + value.size();
    const auto read = std::from_chars(value.data(), end, number);
    if (read.ec != std::errc() || read.ptr != end || number > largest)
        throw ArgumentFailure(std::string(name) + ": '" + value + "' is no number up to " + std::to_string(largest));
    return number;
}

bool Query::flag(const char* name) const
{
    return number(name, 0, 1) == 1;
}

Page Page::of(const Query& query, std::size_t count, std::size_t largestCount)
{
    return {query.number("from", 0, largestFrom), query.number("count", count, largestCount)};
}

std::size_t Page::cutTo(std::size_t size)
{
    from = std::min(from, size);
    return from + std::min(count, size - from);
}

} // namespace web
