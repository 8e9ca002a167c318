#include "agent/LaneName.h"

#include <gtest/gtest.h>

using namespace cimple;

namespace
{

const LanePath path{"1000027A51160210", "5063D20000000001"};

TEST(LaneName, LeadsBackToItsLane)
{
    const std::pair<Lane, const char*> rows[] = {
        {{path, 0, 0}, "Driver:1000027A51160210:5063D20000000001:0:PrioLane"},
        {{path, 1, allUnits}, "Config:1000027A51160210:5063D20000000001:256:PrioLane"},
        {{path, 1, maxLaneUnit}, "Config:1000027A51160210:5063D20000000001:2147483647:PrioLane"},
    };
    for (const auto& [lane, name] : rows)
    {
        EXPECT_STREQ(laneName(lane).c_str(), name);
        EXPECT_EQ(parseLane(name), lane);
        EXPECT_TRUE(laneName(lane).view().starts_with(laneNamePrefix(path, lane.option).view()));
    }
}

TEST(LaneName, HasOneFormAlone)
{
    const std::string head = "Driver:1000027A51160210:5063D20000000001:";
    const std::string names[] = {
        "",
        ":::::::",
        "PrioLane",
        head,
        head + "3",
        head + ":PrioLane",
        head + "3:PrioLane ",
        head + "3:PrioLane:",
        head + "3::PrioLane",
        head + " 3:PrioLane",
        head + "03:PrioLane",
        head + "-3:PrioLane",
        head + "3.0:PrioLane",
        head + "2147483648:PrioLane",
        head + "4294967299:PrioLane",
        head + std::string(10000, '9') + ":PrioLane",
        std::string("\0", 1) + head + "3:PrioLane",
        head + "3" + std::string("\0", 1) + ":PrioLane",
        "Drive:1000027A51160210:5063D20000000001:3:PrioLane",
        "Driver:1000027a51160210:5063D20000000001:3:PrioLane",
        "Driver:1000027A5116021:5063D20000000001:3:PrioLane",
        "Driver:1000027A51160210:5063D2000000000G:3:PrioLane",
        "Driver:1000027A51160210:\"5063D20000000001:3:PrioLane",
        "1000027A51160210:lun-queue-depth",
    };
    for (const std::string& name : names)
        EXPECT_FALSE(parseLane(name)) << name.substr(0, 80);
}

TEST(LaneName, IsSplitAsFarAsItGoes)
{
    const LaneNameParts whole = splitLaneName("a:b:c:d:e");
    EXPECT_EQ(whole.option, "a");
    EXPECT_EQ(whole.initiator, "b");
    EXPECT_EQ(whole.target, "c");
    EXPECT_EQ(whole.rest, "d:e");
    const LaneNameParts part = splitLaneName("a:");
    EXPECT_EQ(part.option, "a");
    EXPECT_TRUE(part.initiator.empty() && part.target.empty() && part.rest.empty());
}

} // namespace
