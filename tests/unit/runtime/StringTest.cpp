#include "runtime/values/String.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <string>
#include <thread>
#include <vector>

using namespace cimple;

namespace
{

/// One random edit applied to a String and to a std::string.
void edit_both(String& text, std::string& model)
{
    const auto piece = *rc::gen::container<std::string>(rc::gen::inRange<char>('a', 'e'));
    switch (*rc::gen::inRange(0, 8))
    {
    case 0:
        text.append(piece.data(), piece.size());
        model += piece;
        break;
    case 1:
        text.append('x');
        model += 'x';
        break;
    case 2:
        text.assign(piece.data(), piece.size());
        model = piece;
        break;
    case 3:
    {
        const auto pos = *rc::gen::inRange<std::size_t>(0, model.size() + 2);
        text.remove(pos, piece.size());
        if (pos < model.size())
            model.erase(pos, piece.size());
        break;
    }
    case 4:
        text.append(text.c_str(), text.size()); // a part of the string itself
        model += std::string(model);
        break;
    case 5:
        text = text.c_str();
        break;
    case 6:
        text.reserve(piece.size());
        break;
    case 7:
        text.assign(text.c_str() + text.size() / 2, text.size() - text.size() / 2);
        model = model.substr(model.size() / 2);
        break;
    }
}

RC_GTEST_PROP(StringProperty, EditsActLikeStdString, ())
{
    String text;
    std::string model;
    const int edits = *rc::gen::inRange(1, 20);
    for (int i = 0; i < edits; ++i)
    {
        const String before(text);
        const std::string model_before(model);
        if (model.size() < 4096)
            edit_both(text, model);
        RC_ASSERT(text.view() == model);
        RC_ASSERT(text.c_str()[text.size()] == '\0');
        RC_ASSERT(text.capacity() >= text.size());
        RC_ASSERT(before.view() == model_before); // a sharer never sees an edit
    }
}

RC_GTEST_PROP(StringProperty, ComparesLikeStdString, (const std::string& a, const std::string& b))
{
    const String x(a);
    const String y(b);
    RC_ASSERT((x == y) == (a == b));
    RC_ASSERT((x < y) == (a < b));
    RC_ASSERT(x == String(a));
}

TEST(String, CopiesShareUntilOneChanges)
{
    String a("text");
    String b(a);
    EXPECT_TRUE(a.shares(b));
    EXPECT_EQ(a.shares_count(), 2u);

    b.append('!');
    EXPECT_FALSE(a.shares(b));
    EXPECT_EQ(a.shares_count(), 1u);
    EXPECT_EQ(a, "text");
    EXPECT_EQ(b, "text!");

    const char* place = b.c_str();
    b.append('!'); // private and with room: edited in place
    EXPECT_EQ(b.c_str(), place);

    a = *&a;
    EXPECT_EQ(a, "text");
    String moved(std::move(a));
    EXPECT_TRUE(a.empty());
    EXPECT_EQ(moved, "text");
}

TEST(String, EmptyTextsShareOneStaticRepresentation)
{
    String edited("x");
    edited.remove(0, 1);
    for (const String& empty : {String(), String(""), String(static_cast<const char*>(nullptr)), edited})
    {
        EXPECT_TRUE(empty.shares(String()));
        EXPECT_EQ(empty.capacity(), 0u);
        EXPECT_EQ(empty.shares_count(), 0u);
        EXPECT_STREQ(empty.c_str(), "");
    }
}

TEST(String, CapacityIsThePowerOfTwoFrom32)
{
    EXPECT_EQ(String("a").capacity(), 32u);
    EXPECT_EQ(String(std::string(32, 'a')).capacity(), 32u);
    EXPECT_EQ(String(std::string(33, 'a')).capacity(), 64u);
    EXPECT_EQ(String(std::string(100, 'a')).capacity(), 128u);

    String full(std::string(64, 'a'));
    ASSERT_EQ(full.capacity(), 64u);
    full.append('b');
    EXPECT_EQ(full.capacity(), 128u);

    String reserved;
    reserved.reserve(65);
    EXPECT_EQ(reserved.capacity(), 128u);
    EXPECT_TRUE(reserved.empty());
}

TEST(String, ComparesExactlyAndIgnoringCase)
{
    EXPECT_NE(String("Port"), String("port"));
    EXPECT_NE(String("Port"), "Port "); // same start, other length
    EXPECT_NE(String(std::string("a\0b", 3)), String(std::string("a\0c", 3)));
    EXPECT_TRUE(eqi(String("Port"), String("pORT")));
    EXPECT_TRUE(eqi(String("Port"), "pORT"));
    EXPECT_FALSE(eqi(String("Port"), "Ports"));
    EXPECT_FALSE(eqi(String("[ort"), "{ort")); // differ in the bit of case, but are no letters
    EXPECT_TRUE(eqi(String(), static_cast<const char*>(nullptr)));
}

TEST(String, SharesAreCountedAcrossThreads)
{
    const String text("shared between threads");
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
    {
        threads.emplace_back(
            [text]
            {
                for (int j = 0; j < 1000; ++j)
                {
                    String copy(text);
                    String edited(copy);
                    edited.append('x');
                }
            });
    }
    for (std::thread& thread : threads)
        thread.join();
    threads.clear();
    EXPECT_EQ(text.shares_count(), 1u);
}

} // namespace
