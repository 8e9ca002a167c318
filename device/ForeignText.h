// Text out of records that a library fills.
#pragma once

#include "device/RmApi.h"

#include <cstring>
#include <string>

namespace cimple
{

/// A library need not end a full field with a zero byte.
template <std::size_t Size> std::string foreignText(const char (&field)[Size])
{
    return std::string(field, strnlen(field, Size));
}

/// The same of a field that is filled with blanks.
template <std::size_t Size> std::string paddedText(const char (&field)[Size])
{
    std::string text = foreignText(field);
    text.erase(text.find_last_not_of(' ') + 1);
    return text;
}

/// At most `size` bytes at `bytes`, up to the first zero byte.
inline std::string foreignText(const std::uint8_t* bytes, std::size_t size)
{
    const auto* text = reinterpret_cast<const char*>(bytes);
    return std::string(text, strnlen(text, size));
}

/// 16 upper-case hexadecimal digits.
std::string wwnText(const HBA_WWN& wwn);

/// A LUN field, eight bytes as they lie in memory: 16 upper-case hexadecimal digits.
std::string lunText(std::uint64_t field);
void lunToText(std::uint64_t field, char (&text)[17]);

/// The name behind wwnText(). Logs a text of another form and throws std::exception.
HBA_WWN wwnOf(const std::string& text);

} // namespace cimple
