#include "Scenarios.h"

#include "simulator/SimulatedHost.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <thread>

namespace tvrsim
{
namespace
{

using testing::ElementsAre;

class Host : public testing::Test
{
protected:
    SimulatedHost host;

    void SetUp() override
    {
        host.load(readScenario(twoPorts, "test"));
        ASSERT_EQ(host.loadLibrary(), HBA_STATUS_OK);
        handle = host.openAdapter("Tavrin-A");
        ASSERT_NE(handle, 0u);
    }

    /// The entries as "bus:target:lun name".
    std::vector<std::string> mapping()
    {
        std::vector<HBA_FCPSCSIENTRY> entries;
        EXPECT_EQ(host.targetMapping(handle, entries), HBA_STATUS_OK);
        std::vector<std::string> texts;
        for (const HBA_FCPSCSIENTRY& entry : entries)
            texts.push_back(std::to_string(entry.ScsiId.ScsiBusNumber) + ':' +
                            std::to_string(entry.ScsiId.ScsiTargetNumber) + ':' +
                            std::to_string(entry.ScsiId.ScsiOSLun) + ' ' + entry.ScsiId.OSDeviceName);
        return texts;
    }

    HBA_HANDLE handle = 0;
};

TEST_F(Host, LibraryMustBeLoadedOnce)
{
    std::string name;
    EXPECT_EQ(host.loadLibrary(), HBA_STATUS_ERROR) << "it is loaded already";
    EXPECT_EQ(host.adapterCount(), 1u);
    EXPECT_EQ(host.adapterName(1, name), HBA_STATUS_ERROR_ILLEGAL_INDEX);
    EXPECT_EQ(host.freeLibrary(), HBA_STATUS_OK);
    EXPECT_EQ(host.adapterCount(), 0u);
    EXPECT_EQ(host.openAdapter("Tavrin-A"), 0u);
    EXPECT_EQ(host.openHandles(), 0u);
}

TEST_F(Host, HandlesFitTheCommonLibraryAndEnd)
{
    HBA_ADAPTERATTRIBUTES attributes{};
    EXPECT_EQ(host.openAdapter("Tavrin"), 0u);
    for (int i = 0; i < 70000; ++i)
    {
        const HBA_HANDLE next = host.openAdapter("Tavrin-A");
        ASSERT_TRUE(next > 0 && next <= 0xFFFF && next != handle);
        host.closeAdapter(next);
    }
    EXPECT_EQ(host.openHandles(), 1u);
    EXPECT_EQ(host.adapterAttributes(handle, attributes), HBA_STATUS_OK);
    EXPECT_EQ(attributes.NumberOfPorts, 2u);
    host.closeAdapter(handle);
    EXPECT_EQ(host.adapterAttributes(handle, attributes), HBA_STATUS_ERROR_INVALID_HANDLE);
}

TEST_F(Host, MappingHoldsTheUnitsOfOnlinePorts)
{
    EXPECT_THAT(mapping(), ElementsAre("3:0:1 /dev/st0", "3:1:0 /dev/sda", "3:1:300 /dev/sdb", "4:0:0 /dev/sdc",
                                       "4:0:300 /dev/sdd"));
    ASSERT_TRUE(host.setPortState(portA, HBA_PORTSTATE_LINKDOWN));
    EXPECT_THAT(mapping(), ElementsAre("4:0:0 /dev/sdc", "4:0:300 /dev/sdd"));

    ScsiReply reply;
    const ScsiCommand inquiry{ScsiOperation::inquiry};
    EXPECT_EQ(host.scsi(handle, disks, encodeLun(0), inquiry, reply), HBA_STATUS_OK) << "by the other port";
    EXPECT_EQ(host.scsi(handle, tape, encodeLun(1), inquiry, reply), HBA_STATUS_ERROR_ILLEGAL_WWN);
    EXPECT_EQ(host.scsi(portA, disks, encodeLun(0), inquiry, reply), RM_ERROR_INVALID_WWN);
}

TEST_F(Host, StaleDataLastsUntilTheRefresh)
{
    HBA_ADAPTERATTRIBUTES adapter{};
    HBA_PORTATTRIBUTES port{};
    std::vector<HBA_FCPSCSIENTRY> entries;
    ASSERT_TRUE(host.makeStale("Tavrin-A"));
    EXPECT_EQ(host.adapterAttributes(handle, adapter), HBA_STATUS_ERROR_STALE_DATA);
    EXPECT_EQ(host.portAttributes(handle, 0, port), HBA_STATUS_ERROR_STALE_DATA);
    EXPECT_EQ(host.targetMapping(handle, entries), HBA_STATUS_ERROR_STALE_DATA);
    host.refreshInformation(handle);
    EXPECT_EQ(host.portAttributes(handle, 1, port), HBA_STATUS_OK);
    EXPECT_EQ(fromHba(port.PortWWN), portB);
    EXPECT_EQ(host.portAttributes(handle, 2, port), HBA_STATUS_ERROR_ILLEGAL_INDEX);
}

TEST_F(Host, RemovedAdaptersAreGoneFromBothApis)
{
    HBA_ADAPTERATTRIBUTES attributes{};
    std::uint32_t local = 1;
    ASSERT_TRUE(host.removeAdapter("Tavrin-A"));
    EXPECT_FALSE(host.removeAdapter("Tavrin-A"));
    EXPECT_EQ(host.adapterCount(), 0u);
    EXPECT_EQ(host.adapterAttributes(handle, attributes), HBA_STATUS_ERROR_INVALID_HANDLE);
    EXPECT_EQ(host.isLocal(portA, local), RM_OK);
    EXPECT_EQ(local, 0u);
}

std::string valueOf(const AttributeList& list, std::uint32_t id)
{
    const auto buffer = encodeAttributes(list);
    const auto value = findAttribute(buffer, id);
    return value.data() ? std::string(reinterpret_cast<const char*>(value.data()), value.size()) : "absent";
}

TEST_F(Host, DifferencesFromTheRememberedStateAreNamed)
{
    host.remember();
    EXPECT_EQ(host.difference(), "");
    EXPECT_TRUE(host.setPortState(portB, HBA_PORTSTATE_LINKDOWN));
    EXPECT_EQ(host.difference(), "port 10:00:02:7A:00:00:00:B0");
    EXPECT_TRUE(host.setPortState(portB, HBA_PORTSTATE_ONLINE));
    EXPECT_EQ(host.difference(), "");
    EXPECT_TRUE(host.makeStale("Tavrin-A"));
    EXPECT_EQ(host.difference(), "adapter Tavrin-A");
    EXPECT_TRUE(host.removeAdapter("Tavrin-A"));
    EXPECT_EQ(host.difference(), "number of adapters");
}

TEST_F(Host, AttributesFollowTheMembersUnlessListed)
{
    AttributeList list;
    ASSERT_EQ(host.hbaAttributes(portB, list), RM_OK);
    EXPECT_EQ(valueOf(list, RM_HA_OPTION_ROM_VERSION), std::string("1.0\0", 4));
    EXPECT_EQ(valueOf(list, RM_HA_SUBADAPTER_ID), std::string("7\0", 2));
    EXPECT_EQ(valueOf(list, RM_HA_NODE_SYMBOLIC_NAME), "absent") << "null takes it away";

    const auto portState = [&]
    {
        EXPECT_EQ(host.portAttributes(portA, list), RM_OK);
        return valueOf(list, RM_PA_PORT_STATE)[0];
    };
    EXPECT_EQ(portState(), HBA_PORTSTATE_ONLINE);
    ASSERT_TRUE(host.setPortState(portA, HBA_PORTSTATE_LINKDOWN));
    EXPECT_EQ(portState(), HBA_PORTSTATE_LINKDOWN);
    ASSERT_TRUE(host.setAttributeOf(portA, readAttribute(R"({"portState": 3})", "test")));
    EXPECT_EQ(portState(), HBA_PORTSTATE_OFFLINE);
    EXPECT_EQ(valueOf(list, RM_PA_FABRIC_NAME), std::string("\x10\0\0\0\0\0\xFA\xB1", 8));

    ASSERT_TRUE(host.setAttributeOf(portA, readAttribute(R"({"rxFrames": 6})", "test")));
    ASSERT_EQ(host.portStatistics(portA, list), RM_OK);
    EXPECT_EQ(valueOf(list, RM_PS_RX_FRAMES)[0], 6);
    EXPECT_FALSE(host.setAttributeOf(portA, readAttribute(R"({"operatingSystem": "x"})", "test")));
}

TEST(SimulatedCounters, GrowByEachReadingWhereTheyAreCounted)
{
    AttributeList counters = {counterAttribute(RM_PS_RX_FRAMES, 5), counterAttribute(RM_PS_TX_FRAMES, ~0ULL),
                              counterAttribute(RM_PS_LIP_COUNT, ~0ULL - 1)};
    const AttributeList growth = {counterAttribute(RM_PS_RX_FRAMES, 300), counterAttribute(RM_PS_TX_FRAMES, 1),
                                  counterAttribute(RM_PS_LIP_COUNT, 3), counterAttribute(RM_PS_NOS_COUNT, 1)};
    growCounters(counters, growth);
    growCounters(counters, growth);
    const AttributeList expected = {counterAttribute(RM_PS_RX_FRAMES, 605), counterAttribute(RM_PS_TX_FRAMES, ~0ULL),
                                    counterAttribute(RM_PS_LIP_COUNT, 4)};
    EXPECT_EQ(counters, expected);
}

TEST_F(Host, RmQueriesAnswerForThePortTheyName)
{
    std::uint32_t value = 0;
    EXPECT_EQ(host.feature(portB, 201, value), RM_OK);
    EXPECT_EQ(value, 1u);
    EXPECT_EQ(host.feature(portB, 7, value), RM_OK);
    EXPECT_EQ(value, 0u);
    std::vector<RM_Lun> luns;
    EXPECT_EQ(host.luns(portB, disks, luns), RM_OK);
    ASSERT_EQ(luns.size(), 2u);
    EXPECT_EQ(luns[1].osLun, 300u);
    EXPECT_EQ(luns[1].blockLength, 4096u);
    EXPECT_EQ(host.luns(portB, tape, luns), RM_ERROR_INVALID_WWN) << "another port sees it";

    RM_PciRegisters pci{};
    EXPECT_EQ(host.pciRegisters(portA, pci), RM_OK);
    EXPECT_EQ(host.pciRegisters(portB, pci), RM_ERROR_NOT_SUPPORTED);
    EXPECT_EQ(host.pciRegisters(disks, pci), RM_ERROR_INVALID_WWN);
}

TEST_F(Host, DumpsOfEachFunctionAreKeptForTheirPort)
{
    const auto endings = [&](Wwn port)
    {
        DumpFiles dumps;
        EXPECT_EQ(host.dumps(port, dumps), RM_OK);
        std::vector<std::string> texts;
        for (const std::string& file : dumps.files)
            texts.push_back(file.substr(file.find('.')));
        return texts;
    };
    EXPECT_EQ(host.generateDump(portA, ".dmp"), RM_OK);
    EXPECT_EQ(host.generateDumps(".fat"), RM_OK);
    EXPECT_EQ(host.setDumpDirectory(portA, "relative"), RM_ERROR_DIRECTORY_NOT_OPENED);
    EXPECT_EQ(host.setDumpDirectory(portA, "/d"), RM_OK);
    EXPECT_EQ(host.setDumpRetention(portA, 0), RM_ERROR);
    EXPECT_EQ(host.setDumpRetention(portA, 2), RM_OK);
    EXPECT_EQ(host.generateDump(portA, ".core"), RM_OK);
    EXPECT_THAT(endings(portA), ElementsAre(".fat", ".core"));
    EXPECT_THAT(endings(portB), ElementsAre(".fat"));
    DumpFiles dumps;
    EXPECT_EQ(host.dumps(portA, dumps), RM_OK);
    EXPECT_EQ(dumps.directory, "/d");
}

TEST(TracedModules, AreChangedByTheirName)
{
    SimulatedHost host;
    host.load(readScenario(R"({"adapters": [{"name": "A", "ports": [{"wwpn": "1000027A000000A0", "tracedModules": [
        {"module": "link", "level": "info", "portMask": 1}, {"module": "dma", "value": 2}]}]}]})",
                           "test"));
    RM_EventLogModule changed{};
    setText(changed.module, "dma");
    changed.value = 9;
    EXPECT_EQ(host.setEventLogModule(portA, changed), RM_OK);
    setText(changed.module, "none");
    EXPECT_EQ(host.setEventLogModule(portA, changed), RM_ERROR);
    RM_EventLogConfig config{};
    EXPECT_EQ(host.eventLogConfig(portA, config), RM_OK);
    EXPECT_EQ(config.room, 64u);
    ASSERT_EQ(config.count, 2u);
    EXPECT_STREQ(config.entry[0].level, "info");
    EXPECT_EQ(config.entry[0].portMask, 1u);
    EXPECT_EQ(config.entry[1].value, 9u);
}

