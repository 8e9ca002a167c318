#include "device/Vpd.h"

#include <algorithm>

namespace cimple
{

namespace
{

using Bytes = std::span<const std::uint8_t>;

constexpr std::uint8_t largeResource = 0x80;
constexpr std::uint8_t identifierTag = 0x82;
constexpr std::uint8_t readOnlyTag = 0x90;
constexpr std::uint8_t readWriteTag = 0x91;
constexpr std::uint8_t endTag = 0x78; ///< of a small resource, whose length is in the lower three bits

struct NameRow
{
    std::string_view keyword;
    std::string_view name;
};

constexpr NameRow names[] = {
    {"CP", "EXT_CAPABILITY"},   {"EC", "EC_LEVEL"},
    {"FG", "FABRIC_GEOGRAPHY"}, {"LC", "LOCATION"},
    {"MN", "MANUFACTURER_ID"},  {"PG", "PCI_GEOGRAPHY"},
    {"PN", "PART_NUMBER"},      {"SN", "SERIAL_NUMBER"},
    {"YX", "YX (VPD-W)"},       {vpdProductKeyword, "PRODUCT_NAME"},
};

/// Takes `count` bytes off the front of `rest`; false, and nothing taken, if there are fewer.
bool take(Bytes& rest, std::size_t count, Bytes& out)
{
    if (rest.size() < count)
        return false;
    out = rest.first(count);
    rest = rest.subspan(count);
    return true;
}

bool isPrintable(std::uint8_t byte)
{
    return byte >= 0x20 && byte < 0x7F;
}

std::string printable(Bytes value)
{
    while (!value.empty() && (value.back() == 0 || value.back() == ' '))
        value = value.first(value.size() - 1);
    if (std::ranges::all_of(value, isPrintable))
        return std::string(value.begin(), value.end());
    constexpr char digits[] = "0123456789ABCDEF";
    std::string text;
    for (const std::uint8_t byte : value)
        (text += digits[byte >> 4]) += digits[byte & 15];
    return text;
}

/// The keywords of a resource. False if one of them ends the walk.
bool walkKeywords(Bytes resource, std::vector<VpdField>& fields)
{
    while (!resource.empty())
    {
        Bytes head, value;
        if (!take(resource, 3, head) || !isPrintable(head[0]) || !isPrintable(head[1]) ||
            !take(resource, head[2], value))
            return false;
        const std::string keyword(head.begin(), head.begin() + 2);
        if (keyword != "RV" && keyword != "RW")
            fields.push_back({keyword, printable(value)});
    }
    return true;
}

} // namespace

std::vector<VpdField> walkVpd(Bytes area)
{
    std::vector<VpdField> fields;
    for (Bytes tag; take(area, 1, tag);)
    {
        Bytes length, resource;
        if (!(tag[0] & largeResource))
        {
            if ((tag[0] & ~7) == endTag || !take(area, tag[0] & 7, resource))
                break;
            continue;
        }
        if (!take(area, 2, length))
            break;
        const std::size_t wanted = length[0] | length[1] << 8;
        const bool isWhole = take(area, wanted, resource);
        if (tag[0] == identifierTag && isWhole)
            fields.push_back({std::string(vpdProductKeyword), printable(resource)});
        if (tag[0] == readOnlyTag || tag[0] == readWriteTag)
            if (!walkKeywords(isWhole ? resource : area, fields))
                break;
        if (!isWhole)
            break;
    }
    return fields;
}

std::string vpdName(std::string_view keyword)
{
    const auto row = std::ranges::find(names, keyword, &NameRow::keyword);
    return std::string("VPD:").append(row == std::end(names) ? keyword : row->name);
}

} // namespace cimple
