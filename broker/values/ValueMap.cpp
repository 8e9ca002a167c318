#include "broker/values/ValueMap.h"

#include "broker/values/ValueText.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <limits>

namespace broker
{

namespace
{

constexpr std::string_view rangeMark = "..";

/// Decimal or 0x1F; `otherwise` for a text that is no number, as the open end of a range is none.
std::uint64_t numberIn(std::string_view text, std::uint64_t otherwise)
{
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (hexadecimal)
        text.remove_prefix(2);
    std::uint64_t number = otherwise;
    std::from_chars(text.data(), text.data() + text.size(), number, hexadecimal ? 16 : 10);
    return number;
}

bool covers(std::string_view values, std::uint64_t number)
{
    constexpr std::uint64_t highest = std::numeric_limits<std::uint64_t>::max();
    const std::size_t mark = values.find(rangeMark);
    if (mark == std::string_view::npos)
        return !values.empty() && numberIn(values, ~number) == number;
    return numberIn(values.substr(0, mark), 0) <= number &&
           number <= numberIn(values.substr(mark + rangeMark.size()), highest);
}

constexpr std::uint64_t numBits = std::numeric_limits<std::uint64_t>::digits;

bool hasBit(const Value& value, std::uint64_t bit)
{
    return isInteger(value.type()) && bit < numBits && (value.asUnsigned() >> bit & 1U) != 0;
}

/// The value, or the values of an array, each behind what `name` makes of it unless that is nothing or the same.
template <class Name> std::string textOfEach(const Value& value, Name name)
{
    if (value.isNull())
        return valueText(value);
    if (value.isArray())
    {
        std::string text;
        for (const Value& element : value.asList())
            text += (text.empty() ? "" : ", ") + textOfEach(element, name);
        return "[" + text + "]";
    }
    const std::string number = valueText(value);
    const std::string named = name(value);
    return named.empty() || named == number ? number : named + " (" + number + ")";
}

} // namespace

std::string_view valueName(ValueNames names, const Value& value)
{
    if (value.isNull() || !isInteger(value.type()))
        return {};
    const std::uint64_t number = value.asUnsigned();
    const auto covering = [&](bool all)
    {
        return std::find_if(names.begin(), names.end(),
                            [&](const cimple::Value_Name& row)
                            { return (row.values == rangeMark) == all && covers(row.values, number); });
    };
    auto row = covering(false);
    if (row == names.end())
        row = covering(true);
    return row == names.end() ? std::string_view() : row->name;
}

std::string namedValueText(ValueNames names, const Value& value)
{
    return textOfEach(value, [names](const Value& element) { return std::string(valueName(names, element)); });
}

std::string valueWithName(ValueNames names, const Value& value)
{
    const std::string_view name = valueName(names, value);
    return valueText(value) + (name.empty() ? "" : " (" + std::string(name) + ")");
}

std::string namedBitsText(ValueNames bits, const Value& value)
{
    return textOfEach(value,
                      [bits](const Value& element)
                      {
                          std::string names;
                          for (const cimple::Value_Name& row : bits)
                              if (hasBit(element, numberIn(row.values, numBits)))
                                  names += (names.empty() ? "" : ", ") + std::string(row.name);
                          return names;
                      });
}

} // namespace broker
