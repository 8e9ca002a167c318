// Reading text: lines, words and numbers.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace cimple
{

/// Hands out a text line by line as fgets() does: a longer line comes in pieces, and what follows a NUL is not seen.
class LineReader
{
public:
    explicit LineReader(std::string_view text) : _rest(text) {}
    /// At most `limit` - 1 bytes, up to and including the line feed; nothing at the end of the text.
    std::optional<std::string_view> next(std::size_t limit);

private:
    std::string_view _rest;
};

/// Without the white space at both ends.
std::string_view trim(std::string_view text);

/// The number at the start of the text in base 10, 0 if there is none. Clamped to 32 bits, so that a long row of
/// digits is out of every range.
std::int32_t parseDecimal(std::string_view text);

} // namespace cimple
