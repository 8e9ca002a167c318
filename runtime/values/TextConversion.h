// Text to value and value to text.
#pragma once

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace cimple
{

/// Text to value. All return 0, or -1 without touching `value` when the whole text is not of the form:
///   boolean    "true" or "false", in any case
///   unsigned   at most 20 decimal digits, or "0x"/"0X" and at most 16 digits of 0-9 and A-F; no sign
///   signed     an optional sign, then as unsigned
///   real       [sign] digits "." digit... [e [sign] digit...]; the point is required
/// Integers must fit their width. A null text is refused.
int text_to_value(const char* text, bool& value);
int text_to_value(const char* text, std::uint8_t& value);
int text_to_value(const char* text, std::int8_t& value);
int text_to_value(const char* text, std::uint16_t& value);
int text_to_value(const char* text, std::int16_t& value);
int text_to_value(const char* text, std::uint32_t& value);
int text_to_value(const char* text, std::int32_t& value);
int text_to_value(const char* text, std::uint64_t& value);
int text_to_value(const char* text, std::int64_t& value);
int text_to_value(const char* text, float& value);
int text_to_value(const char* text, double& value);

/// Room for the longest 64-bit integer, its sign and a NUL.
inline constexpr std::size_t integer_text_size = 21;

/// A text with its length, NUL-terminated.
struct Integer_Text
{
    const char* data;
    std::size_t size;
};

Integer_Text unsigned_text(std::uint64_t value, char (&buffer)[integer_text_size]);
Integer_Text signed_text(std::int64_t value, char (&buffer)[integer_text_size]);

/// Decimal text of an integer. Values from 0 to 127 come from a static table, others are written backwards
/// into `buffer`; the result points into the one or the other.
template <std::integral T> Integer_Text integer_text(T value, char (&buffer)[integer_text_size])
{
    if constexpr (std::is_signed_v<T>)
        return signed_text(value, buffer);
    else
        return unsigned_text(value, buffer);
}

} // namespace cimple
