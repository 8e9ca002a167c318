#include "foundation/Text.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <string>

namespace cimple
{

namespace
{

bool isBlank(char c)
{
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}

} // namespace

std::optional<std::string_view> LineReader::next(std::size_t limit)
{
    if (_rest.empty())
        return std::nullopt;
    const std::size_t feed = _rest.find('\n');
    const std::size_t whole = feed == std::string_view::npos ? _rest.size() : feed + 1;
    const std::string_view line = _rest.substr(0, std::min(whole, limit - 1));
    _rest.remove_prefix(line.size());
    return line.substr(0, line.find('\0'));
}

std::string_view trim(std::string_view text)
{
    while (!text.empty() && isBlank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && isBlank(text.back()))
        text.remove_suffix(1);
    return text;
}

std::int32_t parseDecimal(std::string_view text)
{
    const long value = std::strtol(std::string(text).c_str(), nullptr, 10);
    return static_cast<std::int32_t>(std::clamp<long>(value, INT32_MIN, INT32_MAX));
}

} // namespace cimple
