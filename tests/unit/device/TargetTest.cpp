#include "FakeHost.h"

#include "device/Data.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"

#include <cstring>
#include <gmock/gmock.h>

using namespace cimple;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::SizeIs;

namespace
{

class TargetTest : public testing::Test
{
protected:
    TargetTest()
    {
        host.addAdapter(1);
        data.buildAdapterData();
        log.lines.clear();
        host.calls.clear();
    }

    std::vector<Target*>& scan()
    {
        data.buildSANData();
        return data.ports.at(0)->getTargets();
    }
    /// Inquiries of every page and capacity that answer alike.
    static std::string standardInquiry()
    {
        return std::string("\x1f\x00\x05\x02\x1f\x00\x00\x00", 8) + std::string(28, 'x');
    }

    LoadedHost host;
    LogCapture log;
    Data data;
};

TEST_F(TargetTest, FieldsOfATarget)
{
    auto& entry = (host.adapters[0].mapping = mappingOf(1))[0];
    entry.FcpId.FcId = 0x10300;
    entry.FcpId.FcpLun = 7;
    std::memset(entry.ScsiId.OSDeviceName, 'd', sizeof entry.ScsiId.OSDeviceName);
    entry.ScsiId.ScsiBusNumber = 1;
    entry.ScsiId.ScsiTargetNumber = 2;
    entry.ScsiId.ScsiOSLun = 3;
    host.inquiry[0] = std::string("\xE1\x80\x05\x02\x1f\x00\x00\x00", 8) + "TAVRIN  Virtual Disk    1.23rest";
    host.inquiry[0x80] = std::string("\x00\x80\x00\x05", 4) + "12345";
    host.inquiry[0x83] = std::string("\x00\x83\x00\x0c\x01\x03\x00\x08", 8) + "ABCDEFGH";
    host.capacity = std::string("\x01\x02\x03\x04\x00\x00\x02\x00", 8);

    const auto& targets = scan();
    ASSERT_THAT(targets, SizeIs(1));
    const Target& t = *targets[0];
    EXPECT_EQ(t.fcId, 0x10300u);
    EXPECT_EQ(t.nodeWWN, "5000000000000000");
    EXPECT_EQ(t.portWWN, "5000000000000001");
    EXPECT_EQ(t.fcpLun, 7u);
    EXPECT_EQ(t.osDeviceName, std::string(256, 'd'));
    EXPECT_EQ(t.scsiBusNumber, 1u);
    EXPECT_EQ(t.scsiTargetNumber, 2u);
    EXPECT_EQ(t.scsiOSLun, 3u);
    EXPECT_EQ(t.deviceType, 1u); // the upper three bits are the qualifier
    EXPECT_EQ(t.vendor, "TAVRIN  ");
    EXPECT_EQ(t.product, "Virtual Disk    ");
    EXPECT_EQ(t.revision, "1.23");
    EXPECT_EQ(t.serialNumber, "12345");
    EXPECT_EQ(t.designator.designatorType, 3u);
    EXPECT_EQ(t.designator.designatorLength, 8u);
    EXPECT_EQ(std::memcmp(t.designator.value, "ABCDEFGH", 8), 0);
    EXPECT_EQ(t.lastLba, 0x01020304u);
    EXPECT_EQ(t.blockLength, 512u);
    EXPECT_THAT(log.lines,
                ElementsAre("5 buildSANData", "5 Target Scan from adapter: Tavrin-F0", "5 FCAdapter::rescanTargets",
                            "5 FCPort::rescanTargets", "5 To retry the HBA_GetFcpTargetMapping command",
                            "5 Deleting the allocated memory", "5 All Ok ...break ", "5 Successful target info fetched",
                            "5 Creating Target...", "5 SCSI Inquiry with 0, 0", "5 DeviceType......1",
                            "5 SCSI Inquiry with 1, 0x80", "5 SCSI Inquiry with 1, 0x83", "5 Send Read Capacity",
                            "5 End Creating Target..."));
    EXPECT_EQ(host.calls["HBA_OpenAdapter"], 2);
    EXPECT_EQ(host.calls["HBA_CloseAdapter"], 2);
}

TEST_F(TargetTest, AConditionIsRetriedTwice)
{
    host.adapters[0].mapping = mappingOf(1);
    host.inquiry[0] = standardInquiry();
    host.sense = "\x70";
    host.statuses = {{"HBA_SendScsiInquiry 0", {9, 9}},
                     {"HBA_SendScsiInquiry 128", {9, 9, 9}},
                     {"HBA_SendScsiInquiry 131", {9, 9, 9}},
                     {"HBA_SendReadCapacity", {1}}};
    const auto& targets = scan();
    ASSERT_THAT(targets, SizeIs(1));
    EXPECT_EQ(targets[0]->vendor, "xxxxxxxx");
    EXPECT_EQ(targets[0]->serialNumber, "Unknown");
    EXPECT_EQ(targets[0]->designator.designatorLength, 0u);
    EXPECT_EQ(targets[0]->lastLba, 0u);
    for (const char* page : {"0", "128", "131"})
        EXPECT_EQ(host.calls[std::string("HBA_SendScsiInquiry ") + page], 3);
    EXPECT_EQ(host.calls["HBA_SendReadCapacity"], 1); // only a check condition is tried again
    EXPECT_EQ(log.count("5 HBA_SendScsiInquiry_t(0x80) returns 9."), 2);
    EXPECT_EQ(log.count("5 HBA_SendScsiInquiry_t(0x80) returns 1."), 1);
    EXPECT_EQ(log.count("5 70 "), 1);
    EXPECT_EQ(log.count("5 00 "), 23);
}

TEST_F(TargetTest, AUnitThatAnswersNothingIsUnknown)
{
    host.adapters[0].mapping = mappingOf(1);
    host.statuses["HBA_SendScsiInquiry 0"] = {1};
    const auto& targets = scan();
    ASSERT_THAT(targets, SizeIs(1));
    EXPECT_EQ(targets[0]->vendor, "Unknown");
    EXPECT_EQ(targets[0]->product, "Unknown");
    EXPECT_EQ(targets[0]->revision, "Unknown");
    EXPECT_EQ(targets[0]->deviceType, 0u);
}

TEST_F(TargetTest, HostilePagesStayInTheirFields)
{
    host.adapters[0].mapping = mappingOf(1);
    host.inquiry[0] = std::string(255, 'I');
    host.inquiry[0x80] = std::string(255, 'S');
    host.inquiry[0x83] = std::string(255, '\xFF'); // a designator longer than the page
    const auto& targets = scan();
    ASSERT_THAT(targets, SizeIs(1));
    EXPECT_EQ(targets[0]->vendor, "IIIIIIII");
    EXPECT_EQ(targets[0]->product, std::string(16, 'I'));
    EXPECT_EQ(targets[0]->revision, "IIII");
    EXPECT_EQ(targets[0]->serialNumber, std::string(251, 'S'));
    EXPECT_LE(targets[0]->designator.designatorLength, 255u - 8u);
}

TEST_F(TargetTest, ARescanReplacesTheTargets)
{
    host.adapters[0].mapping = mappingOf(2);
    EXPECT_THAT(scan(), SizeIs(2));
    log.lines.clear();
    host.adapters[0].mapping.clear();
    EXPECT_THAT(scan(), IsEmpty());
    EXPECT_EQ(log.count("5 Freeing Target: 5000000000000001"), 2);
    EXPECT_EQ(log.count("5 HBA_GetFcpTargetMapping_t() found no target mappings"), 1);
}

TEST_F(TargetTest, TheBufferGrowsWithTheMapping)
{
    host.adapters[0].mapping = mappingOf(300);
    EXPECT_THAT(scan(), SizeIs(300));
    EXPECT_EQ(host.calls["HBA_GetFcpTargetMapping"], 2);
    EXPECT_EQ(log.count("5 Increasing the buffer to = 300"), 1);
    EXPECT_EQ(data.ports[0]->getTargets().back()->fcpLun, 299u);

    host.statuses["HBA_GetFcpTargetMapping"] = {8};
    host.adapters[0].mapping = mappingOf(3);
    EXPECT_THAT(scan(), SizeIs(3));
    EXPECT_EQ(host.calls["HBA_RefreshInformation"], 1);
    EXPECT_EQ(log.count("5 Refresh and retry ... "), 1);
}

/// What a mapping call may answer, and how many targets come of it.
struct MappingCase
{
    HBA_STATUS status;
    HBA_UINT32 count;
    int calls;
    std::size_t targets;
    std::vector<std::string> notable;
};

TEST_F(TargetTest, HostileMappings)
{
    const MappingCase cases[] = {
        {7, 300, 3, 0, {}},          // more and more
        {7, 0, 3, 0, {}},            // more than nothing
        {7, 0xFFFFFFFF, 3, 0, {}},   // more than the memory
        {0, 0xFFFFFFFF, 1, 256, {}}, // fills what was offered and says otherwise
        {8, 1, 3, 0, {}},            // stale for ever
        {1, 5, 1, 0, {"3 Error hbaStatus=1"}},
    };
    for (const MappingCase& c : cases)
    {
        log.lines.clear();
        host.calls.clear();
        host.mapping = [&](HBA_FCPTARGETMAPPING* out)
        {
            // The room that was offered is there to its last byte.
            std::memset(static_cast<void*>(out->entry), 0, out->NumberOfEntries * sizeof out->entry[0]);
            out->NumberOfEntries = c.count;
            return c.status;
        };
        EXPECT_THAT(scan(), SizeIs(c.targets)) << c.status << " " << c.count;
        EXPECT_EQ(host.calls["HBA_GetFcpTargetMapping"], c.calls);
        EXPECT_EQ(log.notable(), c.notable);
        EXPECT_EQ(log.count("5 Successful target info fetched"), c.notable.empty());
        EXPECT_EQ(host.calls["HBA_OpenAdapter"], host.calls["HBA_CloseAdapter"]);
    }
}

TEST_F(TargetTest, AFailureCostsTheTargetOrThePortOnly)
{
    host.addAdapter(1);
    data.buildAdapterData();
    log.lines.clear();
    for (FakeAdapter& adapter : host.adapters)
        adapter.mapping = mappingOf(2);
    host.statuses["HBA_OpenAdapter"] = {0, 1}; // for the first port, its first target
    EXPECT_THAT(scan(), SizeIs(1));
    EXPECT_THAT(data.ports[1]->getTargets(), SizeIs(2));
    EXPECT_THAT(log.notable(), ElementsAre("3 HBA_OpenAdapter failed, skipping Adapter Tavrin-F0",
                                           "3 target creation failed - moving to the next target"));
    log.lines.clear();
    host.statuses["HBA_OpenAdapter"] = {1};
    EXPECT_THAT(scan(), IsEmpty());
    EXPECT_THAT(data.ports[1]->getTargets(), SizeIs(2));
    EXPECT_THAT(log.notable(), ElementsAre("3 HBA_OpenAdapter failed, skipping Adapter Tavrin-F0",
                                           "3 Issue with Target Rescan - moving to the next Port"));
}

/// An adapter of another kind, whose scan fails as a whole.
class BrokenAdapter : public FCAdapter
{
public:
    using FCAdapter::FCAdapter;
    void rescanTargets() override { throw std::exception(); }
};

TEST_F(TargetTest, AFailingAdapterDoesNotStopTheScan)
{
    host.adapters[0].mapping = mappingOf(1);
    data.adapters.insert(data.adapters.begin(), new BrokenAdapter("Tavrin-F0", 0));
    log.lines.clear();
    EXPECT_THAT(scan(), SizeIs(1));
    EXPECT_THAT(log.notable(), ElementsAre("3 Issue with Target Rescan with Adapter- moving to the next adapter"));
}

} // namespace
