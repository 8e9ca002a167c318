#include "model/PortValues.h"

#include <algorithm>
#include <iterator>
#include <span>

namespace cimple
{

namespace
{

struct ValueRow
{
    std::uint32_t code;
    ValueText value;
};

constexpr ValueText unknown = {0, "Unknown"};

constexpr ValueRow portTypes[] = {
    {2, {1, "Other"}},
    {5, {10, "N"}},
    {6, {11, "NL"}},
    {7, {16, "FL"}},
    {8, {15, "F"}},
    {9, {14, "E"}},
    {10, {18, "G"}},
    {20, {1, "Private Loop"}},
    {21, {1, "Point to Point"}},
};

constexpr ValueRow portStates[] = {
    {2, {2, "OK"}},
    {3, {10, "Stopped"}},
    {4, {1, "Other"}},
    {5, {11, "InService"}},
    {6, {1, "Other"}},
    {7, {6, "Error"}},
    {8, {32776, "InService"}},
    {20, {32788, "Operational. Need RESET"}},
    {21, {32789, "Link down. Need RESET"}},
    {22, {32790, "Disable"}},
};

constexpr ValueRow controllerStates[] = {
    {2, {2, "OK"}},         {3, {10, "Stopped"}}, {4, {1, "Other"}},      {6, {1, "Other"}},
    {5, {11, "InService"}}, {7, {6, "Error"}},    {8, {11, "InService"}},
};

ValueText lookUp(std::span<const ValueRow> rows, std::uint32_t code)
{
    const auto row = std::ranges::find(rows, code, &ValueRow::code);
    return row == rows.end() ? unknown : row->value;
}

struct BitRow
{
    std::uint8_t bit;
    std::uint16_t value;
};

constexpr BitRow classes[] = {{0x01, 7}, {0x02, 1}, {0x04, 2}, {0x08, 3}, {0x10, 4}, {0x40, 5}};

struct Fc4Row
{
    std::uint8_t place;
    std::uint8_t bit;
    std::uint16_t value;
};

constexpr Fc4Row fc4Types[] = {
    {3, 0x10, 4},  {3, 0x20, 5},  {2, 0x01, 8},  {2, 0x02, 9},  {1, 0x02, 17},  {1, 0x04, 18},
    {1, 0x08, 19}, {1, 0x20, 21}, {1, 0x40, 22}, {1, 0x80, 23}, {0, 0x02, 25},  {0, 0x04, 26},
    {0, 0x08, 27}, {0, 0x10, 28}, {7, 0x01, 32}, {7, 0x04, 34}, {7, 0x10, 36},  {11, 0x01, 64},
    {9, 0x01, 80}, {9, 0x02, 81}, {9, 0x04, 82}, {8, 0x01, 88}, {15, 0x01, 96},
};

constexpr std::uint16_t otherFc4Type = 1;

/// Bits that stand for a type without a value of its own.
constexpr std::uint8_t otherFc4Bits(std::size_t place)
{
    switch (place)
    {
    case 0:
        return 0xE1;
    case 1:
        return 0x11;
    case 2:
        return 0xFC;
    case 3:
        return 0xCF;
    case 7:
        return 0xEA;
    case 9:
        return 0xF8;
    case 11:
    case 15:
        return 0xFE;
    default:
        return 0xFF;
    }
}

struct SpeedRow
{
    std::uint32_t code;
    std::uint64_t bitsPerSecond;
};

constexpr std::uint64_t gigabit = 1'000'000'000;

/// Fastest first: code 4 is 10 Gbit/s.
constexpr SpeedRow speeds[] = {{32, 16 * gigabit}, {4, 10 * gigabit}, {16, 8 * gigabit},
                               {8, 4 * gigabit},   {2, 2 * gigabit},  {1, gigabit}};

} // namespace

ValueText portType(std::uint32_t type)
{
    return lookUp(portTypes, type);
}

ValueText portStatus(std::uint32_t state)
{
    return lookUp(portStates, state);
}

ValueText controllerStatus(std::uint32_t state)
{
    return lookUp(controllerStates, state);
}

Array<std::uint16_t> classesOfService(std::uint32_t mask)
{
    Array<std::uint16_t> values;
    for (const BitRow& row : classes)
        if (mask & row.bit)
            values.append(row.value);
    if (values.size() == 0)
        values.append(0);
    return values;
}

void appendFc4Types(const std::array<std::uint8_t, 32>& types, Array<std::uint16_t>& out)
{
    if (std::ranges::all_of(types, [](std::uint8_t bits) { return bits == 0; }))
    {
        out.append(0);
        return;
    }
    for (const Fc4Row& row : fc4Types)
        if (types[row.place] & row.bit)
            out.append(row.value);
    for (std::size_t place = 0; place < types.size(); place++)
        if (types[place] & otherFc4Bits(place))
        {
            out.append(otherFc4Type);
            return;
        }
}

std::uint64_t portSpeed(std::uint32_t code)
{
    const auto row = std::ranges::find(speeds, code, &SpeedRow::code);
    return row == std::end(speeds) ? 0 : row->bitsPerSecond;
}

std::uint64_t fastestSpeed(std::uint32_t mask)
{
    const auto row = std::ranges::find_if(speeds, [&](const SpeedRow& speed) { return (mask & speed.code) != 0; });
    return row == std::end(speeds) ? 0 : row->bitsPerSecond;
}

} // namespace cimple
