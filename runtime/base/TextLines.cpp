#include "runtime/base/TextLines.h"

#include <algorithm>
#include <cctype>

namespace cimple
{

namespace
{

bool is_blank(char c)
{
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}

} // namespace

std::optional<std::string_view> Line_Reader::next(std::size_t limit)
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
    while (!text.empty() && is_blank(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && is_blank(text.back()))
        text.remove_suffix(1);
    return text;
}

} // namespace cimple
