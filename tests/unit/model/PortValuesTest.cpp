// What the HBA API says of a port, value by value.
#include "model/PortValues.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>

using namespace cimple;
using testing::ElementsAre;

namespace
{

using Values = std::vector<std::uint16_t>;
using Answer = std::pair<std::uint16_t, std::string>;

Values valuesOf(const Array<std::uint16_t>& array)
{
    return Values(array.data(), array.data() + array.size());
}

Answer answerOf(const ValueText& value)
{
    return {value.value, value.text};
}

/// Every code below 64 and the largest give the answer of the map, or 0 and "Unknown".
void expectMap(ValueText (*function)(std::uint32_t), const std::map<std::uint32_t, Answer>& known)
{
    for (std::uint32_t i = 0; i <= 64; i++)
    {
        const std::uint32_t code = i == 64 ? 0xFFFFFFFF : i;
        const auto row = known.find(code);
        EXPECT_EQ(answerOf(function(code)), row == known.end() ? Answer(0, "Unknown") : row->second) << code;
    }
}

TEST(PortValues, TypesAndStates)
{
    expectMap(portType, {{2, {1, "Other"}},
                         {5, {10, "N"}},
                         {6, {11, "NL"}},
                         {7, {16, "FL"}},
                         {8, {15, "F"}},
                         {9, {14, "E"}},
                         {10, {18, "G"}},
                         {20, {1, "Private Loop"}},
                         {21, {1, "Point to Point"}}});
    std::map<std::uint32_t, Answer> states = {{2, {2, "OK"}},        {3, {10, "Stopped"}},   {4, {1, "Other"}},
                                              {6, {1, "Other"}},     {5, {11, "InService"}}, {7, {6, "Error"}},
                                              {8, {11, "InService"}}};
    expectMap(controllerStatus, states);
    states[8] = {32776, "InService"};
    states[20] = {32788, "Operational. Need RESET"};
    states[21] = {32789, "Link down. Need RESET"};
    states[22] = {32790, "Disable"};
    expectMap(portStatus, states);
}

TEST(PortValues, ClassesOfServiceStandInTheOrderOfTheirBits)
{
    const std::pair<std::uint32_t, Values> rows[] = {
        {0x00, {0}}, {0x01, {7}}, {0x02, {1}}, {0x04, {2}},       {0x08, {3}},    {0x10, {4}},
        {0x20, {0}}, {0x40, {5}}, {0x80, {0}}, {0xFFFFFFA0, {0}}, {0x0C, {2, 3}}, {0x5F, {7, 1, 2, 3, 4, 5}},
    };
    for (const auto& [mask, values] : rows)
        EXPECT_EQ(valuesOf(classesOfService(mask)), values) << mask;
}

TEST(PortValues, SpeedsByCodeAndByMask)
{
    const std::map<std::uint32_t, std::uint64_t> speeds = {{1, 1'000'000'000},  {2, 2'000'000'000},
                                                           {4, 10'000'000'000}, {8, 4'000'000'000},
                                                           {16, 8'000'000'000}, {32, 16'000'000'000}};
    for (std::uint32_t code = 0; code < 130; code++)
        EXPECT_EQ(portSpeed(code), speeds.contains(code) ? speeds.at(code) : 0) << code;
    const std::pair<std::uint32_t, std::uint64_t> masks[] = {
        {0, 0},
        {64, 0},
        {1, 1'000'000'000},
        {3, 2'000'000'000},
        {11, 4'000'000'000},
        {26, 8'000'000'000},
        {4 + 16, 10'000'000'000}, // 10 Gbit/s beats 8
        {63, 16'000'000'000},
    };
    for (const auto& [mask, speed] : masks)
        EXPECT_EQ(fastestSpeed(mask), speed) << mask;
}

/// A list with one bit.
Values typesOf(std::size_t place, std::uint8_t bits)
{
    std::array<std::uint8_t, 32> types{};
    types[place] = bits;
    Array<std::uint16_t> values;
    appendFc4Types(types, values);
    return valuesOf(values);
}

TEST(PortValues, EachFc4BitHasItsValueOrIsAnother)
{
    // By place and bit. The bit of place 8 is a type of its own and another all the same.
    const std::map<std::pair<std::size_t, int>, Values> known = {
        {{3, 0x10}, {4}},  {{3, 0x20}, {5}},     {{2, 0x01}, {8}},   {{2, 0x02}, {9}},  {{1, 0x02}, {17}},
        {{1, 0x04}, {18}}, {{1, 0x08}, {19}},    {{1, 0x20}, {21}},  {{1, 0x40}, {22}}, {{1, 0x80}, {23}},
        {{0, 0x02}, {25}}, {{0, 0x04}, {26}},    {{0, 0x08}, {27}},  {{0, 0x10}, {28}}, {{7, 0x01}, {32}},
        {{7, 0x04}, {34}}, {{7, 0x10}, {36}},    {{11, 0x01}, {64}}, {{9, 0x01}, {80}}, {{9, 0x02}, {81}},
        {{9, 0x04}, {82}}, {{8, 0x01}, {88, 1}}, {{15, 0x01}, {96}},
    };
    for (std::size_t place = 0; place < 32; place++)
        for (int bit = 1; bit < 256; bit *= 2)
        {
            const auto row = known.find({place, bit});
            EXPECT_EQ(typesOf(place, static_cast<std::uint8_t>(bit)), row == known.end() ? Values{1} : row->second)
                << place << " " << bit;
        }
    EXPECT_EQ(typesOf(0, 0), Values{0});
    EXPECT_EQ(typesOf(3, 0xFF), (Values{4, 5, 1})) << "one value for all others";
}

} // namespace
