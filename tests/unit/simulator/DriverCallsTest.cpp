#include "simulator/SimulatedHost.h"
#include "tests/unit/simulator/Scenarios.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using testing::ElementsAre;

namespace tvrsim
{
namespace
{

TEST(DriverCalls, ParametersThatChangeWithTheDriverWaitForIt)
{
    SimulatedHost host;
    host.load(readScenario(R"({"adapters": [{"name": "A", "ports": [{"wwpn": "1000027A000000A0"}], "driverParameters": [
        {"name": "now", "high": 9}, {"name": "later", "high": 9, "dynamic": 4}]}]})",
                           "test"));
    const auto values = [&]
    {
        std::vector<RM_DriverParam> list;
        EXPECT_EQ(host.driverParameters(portA, list), RM_OK);
        return std::vector{list.at(0).current, list.at(1).current};
    };
    EXPECT_EQ(host.setDriverParameter(portA, "now=0x9", RM_PARAM_PERMANENT), RM_OK);
    EXPECT_EQ(host.setDriverParameter(portA, "later=5", RM_PARAM_PERMANENT), RM_OK);
    EXPECT_EQ(host.setDriverParameter(portA, "now=4", 0), RM_OK);
    EXPECT_THAT(values(), ElementsAre(4, 0));
    host.reboot(false);
    EXPECT_THAT(values(), ElementsAre(9, 5));
    for (const char* text : {"", "now", "now=", "=1", "now=10", "now=1x", "now=4294967297", "no=1"})
        EXPECT_EQ(host.setDriverParameter(portA, text, 0), RM_ERROR) << text;
    EXPECT_EQ(host.setDriverParameter(portA, "now=1", 4), RM_ERROR);
    EXPECT_EQ(host.setDriverParameter(portB, "now=1", 0), RM_ERROR_INVALID_WWN);
    EXPECT_THAT(values(), ElementsAre(9, 5));
}

TEST(DriverCalls, LanesAreKeptForEachOptionAndEachPort)
{
    SimulatedHost host;
    std::string text = twoPorts;
    const std::string member = "\"scsiBus\": 3,";
    text.insert(text.find(member), R"("priorityLanes": [{"target": "tape", "lun": 1, "configState": 0}], )");
    host.load(readScenario(text, "test"));
    const auto lanes = [&](Wwn from, Wwn target, std::uint32_t option)
    {
        std::vector<RM_OASLun> list;
        EXPECT_EQ(host.priorityLanes(portA, from, target, option, list), RM_OK);
        std::string all;
        for (const RM_OASLun& lun : list)
            all += std::to_string(lun.osLun) + "=" + std::to_string(lun.laneState) + " ";
        return all;
    };
    EXPECT_EQ(host.setPriorityLane(portA, 0, disks, 300, 1, RM_LANE_CONFIG), RM_OK);
    EXPECT_EQ(host.setPriorityLane(portA, vport, disks, -1, 1, RM_LANE_DRIVER), RM_OK);
    EXPECT_EQ(lanes(0, tape, RM_LANE_DRIVER), "1=1 ");
    EXPECT_EQ(lanes(0, tape, RM_LANE_CONFIG), "1=0 ");
    EXPECT_EQ(lanes(0, disks, RM_LANE_DRIVER), "300=0 ");
    EXPECT_EQ(lanes(0, disks, RM_LANE_CONFIG), "300=1 ");
    EXPECT_EQ(lanes(vport, disks, RM_LANE_DRIVER), "0=1 300=1 ");
    host.reboot(false);
    EXPECT_EQ(lanes(0, tape, RM_LANE_DRIVER), "1=0 ");
    EXPECT_EQ(lanes(0, disks, RM_LANE_DRIVER), "300=1 ");
    EXPECT_EQ(lanes(vport, disks, RM_LANE_DRIVER), "0=0 300=0 ");

    std::vector<RM_OASLun> list;
    EXPECT_EQ(host.setPriorityLane(portA, 0, disks, 5, 1, RM_LANE_DRIVER), RM_ERROR);
    EXPECT_EQ(host.setPriorityLane(portA, 0, disks, 0, 2, RM_LANE_DRIVER), RM_ERROR);
    EXPECT_EQ(host.setPriorityLane(portA, 0, disks, 0, 1, 2), RM_ERROR);
    EXPECT_EQ(host.setPriorityLane(portA, vport, tape, 1, 1, RM_LANE_DRIVER), RM_ERROR_INVALID_WWN);
    EXPECT_EQ(host.setPriorityLane(portB, 0, disks, 0, 1, RM_LANE_DRIVER), RM_ERROR_NOT_SUPPORTED);
    EXPECT_EQ(host.priorityLanes(portA, portB, disks, RM_LANE_DRIVER, list), RM_ERROR_INVALID_WWN);
    EXPECT_EQ(host.priorityLanes(portA, 0, disks, 2, list), RM_ERROR);
}

} // namespace
} // namespace tvrsim
