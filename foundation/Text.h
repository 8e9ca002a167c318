// Text that comes from files and libraries: lines, numbers, fixed-size fields.
#pragma once

#include "runtime/String.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
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

/// Text of a fixed-size field, which may lack a terminator.
inline String fieldText(const char* field, std::size_t size)
{
    return String(field, strnlen(field, size));
}
template <std::size_t N> String fieldText(const char (&field)[N])
{
    return fieldText(field, N);
}

/// Copies between fields of one size; the copy has a terminator always.
template <std::size_t N> void copyField(char (&out)[N], const char (&in)[N])
{
    const std::size_t size = strnlen(in, N - 1);
    std::memcpy(out, in, size);
    out[size] = '\0';
}

} // namespace cimple
