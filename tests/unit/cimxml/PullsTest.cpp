// What is kept of results between two requests.
#include "broker/cimxml/Pulls.h"

#include <gtest/gtest.h>

using namespace cimxml;
using namespace std::chrono_literals;

namespace
{

std::optional<Part> open(Pulls& pulls, PulledKind kind, const std::vector<std::string>& elements, std::size_t most,
                         std::chrono::seconds time)
{
    Collected result(pulls);
    for (const std::string& element : elements)
        result.add(element);
    return pulls.open(kind, result, most, time);
}

TEST(Pulls, GiveEachElementOnceAndInOrder)
{
    Pulls pulls;
    std::optional<Part> part = open(pulls, PulledKind::paths, {"a", "b", "c", "d", "e"}, 2, 60s);
    ASSERT_TRUE(part);
    std::vector<std::string> all = part->elements;
    const std::string context = part->context;
    while (!part->context.empty())
    {
        part = pulls.pull(PulledKind::paths, context, 2);
        ASSERT_TRUE(part);
        all.insert(all.end(), part->elements.begin(), part->elements.end());
    }
    EXPECT_EQ(all, (std::vector<std::string>{"a", "b", "c", "d", "e"}));
    EXPECT_FALSE(pulls.pull(PulledKind::paths, context, 1));
    EXPECT_FALSE(pulls.close(context));
}

TEST(Pulls, AreGivenUpInTime)
{
    Pulls pulls;
    const std::string context = open(pulls, PulledKind::instances, {"a"}, 0, -1s)->context;
    EXPECT_FALSE(pulls.pull(PulledKind::instances, context, 1));
    EXPECT_EQ(open(pulls, PulledKind::instances, {}, 0, 60s)->context, "");
}

TEST(Pulls, KeepSoManyAndSoMuchAtOnce)
{
    Pulls pulls;
    std::string first;
    for (int i = 0; i < 64; i++)
    {
        const std::optional<Part> part = open(pulls, PulledKind::paths, {"a"}, 0, 60s);
        ASSERT_TRUE(part) << i;
        first = first.empty() ? part->context : first;
    }
    EXPECT_FALSE(open(pulls, PulledKind::paths, {"a"}, 0, 60s));
    EXPECT_TRUE(pulls.close(first));
    EXPECT_FALSE(open(pulls, PulledKind::paths, {std::string((64 << 20) + 1, 'x')}, 0, 60s));
    EXPECT_TRUE(open(pulls, PulledKind::paths, {std::string(1 << 20, 'x')}, 0, 60s));
    Collected other(pulls);
    EXPECT_FALSE(other.add(std::string(64 << 20, 'x'))) << "what is being collected counts too";
}

} // namespace
