// The parameters of a question, as they stand behind its path.
#pragma once

#include <httplib.h>

#include <cstddef>
#include <initializer_list>
#include <string>

namespace web
{

class Query
{
public:
    /// Throws ArgumentFailure for a parameter that is not among the known, or stands twice.
    Query(const httplib::Params& params, std::initializer_list<const char*> known);

    /// Empty for one that is missing.
    std::string text(const char* name) const;
    /// Throws ArgumentFailure for one that is missing or empty.
    std::string required(const char* name) const;
    /// Throws ArgumentFailure for what is no number or a larger one than that.
    std::size_t number(const char* name, std::size_t otherwise, std::size_t largest) const;
    /// "1" or "0"; throws ArgumentFailure for anything else.
    bool flag(const char* name) const;

private:
    const httplib::Params& _params;
};

/// A part of a list.
struct Page
{
    std::size_t from = 0;
    std::size_t count = 0;

    static constexpr std::size_t largestFrom = 10'000'000;

    static Page of(const Query& query, std::size_t count, std::size_t largestCount);
    /// The place behind the last, in a list of that size; `from` lies within the list afterwards.
    std::size_t cutTo(std::size_t size);
};

} // namespace web
