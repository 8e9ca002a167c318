// Reading text line by line.
#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

namespace cimple
{

/// Hands out a text line by line as fgets() does: a longer line comes in pieces, and what follows a NUL is not seen.
class Line_Reader
{
public:
    explicit Line_Reader(std::string_view text) : _rest(text) {}
    /// At most `limit` - 1 bytes, up to and including the line feed; nothing at the end of the text.
    std::optional<std::string_view> next(std::size_t limit);

private:
    std::string_view _rest;
};

/// Without the white space at both ends.
std::string_view trim(std::string_view text);

} // namespace cimple
