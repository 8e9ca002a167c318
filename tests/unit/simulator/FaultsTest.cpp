#include "Scenarios.h"

#include "simulator/Call.h"

#include <gmock/gmock.h>

#include <thread>

namespace tvrsim
{
namespace
{

using testing::ElementsAre;
using namespace std::chrono_literals;

class Faulty : public testing::Test
{
protected:
    Simulation simulation;

    void add(const std::string& row) { simulation.addFault(readFault(row, "fault")); }

    std::int32_t call(const char* function, const std::string& subject = {})
    {
        return Call(simulation, function, [&] { return subject; }).status([] { return 0; });
    }

    std::vector<std::int32_t> calls(int count, const char* function)
    {
        std::vector<std::int32_t> results;
        while (count-- > 0)
            results.push_back(call(function));
        return results;
    }
};

TEST_F(Faulty, RowsHitTheCallsOfTheirRange)
{
    call("LRM_InitLib"); // before the rows, so it does not count for them
    add(R"({"function": "LRM_InitLib", "from": 2, "to": 3, "status": 5})");
    add(R"({"function": "LRM_InitLib", "from": 3, "to": 4, "status": 6})");
    add(R"({"function": "RM_InitLib", "status": 7})");
    EXPECT_THAT(calls(5, "LRM_InitLib"), ElementsAre(0, 5, 5, 6, 0)) << "of several rows the first counts";
    EXPECT_EQ(call("RM_InitLib"), 7);
    EXPECT_EQ(simulation.counts.of("LRM_InitLib"), 6u);
    EXPECT_EQ(simulation.counts.of("RM_InitLib"), 1u);
    simulation.clearFaults();
    EXPECT_EQ(call("RM_InitLib"), 0);
}

TEST_F(Faulty, RowsOfASubjectCountItsCallsOnly)
{
    add(R"({"function": "LRM_GetQoS", "subject": "1000027a000000a0", "to": 1, "status": 9})");
    EXPECT_EQ(call("LRM_GetQoS", wwnText(portB)), 0);
    EXPECT_EQ(call("LRM_GetQoS", wwnText(portA)), 9);
    EXPECT_EQ(call("LRM_GetQoS", wwnText(portA)), 0);
}

TEST_F(Faulty, DelaysHoldACallBeforeItsWork)
{
    add(R"({"function": "LRM_InitLib", "delayMs": 15, "to": 1})");
    add(R"({"function": "LRM_InitLib", "delayMs": 15, "to": 1})");
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(call("LRM_InitLib"), 0);
    EXPECT_GE(std::chrono::steady_clock::now() - start, 30ms);
}

TEST_F(Faulty, GatesHoldCallsUntilTheyAreOpened)
{
    add(R"({"function": "LRM_InitLib", "gate": "start"})");
    EXPECT_FALSE(simulation.gates.await("start", 1, 0ms));
    std::atomic<int> passed = 0;
    std::jthread first([&] { passed += call("LRM_InitLib") == 0; });
    std::jthread second([&] { passed += call("LRM_InitLib") == 0; });
    ASSERT_TRUE(simulation.gates.await("start", 2, 10s));
    EXPECT_EQ(passed, 0);
    call("LRM_ExitLib"); // others go on
    simulation.gates.open("start");
    first.join();
    second.join();
    EXPECT_EQ(passed, 2);
    EXPECT_EQ(call("LRM_InitLib"), 0) << "an open gate stays open";
}

TEST_F(Faulty, ANewHostFreesTheCallsThatAreHeld)
{
    add(R"({"function": "LRM_InitLib", "gate": "start"})");
    std::jthread held([&] { call("LRM_InitLib"); });
    ASSERT_TRUE(simulation.gates.await("start", 1, 10s));
    simulation.load(readScenario(R"({"faults": [{"function": "LRM_ExitLib", "status": 3}]})", "test"));
    held.join();
    EXPECT_EQ(call("LRM_ExitLib"), 3);
    EXPECT_EQ(simulation.counts.of("LRM_InitLib"), 0u);
}

// Outputs.

TEST_F(Faulty, RecordsAreCutAndHostileWithinTheirRoom)
{
    const auto read = [](RM_VirtualMachine& machine)
    {
        setText(machine.name, "guest");
        return RM_OK;
    };
    RM_VirtualMachine machine;
    std::memset(&machine, '-', sizeof machine);
    add(R"({"function": "LRM_GetVMFromVPort", "truncate": 3, "to": 1})");
    add(R"({"function": "LRM_GetVMFromVPort", "hostile": "unterminatedText", "from": 2})");
    EXPECT_EQ(Call(simulation, "LRM_GetVMFromVPort").record(&machine, read), RM_OK);
    EXPECT_EQ(std::string(machine.name, 6), "gue---");
    EXPECT_EQ(Call(simulation, "LRM_GetVMFromVPort").record(&machine, read), RM_OK);
    EXPECT_EQ(std::string(machine.uuid, sizeof machine.uuid), std::string(sizeof machine.uuid, 'X'));
    EXPECT_EQ(Call(simulation, "RM_GetVMFromVPort").record<RM_VirtualMachine>(nullptr, read), HBA_STATUS_ERROR_ARG);
}

TEST_F(Faulty, TextsKeepToTheirRoom)
{
    const auto read = [](std::string& text)
    {
        text = "version 12";
        return RM_OK;
    };
    char buffer[9] = "--------";
    EXPECT_EQ(Call(simulation, "RM_GetVersion").text(buffer, 4, read), RM_OK);
    EXPECT_STREQ(buffer, "ver");
    EXPECT_EQ(buffer[4], '-');
    EXPECT_EQ(Call(simulation, "RM_GetVersion").text(buffer, 0, read), RM_OK);
    add(R"({"function": "RM_GetVersion", "hostile": "unterminatedText"})");
    EXPECT_EQ(Call(simulation, "RM_GetVersion").text(buffer, 6, read), RM_OK);
    EXPECT_EQ(std::string(buffer, 8), "XXXXXX--");
}

struct List
{
    std::uint32_t count;
    std::uint32_t entry[4];
};

TEST_F(Faulty, ListsTellTheNumberTheyNeed)
{
    const auto read = [](std::vector<std::uint32_t>& entries)
    {
        entries = {1, 2, 3};
        return RM_OK;
    };
    struct Case
    {
        const char* fault;
        std::uint32_t room;
        std::int32_t status;
        std::uint32_t count;
        std::vector<std::uint32_t> entries;
    };
    const Case cases[] = {
        {nullptr, 4, RM_OK, 3, {1, 2, 3, 0}},
        {nullptr, 3, RM_OK, 3, {1, 2, 3, 0}},
        {nullptr, 2, RM_ERROR_MORE_DATA, 3, {1, 2, 0, 0}},
        {nullptr, 0, RM_ERROR_MORE_DATA, 3, {0, 0, 0, 0}},
        {R"({"function": "LRM_VPList", "truncate": 4})", 4, RM_OK, 3, {1, 0, 0, 0}},
        {R"({"function": "LRM_VPList", "hostile": "hugeCount"})", 2, RM_OK, 0xFFFFFFFF, {1, 2, 0, 0}},
        {R"({"function": "LRM_VPList", "status": 8})", 4, 8, 4, {0, 0, 0, 0}},
    };
    for (const Case& c : cases)
    {
        SCOPED_TRACE(c.room);
        simulation.clearFaults();
        if (c.fault)
            add(c.fault);
        List list{c.room, {}};
        EXPECT_EQ(Call(simulation, "LRM_VPList").list(&list, &List::count, read), c.status);
        EXPECT_EQ(list.count, c.count);
        EXPECT_THAT(list.entry, testing::ElementsAreArray(c.entries));
    }
}

TEST_F(Faulty, AttributeBuffersKeepToTheirRoom)
{
    const auto read = [](AttributeList& list)
    {
        list = {numberAttribute(1, 11), numberAttribute(2, 22)};
        return RM_OK;
    };
    std::byte buffer[64];
    const auto fill = [&](std::uint32_t room, std::uint32_t& size)
    {
        std::ranges::fill(buffer, std::byte{0});
        size = room;
        return Call(simulation, "LRM_GetHBAAttributes").attributes(buffer, &size, read);
    };
    std::uint32_t size = 0;
    EXPECT_EQ(fill(64, size), RM_OK);
    const std::uint32_t needed = size;
    EXPECT_NE(findAttribute({buffer, size}, 2).data(), nullptr);
    EXPECT_EQ(fill(needed, size), RM_OK);
    EXPECT_EQ(fill(needed - 1, size), RM_ERROR_MORE_DATA);
    EXPECT_EQ(size, needed);
    EXPECT_EQ(usedBytes(buffer), 0u);

    add(R"({"function": "LRM_GetHBAAttributes", "truncate": 21, "to": 1})");
    EXPECT_EQ(fill(64, size), RM_OK);
    EXPECT_EQ(size, 21u);
    EXPECT_EQ(usedBytes(buffer), 21u);
    EXPECT_NE(findAttribute({buffer, size}, 1).data(), nullptr);
    EXPECT_EQ(findAttribute({buffer, size}, 2).data(), nullptr);

    add(R"({"function": "LRM_GetHBAAttributes", "hostile": "allOnes"})");
    EXPECT_EQ(fill(60, size), RM_OK);
    EXPECT_EQ(buffer[59], std::byte{0xFF});
    EXPECT_EQ(buffer[60], std::byte{0});
}

TEST_F(Faulty, ScsiBuffersKeepToTheirRoom)
{
    const auto run = [](ScsiReply& reply)
    {
        reply = {HBA_STATUS_SCSI_CHECK_CONDITION, {0, 0x83, 0, 2, 5, 6}, {0x70, 0, 5}};
        return reply.status;
    };
    std::uint8_t data[8] = {}, sense[4] = {};
    Call(simulation, "HBA_SendScsiInquiry").scsi(data, 5, sense, 2, run);
    EXPECT_THAT(data, ElementsAre(0, 0x83, 0, 2, 5, 0, 0, 0));
    EXPECT_THAT(sense, ElementsAre(0x70, 0, 0, 0));
    EXPECT_EQ(Call(simulation, "HBA_SendScsiInquiry").scsi(nullptr, 0, nullptr, 0, run), 9);
    EXPECT_EQ(Call(simulation, "HBA_SendScsiInquiry").scsi(nullptr, 8, nullptr, 0, run), HBA_STATUS_ERROR_ARG);

    add(R"({"function": "HBA_SendScsiInquiry", "hostile": "hugeLength", "to": 1})");
    Call(simulation, "HBA_SendScsiInquiry").scsi(data, 5, sense, 4, run);
    EXPECT_THAT(data, ElementsAre(0, 0x83, 0xFF, 0xFF, 0xFF, 0, 0, 0));
    add(R"({"function": "HBA_SendScsiInquiry", "hostile": "allOnes"})");
    Call(simulation, "HBA_SendScsiInquiry").scsi(data, 7, sense, 4, run);
    EXPECT_THAT(data, ElementsAre(255, 255, 255, 255, 255, 255, 255, 0));
}

} // namespace
} // namespace tvrsim
