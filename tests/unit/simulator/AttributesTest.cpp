#include "simulator/Attributes.h"

#include <gmock/gmock.h>
#include <rapidcheck.h>

#include <algorithm>

namespace tvrsim
{
namespace
{

std::string valueOf(std::span<const std::byte> bytes)
{
    return std::string(reinterpret_cast<const char*>(bytes.data()), bytes.size());
}

AttributeList randomList()
{
    AttributeList list;
    const auto texts = *rc::gen::container<std::vector<std::string>>(rc::gen::arbitrary<std::string>());
    for (std::uint32_t id = 0; id < texts.size(); ++id)
        list.push_back({0x200 + id, AttributeForm::bytes, texts[id]});
    return list;
}

TEST(AttributeBuffer, GivesBackWhatWasPutIn)
{
    EXPECT_TRUE(rc::check(
        []
        {
            const AttributeList list = randomList();
            const std::vector<std::byte> buffer = encodeAttributes(list);
            RC_ASSERT(usedBytes(buffer.data()) == buffer.size());
            for (const Attribute& attribute : list)
            {
                const auto found = findAttribute(buffer, attribute.id);
                RC_ASSERT(found.data() != nullptr);
                RC_ASSERT(valueOf(found) == attribute.value);
            }
            RC_ASSERT(findAttribute(buffer, 0x1FF).data() == nullptr);
        }));
}

TEST(AttributeBuffer, CutAnywhereGivesWholeValuesOrNone)
{
    EXPECT_TRUE(rc::check(
        []
        {
            const AttributeList list = randomList();
            const std::vector<std::byte> buffer = encodeAttributes(list);
            const auto length = *rc::gen::inRange<std::size_t>(0, buffer.size() + 1);
            const std::vector<std::byte> cut(buffer.begin(), buffer.begin() + static_cast<std::ptrdiff_t>(length));
            for (const Attribute& attribute : list)
                if (const auto found = findAttribute(cut, attribute.id); found.data())
                    RC_ASSERT(valueOf(found) == attribute.value);
        }));
}

TEST(AttributeBuffer, ForeignBytesHoldNoAttributes)
{
    const std::vector<std::byte> zeros(64), ones(64, std::byte{0xFF});
    EXPECT_EQ(usedBytes(zeros.data()), 0u);
    EXPECT_EQ(usedBytes(ones.data()), 0u);
    EXPECT_EQ(findAttribute(ones, 0xFFFFFFFF).data(), nullptr);
}

TEST(AttributeBuffer, TextsEndUnlessTheyMustNot)
{
    const AttributeList list = {textAttribute(1, "abc"),
                                textAttribute(2, ""),
                                {3, AttributeForm::absent, "no"},
                                numberAttribute(4, 0x01020304)};
    const auto good = encodeAttributes(list);
    EXPECT_EQ(valueOf(findAttribute(good, 1)), std::string("abc\0", 4));
    EXPECT_EQ(valueOf(findAttribute(good, 2)), std::string("\0", 1));
    EXPECT_EQ(findAttribute(good, 3).data(), nullptr);
    EXPECT_EQ(findAttribute(good, 4).size(), 4u);

    const auto bad = encodeAttributes(list, false);
    for (std::uint32_t id : {1, 2})
        EXPECT_THAT(valueOf(findAttribute(bad, id)), testing::Not(testing::Contains('\0')));
    EXPECT_EQ(findAttribute(bad, 4).size(), 4u);
}

TEST(AttributeRows, NumbersAndNamesAreUnique)
{
    std::vector<std::uint32_t> numbers;
    std::vector<std::string> names;
    for (const auto rows : {adapterAttributeRows, portAttributeRows, statisticsRows, serverAttributeRows})
        for (const AttributeRow& row : rows)
        {
            numbers.push_back(row.id);
            names.emplace_back(row.key);
        }
    std::ranges::sort(numbers);
    std::ranges::sort(names);
    EXPECT_EQ(std::ranges::adjacent_find(numbers), numbers.end());
    EXPECT_EQ(std::ranges::adjacent_find(names), names.end());
}

} // namespace
} // namespace tvrsim
