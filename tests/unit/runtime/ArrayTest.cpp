#include "runtime/values/Array.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <string>
#include <vector>

using namespace cimple;

namespace
{

String make_element(int n, const String*)
{
    return String(std::to_string(n).c_str());
}

std::uint16_t make_element(int n, const std::uint16_t*)
{
    return static_cast<std::uint16_t>(n);
}

std::string make_element(int n, const std::string*)
{
    return std::to_string(n); // short texts point into their own object: bytes must not be moved
}

template <class T> void expect_same(const Array<T>& array, const std::vector<T>& model)
{
    RC_ASSERT(array.size() == model.size());
    RC_ASSERT(array.capacity() >= array.size());
    for (std::size_t i = 0; i < model.size(); ++i)
        RC_ASSERT(array[i] == model[i]);
}

template <class T> void edit_both(Array<T>& array, std::vector<T>& model)
{
    const auto pos = *rc::gen::inRange<std::size_t>(0, model.size() + 1);
    const T element = make_element(*rc::gen::inRange(0, 100), static_cast<const T*>(nullptr));
    switch (*rc::gen::inRange(0, 7))
    {
    case 0:
        array.append(element);
        model.push_back(element);
        break;
    case 1:
        array.prepend(element);
        model.insert(model.begin(), element);
        break;
    case 2:
        array.insert(pos, element);
        model.insert(model.begin() + static_cast<std::ptrdiff_t>(pos), element);
        break;
    case 3:
    {
        const auto count = *rc::gen::inRange<std::size_t>(0, model.size() - pos + 1);
        array.remove(pos, count);
        model.erase(model.begin() + static_cast<std::ptrdiff_t>(pos),
                    model.begin() + static_cast<std::ptrdiff_t>(pos + count));
        break;
    }
    case 4:
        array.resize(pos * 2, &element);
        model.resize(pos * 2, element);
        break;
    case 5:
    {
        const std::vector<T> copy(model);
        array.append(array.data(), array.size()); // its own elements
        model.insert(model.end(), copy.begin(), copy.end());
        break;
    }
    case 6:
        if (pos < model.size())
        {
            const T copy(model[pos]);
            array.resize(model.size() + 3, &array[pos]); // filled with one of its own
            model.resize(model.size() + 3, copy);
        }
        break;
    }
}

template <class T> void acts_like_vector()
{
    Array<T> array;
    std::vector<T> model;
    const int edits = *rc::gen::inRange(1, 25);
    for (int i = 0; i < edits && model.size() < 500; ++i)
    {
        edit_both(array, model);
        expect_same(array, model);
    }
    Array<T> copy(array);
    RC_ASSERT(copy == array);
    copy.append(make_element(1, static_cast<const T*>(nullptr)));
    RC_ASSERT(!(copy == array));
    copy = array;
    copy = *&copy;
    expect_same(copy, model);
    expect_same(array, model);
}

RC_GTEST_PROP(ArrayProperty, OfNumbersActsLikeVector, ())
{
    acts_like_vector<std::uint16_t>();
}

RC_GTEST_PROP(ArrayProperty, OfStringsActsLikeVector, ())
{
    acts_like_vector<String>();
}

RC_GTEST_PROP(ArrayProperty, OfOtherTypesActsLikeVector, ())
{
    acts_like_vector<std::string>();
}

TEST(Array, GrowsToExactlyWhatIsAskedFor)
{
    Array<std::uint32_t> array;
    EXPECT_EQ(array.capacity(), 8u);
    EXPECT_EQ(array.size(), 0u);
    array.reserve(5);
    EXPECT_EQ(array.capacity(), 8u);
    for (std::uint32_t i = 0; i < 8; ++i)
        array.append(i);
    EXPECT_EQ(array.capacity(), 8u);
    array.append(8);
    EXPECT_EQ(array.capacity(), 9u);
    array.append(9);
    EXPECT_EQ(array.capacity(), 10u);
    array.reserve(100);
    EXPECT_EQ(array.capacity(), 100u);
    array.clear();
    EXPECT_EQ(array.capacity(), 100u);

    Array<std::uint32_t> reserved;
    reserved.reserve(9);
    EXPECT_EQ(reserved.capacity(), 9u);
}

TEST(Array, FindReturnsTheIndexOnlyWithAnEqualityFunction)
{
    const Array<String> texts{"a", "b", "c"};
    EXPECT_EQ(texts.find("a"), 0);
    EXPECT_EQ(texts.find("c"), 2);
    EXPECT_EQ(texts.find("C"), -1);

    const Array<std::uint16_t> numbers{10, 20, 30};
    EXPECT_EQ(numbers.find(10), 1);
    EXPECT_EQ(numbers.find(30), 1);
    EXPECT_EQ(numbers.find(40), -1);
}

TEST(Array, CopiesAreDeep)
{
    Array<String> a{"x", "y"};
    Array<String> b(a);
    b[0].append('!');
    b.append("z");
    EXPECT_EQ(a[0], "x");
    EXPECT_EQ(a.size(), 2u);

    Array<String> moved(std::move(b));
    EXPECT_EQ(moved.size(), 3u);
    b = a; // a moved-from array may be assigned
    EXPECT_TRUE(b == a);
}

TEST(Array, ResizeZeroFillsPlainElements)
{
    Array_Base array(array_traits(UINT64));
    array.resize(3);
    EXPECT_EQ(*static_cast<const std::uint64_t*>(array.at(2)), 0u);
    Array<String> texts;
    texts.resize(2);
    EXPECT_EQ(texts[1], "");
}

TEST(Array, TraitsFollowTheTypeCode)
{
    for (std::uint32_t type = 0; type < num_types; ++type)
        EXPECT_EQ(array_traits(type)->element_size, type_width(type)) << type_name(type);
    EXPECT_EQ(array_traits_of<std::uint16_t>(), array_traits(UINT16));
    EXPECT_EQ(array_traits_of<Datetime>(), array_traits(DATETIME));
    EXPECT_EQ(array_traits_of<Instance*>(), instance_array_traits());
}

/// Throws from its third copy on, and counts the living.
struct Fragile
{
    static inline int alive = 0;
    static inline int copies = 0;

