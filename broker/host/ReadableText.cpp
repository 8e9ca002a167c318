#include "broker/host/ReadableText.h"

#include "broker/values/ValueMap.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <span>
#include <sstream>

namespace broker
{

namespace
{

struct ScaleRow
{
    std::uint64_t factor;
    const char* unit;
};

constexpr std::array<ScaleRow, 7> sizes{{
    {1ULL << 60, "EiB"},
    {1ULL << 50, "PiB"},
    {1ULL << 40, "TiB"},
    {1ULL << 30, "GiB"},
    {1ULL << 20, "MiB"},
    {1ULL << 10, "KiB"},
    {1, "bytes"},
}};

constexpr std::array<ScaleRow, 3> speeds{{{1'000'000'000, "Gbit/s"}, {1'000'000, "Mbit/s"}, {1, "bit/s"}}};

struct UnitRow
{
    std::string_view unit; ///< as the schema has it
    const char* text;
    std::span<const ScaleRow> larger; ///< for numbers that are better read in larger units
};

constexpr UnitRow units[] = {
    {"bit / second", "bit/s", speeds},
    {"byte", "bytes", sizes},
    {"percent", "%", {}},
    {"degree celsius", "°C", {}},
    {"volt", "V", {}},
    {"ampere * 10^-3", "mA", {}},
    {"watt * 10^-3", "mW", {}},
    {"meter * 10^-9", "nm", {}},
    {"meter", "m", {}},
    {"second", "s", {}},
    {"second * 10^-3", "ms", {}},
};

/// Null for a unit that is not in the table.
const UnitRow* rowOfUnit(std::string_view unit)
{
    const auto* row = std::ranges::find(units, unit, &UnitRow::unit);
    return row == std::end(units) ? nullptr : row;
}

/// The largest unit that is not above the number.
const ScaleRow& scaleOf(std::uint64_t number, std::span<const ScaleRow> rows)
{
    const auto row = std::find_if(rows.begin(), rows.end(), [&](const ScaleRow& r) { return number >= r.factor; });
    return row == rows.end() ? rows.back() : *row;
}

/// True if the number has no more than one decimal in its largest unit.
bool isRound(std::uint64_t number, std::span<const ScaleRow> rows)
{
    constexpr std::uint64_t tenths = 10;
    const std::uint64_t factor = scaleOf(number, rows).factor;
    return number % factor * tenths % factor == 0;
}

/// In the largest unit that is not above the number, with one decimal where that is not 0.
std::string scaled(std::uint64_t number, std::span<const ScaleRow> rows)
{
    const ScaleRow* row = &scaleOf(number, rows);
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), "%.1f", static_cast<double>(number) / static_cast<double>(row->factor));
    std::string result = text.data();
    if (result.ends_with(".0"))
        result.resize(result.size() - 2);
    return result + " " + row->unit;
}

bool isNumber(CMPIType type)
{
    const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    return isInteger(element) || element == CMPI_real32 || element == CMPI_real64;
}

} // namespace

std::string sizeText(std::uint64_t bytes)
{
    return scaled(bytes, sizes);
}

std::string speedText(std::uint64_t bitsPerSecond)
{
    return bitsPerSecond == 0 ? std::string() : scaled(bitsPerSecond, speeds);
}

std::string unitText(std::string_view unit)
{
    const UnitRow* row = rowOfUnit(unit);
    return row ? row->text : std::string(unit);
}

std::string measureText(std::string_view unit, const Value& value)
{
    if (value.isNull())
        return valueText(value);
    if (value.isArray())
    {
        std::string text;
        for (const Value& element : value.asList())
            text += (text.empty() ? "" : ", ") + measureText(unit, element);
        return "[" + text + "]";
    }
    const UnitRow* row = rowOfUnit(unit);
    const bool scalable = row && !row->larger.empty() && isInteger(value.type()) && !isSignedInteger(value.type());
    if (scalable && isRound(value.asUnsigned(), row->larger))
        return scaled(value.asUnsigned(), row->larger);
    return valueText(value) + " " + unitText(unit);
}

std::string shownText(const ClassInfo* info, const Value& value, std::string_view feature, std::string_view parameter)
{
    if (!info || !isNumber(value.type()))
        return oneLine(valueText(value));
    if (const ValueNames names = valueNames(*info, feature, parameter); !names.empty())
        return namedValueText(names, value);
    if (const ValueNames bits = bitNames(*info, feature, parameter); !bits.empty())
        return namedBitsText(bits, value);
    const std::string_view unit = unitOf(*info, feature, parameter);
    return unit.empty() ? valueText(value) : measureText(unit, value);
}

std::string countText(std::uint64_t count, const char* singular, const char* plural)
{
    return std::to_string(count) + " " + (count == 1 ? singular : plural);
}

std::string inSentence(std::string name)
{
    if (name.size() > 1 && lowerLetter(name[1]) == name[1])
        name[0] = lowerLetter(name[0]);
    return name;
}

std::string inCapitals(std::string text)
{
    std::ranges::transform(text, text.begin(),
                           [](char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; });
    return text;
}

std::string withSingleBlanks(const std::string& text)
{
    std::string result;
    for (const char c : text)
        if (c != ' ' || (!result.empty() && result.back() != ' '))
            result += c;
    if (result.ends_with(' '))
        result.pop_back();
    return result;
}

std::size_t displayWidth(const std::string& text)
{
    constexpr unsigned continuationMask = 0xC0;
    constexpr unsigned continuation = 0x80;
    return static_cast<std::size_t>(std::count_if(
        text.begin(), text.end(), [](unsigned char c) { return (c & continuationMask) != continuation; }));
}

std::string padded(const std::string& text, std::size_t width)
{
    const std::size_t shown = displayWidth(text);
    return shown < width ? text + std::string(width - shown, ' ') : text;
}

std::string shortened(const std::string& text, std::size_t characters)
{
    if (displayWidth(text) <= characters)
        return text;
    std::string head = text;
    while (displayWidth(head) >= characters)
    {
        constexpr unsigned continuationMask = 0xC0;
        constexpr unsigned continuation = 0x80;
        while ((static_cast<unsigned char>(head.back()) & continuationMask) == continuation)
            head.pop_back();
        head.pop_back();
    }
    return head + "…";
}

std::vector<std::string> lines(const std::string& text, std::size_t characters)
{
    std::vector<std::string> result;
    std::istringstream words(text);
    for (std::string word; words >> word;)
    {
        if (result.empty() || displayWidth(result.back()) + 1 + displayWidth(word) > characters)
            result.push_back(shortened(word, characters));
        else
            result.back() += " " + word;
    }
    return result;
}

} // namespace broker
