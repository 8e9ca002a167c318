// The counters of a port: what they count, and which of them count errors.
#pragma once

#include <string_view>

namespace web
{

struct CounterRow
{
    std::string_view property;
    const char* label;
    const char* unit;
    bool isError = false;
};

/// Null for a counter that is not in the table.
const CounterRow* counterRow(std::string_view property);

} // namespace web
