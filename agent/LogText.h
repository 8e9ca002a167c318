// A literal line of the log that a table or an argument carries, with the place that names it.
#pragma once

#include "foundation/Log.h"

#include <cstdint>

namespace cimple
{

/// A line of which the place in the log is where it is written down, not where it is logged.
struct LogText
{
    /// Takes a literal with one "%d" at the most: any other conversion does not build.
    consteval LogText(int level, const char* text, const char* file = __builtin_FILE(),
                      unsigned line = __builtin_LINE())
        : text(text), file(file), level(level), line(line)
    {
        int values = 0;
        for (const char* c = text; c && *c; c++)
            if (*c == '%' && (c[1] != 'd' || ++values > 1))
                throw "a conversion that log() has no value for";
    }
    /// Of level 1, as most failures are.
    consteval LogText(const char* text, const char* file = __builtin_FILE(), unsigned line = __builtin_LINE())
        : LogText(TVR_CRIT, text, file, line)
    {}
    /// Nothing is logged.
    consteval LogText() : LogText(TVR_DBG, nullptr) {}

    /// `status` is the value of the text's "%d", if it has one.
    void log(std::uint32_t status = 0) const;

    // Without padding between: clang 14 loses it where it makes a temporary at compile time, and shifts what follows.
    const char* text;
    const char* file;
    int level;
    unsigned line;
};

} // namespace cimple