    Fragile() { ++alive; }
    Fragile(const Fragile&)
    {
        if (++copies > 2)
            throw 1;
        ++alive;
    }
    ~Fragile() { --alive; }
};

TEST(Array, ACopyThatThrowsLeaksNothing)
{
    {
        const Fragile elements[3];
        Fragile::copies = -3; // three go into the source, two into the copy
        Array<Fragile> source;
        source.append(elements, 3);
        EXPECT_THROW(Array<Fragile> copy(source), int);
        Fragile::copies = 0;
        Array<Fragile> target;
        EXPECT_THROW(target = source, int);
        EXPECT_EQ(target.size(), 0u);

        // Elements that move by copies: the array keeps what it had.
        const auto refused = [&](auto change)
        {
            Fragile::copies = 0;
            EXPECT_THROW(change(), int);
            EXPECT_EQ(source.size(), 3u);
            EXPECT_EQ(Fragile::alive, 6);
        };
        Fragile::copies = -100;
        refused([&] { source.reserve(100); });
        refused([&] { source.insert(0, elements[0]); });
        refused([&] { source.Array_Base::insert(1, elements, 3); });
        Fragile::copies = 2;
        EXPECT_THROW(source.remove(0), int);
        EXPECT_EQ(source.size(), 3u);
        Fragile::copies = -100;
        source.remove(1);
        source.prepend(elements[0]);
        EXPECT_EQ(source.size(), 3u);
    }
    EXPECT_EQ(Fragile::alive, 0);
}

TEST(ArrayDeathTest, PositionsOutsideAreAsserted)
{
    Array<std::uint8_t> array{1, 2};
    EXPECT_DEATH(array[2], "Array.cpp\\([0-9]+\\): .*: assert: index < _rep->size");
    EXPECT_DEATH(array.remove(1, 2), "assert");
}

} // namespace
