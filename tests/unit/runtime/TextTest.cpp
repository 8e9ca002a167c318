// Text to value, value to text, and the buffer that assembles text.
#include "runtime/values/Buffer.h"
#include "runtime/values/TextConversion.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <cmath>
#include <limits>
#include <string>

using namespace cimple;

namespace
{

template <class T> bool accepts(const char* text, T expected)
{
    T value{};
    return text_to_value(text, value) == 0 && value == expected;
}

/// Refused, with the value left as it was.
template <class T> bool refuses(const char* text)
{
    T value = static_cast<T>(1);
    return text_to_value(text, value) == -1 && value == static_cast<T>(1);
}

template <class T> std::string text_of(T value)
{
    char buffer[integer_text_size];
    const Integer_Text text = integer_text(value, buffer);
    EXPECT_EQ(text.data[text.size], '\0');
    return {text.data, text.size};
}

template <class T> void round_trips(T value)
{
    RC_ASSERT(text_of(value) == std::to_string(value));
    RC_ASSERT(accepts(text_of(value).c_str(), value));
}

RC_GTEST_PROP(TextProperty, IntegersGoBothWays,
              (std::uint64_t u64, std::int64_t s64, std::uint32_t u32, std::int32_t s32, std::uint8_t u8,
               std::int8_t s8))
{
    round_trips(u64);
    round_trips(s64);
    round_trips(u32);
    round_trips(s32);
    round_trips<std::uint16_t>(static_cast<std::uint16_t>(u32));
    round_trips<std::int16_t>(static_cast<std::int16_t>(s32));
    round_trips(u8);
    round_trips(s8);
}

TEST(Text, IntegersAtTheEdges)
{
    for (const std::uint64_t value : {std::uint64_t{0}, std::uint64_t{9}, std::uint64_t{10}, std::uint64_t{99},
                                      std::uint64_t{100}, std::uint64_t{127}, std::uint64_t{128}, UINT64_MAX})
        EXPECT_EQ(text_of(value), std::to_string(value));
    EXPECT_EQ(text_of(INT64_MIN), "-9223372036854775808");
    EXPECT_EQ(text_of(-1), "-1");

    // Small values need no buffer: all of them share the static texts.
    char one[integer_text_size];
    char other[integer_text_size];
    EXPECT_EQ(integer_text(127, one).data, integer_text(127, other).data);
    EXPECT_NE(integer_text(128, one).data, integer_text(128, other).data);
}

TEST(Text, Booleans)
{
    EXPECT_TRUE(accepts("TRUE", true));
    EXPECT_TRUE(accepts("False", false));
    for (const char* text : {"", "1", "yes", "true ", " true", "tru"})
        EXPECT_TRUE(refuses<bool>(text)) << text;
    EXPECT_TRUE(refuses<bool>(nullptr));
}

TEST(Text, UnsignedIntegers)
{
    EXPECT_TRUE(accepts<std::uint64_t>("18446744073709551615", UINT64_MAX));
    EXPECT_TRUE(accepts<std::uint64_t>("00000000000000000007", 7));
    EXPECT_TRUE(accepts<std::uint64_t>("0x1F", 31));
    EXPECT_TRUE(accepts<std::uint64_t>("0XFFFFFFFFFFFFFFFF", UINT64_MAX));
    EXPECT_TRUE(accepts<std::uint8_t>("255", 255));
    EXPECT_TRUE(accepts<std::uint16_t>("0xFFFF", 65535));
    const char* refused[] = {"",     "+1",  "-1",
                             "0x1f", "0x",  "0x00000000000000001",
                             " 1",   "1 ",  "1.0",
                             "1A",   "x1",  "18446744073709551616",
                             "0x-1", "--1", "000000000000000000007",
                             "0x G"};
    for (const char* text : refused)
        EXPECT_TRUE(refuses<std::uint64_t>(text)) << text;
    EXPECT_TRUE(refuses<std::uint8_t>("256"));
    EXPECT_TRUE(refuses<std::uint16_t>("0x10000"));
    EXPECT_TRUE(refuses<std::uint32_t>("4294967296"));
    EXPECT_TRUE(refuses<std::uint32_t>(nullptr));
}

TEST(Text, SignedIntegers)
{
    EXPECT_TRUE(accepts<std::int8_t>("-128", -128));
    EXPECT_TRUE(accepts<std::int8_t>("+127", 127));
    EXPECT_TRUE(accepts<std::int8_t>("-0x80", -128));
    EXPECT_TRUE(accepts<std::int64_t>("-9223372036854775808", INT64_MIN));
    EXPECT_TRUE(accepts<std::int32_t>("-0", 0));
    EXPECT_TRUE(refuses<std::int8_t>("128"));
    EXPECT_TRUE(refuses<std::int8_t>("-129"));
    EXPECT_TRUE(refuses<std::int64_t>("9223372036854775808"));
    EXPECT_TRUE(refuses<std::int64_t>("-9223372036854775809"));
    for (const char* text : {"", "+", "-", "+-1", "- 1"})
        EXPECT_TRUE(refuses<std::int16_t>(text)) << text;
    EXPECT_TRUE(refuses<std::int16_t>(nullptr));
}

TEST(Text, Reals)
{
    EXPECT_TRUE(accepts("1.0e5", 1.0e5));
    EXPECT_TRUE(accepts("-12.5E-2", -0.125));
    EXPECT_TRUE(accepts("+.5", 0.5));
    EXPECT_TRUE(accepts("1.5", 1.5f));
    EXPECT_TRUE(accepts("1.0e300", std::numeric_limits<float>::infinity()));
    EXPECT_TRUE(accepts("-1.0e300", -std::numeric_limits<float>::infinity()));
    for (const char* text :
         {"", "1.", "12", "1e5", ".", "1.5e", "1.5e+", "1.5 ", " 1.5", "1.5x", "0x1.8p1", "nan", "inf", "1,5", "--1.5"})
    {
        EXPECT_TRUE(refuses<double>(text)) << text;
        EXPECT_TRUE(refuses<float>(text)) << text;
    }
    EXPECT_TRUE(refuses<double>(nullptr));
}

RC_GTEST_PROP(BufferProperty, EditsActLikeStdString, ())
{
    Buffer buffer;
    std::string model;
    const int edits = *rc::gen::inRange(1, 15);
    for (int i = 0; i < edits; ++i)
    {
        const auto pos = *rc::gen::inRange<std::size_t>(0, model.size() + 1);
        const auto piece = *rc::gen::container<std::string>(rc::gen::inRange<char>('a', 'e'));
        switch (*rc::gen::inRange(0, 4))
        {
        case 0:
            buffer.append(piece.c_str());
            model += piece;
            break;
        case 1:
            buffer.insert(pos, piece.data(), piece.size());
            model.insert(pos, piece);
            break;
        case 2:
        {
            const std::string own = model.substr(pos);
            buffer.insert(0, buffer.c_str() + pos, own.size()); // a part of the buffer itself
            model.insert(0, own);
            break;
        }
        case 3:
            buffer.remove(pos, (model.size() - pos) / 2);
            model.erase(pos, (model.size() - pos) / 2);
            break;
        }
        RC_ASSERT(std::string(buffer.c_str()) == model);
        RC_ASSERT(buffer.size() == model.size());
    }
}

TEST(Buffer, CapacityRules)
{
    Buffer buffer;
    EXPECT_EQ(buffer.data(), nullptr);
    EXPECT_STREQ(buffer.c_str(), "");
    buffer.reserve(1);
    EXPECT_EQ(buffer.capacity(), 4096u);
    buffer.reserve(4097);
    EXPECT_EQ(buffer.capacity(), 4097u);
    buffer.reserve(10);
    EXPECT_EQ(buffer.capacity(), 4097u);

    Buffer inserted;
    inserted.insert(0, "12345", 5);
    EXPECT_EQ(inserted.capacity(), 8u);
    inserted.insert(5, "6789", 4);
    EXPECT_EQ(inserted.capacity(), 16u);
}

TEST(Buffer, FormatsTextOfAnyLength)
{
    Buffer buffer;
    buffer.append_integer(-7);
    buffer.append(' ');
    const std::string longer(5000, 'x'); // longer than the first try and than the first reservation
    buffer.appendf("%s|%d", longer.c_str(), 12);
    EXPECT_EQ(buffer.c_str(), "-7 " + longer + "|12");
    EXPECT_EQ(buffer.size(), longer.size() + 6);

    // Exactly the size of the first try, one less and one more.
    for (const std::size_t size : {126u, 127u, 128u, 129u})
    {
        Buffer exact;
        exact.appendf("%s", std::string(size, 'y').c_str());
        EXPECT_EQ(exact.c_str(), std::string(size, 'y'));
    }

    const std::size_t size = buffer.size();
    buffer.appendf("and %lc", static_cast<wint_t>(0x7fffffff)); // no character, in a buffer of any size
    EXPECT_EQ(buffer.size(), size);
    EXPECT_EQ(buffer.c_str()[size], '\0');
}

} // namespace