TEST_F(Host, VirtualPortsBelongToTheirPort)
{
    std::vector<RM_VPortEntry> entries;
    std::vector<RM_VPortTarget> targets;
    RM_VPortAttributes attributes{};
    RM_VirtualMachine machine{};
    EXPECT_EQ(host.vports(portB, entries), RM_OK);
    EXPECT_TRUE(entries.empty());
    EXPECT_EQ(host.vports(portA, entries), RM_OK);
    ASSERT_EQ(entries.size(), 1u);
    EXPECT_EQ(fromHba(entries[0].wwpn), vport);
    EXPECT_EQ(host.vportAttributes(portB, vport, attributes), RM_ERROR_INVALID_WWN);
    EXPECT_EQ(host.vportAttributes(portA, vport, attributes), RM_OK);
    EXPECT_EQ(attributes.targetCount, 1u);
    EXPECT_EQ(host.vportTargets(portA, vport, targets), RM_OK);
    ASSERT_EQ(targets.size(), 1u);
    EXPECT_EQ(targets[0].scsiBusNumber, 3u);
    EXPECT_EQ(host.vportMachine(portA, vport, machine), RM_OK);
    EXPECT_STREQ(machine.name, "guest");
    ScsiReply reply;
    EXPECT_EQ(host.vportScsi(portA, vport, disks, 0, {ScsiOperation::reportLuns}, reply), RM_OK);
    EXPECT_EQ(reply.data.size(), 24u);
    EXPECT_EQ(host.vportScsi(portA, vport, tape, 0, {ScsiOperation::reportLuns}, reply), RM_ERROR_INVALID_WWN);
}

