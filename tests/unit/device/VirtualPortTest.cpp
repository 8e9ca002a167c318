#include "FakeHost.h"

#include "device/TVR_MethodWrapper.h"

#include <cstring>
#include <gmock/gmock.h>

using namespace cimple;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::SizeIs;

namespace
{

using W = TVR_MethodWrapper;

constexpr const char* portId = "1000112233123456";
constexpr const char* vportId = "1000112233000001";
constexpr const char* targetId = "5000000000000001";

class VirtualPortTest : public testing::Test
{
protected:
    LoadedHost host;
    LogCapture log;
};

TEST_F(VirtualPortTest, ListsGrowToWhatTheLibraryHas)
{
    for (const std::size_t count : {0, 1, 64, 65, 500})
    {
        host.vports.assign(count, {});
        for (std::size_t i = 0; i < count; ++i)
            host.vports[i].wwpn = wwn(i);
        std::vector<RM_VPortEntry> out(3);
        EXPECT_EQ(W::ListVPorts(portId, &out), 0);
        ASSERT_THAT(out, SizeIs(count));
        EXPECT_TRUE(count == 0 || std::memcmp(out.data(), host.vports.data(), count * sizeof out[0]) == 0);
    }
    EXPECT_EQ(host.calls["LRM_VPList"], 3 + 2 * 2);
}

TEST_F(VirtualPortTest, FailuresLeaveTheOutput)
{
    std::vector<RM_VPortEntry> out(3);
    host.statuses["LRM_VPList"] = {2};
    EXPECT_EQ(W::ListVPorts(portId, &out), 2);
    host.statuses["LRM_VPList"] = {7, 7, 7, 7};
    EXPECT_EQ(W::ListVPorts(portId, &out), 7); // no end to more data
    EXPECT_EQ(host.calls["LRM_VPList"], 4);
    EXPECT_EQ(W::ListVPorts("short", &out), 1);
    EXPECT_EQ(W::ListVPorts(nullptr, &out), 1);
    EXPECT_EQ(W::ListVPorts(portId, nullptr), 1);
    EXPECT_THAT(out, SizeIs(3));
    EXPECT_THAT(log.lines, IsSupersetOf({"5 Status: <2>:not supported", "5 Status: <7>", "3 str2HBAName failed",
                                         "3 Id2HBAName failed", "5 Invalid input pointer"}));
}

TEST_F(VirtualPortTest, EveryQueryChecksItsArgumentsBeforeTheLibrary)
{
    RM_VPortAttributes attributes;
    std::vector<RM_VPortTarget> targets;
    std::vector<HBA_UINT64> luns;
    VPortLunAttributes lun;
    RM_VirtualMachine machine;
    std::vector<TargetLun> targetLuns;
    const std::pair<RM_STATUS, RM_STATUS> results[] = {
        {W::ListVPortAttributes(portId, vportId, nullptr), W::ListVPortAttributes(portId, "x", &attributes)},
        {W::ListVPortTargets(portId, vportId, nullptr), W::ListVPortTargets("x", vportId, &targets)},
        {W::ListVPortLuns(portId, vportId, targetId, nullptr), W::ListVPortLuns(portId, vportId, "x", &luns)},
        {W::VPortLunAttr(portId, vportId, targetId, 0, nullptr), W::VPortLunAttr(portId, "x", targetId, 0, &lun)},
        {W::ListVMfromVPort(portId, vportId, nullptr), W::ListVMfromVPort(portId, "x", &machine)},
        {W::tvrcimGetTargetMapping(portId, targetId, nullptr), W::tvrcimGetTargetMapping(portId, "x", &targetLuns)},
    };
    for (const auto& [nullOutput, wrongName] : results)
    {
        EXPECT_EQ(nullOutput, 1);
        EXPECT_EQ(wrongName, 1);
    }
    EXPECT_EQ(log.count("5 Invalid input pointer"), 5);
    EXPECT_EQ(log.count("5 Invalid input vp attributes pointer"), 1);
    EXPECT_EQ(log.count("3 str2HBAName failed"), 6);
    EXPECT_THAT(host.calls, IsEmpty());
}

TEST_F(VirtualPortTest, Attributes)
{
    RM_VPortAttributes attributes{};
    EXPECT_EQ(W::ListVPortAttributes(portId, vportId, &attributes), 0);
    EXPECT_EQ(W::hbaNameToString(attributes.wwpn), "10:00:11:22:33:00:00:01");
    host.statuses["LRM_VPGetAttributes"] = {5};
    EXPECT_EQ(W::ListVPortAttributes(portId, vportId, &attributes), 5);
}

TEST_F(VirtualPortTest, Targets)
{
    host.vportTargets = {{wwn(0x5000000000000001), wwn(0x5000000000000000), 0x10300, 1, 2}};
    std::vector<RM_VPortTarget> out;
    EXPECT_EQ(W::ListVPortTargets(portId, vportId, &out), 0);
    ASSERT_THAT(out, SizeIs(1));
    EXPECT_EQ(out[0].fcId, 0x10300u);
    EXPECT_THAT(log.lines,
                IsSupersetOf({"5 1 Targets Found on Virtual Port ", "5 SCSI Bus no: 1", "5 SCSI Target no: 2",
                              "5 Target WWPN: 50:00:00:00:00:00:00:01, Target WWNN: 50:00:00:00:00:00:00:00"}));
}

TEST_F(VirtualPortTest, LogicalUnits)
{
    std::vector<HBA_UINT64> luns;
    host.reportLuns = std::string("\0\0\0\x10\0\0\0\0", 8) + counter(7) + counter(8) + counter(9);
    EXPECT_EQ(W::ListVPortLuns(portId, vportId, targetId, &luns), 0);
    EXPECT_THAT(luns, ElementsAre(7, 8));
    host.reportLuns = std::string("\xFF\xFF\xFF\xFF\0\0\0\0", 8); // more than the buffer
    EXPECT_EQ(W::ListVPortLuns(portId, vportId, targetId, &luns), 0);
    EXPECT_THAT(luns, SizeIs(512));
    host.reportLuns = std::string("\0\0\0\x07\0\0\0\0", 8) + "1234567"; // less than one unit
    EXPECT_EQ(W::ListVPortLuns(portId, vportId, targetId, &luns), 0);
    EXPECT_THAT(luns, IsEmpty());
    host.statuses["LRM_VpScsiReportLUNs"] = {9, 9, 9};
    EXPECT_EQ(W::ListVPortLuns(portId, vportId, targetId, &luns), 9);
    EXPECT_EQ(host.calls["LRM_VpScsiReportLUNs"], 6);
}

TEST_F(VirtualPortTest, AttributesOfALogicalUnit)
{
    host.inquiry[0] = std::string("\x01\x80\x05\x02\x1f\x00\x00\x00", 8) + "TAVRIN  Virtual Tape    1.23";
    host.capacity = std::string("\x00\x00\x00\x0f\x00\x00\x02\x00", 8);
    VPortLunAttributes out;
    EXPECT_EQ(W::VPortLunAttr(portId, vportId, targetId, 7, &out), 0);
    EXPECT_EQ(out.inquiry.deviceType, 1u);
    EXPECT_EQ(out.inquiry.product, "Virtual Tape    ");
    EXPECT_EQ(out.capacity.lastLba, 15u);
    EXPECT_EQ(out.capacity.blockLength, 512u);
    EXPECT_EQ(out.designator.designatorLength, 0u) << "no such page";
    host.inquiry[0x80] = std::string("\x01\x80\x00\x04SN07", 8);
    host.inquiry[0x83] = std::string("\x01\x83\x00\x0C\x01\x03\x00\x08\x50\x00\x00\x00\x00\x00\x00\x0A", 16);
    EXPECT_EQ(W::VPortLunAttr(portId, vportId, targetId, 7, &out), 0);
    EXPECT_EQ(out.serialNumber, "SN07");
    EXPECT_EQ(out.designator.designatorLength, 8u);
    host.statuses["LRM_VpScsiReadCapacity"] = {5};
    host.statuses["LRM_VpScsiInquiry"] = {0, 5, 5};
    EXPECT_EQ(W::VPortLunAttr(portId, vportId, targetId, 7, &out), 0) << "a unit need not have them";
    EXPECT_EQ(out.capacity.blockLength, 0u);
    EXPECT_EQ(out.serialNumber, "Unknown");
    host.statuses["LRM_VpScsiInquiry"] = {6};
    EXPECT_EQ(W::VPortLunAttr(portId, vportId, targetId, 7, &out), 6);
    EXPECT_EQ(host.calls["LRM_VpScsiReadCapacity"], 3);
}

TEST_F(VirtualPortTest, VirtualMachineTextsAreTerminated)
{
    RM_VirtualMachine machine;
    EXPECT_EQ(W::ListVMfromVPort(portId, vportId, &machine), 0);
    EXPECT_EQ(std::string(machine.name), std::string(255, 'm'));
    EXPECT_EQ(std::string(machine.uuid), std::string(39, 'm'));
}

TEST_F(VirtualPortTest, TargetMappingOfAPhysicalPort)
{
    host.luns = {{0, 0, 512}, {1, 1, 512}};
    host.inquiry[0] = std::string(8, '\0') + "TAVRIN  ";
    host.statuses["LRM_ScsiInquiry"] = {9, 0, 2};
    std::vector<TargetLun> out;
    EXPECT_EQ(W::tvrcimGetTargetMapping(portId, targetId, &out), 0);
    ASSERT_THAT(out, SizeIs(2));
    EXPECT_EQ(out[0].inquiry.vendor, "TAVRIN  ");
    EXPECT_EQ(out[1].lun.fcpLun, 1);
    EXPECT_EQ(out[1].inquiry.vendor, "Unknown");
    host.statuses["LRM_GetLunList"] = {97};
    EXPECT_EQ(W::tvrcimGetTargetMapping(portId, targetId, &out), 97);
    EXPECT_THAT(out, SizeIs(2));
}

// --- priority lanes

TEST_F(VirtualPortTest, PriorityLanesAreAskedForByAllNames)
{
    std::string asked;
    host.laneList = [&](HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, std::uint32_t option, RM_OASLunList* list)
    {
        asked = W::hbaNameToString(wwpn) + " " + W::hbaNameToString(vport) + " " + W::hbaNameToString(target) + " " +
                std::to_string(option) + " " + std::to_string(list->count);
        list->count = 0;
        return RM_OK;
    };
    std::vector<RM_OASLun> out(3);
    EXPECT_EQ(W::GetOASLunList(portId, targetId, nullptr, RM_LANE_DRIVER, &out), 0);
    EXPECT_EQ(asked, "10:00:11:22:33:12:34:56 00:00:00:00:00:00:00:00 50:00:00:00:00:00:00:01 0 64");
    EXPECT_THAT(out, IsEmpty());
    EXPECT_EQ(W::GetOASLunList(portId, targetId, vportId, RM_LANE_CONFIG, &out), 0);
    EXPECT_EQ(asked, "10:00:11:22:33:12:34:56 10:00:11:22:33:00:00:01 50:00:00:00:00:00:00:01 1 64");
}

TEST_F(VirtualPortTest, PriorityLanesAreListedWithTheirFieldsAsBytesLie)
{
    HBA_UINT64 field;
    const unsigned char bytes[] = {0x40, 0x0A, 0, 0, 0, 0, 0, 0xFF};
    std::memcpy(&field, bytes, sizeof field);
    host.lanes = {{field, 10, 1}, {0, 11, 0}};
    std::vector<RM_OASLun> out;
    EXPECT_EQ(W::GetOASLunList(portId, targetId, nullptr, RM_LANE_DRIVER, &out), 0);
    ASSERT_THAT(out, SizeIs(2));
    EXPECT_EQ(out[0].osLun, 10u);
    EXPECT_EQ(out[0].laneState, 1u);
    std::erase_if(log.lines, [](const std::string& line)
                  { return line.find("Lane") == line.npos && line.find("Lun") == line.npos; });
    EXPECT_THAT(log.lines, ElementsAre("5 TVR_MethodWrapper::GetOASLunList", "5 FCP Lun: 400A0000000000FF",
                                       "5 PrioLane Lun: 10", "5 PrioLane State: 1", "5 FCP Lun: 0000000000000000",
                                       "5 PrioLane Lun: 11", "5 PrioLane State: 0", "5 Exit GetOASLunList"));
}

/// A library that says more than it may: the count of each call, and what it returns.
struct LaneRow
{
    std::uint32_t count;
    RM_STATUS status;
    std::size_t entries; ///< that come out
    std::uint32_t rooms; ///< of all calls, added up
    RM_STATUS result;
};

TEST_F(VirtualPortTest, CountsOfPriorityLanesAreBounded)
{
    constexpr LaneRow rows[] = {
        {64, RM_OK, 64, 64, RM_OK},
        {65, RM_OK, 64, 64, RM_OK}, // a success with more than there was room for
        {0xFFFFFFFF, RM_OK, 64, 64, RM_OK},
        {100, RM_ERROR_MORE_DATA, 0, 64 + 100 + 100, RM_ERROR_MORE_DATA},
        {0, RM_ERROR_MORE_DATA, 0, 64, RM_ERROR_MORE_DATA},
        {0xFFFFFFFF, RM_ERROR_MORE_DATA, 0, 64 + 2 * 65536, RM_ERROR_MORE_DATA},
        {0xFFFFFFFF, RM_ERROR_NOT_SUPPORTED, 0, 64, RM_ERROR_NOT_SUPPORTED},
        {1, RM_ERROR_FIRMWARE_LACKS, 0, 64, 251},
    };
    for (const LaneRow& row : rows)
    {
        std::uint32_t rooms = 0;
        host.laneList = [&](HBA_WWN, HBA_WWN, HBA_WWN, std::uint32_t, RM_OASLunList* list)
        {
            rooms += list->count;
            std::memset(static_cast<void*>(list->entry), 0xFF, list->count * sizeof list->entry[0]);
            list->count = row.count;
            return row.status;
        };
        std::vector<RM_OASLun> out(3);
        EXPECT_EQ(W::GetOASLunList(portId, targetId, nullptr, RM_LANE_DRIVER, &out), row.result) << row.count;
        EXPECT_THAT(out, SizeIs(row.status == RM_OK ? row.entries : 3)) << row.count;
        EXPECT_EQ(rooms, row.rooms) << row.count;
    }
    EXPECT_EQ(log.count("5 RM_GetOASLunList error."), 5);
}

TEST_F(VirtualPortTest, PriorityLanesOfWrongNamesAreNotAskedFor)
{
    std::vector<RM_OASLun> out(3);
    EXPECT_EQ(W::GetOASLunList(portId, targetId, nullptr, RM_LANE_DRIVER, nullptr), 1);
    EXPECT_EQ(log.count("5 Invalid input pointer"), 1);
    for (const auto& [port, target, vport] :
         {std::tuple{"x", targetId, vportId}, std::tuple{portId, "x", vportId}, std::tuple{portId, targetId, "x"}})
        EXPECT_EQ(W::GetOASLunList(port, target, vport, RM_LANE_DRIVER, &out), 1);
    EXPECT_EQ(W::GetOASLunList(nullptr, targetId, nullptr, RM_LANE_DRIVER, &out), 1);
    EXPECT_THAT(out, SizeIs(3));
    EXPECT_THAT(host.calls, IsEmpty());
}

TEST_F(VirtualPortTest, FeaturesQosAndTraces)
{
    const HBA_WWN port = wwn(0x1000112233123456);
    host.features = {{200, 1}, {201, 0}};
    std::vector<RM_Feature> features;
    EXPECT_EQ(W::GetHBAFeatureList(port, &features), 0);
    ASSERT_THAT(features, SizeIs(2));
    EXPECT_EQ(log.count("5 TVR_MethodWrapper::Features: 200->1"), 1);
    EXPECT_EQ(W::GetHBAFeatureList(port, nullptr), 1);

    RM_QosInfo qos{};
    EXPECT_EQ(W::GetQosInfo(port, &qos), 0);
    EXPECT_EQ(qos.bandwidth, 40u);
    qos = {};
    host.statuses["LRM_GetQoS"] = {2};
    EXPECT_EQ(W::GetQosInfo(port, &qos), 2);
    EXPECT_EQ(qos.bandwidth, 0u);

    host.statuses["LRM_SetDebugTraces"] = {2};
    EXPECT_EQ(W::SetMILITraceLevel(3), 2);
    EXPECT_EQ(W::SetMILITraceLevel(3), 0);
    EXPECT_EQ(log.count("5 Status: <2>:not supported"), 2);
}

} // namespace
