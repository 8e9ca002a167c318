#include "Scenarios.h"

#include "simulator/ScsiResponses.h"

#include <gmock/gmock.h>
#include <rapidcheck.h>

namespace tvrsim
{
namespace
{

using testing::ElementsAre;

class Scsi : public testing::Test
{
protected:
    Scenario scenario = readScenario(twoPorts, "test");
    Target& diskTarget = scenario.targets[0];
    Target& tapeTarget = scenario.targets[1];

    ScsiReply run(Target& target, std::uint32_t lun, ScsiOperation operation, std::uint8_t page = 0)
    {
        return execute(target, encodeLun(lun), {operation, page});
    }

    static std::string textAt(const ScsiReply& reply, std::size_t place, std::size_t length)
    {
        return std::string(reply.data.begin() + static_cast<std::ptrdiff_t>(place),
                           reply.data.begin() + static_cast<std::ptrdiff_t>(place + length));
    }

    /// Sense key, additional code and qualifier.
    static std::vector<int> sense(const ScsiReply& reply)
    {
        EXPECT_EQ(reply.status, HBA_STATUS_SCSI_CHECK_CONDITION);
        EXPECT_TRUE(reply.data.empty());
        EXPECT_EQ(reply.sense.at(0), 0x70);
        return {reply.sense.at(2), reply.sense.at(12), reply.sense.at(13)};
    }
};

TEST_F(Scsi, InquiryNamesTheUnit)
{
    const ScsiReply reply = run(diskTarget, 0, ScsiOperation::inquiry);
    EXPECT_EQ(reply.status, 0u);
    ASSERT_GE(reply.data.size(), 36u);
    EXPECT_EQ(reply.data[0], 0);
    EXPECT_EQ(reply.data[4] + 5u, reply.data.size());
    EXPECT_EQ(textAt(reply, 8, 8), "V       ");
    EXPECT_EQ(textAt(reply, 16, 16), "PRODUCT         ");
    EXPECT_EQ(textAt(reply, 32, 4), "1.2 ");
}

TEST_F(Scsi, VitalProductData)
{
    EXPECT_THAT(run(diskTarget, 0, ScsiOperation::vitalProductData, 0x00).data, ElementsAre(0, 0, 0, 3, 0, 0x80, 0x83));
    EXPECT_THAT(run(diskTarget, 0, ScsiOperation::vitalProductData, 0x80).data, ElementsAre(0, 0x80, 0, 2, 'S', '0'));

    const ScsiReply names = run(diskTarget, 0, ScsiOperation::vitalProductData, 0x83);
    ASSERT_EQ(names.data.size(), 4u + 20 + 7);
    EXPECT_EQ(names.data[3], 27);
    EXPECT_EQ(textAt(names, 4, 5), std::string("\x01\x03\x00\x10\x60", 5));
    EXPECT_EQ(textAt(names, 24, 7), std::string("\x02\x01\x00\x03"
                                                "abc",
                                                7));

    EXPECT_THAT(sense(run(diskTarget, 300, ScsiOperation::vitalProductData, 0x80)), ElementsAre(5, 0x24, 0));
}

TEST_F(Scsi, ReadCapacity)
{
    EXPECT_THAT(run(diskTarget, 300, ScsiOperation::readCapacity).data, ElementsAre(0, 0, 0, 9, 0, 0, 0x10, 0));
    EXPECT_THAT(run(diskTarget, 0, ScsiOperation::readCapacity).data, ElementsAre(0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 2, 0))
        << "more blocks than the command can tell";
    EXPECT_THAT(sense(run(tapeTarget, 1, ScsiOperation::readCapacity)), ElementsAre(5, 0x20, 0));
}

TEST_F(Scsi, CheckConditionsAreUsedUp)
{
    EXPECT_EQ(run(tapeTarget, 1, ScsiOperation::vitalProductData, 0).status, 0u) << "for other commands";
    EXPECT_THAT(sense(run(tapeTarget, 1, ScsiOperation::inquiry)), ElementsAre(6, 0x29, 0));
    EXPECT_THAT(sense(run(tapeTarget, 1, ScsiOperation::inquiry)), ElementsAre(6, 0x29, 0));
    EXPECT_EQ(run(tapeTarget, 1, ScsiOperation::inquiry).data.at(0), 1);
}

TEST_F(Scsi, MissingUnitsAnswerAnInquiryOnly)
{
    EXPECT_EQ(run(diskTarget, 5, ScsiOperation::inquiry).data.at(0), 0x7F);
    EXPECT_THAT(sense(run(diskTarget, 5, ScsiOperation::readCapacity)), ElementsAre(5, 0x25, 0));
    EXPECT_EQ(execute(diskTarget, -1, {ScsiOperation::inquiry}).data.at(0), 0x7F);
}

TEST_F(Scsi, ReportLunsListsTheUnits)
{
    const ScsiReply reply = run(diskTarget, 0, ScsiOperation::reportLuns);
    EXPECT_THAT(reply.data, ElementsAre(0, 0, 0, 16, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x41, 0x2C, 0, 0, 0, 0, 0, 0));
}

TEST(Lun, FieldAndNumberAgree)
{
    EXPECT_TRUE(rc::check(
        []
        {
            const auto number = *rc::gen::inRange<std::uint32_t>(0, 16384);
            RC_ASSERT(decodeLun(encodeLun(number)) == number);
        }));
}

} // namespace
} // namespace tvrsim