// Of use under the thread sanitizer: readers, and a writer that takes the host away below them.
TEST_F(Host, ManyThreadsMayCall)
{
    std::atomic<bool> stop = false;
    std::vector<std::jthread> readers;
    for (int i = 0; i < 3; ++i)
        readers.emplace_back(
            [&]
            {
                while (!stop)
                {
                    const HBA_HANDLE own = host.openAdapter("Tavrin-A");
                    std::vector<HBA_FCPSCSIENTRY> entries;
                    host.targetMapping(own, entries);
                    for (const HBA_FCPSCSIENTRY& entry : entries)
                    {
                        ScsiReply reply;
                        host.scsi(own, fromHba(entry.FcpId.PortWWN), entry.FcpId.FcpLun, {ScsiOperation::inquiry},
                                  reply);
                    }
                    AttributeList list;
                    host.portAttributes(portA, list);
                    host.closeAdapter(own);
                }
            });
    for (int i = 0; i < 200; ++i)
    {
        host.setPortState(portA, i % 2 ? HBA_PORTSTATE_ONLINE : HBA_PORTSTATE_LINKDOWN);
        if (i % 20 == 0)
            host.removeAdapter("Tavrin-A");
        if (i % 20 == 10)
            host.load(readScenario(twoPorts, "test"));
        std::this_thread::yield();
    }
    stop = true;
    readers.clear();
    EXPECT_EQ(host.openHandles(), 1u);
}

} // namespace
} // namespace tvrsim
