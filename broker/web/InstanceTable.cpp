#include "broker/web/InstanceTable.h"

#include "broker/host/ReadableText.h"
#include "broker/values/PathText.h"
#include "broker/web/Failure.h"

#include <algorithm>
#include <bit>
#include <numeric>
#include <span>

namespace web
{

using namespace broker;

namespace
{

constexpr std::size_t longestText = 1000; ///< of a cell; the instance has the rest
constexpr std::uint32_t nullMark = 1U << 31;

bool isNumber(CMPIType type)
{
    return isInteger(type) || type == CMPI_real32 || type == CMPI_real64;
}

/// A number whose order is that of the values of its type.
std::uint64_t rank(const Value& value)
{
    constexpr std::uint64_t sign = 1ULL << 63;
    if (value.isNull() || !isNumber(value.type()))
        return 0;
    if (isInteger(value.type()))
        return isSignedInteger(value.type()) ? static_cast<std::uint64_t>(value.asSigned()) ^ sign : value.asUnsigned();
    const auto bits = std::bit_cast<std::uint64_t>(value.asReal());
    return bits & sign ? ~bits : bits | sign;
}

/// A readable text that is not too long, cut between two characters.
std::string cellText(const ClassInfo* info, const Property& property)
{
    std::string text = shownText(info, property.value, property.name);
    if (text.size() <= longestText)
        return text;
    constexpr unsigned continuationMask = 0xC0;
    constexpr unsigned continuation = 0x80;
    std::size_t end = longestText;
    while (end > 0 && (static_cast<unsigned char>(text[end]) & continuationMask) == continuation)
        end--;
    return text.substr(0, end) + "…";
}

} // namespace

InstanceTable::InstanceTable(const ClassTable& classes, const ClassInfo& info) : _classes(classes)
{
    for (const FeatureInfo& property : info.properties)
    {
        if (isNumber(property.type))
            _numbers[_columns.size()];
        _columns.push_back(property.name);
    }
}

void InstanceTable::add(const Object& object)
{
    const ClassInfo* info = _classes.find(object.path.className);
    Row row{fullPathText(object.path), {}, {}};
    row.ends.reserve(_columns.size());
    for (std::size_t column = 0; column < _columns.size(); column++)
    {
        const Property* property = findNamed(object.properties, _columns[column]);
        const bool isNull = !property || property->value.isNull();
        if (!isNull)
            row.texts += cellText(info, *property);
        row.texts += '\n';
        row.ends.push_back(static_cast<std::uint32_t>(row.texts.size()) | (isNull ? nullMark : 0));
        if (const auto numbers = _numbers.find(column); numbers != _numbers.end())
            numbers->second.push_back(isNull ? 0 : rank(property->value));
    }
    row.texts.shrink_to_fit();
    _bytes += sizeof(Row) + row.path.capacity() + row.texts.capacity() + row.ends.size() * sizeof(std::uint32_t) +
              _numbers.size() * sizeof(std::uint64_t);
    _rows.push_back(std::move(row));
}

std::optional<std::string_view> InstanceTable::text(std::size_t row, std::size_t column) const
{
    if (isNull(row, column))
        return std::nullopt;
    const Row& found = _rows[row];
    const std::size_t begin = column == 0 ? 0 : found.ends[column - 1] & ~nullMark;
    return std::string_view(found.texts).substr(begin, found.ends[column] - begin - 1);
}

std::vector<std::size_t> InstanceTable::select(const Selection& selection) const
{
    std::vector<std::size_t> rows(_rows.size());
    std::iota(rows.begin(), rows.end(), 0);
    if (!selection.find.empty())
        std::erase_if(rows, [&, wanted = lowerCase(oneLine(selection.find))](std::size_t row)
                      { return !has(_rows[row], wanted); });
    if (selection.sort.empty())
        return rows;
    const std::size_t column = columnOf(selection.sort);
    const auto nulls =
        std::stable_partition(rows.begin(), rows.end(), [&](std::size_t row) { return !isNull(row, column); });
    const std::span<std::size_t> valued(rows.begin(), nulls);
    const auto sortBy = [&](auto key)
    {
        std::ranges::stable_sort(valued, [&](std::size_t a, std::size_t b)
                                 { return selection.descending ? key(b) < key(a) : key(a) < key(b); });
    };
    if (const auto numbers = _numbers.find(column); numbers != _numbers.end())
        sortBy([&](std::size_t row) { return numbers->second[row]; });
    else
        sortBy([&](std::size_t row) { return *text(row, column); });
    return rows;
}

std::size_t InstanceTable::columnOf(const std::string& name) const
{
    const auto found =
        std::ranges::find_if(_columns, [&](const std::string& column) { return sameName(column, name); });
    if (found == _columns.end())
        throw ArgumentFailure("sort: there is no property '" + name + "'");
    return static_cast<std::size_t>(found - _columns.begin());
}

bool InstanceTable::has(const Row& row, std::string_view wanted) const
{
    const auto contains = [&](std::string_view text)
    {
        return std::search(text.begin(), text.end(), wanted.begin(), wanted.end(),
                           [](char a, char b) { return lowerLetter(a) == b; }) != text.end();
    };
    return contains(row.texts) || contains(row.path);
}

bool InstanceTable::isNull(std::size_t row, std::size_t column) const
{
    return (_rows[row].ends[column] & nullMark) != 0;
}

} // namespace web
